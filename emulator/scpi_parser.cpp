#include "emulator/scpi_parser.h"

#include <cctype>

namespace qn::emu {
namespace {

bool IsSpace(char c) {
    return c == ' ' || c == '\t' || c == '\r';
}

std::string_view Trim(std::string_view s) {
    while (!s.empty() && IsSpace(s.front())) s.remove_prefix(1);
    while (!s.empty() && IsSpace(s.back())) s.remove_suffix(1);
    return s;
}

bool IsQuote(char c) {
    return c == '"' || c == '\'';
}

// Length of a quoted string starting at s[0] (quotes included), doubled quotes being an
// embedded quote; nullopt when the closing quote is missing.
std::optional<std::size_t> QuotedLength(std::string_view s, std::string* value) {
    const char q = s[0];
    for (std::size_t i = 1; i < s.size(); ++i) {
        if (s[i] != q) {
            if (value) value->push_back(s[i]);
            continue;
        }
        if (i + 1 < s.size() && s[i + 1] == q) {
            if (value) value->push_back(q);
            ++i;
            continue;
        }
        return i + 1;
    }
    return std::nullopt;
}

// Length of the element starting at s[0] up to (not including) the next separator `sep` that
// lies outside strings and blocks.
std::size_t ElementLength(std::string_view s, char sep) {
    std::size_t i = 0;
    while (i < s.size() && s[i] != sep) {
        if (IsQuote(s[i])) {
            const auto n = QuotedLength(s.substr(i), nullptr);
            if (!n) return s.size();
            i += *n;
            continue;
        }
        if (s[i] == '#') {
            std::size_t header = 0;
            if (const auto len = ParseBlockHeader(s.substr(i), header)) {
                i += std::min(s.size() - i, header + *len);
                continue;
            }
        }
        ++i;
    }
    return i;
}

bool IsMnemonicChar(char c) {
    return std::isalnum(static_cast<unsigned char>(c)) != 0 || c == '_';
}

std::optional<ScpiError> ParseArgument(std::string_view text, Argument& arg) {
    text = Trim(text);
    if (text.empty()) return err::kSyntax;
    if (IsQuote(text[0])) {
        arg.kind = Argument::Kind::kString;
        const auto n = QuotedLength(text, &arg.value);
        if (!n || !Trim(text.substr(*n)).empty()) return err::kSyntax;
        return std::nullopt;
    }
    std::size_t header = 0;
    if (text[0] == '#') {
        const auto len = ParseBlockHeader(text, header);
        if (!len || header + *len != text.size()) return err::kInvalidBlock;
        arg.kind = Argument::Kind::kBlock;
        arg.value = std::string(text.substr(header));
        return std::nullopt;
    }
    arg.kind = Argument::Kind::kText;
    arg.value = std::string(text);
    return std::nullopt;
}

std::optional<ScpiError> ParseHeader(std::string_view& rest, ProgramUnit& unit) {
    if (!rest.empty() && rest[0] == '*') {
        unit.common = true;
        std::size_t n = 1;
        while (n < rest.size() && std::isalpha(static_cast<unsigned char>(rest[n]))) ++n;
        if (n == 1) return err::kSyntax;
        unit.mnemonics.emplace_back(rest.substr(0, n));
        rest.remove_prefix(n);
        return std::nullopt;
    }
    if (!rest.empty() && rest[0] == ':') {
        unit.absolute = true;
        rest.remove_prefix(1);
    }
    while (true) {
        std::size_t n = 0;
        while (n < rest.size() && IsMnemonicChar(rest[n])) ++n;
        if (n == 0 || !std::isalpha(static_cast<unsigned char>(rest[0]))) {
            return rest.empty() || rest[0] == ':' ? err::kSyntax : err::kInvalidCharacter;
        }
        unit.mnemonics.emplace_back(rest.substr(0, n));
        rest.remove_prefix(n);
        if (rest.empty() || rest[0] != ':') return std::nullopt;
        rest.remove_prefix(1);
    }
}

}  // namespace

std::optional<std::size_t> ParseBlockHeader(std::string_view text, std::size_t& header_length) {
    if (text.size() < 2 || text[0] != '#' || text[1] < '1' || text[1] > '9') return std::nullopt;
    const std::size_t digits = static_cast<std::size_t>(text[1] - '0');
    if (text.size() < 2 + digits) return std::nullopt;
    std::size_t length = 0;
    for (std::size_t i = 2; i < 2 + digits; ++i) {
        if (!std::isdigit(static_cast<unsigned char>(text[i]))) return std::nullopt;
        length = length * 10 + static_cast<std::size_t>(text[i] - '0');
    }
    header_length = 2 + digits;
    return length;
}

void MessageFramer::Append(std::string_view bytes) {
    buffer_.append(bytes);
}

bool MessageFramer::TakeOverrun() {
    const bool value = overrun_;
    overrun_ = false;
    return value;
}

bool MessageFramer::Scan() {
    while (scan_ < buffer_.size()) {
        if (state_ == State::kBlockData) {
            const std::size_t take = std::min(block_remaining_, buffer_.size() - scan_);
            scan_ += take;
            block_remaining_ -= take;
            if (block_remaining_ == 0) state_ = State::kText;
            continue;
        }
        const char c = buffer_[scan_];
        if (c == '\n') return true;
        if (state_ == State::kText && quote_ == 0 && c == '#') {
            std::size_t header = 0;
            const std::string_view rest(buffer_.data() + scan_, buffer_.size() - scan_);
            const auto length = ParseBlockHeader(rest, header);
            const bool incomplete = !length && rest.size() >= 2 && rest[1] >= '1' &&
                                    rest[1] <= '9' && rest.size() < 2u + (rest[1] - '0');
            if (incomplete) return false;  // wait for the rest of the header
            if (length && *length <= kMaxMessageBytes) {
                scan_ += header;
                block_remaining_ = *length;
                state_ = State::kBlockData;
                continue;
            }
        }
        if (state_ == State::kText && IsQuote(c))
            quote_ = quote_ == 0 ? c : (quote_ == c ? 0 : quote_);
        ++scan_;
    }
    return false;
}

std::optional<std::string> MessageFramer::Next() {
    while (true) {
        const bool complete = Scan();
        if (!complete) {
            if (state_ != State::kDiscard && scan_ > kMaxMessageBytes) {
                state_ = State::kDiscard;
                overrun_ = true;
            }
            if (state_ == State::kDiscard) {
                buffer_.clear();
                scan_ = 0;
            }
            return std::nullopt;
        }
        std::string message = buffer_.substr(0, scan_);
        buffer_.erase(0, scan_ + 1);
        scan_ = 0;
        quote_ = 0;
        if (state_ == State::kDiscard) {
            state_ = State::kText;
            continue;
        }
        return message;
    }
}

std::vector<std::string_view> SplitUnits(std::string_view message) {
    std::vector<std::string_view> units;
    while (true) {
        const std::size_t n = ElementLength(message, ';');
        units.push_back(message.substr(0, n));
        if (n >= message.size()) return units;
        message.remove_prefix(n + 1);
    }
}

UnitParse ParseUnit(std::string_view text) {
    UnitParse result;
    std::string_view rest = Trim(text);
    if (rest.empty()) return result;
    ProgramUnit unit;
    if (auto error = ParseHeader(rest, unit)) {
        result.error = error;
        return result;
    }
    if (!rest.empty() && rest[0] == '?') {
        unit.query = true;
        rest.remove_prefix(1);
    }
    if (!rest.empty() && !IsSpace(rest[0])) {
        result.error = err::kInvalidCharacter;
        return result;
    }
    rest = Trim(rest);
    while (!rest.empty()) {
        const std::size_t n = ElementLength(rest, ',');
        Argument arg;
        if (auto error = ParseArgument(rest.substr(0, n), arg)) {
            result.error = error;
            return result;
        }
        unit.args.push_back(std::move(arg));
        if (n >= rest.size()) break;
        rest.remove_prefix(n + 1);
        if (Trim(rest).empty()) {
            result.error = err::kSyntax;  // trailing comma
            return result;
        }
    }
    result.unit = std::move(unit);
    return result;
}

}  // namespace qn::emu

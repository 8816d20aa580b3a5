#include "platform/visa/ieee488.h"

#include <charconv>
#include <cmath>
#include <limits>
#include <string>

namespace qn::visa {
namespace {

bool IsDigit(char c) {
    return c >= '0' && c <= '9';
}

char Upper(char c) {
    return c >= 'a' && c <= 'z' ? char(c - 32) : c;
}

bool IStartsWith(std::string_view s, std::string_view word) {
    if (s.size() < word.size()) return false;
    for (std::size_t i = 0; i < word.size(); ++i)
        if (Upper(s[i]) != word[i]) return false;
    return true;
}

// Digit value in base, or -1.
int DigitIn(char c, int base) {
    int v = IsDigit(c) ? c - '0' : (Upper(c) >= 'A' && Upper(c) <= 'F') ? Upper(c) - 'A' + 10 : -1;
    return v < base ? v : -1;
}

// "#H1F", "#Q17", "#B101": unsigned, at most 64 bits.
NumberParse NonDecimal(std::string_view t, bool at_end, double* value, std::size_t* consumed) {
    if (t.size() < 2) return at_end ? NumberParse::kNoNumber : NumberParse::kNeedMore;
    char k = Upper(t[1]);
    int base = k == 'H' ? 16 : k == 'Q' ? 8 : k == 'B' ? 2 : 0;
    if (base == 0) return NumberParse::kNoNumber;
    std::size_t i = 2;
    std::uint64_t v = 0;
    for (; i < t.size(); ++i) {
        int d = DigitIn(t[i], base);
        if (d < 0) break;
        if (v >
            (std::numeric_limits<std::uint64_t>::max() - std::uint64_t(d)) / std::uint64_t(base))
            return NumberParse::kNoNumber;
        v = v * std::uint64_t(base) + std::uint64_t(d);
    }
    if (i == t.size() && !at_end) return NumberParse::kNeedMore;
    if (i == 2) return NumberParse::kNoNumber;
    *value = double(v);
    *consumed = i;
    return NumberParse::kOk;
}

// Special words some instruments send instead of digits.
struct Word {
    std::string_view text;
    double value;
};
constexpr Word kWords[] = {
    {"INFINITY", std::numeric_limits<double>::infinity()},
    {"INF", std::numeric_limits<double>::infinity()},
    {"NAN", std::numeric_limits<double>::quiet_NaN()},
};

std::string UpperCopy(std::string_view s) {
    std::string u(s);
    for (char& c : u) c = Upper(c);
    return u;
}

std::size_t Digits(std::string_view t, std::size_t i) {
    while (i < t.size() && IsDigit(t[i])) ++i;
    return i;
}

}  // namespace

BlockParse ParseBlockHeader(std::string_view b, std::uint64_t max_length, BlockHeader* out) {
    if (b.empty()) return BlockParse::kNeedMore;
    if (b[0] != '#') return BlockParse::kNotBlock;
    if (b.size() < 2) return BlockParse::kNeedMore;
    if (!IsDigit(b[1])) return BlockParse::kMalformed;
    const std::size_t n = std::size_t(b[1] - '0');
    if (n == 0) {
        *out = BlockHeader{true, 0, 2};
        return BlockParse::kOk;
    }
    std::uint64_t length = 0;  // at most 9 digits: no overflow
    for (std::size_t i = 0; i < n; ++i) {
        if (2 + i >= b.size()) return BlockParse::kNeedMore;
        if (!IsDigit(b[2 + i])) return BlockParse::kMalformed;
        length = length * 10 + std::uint64_t(b[2 + i] - '0');
    }
    if (length > max_length) return BlockParse::kTooLarge;
    *out = BlockHeader{false, length, 2 + n};
    return BlockParse::kOk;
}

NumberParse ParseNumber(std::string_view t, bool at_end, double* value, std::size_t* consumed) {
    if (t.empty()) return at_end ? NumberParse::kNoNumber : NumberParse::kNeedMore;
    if (t[0] == '#') return NonDecimal(t, at_end, value, consumed);

    std::size_t i = 0;
    bool negative = false;
    if (t[0] == '+' || t[0] == '-') {
        negative = t[0] == '-';
        ++i;
    }
    const std::string_view rest = t.substr(i);
    for (const Word& w : kWords) {
        if (IStartsWith(rest, w.text)) {
            std::size_t end = i + w.text.size();
            if (end == t.size() && !at_end && w.text == "INF") return NumberParse::kNeedMore;
            *value = negative ? -w.value : w.value;
            *consumed = end;
            return NumberParse::kOk;
        }
        // "IN" at the end of the text may still become "INF".
        if (!at_end && !rest.empty() && rest.size() < w.text.size() &&
            IStartsWith(w.text, UpperCopy(rest)))
            return NumberParse::kNeedMore;
    }
    const std::size_t mantissa = i;
    i = Digits(t, i);
    std::size_t int_digits = i - mantissa;
    std::size_t frac_digits = 0;
    if (i < t.size() && t[i] == '.') {
        std::size_t f = Digits(t, i + 1);
        frac_digits = f - (i + 1);
        i = f;
    }
    if (int_digits + frac_digits == 0) {
        bool partial = !at_end && i == t.size();  // "+", "-", "." or "" so far
        return partial ? NumberParse::kNeedMore : NumberParse::kNoNumber;
    }
    std::size_t end = i;
    if (i < t.size() && (t[i] == 'e' || t[i] == 'E')) {
        std::size_t e = i + 1;
        if (e < t.size() && (t[e] == '+' || t[e] == '-')) ++e;
        std::size_t d = Digits(t, e);
        if (d > e)
            end = d;  // complete exponent
        else if (d == t.size() && !at_end)
            return NumberParse::kNeedMore;  // "1E", "1E+"
    }
    if (end == t.size() && !at_end) return NumberParse::kNeedMore;

    // from_chars takes no leading '+'; the text is [mantissa, end).
    std::string_view digits = t.substr(mantissa, end - mantissa);
    double v = 0;
    auto [ptr, ec] = std::from_chars(digits.data(), digits.data() + digits.size(), v);
    if (ec == std::errc::result_out_of_range) {
        // Overflow or underflow: decide by the exponent's sign.
        std::size_t epos = digits.find_first_of("eE");
        bool tiny =
            epos != std::string_view::npos && epos + 1 < digits.size() && digits[epos + 1] == '-';
        v = tiny ? 0.0 : std::numeric_limits<double>::infinity();
    } else if (ec != std::errc() || ptr != digits.data() + digits.size()) {
        return NumberParse::kNoNumber;
    }
    *value = negative ? -v : v;
    *consumed = end;
    return NumberParse::kOk;
}

}  // namespace qn::visa

#include "io/reply_number.h"

#include <charconv>
#include <cmath>
#include <cstdint>

#include "platform/ivi/ivifloat.h"

namespace qn {

namespace {
bool IsSpace(char c) { return c == ' ' || (c >= '\t' && c <= '\r'); }
bool IsDigit(char c) { return c >= '0' && c <= '9'; }
}  // namespace

ReplyNumber ParseReplyNumber(std::string_view s) {
    std::size_t i = 0;
    while (i < s.size() && IsSpace(s[i])) ++i;
    const std::size_t start = i;
    if (i < s.size() && (s[i] == '+' || s[i] == '-')) ++i;
    std::size_t digits = 0;
    while (i < s.size() && IsDigit(s[i])) ++i, ++digits;
    if (i < s.size() && s[i] == '.') {
        ++i;
        while (i < s.size() && IsDigit(s[i])) ++i, ++digits;
    }
    if (digits == 0) return {};
    // An exponent counts only when digits follow it ("1e" reads as 1).
    if (i < s.size() && (s[i] == 'e' || s[i] == 'E')) {
        std::size_t j = i + 1;
        if (j < s.size() && (s[j] == '+' || s[j] == '-')) ++j;
        if (j < s.size() && IsDigit(s[j])) {
            while (j < s.size() && IsDigit(s[j])) ++j;
            i = j;
        }
    }
    std::string_view text = s.substr(start, i - start);
    if (!text.empty() && text.front() == '+') text.remove_prefix(1);
    ReplyNumber n;
    n.found = true;
    auto r = std::from_chars(text.data(), text.data() + text.size(), n.value);
    if (r.ec == std::errc::result_out_of_range) {
        // Too large or too small for a double: infinity or zero with the sign.
        bool negative = text.front() == '-';
        bool tiny = false;
        auto e = text.find_first_of("eE");
        tiny = e != std::string_view::npos && text.substr(e + 1).front() == '-';
        n.value = tiny ? (negative ? -0.0 : 0.0) : (negative ? -HUGE_VAL : HUGE_VAL);
    }
    return n;
}

LONG ReplyToLong(const ReplyNumber& n) {
    double v = n.value;
    if (std::isnan(v)) return 0;
    if (v >= 2147483647.0) return 2147483647;
    if (v <= -2147483648.0) return -2147483647 - 1;
    return static_cast<LONG>(v);  // truncation toward zero
}

SHORT ReplyToShort(const ReplyNumber& n) {
    return static_cast<SHORT>(static_cast<std::uint16_t>(static_cast<std::uint32_t>(ReplyToLong(n))));
}

bool ReplyToBool(const ReplyNumber& n) {
    return (static_cast<std::uint32_t>(ReplyToLong(n)) & 0xFFu) != 0;
}

float ReplyToFloat(const ReplyNumber& n) { return static_cast<float>(ReplyToDouble(n)); }

double ReplyToDouble(const ReplyNumber& n) { return n.found ? n.value : ivi::IviFloatNaN(); }

}  // namespace qn

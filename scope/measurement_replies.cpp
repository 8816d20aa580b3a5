#include "scope/measurement_replies.h"

#include <cerrno>
#include <charconv>
#include <cmath>
#include <cstdlib>
#include <limits>
#include <vector>

namespace qn {

namespace {

std::string_view Trim(std::string_view s) {
    while (!s.empty() && (s.front() == ' ' || s.front() == '\t' || s.front() == '\r'))
        s.remove_prefix(1);
    while (!s.empty() && (s.back() == ' ' || s.back() == '\t' || s.back() == '\r'))
        s.remove_suffix(1);
    return s;
}

std::vector<std::string_view> Fields(std::string_view s) {
    std::vector<std::string_view> out;
    for (;;) {
        std::size_t comma = s.find(',');
        out.push_back(Trim(s.substr(0, comma)));
        if (comma == std::string_view::npos) return out;
        s.remove_prefix(comma + 1);
    }
}

bool ParseDouble(std::string_view field, double* out) {
    if (field.empty() || field.size() > 64) return false;
    const std::string text(field);
    char* end = nullptr;
    errno = 0;
    const double v = std::strtod(text.c_str(), &end);
    if (end != text.c_str() + text.size() || !std::isfinite(v)) return false;
    // Only decimal notation: strtod would also take hexadecimal floats.
    for (char c : text)
        if (c == 'x' || c == 'X') return false;
    *out = v;
    return true;
}

bool ParseLong(std::string_view field, LONG* out) {
    if (!field.empty() && field.front() == '+') {
        field.remove_prefix(1);
        if (!field.empty() && (field.front() == '+' || field.front() == '-')) return false;
    }
    if (field.empty()) return false;
    std::int64_t v = 0;
    const char* end = field.data() + field.size();
    auto [p, ec] = std::from_chars(field.data(), end, v);
    if (ec != std::errc() || p != end) return false;
    if (v < std::numeric_limits<LONG>::min() || v > std::numeric_limits<LONG>::max()) return false;
    *out = static_cast<LONG>(v);
    return true;
}

bool IsUpperWord(std::string_view s) {
    if (s.empty()) return false;
    for (char c : s)
        if (c < 'A' || c > 'Z') return false;
    return true;
}

}  // namespace

bool ParseThresholdReply(std::string_view reply, ThresholdReply* out) {
    const std::vector<std::string_view> f = Fields(Trim(reply));
    if (f.size() != 5 || f[0] != "THR" || !IsUpperWord(f[1])) return false;
    ThresholdReply r;
    r.mode = std::string(f[1]);
    if (!ParseDouble(f[2], &r.high) || !ParseDouble(f[3], &r.mid) || !ParseDouble(f[4], &r.low))
        return false;
    *out = std::move(r);
    return true;
}

bool ParseIntegerPair(std::string_view reply, LONG* a, LONG* b) {
    const std::vector<std::string_view> f = Fields(Trim(reply));
    LONG x = 0, y = 0;
    if (f.size() != 2 || !ParseLong(f[0], &x) || !ParseLong(f[1], &y)) return false;
    *a = x;
    *b = y;
    return true;
}

void SplitSourcesReply(std::string_view reply, std::string* first, std::string* second) {
    reply = Trim(reply);
    const std::size_t comma = reply.find(',');
    *first = std::string(Trim(reply.substr(0, comma)));
    *second = comma == std::string_view::npos ? std::string()
                                              : std::string(Trim(reply.substr(comma + 1)));
}

bool IsSourceWord(std::string_view s) {
    if (s.empty() || s.size() > 32) return false;
    for (char c : s) {
        const bool ok = (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9');
        if (!ok) return false;
    }
    return true;
}

}  // namespace qn

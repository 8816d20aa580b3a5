#include "core/options.h"

#include <algorithm>
#include <climits>
#include <unordered_map>

namespace qn {

namespace {
char Lower(char c) { return (c >= 'A' && c <= 'Z') ? char(c - 'A' + 'a') : c; }
char Upper(char c) { return (c >= 'a' && c <= 'z') ? char(c - 'a' + 'A') : c; }
bool IsBlank(char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n' || c == '\v' || c == '\f'; }
bool IsPairChar(char c) { return c != ',' && c != '='; }
}  // namespace

std::string ToLower(std::string_view s) {
    std::string r(s);
    std::transform(r.begin(), r.end(), r.begin(), Lower);
    return r;
}

std::string ToUpper(std::string_view s) {
    std::string r(s);
    std::transform(r.begin(), r.end(), r.begin(), Upper);
    return r;
}

std::string_view TrimBlanks(std::string_view s) {
    while (!s.empty() && IsBlank(s.front())) s.remove_prefix(1);
    while (!s.empty() && IsBlank(s.back())) s.remove_suffix(1);
    return s;
}

bool EqualsNoCase(std::string_view a, std::string_view b) {
    return a.size() == b.size() &&
           std::equal(a.begin(), a.end(), b.begin(), [](char x, char y) { return Lower(x) == Lower(y); });
}

SplitOptionString SplitDriverSetup(std::string_view options) {
    static constexpr std::string_view kKey = "DRIVERSETUP=";
    SplitOptionString r;
    std::size_t at = ToUpper(options).find(kKey);
    if (at == std::string::npos) {
        r.ordinary = std::string(options);
        return r;
    }
    r.ordinary = std::string(options.substr(0, at));
    r.driver_setup = std::string(options.substr(at + kKey.size()));
    r.has_driver_setup = true;
    return r;
}

std::vector<OptionPair> ParseOptionPairs(std::string_view text) {
    std::vector<OptionPair> pairs;
    std::unordered_map<std::string, std::size_t> index;  // name -> position in pairs
    std::size_t i = 0;
    const std::size_t n = text.size();
    while (i < n) {
        // Try a match starting at i: name run, "=", value run.
        std::size_t name_end = i;
        while (name_end < n && IsPairChar(text[name_end])) ++name_end;
        if (name_end == i || name_end >= n || text[name_end] != '=') {
            // No match can start anywhere in this run: it ends at the same
            // place. Skip past the run and the separator that ended it.
            i = name_end == i ? i + 1 : name_end;
            continue;
        }
        std::size_t value_begin = name_end + 1;
        std::size_t value_end = value_begin;
        while (value_end < n && IsPairChar(text[value_end])) ++value_end;
        if (value_end == value_begin) {  // "name=" followed by ',' '=' or the end
            i = value_begin;
            continue;
        }
        OptionPair p{std::string(TrimBlanks(text.substr(i, name_end - i))),
                     std::string(TrimBlanks(text.substr(value_begin, value_end - value_begin)))};
        auto [it, inserted] = index.try_emplace(p.name, pairs.size());
        if (inserted)
            pairs.push_back(std::move(p));
        else
            pairs[it->second].value = std::move(p.value);
        i = value_end;
    }
    return pairs;
}

std::optional<bool> ParseBooleanWord(std::string_view word) {
    for (std::string_view t : {"true", "VI_TRUE", "1"})
        if (EqualsNoCase(word, t)) return true;
    for (std::string_view f : {"false", "VI_FALSE", "0"})
        if (EqualsNoCase(word, f)) return false;
    return std::nullopt;
}

long ParseDecimalPrefix(std::string_view text) {
    std::size_t i = 0;
    while (i < text.size() && IsBlank(text[i])) ++i;
    bool negative = false;
    if (i < text.size() && (text[i] == '+' || text[i] == '-')) negative = text[i++] == '-';
    long long v = 0;
    for (; i < text.size() && text[i] >= '0' && text[i] <= '9'; ++i) {
        v = v * 10 + (text[i] - '0');
        if (v > static_cast<long long>(INT_MAX) + 1) v = static_cast<long long>(INT_MAX) + 1;
    }
    if (negative) v = -v;
    return static_cast<long>(std::clamp<long long>(v, INT_MIN, INT_MAX));
}

}  // namespace qn

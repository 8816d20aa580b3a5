// libFuzzer target: the threshold, delay/activity and measurement-source
// reply parsers. An accepted threshold reply has an upper-case mode and
// finite levels and reads the same when written back; an accepted integer
// pair reads the same when written back; a source accepted as a word holds
// only letters and digits.
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>

#include "scope/measurement_replies.h"

namespace {

void CheckThreshold(std::string_view text) {
    qn::ThresholdReply t;
    if (!qn::ParseThresholdReply(text, &t)) return;
    if (t.mode.empty() || !std::isfinite(t.high) || !std::isfinite(t.mid) || !std::isfinite(t.low))
        std::abort();
    for (char c : t.mode)
        if (c < 'A' || c > 'Z') std::abort();
    std::string again = "THR," + t.mode;
    for (double v : {t.high, t.mid, t.low}) {
        char number[40];
        std::snprintf(number, sizeof number, ",%.17g", v);
        again += number;
    }
    qn::ThresholdReply u;
    if (!qn::ParseThresholdReply(again, &u) || u.mode != t.mode || u.high != t.high ||
        u.mid != t.mid || u.low != t.low)
        std::abort();
}

void CheckPair(std::string_view text) {
    LONG a = 7, b = 7;
    if (!qn::ParseIntegerPair(text, &a, &b)) {
        if (a != 7 || b != 7) std::abort();  // a refused reply leaves the outputs alone
        return;
    }
    const std::string again = std::to_string(a) + "," + std::to_string(b);
    LONG c = 0, d = 0;
    if (!qn::ParseIntegerPair(again, &c, &d) || c != a || d != b) std::abort();
}

void CheckSources(std::string_view text) {
    std::string first, second;
    qn::SplitSourcesReply(text, &first, &second);
    if (first.size() + second.size() > text.size()) std::abort();
    for (const std::string& s : {first, second}) {
        if (!qn::IsSourceWord(s)) continue;
        for (char c : s)
            if (!std::isalnum(static_cast<unsigned char>(c))) std::abort();
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text(reinterpret_cast<const char*>(data), size);
    CheckThreshold(text);
    CheckPair(text);
    CheckSources(text);
    return 0;
}

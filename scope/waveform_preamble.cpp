// Parsing of the waveform preamble reply.
#include <cmath>
#include <string>
#include <vector>

#include "io/reply_number.h"
#include "scope/waveform_scaling.h"

namespace qn {

namespace {

// Fields 1-based as the instrument documents them.
constexpr std::size_t kXIncrement = 5, kXOrigin = 6, kYIncrement = 8, kYOrigin = 9,
                      kYReference = 10;

bool FieldNumber(const std::vector<std::string_view>& fields, std::size_t index, double* out) {
    if (index > fields.size()) return false;
    const ReplyNumber n = ParseReplyNumber(fields[index - 1]);
    if (!n.found || !std::isfinite(n.value)) return false;
    *out = n.value;
    return true;
}

}  // namespace

bool ParsePreamble(std::string_view reply, WaveformScaling* out) {
    std::string text;
    text.reserve(reply.size());
    for (char c : reply)
        if (c != '"') text.push_back(c);
    std::vector<std::string_view> fields;
    std::string_view rest(text);
    for (;;) {
        const std::size_t comma = rest.find(',');
        fields.push_back(rest.substr(0, comma));
        if (comma == std::string_view::npos) break;
        rest.remove_prefix(comma + 1);
    }
    WaveformScaling s;
    double yref = 0.0;
    if (!FieldNumber(fields, kXIncrement, &s.x_increment) ||
        !FieldNumber(fields, kXOrigin, &s.x_origin) ||
        !FieldNumber(fields, kYIncrement, &s.y_increment) ||
        !FieldNumber(fields, kYOrigin, &s.y_origin) || !FieldNumber(fields, kYReference, &yref))
        return false;
    // A decimal integer: the number must be whole and fit 32 bits.
    if (yref != std::trunc(yref) || yref < -2147483648.0 || yref > 2147483647.0) return false;
    s.y_reference = static_cast<LONG>(yref);
    *out = s;
    return true;
}

}  // namespace qn

// The conversion kernels of waveform transfer. This file is compiled with
// -ffp-contract=off: every point must equal the two-step formula
// (v - yref) * yinc + yorg exactly, so the multiply and the add may not be
// fused into one rounding.
#include <limits>

#include "scope/waveform_scaling.h"

namespace qn {

bool ConvertWords(const std::int16_t* __restrict raw, std::size_t n, const WaveformScaling& s,
                  double* __restrict out) {
    const double yref = static_cast<double>(s.y_reference);
    const double yinc = s.y_increment;
    const double yorg = s.y_origin;
    const double nan = std::numeric_limits<double>::quiet_NaN();
    // Branch-free so that the loop vectorises: every point is converted and
    // the invalid ones are replaced afterwards by a select.
    int invalid = 0;
    for (std::size_t i = 0; i < n; ++i) {
        const std::int16_t v = raw[i];
        const double y = (static_cast<double>(v) - yref) * yinc + yorg;
        const bool bad = v == kInvalidWord;
        out[i] = bad ? nan : y;
        invalid |= bad;
    }
    return invalid != 0;
}

bool ConvertWordPairs(const std::int16_t* __restrict raw, std::size_t pairs,
                      const WaveformScaling& s, double* __restrict min, double* __restrict max) {
    const double yref = static_cast<double>(s.y_reference);
    const double yinc = s.y_increment;
    const double yorg = s.y_origin;
    const double nan = std::numeric_limits<double>::quiet_NaN();
    int invalid = 0;
    for (std::size_t k = 0; k < pairs; ++k) {
        const std::int16_t lo = raw[2 * k], hi = raw[2 * k + 1];
        const double a = (static_cast<double>(lo) - yref) * yinc + yorg;
        const double b = (static_cast<double>(hi) - yref) * yinc + yorg;
        min[k] = lo == kInvalidWord ? nan : a;
        max[k] = hi == kInvalidWord ? nan : b;
        invalid |= (lo == kInvalidWord) | (hi == kInvalidWord);
    }
    return invalid != 0;
}

void ExtractBit(const std::uint8_t* __restrict raw, std::size_t n, int bit,
                double* __restrict out) {
    const unsigned shift = static_cast<unsigned>(bit) & 7u;
    for (std::size_t i = 0; i < n; ++i) out[i] = static_cast<double>((raw[i] >> shift) & 1u);
}

}  // namespace qn

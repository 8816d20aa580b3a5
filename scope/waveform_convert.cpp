// The conversion kernels of waveform transfer. This file is compiled with
// -ffp-contract=off: every point must equal the two-step formula
// (v - yref) * yinc + yorg exactly, so the multiply and the add may not be
// fused into one rounding.
#include <limits>

#include "scope/waveform_scaling.h"

namespace qn {

// Where the processor has them, 256-bit vectors convert four points per
// instruction; the default clone keeps the baseline instruction set. (FMA is
// not among the targets: it would not be used anyway with contraction off.)
// Sanitizer builds use one plain version: a clone's resolver runs while the
// program is being relocated, before the sanitizer's runtime has started.
#if defined(__x86_64__) && !defined(__SANITIZE_ADDRESS__) && !defined(__SANITIZE_THREAD__)
#define QN_VECTOR_CLONES __attribute__((target_clones("avx2", "default")))
#else
#define QN_VECTOR_CLONES
#endif

QN_VECTOR_CLONES bool ConvertWords(const std::int16_t* __restrict raw, std::size_t n, const WaveformScaling& s,
                  double* __restrict out) {
    const double yref = static_cast<double>(s.y_reference);
    const double yinc = s.y_increment;
    const double yorg = s.y_origin;
    const double nan = std::numeric_limits<double>::quiet_NaN();
    // Three simple loops that vectorise: look for invalid points in the raw
    // words, convert every point, then (rarely) put NaN where a point had
    // no data.
    int invalid = 0;
    for (std::size_t i = 0; i < n; ++i) invalid |= raw[i] == kInvalidWord;
    for (std::size_t i = 0; i < n; ++i) out[i] = (static_cast<double>(raw[i]) - yref) * yinc + yorg;
    if (invalid)
        for (std::size_t i = 0; i < n; ++i)
            if (raw[i] == kInvalidWord) out[i] = nan;
    return invalid != 0;
}

QN_VECTOR_CLONES bool ConvertWordPairs(const std::int16_t* __restrict raw, std::size_t pairs,
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

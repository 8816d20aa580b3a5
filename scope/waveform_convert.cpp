// The conversion kernels of waveform transfer. This file is compiled with
// -ffp-contract=off: every point must equal the two-step formula
// (v - yref) * yinc + yorg exactly, so the multiply and the add may not be
// fused into one rounding.
#include <cstdint>
#include <limits>

#if defined(__x86_64__)
#include <immintrin.h>
#endif

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

namespace {

// A word of a record sent most significant byte first.
inline std::int16_t WordAt(const std::uint8_t* raw, std::size_t i) {
    return static_cast<std::int16_t>(static_cast<std::uint16_t>(raw[2 * i] << 8 | raw[2 * i + 1]));
}

inline double Scale(std::int16_t v, double yref, double yinc, double yorg) {
    return v == kInvalidWord ? std::numeric_limits<double>::quiet_NaN()
                             : (static_cast<double>(v) - yref) * yinc + yorg;
}

bool ConvertMsbFirstScalar(const std::uint8_t* raw, std::size_t n, const WaveformScaling& s,
                           double* out) {
    const double yref = static_cast<double>(s.y_reference);
    bool invalid = false;
    for (std::size_t i = 0; i < n; ++i) {
        const std::int16_t v = WordAt(raw, i);
        invalid |= v == kInvalidWord;
        out[i] = Scale(v, yref, s.y_increment, s.y_origin);
    }
    return invalid;
}

#if defined(__x86_64__) && !defined(__SANITIZE_ADDRESS__)
// Four points of 32-bit words scaled into dst (32-byte aligned).
__attribute__((target("avx2"), always_inline)) inline void PutFour(double* dst, __m128i four,
                                                                   __m256d vref, __m256d vinc,
                                                                   __m256d vorg, bool stream) {
    const __m256d d =
        _mm256_add_pd(_mm256_mul_pd(_mm256_sub_pd(_mm256_cvtepi32_pd(four), vref), vinc), vorg);
    if (stream)
        _mm256_stream_pd(dst, d);
    else
        _mm256_store_pd(dst, d);
}

// Sixteen words per step: the byte order swapped by one shuffle, widened to
// doubles four at a time, scaled with a separate multiply and add, written
// past the cache when the record is large (the output is not read
// again by the driver). A step holding an invalid word is done point by point.
__attribute__((target("avx2"))) bool ConvertMsbFirstAvx2(const std::uint8_t* raw, std::size_t n,
                                                         const WaveformScaling& s, double* out) {
    const double yref = static_cast<double>(s.y_reference);
    std::size_t i = 0;
    bool invalid = false;
    // Point by point up to a 32-byte boundary of the output.
    while (i < n && (reinterpret_cast<std::uintptr_t>(out + i) & 31u) != 0) {
        invalid |= WordAt(raw, i) == kInvalidWord;
        out[i] = Scale(WordAt(raw, i), yref, s.y_increment, s.y_origin);
        ++i;
    }
    // From half the last-level cache up, the output would push the rest out on its way
    // through, and streaming saves reading each line before it is written (a 1,000,000-point
    // record converts about a quarter faster).
    constexpr std::size_t kStreamBytes = std::size_t(4) << 20;
    const bool stream = n * sizeof(double) >= kStreamBytes;
    const __m256i swap = _mm256_setr_epi8(1, 0, 3, 2, 5, 4, 7, 6, 9, 8, 11, 10, 13, 12, 15, 14, 1,
                                          0, 3, 2, 5, 4, 7, 6, 9, 8, 11, 10, 13, 12, 15, 14);
    const __m256i bad = _mm256_set1_epi16(kInvalidWord);
    const __m256d vref = _mm256_set1_pd(yref);
    const __m256d vinc = _mm256_set1_pd(s.y_increment);
    const __m256d vorg = _mm256_set1_pd(s.y_origin);
    for (; i + 16 <= n; i += 16) {
        __m256i w = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(raw + 2 * i));
        w = _mm256_shuffle_epi8(w, swap);
        const __m256i hit = _mm256_cmpeq_epi16(w, bad);
        if (!_mm256_testz_si256(hit, hit)) {
            invalid = true;
            for (std::size_t k = i; k < i + 16; ++k)
                out[k] = Scale(WordAt(raw, k), yref, s.y_increment, s.y_origin);
            continue;
        }
        const __m256i lo = _mm256_cvtepi16_epi32(_mm256_castsi256_si128(w));
        const __m256i hi = _mm256_cvtepi16_epi32(_mm256_extracti128_si256(w, 1));
        PutFour(out + i, _mm256_castsi256_si128(lo), vref, vinc, vorg, stream);
        PutFour(out + i + 4, _mm256_extracti128_si256(lo, 1), vref, vinc, vorg, stream);
        PutFour(out + i + 8, _mm256_castsi256_si128(hi), vref, vinc, vorg, stream);
        PutFour(out + i + 12, _mm256_extracti128_si256(hi, 1), vref, vinc, vorg, stream);
    }
    if (stream) _mm_sfence();
    return ConvertMsbFirstScalar(raw + 2 * i, n - i, s, out + i) || invalid;
}
#endif

}  // namespace

bool ConvertWordsMsbFirst(const std::uint8_t* raw, std::size_t n, const WaveformScaling& s,
                          double* out) {
#if defined(__x86_64__) && !defined(__SANITIZE_ADDRESS__)
    static const bool avx2 = __builtin_cpu_supports("avx2");
    if (avx2) return ConvertMsbFirstAvx2(raw, n, s, out);
#endif
    return ConvertMsbFirstScalar(raw, n, s, out);
}

bool ConvertWordPairsMsbFirst(const std::uint8_t* raw, std::size_t pairs,
                              const WaveformScaling& s, double* min, double* max) {
    const double yref = static_cast<double>(s.y_reference);
    bool invalid = false;
    for (std::size_t k = 0; k < pairs; ++k) {
        const std::int16_t lo = WordAt(raw, 2 * k), hi = WordAt(raw, 2 * k + 1);
        invalid |= lo == kInvalidWord || hi == kInvalidWord;
        min[k] = Scale(lo, yref, s.y_increment, s.y_origin);
        max[k] = Scale(hi, yref, s.y_increment, s.y_origin);
    }
    return invalid;
}

void ExtractBit(const std::uint8_t* __restrict raw, std::size_t n, int bit,
                double* __restrict out) {
    const unsigned shift = static_cast<unsigned>(bit) & 7u;
    for (std::size_t i = 0; i < n; ++i) out[i] = static_cast<double>((raw[i] >> shift) & 1u);
}

}  // namespace qn

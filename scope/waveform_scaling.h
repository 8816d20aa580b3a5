// The scaling factors of a transferred waveform record and the conversion of
// its raw elements into doubles.
#pragma once

#include <cstddef>
#include <cstdint>
#include <limits>
#include <string_view>

#include "platform/com/types.h"

namespace qn {

struct WaveformScaling {
    double x_origin = 0.0;     // s, time of the first point
    double x_increment = 0.0;  // s between points
    double y_origin = 0.0;     // V at the reference code
    double y_increment = 0.0;  // V per code
    LONG y_reference = 0;      // code of y_origin
};

// The raw word marking a point the instrument has no data for.
inline constexpr std::int16_t kInvalidWord = -32768;

// out[i] = (raw[i] - y_reference) * y_increment + y_origin, rounded once per
// operation (never fused), and a quiet NaN where raw[i] is kInvalidWord.
// Returns true when at least one such invalid point was seen. `out` must not
// overlap `raw`.
bool ConvertWords(const std::int16_t* raw, std::size_t n, const WaveformScaling& s, double* out);

// The same conversion of a record as the instrument sends it: 2 * n bytes,
// each word most significant byte first.
bool ConvertWordsMsbFirst(const std::uint8_t* raw, std::size_t n, const WaveformScaling& s,
                          double* out);

// The conversion of a record of (minimum, maximum) pairs sent most
// significant byte first: word 2k goes to min[k], word 2k + 1 to max[k], for
// k < pairs.
bool ConvertWordPairsMsbFirst(const std::uint8_t* raw, std::size_t pairs,
                              const WaveformScaling& s, double* min, double* max);

// out[i] = 1.0 when bit `bit` (0..7) of raw[i] is set, else 0.0.
void ExtractBit(const std::uint8_t* raw, std::size_t n, int bit, double* out);

// Parses a ":WAV:PRE?" reply: double quotes removed, fields split at commas;
// field 5 x increment, 6 x origin, 8 y increment, 9 y origin, 10 y
// reference. False when a needed field is missing, is not a number or is not
// finite, or the y reference is not a 32-bit integer.
bool ParsePreamble(std::string_view reply, WaveformScaling* out);

}  // namespace qn

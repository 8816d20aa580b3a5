// The conversion kernels against the plain scaling formula, bit for bit, and
// the preamble parser.
#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <random>
#include <vector>

#include "scope/waveform_scaling.h"

namespace qn::test {
namespace {

// The formula as written, each operation rounded on its own.
double Plain(std::int16_t v, const WaveformScaling& s) {
    volatile double d = static_cast<double>(v) - static_cast<double>(s.y_reference);
    volatile double m = d * s.y_increment;
    return m + s.y_origin;
}

bool SameBits(double a, double b) { return std::memcmp(&a, &b, sizeof a) == 0; }

// Scalings with negative, positive and zero origins and references, at full
// precision.
constexpr WaveformScaling kScalings[] = {
    {0, 0, 0.0, 1e-4, 16384},
    {0, 0, 0.12345678901234567, 3.3333333333333333e-5, -17},
    {0, 0, -2.5, 0.1 / 3.0, 0},
    {0, 0, 1e-300, 7.123e-12, 32768},
};

// Random words with an invalid point at index 3 (when there is one).
std::vector<std::int16_t> RandomWords(std::size_t n, std::mt19937& gen) {
    std::uniform_int_distribution<int> dist(-32767, 32767);
    std::vector<std::int16_t> raw(n);
    for (auto& v : raw) v = static_cast<std::int16_t>(dist(gen));
    if (n > 3) raw[3] = kInvalidWord;
    return raw;
}

void ExpectPoint(double got, std::int16_t raw, const WaveformScaling& s, std::size_t i) {
    if (raw == kInvalidWord) {
        EXPECT_TRUE(std::isnan(got)) << i;
    } else {
        EXPECT_TRUE(SameBits(got, Plain(raw, s))) << i << ": " << raw << " gave " << got;
    }
}

std::vector<std::uint8_t> MsbFirst(const std::vector<std::int16_t>& words) {
    std::vector<std::uint8_t> bytes;
    for (std::int16_t w : words) {
        bytes.push_back(std::uint8_t(static_cast<std::uint16_t>(w) >> 8));
        bytes.push_back(std::uint8_t(w & 0xFF));
    }
    return bytes;
}

// Lengths around the 16-word steps of the vector kernel, outputs starting at
// every alignment, invalid points inside and outside the first step, and
// records large enough to be written past the cache.
TEST(WaveformConvert, WordsAndPairsMatchThePlainFormulaBitForBitWithNaNForInvalid) {
    std::mt19937 gen(7);
    for (const WaveformScaling& s : kScalings) {
        SCOPED_TRACE(s.y_origin);
        for (std::size_t n : {0u, 1u, 7u, 15u, 16u, 17u, 33u, 1001u, 1200000u}) {
            std::vector<std::int16_t> raw = RandomWords(n, gen);
            if (n > 40) raw[40] = raw[n - 1] = kInvalidWord;
            const std::vector<std::uint8_t> wire = MsbFirst(raw);
            std::vector<double> out(n, 99.0);
            EXPECT_EQ(ConvertWords(raw.data(), n, s, out.data()), n > 3);
            for (std::size_t i = 0; i < n; ++i) ExpectPoint(out[i], raw[i], s, i);
            for (std::size_t shift : {0u, 1u, 2u, 3u}) {
                SCOPED_TRACE(shift);
                std::vector<double> msb(n + shift + 1, 99.0);
                EXPECT_EQ(ConvertWordsMsbFirst(wire.data(), n, s, msb.data() + shift), n > 3);
                for (std::size_t i = 0; i < n; ++i) ExpectPoint(msb[shift + i], raw[i], s, i);
                EXPECT_EQ(msb[shift + n], 99.0);
                EXPECT_EQ(msb[0], shift ? 99.0 : msb[0]);
            }

            const std::size_t pairs = n / 2;
            std::vector<double> lo(pairs, 99.0), hi(pairs, 99.0);
            EXPECT_EQ(ConvertWordPairsMsbFirst(wire.data(), pairs, s, lo.data(), hi.data()),
                      pairs > 1);
            for (std::size_t k = 0; k < pairs; ++k) {
                ExpectPoint(lo[k], raw[2 * k], s, 2 * k);
                ExpectPoint(hi[k], raw[2 * k + 1], s, 2 * k + 1);
            }
        }
    }
}

TEST(WaveformConvert, EachBitAloneAndAllBits) {
    for (int bit = 0; bit < 8; ++bit) {
        std::vector<std::uint8_t> raw;
        for (int other = 0; other < 8; ++other) raw.push_back(std::uint8_t(1u << other));
        raw.push_back(0x00);
        raw.push_back(0xFF);
        raw.push_back(std::uint8_t(~(1u << bit)));
        std::vector<double> expected(8, 0.0);
        expected[std::size_t(bit)] = 1.0;
        expected.insert(expected.end(), {0.0, 1.0, 0.0});
        std::vector<double> out(raw.size(), 99.0);
        ExtractBit(raw.data(), raw.size(), bit, out.data());
        EXPECT_EQ(out, expected) << "bit " << bit;
    }
}

// The reference code gives the origin; the pair split keeps min before max.
TEST(WaveformConvert, ReferenceCodeGivesTheOrigin) {
    const WaveformScaling s{0, 0, -0.5, 1e-4, 16384};
    const std::int16_t raw[] = {16384, 26384, 6384, kInvalidWord};
    double out[4], lo[2], hi[2];
    EXPECT_TRUE(ConvertWords(raw, 4, s, out));
    EXPECT_EQ(out[0], -0.5);
    EXPECT_DOUBLE_EQ(out[1], 0.5);
    EXPECT_DOUBLE_EQ(out[2], -1.5);
    const std::vector<std::uint8_t> wire = MsbFirst({raw, raw + 4});
    EXPECT_TRUE(ConvertWordPairsMsbFirst(wire.data(), 2, s, lo, hi));
    EXPECT_EQ(lo[0], -0.5);
    EXPECT_DOUBLE_EQ(hi[0], 0.5);
    EXPECT_DOUBLE_EQ(lo[1], -1.5);
    EXPECT_TRUE(std::isnan(hi[1]));
}

TEST(WaveformPreamble, FieldsAndRefusals) {
    WaveformScaling s;
    ASSERT_TRUE(ParsePreamble("\"1,0,1000,1,2.0E-06,-1.0E-03,0,1.25E-04,0.5,16384\"", &s));
    EXPECT_EQ(s.x_increment, 2e-6);
    EXPECT_EQ(s.x_origin, -1e-3);
    EXPECT_EQ(s.y_increment, 1.25e-4);
    EXPECT_EQ(s.y_origin, 0.5);
    EXPECT_EQ(s.y_reference, 16384);
    const char* bad[] = {
        "",
        "1,0,1000,1,2e-6,0,0,1e-4,0",          // nine fields
        "1,0,1000,1,x,0,0,1e-4,0,0",           // not a number
        "1,0,1000,1,2e-6,0,0,1e-4,0,1.5",      // fractional reference
        "1,0,1000,1,2e-6,0,0,1e-4,0,9e99",     // reference beyond 32 bits
        "1,0,1000,1,2e-6,0,0,INF,0,0",         // not finite
    };
    for (const char* text : bad) EXPECT_FALSE(ParsePreamble(text, &s)) << text;
}

}  // namespace
}  // namespace qn::test

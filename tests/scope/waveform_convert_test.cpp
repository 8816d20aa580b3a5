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

TEST(WaveformConvert, WordsMatchThePlainFormulaBitForBitWithNaNForInvalid) {
    const WaveformScaling scalings[] = {
        {0, 0, 0.0, 1e-4, 16384},
        {0, 0, 0.123456789, 3.3333333333333e-5, -17},
        {0, 0, -2.5, 0.1 / 3.0, 0},
        {0, 0, 1e-300, 7.123e-12, 32768},
    };
    std::mt19937 gen(7);
    std::uniform_int_distribution<int> dist(-32768, 32767);
    for (const WaveformScaling& s : scalings) {
        // Odd lengths exercise the vector loop's remainder.
        for (std::size_t n : {0u, 1u, 7u, 1001u}) {
            std::vector<std::int16_t> raw(n);
            for (auto& v : raw) v = static_cast<std::int16_t>(dist(gen));
            if (n > 3) raw[3] = kInvalidWord;
            std::vector<double> out(n, 99.0);
            const bool invalid = ConvertWords(raw.data(), n, s, out.data());
            EXPECT_EQ(invalid, n > 3);
            for (std::size_t i = 0; i < n; ++i) {
                if (raw[i] == kInvalidWord) {
                    ASSERT_TRUE(std::isnan(out[i])) << i;
                } else {
                    ASSERT_TRUE(SameBits(out[i], Plain(raw[i], s))) << i << " " << raw[i];
                }
            }
        }
    }
}

TEST(WaveformConvert, ReferenceCodeMapsToOriginAndPairsSplit) {
    const WaveformScaling s{0, 0, 0.0, 1e-4, 16384};
    const std::int16_t raw[] = {16384, 26384, kInvalidWord, 6384, 1};
    double out[5];
    ConvertWords(raw, 5, s, out);
    EXPECT_EQ(out[0], 0.0);
    EXPECT_EQ(out[1], 1.0);
    double lo[2], hi[2];
    EXPECT_TRUE(ConvertWordPairs(raw, 2, s, lo, hi));
    EXPECT_EQ(lo[0], 0.0);
    EXPECT_EQ(hi[0], 1.0);
    EXPECT_TRUE(std::isnan(lo[1]));
    EXPECT_TRUE(SameBits(hi[1], Plain(6384, s)));
    EXPECT_FALSE(ConvertWordPairs(raw, 1, s, lo, hi));
}

TEST(WaveformConvert, BytesGiveTheSelectedBit) {
    const std::uint8_t raw[] = {0x00, 0x04, 0xFB, 0xFF};
    double out[4];
    ExtractBit(raw, 4, 2, out);
    EXPECT_EQ(std::vector<double>(out, out + 4), (std::vector<double>{0, 1, 0, 1}));
    ExtractBit(raw, 4, 7, out);
    EXPECT_EQ(std::vector<double>(out, out + 4), (std::vector<double>{0, 0, 1, 1}));
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

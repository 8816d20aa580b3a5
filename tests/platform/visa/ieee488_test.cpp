#include "platform/visa/ieee488.h"

#include <gtest/gtest.h>

#include <cmath>

namespace qn::visa {
namespace {

struct HeaderCase {
    std::string_view bytes;
    std::uint64_t max;
    BlockParse result;
    bool indefinite;
    std::uint64_t length;
    std::size_t header_size;
};

constexpr std::uint64_t kBig = 1u << 30;

constexpr HeaderCase kHeaders[] = {
    {"#15abcde", kBig, BlockParse::kOk, false, 5, 3},
    {"#210\n\n\n", kBig, BlockParse::kOk, false, 10, 4},
    {"#9000000010", kBig, BlockParse::kOk, false, 10, 11},
    {"#10", kBig, BlockParse::kOk, false, 0, 3},
    {"#0abc\n", kBig, BlockParse::kOk, true, 0, 2},
    {"#41000", 1000, BlockParse::kOk, false, 1000, 6},  // exactly the bound
    {"#41001", 1000, BlockParse::kTooLarge, false, 0, 0},
    {"#9999999999", 1000, BlockParse::kTooLarge, false, 0, 0},
    {"", kBig, BlockParse::kNeedMore, false, 0, 0},
    {"#", kBig, BlockParse::kNeedMore, false, 0, 0},
    {"#3", kBig, BlockParse::kNeedMore, false, 0, 0},
    {"#312", kBig, BlockParse::kNeedMore, false, 0, 0},
    {"#A12", kBig, BlockParse::kMalformed, false, 0, 0},
    {"#-5", kBig, BlockParse::kMalformed, false, 0, 0},
    {"#3 12", kBig, BlockParse::kMalformed, false, 0, 0},
    {"#31x2", kBig, BlockParse::kMalformed, false, 0, 0},
    {"#5123\n", kBig, BlockParse::kMalformed, false, 0, 0},  // truncated by the terminator
    {"12345", kBig, BlockParse::kNotBlock, false, 0, 0},
    {" #15abcde", kBig, BlockParse::kNotBlock, false, 0, 0},
};

TEST(BlockHeaderTest, EveryFormTruncatedAndLying) {
    for (const HeaderCase& c : kHeaders) {
        BlockHeader h;
        EXPECT_EQ(ParseBlockHeader(c.bytes, c.max, &h), c.result) << c.bytes;
        if (c.result != BlockParse::kOk) continue;
        EXPECT_EQ(h.indefinite, c.indefinite) << c.bytes;
        EXPECT_EQ(h.length, c.length) << c.bytes;
        EXPECT_EQ(h.header_size, c.header_size) << c.bytes;
    }
}

struct NumberCase {
    std::string_view text;
    bool at_end;
    NumberParse result;
    double value;
    std::size_t consumed;
};

const double kInf = INFINITY;

const NumberCase kNumbers[] = {
    {"42", true, NumberParse::kOk, 42, 2},
    {"+42\n", false, NumberParse::kOk, 42, 3},
    {"-2.5,", false, NumberParse::kOk, -2.5, 4},
    {"1.5E+03;", false, NumberParse::kOk, 1500, 7},
    {"1.5e-3 ", false, NumberParse::kOk, 0.0015, 6},
    {"9.91E37\n", false, NumberParse::kOk, 9.91e37, 7},
    {".5", true, NumberParse::kOk, 0.5, 2},
    {"5.", true, NumberParse::kOk, 5, 2},
    {"1E", true, NumberParse::kOk, 1, 1},  // the E belongs to what follows
    {"1E+x", false, NumberParse::kOk, 1, 1},
    {"2.7V", false, NumberParse::kOk, 2.7, 3},
    {"#H1F,", false, NumberParse::kOk, 31, 4},
    {"#hff", true, NumberParse::kOk, 255, 4},
    {"#Q17\n", false, NumberParse::kOk, 15, 4},
    {"#B101\n", false, NumberParse::kOk, 5, 5},
    {"#HFFFFFFFFFFFFFFFF", true, NumberParse::kOk, 18446744073709551615.0, 18},
    {"#H10000000000000000", true, NumberParse::kNoNumber, 0, 0},
    {"INF\n", false, NumberParse::kOk, kInf, 3},
    {"-inf", true, NumberParse::kOk, -kInf, 4},
    {"+Infinity,", false, NumberParse::kOk, kInf, 9},
    {"1e999", true, NumberParse::kOk, kInf, 5},
    {"-1e999", true, NumberParse::kOk, -kInf, 6},
    {"1e-999", true, NumberParse::kOk, 0, 6},
    // Could still grow: the caller must wait for more text.
    {"42", false, NumberParse::kNeedMore, 0, 0},
    {"1.5E", false, NumberParse::kNeedMore, 0, 0},
    {"1.5E+", false, NumberParse::kNeedMore, 0, 0},
    {"-", false, NumberParse::kNeedMore, 0, 0},
    {"", false, NumberParse::kNeedMore, 0, 0},
    {"#", false, NumberParse::kNeedMore, 0, 0},
    {"#H1", false, NumberParse::kNeedMore, 0, 0},
    {"IN", false, NumberParse::kNeedMore, 0, 0},
    {"INF", false, NumberParse::kNeedMore, 0, 0},
    // Not numbers.
    {"", true, NumberParse::kNoNumber, 0, 0},
    {"-", true, NumberParse::kNoNumber, 0, 0},
    {".", true, NumberParse::kNoNumber, 0, 0},
    {"+.e5", true, NumberParse::kNoNumber, 0, 0},
    {"ON", true, NumberParse::kNoNumber, 0, 0},
    {" 1", true, NumberParse::kNoNumber, 0, 0},
    {"#X12", true, NumberParse::kNoNumber, 0, 0},
    {"#H", true, NumberParse::kNoNumber, 0, 0},
    {"#HG", true, NumberParse::kNoNumber, 0, 0},
    {"IN", true, NumberParse::kNoNumber, 0, 0},
};

TEST(NumberParseTest, InstrumentNumberForms) {
    for (const NumberCase& c : kNumbers) {
        double v = -123;
        std::size_t used = 999;
        NumberParse r = ParseNumber(c.text, c.at_end, &v, &used);
        EXPECT_EQ(r, c.result) << "'" << c.text << "'";
        if (r != NumberParse::kOk || c.result != NumberParse::kOk) continue;
        EXPECT_EQ(used, c.consumed) << c.text;
        EXPECT_DOUBLE_EQ(v, c.value) << c.text;
    }
}

TEST(NumberParseTest, NanAndLongMantissa) {
    double v = 0;
    std::size_t used = 0;
    ASSERT_EQ(ParseNumber("nan,", false, &v, &used), NumberParse::kOk);
    EXPECT_TRUE(std::isnan(v));
    std::string digits(400, '9');
    ASSERT_EQ(ParseNumber(digits, true, &v, &used), NumberParse::kOk);
    EXPECT_EQ(used, digits.size());
    EXPECT_TRUE(std::isinf(v));
}

}  // namespace
}  // namespace qn::visa

#include <gtest/gtest.h>

#include <cmath>
#include <cstdio>

#include "io/command_format.h"
#include "io/reply_number.h"

namespace qn {
namespace {

TEST(ReplyNumber, ParsesTheLeadingDecimalNumber) {
    struct Case {
        const char* reply;
        bool found;
        double value;
        LONG as_long;
    };
    const Case cases[] = {
        {"", false, 0, 0},
        {"abc", false, 0, 0},
        {"  +4", true, 4, 4},
        {"2.7", true, 2.7, 2},
        {"-2.7", true, -2.7, -2},
        {"1E0", true, 1, 1},
        {"1.00000E+00\n", true, 1, 1},
        {"1e", true, 1, 1},            // an exponent needs digits
        {"-.5V", true, -0.5, 0},
        {"+9.9E37", true, 9.9e37, 2147483647},  // saturates
        {"-1e400", true, -HUGE_VAL, -2147483647 - 1},
        {"1e-400", true, 0, 0},
        {".", false, 0, 0},
        {"+-1", false, 0, 0},
        {"12,34", true, 12, 12},
        {"0x10", true, 0, 0},          // no hexadecimal: stops at the x
        {"nan", false, 0, 0},
    };
    for (const Case& c : cases) {
        ReplyNumber n = ParseReplyNumber(c.reply);
        EXPECT_EQ(n.found, c.found) << c.reply;
        EXPECT_EQ(n.value, c.value) << c.reply;
        EXPECT_EQ(ReplyToLong(n), c.as_long) << c.reply;
    }
}

TEST(ReplyNumber, TypedConversions) {
    EXPECT_TRUE(std::isnan(ReplyToDouble(ParseReplyNumber("OFF"))));
    EXPECT_EQ(ReplyToShort(ParseReplyNumber("65537")), 1);  // low 16 bits
    EXPECT_TRUE(ReplyToBool(ParseReplyNumber("1")));
    EXPECT_FALSE(ReplyToBool(ParseReplyNumber("0")));
    EXPECT_FALSE(ReplyToBool(ParseReplyNumber("256")));  // low 8 bits
    EXPECT_EQ(ReplyToFloat(ParseReplyNumber("0.1")), 0.1f);
}

TEST(CommandFormat, FillsConversionsByArgumentType) {
    EXPECT_EQ(FormatCommandArgs(":CHAN%d:RANG %.15g", 2, 0.1), ":CHAN2:RANG 0.1");
    EXPECT_EQ(FormatCommandArgs(":TIM:RANG %.15g", 1e-3), ":TIM:RANG 0.001");
    EXPECT_EQ(FormatCommandArgs(":CHAN%i:LAB \"%s\"", 1, std::string_view("A")), ":CHAN1:LAB \"A\"");
    EXPECT_EQ(FormatCommandArgs("100%% %d", 5), "100% 5");
    // A mismatched table entry gives a wrong text, never undefined behaviour.
    EXPECT_EQ(FormatCommandArgs("%s %d", 1.5, std::string_view("x")), "1.5 x");
    EXPECT_EQ(FormatCommandArgs("%d %d", 1), "1 ");
    EXPECT_EQ(FormatCommandArgs("%q %d", 3), "%q 3");
    EXPECT_EQ(FormatCommandArgs("%999999999d", 3), "%999999999d");
    EXPECT_EQ(FormatCommandArgs("end %"), "end %");
}

// Long conversions are formatted completely, never cut at a buffer's size.
TEST(CommandFormat, LongConversionsAreNeverCut) {
    char f_text[512], e_text[512];
    std::snprintf(f_text, sizeof f_text, "%f", -1e300);
    std::snprintf(e_text, sizeof e_text, "%.300e", 1.0 / 3);
    const std::string text(1000, 'a');
    struct Case {
        std::string got, want;
    };
    const Case cases[] = {
        {FormatCommandArgs(":V %f", -1e300), ":V " + std::string(f_text)},
        {FormatCommandArgs(":V %.300e", 1.0 / 3), ":V " + std::string(e_text)},
        {FormatCommandArgs(":V %200d;", 42), ":V " + std::string(198, ' ') + "42;"},
        {FormatCommandArgs(":V %-130i;", -7), ":V -7" + std::string(128, ' ') + ";"},
        {FormatCommandArgs(":V %.17g", 0.1), ":V 0.10000000000000001"},
        {FormatCommandArgs(":L \"%s\"", std::string_view(text)), ":L \"" + text + "\""},
    };
    for (const Case& c : cases) EXPECT_EQ(c.got, c.want);
    EXPECT_GT(cases[0].got.size(), 300u);
}

}  // namespace
}  // namespace qn

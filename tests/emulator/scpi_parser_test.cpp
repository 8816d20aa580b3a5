#include "emulator/scpi_parser.h"

#include <gtest/gtest.h>

namespace qn::emu {
namespace {

TEST(MessageFramer, BlocksMayHoldTerminatorsAndInputMayArriveInPieces) {
    const std::string wire = std::string(":DATA #15a\nb;c\n*IDN?\n") + "partial";
    MessageFramer framer;
    for (char c : wire) framer.Append(std::string_view(&c, 1));  // worst-case chunking
    EXPECT_EQ(framer.Next(), ":DATA #15a\nb;c");
    EXPECT_EQ(framer.Next(), "*IDN?");
    EXPECT_EQ(framer.Next(), std::nullopt);
    framer.Append("\n");
    EXPECT_EQ(framer.Next(), "partial");
}

TEST(MessageFramer, BlockHeaderSplitAcrossReadsIsHonoured) {
    MessageFramer framer;
    framer.Append(":D #2");
    EXPECT_EQ(framer.Next(), std::nullopt);
    framer.Append("03\n\n\n\n");
    EXPECT_EQ(framer.Next(), ":D #203\n\n\n");
}

TEST(SplitUnits, SeparatorsInsideStringsAndBlocksDoNotSplit) {
    const auto units = SplitUnits(R"(:A "x;y";:B #13;;;;C 'q;')");
    ASSERT_EQ(units.size(), 3u);
    EXPECT_EQ(units[0], R"(:A "x;y")");
    EXPECT_EQ(units[1], ":B #13;;;");
    EXPECT_EQ(units[2], "C 'q;'");
}

TEST(ParseUnit, HeadersArgumentsAndErrors) {
    struct Case {
        const char* text;
        int error;  // 0: parses
        std::size_t mnemonics;
        std::size_t args;
    };
    const Case cases[] = {
        {" :CHAN1:RANG 5", 0, 2, 1},
        {"*idn?", 0, 1, 0},
        {"SYST:DATA:VAL? \"A\"\"B\"", 0, 3, 1},
        {":WAV:POIN MAX, 2000", 0, 2, 2},
        {":X #14abcd, 7", 0, 1, 2},
        {":X #15abcd", -161, 0, 0},  // block shorter than declared
        {":X 1,", -102, 0, 0},
        {":X \"open", -102, 0, 0},
        {":A::B", -102, 0, 0},
        {":A$B", -101, 0, 0},
        {"*", -102, 0, 0},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.text);
        const UnitParse p = ParseUnit(c.text);
        if (c.error != 0) {
            ASSERT_TRUE(p.error.has_value());
            EXPECT_EQ(p.error->code, c.error);
            continue;
        }
        ASSERT_TRUE(p.unit.has_value());
        EXPECT_EQ(p.unit->mnemonics.size(), c.mnemonics);
        EXPECT_EQ(p.unit->args.size(), c.args);
    }
    EXPECT_EQ(ParseUnit(R"(L "A""B")").unit->args[0].value, "A\"B");
    EXPECT_EQ(ParseUnit(":X #14a\nc;").unit->args[0].value, "a\nc;");
}

}  // namespace
}  // namespace qn::emu

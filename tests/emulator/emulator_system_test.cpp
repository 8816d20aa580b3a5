// System, display, marker and external-input commands over the socket: the clock, setups
// that restore the state they came from, the screen image, and the marker sources.
#include <gtest/gtest.h>

#include <cstdint>

#include "emulator/models.h"
#include "emulator/setup_block.h"
#include "tests/emulator/scpi_client.h"

namespace qn::emu {
namespace {

using namespace test;

std::string Block(const std::string& payload) {
    const std::string length = std::to_string(payload.size());
    return "#" + std::to_string(length.size()) + length + payload;
}

std::uint32_t Le32(const std::string& s, std::size_t at) {
    std::uint32_t v = 0;
    for (int i = 3; i >= 0; --i) v = v << 8 | static_cast<std::uint8_t>(s[at + std::size_t(i)]);
    return v;
}

TEST(EmulatorSystem, ClockReadsBackWhatWasSetAndRefusesImpossibleValues) {
    Session s("QDS4034A");
    auto& c = s.client;
    c.Send(":SYST:DATE 2026,12,6;:SYST:TIME 23,59,58");
    EXPECT_EQ(c.Query(":SYST:DATE?;:SYST:TIME?"), "+2026,+12,+6;+23,+59,+58");
    c.Send(":SYST:DATE 2026,13,1");
    c.Send(":SYST:TIME 24,0,0");
    EXPECT_EQ(c.Query(":SYST:DATE?;:SYST:TIME?"), "+2026,+12,+6;+23,+59,+58");
    EXPECT_EQ(c.Query("SYST:ERR?"), R"(-222,"Data out of range")");
    EXPECT_EQ(c.Query("SYST:ERR?"), R"(-222,"Data out of range")");
    EXPECT_FALSE(c.Query(":SER?").empty());
}

TEST(EmulatorSystem, SetupBlockRestoresTheStateItCameFrom) {
    Session s("QDS4034A");
    auto& c = s.client;
    c.Send(":CHAN2:DISP 1;:CHAN2:RANG 0.123456789012345;:TIM:POS -2.5E-5;:DISP:LAB 1");
    c.Send(":MARK:MODE MAN;:MARK:X1Y1 CHAN2;:MARK:X2P 1.25E-6;:EXT:PROB 10;:EXT:UNIT AMP");
    const std::string setup = ReadBlock(c, ":SYST:SET?");
    c.Send("*RST");
    ASSERT_EQ(c.Query(":CHAN2:RANG?;:MARK:MODE?;:EXT:UNIT?"), "8;OFF;VOLT");
    c.Send(":SYST:SET " + Block(setup));
    EXPECT_EQ(c.Query(":CHAN2:DISP?;:CHAN2:RANG?;:TIM:POS?;:DISP:LAB?"),
              "1;0.123456789012345;-2.5E-05;1");
    EXPECT_EQ(c.Query(":MARK:MODE?;:MARK:X1Y1?;:MARK:X2P?;:EXT:PROB?;:EXT:UNIT?"),
              "MAN;CHAN2;1.25E-06;10;AMP");
    EXPECT_EQ(c.Query("SYST:ERR?"), kNoError);
    EXPECT_EQ(ReadBlock(c, ":SYST:SET?"), setup);
}

TEST(EmulatorSystem, SetupsThatAreNotSetupsChangeNothing) {
    Session s("QDS4034A");
    auto& c = s.client;
    const std::string good = ReadBlock(c, ":SYST:SET?");
    std::string forged = good;
    forged.replace(forged.find("channel1.range=8"), 16, "channel1.range=-8");
    std::string unterminated = good;
    unterminated.pop_back();
    const std::string payloads[] = {
        "not a setup\n", forged, unterminated,
        good.substr(0, good.find("channel2")),  // settings missing
    };
    c.Send(":CHAN1:RANG 4");
    for (const std::string& p : payloads) {
        c.Send(":SYST:SET " + Block(p));
        EXPECT_EQ(c.Query("SYST:ERR?"), R"(-230,"Data corrupt or stale")");
        EXPECT_EQ(c.Query(":CHAN1:RANG?"), "4");
    }
}

TEST(EmulatorSystem, DecodedSetupsAreBoundedAndComplete) {
    const ModelInfo model = *LookUpModel("QDS4034A");
    ScopeSettings changed;
    changed.channels[3].label = "a\nb\\c";
    changed.markers.y2 = -0.30000000000000004;
    const auto back = DecodeSetup(EncodeSetup(changed), model);
    ASSERT_TRUE(back);
    EXPECT_EQ(back->channels[3].label, "a\nb\\c");
    EXPECT_EQ(back->markers.y2, -0.30000000000000004);
    // Unknown lines are ignored: a setup of exactly the largest size decodes, one byte more not.
    std::string padded = EncodeSetup(changed) + "pad=";
    padded += std::string(kMaxSetupBytes - padded.size() - 1, 'x') + "\n";
    EXPECT_TRUE(DecodeSetup(padded, model));
    padded.insert(padded.size() - 1, "x");
    EXPECT_FALSE(DecodeSetup(padded, model));
    std::string nan = EncodeSetup(changed);
    nan.replace(nan.find("marker.x1=0"), 11, "marker.x1=nan");
    EXPECT_FALSE(DecodeSetup(nan, model));
}

TEST(EmulatorSystem, ScreenImageIsABitmapWithTheTraces) {
    Session s("QDS4034A");
    auto& c = s.client;
    c.Send(":CHAN1:DISP 1;:DIG");
    const std::string bmp = ReadBlock(c, ":DISP:DATA? BMP,SCR");
    ASSERT_GT(bmp.size(), 54u);
    EXPECT_EQ(bmp.substr(0, 2), "BM");
    EXPECT_EQ(Le32(bmp, 2), bmp.size());
    EXPECT_EQ(Le32(bmp, 10), 54u);  // pixels follow the two headers
    EXPECT_EQ(Le32(bmp, 18), 640u);
    EXPECT_EQ(Le32(bmp, 22), 480u);
    EXPECT_EQ(static_cast<std::uint8_t>(bmp[28]), 24);
    // Channel 1's trace colour (BGR 0,230,255) is on screen.
    bool trace = false;
    for (std::size_t i = 54; i + 2 < bmp.size() && !trace; i += 3) {
        trace = bmp.compare(i, 3, std::string("\x00\xE6\xFF", 3)) == 0;
    }
    EXPECT_TRUE(trace);
}

TEST(EmulatorSystem, MarkerSourcesAreAnalogChannels) {
    Session s("QDS4034A");
    auto& c = s.client;
    c.Send(":MARK:X1Y1 CHAN3;:MARK:X2Y2 channel4");
    EXPECT_EQ(c.Query(":MARK:X1Y1?;:MARK:X2Y2?"), "CHAN3;CHAN4");
    c.Send(":MARK:X1Y1 MATH");
    EXPECT_EQ(c.Query("SYST:ERR?;:MARK:X1Y1?"), std::string(kIllegal) + ";CHAN3");
}

INSTANTIATE_TEST_SUITE_P(
    System, Refusals,
    ::testing::Values(
        Refusal{"QDS4034A", ":MARK:X1Y2 CHAN1", R"(-114,"Header suffix out of range")"},
        Refusal{"QDS4034A", ":DISP:DATA? PNG,SCR", kIllegal}));

TEST(EmulatorSystem, SavedSlotsHoldTheDisplayAndMarkerSettings) {
    Session s("QDS4034A");
    auto& c = s.client;
    c.Send(":DISP:PERS INF;:MARK:Y1P 0.5;*SAV 4;*RST");
    EXPECT_EQ(c.Query(":DISP:PERS?;:MARK:Y1P?"), "MIN;0");
    c.Send("*RCL 4");
    EXPECT_EQ(c.Query(":DISP:PERS?;:MARK:Y1P?"), "INF;0.5");
}

}  // namespace
}  // namespace qn::emu

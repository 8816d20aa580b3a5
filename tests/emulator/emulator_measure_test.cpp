// The measurement and digital-channel commands over the socket: what each
// model accepts and refuses, the definitions read back as written, pods and
// their channels switching together, and the activity flags.
#include <gtest/gtest.h>

#include "tests/emulator/scpi_client.h"

namespace qn::emu {
namespace {

using namespace test;

INSTANTIATE_TEST_SUITE_P(
    Measure, Refusals,
    ::testing::Values(
        Refusal{"QMS4034A", ":MEAS:DEF THR,PERC,90,50,10", nullptr},
        Refusal{"QMS4034A", ":MEAS:DEF THR,PERC,10,50,90", kOutOfRange},
        Refusal{"QMS4034A", ":MEAS:DEF THR,PERC,90,50,50", kOutOfRange},
        Refusal{"QMS4034A", ":MEAS:DEF THR,VOLT,90,50,10", kIllegal},
        Refusal{"QMS4034A", ":MEAS:DEF THR,ABS,2,0", R"(-109,"Missing parameter")"},
        Refusal{"QMS4034A", ":MEAS:DEF DEL,1,-2", nullptr},
        Refusal{"QMS4034A", ":MEAS:DEF DEL,1,X", R"(-104,"Data type error")"},
        Refusal{"QMS4034A", ":MEAS:DEF DEL,1001,1", kOutOfRange},
        Refusal{"QMS4034A", ":MEAS:SOUR DIG15,CHAN4", nullptr},
        Refusal{"QMS4034A", ":MEAS:SOUR DIG16", kIllegal},
        Refusal{"QMS4034A", ":MEAS:SOUR DIG", kIllegal},
        Refusal{"QDS4034A", ":MEAS:SOUR DIG0", kIllegal},
        Refusal{"QMS4034A", ":DIG0:DISP 1;:DIG15:LAB \"CLK\";:DIG7:THR -1.5", nullptr},
        Refusal{"QMS4034A", ":DIG16:DISP 1", R"(-114,"Header suffix out of range")"},
        Refusal{"QMS4034A", ":DIG3:THR 9", kOutOfRange},
        Refusal{"QDS4034A", ":DIG0:DISP 1", R"(-113,"Undefined header")"},
        Refusal{"QDS4034A", ":ACT?", R"(-113,"Undefined header")"},
        Refusal{"73122D", ":ACT", nullptr},
        Refusal{"QMS4034A", ":MEAS:FREQ? CHAN5", kIllegal},
        Refusal{"QMS4034A", ":MEAS:TEDG? ONE, CHAN1", R"(-104,"Data type error")"},
        Refusal{"QMS4034A", ":EMUL:INP4 SQU,1E3,2,0", nullptr},
        Refusal{"QDS4032A", ":EMUL:INP3 SIN,1E3,2,0", R"(-114,"Header suffix out of range")"},
        Refusal{"QMS4034A", ":EMUL:INP1 TRI,1E3,2,0", kIllegal}));

TEST(EmulatorMeasure, DefinitionsAndSourcesReadBack) {
    Session s("QMS4034A");
    auto& c = s.client;
    EXPECT_EQ(c.Query(":MEAS:DEF? THR"), "THR,PERC,90,50,10");
    EXPECT_EQ(c.Query(":MEAS:DEF? DEL"), "1,1");
    EXPECT_EQ(c.Query(":MEAS:SOUR?"), "CHAN1,CHAN2");
    c.Send(":MEAS:DEF THR,ABSOLUTE,1.25,0.5,-0.125;:MEAS:DEF DEL,-3,2;:MEAS:SOUR CHAN3,CHAN4");
    c.Send(":MEAS:SOUR DIG9");  // one source keeps the second
    EXPECT_EQ(c.Query(":MEAS:DEF? THR"), "THR,ABS,1.25,0.5,-0.125");
    EXPECT_EQ(c.Query(":MEAS:DEF? DEL"), "-3,2");
    EXPECT_EQ(c.Query(":MEAS:SOUR?"), "DIG9,CHAN4");
    // *RST returns the subsystem to its defaults.
    c.Send("*RST");
    EXPECT_EQ(c.Query(":MEAS:SOUR?"), "CHAN1,CHAN2");
    EXPECT_EQ(c.Query("SYST:ERR?"), kNoError);
}

TEST(EmulatorMeasure, PodsAndTheirChannelsSwitchTogether) {
    Session s("QMS4034A");
    auto& c = s.client;
    EXPECT_EQ(c.Query(":STAT? DIG8"), "0");
    c.Send(":POD2:DISP 1");
    EXPECT_EQ(c.Query(":DIG8:DISP?;:DIG15:DISP?;:DIG7:DISP?"), "1;1;0");
    c.Send(":DIG8:DISP 0");
    EXPECT_EQ(c.Query(":POD2:DISP?"), "1");  // seven channels still on
    for (int d = 9; d <= 15; ++d) c.Send(":DIG" + std::to_string(d) + ":DISP 0");
    EXPECT_EQ(c.Query(":POD2:DISP?;:STAT? POD2"), "0;0");
    c.Send(":DIG3:DISP 1");
    EXPECT_EQ(c.Query(":POD1:DISP?;:STAT? DIG3;:STAT? DIG4"), "1;1;0");
    // A hidden channel has no result; a shown one measures its own bit.
    EXPECT_EQ(c.Query(":MEAS:FREQ? DIG4"), "9.9E+37");
    EXPECT_NE(c.Query(":MEAS:FREQ? DIG3"), "9.9E+37");
    EXPECT_EQ(c.Query("SYST:ERR?"), kNoError);
}

TEST(EmulatorMeasure, ActivityFlagsClearUntilTheNextAcquisition) {
    Session s("QMS4034A");
    auto& c = s.client;
    // Every channel of both pods changes in the pattern; the levels are the
    // last point's bits.
    const std::string first = c.Query(":ACT?");
    EXPECT_EQ(first.substr(0, first.find(',')), "65535");
    c.Send(":ACT");
    EXPECT_EQ(c.Query(":ACT?").substr(0, 2), "0,");
    c.Query(":DIG;*OPC?");
    EXPECT_EQ(c.Query(":ACT?").substr(0, 6), "65535,");
}

}  // namespace
}  // namespace qn::emu

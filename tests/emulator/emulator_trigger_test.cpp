// The emulator's trigger subsystem over the socket: compound trigger messages as the driver
// sends them, refusals by range and by feature, and acquisitions that wait for their trigger.
#include <gtest/gtest.h>

#include "tests/emulator/scpi_client.h"

namespace qn::emu {
namespace {

using namespace test;

TEST(EmulatorTrigger, DriverMessagesSetTheirTypesState) {
    Session s("QMS4034A");
    auto& c = s.client;
    c.Send(":TRIG:MODE EDGE;EDGE:SOUR LINE;SLOP NEG");
    EXPECT_EQ(c.Query(":TRIG:MODE?;SOUR?;EDGE:SLOP?"), "EDGE;LINE;NEG");
    c.Send(":TRIG:SOUR DIG15;:TRIG:GLIT:SOUR DIG15");
    c.Send(":TRIG:GLIT:QUAL GRE;:TRIG:GLIT:POL NEG");
    c.Send(":TRIG:GLIT:LESS 1e-12;:TRIG:GLIT:GRE 5e-7");
    EXPECT_EQ(c.Query(":TRIG:GLIT:SOUR?;QUAL?;POL?;LESS?;GRE?"), "DIG15;GRE;NEG;2E-09;5E-07");
    c.Send(":TRIG:MODE DUR;:TRIG:DUR:QUAL OUTR;:TRIG:DUR:RANG 1e-06,3e-06");
    c.Send("TRIG:DUR:PATT 0,131072");
    EXPECT_EQ(c.Query("TRIG:DUR:RANG?;PATT?;QUAL?"), "1E-06,3E-06;0,131072;OUTR");
    c.Send(":TRIG:TV:MODE LINEF2;:TRIG:TV:LINE 37;:TRIG:TV:STAN SEC");
    EXPECT_EQ(c.Query(":TRIGger:TV:MODE?;LINE?;STAN?"), "LINEF2;37;SEC");
    c.Send(":TRIG:SEQ:PATT1 1,3;:TRIG:SEQ:PATT2 1,3");
    c.Send(":TRIG:SEQ:FIND PATT1,ENT,NONE;TRIG PATT2,EXIT,NONE;RES NONE,NONE,NONE;:TRIG:MODE SEQ");
    EXPECT_EQ(c.Query(":TRIG:SEQ:PATT2?;TRIG?;:TRIG:MODE?"), "1,3;PATT2,EXIT,NONE;SEQ");
    c.Send(":TRIG:PATT 2,3,DIG3,POS;:TRIG:MODE PATT");
    EXPECT_EQ(c.Query(":TRIG:PATT?;MODE?"), "2,3,DIG3,POS;PATT");
    c.Send(":TRIG:COUP DC;REJ HFR;NREJ ON");
    EXPECT_EQ(c.Query(":TRIG:COUP?;REJ?;NREJ?"), "DC;HFR;1");
    EXPECT_EQ(c.Query("SYST:ERR?"), kNoError);
    c.Send("*RST");
    EXPECT_EQ(c.Query(":TRIG:MODE?;SOUR?;SWE?;LEV?"), "EDGE;CHAN1;AUTO;0");
}

INSTANTIATE_TEST_SUITE_P(
    Trigger, Refusals,
    ::testing::Values(Refusal{"QDS3014L", ":TRIG:SOUR EXT", kConflict},
                      Refusal{"QDS4032A", ":TRIG:SOUR EXT", nullptr},
                      Refusal{"QDS4032A", ":TRIG:SOUR CHAN3", kOutOfRange},
                      Refusal{"QDS4032A", ":TRIG:SOUR CHAN2", nullptr},
                      Refusal{"QDS4032A", ":TRIG:SOUR DIG0", kOutOfRange},
                      Refusal{"QMS4034A", ":TRIG:SOUR DIG16", kOutOfRange},
                      Refusal{"QDS4032A", ":TRIG:GLIT:SOUR LINE", kIllegal},
                      Refusal{"QDS4032A", ":TRIG:TV:SOUR EXT", kIllegal},
                      Refusal{"QDS4032A", ":TRIG:SWE AUTL", kConflict},
                      Refusal{"QDS2014A", ":TRIG:SWE AUTL", nullptr},
                      Refusal{"QDS2014A", ":TRIG:MODE SEQ", kConflict},
                      Refusal{"QDS2014A", ":TRIG:SEQ:PATT1 1,1", R"(-113,"Undefined header")"},
                      Refusal{"QDS4032A", ":TRIG:SEQ:PATT3 1,1", R"(-114,"Header suffix out of range")"},
                      Refusal{"QDS4032A", ":TRIG:DUR:RANG 2e-6,1e-6", kConflict},
                      Refusal{"QDS4032A", ":TRIG:DUR:RANG 1e-9,1e-6", kOutOfRange},
                      Refusal{"QDS4032A", ":TRIG:TV:LINE 0", kOutOfRange},
                      Refusal{"QDS4032A", ":TRIG:TV:LINE 1126", kOutOfRange},
                      Refusal{"QDS4032A", ":TRIG:PATT 1,2,CHAN1", R"(-109,"Missing parameter")"},
                      Refusal{"QDS4032A", ":TRIG:PATT 1,2,EXT,POS", kIllegal},
                      Refusal{"QDS4032A", ":TRIG:HOLD 1e-9", kOutOfRange},
                      Refusal{"QDS4032A", ":TRIG:LEV 1e6", kOutOfRange}));

TEST(EmulatorTrigger, NormalSweepWaitsForALevelTheSignalReaches) {
    Session s("QDS2014A");
    auto& c = s.client;
    c.Send(":TRIG:SWE NORM;:TRIG:LEV 5;:SING");
    // *OPC? returns once the acquisition time has passed; without a trigger
    // event the acquisition is still running then.
    EXPECT_EQ(c.Query("*OPC?"), "1");
    EXPECT_EQ(c.Query(":OPER:COND?"), "8");
    c.Send(":TRIG:LEV 1");
    EXPECT_EQ(c.Query("*OPC?"), "1");
    EXPECT_EQ(c.Query(":OPER:COND?"), "0");
    // A grounded source never crosses the level; the automatic sweep triggers anyway.
    c.Send(":CHAN1:COUP GND;:TRIG:LEV 0;:SING");
    EXPECT_EQ(c.Query("*OPC?"), "1");
    EXPECT_EQ(c.Query(":OPER:COND?"), "8");
    c.Send(":TRIG:SWE AUTO");
    EXPECT_EQ(c.Query(":OPER:COND?"), "0");
}

}  // namespace
}  // namespace qn::emu

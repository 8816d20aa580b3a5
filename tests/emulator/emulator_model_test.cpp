// Model identity, system-data feature keys per family and the early-family dialect.
#include <gtest/gtest.h>

#include <set>

#include "emulator/emulator.h"
#include "emulator/models.h"
#include "tests/emulator/scpi_client.h"

namespace qn::emu {
namespace {

using test::ScpiClient;

std::string Val(ScpiClient& c, const char* key) {
    return c.Query(std::string(":SYST:DATA:VAL? \"") + key + "\"");
}

TEST(EmulatorModels, TableHolds65ModelsInSevenFamiliesThatIdentifyThemselves) {
    EXPECT_EQ(AllModelNames().size(), 65u);
    std::set<std::string> families;
    for (std::string_view name : AllModelNames()) {
        const auto model = LookUpModel(name);
        ASSERT_TRUE(model) << name;
        families.insert(model->family->name);
        Emulator emu{std::string(name)};
        ScpiClient c(emu.Start());
        const std::string idn = c.Query("*IDN?");
        EXPECT_EQ(idn.substr(0, idn.find(',', 21)), "QUORLEN TECHNOLOGIES," + std::string(name));
    }
    EXPECT_EQ(families.size(), 7u);
    EXPECT_FALSE(LookUpModel("QDS4032"));  // exact names only
}

struct KeyCase {
    const char* model;
    const char* chan;
    const char* pods;
    const char* band;
    const char* bwl;
    const char* chan_feat;
    const char* trig_feat;
    const char* trig_mod;
    const char* anal_feat;
    const char* disp_lab_ver;
    const char* wav_feat_ver;
};

class FeatureKeys : public ::testing::TestWithParam<KeyCase> {};

TEST_P(FeatureKeys, AnswerFromModelNameAndFamily) {
    const KeyCase& k = GetParam();
    Emulator emu(k.model);
    ScpiClient c(emu.Start());
    EXPECT_EQ(Val(c, "COUN:CHAN"), k.chan);
    EXPECT_EQ(Val(c, "COUN:POD"), k.pods);
    EXPECT_EQ(Val(c, "POD:SIZE"), "8");
    EXPECT_EQ(std::stod(Val(c, "CHAN:BAND")), std::stod(k.band));
    EXPECT_EQ(std::stod(Val(c, "CHAN:BWL")), std::stod(k.bwl));
    EXPECT_EQ(Val(c, "CHAN:FEAT"), k.chan_feat);
    EXPECT_EQ(Val(c, "TRIG:FEAT"), k.trig_feat);
    EXPECT_EQ(Val(c, "TRIG:MOD"), k.trig_mod);
    EXPECT_EQ(Val(c, "ANAL:FEAT"), k.anal_feat);
    EXPECT_EQ(c.Query(":SYST:DATA:VER? \"DISP:LAB\""), k.disp_lab_ver);
    EXPECT_EQ(c.Query(":syst:data:version? \"WAV:FEAT\""), k.wav_feat_ver);
    EXPECT_EQ(c.Query("SYST:ERR?"), R"(+0,"No error")");
}

INSTANTIATE_TEST_SUITE_P(
    Families, FeatureKeys,
    ::testing::Values(KeyCase{"QMS4104B", "4", "2", "1e9", "2.5e7", R"("FIFT,PROT,PSK")",
                              R"("EXT,ZONE")", R"("EDGE,GLIT,PATT,TV,RUNT,SEQ")",
                              R"("DDIG,MEAS,FFT")", "1", "1"},
                      KeyCase{"QDS4032A", "2", "0", "3.5e8", "2.5e7", R"("FIFT,PROT,PSK")",
                              R"("EXT")", R"("EDGE,GLIT,PATT,TV,RUNT,SEQ")", R"("DDIG,MEAS")", "1",
                              "1"},
                      KeyCase{"QMS3052A", "2", "2", "5e8", "2e7", R"("FIFT,PROT,PSK")", R"("EXT")",
                              R"("EDGE,GLIT,PATT,TV,RUNT,SEQ")", R"("DDIG,MEAS")", "1", "1"},
                      KeyCase{"QDS3014L", "4", "0", "1e8", "2e7", R"("PSK")", R"("")",
                              R"("EDGE,GLIT,PATT,TV")", R"("DDIG,MEAS")", "1", "0"},
                      KeyCase{"QDS2054A", "4", "0", "5e8", "2e7", R"("GCO,ALEV,PSK")", R"("EXT")",
                              R"("EDGE,GLIT,PATT,TV")", R"("MEAS")", "1", "0"}),
    [](const ::testing::TestParamInfo<KeyCase>& p) { return std::string(p.param.model); });

TEST(EmulatorModels, DisplayLabelAndWaveformFeatureValues) {
    Emulator low("QDS3034L");
    ScpiClient c(low.Start());
    EXPECT_EQ(Val(c, "DISP:LAB"), "0");
    c.Send(":SYST:DATA:VAL? \"WAV:FEAT\"");  // unknown key: no reply, illegal parameter
    EXPECT_EQ(c.Query("SYST:ERR?"), R"(-224,"Illegal parameter value")");
    Emulator high("QDS4054B");
    ScpiClient h(high.Start());
    EXPECT_EQ(Val(h, "WAV:FEAT"), R"("DEC,SEGM")");
    EXPECT_EQ(Val(h, "DISP:LAB"), "1");
}

TEST(EmulatorModels, EarlyFamiliesHaveNoSystemDataAndTheirOwnStatusDialect) {
    for (const char* model : {"73121A", "73124A", "73141D", "73142A"}) {
        SCOPED_TRACE(model);
        Emulator emu(model);
        ScpiClient c(emu.Start());
        c.Send(":SYST:DATA:VER? \"DISP:LAB\"");
        c.Send(":SYST:DATA:VAL? \"COUN:CHAN\"");
        c.Send("OPER:COND?");
        EXPECT_EQ(c.Query("*ESR?"), "160");  // power-on + command error
        for (int i = 0; i < 3; ++i) EXPECT_EQ(c.Query("SYST:ERR?"), R"(-113,"Undefined header")");
        EXPECT_EQ(c.Query("OPER?"), "0");
    }
    Emulator newer("QDS2012A");
    ScpiClient n(newer.Start());
    EXPECT_EQ(n.Query("OPER:COND?;:OPER:EVEN?"), "0;0");
    n.Send("OPER?");
    EXPECT_EQ(n.Query("SYST:ERR?"), R"(-113,"Undefined header")");
}

TEST(EmulatorModels, EarlyModelsDeriveChannelsPodsAndBandwidthFromTheName) {
    struct Case {
        const char* name;
        int channels;
        int pods;
        double bandwidth;
        bool fifty_ohm;
        bool ext_trigger;
    };
    const Case cases[] = {
        {"73122A", 2, 0, 1e8, false, true}, {"73124A", 4, 0, 1e8, false, false},
        {"73121D", 2, 2, 6e7, false, true}, {"73141D", 2, 2, 3e8, true, true},
        {"73142A", 2, 0, 5e8, true, true},
    };
    for (const Case& tc : cases) {
        SCOPED_TRACE(tc.name);
        const auto m = LookUpModel(tc.name);
        ASSERT_TRUE(m);
        EXPECT_EQ(m->analog_channels, tc.channels);
        EXPECT_EQ(m->pods, tc.pods);
        EXPECT_EQ(m->bandwidth, tc.bandwidth);
        EXPECT_EQ(m->Has(kFeatFiftyOhm), tc.fifty_ohm);
        EXPECT_EQ(m->Has(kFeatExtTrigger), tc.ext_trigger);
    }
}

}  // namespace
}  // namespace qn::emu

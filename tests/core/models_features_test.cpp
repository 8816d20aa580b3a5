#include <gtest/gtest.h>

#include <algorithm>
#include <map>

#include "Quorlen731XXErrors.h"
#include "core/features.h"
#include "core/models.h"
#include "core/root.h"
#include "platform/com/errorinfo.h"
#include "tests/support/scripted_driver.h"

namespace qn::test {
namespace {

TEST(SupportedModels, SixtyFiveModelsInSevenFamilies) {
    std::map<std::string_view, int> per_family;
    for (const CSupportedModelRow& r : SupportedModelRows()) ++per_family[r.family];
    EXPECT_EQ(per_family, (std::map<std::string_view, int>{{"4XXXB", 14}, {"4XXXA", 16},
                                                           {"2XXXA", 6},  {"3XXXL", 4},
                                                           {"3XXXA", 16}, {"7314X", 4},
                                                           {"7312X", 5}}));
    const auto& v = CSupportedModelValidator::Instance();
    EXPECT_TRUE(v.IsSupported("QDS4032A"));
    EXPECT_FALSE(v.IsSupported("qds4032a"));   // exact case
    EXPECT_FALSE(v.IsSupported("QDS4032"));    // no prefix match
    EXPECT_FALSE(v.IsSupported(""));
    EXPECT_TRUE(v.IsInFamily("73141D", "7314X"));
    EXPECT_FALSE(v.IsInFamily("73141D", "7312X"));
    // The list holds every model once, comma-separated without blanks.
    std::string list = v.ModelList();
    EXPECT_EQ(std::count(list.begin(), list.end(), ','), 64);
    EXPECT_EQ(list.find(' '), std::string::npos);
}

TEST(FixedFeatures, EarlyFamilyRules) {
    FeatureRecord a = FixedFeatures("73122A");
    EXPECT_EQ(a.analog_channel_count, 2);
    EXPECT_EQ(a.digital_channel_count, 0);
    EXPECT_EQ(a.bandwidth, 1e8);
    EXPECT_EQ(a.bandwidth_limit, 2e7);
    EXPECT_TRUE(a.ground_coupling);
    EXPECT_FALSE(a.fifty_ohm_input);
    EXPECT_FALSE(a.probe_skew);
    EXPECT_TRUE(a.external_trigger_input);
    EXPECT_FALSE(a.display_labels);
    EXPECT_EQ(a.waveform_point_limit, 2000);
    EXPECT_EQ(FixedFeatures("73121D").bandwidth, 6e7);
    FeatureRecord b = FixedFeatures("73124A");
    EXPECT_EQ(b.analog_channel_count, 4);
    EXPECT_FALSE(b.external_trigger_input);
    FeatureRecord d = FixedFeatures("73141D");
    EXPECT_EQ(d.analog_channel_count, 2);
    EXPECT_EQ(d.digital_channel_count, 16);
    EXPECT_EQ(d.bandwidth, 3e8);
    EXPECT_EQ(FixedFeatures("73142A").bandwidth, 5e8);
    // Other families keep the defaults until discovery.
    FeatureRecord q = FixedFeatures("QDS4032A");
    EXPECT_FALSE(q.early_family);
    EXPECT_EQ(q.analog_channel_count, 4);
    EXPECT_EQ(q.waveform_point_limit, 1000);
}

TEST(Discovery, AFailingQueryEndsDiscoveryButNotInitialize) {
    ScriptedProvider* io = nullptr;
    ComPtr<Quorlen731XX> driver = DriverOnScript(&io);
    const char* idn = "QUORLEN TECHNOLOGIES,QDS4032A,1,2\n";
    io->Expect("*IDN?\n", idn)
        .Expect("SYST:DATA:VAL? \"COUN:CHAN\"\n", "2\n")
        .Expect("SYST:DATA:VAL? \"COUN:POD\"\n", "0\n")
        .Expect("SYST:DATA:VAL? \"POD:SIZE\"\n", "8\n")
        .Expect("*IDN?\n", idn)
        .Expect(":SYST:DATA:VER? \"DISP:LAB\"\n", "1\n")
        .Expect(":SYST:DATA:VAL? \"DISP:LAB\"\n", "0\n")
        .Expect(":SYST:DATA:VER? \"WAV:FEAT\"\n", "1\n")
        .Expect(":SYST:DATA:VAL? \"WAV:FEAT\"\n", "DEC,SEGM\n")
        .ExpectTimeout(":SYST:DATA:VAL? \"COUN:POD\"\n");
    com::Bstr r("scripted"), o("");
    ASSERT_EQ(driver->Initialize(r.get(), VARIANT_TRUE, VARIANT_FALSE, o.get()), S_OK);
    EXPECT_TRUE(io->Done());
    EXPECT_FALSE(com::TakeThreadError(nullptr));
    const FeatureRecord& f = driver->Core().features;
    EXPECT_FALSE(f.display_labels);
    EXPECT_TRUE(f.counted_maximum_points);
    EXPECT_EQ(f.digital_channel_count, 16);  // not reached: the default stays
    // The instance lists were built from the instrument's own counts.
    EXPECT_EQ(driver->Core().repcaps.List(RepCapClass::kChannel)->size(), 2u);
    EXPECT_EQ(driver->Core().repcaps.List(RepCapClass::kUserDigitalChannel)->size(), 0u);
}

// Channel counts the instrument reports are bounded before any instance is
// created: a hostile count fails Initialize instead of allocating without
// end, and two negative pod replies do not multiply into a large count.
TEST(Discovery, HostileChannelCountsAreBounded) {
    struct Case {
        const char* chan;
        const char* pods;
        const char* size;
        bool fails;
    };
    const char* idn = "QUORLEN TECHNOLOGIES,QDS4032A,1,2\n";
    for (const Case& c : {Case{"2147483647", "0", "8", true}, Case{"4", "2147483647", "8", true},
                          Case{"4", "-2147483648", "-2147483648", false},
                          Case{"4", "-65536", "-65536", false}}) {
        SCOPED_TRACE(std::string(c.chan) + " " + c.pods + " " + c.size);
        ScriptedProvider* io = nullptr;
        ComPtr<Quorlen731XX> driver = DriverOnScript(&io);
        io->Expect("*IDN?\n", idn)
            .Expect("SYST:DATA:VAL? \"COUN:CHAN\"\n", std::string(c.chan) + "\n")
            .Expect("SYST:DATA:VAL? \"COUN:POD\"\n", std::string(c.pods) + "\n")
            .Expect("SYST:DATA:VAL? \"POD:SIZE\"\n", std::string(c.size) + "\n");
        if (!c.fails)  // a timeout ends feature discovery
            io->Expect("*IDN?\n", idn).ExpectTimeout(":SYST:DATA:VER? \"DISP:LAB\"\n");
        com::Bstr r("scripted"), o("");
        EXPECT_EQ(driver->Initialize(r.get(), VARIANT_FALSE, VARIANT_FALSE, o.get()),
                  c.fails ? E_IVI_UNEXPECTED_RESPONSE : S_OK);
        EXPECT_TRUE(io->Done());
        if (!c.fails) {
            EXPECT_EQ(driver->Core().repcaps.List(RepCapClass::kUserDigitalChannel)->size(), 0u);
        }
    }
}

// Discovery asks for the counts again; replies that would overflow or are
// out of any sensible range end discovery with the defaults kept.
TEST(Discovery, HostileCountsEndDiscovery) {
    struct Case {
        const char* pods;
        const char* size;
        const char* chan;
    };
    for (const Case& c : {Case{"65536", "65536", "4"}, Case{"-65536", "65536", "4"},
                          Case{"2", "8", "2147483647"}, Case{"2", "8", "-1"}}) {
        SCOPED_TRACE(std::string(c.pods) + " " + c.size + " " + c.chan);
        ScriptedProvider* io = nullptr;
        ComPtr<Quorlen731XX> driver = DriverOnScript(&io);
        const char* idn = "QUORLEN TECHNOLOGIES,QDS4032A,1,2\n";
        io->Expect("*IDN?\n", idn)
            .Expect("SYST:DATA:VAL? \"COUN:CHAN\"\n", "2\n")
            .Expect("SYST:DATA:VAL? \"COUN:POD\"\n", "2\n")
            .Expect("SYST:DATA:VAL? \"POD:SIZE\"\n", "8\n")
            .Expect("*IDN?\n", idn)
            .Expect(":SYST:DATA:VER? \"DISP:LAB\"\n", "0\n")
            .Expect(":SYST:DATA:VER? \"WAV:FEAT\"\n", "0\n")
            .Expect(":SYST:DATA:VAL? \"COUN:POD\"\n", std::string(c.pods) + "\n")
            .Expect(":SYST:DATA:VAL? \"POD:SIZE\"\n", std::string(c.size) + "\n");
        const bool pods_ok = std::string(c.chan) != "4";
        if (pods_ok) io->Expect(":SYST:DATA:VAL? \"COUN:CHAN\"\n", std::string(c.chan) + "\n");
        com::Bstr r("scripted"), o("");
        ASSERT_EQ(driver->Initialize(r.get(), VARIANT_FALSE, VARIANT_FALSE, o.get()), S_OK);
        EXPECT_TRUE(io->Done());
        const FeatureRecord& f = driver->Core().features;
        EXPECT_EQ(f.digital_channel_count, pods_ok ? 16 : FeatureRecord{}.digital_channel_count);
        EXPECT_EQ(f.analog_channel_count, FeatureRecord{}.analog_channel_count);
    }
}

}  // namespace
}  // namespace qn::test

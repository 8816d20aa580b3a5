#include <gtest/gtest.h>

#include <iterator>
#include <set>
#include <sstream>
#include <string>

#include "Quorlen731XXErrors.h"
#include "core/features.h"
#include "core/models.h"
#include "core/root.h"
#include "platform/com/errorinfo.h"
#include "tests/support/scripted_driver.h"

namespace qn::test {
namespace {

// The supported models as documented, family by family.
constexpr std::pair<const char*, const char*> kDocumentedFamilies[] = {
    {"4XXXB", "QMS4104B QMS4054B QMS4052B QMS4034B QMS4032B QMS4012B QMS4014B QDS4014B QDS4052B "
              "QDS4054B QDS4032B QDS4034B QDS4012B QDS4104B"},
    {"4XXXA", "QMS4014A QMS4012A QDS4014A QDS4012A QMS4104A QMS4054A QMS4034A QMS4102A QMS4052A "
              "QMS4032A QDS4104A QDS4054A QDS4034A QDS4102A QDS4052A QDS4032A"},
    {"2XXXA", "QDS2012A QDS2014A QDS2032A QDS2034A QDS2052A QDS2054A"},
    {"3XXXL", "QDS3034L QDS3104L QDS3054L QDS3014L"},
    {"3XXXA", "QMS3104A QDS3104A QMS3102A QDS3102A QMS3054A QDS3054A QMS3052A QDS3052A QMS3034A "
              "QDS3034A QMS3032A QDS3032A QMS3014A QDS3014A QMS3012A QDS3012A"},
    {"7314X", "73142D 73142A 73141D 73141A"},
    {"7312X", "73124A 73122D 73122A 73121D 73121A"},
};

TEST(SupportedModels, EveryDocumentedModelIsSupportedInItsOwnFamilyOnly) {
    const auto& v = CSupportedModelValidator::Instance();
    std::multiset<std::string> documented;
    for (auto [family, models] : kDocumentedFamilies) {
        std::istringstream in(models);
        for (std::string m; in >> m;) {
            documented.insert(m);
            EXPECT_TRUE(v.IsSupported(m)) << m;
            for (auto [other, unused] : kDocumentedFamilies)
                EXPECT_EQ(v.IsInFamily(m, other), std::string_view(other) == family)
                    << m << " in " << other;
        }
    }
    EXPECT_EQ(documented.size(), 65u);
    // The model list names each documented model once, comma-separated.
    std::multiset<std::string> listed;
    std::istringstream list(v.ModelList());
    for (std::string m; std::getline(list, m, ',');) listed.insert(m);
    EXPECT_EQ(listed, documented);
    // Names are matched exactly, never by case, prefix or family.
    for (const char* near : {"qds4032a", "QDS4032", "QDS4032A ", "QDS4032AB", "7312X", ""})
        EXPECT_FALSE(v.IsSupported(near)) << near;
    EXPECT_FALSE(v.IsInFamily("73141d", "7314X"));
    EXPECT_FALSE(v.IsInFamily("73141D", "7314x"));
}

// The record of every early-family model, written out from the documented
// rules, and the defaults that every other model keeps until discovery.
TEST(FixedFeatures, EveryEarlyModelAndTheDefaults) {
    struct Case {
        const char* model;
        LONG analog, digital;
        double bandwidth, limit;
        bool ext_trigger, labels, ground, fifty, protection, skew, auto_level;
    };
    const Case cases[] = {
        {"73142D", 2, 16, 5e8, 2.5e7, true, true, false, true, true, true, false},
        {"73142A", 2, 0, 5e8, 2.5e7, true, false, false, true, true, true, false},
        {"73141D", 2, 16, 3e8, 2.5e7, true, true, false, true, true, true, false},
        {"73141A", 2, 0, 3e8, 2.5e7, true, false, false, true, true, true, false},
        {"73124A", 4, 0, 1e8, 2e7, false, false, true, false, false, false, true},
        {"73122D", 2, 16, 1e8, 2e7, true, true, true, false, false, false, true},
        {"73122A", 2, 0, 1e8, 2e7, true, false, true, false, false, false, true},
        {"73121D", 2, 16, 6e7, 2e7, true, true, true, false, false, false, true},
        {"73121A", 2, 0, 6e7, 2e7, true, false, true, false, false, false, true},
        {"QDS4032A", 4, 16, 1e9, 2.5e7, true, true, false, true, true, true, false},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.model);
        const FeatureRecord f = FixedFeatures(c.model);
        const bool early = c.model[0] == '7';
        EXPECT_EQ(f.early_family, early);
        EXPECT_EQ(f.waveform_point_limit, early ? 2000 : 1000);
        EXPECT_EQ(f.analog_channel_count, c.analog);
        EXPECT_EQ(f.digital_channel_count, c.digital);
        EXPECT_EQ(f.bandwidth, c.bandwidth);
        EXPECT_EQ(f.bandwidth_limit, c.limit);
        EXPECT_EQ(f.external_trigger_input, c.ext_trigger);
        EXPECT_EQ(f.display_labels, c.labels);
        EXPECT_EQ(f.ground_coupling, c.ground);
        EXPECT_EQ(f.fifty_ohm_input, c.fifty);
        EXPECT_EQ(f.channel_protection, c.protection);
        EXPECT_EQ(f.probe_skew, c.skew);
        EXPECT_EQ(f.auto_level_sweep, c.auto_level);
        EXPECT_FALSE(f.digitize_command);
        EXPECT_FALSE(f.sequence_trigger);
        EXPECT_FALSE(f.counted_maximum_points);
    }
}

// A newer model's session up to feature discovery: the identity, the counts
// its instance lists are built from, and the identity again (left out with
// `second_identity` false). Discovery's own queries are the caller's.
ScriptedProvider* ScriptCounts(ComPtr<Quorlen731XX>* driver, const std::string& chan,
                               const std::string& pods, const std::string& size,
                               bool second_identity = true) {
    ScriptedProvider* io = nullptr;
    *driver = DriverOnScript(&io);
    const char* idn = "QUORLEN TECHNOLOGIES,QDS4032A,1,2\n";
    io->Expect("*IDN?\n", idn)
        .Expect("SYST:DATA:VAL? \"COUN:CHAN\"\n", chan + "\n")
        .Expect("SYST:DATA:VAL? \"COUN:POD\"\n", pods + "\n")
        .Expect("SYST:DATA:VAL? \"POD:SIZE\"\n", size + "\n");
    if (second_identity) io->Expect("*IDN?\n", idn);
    return io;
}

// A newer model's whole discovery, with each feature token alone in its
// reply: it sets its own flag and no other; tokens match case-sensitively.
TEST(Discovery, EachFeatureTokenAloneSetsItsOwnFlag) {
    using F = bool FeatureRecord::*;
    const F flags[] = {&FeatureRecord::ground_coupling,  &FeatureRecord::auto_level_sweep,
                       &FeatureRecord::fifty_ohm_input,  &FeatureRecord::channel_protection,
                       &FeatureRecord::probe_skew,       &FeatureRecord::external_trigger_input,
                       &FeatureRecord::sequence_trigger, &FeatureRecord::digitize_command};
    struct Case {
        const char* chan;
        const char* trig;
        const char* mode;
        const char* analog;
        int flag;  // index into flags; -1: none
    };
    const Case cases[] = {
        {"GCO", "", "", "", 0},  {"ALEV", "", "", "", 1}, {"FIFT", "", "", "", 2},
        {"PROT", "", "", "", 3}, {"PSK", "", "", "", 4},  {"", "EXT", "", "", 5},
        {"", "", "SEQ", "", 6},  {"", "", "", "DDIG", 7}, {"psk", "ext", "seq", "ddig", -1},
    };
    const auto val = [](const char* key) { return std::string(":SYST:DATA:VAL? \"") + key + "\"\n"; };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.flag);
        ComPtr<Quorlen731XX> driver;
        ScriptedProvider* io = ScriptCounts(&driver, "2", "3", "5");
        io->Expect(":SYST:DATA:VER? \"DISP:LAB\"\n", "1\n")
            .Expect(val("DISP:LAB"), "0\n")
            .Expect(":SYST:DATA:VER? \"WAV:FEAT\"\n", "1\n")
            .Expect(val("WAV:FEAT"), "DEC\n")
            .Expect(val("COUN:POD"), "3\n")
            .Expect(val("POD:SIZE"), "5\n")
            .Expect(val("COUN:CHAN"), "2\n")
            .Expect(val("CHAN:BAND"), "1.2345678901234567E9\n")
            .Expect(val("CHAN:BWL"), "2.0000000000000004E7\n")
            .Expect(val("CHAN:FEAT"), std::string(c.chan) + "\n")
            .Expect(val("TRIG:FEAT"), std::string(c.trig) + "\n")
            .Expect(val("TRIG:MOD"), std::string(c.mode) + "\n")
            .Expect(val("ANAL:FEAT"), std::string(c.analog) + "\n");
        com::Bstr r("scripted"), o("");
        ASSERT_EQ(driver->Initialize(r.get(), VARIANT_FALSE, VARIANT_FALSE, o.get()), S_OK);
        EXPECT_TRUE(io->Done());
        const FeatureRecord& f = driver->Core().features;
        for (int k = 0; k < int(std::size(flags)); ++k) EXPECT_EQ(f.*flags[k], k == c.flag) << k;
        EXPECT_FALSE(f.display_labels);
        EXPECT_TRUE(f.counted_maximum_points);
        EXPECT_EQ(f.digital_channel_count, 15);
        EXPECT_EQ(f.analog_channel_count, 2);
        EXPECT_EQ(f.bandwidth, 1.2345678901234567e9);
        EXPECT_EQ(f.bandwidth_limit, 2.0000000000000004e7);
    }
}

TEST(Discovery, AFailingQueryEndsDiscoveryButNotInitialize) {
    ComPtr<Quorlen731XX> driver;
    ScriptedProvider* io = ScriptCounts(&driver, "2", "0", "8");
    io->Expect(":SYST:DATA:VER? \"DISP:LAB\"\n", "1\n")
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
    for (const Case& c : {Case{"2147483647", "0", "8", true}, Case{"4", "2147483647", "8", true},
                          Case{"4", "-2147483648", "-2147483648", false},
                          Case{"4", "-65536", "-65536", false}}) {
        SCOPED_TRACE(std::string(c.chan) + " " + c.pods + " " + c.size);
        ComPtr<Quorlen731XX> driver;
        ScriptedProvider* io = ScriptCounts(&driver, c.chan, c.pods, c.size, !c.fails);
        if (!c.fails)  // a timeout ends feature discovery
            io->ExpectTimeout(":SYST:DATA:VER? \"DISP:LAB\"\n");
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
        ComPtr<Quorlen731XX> driver;
        ScriptedProvider* io = ScriptCounts(&driver, "2", "2", "8");
        io->Expect(":SYST:DATA:VER? \"DISP:LAB\"\n", "0\n")
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

// Feature discovery and instance lists against the emulator of every family.
#include <gtest/gtest.h>

#include "Quorlen731XX.h"
#include "core/root.h"
#include "tests/support/emulator_driver.h"

namespace qn::test {
namespace {

struct Expect {
    const char* model;
    LONG analog, digital;
    double bandwidth, bandwidth_limit;
    bool ground, fifty, skew, protection, external, sequence, digitize, counted, early;
    LONG instances, digital_instances;
};

class FeaturesOnEmulator : public ::testing::TestWithParam<Expect>, protected EmulatedDriver {};

TEST_P(FeaturesOnEmulator, DiscoveryAndCollectionsFollowTheModel) {
    const Expect& e = GetParam();
    ASSERT_EQ(Open(e.model), S_OK) << ErrorText();
    const FeatureRecord& f = driver->Core().features;
    EXPECT_EQ(f.analog_channel_count, e.analog);
    EXPECT_EQ(f.digital_channel_count, e.digital);
    EXPECT_EQ(f.bandwidth, e.bandwidth);
    EXPECT_EQ(f.bandwidth_limit, e.bandwidth_limit);
    EXPECT_EQ(f.ground_coupling, e.ground);
    EXPECT_EQ(f.fifty_ohm_input, e.fifty);
    EXPECT_EQ(f.probe_skew, e.skew);
    EXPECT_EQ(f.channel_protection, e.protection);
    EXPECT_EQ(f.external_trigger_input, e.external);
    EXPECT_EQ(f.sequence_trigger, e.sequence);
    EXPECT_EQ(f.digitize_command, e.digitize);
    EXPECT_EQ(f.counted_maximum_points, e.counted);
    EXPECT_EQ(f.early_family, e.early);
    EXPECT_EQ(f.waveform_point_limit, e.early ? 2000 : 1000);

    ComPtr<IIviScopeChannels> channels;
    ASSERT_EQ(ComPtr<IIviDriver>(driver.get()).As(channels), S_OK);
    LONG n = -1;
    EXPECT_EQ(channels->get_Count(&n), S_OK);
    EXPECT_EQ(n, e.instances);
    ComPtr<IQuorlen731XXDigitalChannels> digital;
    ASSERT_EQ(ComPtr<IIviDriver>(driver.get()).As(digital), S_OK);
    EXPECT_EQ(digital->get_Count(&n), S_OK);
    EXPECT_EQ(n, e.digital_instances);
    ComPtr<IQuorlen731XXMeasurements> measurements;
    ASSERT_EQ(ComPtr<IIviDriver>(driver.get()).As(measurements), S_OK);
    EXPECT_EQ(measurements->get_Count(&n), S_OK);
    EXPECT_EQ(n, 2 * e.instances + e.digital_instances);
    EXPECT_EQ(driver->Close(), S_OK);
}

// Expected values follow the emulator's documented family table
// (emulator/README.md) and the fixed rules of the early families.
INSTANTIATE_TEST_SUITE_P(
    Families, FeaturesOnEmulator,
    ::testing::Values(
        //      model       an dig  bandwidth  bwlimit  gnd    50ohm  skew   prot   ext    seq    ddig   count  early  inst dinst
        Expect{"QDS4032A", 2, 0, 3.5e8, 2.5e7, false, true, true, true, true, true, true, true, false, 2, 0},
        Expect{"QMS3104A", 4, 16, 1e9, 2e7, false, true, true, true, true, true, true, false, false, 4, 16},
        Expect{"QDS2014A", 4, 0, 1e8, 2e7, true, false, true, false, true, false, false, false, false, 4, 0},
        Expect{"73122A", 2, 0, 1e8, 2e7, true, false, false, false, true, false, false, false, true, 2, 0},
        Expect{"73124A", 4, 0, 1e8, 2e7, true, false, false, false, false, false, false, false, true, 4, 0},
        Expect{"73122D", 2, 16, 1e8, 2e7, true, false, false, false, true, false, false, false, true, 2, 16},
        Expect{"73141D", 2, 16, 3e8, 2.5e7, false, true, true, true, true, false, false, false, true, 4, 16},
        Expect{"73141A", 2, 0, 3e8, 2.5e7, false, true, true, true, true, false, false, false, true, 4, 0}),
    [](const ::testing::TestParamInfo<Expect>& i) { return std::string("M") + i.param.model; });

}  // namespace
}  // namespace qn::test

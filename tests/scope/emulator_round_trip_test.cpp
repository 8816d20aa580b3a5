// Every acquisition and channel property written to the emulator over a
// socket and read back: a 4-channel model with the 50-ohm input, probe skew
// and protection, a 2-channel model with ground coupling only, a model with
// counted maximum points and the two early families. The status check is
// on, so any command the instrument refuses fails.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <vector>

#include "tests/scope/property_rows.h"
#include "tests/scope/scope_fixture.h"
#include "tests/support/emulator_driver.h"

namespace qn::test {
namespace {

// A write of row.written, then a read expected to give `expected`.
struct RoundTrip {
    PropertyRow row;
    double expected;
};
RoundTrip Trip(PropertyRow row) { return {row, row.written}; }
RoundTrip Trip(PropertyRow row, double expected) { return {std::move(row), expected}; }

void RunTrips(const std::vector<RoundTrip>& trips) {
    for (const RoundTrip& t : trips) {
        SCOPED_TRACE(t.row.name + " = " + std::to_string(t.row.written));
        if (t.row.put) {
            ASSERT_EQ(t.row.put(t.row.written), S_OK) << ErrorText();
        }
        double v = std::nan("");
        ASSERT_EQ(t.row.get(&v), S_OK) << ErrorText();
        EXPECT_NEAR(v, t.expected, std::abs(t.expected) * 1e-12);
    }
}

class ScopeOnEmulator : public ::testing::TestWithParam<const char*>, protected EmulatedDriver {
protected:
    void SetUp() override {
        ASSERT_EQ(Open(GetParam(), "QueryInstrStatus=true", true, true), S_OK) << ErrorText();
    }
    void TearDown() override {
        if (driver) {
            EXPECT_EQ(driver->Close(), S_OK);
        }
    }
    const FeatureRecord& Features() { return driver->Core().features; }
    // The first entry of the instrument's error queue.
    LONG NextError() {
        LONG code = 0;
        com::Bstr text;
        EXPECT_EQ(driver->ErrorQuery(&code, text.Out()), S_OK);
        return code;
    }
};

TEST_P(ScopeOnEmulator, ChannelPropertiesRoundTrip) {
    using U = IQuorlen731XXChannel;
    using C = IIviScopeChannel;
    const FeatureRecord& f = Features();
    ASSERT_GE(f.analog_channel_count, 2);
    for (int n = 1; n <= f.analog_channel_count; ++n) {
        SCOPED_TRACE("channel " + std::to_string(n));
        auto user = ChannelNamed<IQuorlen731XXChannels, U>(*driver.get(),
                                                           ("UserChannel" + std::to_string(n)).c_str());
        auto ivi = ChannelNamed<IIviScopeChannels, C>(*driver.get(),
                                                      ("Channel" + std::to_string(n)).c_str());
        U* u = user.get();
        C* c = ivi.get();
        // Distinct values per channel, with 17 significant digits so that a
        // command losing precision is seen.
        const double k = n;
        std::vector<RoundTrip> trips = {
            Trip(Row("Enabled", u, &U::get_Enabled, &U::put_Enabled, 0, -1)),
            Trip(Row("ProbeAttenuation", c, &C::get_ProbeAttenuation, &C::put_ProbeAttenuation,
                     0, 1.2345678901234567 * k)),
            Trip(ReadOnly("ProbeSense", u, &U::get_ProbeSense, 1.2345678901234567 * k)),
            Trip(Row("Range", u, &U::get_Range, &U::put_Range, 0, 2.3456789012345678 * k)),
            Trip(Row("Offset", c, &C::get_Offset, &C::put_Offset, 0, -0.34567890123456789 * k)),
            Trip(Row("Coupling", c, &C::get_Coupling, &C::put_Coupling, 0, 0)),
            Trip(Row("Coupling", u, &U::get_Coupling, &U::put_Coupling, 0, 1)),
            Trip(Row("InputImpedance", u, &U::get_InputImpedance, &U::put_InputImpedance, 0, 1e6)),
            Trip(Row("InputFrequencyMax", c, &C::get_InputFrequencyMax,
                     &C::put_InputFrequencyMax, 0, f.bandwidth_limit)),
            Trip(Row("InputFrequencyMax", u, &U::get_InputFrequencyMax,
                     &U::put_InputFrequencyMax, 0, f.bandwidth_limit + 1),
                 f.bandwidth),
            Trip(Row("Units", u, &U::get_Units, &U::put_Units, 0, 1)),
            Trip(Row("Units", u, &U::get_Units, &U::put_Units, 0, 0)),
            Trip(Row("Invert", u, &U::get_Invert, &U::put_Invert, 0, -1)),
            Trip(Row("Range", c, &C::get_Range, &C::put_Range, 0, 4 * k)),
        };
        if (f.ground_coupling)
            trips.push_back(Trip(Row("Coupling", u, &U::get_Coupling, &U::put_Coupling, 0, 2)));
        if (f.fifty_ohm_input)
            trips.push_back(Trip(Row("InputImpedance", c, &C::get_InputImpedance,
                                     &C::put_InputImpedance, 0, 50)));
        if (f.probe_skew)
            trips.push_back(
                Trip(Row("ProbeSkew", u, &U::get_ProbeSkew, &U::put_ProbeSkew, 0, -4.5678901234567891e-9 * k)));
        if (f.channel_protection)
            trips.push_back(Trip(ReadOnly("Protection", u, &U::get_Protection, 0)));
        RunTrips(trips);

        com::Bstr label("\"Probe " + std::to_string(n) + "\"");
        ASSERT_EQ(u->put_Label(label.get()), S_OK) << ErrorText();
        com::Bstr back;
        ASSERT_EQ(u->get_Label(back.Out()), S_OK);
        EXPECT_EQ(back.utf8(), label.utf8());
        if (f.channel_protection) {
            EXPECT_EQ(u->ClearProtection(), S_OK) << ErrorText();
        }
    }
}

TEST_P(ScopeOnEmulator, AcquisitionPropertiesRoundTrip) {
    using A = IQuorlen731XXAcquisition;
    using C = IIviScopeAcquisition;
    A* a = driver.get();
    C* c = driver.get();
    RunTrips({
        Trip(Row("TimePerRecord", a, &A::get_TimePerRecord, &A::put_TimePerRecord, 0, 2.3456789012345678e-3)),
        Trip(Row("TimePerRecord", c, &C::get_TimePerRecord, &C::put_TimePerRecord, 0, 4e-3)),
        Trip(Row("StartTime", a, &A::get_StartTime, &A::put_StartTime, 0, -1.2345678901234567e-3)),
        Trip(Row("StartTime", c, &C::get_StartTime, &C::put_StartTime, 0, 2.5e-4)),
        Trip(Row("NumberOfPointsMin", c, &C::get_NumberOfPointsMin, &C::put_NumberOfPointsMin, 0,
                 500)),
        Trip(ReadOnly("RecordLength", a, &A::get_RecordLength, 500)),
        Trip(ReadOnly("SampleRate", c, &C::get_SampleRate, 500 / 4e-3)),
        Trip(Row("Interpolation", a, &A::get_Interpolation, &A::put_Interpolation, 0, 1)),
        Trip(ReadOnly("SampleMode", a, &A::get_SampleMode, 1)),
        Trip(Row("Interpolation", c, &C::get_Interpolation, &C::put_Interpolation, 0, 2)),
        Trip(ReadOnly("SampleMode", c, &C::get_SampleMode, 0)),
        Trip(Row("Type", a, &A::get_Type, &A::put_Type, 0, 1)),
        Trip(Row("Type", c, &C::get_Type, &C::put_Type, 0, 2)),
        Trip(Row("NumberOfAverages", a, &A::get_NumberOfAverages, &A::put_NumberOfAverages, 0, 32),
             1),
        Trip(Row("Type", a, &A::get_Type, &A::put_Type, 0, 4)),
        Trip(Row("NumberOfAverages", c, &C::get_NumberOfAverages, &C::put_NumberOfAverages, 0,
                 16)),
        Trip(Row("Type", a, &A::get_Type, &A::put_Type, 0, 0)),
    });
    // Above the point limit the maximum record is asked for.
    ASSERT_EQ(a->put_NumberOfPointsMin(Features().waveform_point_limit + 1), S_OK) << ErrorText();
    LONG points = 0;
    ASSERT_EQ(a->get_RecordLength(&points), S_OK);
    EXPECT_GE(points, Features().waveform_point_limit);
}

TEST_P(ScopeOnEmulator, RefusedValuesFailWithTheInstrumentsError) {
    auto user = ChannelNamed<IQuorlen731XXChannels, IQuorlen731XXChannel>(*driver.get(), "UserChannel2");
    EXPECT_EQ(user->put_Range(1000.0), E_IVI_INSTRUMENT_STATUS);
    EXPECT_EQ(NextError(), -222);
    EXPECT_EQ(static_cast<IQuorlen731XXAcquisition*>(driver.get())->put_NumberOfAverages(0),
              E_IVI_INSTRUMENT_STATUS);
    EXPECT_EQ(NextError(), -222);
    // What the model lacks is refused by the driver before anything is sent.
    const FeatureRecord& f = Features();
    EXPECT_EQ(user->put_Coupling(Quorlen731XXVerticalCouplingGnd),
              f.ground_coupling ? S_OK : E_QUORLEN731XX_VERTICAL_GROUND_COUPLING);
    EXPECT_EQ(user->put_InputImpedance(50.0), f.fifty_ohm_input ? S_OK : E_IVI_INVALID_VALUE);
    EXPECT_EQ(NextError(), 0);
    // With no source displayed there is nothing to take points from.
    for (int n = 1; n <= f.analog_channel_count; ++n) {
        auto ch = ChannelNamed<IIviScopeChannels, IIviScopeChannel>(
            *driver.get(), ("Channel" + std::to_string(n)).c_str());
        ASSERT_EQ(ch->put_Enabled(VARIANT_FALSE), S_OK);
    }
    LONG points = 0;
    EXPECT_EQ(static_cast<IIviScopeAcquisition*>(driver.get())->get_RecordLength(&points),
              E_IVISCOPE_CHANNEL_NOT_ENABLED);
}

INSTANTIATE_TEST_SUITE_P(Models, ScopeOnEmulator, ::testing::Values("QMS3104A", "QDS2012A", "QDS4054B", "73122A", "73141D"));

}  // namespace
}  // namespace qn::test

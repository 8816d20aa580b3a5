// Measurements and digital channels end to end against the emulator over a
// loopback socket: the physically expected values for a sine and a square
// wave with a known phase shift, on a mixed-signal model and on an
// early-family model, and the refusals a real scope gives.
#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <memory>
#include <string>

#include "Quorlen731XXErrors.h"
#include "core/root.h"
#include "io/io_manager.h"
#include "tests/scope/scope_fixture.h"
#include "tests/support/emulator_driver.h"

namespace qn::test {
namespace {

class MeasurementOnEmulator : public ::testing::TestWithParam<const char*>,
                              protected EmulatedDriver {
protected:
    void SetUp() override {
        ASSERT_EQ(Open(GetParam()), S_OK) << ErrorText();
        // Five periods of a 1 kHz, 2 Vpp sine on channel 1 and of a 1 kHz,
        // 4 Vpp square lagging it by 90 degrees on channel 2; channel 1's
        // range keeps its noise small against the sine.
        ASSERT_EQ(Io(*driver.get()).InstrWrite(":TIM:RANG 5E-3;:CHAN1:RANG 2.5;:CHAN2:DISP 1;"
                                                ":EMUL:INP1 SIN,1E3,2,0;:EMUL:INP2 SQU,1E3,4,90"),
                  S_OK);
    }
    HRESULT Measure(const std::string& name, Quorlen731XXMeasurementEnum f, double* v) {
        return ChannelNamed<IQuorlen731XXMeasurements, IQuorlen731XXMeasurement>(*driver.get(),
                                                                                name.c_str())
            ->FetchWaveformMeasurement(f, v);
    }
};

TEST_P(MeasurementOnEmulator, SineAndSquareGiveTheirPhysicalValues) {
    struct Case {
        const char* object;
        Quorlen731XXMeasurementEnum function;
        double expected;
        double tolerance;
    } cases[] = {
        {"UserChannel1", Quorlen731XXMeasurementFrequency, 1e3, 5.0},
        {"UserChannel1", Quorlen731XXMeasurementPeriod, 1e-3, 5e-6},
        {"UserChannel1", Quorlen731XXMeasurementVoltagePeakToPeak, 2.0, 0.2},
        {"UserChannel1", Quorlen731XXMeasurementVoltageRMS, std::sqrt(0.5), 0.02},
        {"UserChannel1", Quorlen731XXMeasurementDutyCyclePos, 50.0, 2.0},
        {"UserChannel1", Quorlen731XXMeasurementTimeOfEdge, -2e-3, 1e-5},
        {"UserChannel1", Quorlen731XXMeasurementValueAtTime, 0.0, 0.1},
        {"UserChannel1", Quorlen731XXMeasurementDelay, 0.25e-3, 1e-5},
        {"UserChannel1", Quorlen731XXMeasurementPhase, 90.0, 3.0},
        {"UserChannel2", Quorlen731XXMeasurementFrequency, 1e3, 5.0},
        {"UserChannel2", Quorlen731XXMeasurementVoltagePeakToPeak, 4.0, 0.2},
        {"UserChannel2", Quorlen731XXMeasurementVoltageHigh, 2.0, 0.1},
        {"UserChannel2", Quorlen731XXMeasurementVoltageLow, -2.0, 0.1},
        {"UserChannel2", Quorlen731XXMeasurementVoltageRMS, 2.0, 0.05},
        {"UserChannel2", Quorlen731XXMeasurementDutyCycleNeg, 50.0, 1.0},
        {"UserChannel2", Quorlen731XXMeasurementWidthPos, 0.5e-3, 1e-5},
        {"UserChannel2", Quorlen731XXMeasurementTimeOfEdge, -1.75e-3, 1e-5},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(std::string(c.object) + " " + std::to_string(c.function));
        double v = 0;
        ASSERT_EQ(Measure(c.object, c.function, &v), S_OK);
        EXPECT_NEAR(v, c.expected, c.tolerance);
    }
    // The second falling edge of the sine, and the value a quarter period in.
    auto* conf = static_cast<IQuorlen731XXConfigurableMeasurement*>(driver.get());
    ASSERT_EQ(conf->put_TimeAtEdgeOccurrence(2), S_OK);
    ASSERT_EQ(conf->put_TimeAtEdgeSlope(Quorlen731XXMeasurementSlopeNegative), S_OK);
    ASSERT_EQ(conf->put_ValueAtTimeTime(0.25e-3), S_OK);
    double v = 0;
    ASSERT_EQ(Measure("UserChannel1", Quorlen731XXMeasurementTimeOfEdge, &v), S_OK);
    EXPECT_NEAR(v, -0.5e-3, 1e-5);
    ASSERT_EQ(Measure("UserChannel1", Quorlen731XXMeasurementValueAtTime, &v), S_OK);
    EXPECT_NEAR(v, 1.0, 0.1);
}

TEST_P(MeasurementOnEmulator, ImpossibleMeasurementsAndHiddenSourcesAreRefused) {
    CDriverIOManager io(*driver.get());
    // A flat input has no edges; a source that is off cannot be measured.
    ASSERT_EQ(io.InstrWrite(":EMUL:INP1 SIN,1E3,0,0"), S_OK);
    double v = 0;
    EXPECT_EQ(Measure("UserChannel1", Quorlen731XXMeasurementFrequency, &v),
              E_IVISCOPE_UNABLE_TO_PERFORM_MEASUREMENT);
    EXPECT_EQ(v, 9.9e37);
    ASSERT_EQ(io.InstrWrite(":CHAN2:DISP 0"), S_OK);
    EXPECT_EQ(Measure("UserChannel2", Quorlen731XXMeasurementFrequency, &v),
              E_IVISCOPE_CHANNEL_NOT_ENABLED);
    EXPECT_EQ(Measure("UserChannel1", Quorlen731XXMeasurementDelay, &v),
              E_IVISCOPE_CHANNEL_NOT_ENABLED);
    // The session is still usable, with the instrument's error queue empty.
    ASSERT_EQ(io.InstrWrite(":EMUL:INP1 SIN,1E3,2,0"), S_OK);
    EXPECT_EQ(Measure("UserChannel1", Quorlen731XXMeasurementVoltagePeakToPeak, &v), S_OK);
    std::string error;
    ASSERT_EQ(io.InstrQuery(":SYST:ERR?", &error, 255), S_OK);
    EXPECT_EQ(error.substr(0, 2), "+0") << error;
}

TEST_P(MeasurementOnEmulator, ReferenceLevelsAndDelayEdgesRoundTrip) {
    auto* ref = static_cast<IIviScopeReferenceLevel*>(driver.get());
    ASSERT_EQ(ref->Configure(20.0, 45.5, 80.25), S_OK);
    EXPECT_EQ(Got(ref, &IIviScopeReferenceLevel::get_High), 80.25);
    EXPECT_EQ(Got(ref, &IIviScopeReferenceLevel::get_Mid), 45.5);
    EXPECT_EQ(Got(ref, &IIviScopeReferenceLevel::get_Low), 20.0);
    using M = IQuorlen731XXMultiWaveformMeasurement;
    M* multi = driver.get();
    com::Bstr ch2("UserChannel2");
    ASSERT_EQ(multi->ConfigureDelay(ch2.get(), Quorlen731XXMeasurementSlopePositive,
                                    Quorlen731XXMeasurementSlopeNegative, 1, 2),
              S_OK);
    EXPECT_EQ(Got(multi, &M::get_DelaySlope2), Quorlen731XXMeasurementSlopeNegative);
    EXPECT_EQ(Got(multi, &M::get_DelayOccurence2), 2);
    // First rising edge of the sine to the second falling edge of the square
    // (-1.25 ms; the first is at -2.25 ms). The sine crosses the middle level
    // of 45.5 % (-0.09 V) before -2 ms.
    double v = 0;
    ASSERT_EQ(Measure("UserChannel1", Quorlen731XXMeasurementDelay, &v), S_OK);
    EXPECT_NEAR(v, 0.75e-3 + std::asin(0.09) / (2 * M_PI * 1e3), 1e-5);
}

INSTANTIATE_TEST_SUITE_P(Models, MeasurementOnEmulator, ::testing::Values("QMS4034A", "73122D"));

TEST(DigitalOnEmulator, PodsCarryTheirPatternAndChannelsTheirOwnBit) {
    EmulatedDriver session;
    ASSERT_EQ(session.Open("QMS4034A"), S_OK) << ErrorText();
    const ComPtr<Quorlen731XX>& driver = session.driver;
    auto dig = [&](int d) {
        return ChannelNamed<IQuorlen731XXDigitalChannels, IQuorlen731XXDigitalChannel>(
            *driver.get(), ("UserDigitalChannel" + std::to_string(d)).c_str());
    };
    SAFEARRAY* a = nullptr;
    double x0 = 0, dx = 0;
    // Pod 1 is off until one of its channels is switched on.
    EXPECT_EQ(dig(3)->FetchDigitalWaveform(&a, &x0, &dx), E_IVISCOPE_CHANNEL_NOT_ENABLED);
    ASSERT_EQ(dig(3)->put_Enabled(VARIANT_TRUE), S_OK);
    ASSERT_EQ(dig(3)->put_Threshold(-0.75), S_OK);
    EXPECT_EQ(Got(dig(3).get(), &IQuorlen731XXDigitalChannel::get_Threshold), -0.75);
    ASSERT_EQ(dig(3)->ReadDigitalWaveform(Quorlen731XXTimeOutEnum(5000), &a, &x0, &dx), S_OK);
    com::SafeArray pod3(a);
    a = nullptr;  // output arrays are in/out: a new call must not get pod3's array
    ASSERT_EQ(dig(5)->FetchDigitalWaveform(&a, &x0, &dx), S_OK);
    com::SafeArray pod5(a);
    ASSERT_GT(pod3.size(), 0u);
    ASSERT_EQ(pod3.size(), pod5.size());
    EXPECT_EQ(std::memcmp(pod3.data<std::uint8_t>(), pod5.data<std::uint8_t>(), pod3.size()), 0);
    // Pod 1 counts: bit 0 toggles most often, bit 7 once.
    int toggles0 = 0, toggles7 = 0;
    for (std::size_t i = 1; i < pod3.size(); ++i) {
        const int change = pod3.data<std::uint8_t>()[i] ^ pod3.data<std::uint8_t>()[i - 1];
        toggles0 += change & 1;
        toggles7 += (change >> 7) & 1;
    }
    EXPECT_GT(toggles0, 100);
    EXPECT_EQ(toggles7, 1);
    // Through its measurement object the channel reads its own bit, and its
    // clock-like bit 0 has a frequency.
    auto m = ChannelNamed<IQuorlen731XXMeasurements, IQuorlen731XXMeasurement>(
        *driver.get(), "UserDigitalChannel0");
    ASSERT_EQ(dig(0)->put_Enabled(VARIANT_TRUE), S_OK);
    double f = 0;
    ASSERT_EQ(m->FetchWaveformMeasurement(Quorlen731XXMeasurementFrequency, &f), S_OK);
    // 32000 points in 1 ms, the count advancing every 125 points.
    EXPECT_NEAR(f, 1.0 / (250 * 1e-3 / 32000), 50.0);
    EXPECT_EQ(m->FetchWaveformMeasurement(Quorlen731XXMeasurementRiseTime, &f), E_IVI_INVALID_VALUE);
    LONG edges = 0, levels = 0;
    auto* multi = static_cast<IQuorlen731XXMultiWaveformMeasurement*>(driver.get());
    ASSERT_EQ(multi->ResetActivity(), S_OK);
    ASSERT_EQ(multi->ReadActivity(&edges, &levels), S_OK);
    EXPECT_EQ(edges, 0);
}

}  // namespace
}  // namespace qn::test

// The emulator's measurement arithmetic on exact synthetic records: a pulse
// train of known duty cycle, flat and single-edge records, crossings in
// both directions, and phase wrapping.
#include <gtest/gtest.h>

#include <cmath>
#include <numbers>

#include "emulator/measure_math.h"

namespace qn::emu {
namespace {

// `periods` periods of `n` points each: high (`hi`) for the first `duty`
// of every period, low (`lo`) otherwise; 1 us per point, from t = -5 us.
Trace Pulses(int periods, int n, double duty, double lo = 0.0, double hi = 1.0) {
    Trace t;
    t.x0 = -5e-6;
    t.dx = 1e-6;
    for (int p = 0; p < periods; ++p)
        for (int i = 0; i < n; ++i) t.v.push_back(i < duty * n ? hi : lo);
    return t;
}

Trace Sine(double lag_degrees, int points = 4000, double cycles = 4.0) {
    Trace t;
    t.x0 = 0.0;
    t.dx = cycles / points;  // one cycle per unit of time
    for (int i = 0; i < points; ++i)
        t.v.push_back(std::sin(2 * std::numbers::pi * i * t.dx - lag_degrees * std::numbers::pi / 180));
    return t;
}

TEST(MeasureMath, PulseTrainTimingAtTheMiddleLevel) {
    const Trace t = Pulses(5, 100, 0.3, -1.0, 3.0);
    const Measurer m(t, Thresholds{});
    // Edges at the middle level fall halfway between the two points of a step.
    ASSERT_TRUE(m.Period());
    EXPECT_NEAR(*m.Period(), 100e-6, 1e-12);
    EXPECT_NEAR(*m.Frequency(), 1e4, 1e-6);
    EXPECT_NEAR(*m.DutyCycle(), 30.0, 1e-9);
    EXPECT_NEAR(*m.PositiveWidth(), 30e-6, 1e-12);
    EXPECT_NEAR(*m.NegativeWidth(), 70e-6, 1e-12);
    EXPECT_EQ(m.Top(), 3.0 - 4.0 / 400);  // the middle of the top histogram bin
    EXPECT_EQ(m.Base(), -1.0 + 4.0 / 400);
    // 10 % to 90 % of one step: 0.8 of a point.
    EXPECT_NEAR(*m.RiseTime(), 0.8e-6, 1e-6 * 0.02);
    // The first rising edge is the one at the second period's start (the
    // record starts high), the first falling one inside the first period.
    EXPECT_NEAR(*m.EdgeTime(1), -5e-6 + 99.5e-6, 1e-12);
    EXPECT_NEAR(*m.EdgeTime(-1), -5e-6 + 29.5e-6, 1e-12);
    EXPECT_NEAR(*m.EdgeTime(-5), -5e-6 + 429.5e-6, 1e-12);
    EXPECT_FALSE(m.EdgeTime(-6));
    EXPECT_FALSE(m.EdgeTime(0));
    EXPECT_NEAR(*m.TimeAtValue(2.0, -2), -5e-6 + 129.25e-6, 1e-12);
    EXPECT_NEAR(*m.TimeAtValue(2.0, 1), -5e-6 + 99.75e-6, 1e-12);
}

TEST(MeasureMath, RecordsWithoutEnoughEdgesHaveNoTiming) {
    struct Case {
        const char* name;
        Trace trace;
        double min_amplitude;
        bool rise;    // one rising edge seen
        bool period;  // two edges of one kind seen
    };
    Trace flat;
    flat.v.assign(1000, 0.25);
    Trace noise = Pulses(50, 4, 0.5, 0.0, 0.02);
    Trace step = Pulses(1, 200, 0.0, 0.0, 1.0);
    for (std::size_t i = 100; i < step.v.size(); ++i) step.v[i] = 1.0;
    const Case cases[] = {
        {"flat", flat, 0.0, false, false},
        {"noise below the minimum amplitude", noise, 0.1, false, false},
        {"noise above it", noise, 0.01, true, true},
        {"one step", step, 0.0, true, false},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        Thresholds th;
        th.min_amplitude = c.min_amplitude;
        const Measurer m(c.trace, th);
        EXPECT_EQ(m.RiseTime().has_value(), c.rise);
        EXPECT_EQ(m.Period().has_value(), c.period);
        EXPECT_EQ(m.DutyCycle().has_value(), c.period);
    }
    const Measurer m(flat, Thresholds{});
    EXPECT_EQ(m.PeakToPeak(), 0.0);
    EXPECT_FALSE(m.Overshoot());
    EXPECT_NEAR(m.Rms(), 0.25, 1e-12);
}

TEST(MeasureMath, ValuesBetweenPointsAndOutsideTheRecord) {
    const Trace t = Pulses(2, 10, 0.5);
    const Measurer m(t, Thresholds{});
    EXPECT_EQ(*m.ValueAtTime(-5e-6), 1.0);
    EXPECT_NEAR(*m.ValueAtTime(-5e-6 + 4.25e-6), 0.75, 1e-9);  // from 1 to 0 between points 4 and 5
    ASSERT_TRUE(m.ValueAtTime(-5e-6 + 19e-6));  // the last point, however it rounds
    EXPECT_EQ(*m.ValueAtTime(-5e-6 + 19e-6), 0.0);
    EXPECT_FALSE(m.ValueAtTime(-5e-6 + 19.5e-6));
    EXPECT_FALSE(m.ValueAtTime(-5.5e-6));
    EXPECT_FALSE(m.ValueAtTime(NAN));
}

TEST(MeasureMath, PhaseFollowsTheLagAndWraps) {
    const Trace reference = Sine(0.0);
    const Measurer a(reference, Thresholds{});
    const std::pair<double, double> lags[] = {{0, 0}, {45, 45}, {90, 90}, {179, 179},
                                              {270, -90}, {-30, -30}};
    for (const auto& [lag, phase] : lags) {
        const Trace other = Sine(lag);
        const Measurer b(other, Thresholds{});
        ASSERT_TRUE(Phase(a, b)) << lag;
        EXPECT_NEAR(*Phase(a, b), phase, 0.5) << lag;
    }
    // Absolute reference levels put the middle level where they say; the
    // record starts below the low level, so its first rise counts.
    const Measurer high_mid(reference, Thresholds{false, 0.9, 0.5, 0.1});
    EXPECT_NEAR(*high_mid.EdgeTime(1), std::asin(0.5) / (2 * std::numbers::pi), 2e-3);
}

}  // namespace
}  // namespace qn::emu

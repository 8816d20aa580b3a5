// The automatic measurements of the emulated scope, computed from a record
// in volts: voltage statistics, top and base by histogram, edges at the
// reference levels, and the timing measurements built on them. Every
// function returns nullopt where a real scope shows no result (no edge, a
// flat signal, a time outside the record).
#pragma once

#include <optional>
#include <vector>

namespace qn::emu {

struct Trace {
    std::vector<double> v;  // volts (0/1 for a digital channel)
    double x0 = 0.0;        // time of the first point, s
    double dx = 1.0;        // s between points
};

// Reference levels: percent of the top-to-base amplitude, or volts.
struct Thresholds {
    bool percent = true;
    double high = 90.0;
    double mid = 50.0;
    double low = 10.0;
    // A signal whose top-to-base amplitude is smaller is flat: it has no
    // edges (the noise of a flat trace must not read as a frequency).
    double min_amplitude = 0.0;
};

class Measurer {
  public:
    Measurer(const Trace& trace, const Thresholds& thresholds);

    double Max() const { return max_; }
    double Min() const { return min_; }
    double PeakToPeak() const { return max_ - min_; }
    double Top() const { return top_; }
    double Base() const { return base_; }
    double Amplitude() const { return top_ - base_; }
    double TimeAtMax() const;
    double TimeAtMin() const;
    // Over whole periods when the record holds one, else over the record.
    double Average() const;
    double Rms() const;
    std::optional<double> Overshoot() const;  // percent of the amplitude
    std::optional<double> Preshoot() const;

    std::optional<double> Period() const;
    std::optional<double> Frequency() const;
    std::optional<double> PositiveWidth() const;
    std::optional<double> NegativeWidth() const;
    std::optional<double> DutyCycle() const;  // percent
    std::optional<double> RiseTime() const;
    std::optional<double> FallTime() const;

    // The n-th rising (n > 0) or falling (n < 0) edge at the middle level.
    std::optional<double> EdgeTime(int n) const;
    // The n-th crossing of `level` upwards (n > 0) or downwards (n < 0).
    std::optional<double> TimeAtValue(double level, int n) const;
    std::optional<double> ValueAtTime(double t) const;

  private:
    struct Edge {
        double t;       // time at the middle level
        double start;   // time leaving the low (rising) or high (falling) level
        double end;     // time reaching the other level
    };
    double Level(double value) const;
    std::pair<std::size_t, std::size_t> WholePeriods() const;
    double Crossing(std::size_t i, double level) const;
    void FindEdges();

    const Trace& trace_;
    double min_amplitude_ = 0;
    double max_ = 0, min_ = 0, top_ = 0, base_ = 0;
    double high_ = 0, mid_ = 0, low_ = 0;
    std::vector<Edge> rising_, falling_;
    std::vector<std::size_t> rising_index_;  // sample index of each rising edge
};

// Delay from edge `edge1` of `a` to edge `edge2` of `b` (negative: falling),
// and the same as a phase in degrees of a's period, in (-180, 180].
std::optional<double> Delay(const Measurer& a, const Measurer& b, int edge1, int edge2);
std::optional<double> Phase(const Measurer& a, const Measurer& b);

}  // namespace qn::emu

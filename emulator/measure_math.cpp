#include "emulator/measure_math.h"

#include <algorithm>
#include <cmath>

namespace qn::emu {
namespace {

constexpr int kHistogramBins = 200;
// A plateau must hold this share of the points of its half to count as the
// top or the base; otherwise (a sine, a triangle) the extreme is taken.
constexpr double kPlateauShare = 0.05;

}  // namespace

Measurer::Measurer(const Trace& trace, const Thresholds& thresholds)
    : trace_(trace), min_amplitude_(thresholds.min_amplitude) {
    if (trace.v.empty()) return;
    const auto [lo, hi] = std::minmax_element(trace.v.begin(), trace.v.end());
    min_ = *lo;
    max_ = *hi;
    top_ = max_;
    base_ = min_;
    const double span = max_ - min_;
    if (span > 0) {
        std::vector<int> bins(kHistogramBins, 0);
        for (double v : trace.v) {
            const int b = std::min(kHistogramBins - 1, static_cast<int>((v - min_) / span * kHistogramBins));
            ++bins[static_cast<std::size_t>(b)];
        }
        const int half = kHistogramBins / 2;
        const auto top_bin = std::max_element(bins.begin() + half, bins.end());
        const auto base_bin = std::max_element(bins.begin(), bins.begin() + half);
        const double need = kPlateauShare * static_cast<double>(trace.v.size()) / 2.0;
        const double width = span / kHistogramBins;
        if (*top_bin >= need)
            top_ = min_ + (static_cast<double>(top_bin - bins.begin()) + 0.5) * width;
        if (*base_bin >= need)
            base_ = min_ + (static_cast<double>(base_bin - bins.begin()) + 0.5) * width;
    }
    high_ = thresholds.percent ? base_ + Amplitude() * thresholds.high / 100.0 : thresholds.high;
    mid_ = thresholds.percent ? base_ + Amplitude() * thresholds.mid / 100.0 : thresholds.mid;
    low_ = thresholds.percent ? base_ + Amplitude() * thresholds.low / 100.0 : thresholds.low;
    FindEdges();
}

// The time at which the straight line from point i to i+1 crosses `level`.
double Measurer::Crossing(std::size_t i, double level) const {
    const double a = trace_.v[i], b = trace_.v[i + 1];
    const double f = b == a ? 0.0 : (level - a) / (b - a);
    return trace_.x0 + (static_cast<double>(i) + f) * trace_.dx;
}

// Edges with hysteresis: a rising edge leaves the low level and reaches the
// high level; its time is the last crossing of the middle level in between
// (falling edges the other way round).
void Measurer::FindEdges() {
    const std::vector<double>& v = trace_.v;
    if (!(high_ > low_) || v.size() < 2 || Amplitude() < min_amplitude_) return;
    int state = v[0] <= low_ ? -1 : v[0] >= high_ ? 1 : 0;  // below low, above high, unknown
    double left_low = 0, left_high = 0, middle = 0;
    std::size_t middle_index = 0;
    for (std::size_t i = 0; i + 1 < v.size(); ++i) {
        const double a = v[i], b = v[i + 1];
        if (a <= low_ && b > low_) left_low = Crossing(i, low_);
        if (a >= high_ && b < high_) left_high = Crossing(i, high_);
        if ((a < mid_ && b >= mid_) || (a > mid_ && b <= mid_)) {
            middle = Crossing(i, mid_);
            middle_index = i;
        }
        if (b >= high_ && state != 1) {
            if (state == -1) {
                rising_.push_back({middle, left_low, Crossing(i, high_)});
                rising_index_.push_back(middle_index);
            }
            state = 1;
        } else if (b <= low_ && state != -1) {
            if (state == 1) falling_.push_back({middle, left_high, Crossing(i, low_)});
            state = -1;
        }
    }
}

double Measurer::TimeAtMax() const {
    const auto it = std::max_element(trace_.v.begin(), trace_.v.end());
    return trace_.x0 + static_cast<double>(it - trace_.v.begin()) * trace_.dx;
}

double Measurer::TimeAtMin() const {
    const auto it = std::min_element(trace_.v.begin(), trace_.v.end());
    return trace_.x0 + static_cast<double>(it - trace_.v.begin()) * trace_.dx;
}

std::pair<std::size_t, std::size_t> Measurer::WholePeriods() const {
    if (rising_index_.size() >= 2) return {rising_index_.front() + 1, rising_index_.back() + 1};
    return {0, trace_.v.size()};
}

double Measurer::Average() const {
    const auto [a, b] = WholePeriods();
    if (a >= b) return 0.0;
    double sum = 0;
    for (std::size_t i = a; i < b; ++i) sum += trace_.v[i];
    return sum / static_cast<double>(b - a);
}

double Measurer::Rms() const {
    const auto [a, b] = WholePeriods();
    if (a >= b) return 0.0;
    double sum = 0;
    for (std::size_t i = a; i < b; ++i) sum += trace_.v[i] * trace_.v[i];
    return std::sqrt(sum / static_cast<double>(b - a));
}

std::optional<double> Measurer::Overshoot() const {
    if (!(Amplitude() > 0)) return std::nullopt;
    return (max_ - top_) / Amplitude() * 100.0;
}

std::optional<double> Measurer::Preshoot() const {
    if (!(Amplitude() > 0)) return std::nullopt;
    return (base_ - min_) / Amplitude() * 100.0;
}

// From the rising edges, or from the falling ones when the record holds
// only one rising edge.
std::optional<double> Measurer::Period() const {
    const std::vector<Edge>& e = rising_.size() >= 2 ? rising_ : falling_;
    if (e.size() < 2) return std::nullopt;
    return (e.back().t - e.front().t) / static_cast<double>(e.size() - 1);
}

std::optional<double> Measurer::Frequency() const {
    const auto p = Period();
    if (!p || !(*p > 0)) return std::nullopt;
    return 1.0 / *p;
}

std::optional<double> Measurer::PositiveWidth() const {
    for (const Edge& r : rising_)
        for (const Edge& f : falling_)
            if (f.t > r.t) return f.t - r.t;
    return std::nullopt;
}

std::optional<double> Measurer::NegativeWidth() const {
    for (const Edge& f : falling_)
        for (const Edge& r : rising_)
            if (r.t > f.t) return r.t - f.t;
    return std::nullopt;
}

std::optional<double> Measurer::DutyCycle() const {
    const auto w = PositiveWidth();
    const auto p = Period();
    if (!w || !p || !(*p > 0)) return std::nullopt;
    return *w / *p * 100.0;
}

std::optional<double> Measurer::RiseTime() const {
    if (rising_.empty()) return std::nullopt;
    return rising_.front().end - rising_.front().start;
}

std::optional<double> Measurer::FallTime() const {
    if (falling_.empty()) return std::nullopt;
    return falling_.front().end - falling_.front().start;
}

std::optional<double> Measurer::EdgeTime(int n) const {
    const std::vector<Edge>& edges = n > 0 ? rising_ : falling_;
    const std::size_t k = static_cast<std::size_t>(n > 0 ? n : -static_cast<long>(n));
    if (n == 0 || k > edges.size()) return std::nullopt;
    return edges[k - 1].t;
}

std::optional<double> Measurer::TimeAtValue(double level, int n) const {
    if (n == 0) return std::nullopt;
    int seen = 0;
    const std::vector<double>& v = trace_.v;
    for (std::size_t i = 0; i + 1 < v.size(); ++i) {
        const bool up = v[i] < level && v[i + 1] >= level;
        const bool down = v[i] > level && v[i + 1] <= level;
        if ((n > 0 && up) || (n < 0 && down)) {
            if (++seen == std::abs(n)) return Crossing(i, level);
        }
    }
    return std::nullopt;
}

std::optional<double> Measurer::ValueAtTime(double t) const {
    if (trace_.v.size() < 2) return std::nullopt;
    // The time of the last point, computed by the caller as x0 + i * dx, may
    // round a hair beyond it.
    const double last = static_cast<double>(trace_.v.size() - 1);
    double pos = (t - trace_.x0) / trace_.dx;
    if (pos > last && pos < last + 1e-9) pos = last;
    if (!(pos >= 0) || pos > last) return std::nullopt;
    const std::size_t i = std::min(static_cast<std::size_t>(pos), trace_.v.size() - 2);
    const double f = pos - static_cast<double>(i);
    return trace_.v[i] + f * (trace_.v[i + 1] - trace_.v[i]);
}

std::optional<double> Delay(const Measurer& a, const Measurer& b, int edge1, int edge2) {
    const auto t1 = a.EdgeTime(edge1);
    const auto t2 = b.EdgeTime(edge2);
    if (!t1 || !t2) return std::nullopt;
    return *t2 - *t1;
}

std::optional<double> Phase(const Measurer& a, const Measurer& b) {
    const auto d = Delay(a, b, 1, 1);
    const auto p = a.Period();
    if (!d || !p || !(*p > 0)) return std::nullopt;
    double deg = std::fmod(*d / *p * 360.0, 360.0);
    if (deg > 180.0) deg -= 360.0;
    if (deg <= -180.0) deg += 360.0;
    return deg;
}

}  // namespace qn::emu

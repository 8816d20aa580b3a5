#include "tools/waveform_files.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <fstream>
#include <string>
#include <utility>
#include <vector>

namespace qn::tools {

namespace {

std::string Number(double v) {
    if (std::isnan(v)) return "";
    char buf[32];
    std::snprintf(buf, sizeof buf, "%.9g", v);
    return buf;
}

struct Bounds {
    double x0 = 0, x1 = 1, y0 = -1, y1 = 1;
};

Bounds Extent(const std::vector<Trace>& traces) {
    Bounds b{1e300, -1e300, 1e300, -1e300};
    for (const Trace& t : traces) {
        if (t.y.empty()) continue;
        b.x0 = std::min(b.x0, t.initial_x);
        b.x1 = std::max(b.x1, t.initial_x + t.x_increment * double(t.y.size() - 1));
        for (double v : t.y)
            if (!std::isnan(v)) b.y0 = std::min(b.y0, v), b.y1 = std::max(b.y1, v);
    }
    if (b.x0 >= b.x1) b.x0 = 0, b.x1 = 1;
    if (b.y0 >= b.y1) b.y0 -= 1, b.y1 += 1;
    const double margin = 0.05 * (b.y1 - b.y0);
    return {b.x0, b.x1, b.y0 - margin, b.y1 + margin};
}

constexpr const char* kColours[] = {"#d4a000", "#00a060", "#0060d0", "#c03070"};
constexpr double kWidth = 900, kHeight = 500, kLeft = 80, kRight = 20, kTop = 30, kBottom = 60;

// Axis ticks at 1, 2 or 5 times a power of ten, about `target` of them
// between lo and hi.
std::vector<double> NiceTicks(double lo, double hi, int target) {
    const double raw = (hi - lo) / target;
    const double mag = std::pow(10.0, std::floor(std::log10(raw)));
    double step = mag;
    for (double m : {1.0, 2.0, 5.0, 10.0})
        if (m * mag >= raw) {
            step = m * mag;
            break;
        }
    std::vector<double> ticks;
    for (double v = std::ceil(lo / step) * step; v <= hi + step * 1e-9; v += step)
        ticks.push_back(std::abs(v) < step * 1e-9 ? 0.0 : v);
    return ticks;
}

// An axis unit with an SI prefix chosen for the largest magnitude shown.
struct AxisUnit {
    double scale;
    std::string label;
};
AxisUnit UnitFor(double lo, double hi, const char* unit) {
    const double m = std::max(std::abs(lo), std::abs(hi));
    static constexpr std::pair<double, const char*> kPrefixes[] = {
        {1e-9, "n"}, {1e-6, "\xC2\xB5"}, {1e-3, "m"}, {1.0, ""}, {1e3, "k"}, {1e6, "M"}};
    AxisUnit u{1.0, unit};
    for (auto [factor, prefix] : kPrefixes)
        if (m >= factor) u = {factor, std::string(prefix) + unit};
    return u;
}

std::string TickLabel(double v, double step, double scale) {
    const double scaled_step = step / scale;
    int decimals = scaled_step >= 1 ? 0 : int(std::ceil(-std::log10(scaled_step) - 1e-9));
    char buf[32];
    std::snprintf(buf, sizeof buf, "%.*f", std::clamp(decimals, 0, 9), v / scale);
    return buf;
}
constexpr std::size_t kMaxPolylinePoints = 4000;  // longer traces are thinned for drawing

}  // namespace

bool WriteCsv(const std::string& path, const std::vector<Trace>& traces) {
    std::ofstream f(path);
    if (!f) return false;
    f << "time_s";
    std::size_t rows = 0;
    for (const Trace& t : traces) {
        f << ',' << t.name << "_V";
        rows = std::max(rows, t.y.size());
    }
    f << '\n';
    const Trace* first = traces.empty() ? nullptr : &traces.front();
    for (std::size_t i = 0; i < rows; ++i) {
        f << (first ? Number(first->initial_x + first->x_increment * double(i)) : "");
        for (const Trace& t : traces) f << ',' << (i < t.y.size() ? Number(t.y[i]) : "");
        f << '\n';
    }
    return bool(f);
}

bool WriteSvg(const std::string& path, const std::vector<Trace>& traces) {
    std::ofstream f(path);
    if (!f) return false;
    const Bounds b = Extent(traces);
    const double pw = kWidth - kLeft - kRight, ph = kHeight - kTop - kBottom;
    auto px = [&](double x) { return kLeft + (x - b.x0) / (b.x1 - b.x0) * pw; };
    auto py = [&](double y) { return kTop + (b.y1 - y) / (b.y1 - b.y0) * ph; };
    f << "<svg xmlns='http://www.w3.org/2000/svg' width='" << kWidth << "' height='" << kHeight
      << "' font-family='sans-serif' font-size='12'>\n"
      << "<rect width='100%' height='100%' fill='white'/>\n"
      << "<rect x='" << kLeft << "' y='" << kTop << "' width='" << pw << "' height='" << ph
      << "' fill='#101418' stroke='black'/>\n";
    const std::vector<double> xt = NiceTicks(b.x0, b.x1, 8), yt = NiceTicks(b.y0, b.y1, 8);
    const AxisUnit xu = UnitFor(b.x0, b.x1, "s"), yu = UnitFor(b.y0, b.y1, "V");
    for (double x : xt) {
        f << "<line x1='" << px(x) << "' y1='" << kTop << "' x2='" << px(x) << "' y2='"
          << kTop + ph << "' stroke='#3a4048'/>\n<text x='" << px(x) << "' y='" << kTop + ph + 16
          << "' text-anchor='middle'>" << TickLabel(x, xt.size() > 1 ? xt[1] - xt[0] : 1, xu.scale)
          << "</text>\n";
    }
    for (double y : yt) {
        f << "<line x1='" << kLeft << "' y1='" << py(y) << "' x2='" << kLeft + pw << "' y2='"
          << py(y) << "' stroke='#3a4048'/>\n<text x='" << kLeft - 6 << "' y='" << py(y) + 4
          << "' text-anchor='end'>" << TickLabel(y, yt.size() > 1 ? yt[1] - yt[0] : 1, yu.scale)
          << "</text>\n";
    }
    f << "<text x='" << kLeft + pw / 2 << "' y='" << kHeight - 15 << "' text-anchor='middle'>time ("
      << xu.label << ")</text>\n"
      << "<text x='18' y='" << kTop + ph / 2 << "' text-anchor='middle' transform='rotate(-90 18 "
      << kTop + ph / 2 << ")'>voltage (" << yu.label << ")</text>\n";
    for (std::size_t k = 0; k < traces.size(); ++k) {
        const Trace& t = traces[k];
        const char* colour = kColours[k % std::size(kColours)];
        const std::size_t step = std::max<std::size_t>(1, t.y.size() / kMaxPolylinePoints);
        f << "<polyline fill='none' stroke='" << colour << "' stroke-width='1.2' points='";
        for (std::size_t i = 0; i < t.y.size(); i += step)
            if (!std::isnan(t.y[i]))
                f << px(t.initial_x + t.x_increment * double(i)) << ',' << py(t.y[i]) << ' ';
        f << "'/>\n<text x='" << kLeft + 10 + 110 * double(k) << "' y='20' fill='" << colour
          << "'>" << t.name << "</text>\n";
    }
    f << "</svg>\n";
    return bool(f);
}

}  // namespace qn::tools

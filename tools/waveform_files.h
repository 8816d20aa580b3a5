// Writers for fetched waveforms: a CSV table (time and one column per trace)
// and an SVG plot with time and voltage axes.
#pragma once

#include <string>
#include <vector>

namespace qn::tools {

struct Trace {
    std::string name;
    double initial_x = 0.0;    // s
    double x_increment = 0.0;  // s
    std::vector<double> y;     // V; NaN where the instrument had no data
};

// False (with errno set by the stream) when the file cannot be written.
bool WriteCsv(const std::string& path, const std::vector<Trace>& traces);
bool WriteSvg(const std::string& path, const std::vector<Trace>& traces);

}  // namespace qn::tools

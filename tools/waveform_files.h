// Writers for fetched waveforms: a CSV table (time and one column per trace)
// and an SVG plot with time and voltage axes.
#pragma once

#include <span>
#include <string>
#include <vector>

#include "platform/com/safearray.h"

namespace qn::tools {

// A fetched waveform. Analog points stay in the driver's output array;
// digital states, converted from the pod's bytes, live in `states`.
struct Trace {
    std::string name;
    double initial_x = 0.0;    // s
    double x_increment = 0.0;  // s
    com::SafeArray array;
    std::vector<double> states;
    std::span<const double> y;  // V or 0/1; NaN where the instrument had no data
};

// False (with errno set by the stream) when the file cannot be written.
bool WriteCsv(const std::string& path, const std::vector<Trace>& traces);
bool WriteSvg(const std::string& path, const std::vector<Trace>& traces);

}  // namespace qn::tools

// Settings of the emulated oscilloscope that *RST restores and *SAV/*RCL store, and the
// acquired record that :WAV:DATA? serves.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "emulator/trigger_state.h"

namespace qn::emu {

inline constexpr int kMaxAnalogChannels = 4;
inline constexpr int kMaxPods = 2;
inline constexpr int kMaxDigitalChannels = 8 * kMaxPods;

// The signal at an analog input: a sine or a square wave of the given
// frequency and peak amplitude, lagging by `phase` degrees. Not a setting of
// the scope: *RST keeps it.
struct InputSignal {
    bool square = false;
    double frequency = 1e3;  // Hz
    double amplitude = 1.0;  // V, peak
    double phase = 0.0;      // degrees of lag
};

struct DigitalSettings {
    bool display = false;
    std::string label;
    double threshold = 1.4;  // V
};

// The measurement subsystem: sources, reference levels and delay edges.
struct MeasureSettings {
    std::string source1 = "CHAN1";
    std::string source2 = "CHAN2";
    std::string mode = "PERC";  // "PERC" or "ABS"
    double high = 90.0;
    double mid = 50.0;
    double low = 10.0;
    int edge1 = 1;  // negative: falling edge
    int edge2 = 1;
};

struct ChannelSettings {
    bool display = false;
    double range = 8.0;   // V, full screen
    double offset = 0.0;  // V
    std::string coupling = "DC";
    std::string impedance = "ONEM";
    bool bandwidth_limit = false;
    double probe = 1.0;
    double skew = 0.0;  // s
    std::string units = "VOLT";
    bool invert = false;
    std::string label;
};

// The manual markers (:MARK).
struct MarkerSettings {
    std::string mode = "OFF";  // "OFF" or "MAN"
    double x1 = 0.0, x2 = 0.0;  // s
    double y1 = 0.0, y2 = 0.0;  // V
    std::string x1y1_source = "CHAN1";
    std::string x2y2_source = "CHAN1";
};

struct ScopeSettings {
    double time_range = 1e-3;  // s, full screen
    double time_position = 0.0;
    std::string time_reference = "CENT";
    std::string acquire_type = "NORM";
    int acquire_count = 8;
    std::string acquire_mode = "RTIM";
    bool vectors = true;
    std::array<ChannelSettings, kMaxAnalogChannels> channels{};
    std::array<bool, kMaxPods> pod_display{};
    std::array<DigitalSettings, kMaxDigitalChannels> digital{};
    MeasureSettings measure;
    bool math_display = false;
    std::string waveform_source = "CHAN1";
    std::string waveform_format = "WORD";
    bool waveform_unsigned = false;
    std::string waveform_byte_order = "MSBF";
    int waveform_points = 1000;
    bool labels = false;
    std::string persistence = "MIN";  // "MIN" or "INF"
    MarkerSettings markers;
    double external_probe = 1.0;
    std::string external_units = "VOLT";
    TriggerSettings trigger;

    ScopeSettings() {
        channels[0].display = true;
        for (std::size_t i = 0; i < channels.size(); ++i) {
            channels[i].label = std::string(1, static_cast<char>('1' + i));
        }
        for (std::size_t d = 0; d < digital.size(); ++d) digital[d].label = "D" + std::to_string(d);
    }
};

// One acquired record of one source, as the digitiser produced it.
struct SourceRecord {
    std::string source;             // "CHAN1", "POD1", ...
    std::vector<std::int16_t> raw;  // analog: signed 16-bit codes; pods: one byte per point
    double y_increment = 0.0;
    double y_origin = 0.0;
    int y_reference = 0;
};

struct AcquiredRecord {
    bool valid = false;
    std::string type;  // "NORM", "PEAK", "AVER", "HRES"
    double x_increment = 0.0;
    double x_origin = 0.0;
    int points = 0;  // points per record (a peak record holds min/max pairs)
    std::vector<SourceRecord> sources;
};

}  // namespace qn::emu

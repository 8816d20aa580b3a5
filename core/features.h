// The feature record of a session: channel counts, bandwidths and the
// optional hardware of the connected model, and the way it is filled.
#pragma once

#include <string_view>

#include "platform/com/types.h"

namespace qn {

class CDriverNode;

struct FeatureRecord {
    bool channel_protection = true;
    bool ground_coupling = false;
    bool auto_level_sweep = false;
    bool fifty_ohm_input = true;
    bool probe_skew = true;
    bool display_labels = true;
    bool external_trigger_input = true;
    bool sequence_trigger = false;        // set only by discovery
    bool early_family = false;
    bool digitize_command = false;
    LONG analog_channel_count = 4;
    LONG digital_channel_count = 16;
    double bandwidth = 1e9;               // Hz
    double bandwidth_limit = 2.5e7;       // Hz
    LONG waveform_point_limit = 1000;
    bool counted_maximum_points = false;  // set only by discovery
};

// The largest channel count of either kind a session accepts from the
// instrument; the real models have at most four analog and sixteen digital
// channels, so a larger reply is a bad one.
inline constexpr LONG kMaxChannelCount = 1024;

// True for the models of the "7312X" and "7314X" families.
bool IsEarlyFamilyModel(std::string_view model);

// The record of a model before any query: the defaults, with the fixed
// rules of the early families applied. Used in simulation and as the start
// of discovery.
FeatureRecord FixedFeatures(std::string_view model);

// Fills the record for the connected instrument: the fixed rules for the
// early families, otherwise the system-data queries in their order; the
// first failing query ends discovery, keeping what was read so far.
FeatureRecord DiscoverFeatures(CDriverNode& root, std::string_view model);

}  // namespace qn

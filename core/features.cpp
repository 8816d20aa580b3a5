#include "core/features.h"

#include <string>

#include "core/models.h"
#include "io/io_manager.h"

namespace qn {

namespace {

bool Contains(std::string_view s, std::string_view part) {
    return s.find(part) != std::string_view::npos;
}

std::string KeyQuery(const char* verb, std::string_view key) {
    return std::string(":SYST:DATA:") + verb + "? \"" + std::string(key) + "\"";
}

// The text of a feature key (at most 127 characters).
HRESULT QueryText(CDriverIOManager& io, std::string_view key, std::string* out) {
    return io.InstrQuery(KeyQuery("VAL", key), out, 127);
}

// A key that only newer firmware knows: its value is read when
// ":SYST:DATA:VER?" for the key answers 1.
HRESULT QueryVersioned(CDriverIOManager& io, std::string_view key, bool* present) {
    LONG version = 0;
    HRESULT hr = io.InstrQuery(KeyQuery("VER", key), &version);
    *present = SUCCEEDED(hr) && version == 1;
    return hr;
}

bool InRange(LONG count) { return count >= 0 && count <= kMaxChannelCount; }

}  // namespace

bool IsEarlyFamilyModel(std::string_view model) {
    const auto& v = CSupportedModelValidator::Instance();
    return v.IsInFamily(model, "7312X") || v.IsInFamily(model, "7314X");
}

FeatureRecord FixedFeatures(std::string_view model) {
    FeatureRecord f;
    if (!IsEarlyFamilyModel(model)) return f;
    f.early_family = true;
    f.waveform_point_limit = 2000;
    if (Contains(model, "1A") || Contains(model, "1D") || Contains(model, "2A") ||
        Contains(model, "2D")) {
        f.analog_channel_count = 2;
    } else {
        f.analog_channel_count = 4;
        f.external_trigger_input = false;
    }
    if (!Contains(model, "D")) {
        f.digital_channel_count = 0;
        f.display_labels = false;
    }
    if (CSupportedModelValidator::Instance().IsInFamily(model, "7312X")) {
        f.bandwidth_limit = 2e7;
        f.auto_level_sweep = true;
        f.ground_coupling = true;
        f.fifty_ohm_input = false;
        f.channel_protection = false;
        f.probe_skew = false;
        f.bandwidth = Contains(model, "73121") ? 6e7 : 1e8;
    } else {
        f.bandwidth = Contains(model, "73141") ? 3e8 : 5e8;
    }
    return f;
}

FeatureRecord DiscoverFeatures(CDriverNode& root, std::string_view model) {
    FeatureRecord f = FixedFeatures(model);
    if (f.early_family) return f;
    CDriverIOManager io(root);
    bool present = false;
    LONG n = 0;
    std::string text;

    if (FAILED(QueryVersioned(io, "DISP:LAB", &present))) return f;
    if (present) {
        if (FAILED(io.InstrQuery(KeyQuery("VAL", "DISP:LAB"), &n))) return f;
        f.display_labels = n > 0;
    }
    f.counted_maximum_points = false;
    if (FAILED(QueryVersioned(io, "WAV:FEAT", &present))) return f;
    if (present) {
        if (FAILED(QueryText(io, "WAV:FEAT", &text))) return f;
        f.counted_maximum_points = Contains(text, "DEC");
    }
    LONG pods = 0, pod_size = 0;
    if (FAILED(io.InstrQuery(KeyQuery("VAL", "COUN:POD"), &pods))) return f;
    if (FAILED(io.InstrQuery(KeyQuery("VAL", "POD:SIZE"), &pod_size))) return f;
    // Counts outside 0..kMaxChannelCount are bad replies: they end
    // discovery like a failed query (and are never multiplied unchecked).
    if (!InRange(pods) || !InRange(pod_size) || !InRange(pods * pod_size)) return f;
    f.digital_channel_count = pods * pod_size;
    LONG analog = 0;
    if (FAILED(io.InstrQuery(KeyQuery("VAL", "COUN:CHAN"), &analog)) || !InRange(analog)) return f;
    f.analog_channel_count = analog;
    if (FAILED(io.InstrQuery(KeyQuery("VAL", "CHAN:BAND"), &f.bandwidth))) return f;
    if (FAILED(io.InstrQuery(KeyQuery("VAL", "CHAN:BWL"), &f.bandwidth_limit))) return f;
    if (FAILED(QueryText(io, "CHAN:FEAT", &text))) return f;
    f.ground_coupling = Contains(text, "GCO");
    f.auto_level_sweep = Contains(text, "ALEV");
    f.fifty_ohm_input = Contains(text, "FIFT");
    f.channel_protection = Contains(text, "PROT");
    f.probe_skew = Contains(text, "PSK");
    if (FAILED(QueryText(io, "TRIG:FEAT", &text))) return f;
    f.external_trigger_input = Contains(text, "EXT");
    if (FAILED(QueryText(io, "TRIG:MOD", &text))) return f;
    f.sequence_trigger = Contains(text, "SEQ");
    if (FAILED(QueryText(io, "ANAL:FEAT", &text))) return f;
    f.digitize_command = Contains(text, "DDIG");
    return f;
}

}  // namespace qn

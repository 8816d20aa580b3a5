#include "emulator/setup_block.h"

#include <charconv>
#include <cmath>
#include <cstdio>
#include <map>

namespace qn::emu {
namespace {

constexpr std::string_view kFirstLine = "QN731XX-SETUP 1";

// Calls v(key, field) for every setting, in one fixed order. S is ScopeSettings, const or not.
template <class S, class V>
void VisitSettings(S& s, V&& v) {
    v("time.range", s.time_range);
    v("time.position", s.time_position);
    v("time.reference", s.time_reference);
    v("acquire.type", s.acquire_type);
    v("acquire.count", s.acquire_count);
    v("acquire.mode", s.acquire_mode);
    v("display.vectors", s.vectors);
    v("display.labels", s.labels);
    v("display.persistence", s.persistence);
    for (std::size_t i = 0; i < s.channels.size(); ++i) {
        auto& c = s.channels[i];
        const std::string p = "channel" + std::to_string(i + 1) + ".";
        v(p + "display", c.display);
        v(p + "range", c.range);
        v(p + "offset", c.offset);
        v(p + "coupling", c.coupling);
        v(p + "impedance", c.impedance);
        v(p + "bwlimit", c.bandwidth_limit);
        v(p + "probe", c.probe);
        v(p + "skew", c.skew);
        v(p + "units", c.units);
        v(p + "invert", c.invert);
        v(p + "label", c.label);
    }
    for (std::size_t i = 0; i < s.pod_display.size(); ++i) {
        v("pod" + std::to_string(i + 1) + ".display", s.pod_display[i]);
    }
    for (std::size_t i = 0; i < s.digital.size(); ++i) {
        auto& d = s.digital[i];
        const std::string p = "digital" + std::to_string(i) + ".";
        v(p + "display", d.display);
        v(p + "label", d.label);
        v(p + "threshold", d.threshold);
    }
    v("measure.source1", s.measure.source1);
    v("measure.source2", s.measure.source2);
    v("measure.mode", s.measure.mode);
    v("measure.high", s.measure.high);
    v("measure.mid", s.measure.mid);
    v("measure.low", s.measure.low);
    v("measure.edge1", s.measure.edge1);
    v("measure.edge2", s.measure.edge2);
    v("math.display", s.math_display);
    v("waveform.source", s.waveform_source);
    v("waveform.format", s.waveform_format);
    v("waveform.unsigned", s.waveform_unsigned);
    v("waveform.byteorder", s.waveform_byte_order);
    v("waveform.points", s.waveform_points);
    v("marker.mode", s.markers.mode);
    v("marker.x1", s.markers.x1);
    v("marker.x2", s.markers.x2);
    v("marker.y1", s.markers.y1);
    v("marker.y2", s.markers.y2);
    v("marker.x1y1", s.markers.x1y1_source);
    v("marker.x2y2", s.markers.x2y2_source);
    v("external.probe", s.external_probe);
    v("external.units", s.external_units);
}

std::string Encode(double v) {
    char text[40];
    std::snprintf(text, sizeof text, "%.17g", v);
    return text;
}
std::string Encode(int v) { return std::to_string(v); }
std::string Encode(bool v) { return v ? "1" : "0"; }
// Strings keep one line: backslash and line feed are escaped.
std::string Encode(const std::string& v) {
    std::string out;
    for (char c : v) {
        if (c == '\\') out += "\\\\";
        else if (c == '\n') out += "\\n";
        else out += c;
    }
    return out;
}

bool Decode(std::string_view text, double* v) {
    const std::string s(text);
    char* end = nullptr;
    *v = std::strtod(s.c_str(), &end);
    return !s.empty() && end == s.c_str() + s.size() && std::isfinite(*v);
}
bool Decode(std::string_view text, int* v) {
    const auto r = std::from_chars(text.data(), text.data() + text.size(), *v);
    return r.ec == std::errc() && r.ptr == text.data() + text.size();
}
bool Decode(std::string_view text, bool* v) {
    if (text != "0" && text != "1") return false;
    *v = text == "1";
    return true;
}
bool Decode(std::string_view text, std::string* v) {
    v->clear();
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (text[i] != '\\') {
            *v += text[i];
            continue;
        }
        if (++i == text.size()) return false;
        if (text[i] == 'n') *v += '\n';
        else if (text[i] == '\\') *v += '\\';
        else return false;
    }
    return true;
}

// Values the instrument could never have had are refused, so that a forged setup cannot put
// the emulator into a state its commands would not allow.
bool Plausible(const ScopeSettings& s, const ModelInfo& model) {
    if (!(s.time_range > 0) || s.acquire_count < 1 || s.acquire_count > 65536) return false;
    if (s.waveform_points < 1 || s.waveform_points > model.family->max_points) return false;
    for (const ChannelSettings& c : s.channels) {
        if (!(c.range > 0) || !(c.probe > 0)) return false;
    }
    return true;
}

}  // namespace

std::string EncodeSetup(const ScopeSettings& settings) {
    std::string out(kFirstLine);
    out += '\n';
    VisitSettings(settings, [&](const std::string& key, const auto& value) {
        out += key + "=" + Encode(value) + "\n";
    });
    return out;
}

std::optional<ScopeSettings> DecodeSetup(std::string_view payload, const ModelInfo& model) {
    if (payload.size() > kMaxSetupBytes) return std::nullopt;
    if (!payload.starts_with(kFirstLine) || payload.size() == kFirstLine.size() ||
        payload[kFirstLine.size()] != '\n') {
        return std::nullopt;
    }
    std::map<std::string, std::string_view, std::less<>> lines;
    std::string_view rest = payload.substr(kFirstLine.size() + 1);
    while (!rest.empty()) {
        const std::size_t end = rest.find('\n');
        if (end == std::string_view::npos) return std::nullopt;  // a line without its end
        const std::string_view line = rest.substr(0, end);
        rest.remove_prefix(end + 1);
        const std::size_t eq = line.find('=');
        if (eq == std::string_view::npos) return std::nullopt;
        lines.emplace(std::string(line.substr(0, eq)), line.substr(eq + 1));
    }
    ScopeSettings s;
    bool ok = true;
    VisitSettings(s, [&](const std::string& key, auto& value) {
        const auto it = lines.find(key);
        ok = ok && it != lines.end() && Decode(it->second, &value);
    });
    if (!ok || !Plausible(s, model)) return std::nullopt;
    return s;
}

}  // namespace qn::emu

#include "emulator/waveform.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <numbers>

namespace qn::emu {
namespace {

constexpr double kCodesPerScreen = 64000.0;  // WORD codes spanning the full screen
constexpr std::int16_t kMaxCode = 32767;

double ReferenceFraction(const std::string& reference) {
    if (reference == "LEFT") return 0.1;
    if (reference == "RIGH") return 0.9;
    return 0.5;
}

double StartTime(const ScopeSettings& s) {
    return s.time_position - s.time_range * ReferenceFraction(s.time_reference);
}

// Small deterministic generator so that records are reproducible.
class Noise {
  public:
    explicit Noise(std::uint32_t seed) : state_(seed * 2654435761u + 1u) {}
    double Next() {  // uniform in [-1, 1)
        state_ = state_ * 1664525u + 1013904223u;
        return static_cast<double>(state_ >> 8) / static_cast<double>(1u << 23) - 1.0;
    }

  private:
    std::uint32_t state_;
};

SourceRecord AnalogRecord(const ScopeSettings& s, const InputSignal& in, int channel, int length,
                          std::uint32_t seed, double shift) {
    const ChannelSettings& c = s.channels[static_cast<std::size_t>(channel - 1)];
    SourceRecord r;
    r.source = "CHAN" + std::to_string(channel);
    r.y_increment = c.range / kCodesPerScreen;
    r.y_origin = c.offset;
    r.raw.resize(static_cast<std::size_t>(length));
    double noise_level = 0.01 * c.range;
    if (s.acquire_type == "AVER") noise_level /= std::sqrt(std::max(1, s.acquire_count));
    if (s.acquire_type == "HRES") noise_level /= 4.0;
    Noise noise(seed + static_cast<std::uint32_t>(channel));
    const double dt = s.time_range / length;
    for (int i = 0; i < length; ++i) {
        const double phase =
            2.0 * std::numbers::pi * in.frequency * (StartTime(s) + i * dt + shift) -
            in.phase * std::numbers::pi / 180.0;
        double v = in.square ? (std::sin(phase) >= 0 ? 1.0 : -1.0) : std::sin(phase);
        v = v * in.amplitude + noise.Next() * noise_level;
        if (c.invert) v = -v;
        if (c.coupling == "GND") v = 0.0;
        const double code =
            std::clamp(std::round((v - c.offset) / r.y_increment), -static_cast<double>(kMaxCode),
                       static_cast<double>(kMaxCode));
        r.raw[static_cast<std::size_t>(i)] = static_cast<std::int16_t>(code);
    }
    return r;
}

SourceRecord PodRecord(int pod, int length) {
    SourceRecord r;
    r.source = "POD" + std::to_string(pod);
    r.y_increment = 1.0;
    r.raw = PodPattern(pod, length);
    return r;
}

// The level of the serial line in bit period `n`: frames of ten bits.
int SerialBit(int n) {
    static constexpr char kText[] = {'Q', 'N'};
    const int frame = n / 10, bit = n % 10;
    if (bit == 0) return 0;  // start bit
    if (bit == 9) return 1;  // stop bit
    return (kText[frame % 2] >> (bit - 1)) & 1;
}

const SourceRecord* FindSource(const AcquiredRecord& record, const std::string& source) {
    for (const SourceRecord& r : record.sources) {
        if (r.source == source) return &r;
    }
    return nullptr;
}

int TypeCode(const std::string& type) {
    if (type == "PEAK") return 1;
    if (type == "AVER") return 2;
    if (type == "HRES") return 3;
    return 0;
}

int TransferPoints(const ScopeSettings& s, const ModelInfo& model) {
    return std::clamp(s.waveform_points, 1, model.family->max_points);
}

// Decimated codes of one source; a peak record yields min/max pairs.
std::vector<std::int16_t> Decimate(const SourceRecord& r, int points, bool peak) {
    std::vector<std::int16_t> out;
    const std::size_t length = r.raw.size();
    const std::size_t n = std::min<std::size_t>(static_cast<std::size_t>(points), length);
    out.reserve(peak ? 2 * n : n);
    for (std::size_t i = 0; i < n; ++i) {
        const std::size_t begin = i * length / n;
        const std::size_t end = std::max(begin + 1, (i + 1) * length / n);
        if (!peak) {
            out.push_back(r.raw[begin]);
            continue;
        }
        const auto [lo, hi] = std::minmax_element(r.raw.begin() + static_cast<long>(begin),
                                                  r.raw.begin() + static_cast<long>(end));
        out.push_back(*lo);
        out.push_back(*hi);
    }
    return out;
}

bool IsPod(const std::string& source) {
    return source.rfind("POD", 0) == 0;
}

}  // namespace

std::vector<std::int16_t> PodPattern(int pod, int length) {
    std::vector<std::int16_t> raw(static_cast<std::size_t>(std::max(0, length)));
    const int step = std::max(1, length / 256);
    for (int i = 0; i < length; ++i) {
        const int count = (i / step) & 0xFF;
        int bits = count;
        if (pod != 1) bits = ((0xFF - count) & 0xFC) | ((i / step) & 1) | (SerialBit(i / step) << 1);
        raw[static_cast<std::size_t>(i)] = static_cast<std::int16_t>(bits);
    }
    return raw;
}

std::array<InputSignal, kMaxAnalogChannels> DefaultInputs() {
    std::array<InputSignal, kMaxAnalogChannels> in{};
    for (int ch = 1; ch <= kMaxAnalogChannels; ++ch)
        in[static_cast<std::size_t>(ch - 1)] = {ch % 2 == 0, (1.0 + ch) * 1e3, 2.4, 0.0};
    return in;
}

std::optional<double> EdgeTriggerShift(const ScopeSettings& s, const ModelInfo& model,
                                       std::span<const InputSignal> inputs) {
    const TriggerSettings& t = s.trigger;
    if (t.mode != "EDGE" || t.source.rfind("CHAN", 0) != 0) return 0.0;
    const int channel = t.source[4] - '0';
    if (channel < 1 || channel > model.analog_channels ||
        static_cast<std::size_t>(channel) > inputs.size())
        return 0.0;
    const ChannelSettings& c = s.channels[static_cast<std::size_t>(channel - 1)];
    const InputSignal& in = inputs[static_cast<std::size_t>(channel - 1)];
    if (c.coupling == "GND" || in.frequency <= 0.0) return std::nullopt;
    // The displayed signal is sign * A * w(theta); find the phase theta where it crosses the
    // level in the wanted direction.
    const double sign = c.invert ? -1.0 : 1.0;
    const double rising = t.slope == "NEG" ? -1.0 : 1.0;  // EITH and ALT fire on rising first
    const double pi = std::numbers::pi;
    double theta = 0.0;
    if (in.square) {
        // The square wave steps at theta 0 (up) and pi (down) between -A and +A.
        if (std::abs(t.level) >= in.amplitude) return std::nullopt;
        theta = sign * rising > 0 ? 0.0 : pi;
    } else {
        const double u = sign * t.level / in.amplitude;
        if (!(std::abs(u) <= 1.0)) return std::nullopt;
        theta = sign * rising > 0 ? std::asin(u) : pi - std::asin(u);
    }
    // theta = 2 pi f (0 + shift) - lag
    return (theta + in.phase * pi / 180.0) / (2.0 * pi * in.frequency);
}

bool TriggerFires(const ScopeSettings& s, const ModelInfo& model,
                  std::span<const InputSignal> inputs) {
    return s.trigger.sweep != "NORM" || EdgeTriggerShift(s, model, inputs).has_value();
}

AcquiredRecord SynthesizeRecord(const ScopeSettings& s, const ModelInfo& model,
                                std::span<const InputSignal> inputs, std::uint32_t acquisition) {
    AcquiredRecord record;
    record.valid = true;
    record.type = s.acquire_type;
    record.points = model.family->max_points;
    record.x_increment = s.time_range / record.points;
    record.x_origin = StartTime(s);
    const double shift = EdgeTriggerShift(s, model, inputs).value_or(0.0);
    for (int ch = 1; ch <= model.analog_channels; ++ch) {
        if (s.channels[static_cast<std::size_t>(ch - 1)].display) {
            record.sources.push_back(AnalogRecord(s, inputs[static_cast<std::size_t>(ch - 1)], ch,
                                                  record.points, acquisition, shift));
        }
    }
    for (int pod = 1; pod <= model.pods; ++pod) {
        if (s.pod_display[static_cast<std::size_t>(pod - 1)]) {
            record.sources.push_back(PodRecord(pod, record.points));
        }
    }
    return record;
}

TransferScale ComputeScale(const ScopeSettings& s, const AcquiredRecord& record,
                           const ModelInfo& model) {
    TransferScale scale;
    scale.format = s.waveform_format == "BYTE" ? 0 : 1;
    scale.points = TransferPoints(s, model);
    const SourceRecord* src = record.valid ? FindSource(record, s.waveform_source) : nullptr;
    const std::string type = src ? record.type : s.acquire_type;
    scale.type = TypeCode(type);
    scale.count = type == "AVER" ? s.acquire_count : 1;
    scale.x_increment = (src ? record.x_increment * record.points : s.time_range) / scale.points;
    scale.x_origin = src ? record.x_origin : StartTime(s);
    if (IsPod(s.waveform_source)) {
        scale.y_increment = 1.0;
        return scale;
    }
    int channel = 1;
    if (s.waveform_source.rfind("CHAN", 0) == 0) channel = s.waveform_source[4] - '0';
    const ChannelSettings& c = s.channels[static_cast<std::size_t>(std::clamp(channel, 1, 4) - 1)];
    scale.y_increment = src ? src->y_increment : c.range / kCodesPerScreen;
    scale.y_origin = src ? src->y_origin : c.offset;
    if (scale.format == 0) scale.y_increment *= 256.0;  // BYTE keeps the top 8 bits
    if (s.waveform_unsigned) scale.y_reference = scale.format == 0 ? 128 : 32768;
    return scale;
}

std::string FormatPreamble(const TransferScale& t) {
    char text[256];
    std::snprintf(text, sizeof text, "%d,%d,%d,%d,%.10E,%.10E,0,%.10E,%.10E,%d", t.format, t.type,
                  t.points, t.count, t.x_increment, t.x_origin, t.y_increment, t.y_origin,
                  t.y_reference);
    return text;
}

std::string MakeBlock(const std::string& payload) {
    const std::string length = std::to_string(payload.size());
    return "#" + std::to_string(length.size()) + length + payload;
}

std::optional<std::string> EncodeWaveformBlock(const ScopeSettings& s, const AcquiredRecord& record,
                                               const ModelInfo& model) {
    const SourceRecord* src = record.valid ? FindSource(record, s.waveform_source) : nullptr;
    if (!src) return std::nullopt;
    const bool pod = IsPod(src->source);
    const std::vector<std::int16_t> codes =
        Decimate(*src, TransferPoints(s, model), record.type == "PEAK");
    std::string payload;
    const bool word = s.waveform_format != "BYTE";
    payload.reserve(codes.size() * (word ? 2 : 1));
    for (std::int16_t code : codes) {
        int value = code;
        if (!word && !pod) value = code >> 8;  // keep the top 8 bits
        if (s.waveform_unsigned && !pod) value += word ? 32768 : 128;
        const auto bits = static_cast<std::uint16_t>(value);
        if (!word) {
            payload.push_back(static_cast<char>(bits & 0xFF));
        } else if (s.waveform_byte_order == "LSBF") {
            payload.push_back(static_cast<char>(bits & 0xFF));
            payload.push_back(static_cast<char>(bits >> 8));
        } else {
            payload.push_back(static_cast<char>(bits >> 8));
            payload.push_back(static_cast<char>(bits & 0xFF));
        }
    }
    return MakeBlock(payload);
}

}  // namespace qn::emu

// Digital channels of the mixed-signal models (:DIGital<d>, zero-based d,
// eight to a pod), their activity counters, and the emulator's own command
// that sets the signal at an analog input.
#include <array>
#include <string>

#include "emulator/handler_util.h"
#include "emulator/scope_sources.h"
#include "emulator/waveform.h"

namespace qn::emu {
namespace {

constexpr int kChannelsPerPod = 8;
constexpr std::array<const char*, 2> kShapes = {"SINusoid", "SQUare"};

DigitalSettings* DigitalOf(Instrument& inst, const Call& call) {
    const int d = call.suffix(0);
    if (d < 0 || d >= inst.model().pods * kChannelsPerPod) {
        inst.Error(err::kSuffixOutOfRange);
        return nullptr;
    }
    return &inst.settings().digital[static_cast<std::size_t>(d)];
}

// A channel shown or hidden shows or hides its pod with it: the pod is on
// while any of its channels is.
void SetDisplay(Instrument& inst, Call& call) {
    DigitalSettings* dig = DigitalOf(inst, call);
    if (!dig || !ExpectArgs(inst, call, 1)) return;
    const auto on = BoolArg(inst, call.arg(0));
    if (!on) return;
    dig->display = *on;
    ScopeSettings& s = inst.settings();
    const int pod = call.suffix(0) / kChannelsPerPod;
    bool any = false;
    for (int i = 0; i < kChannelsPerPod; ++i)
        any = any || s.digital[static_cast<std::size_t>(pod * kChannelsPerPod + i)].display;
    s.pod_display[static_cast<std::size_t>(pod)] = any;
}
void QueryDisplay(Instrument& inst, Call& call) {
    DigitalSettings* dig = DigitalOf(inst, call);
    if (dig && NoArgs(inst, call)) call.reply = FormatBool(dig->display);
}

void SetLabel(Instrument& inst, Call& call) {
    DigitalSettings* dig = DigitalOf(inst, call);
    if (!dig || !ExpectArgs(inst, call, 1)) return;
    if (auto v = StringArg(inst, call.arg(0))) dig->label = *v;
}
void QueryLabel(Instrument& inst, Call& call) {
    DigitalSettings* dig = DigitalOf(inst, call);
    if (dig && NoArgs(inst, call)) call.reply = Quote(dig->label);
}

void SetThreshold(Instrument& inst, Call& call) {
    DigitalSettings* dig = DigitalOf(inst, call);
    if (!dig || !ExpectArgs(inst, call, 1)) return;
    if (auto v = NumberInRange(inst, call.arg(0), -8.0, 8.0)) dig->threshold = *v;
}
void QueryThreshold(Instrument& inst, Call& call) {
    DigitalSettings* dig = DigitalOf(inst, call);
    if (dig && NoArgs(inst, call)) call.reply = FormatNumber(dig->threshold);
}

// :ACT clears the edge flags; they show again after the next acquisition.
void ResetActivity(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) inst.activity_reset() = inst.acquisitions();
}

// "<edges>,<levels>": one bit per digital channel, set when the channel
// changed in the record (edges) and when it ends high (levels).
void QueryActivity(Instrument& inst, Call& call) {
    if (!NoArgs(inst, call)) return;
    const int points = inst.model().family->max_points;
    const bool cleared = inst.activity_reset() && *inst.activity_reset() == inst.acquisitions();
    long edges = 0, levels = 0;
    for (int pod = 1; pod <= inst.model().pods; ++pod) {
        const std::vector<std::int16_t> codes = PodPattern(pod, points);
        int changed = 0;
        for (std::size_t i = 1; i < codes.size(); ++i) changed |= codes[i] ^ codes[i - 1];
        const int shift = (pod - 1) * kChannelsPerPod;
        if (!cleared) edges |= static_cast<long>(changed & 0xFF) << shift;
        if (!codes.empty()) levels |= static_cast<long>(codes.back() & 0xFF) << shift;
    }
    call.reply = std::to_string(edges) + "," + std::to_string(levels);
}

// :EMULator:INPut<n> SIN|SQU,<frequency Hz>,<peak-to-peak V>,<phase lag degrees>
void SetInput(Instrument& inst, Call& call) {
    const int n = call.suffix(0);
    if (n < 1 || n > inst.model().analog_channels) return inst.Error(err::kSuffixOutOfRange);
    if (!ExpectArgs(inst, call, 4)) return;
    const auto shape = TokenArg(inst, call.arg(0), kShapes);
    const auto f = shape ? NumberInRange(inst, call.arg(1), 0.0, 1e10) : std::nullopt;
    const auto vpp = f ? NumberInRange(inst, call.arg(2), 0.0, 1e3) : std::nullopt;
    const auto phase = vpp ? NumberInRange(inst, call.arg(3), -3600.0, 3600.0) : std::nullopt;
    if (!phase) return;
    inst.inputs()[static_cast<std::size_t>(n - 1)] = {*shape == "SQU", *f, *vpp / 2.0, *phase};
}
void QueryInput(Instrument& inst, Call& call) {
    const int n = call.suffix(0);
    if (n < 1 || n > inst.model().analog_channels) return inst.Error(err::kSuffixOutOfRange);
    if (!NoArgs(inst, call)) return;
    const InputSignal& s = inst.inputs()[static_cast<std::size_t>(n - 1)];
    call.reply = std::string(s.square ? "SQU" : "SIN") + "," + FormatNumber(s.frequency) + "," +
                 FormatNumber(2.0 * s.amplitude) + "," + FormatNumber(s.phase);
}

constexpr CommandSpec kDigital[] = {
    {"DIGital&:DISPlay", SetDisplay, QueryDisplay, kFeatDigital},
    {"DIGital&:LABel", SetLabel, QueryLabel, kFeatDigital},
    {"DIGital&:THReshold", SetThreshold, QueryThreshold, kFeatDigital},
    {"ACTivity", ResetActivity, QueryActivity, kFeatDigital},
    {"EMULator:INPut#", SetInput, QueryInput},
};

}  // namespace

std::span<const CommandSpec> DigitalCommands() {
    return kDigital;
}

}  // namespace qn::emu

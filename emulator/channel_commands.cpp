// Analog channel and digital pod settings. Each channel keeps its own state; values outside
// the hardware's range are refused with -222, values needing missing hardware with -241, and
// commands of missing features are not in the model's command tree at all.
#include <array>
#include <cmath>

#include "emulator/handler_util.h"
#include "emulator/scope_sources.h"

namespace qn::emu {
namespace {

constexpr std::array<const char*, 3> kCouplings = {"AC", "DC", "GND"};
constexpr std::array<const char*, 2> kImpedances = {"ONEMeg", "FIFTy"};
constexpr std::array<const char*, 2> kUnits = {"VOLT", "AMPere"};
constexpr double kMinVoltsPerScreen = 8e-3;  // at the probe tip of a 1:1 probe
constexpr double kMaxVoltsPerScreen = 40.0;
constexpr double kMaxSkew = 100e-9;
constexpr std::size_t kMaxLabel = 32;

// Runs `body` on the addressed channel when the single argument is present.
template <typename Body>
void WithChannelArg(Instrument& inst, Call& call, Body body) {
    ChannelSettings* ch = ChannelOf(inst, call);
    if (ch && ExpectArgs(inst, call, 1)) body(*ch, call.arg(0));
}

template <typename Format>
void ReplyChannel(Instrument& inst, Call& call, Format format) {
    ChannelSettings* ch = ChannelOf(inst, call);
    if (ch && NoArgs(inst, call)) call.reply = format(*ch);
}

void SetDisplay(Instrument& inst, Call& call) {
    WithChannelArg(inst, call, [&](ChannelSettings& ch, const Argument& a) {
        if (auto v = BoolArg(inst, a)) ch.display = *v;
    });
}
void QueryDisplay(Instrument& inst, Call& call) {
    ReplyChannel(inst, call, [](const ChannelSettings& ch) { return FormatBool(ch.display); });
}

void SetRange(Instrument& inst, Call& call) {
    WithChannelArg(inst, call, [&](ChannelSettings& ch, const Argument& a) {
        const double min = kMinVoltsPerScreen * ch.probe;
        if (auto v = NumberInRange(inst, a, min, kMaxVoltsPerScreen * ch.probe)) ch.range = *v;
    });
}
void QueryRange(Instrument& inst, Call& call) {
    ReplyChannel(inst, call, [](const ChannelSettings& ch) { return FormatNumber(ch.range); });
}

void SetOffset(Instrument& inst, Call& call) {
    WithChannelArg(inst, call, [&](ChannelSettings& ch, const Argument& a) {
        const double limit = std::max(2.0 * ch.probe, 5.0 * ch.range);
        if (auto v = NumberInRange(inst, a, -limit, limit)) ch.offset = *v;
    });
}
void QueryOffset(Instrument& inst, Call& call) {
    ReplyChannel(inst, call, [](const ChannelSettings& ch) { return FormatNumber(ch.offset); });
}

void SetCoupling(Instrument& inst, Call& call) {
    WithChannelArg(inst, call, [&](ChannelSettings& ch, const Argument& a) {
        const auto v = TokenArg(inst, a, kCouplings);
        if (!v) return;
        if (*v == "GND" && !inst.model().Has(kFeatGroundCoupling)) {
            inst.Error(err::kHardwareMissing);
            return;
        }
        ch.coupling = *v;
    });
}
void QueryCoupling(Instrument& inst, Call& call) {
    ReplyChannel(inst, call, [](const ChannelSettings& ch) { return ch.coupling; });
}

void SetImpedance(Instrument& inst, Call& call) {
    WithChannelArg(inst, call, [&](ChannelSettings& ch, const Argument& a) {
        const auto v = TokenArg(inst, a, kImpedances);
        if (!v) return;
        if (*v == "FIFT" && !inst.model().Has(kFeatFiftyOhm)) {
            inst.Error(err::kHardwareMissing);
            return;
        }
        ch.impedance = *v;
    });
}
void QueryImpedance(Instrument& inst, Call& call) {
    ReplyChannel(inst, call, [](const ChannelSettings& ch) { return ch.impedance; });
}

void SetBandwidthLimit(Instrument& inst, Call& call) {
    WithChannelArg(inst, call, [&](ChannelSettings& ch, const Argument& a) {
        if (auto v = BoolArg(inst, a)) ch.bandwidth_limit = *v;
    });
}
void QueryBandwidthLimit(Instrument& inst, Call& call) {
    ReplyChannel(inst, call,
                 [](const ChannelSettings& ch) { return FormatBool(ch.bandwidth_limit); });
}

// A new probe attenuation scales the range and offset with it, as on the instrument panel.
void SetProbe(Instrument& inst, Call& call) {
    WithChannelArg(inst, call, [&](ChannelSettings& ch, const Argument& a) {
        const auto v = NumberInRange(inst, a, 0.1, 10000.0);
        if (!v) return;
        ch.range *= *v / ch.probe;
        ch.offset *= *v / ch.probe;
        ch.probe = *v;
    });
}
void QueryProbe(Instrument& inst, Call& call) {
    ReplyChannel(inst, call, [](const ChannelSettings& ch) { return FormatNumber(ch.probe); });
}

void SetSkew(Instrument& inst, Call& call) {
    WithChannelArg(inst, call, [&](ChannelSettings& ch, const Argument& a) {
        if (auto v = NumberInRange(inst, a, -kMaxSkew, kMaxSkew)) ch.skew = *v;
    });
}
void QuerySkew(Instrument& inst, Call& call) {
    ReplyChannel(inst, call, [](const ChannelSettings& ch) { return FormatNumber(ch.skew); });
}

void SetUnits(Instrument& inst, Call& call) {
    WithChannelArg(inst, call, [&](ChannelSettings& ch, const Argument& a) {
        if (auto v = TokenArg(inst, a, kUnits)) ch.units = *v;
    });
}
void QueryUnits(Instrument& inst, Call& call) {
    ReplyChannel(inst, call, [](const ChannelSettings& ch) { return ch.units; });
}

void SetInvert(Instrument& inst, Call& call) {
    WithChannelArg(inst, call, [&](ChannelSettings& ch, const Argument& a) {
        if (auto v = BoolArg(inst, a)) ch.invert = *v;
    });
}
void QueryInvert(Instrument& inst, Call& call) {
    ReplyChannel(inst, call, [](const ChannelSettings& ch) { return FormatBool(ch.invert); });
}

void SetLabel(Instrument& inst, Call& call) {
    WithChannelArg(inst, call, [&](ChannelSettings& ch, const Argument& a) {
        const auto v = StringArg(inst, a);
        if (!v) return;
        if (v->size() > kMaxLabel) {
            inst.Error(err::kDataOutOfRange);
            return;
        }
        ch.label = *v;
    });
}
void QueryLabel(Instrument& inst, Call& call) {
    ReplyChannel(inst, call, [](const ChannelSettings& ch) { return Quote(ch.label); });
}

// Inputs never overload in the emulator.
void QueryProtection(Instrument& inst, Call& call) {
    ReplyChannel(inst, call, [](const ChannelSettings&) { return std::string("NORM"); });
}
void ClearProtection(Instrument& inst, Call& call) {
    if (ChannelOf(inst, call)) NoArgs(inst, call);
}

bool* PodDisplay(Instrument& inst, const Call& call) {
    const int n = call.suffix(0);
    if (n < 1 || n > inst.model().pods) {
        inst.Error(err::kSuffixOutOfRange);
        return nullptr;
    }
    return &inst.settings().pod_display[static_cast<std::size_t>(n - 1)];
}
void SetPodDisplay(Instrument& inst, Call& call) {
    bool* display = PodDisplay(inst, call);
    if (!display || !ExpectArgs(inst, call, 1)) return;
    const auto v = BoolArg(inst, call.arg(0));
    if (!v) return;
    *display = *v;
    // The pod's eight channels follow it.
    const std::size_t first = static_cast<std::size_t>(call.suffix(0) - 1) * 8;
    for (std::size_t d = first; d < first + 8; ++d) inst.settings().digital[d].display = *v;
}
void QueryPodDisplay(Instrument& inst, Call& call) {
    bool* display = PodDisplay(inst, call);
    if (display && NoArgs(inst, call)) call.reply = FormatBool(*display);
}

constexpr CommandSpec kChannel[] = {
    {"CHANnel#:DISPlay", SetDisplay, QueryDisplay},
    {"CHANnel#:RANGe", SetRange, QueryRange},
    {"CHANnel#:OFFSet", SetOffset, QueryOffset},
    {"CHANnel#:COUPling", SetCoupling, QueryCoupling},
    {"CHANnel#:IMPedance", SetImpedance, QueryImpedance},
    {"CHANnel#:BWLimit", SetBandwidthLimit, QueryBandwidthLimit},
    {"CHANnel#:PROBe", SetProbe, QueryProbe},
    {"CHANnel#:PROBe:SKEW", SetSkew, QuerySkew, kFeatProbeSkew},
    {"CHANnel#:UNITs", SetUnits, QueryUnits},
    {"CHANnel#:INVert", SetInvert, QueryInvert},
    {"CHANnel#:LABel", SetLabel, QueryLabel},
    {"CHANnel#:PROTection", nullptr, QueryProtection, kFeatProtection},
    {"CHANnel#:PROTection:CLEar", ClearProtection, nullptr, kFeatProtection},
    {"POD#:DISPlay", SetPodDisplay, QueryPodDisplay, kFeatDigital},
};

}  // namespace

std::span<const CommandSpec> ChannelCommands() {
    return kChannel;
}

}  // namespace qn::emu

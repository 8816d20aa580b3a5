// :SYSTem clock, front-panel lock and setup transfer, and the serial number query.
#include <array>
#include <cstdio>
#include <string>

#include "emulator/handler_util.h"
#include "emulator/setup_block.h"

namespace qn::emu {
namespace {

struct FieldLimits {
    int min, max;
};
constexpr std::array<FieldLimits, 3> kDateLimits = {{{1970, 2099}, {1, 12}, {1, 31}}};
constexpr std::array<FieldLimits, 3> kTimeLimits = {{{0, 23}, {0, 59}, {0, 59}}};

// Three integers within their limits ("+2026,+12,+6"); -109 / -108 for the count, -222 out of
// range. Nothing changes unless all three are good.
template <std::array<int, 3> SystemState::*Field, const std::array<FieldLimits, 3>& Limits>
void SetTriple(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 3)) return;
    std::array<int, 3> v{};
    for (std::size_t i = 0; i < v.size(); ++i) {
        const auto n = IntegerInRange(inst, call.arg(i), Limits[i].min, Limits[i].max);
        if (!n) return;
        v[i] = *n;
    }
    inst.system().*Field = v;
}

template <std::array<int, 3> SystemState::*Field>
void QueryTriple(Instrument& inst, Call& call) {
    if (!NoArgs(inst, call)) return;
    const auto& v = inst.system().*Field;
    char text[48];
    std::snprintf(text, sizeof text, "%+d,%+d,%+d", v[0], v[1], v[2]);
    call.reply = text;
}

void QuerySerial(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = inst.model().serial;
}

void SetLock(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = BoolArg(inst, call.arg(0))) inst.system().locked = *v;
}

void QueryLock(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = FormatBool(inst.system().locked);
}

void QuerySetup(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) {
        const std::string payload = EncodeSetup(inst.settings());
        const std::string length = std::to_string(payload.size());
        call.reply = "#" + std::to_string(length.size()) + length + payload;
    }
}

// A block that is not a setup of this instrument changes nothing (-230).
void SetSetup(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (call.arg(0).kind != Argument::Kind::kBlock) {
        inst.Error(err::kDataType);
        return;
    }
    auto settings = DecodeSetup(call.arg(0).value, inst.model());
    if (!settings) {
        inst.Error(err::kDataCorrupt);
        return;
    }
    inst.StopAcquisition();
    inst.settings() = std::move(*settings);
}

constexpr CommandSpec kSystem[] = {
    {"SYSTem:DATE", SetTriple<&SystemState::date, kDateLimits>, QueryTriple<&SystemState::date>},
    {"SYSTem:TIME", SetTriple<&SystemState::time, kTimeLimits>, QueryTriple<&SystemState::time>},
    {"SYSTem:LOCK", SetLock, QueryLock},
    {"SYSTem:SETup", SetSetup, QuerySetup},
    {"SERial", nullptr, QuerySerial},
};

}  // namespace

std::span<const CommandSpec> SystemCommands() {
    return kSystem;
}

}  // namespace qn::emu

// Operation, overload, trigger and arm registers. The newer families read the operation
// condition with OPER:COND? and its events with :OPER:EVEN?; the early families only have the
// OPER? condition query.
#include "emulator/handler_util.h"

namespace qn::emu {
namespace {

void QueryOperCondition(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = std::to_string(inst.status().operation_condition());
}

void QueryOperEvent(Instrument& inst, Call& call) {
    if (NoArgs(inst, call))
        call.reply = std::to_string(inst.status().ReadAndClearOperationEvents());
}

void SetOperEnable(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = IntegerInRange(inst, call.arg(0), 0, 65535)) {
        inst.status().set_operation_enable(static_cast<std::uint16_t>(*v));
    }
}

void QueryOperEnable(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = std::to_string(inst.status().operation_enable());
}

// Overload register: inputs never overload in the emulator; only the enable mask is kept.

void SetOverloadEnable(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = IntegerInRange(inst, call.arg(0), 0, 4095)) inst.status().set_overload_enable(*v);
}

void QueryOverloadEnable(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = std::to_string(inst.status().overload_enable());
}

void QueryZero(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = "0";
}

// Trigger event register: 1 once an acquisition has triggered.
void QueryTriggerEvent(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = inst.record().valid ? "1" : "0";
}

void QueryOne(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = "1";
}

constexpr CommandSpec kStatus[] = {
    {"OPERegister:CONDition", nullptr, QueryOperCondition, kFeatSystemData},
    {"OPERegister:EVENt", nullptr, QueryOperEvent, kFeatSystemData},
    {"OPERegister", nullptr, QueryOperCondition, kFeatEarlyDialect},
    {"OPEE", SetOperEnable, QueryOperEnable},
    {"OVL", SetOverloadEnable, QueryOverloadEnable, kFeatProtection},
    {"OVLR", nullptr, QueryZero, kFeatProtection},
    {"TER", nullptr, QueryTriggerEvent},
    {"AER", nullptr, QueryOne},
};

}  // namespace

std::span<const CommandSpec> StatusCommands() {
    return kStatus;
}

}  // namespace qn::emu

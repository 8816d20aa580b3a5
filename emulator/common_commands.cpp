// IEEE 488.2 common commands and the SCPI error queue.
#include <string>

#include "emulator/handler_util.h"

namespace qn::emu {
namespace {

void Idn(Instrument& inst, Call& call) {
    if (!NoArgs(inst, call)) return;
    const ModelInfo& m = inst.model();
    call.reply = "QUORLEN TECHNOLOGIES," + m.name + "," + m.serial + "," + m.family->firmware;
}

void Rst(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) inst.Reset();
}

void Cls(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) inst.status().Clear();
}

void SetEse(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = IntegerInRange(inst, call.arg(0), 0, 255)) {
        inst.status().set_event_enable(static_cast<std::uint8_t>(*v));
    }
}

void QueryEse(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = std::to_string(inst.status().event_enable());
}

void QueryEsr(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = std::to_string(inst.status().ReadAndClearEvents());
}

void SetSre(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = IntegerInRange(inst, call.arg(0), 0, 255)) {
        inst.status().set_request_enable(static_cast<std::uint8_t>(*v));
    }
}

void QuerySre(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = std::to_string(inst.status().request_enable());
}

void QueryStb(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) {
        call.reply = std::to_string(inst.status().StatusByte(inst.message_available()));
    }
}

void Opc(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) inst.ArmOperationComplete();
}

void QueryOpc(Instrument& inst, Call& call) {
    if (!NoArgs(inst, call)) return;
    inst.WaitForCompletion();
    call.reply = "1";
}

void Wai(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) inst.WaitForCompletion();
}

// A bus trigger: an armed acquisition triggers at once (not armed: ignored).
void Trg(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) inst.BusTrigger();
}

void QueryTst(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = "0";
}

void Sav(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto slot = IntegerInRange(inst, call.arg(0), 0, Instrument::kSetupSlots - 1)) {
        inst.Save(*slot);
    }
}

void Rcl(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    const auto slot = IntegerInRange(inst, call.arg(0), 0, Instrument::kSetupSlots - 1);
    if (slot && !inst.Recall(*slot)) inst.Error(err::kSettingsConflict);  // empty slot
}

void QueryError(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = inst.status().PopError();
}

constexpr CommandSpec kCommon[] = {
    {"*IDN", nullptr, Idn},
    {"*RST", Rst, nullptr},
    {"*CLS", Cls, nullptr},
    {"*ESE", SetEse, QueryEse},
    {"*ESR", nullptr, QueryEsr},
    {"*SRE", SetSre, QuerySre},
    {"*STB", nullptr, QueryStb},
    {"*OPC", Opc, QueryOpc},
    {"*WAI", Wai, nullptr},
    {"*TRG", Trg, nullptr},
    {"*TST", nullptr, QueryTst},
    {"*SAV", Sav, nullptr},
    {"*RCL", Rcl, nullptr},
    {"SYSTem:ERRor", nullptr, QueryError},
    {"SYSTem:ERRor:NEXT", nullptr, QueryError},
};

}  // namespace

std::span<const CommandSpec> CommonCommands() {
    return kCommon;
}

}  // namespace qn::emu

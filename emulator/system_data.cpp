// :SYST:DATA:VER? and :SYST:DATA:VAL?, the system-data keys that describe the instrument's
// hardware to a driver. Only the newer families have this subsystem.
#include <array>
#include <string>
#include <string_view>

#include "emulator/handler_util.h"

namespace qn::emu {
namespace {

// A key's value for a model; nullopt when the model's firmware does not know the key.
using KeyValue = std::optional<std::string> (*)(const ModelInfo&);

std::optional<std::string> Text(const char* value) {
    if (!value) return std::nullopt;
    return Quote(value);
}

struct DataKey {
    std::string_view key;
    KeyValue value;
};

constexpr std::array<DataKey, 11> kKeys{{
    {"DISP:LAB",
     [](const ModelInfo& m) -> std::optional<std::string> {
         if (!m.family->disp_lab) return std::nullopt;
         return std::string(m.family->disp_lab);
     }},
    {"WAV:FEAT", [](const ModelInfo& m) { return Text(m.family->wav_feat); }},
    {"COUN:POD",
     [](const ModelInfo& m) -> std::optional<std::string> { return std::to_string(m.pods); }},
    {"POD:SIZE",
     [](const ModelInfo&) -> std::optional<std::string> { return std::to_string(kPodSize); }},
    {"COUN:CHAN",
     [](const ModelInfo& m) -> std::optional<std::string> {
         return std::to_string(m.analog_channels);
     }},
    {"CHAN:BAND",
     [](const ModelInfo& m) -> std::optional<std::string> { return FormatNumber(m.bandwidth); }},
    {"CHAN:BWL",
     [](const ModelInfo& m) -> std::optional<std::string> {
         return FormatNumber(m.family->bandwidth_limit);
     }},
    {"CHAN:FEAT", [](const ModelInfo& m) { return Text(m.family->chan_feat); }},
    {"TRIG:FEAT", [](const ModelInfo& m) { return Text(m.family->trig_feat); }},
    {"TRIG:MOD", [](const ModelInfo& m) { return Text(m.family->trig_mod); }},
    {"ANAL:FEAT", [](const ModelInfo& m) { return Text(m.family->anal_feat); }},
}};

// The key named by the single string argument; nullopt (error reported) when refused.
std::optional<std::string> KeyArg(Instrument& inst, const Call& call) {
    if (!ExpectArgs(inst, call, 1)) return std::nullopt;
    return StringArg(inst, call.arg(0));
}

std::optional<std::string> ValueOf(const ModelInfo& model, std::string_view key) {
    for (const DataKey& k : kKeys) {
        if (k.key == key) return k.value(model);
    }
    return std::nullopt;
}

// Version of a key's data: 1 when the firmware knows the key, 0 otherwise.
void QueryVersion(Instrument& inst, Call& call) {
    if (const auto key = KeyArg(inst, call)) {
        call.reply = FormatBool(ValueOf(inst.model(), *key).has_value());
    }
}

void QueryValue(Instrument& inst, Call& call) {
    const auto key = KeyArg(inst, call);
    if (!key) return;
    if (auto value = ValueOf(inst.model(), *key)) {
        call.reply = std::move(*value);
    } else {
        inst.Error(err::kIllegalParameter);  // unknown key
    }
}

constexpr CommandSpec kSystemData[] = {
    {"SYSTem:DATA:VERsion", nullptr, QueryVersion, kFeatSystemData},
    {"SYSTem:DATA:VALue", nullptr, QueryValue, kFeatSystemData},
};

}  // namespace

std::span<const CommandSpec> SystemDataCommands() {
    return kSystemData;
}

}  // namespace qn::emu

// qn731xx trigger [--type T --source NAME --level V ...]: writes the given
// trigger settings and prints the trigger settings as the driver reports them.
#include <cstdio>
#include <string>

#include "tools/commands.h"
#include "tools/session_util.h"
#include "tools/setting_table.h"

namespace qn::tools {

namespace {

using Root = Quorlen731XX;
using Trig = IQuorlen731XXTrigger;
using Edge = IQuorlen731XXTriggerEdge;

// The rows act on the driver object through one of its trigger interfaces.
template <class Itf, class T, HRESULT (Itf::*Get)(T*)>
HRESULT ReadVia(Root* root, SettingValue* out) {
    return Read<Itf, T, Get>(root, out);
}
template <class Itf, class T, HRESULT (Itf::*Put)(T)>
HRESULT WriteVia(Root* root, const SettingValue& v) {
    return Write<Itf, T, Put>(root, v);
}

constexpr Choice kTypes[] = {{"edge", Quorlen731XXTriggerEdge},
                             {"acline", Quorlen731XXTriggerACLine},
                             {"glitch", Quorlen731XXTriggerGlitch},
                             {"width", Quorlen731XXTriggerWidth},
                             {"tv", Quorlen731XXTriggerTV},
                             {"pattern", Quorlen731XXTriggerPattern},
                             {"state", Quorlen731XXTriggerState}};
constexpr Choice kSlopes[] = {{"positive", Quorlen731XXTriggerSlopePositive},
                              {"negative", Quorlen731XXTriggerSlopeNegative},
                              {"either", Quorlen731XXTriggerSlopeEither},
                              {"alternate", Quorlen731XXTriggerSlopeAlternate}};
constexpr Choice kCouplings[] = {{"ac", Quorlen731XXTriggerCouplingAC},
                                 {"dc", Quorlen731XXTriggerCouplingDC},
                                 {"hfreject", Quorlen731XXTriggerCouplingHFReject},
                                 {"lfreject", Quorlen731XXTriggerCouplingLFReject},
                                 {"noisereject", Quorlen731XXTriggerCouplingNoiseReject},
                                 {"tv", Quorlen731XXTriggerCouplingTV}};
constexpr Choice kModifiers[] = {{"none", Quorlen731XXTriggerModifierNone},
                                 {"auto", Quorlen731XXTriggerModifierAuto},
                                 {"autolevel", Quorlen731XXTriggerModifierAutoLevel}};

// Written in this order: the type first, so that the settings written after
// it reach the instrument at once.
constexpr Setting<Root> kTriggerSettings[] = {
    {"type", "Type", "trigger type", SettingKind::kChoice, kTypes,
     ReadVia<Trig, Quorlen731XXTriggerTypeEnum, &Trig::get_Type>,
     WriteVia<Trig, Quorlen731XXTriggerTypeEnum, &Trig::put_Type>},
    {"source", "Source", "trigger source (UserChannel2, UserDigitalChannel3, VAL_EXTERNAL)",
     SettingKind::kText, {}, ReadVia<Trig, BSTR, &Trig::get_Source>,
     WriteVia<Trig, BSTR, &Trig::put_Source>},
    {"level", "Level", "trigger level in V", SettingKind::kReal, {},
     ReadVia<Trig, double, &Trig::get_Level>, WriteVia<Trig, double, &Trig::put_Level>},
    {"slope", "Slope", "edge slope", SettingKind::kChoice, kSlopes,
     ReadVia<Edge, Quorlen731XXTriggerSlopeEnum, &Edge::get_Slope>,
     WriteVia<Edge, Quorlen731XXTriggerSlopeEnum, &Edge::put_Slope>},
    {"coupling", "Coupling", "trigger coupling (tv: read only)", SettingKind::kChoice, kCouplings,
     ReadVia<Trig, Quorlen731XXTriggerCouplingEnum, &Trig::get_Coupling>,
     WriteVia<Trig, Quorlen731XXTriggerCouplingEnum, &Trig::put_Coupling>},
    {"holdoff", "Holdoff", "trigger holdoff in s", SettingKind::kReal, {},
     ReadVia<Trig, double, &Trig::get_Holdoff>, WriteVia<Trig, double, &Trig::put_Holdoff>},
    {"modifier", "Modifier", "sweep: none (normal), auto, autolevel", SettingKind::kChoice,
     kModifiers, ReadVia<Trig, Quorlen731XXTriggerModifierEnum, &Trig::get_Modifier>,
     WriteVia<Trig, Quorlen731XXTriggerModifierEnum, &Trig::put_Modifier>},
    {"continuous", "Continuous", "", SettingKind::kSwitch, {},
     ReadVia<Trig, VARIANT_BOOL, &Trig::get_Continuous>, nullptr},
};

}  // namespace

int TriggerCommand(std::span<char*> argv) {
    SessionOptions options;
    auto app = CommandApp("trigger", "Set and print the trigger.", &options);
    SettingTable<Root> table(kTriggerSettings);
    table.AddOptions(*app);
    if (auto rc = ParseCommandLine(*app, argv)) return *rc;
    return RunSettings(table, options, DriverItself<Root>, "Trigger", "", 0);
}

}  // namespace qn::tools

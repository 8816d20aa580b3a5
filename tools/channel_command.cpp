// qn731xx channel N [--range V ...]: writes the given settings of analog
// channel N and prints the channel's settings as the instrument reports them.
#include <cstdio>
#include <string>

#include "tools/commands.h"
#include "tools/session_util.h"
#include "tools/setting_table.h"

namespace qn::tools {

namespace {

using Ch = IQuorlen731XXChannel;

constexpr Choice kCouplings[] = {{"AC", Quorlen731XXVerticalCouplingAC},
                                 {"DC", Quorlen731XXVerticalCouplingDC},
                                 {"GND", Quorlen731XXVerticalCouplingGnd}};
constexpr Choice kUnits[] = {{"VOLT", Quorlen731XXVolts}, {"AMP", Quorlen731XXAmps}};
constexpr Choice kProtection[] = {{"OK", Quorlen731XXChannelProtectionOK},
                                  {"TRIPPED", Quorlen731XXChannelProtectionTripped}};

// Written in this order: the probe first, since it scales range and offset.
constexpr Setting<Ch> kChannelSettings[] = {
    {"enabled", "Enabled", "show the channel: on or off", SettingKind::kSwitch, {},
     Read<Ch, VARIANT_BOOL, &Ch::get_Enabled>, Write<Ch, VARIANT_BOOL, &Ch::put_Enabled>},
    {"probe", "ProbeAttenuation", "probe attenuation (-1: sensed by the instrument)",
     SettingKind::kReal, {}, Read<Ch, double, &Ch::get_ProbeAttenuation>,
     Write<Ch, double, &Ch::put_ProbeAttenuation>},
    {"range", "Range", "vertical range in V (full screen)", SettingKind::kReal, {},
     Read<Ch, double, &Ch::get_Range>, Write<Ch, double, &Ch::put_Range>},
    {"offset", "Offset", "vertical offset in V", SettingKind::kReal, {},
     Read<Ch, double, &Ch::get_Offset>, Write<Ch, double, &Ch::put_Offset>},
    {"coupling", "Coupling", "input coupling", SettingKind::kChoice, kCouplings,
     Read<Ch, Quorlen731XXVerticalCouplingEnum, &Ch::get_Coupling>,
     Write<Ch, Quorlen731XXVerticalCouplingEnum, &Ch::put_Coupling>},
    {"impedance", "InputImpedance", "input impedance in ohm: 1e6 or 50", SettingKind::kReal, {},
     Read<Ch, double, &Ch::get_InputImpedance>, Write<Ch, double, &Ch::put_InputImpedance>},
    {"max-frequency", "InputFrequencyMax",
     "highest input frequency in Hz (at or below the filter: bandwidth limit on)",
     SettingKind::kReal, {}, Read<Ch, double, &Ch::get_InputFrequencyMax>,
     Write<Ch, double, &Ch::put_InputFrequencyMax>},
    {"skew", "ProbeSkew", "probe skew in s", SettingKind::kReal, {},
     Read<Ch, double, &Ch::get_ProbeSkew>, Write<Ch, double, &Ch::put_ProbeSkew>},
    {"units", "Units", "vertical units", SettingKind::kChoice, kUnits,
     Read<Ch, Quorlen731XXChannelUnitsEnum, &Ch::get_Units>,
     Write<Ch, Quorlen731XXChannelUnitsEnum, &Ch::put_Units>},
    {"invert", "Invert", "invert the waveform: on or off", SettingKind::kSwitch, {},
     Read<Ch, VARIANT_BOOL, &Ch::get_Invert>, Write<Ch, VARIANT_BOOL, &Ch::put_Invert>},
    {"label", "Label", "channel label text", SettingKind::kQuotedText, {},
     Read<Ch, BSTR, &Ch::get_Label>, Write<Ch, BSTR, &Ch::put_Label>},
    {"probe-sense", "ProbeSense", "", SettingKind::kReal, {},
     Read<Ch, double, &Ch::get_ProbeSense>, nullptr},
    {"protection", "Protection", "", SettingKind::kChoice, kProtection,
     Read<Ch, Quorlen731XXChannelProtectionEnum, &Ch::get_Protection>, nullptr},
};

HRESULT FindChannel(Quorlen731XX* driver, long n, ComPtr<Ch>* channel, std::string* what) {
    *what = "channel " + std::to_string(n);
    com::Bstr item("UserChannel" + std::to_string(n));
    return static_cast<IQuorlen731XXChannels*>(driver)->get_Item(item.get(), channel->Out());
}

}  // namespace

int ChannelCommand(std::span<char*> argv) {
    SessionOptions options;
    auto app = CommandApp("channel", "Set and print the settings of analog channel N.", &options);
    long n = 1;
    app->add_option("N", n, "analog channel number")->check(CLI::Range(1, 64))->capture_default_str();
    SettingTable<Ch> table(kChannelSettings);
    table.AddOptions(*app);
    if (auto rc = ParseCommandLine(*app, argv)) return *rc;
    auto target = [n](Quorlen731XX* d, ComPtr<Ch>* ch, std::string* what) {
        return FindChannel(d, n, ch, what);
    };
    return RunSettings(table, options, target, "Channel " + std::to_string(n), "channel", n);
}

}  // namespace qn::tools

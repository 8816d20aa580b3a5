// qn731xx channel N [--range V ...]: writes the given settings of analog
// channel N and prints the channel's settings as the instrument reports them.
#include <cstdio>
#include <cstdlib>
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

int Usage(const SettingTable<Ch>& table, const std::string& error) {
    std::fprintf(stderr, "qn731xx channel: %s\nusage: qn731xx channel N [options]\n%s",
                 error.c_str(), table.Help().c_str());
    return 2;
}

// The channel number from the one positional word, 1 when there is none.
bool ChannelNumber(const CliArgs& args, long* n) {
    if (args.Positionals().size() > 1) return false;
    *n = 1;
    if (args.Positionals().empty()) return true;
    const std::string& word = args.Positionals().front();
    char* end = nullptr;
    *n = std::strtol(word.c_str(), &end, 10);
    return !word.empty() && *end == '\0' && *n >= 1 && *n <= 64;
}

}  // namespace

int ChannelCommand(std::span<char*> argv) {
    SettingTable<Ch> table(kChannelSettings);
    if (WantsHelp(argv)) {
        std::printf("usage: qn731xx channel N [options]\n%s", table.Help().c_str());
        return 0;
    }
    const std::vector<OptionSpec> options = table.Options();
    CliArgs args;
    std::string error;
    if (!args.Parse(options, argv, &error)) return Usage(table, error);
    long n = 0;
    if (!ChannelNumber(args, &n)) return Usage(table, "expected one channel number from 1");
    if (!table.ParseRequests(args, &error)) return Usage(table, error);

    ToolSession session;
    HRESULT hr = OpenSession(args, &session);
    if (FAILED(hr)) return ReportFailure("Initialize", hr);
    const std::string name = "UserChannel" + std::to_string(n);
    ComPtr<Ch> channel;
    com::Bstr item(name);
    hr = static_cast<IQuorlen731XXChannels*>(session.driver.get())->get_Item(item.get(),
                                                                            channel.Out());
    if (FAILED(hr)) return ReportFailure(("channel " + std::to_string(n)).c_str(), hr);
    std::string failed;
    hr = table.Apply(channel.get(), &failed);
    if (FAILED(hr)) return ReportFailure(failed.c_str(), hr);
    PrintReadings("Channel " + std::to_string(n), table.ReadAll(channel.get()), args.Has("json"),
                  "channel", n);
    hr = session.driver->Close();
    if (FAILED(hr)) return ReportFailure("Close", hr);
    return 0;
}

}  // namespace qn::tools

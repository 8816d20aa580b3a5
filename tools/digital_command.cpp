// qn731xx digital --channel D [--enabled on|off --label TEXT --threshold V]:
// writes the given settings of digital channel D (from 0) and prints the
// channel's settings as the instrument reports them.
#include <cstdio>
#include <cstdlib>
#include <string>

#include "tools/commands.h"
#include "tools/session_util.h"
#include "tools/setting_table.h"

namespace qn::tools {

namespace {

using Dig = IQuorlen731XXDigitalChannel;

constexpr Setting<Dig> kDigitalSettings[] = {
    {"enabled", "Enabled", "show the channel: on or off", SettingKind::kSwitch, {},
     Read<Dig, VARIANT_BOOL, &Dig::get_Enabled>, Write<Dig, VARIANT_BOOL, &Dig::put_Enabled>},
    {"label", "Label", "channel label text", SettingKind::kQuotedText, {},
     Read<Dig, BSTR, &Dig::get_Label>, Write<Dig, BSTR, &Dig::put_Label>},
    {"threshold", "Threshold", "logic threshold in V", SettingKind::kReal, {},
     Read<Dig, double, &Dig::get_Threshold>, Write<Dig, double, &Dig::put_Threshold>},
};

int Usage(const SettingTable<Dig>& table, const std::string& error) {
    std::fprintf(stderr, "qn731xx digital: %s\nusage: qn731xx digital --channel D [options]\n%s",
                 error.c_str(), table.Help().c_str());
    return 2;
}

}  // namespace

int DigitalCommand(std::span<char*> argv) {
    SettingTable<Dig> table(kDigitalSettings);
    if (WantsHelp(argv)) {
        std::printf("usage: qn731xx digital --channel D [options]\n  --channel D  digital "
                    "channel number from 0\n%s",
                    table.Help().c_str());
        return 0;
    }
    std::vector<OptionSpec> options = table.Options();
    options.push_back({"channel", true, "digital channel number from 0"});
    CliArgs args;
    std::string error;
    if (!args.Parse(options, argv, &error)) return Usage(table, error);
    const std::string text = args.Value("channel").value_or("0");
    char* end = nullptr;
    const long d = std::strtol(text.c_str(), &end, 10);
    if (*end != '\0' || d < 0 || d > 1023 || !args.Positionals().empty())
        return Usage(table, "--channel takes a digital channel number from 0");
    if (!table.ParseRequests(args, &error)) return Usage(table, error);

    ToolSession session;
    HRESULT hr = OpenSession(args, &session);
    if (FAILED(hr)) return ReportFailure("Initialize", hr);
    ComPtr<Dig> channel;
    com::Bstr item("UserDigitalChannel" + std::to_string(d));
    hr = static_cast<IQuorlen731XXDigitalChannels*>(session.driver.get())
             ->get_Item(item.get(), channel.Out());
    if (FAILED(hr)) return ReportFailure(("digital channel " + std::to_string(d)).c_str(), hr);
    std::string failed;
    hr = table.Apply(channel.get(), &failed);
    if (FAILED(hr)) return ReportFailure(failed.c_str(), hr);
    PrintReadings("Digital channel " + std::to_string(d), table.ReadAll(channel.get()),
                  args.Has("json"), "channel", d);
    hr = session.driver->Close();
    if (FAILED(hr)) return ReportFailure("Close", hr);
    return 0;
}

}  // namespace qn::tools

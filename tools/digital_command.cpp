// qn731xx digital --channel D [--enabled on|off --label TEXT --threshold V]:
// writes the given settings of digital channel D (from 0) and prints the
// channel's settings as the instrument reports them.
#include <cstdio>
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

}  // namespace

int DigitalCommand(std::span<char*> argv) {
    SessionOptions options;
    auto app = CommandApp("digital", "Set and print the settings of digital channel D.", &options);
    long d = 0;
    app->add_option("--channel", d, "digital channel number from 0")
        ->check(CLI::Range(0, 1023))
        ->capture_default_str();
    SettingTable<Dig> table(kDigitalSettings);
    table.AddOptions(*app);
    if (auto rc = ParseCommandLine(*app, argv)) return *rc;
    auto target = [d](Quorlen731XX* driver, ComPtr<Dig>* ch, std::string* what) {
        *what = "digital channel " + std::to_string(d);
        com::Bstr item("UserDigitalChannel" + std::to_string(d));
        return static_cast<IQuorlen731XXDigitalChannels*>(driver)->get_Item(item.get(), ch->Out());
    };
    return RunSettings(table, options, target, "Digital channel " + std::to_string(d), "channel",
                       d);
}

}  // namespace qn::tools

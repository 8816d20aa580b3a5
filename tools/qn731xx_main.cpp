// qn731xx: the command-line program of the Quorlen731XX driver.
#include <cstdio>
#include <cstring>
#include <span>
#include <string_view>

#include "tools/commands.h"
#include "tools/list_command.h"

namespace {

struct Command {
    std::string_view name;
    int (*run)(std::span<char*>);
    std::string_view help;
};

constexpr Command kCommands[] = {
    {"list", qn::tools::ListCommand,
     "print the resources this machine can reach: usbtmc, serial ports, with --lan VXI-11"},
    {"info", qn::tools::InfoCommand,
     "open a session and print its flags, the instrument identity and the option tables"},
    {"fetch", qn::tools::FetchCommand,
     "fetch one channel's waveform and summarise it, optionally to CSV and SVG"},
    {"demo", qn::tools::DemoCommand,
     "identify, reset, configure two channels, acquire, fetch, summarise, write CSV and SVG"},
    {"channel", qn::tools::ChannelCommand,
     "set and print the settings of analog channel N"},
    {"timebase", qn::tools::TimebaseCommand,
     "set and print the horizontal record and acquisition mode"},
    {"measure", qn::tools::MeasureCommand,
     "one measurement of an analog channel, or all of them"},
    {"digital", qn::tools::DigitalCommand,
     "set and print the settings of digital channel D"},
    {"system", qn::tools::SystemCommand,
     "set and print the instrument's date and time, its serial number and the I/O timeout"},
    {"screenshot", qn::tools::ScreenshotCommand, "write the instrument's screen to FILE.bmp"},
    {"setup", qn::tools::SetupCommand,
     "setup save FILE: keep the instrument's setup in FILE; setup load FILE: put it back"},
    {"scpi", qn::tools::ScpiCommand,
     "send one SCPI command through the driver's I/O object; a query prints its reply"},
    {"trigger", qn::tools::TriggerCommand,
     "set and print the trigger"},
};

int Usage(FILE* to) {
    std::fprintf(to, "usage: qn731xx COMMAND [options]\n\ncommands:\n");
    for (const Command& c : kCommands)
        std::fprintf(to, "  %-10.*s %.*s\n", int(c.name.size()), c.name.data(), int(c.help.size()),
                     c.help.data());
    std::fprintf(to, "\n'qn731xx COMMAND --help' shows the options of COMMAND. Without --resource,\n"
                     "an emulator of --model runs on loopback and the driver talks to it.\n");
    return to == stdout ? 0 : 2;
}

}  // namespace

int main(int argc, char** argv) {
    if (argc < 2) return Usage(stderr);
    std::string_view name = argv[1];
    if (name == "--help" || name == "-h" || name == "help") return Usage(stdout);
    for (const Command& c : kCommands)
        if (c.name == name) return c.run(std::span<char*>(argv + 2, argv + argc));
    std::fprintf(stderr, "qn731xx: unknown command '%s'\n", argv[1]);
    return Usage(stderr);
}

// What every qn731xx command shares: --help with its options, a usage error
// that points to that help, one JSON object with --json, quiet stderr when
// piped, and the instrument's status checked unless switched off.
#include <gtest/gtest.h>

#include <cstdio>
#include <string>
#include <vector>

#include "tests/tools/run_command.h"
#include "tools/commands.h"
#include "tools/list_command.h"

namespace qn::tools {
namespace {

using Command = int (*)(std::span<char*>);

struct CommandRow {
    const char* name;
    Command run;
    const char* own_option;  // shown by --help besides the session options
    std::vector<std::string> words = {};  // the positional words the command needs
};

const CommandRow kCommands[] = {
    {"info", InfoCommand, "--id-query"},
    {"fetch", FetchCommand, "--trigger-level"},
    {"demo", DemoCommand, "--plot"},
    {"channel", ChannelCommand, "--coupling", {"2"}},
    {"timebase", TimebaseCommand, "--time-per-record"},
    {"measure", MeasureCommand, "--function"},
    {"digital", DigitalCommand, "--threshold"},
    {"system", SystemCommand, "--timeout"},
    {"screenshot", ScreenshotCommand, "FILE", {"x.bmp"}},
    {"setup", SetupCommand, "ACTION", {"save", "x.scp"}},
    {"scpi", ScpiCommand, "COMMAND", {"*IDN?"}},
    {"trigger", TriggerCommand, "--holdoff"},
};

TEST(CommandLine, EveryCommandHasHelpAndNamesItOnAnUnknownOption) {
    for (const CommandRow& c : kCommands) {
        SCOPED_TRACE(c.name);
        const Result help = Invoke(c.run, {"--help"});
        EXPECT_EQ(help.rc, 0);
        EXPECT_NE(help.out.find(std::string("Usage: qn731xx ") + c.name), std::string::npos)
            << help.out;
        for (const char* option : {c.own_option, "--no-status-check", "--json"})
            EXPECT_NE(help.out.find(option), std::string::npos) << option << " in " << help.out;

        std::vector<std::string> words = c.words;
        words.push_back("--no-such-option");
        const Result bad = Invoke(c.run, words);
        EXPECT_EQ(bad.rc, 2);
        EXPECT_TRUE(bad.out.empty()) << bad.out;
        EXPECT_NE(bad.err.find("--no-such-option"), std::string::npos) << bad.err;
        EXPECT_NE(bad.err.find(std::string("qn731xx ") + c.name + " --help"), std::string::npos)
            << bad.err;
    }
}

TEST(CommandLine, EveryCommandPrintsOneJsonObjectAndNothingOnAPipedStderr) {
    const std::string dir = ::testing::TempDir();
    const std::string setup = dir + "qn_cli_setup.scp";
    struct Case {
        Command run;
        std::vector<std::string> words;
        const char* key;  // a field of the object
    } cases[] = {
        {InfoCommand, {}, "features"},
        {FetchCommand, {"--channel", "2", "--points", "100"}, "traces"},
        {DemoCommand, {"--csv", dir + "qn_cli.csv", "--plot", dir + "qn_cli.svg"}, "measurements"},
        {ChannelCommand, {"2", "--label", "a\\b"}, "label"},
        {TimebaseCommand, {"--time-per-record", "2e-3"}, "sample-rate"},
        {MeasureCommand, {"--all"}, "measurements"},
        {DigitalCommand, {"--model", "QMS4034A", "--channel", "3"}, "threshold"},
        {SystemCommand, {}, "serial"},
        {ScreenshotCommand, {dir + "qn_cli.bmp"}, "bytes"},
        {SetupCommand, {"save", setup}, "bytes"},
        {SetupCommand, {"load", setup}, "loaded"},
        {ScpiCommand, {":CHAN1:RANG?"}, "reply"},
        {ScpiCommand, {":CHAN1:RANG 2"}, "reply"},
        {TriggerCommand, {"--level", "0.25"}, "level"},
    };
    for (Case& c : cases) {
        SCOPED_TRACE(c.words.empty() ? std::string(c.key) : c.words.front());
        c.words.push_back("--json");
        const Result r = Invoke(c.run, c.words);
        ASSERT_EQ(r.rc, 0) << r.err;
        const Json j = OutputObject(r);
        EXPECT_TRUE(j.is_object()) << r.out;
        EXPECT_TRUE(j.contains(c.key)) << r.out;
        EXPECT_TRUE(r.err.empty()) << r.err;
    }
    std::remove(setup.c_str());
}

TEST(CommandLine, ARefusedValueFailsWithTheInstrumentsMessageUnlessTheCheckIsOff) {
    const Result checked = Invoke(TimebaseCommand, {"--time-per-record", "1000"});
    EXPECT_EQ(checked.rc, 1);
    EXPECT_TRUE(checked.out.empty()) << checked.out;
    EXPECT_NE(checked.err.find("--time-per-record failed"), std::string::npos) << checked.err;
    EXPECT_NE(checked.err.find("-222: Data out of range"), std::string::npos) << checked.err;

    const Result unchecked =
        Invoke(TimebaseCommand, {"--time-per-record", "1000", "--no-status-check", "--json"});
    EXPECT_EQ(unchecked.rc, 0) << unchecked.err;
    // The instrument kept its record: nothing says that 1000 s was taken.
    EXPECT_NE(OutputObject(unchecked).value("time-per-record", 0.0), 1000.0) << unchecked.out;

    // Direct I/O is checked as well.
    const Result scpi = Invoke(ScpiCommand, {":TIM:RANG 1000"});
    EXPECT_EQ(scpi.rc, 1);
    EXPECT_NE(scpi.err.find("-222: Data out of range"), std::string::npos) << scpi.err;
    EXPECT_EQ(Invoke(ScpiCommand, {":TIM:RANG 1000", "--no-status-check"}).rc, 0);

    // An explicit option in the option string wins over the default.
    const Result off = Invoke(TimebaseCommand, {"--time-per-record", "1000", "--options",
                                                "QueryInstrStatus=false"});
    EXPECT_EQ(off.rc, 0) << off.err;
}

// Refused input of every command: the exit status (2 for usage, 1 for what
// the driver or the instrument refused) and, where given, the text it prints.
TEST(CommandLine, RefusedInputFailsWithItsStatusAndText) {
    const std::vector<std::string> nowhere = {"--sysfs", "/nonexistent", "--dev", "/nonexistent"};
    struct Case {
        Command run;
        std::vector<std::string> words;
        int rc;
        const char* text = nullptr;  // in stdout or stderr
    };
    const Case cases[] = {
        {ChannelCommand, {"0"}, 2},
        {ChannelCommand, {"1", "2"}, 2},
        {ChannelCommand, {"1", "--range", "4V"}, 2},
        {ChannelCommand, {"--coupling", "LF"}, 2},
        {ChannelCommand, {"--enabled", "maybe"}, 2},
        {ChannelCommand, {"3"}, 1},  // QDS4032A has two channels
        {ChannelCommand, {"1", "--impedance", "75"}, 1},
        {TimebaseCommand, {"--points", "1.5"}, 2},
        {TimebaseCommand, {"extra"}, 2},
        {TimebaseCommand, {"--type", "envelope"}, 1},
        {MeasureCommand, {"--channel", "1"}, 2},
        {MeasureCommand, {"--channel", "1", "--all", "--function", "Period"}, 2},
        {MeasureCommand, {"--channel", "0", "--all"}, 2},
        {MeasureCommand, {"--channel", "1x", "--all"}, 2},
        {MeasureCommand, {"--function", "Frequency2"}, 2},
        {MeasureCommand, {"--function", "28"}, 2},
        {MeasureCommand, {"--function", ""}, 2},
        {MeasureCommand, {"--channel", "3", "--all"}, 1},  // two channels
        // Channel 2 is not shown for channel 1's delay measurement.
        {MeasureCommand, {"--channel", "1", "--function", "Delay"}, 1,
         "Specified channel is not enabled"},
        {DigitalCommand, {"--channel", "0"}, 1},  // the default model has no digital channels
        {DigitalCommand, {"--channel", "-1"}, 2},
        {TriggerCommand, {"--type", "runt"}, 2, "--type runt"},
        {TriggerCommand, {"--level", "1V"}, 2, "--level 1V"},
        {TriggerCommand, {"--slope", "up"}, 2, "--slope up"},
        {TriggerCommand, {"extra"}, 2, "not expected: extra"},
        {TriggerCommand, {"--modifier", "autolevel"}, 1, "put_Modifier"},
        {TriggerCommand, {"--coupling", "tv"}, 1, "Settings Conflict"},
        {TriggerCommand, {"--source", "UserChannel9"}, 1, "UserChannel9"},
        {TriggerCommand, {"--model", "QDS3014L", "--source", "VAL_EXTERNAL"}, 1,
         "-221: Settings conflict"},
        {FetchCommand, {"--trigger-level", "high"}, 2, "--trigger-level"},
        {FetchCommand, {"--trigger-level", "nan"}, 2, "--trigger-level"},
        {FetchCommand, {"--trigger-level", "inf"}, 2, "--trigger-level"},
        {FetchCommand, {"--trigger-level", "1e999"}, 2, "--trigger-level"},
        {FetchCommand, {"--trigger-source", "UserChannel7"}, 1, "UserChannel7"},
        {ScpiCommand, {":CHAN1:RANG 2\n*RST"}, 2},
        {ScpiCommand, {""}, 2},
        {ScpiCommand, {}, 2},
        {ScpiCommand, {"a", "b"}, 2},
        {SetupCommand, {"copy", "x"}, 2},
        {SetupCommand, {"save"}, 2},
        {ScreenshotCommand, {}, 2},
        {ListCommand, {"--lan-address", "127.0.0.1"}, 2, "needs --lan"},
        {ListCommand, {"--lan", "--lan-address", "localhost:111"}, 2, "not an IPv4"},
        {ListCommand, {"--lan", "--lan-address", "127.0.0.1:0"}, 2, "not an IPv4"},
        {ListCommand, {"--lan", "--lan-address", "127.0.0.1:70000"}, 2, "not an IPv4"},
    };
    for (const Case& c : cases) {
        std::vector<std::string> words = c.words;
        if (c.run == ListCommand) words.insert(words.end(), nowhere.begin(), nowhere.end());
        const Result r = Invoke(c.run, words);
        const std::string said = c.words.empty() ? "(none)" : c.words.back();
        EXPECT_EQ(r.rc, c.rc) << said;
        if (c.text) {
            EXPECT_NE((r.out + r.err).find(c.text), std::string::npos) << r.out << r.err;
        }
        if (c.rc == 2) {
            EXPECT_EQ(r.out, "") << said;
        }
    }
}

}  // namespace
}  // namespace qn::tools

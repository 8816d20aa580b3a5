// What every qn731xx command shares: --help with its options, a usage error
// that points to that help, one JSON object with --json, quiet stderr when
// piped, and the instrument's status checked unless switched off.
#include <gtest/gtest.h>

#include <cstdio>
#include <string>
#include <vector>

#include "tests/tools/run_command.h"
#include "tools/commands.h"

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

}  // namespace
}  // namespace qn::tools

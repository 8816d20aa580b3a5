// qn731xx channel, timebase and trigger against the embedded emulator, the
// trigger options of qn731xx fetch, and the parsing of option values.
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "tests/tools/run_command.h"
#include "tools/commands.h"
#include "tools/setting_table.h"

namespace qn::tools {
namespace {

TEST(SettingsCommand, ChannelSetsAndPrintsTheInstrumentsValues) {
    Result r = Invoke(ChannelCommand, {"2", "--model", "QMS3104A", "--probe", "10", "--range", "4",
                                    "--coupling", "dc", "--label", "Clock", "--json"});
    ASSERT_EQ(r.rc, 0) << r.out << r.err;
    EXPECT_EQ(OutputObject(r), Json::parse(R"({"channel": 2, "enabled": false, "probe": 10,
        "range": 4, "offset": 0, "coupling": "DC", "impedance": 1e6, "max-frequency": 1e9,
        "skew": 0, "units": "VOLT", "invert": false, "label": "\"Clock\"", "probe-sense": 10,
        "protection": "OK"})")) << r.out;

    // A model without protection or skew prints them as not available.
    r = Invoke(ChannelCommand, {"1", "--model", "QDS2012A", "--coupling", "GND"});
    ASSERT_EQ(r.rc, 0);
    EXPECT_NE(r.out.find("Coupling             GND"), std::string::npos) << r.out;
    EXPECT_NE(r.out.find("Protection           n/a"), std::string::npos) << r.out;
}

TEST(SettingsCommand, TimebaseSetsAndPrintsTheInstrumentsValues) {
    Result r = Invoke(TimebaseCommand, {"--time-per-record", "1e-3", "--points", "500", "--start-time",
                                     "0", "--averages", "16", "--type", "average", "--json"});
    ASSERT_EQ(r.rc, 0) << r.out << r.err;
    EXPECT_EQ(OutputObject(r), Json::parse(R"({"time-per-record": 0.001, "points": 500,
        "start-time": 0, "interpolation": "SINEX", "averages": 16, "type": "AVERAGE",
        "record-length": 500, "sample-rate": 500000, "sample-mode": "REALTIME"})")) << r.out;
}

TEST(TriggerCommand, SetsAndPrintsTheTrigger) {
    Result r = Invoke(TriggerCommand, {"--type", "edge", "--source", "UserChannel2", "--level",
                                       "0.5", "--slope", "negative", "--holdoff", "0.25",
                                       "--coupling", "hfreject", "--modifier", "none", "--json"});
    ASSERT_EQ(r.rc, 0) << r.out << r.err;
    EXPECT_EQ(OutputObject(r), Json::parse(R"({"type": "edge", "source": "UserChannel2",
        "level": 0.5, "slope": "negative", "coupling": "hfreject", "holdoff": 0.25,
        "modifier": "none", "continuous": false})")) << r.out;

    r = Invoke(TriggerCommand, {"--type", "glitch", "--source", "VAL_EXTERNAL"});
    ASSERT_EQ(r.rc, 0) << r.err;
    EXPECT_NE(r.out.find("VAL_EXTERNAL"), std::string::npos) << r.out;
}

TEST(TriggerCommand, FetchAcquiresOnTheGivenTrigger) {
    Result r = Invoke(FetchCommand, {"--trigger-level", "1", "--trigger-source", "UserChannel1"});
    ASSERT_EQ(r.rc, 0) << r.out << r.err;
    EXPECT_NE(r.out.find("Channel1"), std::string::npos) << r.out;
}

TEST(SettingsCommand, ValuesParseByKind) {
    constexpr Choice kChoices[] = {{"AC", 0}, {"DC", 1}};
    struct Case {
        SettingKind kind;
        const char* text;
        bool ok;
        const char* printed;
    };
    const Case cases[] = {
        {SettingKind::kReal, "1e-3", true, "0.001"},
        {SettingKind::kReal, "-0.12345678901234567", true, "-0.123456789012346"},  {SettingKind::kReal, "", false, ""},
        {SettingKind::kReal, "2 V", false, ""},       {SettingKind::kInteger, "-7", true, "-7"},
        {SettingKind::kInteger, "2147483647", true, "2147483647"},
        {SettingKind::kInteger, "2147483648", false, ""},
        {SettingKind::kInteger, "-2147483648", true, "-2147483648"},
        {SettingKind::kInteger, "-2147483649", false, ""},
        {SettingKind::kSwitch, "ON", true, "on"},     {SettingKind::kSwitch, "0", true, "off"},
        {SettingKind::kChoice, "dc", true, "DC"},     {SettingKind::kChoice, "D", false, ""},
        {SettingKind::kQuotedText, "A B", true, "\"A B\""},
        {SettingKind::kQuotedText, "\"Q\"", true, "\"Q\""},
    };
    for (const Case& c : cases) {
        const SettingInfo info{"x", "X", "", c.kind, kChoices, true};
        SettingValue v;
        std::string error;
        EXPECT_EQ(ParseSetting(info, c.text, &v, &error), c.ok) << c.text;
        if (c.ok) {
            EXPECT_EQ(FormatSetting(info, v), c.printed) << c.text;
        }
        EXPECT_EQ(error.empty(), c.ok) << c.text;
    }
}

}  // namespace
}  // namespace qn::tools

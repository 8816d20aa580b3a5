// qn731xx trigger against the embedded emulator, and the trigger options of
// qn731xx fetch.
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "tests/tools/run_command.h"
#include "tools/commands.h"

namespace qn::tools {
namespace {

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

TEST(TriggerCommand, RefusedValuesPrintTheirErrorAndFail) {
    struct Case {
        std::vector<std::string> words;
        int rc;
        const char* text;  // in stderr
    } cases[] = {
        {{"--type", "runt"}, 2, "--type runt"},
        {{"--level", "1V"}, 2, "--level 1V"},
        {{"--slope", "up"}, 2, "--slope up"},
        {{"extra"}, 2, "not expected: extra"},
        {{"--modifier", "autolevel"}, 1, "put_Modifier"},
        {{"--coupling", "tv"}, 1, "Settings Conflict"},
        {{"--source", "UserChannel9"}, 1, "UserChannel9"},
        {{"--model", "QDS3014L", "--source", "VAL_EXTERNAL"}, 1, "-221: Settings conflict"},
    };
    for (Case& c : cases) {
        const Result r = Invoke(TriggerCommand, c.words);
        EXPECT_EQ(r.rc, c.rc) << c.words.back();
        EXPECT_NE(r.err.find(c.text), std::string::npos) << c.text << " in " << r.err;
    }
}

TEST(TriggerCommand, FetchAcquiresOnTheGivenTrigger) {
    Result r = Invoke(FetchCommand, {"--trigger-level", "1", "--trigger-source", "UserChannel1"});
    ASSERT_EQ(r.rc, 0) << r.out << r.err;
    EXPECT_NE(r.out.find("Channel1"), std::string::npos) << r.out;
    for (const char* level : {"high", "nan", "inf", "1e999"}) {
        r = Invoke(FetchCommand, {"--trigger-level", level});
        EXPECT_EQ(r.rc, 2) << level;
        EXPECT_NE(r.err.find("--trigger-level"), std::string::npos) << r.err;
    }
    r = Invoke(FetchCommand, {"--trigger-source", "UserChannel7"});
    EXPECT_EQ(r.rc, 1);
    EXPECT_NE(r.err.find("UserChannel7"), std::string::npos) << r.err;
}

}  // namespace
}  // namespace qn::tools

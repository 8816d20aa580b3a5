// qn731xx trigger against the embedded emulator, and the trigger options of
// qn731xx fetch.
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "tools/commands.h"

namespace qn::tools {
namespace {

struct Result {
    int rc;
    std::string out;
    std::string err;
};

Result Invoke(int (*command)(std::span<char*>), std::vector<std::string> words) {
    ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1);
    std::vector<char*> argv;
    for (std::string& w : words) argv.push_back(w.data());
    ::testing::internal::CaptureStdout();
    ::testing::internal::CaptureStderr();
    const int rc = command(argv);
    std::string out = ::testing::internal::GetCapturedStdout();
    std::string err = ::testing::internal::GetCapturedStderr();
    return {rc, out, err};
}

TEST(TriggerCommand, SetsAndPrintsTheTrigger) {
    Result r = Invoke(TriggerCommand, {"--type", "edge", "--source", "UserChannel2", "--level",
                                       "0.5", "--slope", "negative", "--holdoff", "0.25",
                                       "--coupling", "hfreject", "--modifier", "none", "--json"});
    ASSERT_EQ(r.rc, 0) << r.out << r.err;
    for (const char* field : {"\"type\":\"edge\"", "\"source\":\"UserChannel2\"", "\"level\":0.5",
                              "\"slope\":\"negative\"", "\"holdoff\":0.25",
                              "\"coupling\":\"hfreject\"", "\"modifier\":\"none\""})
        EXPECT_NE(r.out.find(field), std::string::npos) << field << " in " << r.out;

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
        {{"extra"}, 2, "unexpected word extra"},
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
    r = Invoke(FetchCommand, {"--trigger-level", "high"});
    EXPECT_EQ(r.rc, 2);
    EXPECT_NE(r.err.find("--trigger-level high"), std::string::npos) << r.err;
    r = Invoke(FetchCommand, {"--trigger-source", "UserChannel7"});
    EXPECT_EQ(r.rc, 1);
    EXPECT_NE(r.err.find("UserChannel7"), std::string::npos) << r.err;
}

}  // namespace
}  // namespace qn::tools

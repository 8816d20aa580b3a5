// qn731xx measure, digital and fetch --digital against the embedded emulator.
#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "tests/tools/run_command.h"
#include "tools/commands.h"

namespace qn::tools {
namespace {

TEST(MeasureCommand, AllMeasurementsOfAChannelWithUnits) {
    Result r = Invoke(MeasureCommand, {"--channel", "1", "--all"});
    ASSERT_EQ(r.rc, 0) << r.out << r.err;
    // The fresh emulator's channel 1: a 2 kHz sine of 4.8 V peak-to-peak
    // (plus noise).
    const auto value = [&](const std::string& label) {
        const std::size_t at = r.out.find("\n" + label + " ");
        return at == std::string::npos ? 0.0 : std::strtod(r.out.c_str() + at + 20, nullptr);
    };
    EXPECT_NEAR(value("Frequency"), 2000.0, 20.0) << r.out;
    EXPECT_NEAR(value("Peak-To-Peak"), 4.8, 0.2) << r.out;
    EXPECT_NEAR(value("Neg Duty Cycle"), 50.0, 2.0) << r.out;
    for (const char* unit : {" Hz\n", " V\n", " %\n", " s\n"})
        EXPECT_NE(r.out.find(unit), std::string::npos) << unit << " in\n" << r.out;
    // Channel 2 is off: the two-source measurements say so.
    EXPECT_NE(r.out.find("Delay              Quorlen731XX: Specified channel is not enabled."),
              std::string::npos)
        << r.out;
}

TEST(MeasureCommand, OneMeasurementByNameOrNumber) {
    struct Case {
        const char* function;
        const char* key;
        const char* value;
    } cases[] = {{"DutyCycleNeg", "name", "Neg Duty Cycle"},
                 {"frequencycounter", "unit", "Hz"},
                 {"14", "function", "DutyCyclePos"}};
    for (const Case& c : cases) {
        Result r = Invoke(MeasureCommand, {"--channel", "2", "--function", c.function, "--json"});
        ASSERT_EQ(r.rc, 0) << r.out << r.err;
        const Json j = OutputObject(r);
        EXPECT_EQ(j.value("channel", 0), 2) << r.out;
        ASSERT_EQ(j["measurements"].size(), 1u) << r.out;
        EXPECT_EQ(j["measurements"][0].value(c.key, ""), c.value) << r.out;
    }
}

TEST(DigitalCommand, SetsAndPrintsADigitalChannel) {
    Result r = Invoke(DigitalCommand, {"--channel", "9", "--model", "QMS4034A", "--enabled", "on",
                                       "--threshold", "-0.5", "--label", "CLK", "--json"});
    ASSERT_EQ(r.rc, 0) << r.out << r.err;
    EXPECT_EQ(OutputObject(r), Json::parse(R"({"channel": 9, "enabled": true, "label": "\"CLK\"",
        "threshold": -0.5})")) << r.out;
}

TEST(FetchCommand, DigitalStatesGoToTheCsvFile) {
    const std::string path = ::testing::TempDir() + "qn-digital.csv";
    std::remove(path.c_str());
    Result r = Invoke(FetchCommand, {"--digital", "8", "--model", "QMS4034A", "--csv", path});
    ASSERT_EQ(r.rc, 0) << r.out << r.err;
    std::ifstream in(path);
    std::stringstream text;
    text << in.rdbuf();
    const std::string csv = text.str();
    // Bit 0 of pod 2 is a clock: both states appear, nothing else does.
    std::size_t zeros = 0, ones = 0, lines = 0;
    std::istringstream rows(csv);
    std::string line;
    std::getline(rows, line);  // header
    while (std::getline(rows, line)) {
        ++lines;
        const std::string state = line.substr(line.rfind(',') + 1);
        zeros += state == "0";
        ones += state == "1";
    }
    EXPECT_GT(lines, 100u);
    EXPECT_EQ(zeros + ones, lines) << csv.substr(0, 200);
    EXPECT_GT(zeros, 0u);
    EXPECT_GT(ones, 0u);
}

}  // namespace
}  // namespace qn::tools

// qn731xx system, screenshot, setup and scpi against an emulator on
// loopback: a saved setup restores changed settings, the screenshot is a
// bitmap, and files that are not setups are refused.
#include <gtest/gtest.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include "emulator/emulator.h"
#include "tests/tools/run_command.h"
#include "tools/commands.h"

namespace qn::tools {
namespace {

class SystemCommands : public ::testing::Test {
protected:
    void SetUp() override {
        ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1);
        resource_ = "TCPIP0::127.0.0.1::" + std::to_string(emu_.Start()) + "::SOCKET";
    }
    Result Run(int (*command)(std::span<char*>), std::vector<std::string> words) {
        words.push_back("--resource");
        words.push_back(resource_);
        return Invoke(command, std::move(words));
    }
    static std::string Path(const char* name) { return ::testing::TempDir() + name; }
    static std::string Slurp(const std::string& path) {
        std::ifstream in(path, std::ios::binary);
        return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
    }

    emu::Emulator emu_{"QDS4034A"};
    std::string resource_;
};

TEST_F(SystemCommands, SavedSetupRestoresChangedSettings) {
    const std::string file = Path("qn_setup_roundtrip.scp");
    ASSERT_EQ(Run(ScpiCommand, {":CHAN2:RANG 1.5;:TIM:POS 2E-4;:MARK:MODE MAN"}).rc, 0);
    Result saved = Run(SetupCommand, {"save", file});
    ASSERT_EQ(saved.rc, 0) << saved.err;
    ASSERT_EQ(Run(ScpiCommand, {":CHAN2:RANG 6;:TIM:POS 0;:MARK:MODE OFF"}).rc, 0);
    Result loaded = Run(SetupCommand, {"load", file});
    ASSERT_EQ(loaded.rc, 0) << loaded.err;
    Result read = Run(ScpiCommand, {":CHAN2:RANG?;:TIM:POS?;:MARK:MODE?"});
    ASSERT_EQ(read.rc, 0) << read.err;
    EXPECT_EQ(read.out, "1.5;0.0002;MAN\n");
    std::remove(file.c_str());
}

TEST_F(SystemCommands, FilesThatAreNotSetupsAreRefused) {
    const std::string other = Path("qn_not_a_setup.txt"), forged = Path("qn_forged_setup.scp");
    std::ofstream(other) << "CHAN1:RANG 2\n";
    std::ofstream(forged, std::ios::binary) << "qn731xx-setup 1\nQN731XX-SETUP 1\nbroken\n";
    ASSERT_EQ(Run(ScpiCommand, {":CHAN1:RANG 3"}).rc, 0);
    const std::pair<std::string, const char*> cases[] = {
        {other, "is not a setup file"},
        {forged, "refused the setup"},
        {Path("qn_missing_setup.scp"), "cannot read"},
    };
    for (const auto& [file, message] : cases) {
        SCOPED_TRACE(file);
        Result r = Run(SetupCommand, {"load", file});
        EXPECT_EQ(r.rc, 1);
        EXPECT_NE(r.err.find(message), std::string::npos) << r.err;
    }
    EXPECT_EQ(Run(ScpiCommand, {":CHAN1:RANG?"}).out, "3\n");
    std::remove(other.c_str());
    std::remove(forged.c_str());
}

TEST_F(SystemCommands, ScreenshotIsABitmapFile) {
    const std::string file = Path("qn_screen.bmp");
    Result r = Run(ScreenshotCommand, {file});
    ASSERT_EQ(r.rc, 0) << r.err;
    const std::string bmp = Slurp(file);
    ASSERT_GT(bmp.size(), 54u);
    EXPECT_EQ(bmp.substr(0, 2), "BM");
    std::uint32_t size = 0;
    for (int i = 5; i >= 2; --i) size = size << 8 | static_cast<std::uint8_t>(bmp[std::size_t(i)]);
    EXPECT_EQ(size, bmp.size());
    std::remove(file.c_str());
}

TEST_F(SystemCommands, SystemPrintsClockSerialAndTimeout) {
    Result r = Run(SystemCommand, {"--date", "+2026,+12,+6", "--timeout", "50", "--json"});
    ASSERT_EQ(r.rc, 0) << r.err;
    const Json j = OutputObject(r);
    EXPECT_EQ(j.value("date", ""), "+2026,+12,+6") << r.out;
    EXPECT_EQ(j.value("timeout", 0), 100) << r.out;
    EXPECT_TRUE(j.contains("serial")) << r.out;
}

}  // namespace
}  // namespace qn::tools

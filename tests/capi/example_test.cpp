// The C example program run against the emulator over a loopback socket, as
// a user would run it: a separate process that knows only the C API.
#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>
#include <string>

#include "emulator/emulator.h"

namespace {

// Runs `command`; its standard output, and its exit status in *status.
std::string RunCommand(const std::string& command, int* status) {
    std::string out;
    FILE* p = ::popen(command.c_str(), "r");
    if (!p) return out;
    char buf[512];
    while (std::fgets(buf, sizeof buf, p)) out += buf;
    *status = ::pclose(p);
    return out;
}

TEST(CExample, DrivesTheEmulatorAndShowsTheRefusedSetting) {
    ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1);
    qn::emu::Emulator emulator("QDS2014A");
    const std::uint16_t port = emulator.Start();
    int status = -1;
    const std::string out = RunCommand(std::string(QN_C_EXAMPLE_PATH) + " TCPIP0::127.0.0.1::" +
                                    std::to_string(port) + "::SOCKET 2>&1",
                                &status);
    EXPECT_EQ(status, 0) << out;
    EXPECT_NE(out.find("model: QDS2014A"), std::string::npos) << out;
    EXPECT_NE(out.find("waveform: "), std::string::npos) << out;
    EXPECT_NE(out.find("trigger: edge on "), std::string::npos) << out;
    EXPECT_NE(out.find("Channel1 at 0.5 V, rising"), std::string::npos) << out;
    EXPECT_NE(out.find("frequency: "), std::string::npos) << out;
    EXPECT_NE(out.find("refused setting failed: status 0xBFFA0010"), std::string::npos) << out;
    EXPECT_NE(out.find("Invalid value (42)"), std::string::npos) << out;
    EXPECT_NE(out.find("closed"), std::string::npos) << out;
    emulator.Stop();
}

}  // namespace

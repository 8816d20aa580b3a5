// qn731xx list: usbtmc devices from a fake sysfs tree, serial ports from a
// device directory holding a pseudo-terminal, VXI-11 instruments from the
// emulator's portmapper on loopback; a listed resource opens.
#include "tools/list_command.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <stdlib.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>

#include "emulator/emulator.h"
#include "platform/com/bstr.h"
#include "platform/visa/visa.h"
#include "tests/support/fake_sysfs.h"
#include "tests/tools/run_command.h"

namespace qn::tools {
namespace {

TEST(ListCommand, FindsUsbSerialAndLanResourcesThatOpen) {
    qn::test::FakeSysfs fs;
    fs.Add("usbtmc0", "1-1", "1ab1", "04ce", "DS1ZA1", "0");
    fs.Add("usbtmc1", "1-2", "0957", "17a4", "MY44", "2");
    fs.Add("usbtmc2", "1-3", "0699", "0368", "", "0");  // no serial number: not listed
    const std::string dev = fs.root() + "/dev";
    std::filesystem::create_directories(dev);
    const int pty = ::posix_openpt(O_RDWR | O_NOCTTY | O_CLOEXEC);
    ASSERT_GE(pty, 0);
    ASSERT_EQ(::grantpt(pty), 0);
    ASSERT_EQ(::unlockpt(pty), 0);
    std::filesystem::create_symlink(::ptsname(pty), dev + "/ttyUSB0");
    std::ofstream(dev + "/ttyS3");                                          // not a terminal
    std::filesystem::create_symlink("/nonexistent/tty", dev + "/ttyACM0");  // does not open
    std::ofstream(dev + "/ttyUSBx");                                        // not a port name

    emu::Emulator emu("QDS4032A");
    emu.EnableVxi11();
    emu.EnablePortmapper(0);
    emu.Start();
    const std::string pm = "127.0.0.1:" + std::to_string(emu.portmapper_port());

    Result r = Invoke(ListCommand, {"--sysfs", fs.root(), "--dev", dev, "--lan", "--lan-address",
                                    pm, "--timeout", "300", "--json"});
    ::close(pty);
    ASSERT_EQ(r.rc, 0) << r.err;
    Json j = OutputObject(r);
    ASSERT_TRUE(j.is_object()) << r.out;
    std::vector<std::string> resources;
    for (const Json& f : j["resources"]) resources.push_back(f["resource"]);
    const std::string vxi11 =
        "TCPIP0::127.0.0.1:" + std::to_string(emu.vxi11_port()) + "::inst0::INSTR";
    EXPECT_EQ(resources, (std::vector<std::string>{
                             "USB0::0x1AB1::0x04CE::DS1ZA1::INSTR",
                             "USB0::0x0957::0x17A4::MY44::2::INSTR",
                             "ASRL" + dev + "/ttyUSB0::INSTR",
                             vxi11,
                         }));
    // The LAN resource found opens and answers.
    ComPtr<IResourceManager> rm;
    ASSERT_EQ(visa::CreateResourceManager(rm.Out()), S_OK);
    ComPtr<IVisaSession> session;
    EXPECT_EQ(rm->Open(com::Bstr(vxi11).get(), visa::kNoLock, 2000, nullptr, session.Out()), S_OK);
}

}  // namespace
}  // namespace qn::tools

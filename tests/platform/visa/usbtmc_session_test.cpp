// USBTMC sessions over a stand-in device that answers the driver's
// operations from a script, and the sysfs matching over a fake sysfs tree.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <memory>

#include "tests/platform/visa/instrument_ends.h"
#include "tests/support/fake_sysfs.h"

namespace qn::visa::test {
namespace {

// With the termination character off, END alone ends a message; every
// transfer is bounded by what is left of the session timeout. The device's
// own clear and status byte serve Clear and ReadSTB.
TEST(UsbtmcSessionTest, MessagesEndAtTheDevicesEndAndUseItsOperations) {
    auto script = std::make_shared<UsbtmcScript>();
    script->piece = 4;
    script->replies = {"QUORLEN,QDS4032A,SN1,1.0\n", "NEXT"};
    auto msg = UsbtmcSession(script, false);
    std::string text;
    ASSERT_EQ(ReadText(msg.get(), &text), S_OK) << ThreadErrorText();
    EXPECT_EQ(text, "QUORLEN,QDS4032A,SN1,1.0\n");
    ASSERT_EQ(ReadText(msg.get(), &text), S_OK);
    EXPECT_EQ(text, "NEXT");
    EXPECT_EQ(ReadText(msg.get(), &text), E_VISA_TIMEOUT);
    EXPECT_NE(ThreadErrorText().find("/dev/usbtmc9"), std::string::npos);
    ASSERT_FALSE(script->timeouts.empty());
    for (std::uint32_t ms : script->timeouts) EXPECT_TRUE(ms >= 1 && ms <= 1000) << ms;
    // A clear forgets a reply read in part: nothing of it is drained before the next write.
    script->replies = {"PARTIAL REPLY\n"};
    ASSERT_EQ(ReadText(msg.get(), &text, 4), S_OK);
    ASSERT_EQ(msg->Clear(), S_OK);
    EXPECT_EQ(script->clears, 1);
    script->replies = {"AFTER\n"};
    ASSERT_EQ(Write(msg.get(), "X\n"), S_OK);
    ASSERT_EQ(ReadText(msg.get(), &text), S_OK);
    EXPECT_EQ(text, "AFTER\n");
    SHORT stb = 0;
    ASSERT_EQ(msg->ReadSTB(&stb), S_OK);
    EXPECT_EQ(stb, 0x50);
}

using qn::test::FakeSysfs;

TEST(UsbtmcSysfsTest, ResourcesFindTheirDeviceByIds) {
    FakeSysfs fs;
    fs.Add("usbtmc0", "1-1", "1ab1", "04ce", "DS1ZA1", "0");
    fs.Add("usbtmc1", "1-2", "1ab1", "04ce", "DS1ZB2", "0");
    fs.Add("usbtmc2", "2-1", "0957", "17a4", "MY44", "1");
    fs.Add("usbtmc3", "2-2", "zzzz", "17a4", "X", "0");  // unreadable id: left out
    fs.Add("usbtmc10", "3-1", "0699", "0368", "", "0");  // no serial number
    const auto list = ListUsbtmcDevices(fs.root());
    ASSERT_EQ(list.size(), 4u);
    EXPECT_EQ(list[2].name, "usbtmc2");
    EXPECT_EQ(list[2].vendor_id, 0x0957);
    EXPECT_EQ(list[2].interface_number, 1);
    EXPECT_EQ(list[3].name, "usbtmc10");
    EXPECT_EQ(list[3].serial_number, "");

    struct Case {
        const char* resource;
        const char* opened;  // the device node opened, or null: not found
    } const cases[] = {
        {"USB::0x1AB1::0x04CE::DS1ZA1::INSTR", "usbtmc0"},
        {"USB0::6833::1230::DS1ZB2::INSTR", "usbtmc1"},   // decimal ids
        {"USB::0x1AB1::0x04CE::ds1zb2::INSTR", nullptr},  // serial numbers keep their case
        {"USB::0x1AB1::0x04CF::DS1ZA1::INSTR", nullptr},
        {"USB::0x0957::0x17A4::MY44::1::INSTR", "usbtmc2"},
        {"USB::0x0957::0x17A4::MY44::0::INSTR", nullptr},  // wrong interface
    };
    // The device nodes: plain files in a temp dir stand in for /dev.
    const std::string dev = fs.root() + "/dev";
    std::filesystem::create_directories(dev);
    for (const char* n : {"usbtmc0", "usbtmc1", "usbtmc2"}) std::ofstream(dev + "/" + n);
    for (const Case& c : cases) {
        auto name = ParseResourceName(c.resource);
        if (!name) {
            ADD_FAILURE() << "unparsed " << c.resource;
            continue;
        }
        std::unique_ptr<Transport> t;
        std::string error;
        HRESULT hr = OpenUsbtmcTransportAt(*name, fs.root(), dev, &t, &error);
        if (!c.opened) {
            EXPECT_EQ(hr, E_VISA_RESOURCE_NOT_FOUND) << c.resource;
            EXPECT_NE(error.find("4 usbtmc devices present"), std::string::npos) << error;
            continue;
        }
        EXPECT_EQ(hr, S_OK) << c.resource << ": " << error;
        EXPECT_TRUE(t) << c.resource;
    }
    // A node that cannot be opened says why.
    std::filesystem::remove(dev + "/usbtmc0");
    std::unique_ptr<Transport> t;
    std::string error;
    EXPECT_EQ(OpenUsbtmcTransportAt(*ParseResourceName("USB::0x1AB1::0x04CE::DS1ZA1::INSTR"),
                                    fs.root(), dev, &t, &error),
              E_VISA_RESOURCE_NOT_FOUND);
    EXPECT_NE(error.find("cannot open " + dev + "/usbtmc0"), std::string::npos) << error;
}

}  // namespace
}  // namespace qn::visa::test

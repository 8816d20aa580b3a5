// USBTMC sessions over a stand-in device that answers the driver's
// operations from a script, and the sysfs matching over a fake sysfs tree.
#include <gtest/gtest.h>

#include <cerrno>
#include <deque>
#include <filesystem>
#include <fstream>
#include <memory>

#include "platform/visa/resource_name.h"
#include "platform/visa/session.h"
#include "platform/visa/usbtmc_device.h"
#include "tests/platform/visa/visa_test_util.h"
#include "tests/support/fake_sysfs.h"

namespace qn::visa::test {
namespace {

// What the stand-in device holds and saw; the test keeps it while the
// session owns the device.
struct Script {
    std::deque<std::string> replies;  // messages the device will answer, in order
    std::size_t piece = 1 << 20;      // bytes per transfer at most
    int reads_before_unplug = -1;     // transfers served before the device goes away
    std::string written;
    std::vector<std::uint32_t> timeouts;
    int clears = 0;
};

class StandIn final : public UsbtmcDevice {
  public:
    explicit StandIn(std::shared_ptr<Script> s) : s_(std::move(s)) {}
    int SetTimeout(std::uint32_t ms) override {
        if (s_->reads_before_unplug == 0) return ENODEV;
        s_->timeouts.push_back(ms);
        return 0;
    }
    int Read(BYTE* buf, std::size_t n, std::size_t* got, bool* eom) override {
        *got = 0;
        if (s_->reads_before_unplug == 0) return ENODEV;
        if (s_->reads_before_unplug > 0) --s_->reads_before_unplug;
        if (s_->replies.empty()) return ETIMEDOUT;
        std::string& front = s_->replies.front();
        *got = std::min({n, s_->piece, front.size()});
        std::copy_n(front.begin(), *got, buf);
        front.erase(0, *got);
        *eom = front.empty();
        if (*eom) s_->replies.pop_front();
        return 0;
    }
    int Write(const BYTE* data, std::size_t n, std::size_t* written) override {
        if (s_->reads_before_unplug == 0) return ENODEV;
        s_->written.append(reinterpret_cast<const char*>(data), n);
        *written = n;
        return 0;
    }
    int Clear() override {
        ++s_->clears;
        s_->replies.clear();
        return 0;
    }
    int ReadStatusByte(BYTE* stb) override {
        *stb = 0x50;
        return 0;
    }

  private:
    std::shared_ptr<Script> s_;
};

ComPtr<IMessage> SessionOver(std::shared_ptr<Script> script, bool term_char) {
    ResourceName name = *ParseResourceName("USB0::0x1AB1::0x04CE::DS1ZA1::INSTR");
    auto session = qn::com::MakeComObject<MessageSession>(
        name, MakeUsbtmcTransport(std::make_unique<StandIn>(std::move(script)), "/dev/usbtmc9"));
    ComPtr<IMessage> msg;
    EXPECT_EQ(session->QueryInterface(iid_of<IMessage>, msg.OutVoid()), S_OK);
    msg->put_TerminationCharacterEnabled(term_char ? VARIANT_TRUE : VARIANT_FALSE);
    msg->put_Timeout(1000);
    return msg;
}

TEST(UsbtmcSessionTest, RepliesInEveryTransferSizeEndAtTheDevicesEnd) {
    const std::string reply = "QUORLEN,QDS4032A,SN1,1.0\n";
    for (bool term : {false, true}) {
        for (std::size_t piece = 1; piece <= reply.size(); piece += 3) {
            auto script = std::make_shared<Script>();
            script->piece = piece;
            script->replies = {reply, "NEXT"};
            auto msg = SessionOver(script, term);
            std::string text;
            ASSERT_EQ(ReadText(msg.get(), &text), S_OK) << ThreadErrorText();
            EXPECT_EQ(text, reply) << "piece " << piece << " term " << term;
            // A message without a line feed ends at END all the same.
            ASSERT_EQ(ReadText(msg.get(), &text), S_OK);
            EXPECT_EQ(text, "NEXT");
            // Every transfer was bounded by what was left of the session timeout.
            for (std::uint32_t ms : script->timeouts) EXPECT_TRUE(ms >= 1 && ms <= 1000) << ms;
        }
    }
}

TEST(UsbtmcSessionTest, UnreadRestOfAReplyIsDroppedBeforeTheNextWrite) {
    auto script = std::make_shared<Script>();
    script->piece = 3;
    script->replies = {"0123456789ABCDEF\n", "SECOND\n"};
    auto msg = SessionOver(script, true);
    std::string text;
    ASSERT_EQ(ReadText(msg.get(), &text, 4), S_OK);
    EXPECT_EQ(text, "0123");
    ASSERT_EQ(Write(msg.get(), "Q?\n"), S_OK);
    EXPECT_EQ(script->written, "Q?\n");
    ASSERT_EQ(ReadText(msg.get(), &text), S_OK);
    EXPECT_EQ(text, "SECOND\n");
}

TEST(UsbtmcSessionTest, TimeoutClearAndStatusByteUseTheDevice) {
    auto script = std::make_shared<Script>();
    auto msg = SessionOver(script, true);
    std::string text;
    EXPECT_EQ(ReadText(msg.get(), &text), E_VISA_TIMEOUT);
    EXPECT_NE(ThreadErrorText().find("/dev/usbtmc9"), std::string::npos);
    // A clear forgets a reply read in part: nothing is drained afterwards.
    script->replies = {"PARTIAL REPLY\n"};
    script->piece = 4;
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

TEST(UsbtmcSessionTest, DeviceUnpluggedMidReadEndsInAConnectionLoss) {
    auto script = std::make_shared<Script>();
    script->piece = 5;
    script->replies = {"#41000" + std::string(1000, 'x')};
    script->reads_before_unplug = 1;
    auto msg = SessionOver(script, false);
    std::string text;
    EXPECT_EQ(ReadText(msg.get(), &text, 1006), E_VISA_CONNECTION_LOST);
    EXPECT_NE(ThreadErrorText().find("is gone"), std::string::npos);
    EXPECT_EQ(Write(msg.get(), "*IDN?\n"), E_VISA_CONNECTION_LOST);
    EXPECT_EQ(msg->Close(), S_OK);
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

// AssertTrigger over every transport: the emulator over loopback for the
// socket, VXI-11 and HiSLIP, a stand-in device for USBTMC.
#include <gtest/gtest.h>

#include <cerrno>

#include "emulator/emulator.h"
#include "platform/visa/resource_name.h"
#include "platform/visa/session.h"
#include "platform/visa/usbtmc_device.h"
#include "tests/platform/visa/visa_test_util.h"

namespace qn::visa::test {
namespace {

std::string Query(IMessage* msg, const std::string& text) {
    std::string reply;
    EXPECT_EQ(Write(msg, text + "\n"), S_OK) << ThreadErrorText();
    EXPECT_EQ(ReadText(msg, &reply), S_OK) << ThreadErrorText();
    return reply;
}

// A single acquisition that its own trigger never completes (normal sweep on
// a grounded channel) is completed by the bus trigger, whatever the bus.
TEST(AssertTrigger, CompletesAnArmedAcquisitionOnEveryLanTransport) {
    emu::Emulator emu("QDS2014A");
    emu.EnableVxi11();
    emu.EnableHislip();
    emu.Start();
    const std::string resources[] = {
        "TCPIP0::127.0.0.1::" + std::to_string(emu.port()) + "::SOCKET",
        "TCPIP0::127.0.0.1:" + std::to_string(emu.vxi11_port()) + "::inst0::INSTR",
        "TCPIP0::127.0.0.1::hislip0," + std::to_string(emu.hislip_port()) + "::INSTR",
    };
    for (const std::string& resource : resources) {
        SCOPED_TRACE(resource);
        ComPtr<IMessage> msg = OpenMessage(resource);
        ASSERT_TRUE(msg);
        ASSERT_EQ(Write(msg.get(), "*RST;:TRIG:MODE EDGE;:TRIG:SOUR CHAN1;:TRIG:SWE NORM;"
                                   ":CHAN1:COUP GND;:SING\n"),
                  S_OK);
        EXPECT_EQ(Query(msg.get(), ":OPER:COND?"), "8\n");  // running, not triggered
        emu.ClearReceivedMessages();
        // Another protocol than the default is refused before anything is sent.
        EXPECT_EQ(msg->AssertTrigger(1), E_VISA_INVALID_PROTOCOL);
        EXPECT_TRUE(emu.ReceivedMessages().empty());
        ASSERT_EQ(msg->AssertTrigger(kTriggerProtocolDefault), S_OK) << ThreadErrorText();
        EXPECT_EQ(Query(msg.get(), ":OPER:COND?"), "0\n");
        const auto log = emu.ReceivedMessages();
        ASSERT_FALSE(log.empty());
        EXPECT_EQ(log.front(), "*TRG");
    }
}

// USBTMC: the kernel driver's trigger request; a device without it says so.
class TriggerDevice final : public UsbtmcDevice {
  public:
    explicit TriggerDevice(int result) : result_(result) {}
    int SetTimeout(std::uint32_t) override { return 0; }
    int Read(BYTE*, std::size_t, std::size_t*, bool*) override { return ETIMEDOUT; }
    int Write(const BYTE*, std::size_t, std::size_t*) override { return EIO; }
    int Clear() override { return 0; }
    int ReadStatusByte(BYTE*) override { return EIO; }
    int Trigger() override { return result_; }

  private:
    int result_;
};

TEST(AssertTrigger, UsbtmcUsesTheDriversTriggerRequest) {
    const std::pair<int, HRESULT> cases[] = {
        {0, S_OK},
        {ENOTTY, E_VISA_NOT_SUPPORTED},  // a driver without the request
        {ETIMEDOUT, E_VISA_TIMEOUT},
        {ENODEV, E_VISA_CONNECTION_LOST},
    };
    for (auto [result, expected] : cases) {
        auto session = qn::com::MakeComObject<MessageSession>(
            *ParseResourceName("USB0::0x1AB1::0x04CE::DS1ZA1::INSTR"),
            MakeUsbtmcTransport(std::make_unique<TriggerDevice>(result), "/dev/usbtmc9"));
        EXPECT_EQ(session->AssertTrigger(kTriggerProtocolDefault), expected) << result;
        if (result != 0) {
            EXPECT_NE(ThreadErrorText().find("/dev/usbtmc9"), std::string::npos);
        }
    }
}

}  // namespace
}  // namespace qn::visa::test

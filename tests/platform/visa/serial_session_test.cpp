// Serial sessions on a pseudo-terminal that the test drives from its other
// side: line settings reach the terminal or are refused without a change,
// and opens that fail name their cause.
#include <gtest/gtest.h>
#include <termios.h>

#include <string>

#include "platform/visa/serial.h"
#include "platform/visa/serial_line.h"
#include "tests/platform/visa/instrument_ends.h"

namespace qn::visa::test {
namespace {

using qn::com::Bstr;

ComPtr<ISerial> SerialOf(IMessage* msg) {
    ComPtr<ISerial> serial;
    if (msg) {
        EXPECT_EQ(msg->QueryInterface(iid_of<ISerial>, serial.OutVoid()), S_OK);
    }
    return serial;
}

TEST(SerialSessionTest, OpenFailuresNameTheCause) {
    struct Case {
        const char* resource;
        const char* cause;
    } const cases[] = {
        {"ASRL0::INSTR", "numbered from 1"},
        {"ASRL/dev/qn-no-such-tty::INSTR", "cannot open /dev/qn-no-such-tty"},
        {"ASRL/dev/null::INSTR", "not a serial port"},
    };
    ComPtr<IResourceManager> rm;
    ASSERT_EQ(CreateResourceManager(rm.Out()), S_OK);
    for (const Case& c : cases) {
        ComPtr<IVisaSession> session;
        EXPECT_EQ(rm->Open(Bstr(c.resource).get(), kNoLock, 500, nullptr, session.Out()),
                  E_VISA_RESOURCE_NOT_FOUND)
            << c.resource;
        EXPECT_NE(ThreadErrorText().find(c.cause), std::string::npos) << c.resource;
    }
}

TEST(SerialLineTest, SettingsBecomeTermiosOrAreRefused) {
    struct Case {
        SerialSettings s;
        HRESULT hr;
        tcflag_t cflag;  // c_cflag & kMask when accepted
        tcflag_t iflag;  // c_iflag & (IXON | IXOFF) when accepted
    } const cases[] = {
        {{9600, 8, kParityNone, kStopOne, kFlowNone}, S_OK, CS8, 0},
        {{9600, 7, kParityEven, kStopOne, kFlowNone}, S_OK, CS7 | PARENB, 0},
        {{9600, 5, kParityOdd, kStopTwo, kFlowNone}, S_OK, CS5 | PARENB | PARODD | CSTOPB, 0},
        {{9600, 8, kParityMark, kStopOne, kFlowRtsCts},
         S_OK,
         CS8 | PARENB | PARODD | CMSPAR | CRTSCTS,
         0},
        {{9600, 6, kParitySpace, kStopOne, kFlowXonXoff},
         S_OK,
         CS6 | PARENB | CMSPAR,
         IXON | IXOFF},
        {{9600, 4, kParityNone, kStopOne, kFlowNone}, E_VISA_ATTRIBUTE_STATE, 0, 0},
        {{9600, 9, kParityNone, kStopOne, kFlowNone}, E_VISA_ATTRIBUTE_STATE, 0, 0},
        {{9600, 8, 5, kStopOne, kFlowNone}, E_VISA_ATTRIBUTE_STATE, 0, 0},
        {{9600, 8, -1, kStopOne, kFlowNone}, E_VISA_ATTRIBUTE_STATE, 0, 0},
        {{9600, 8, kParityNone, 15, kFlowNone}, E_VISA_NOT_SUPPORTED, 0, 0},
        {{9600, 8, kParityNone, 1, kFlowNone}, E_VISA_ATTRIBUTE_STATE, 0, 0},
        {{9600, 8, kParityNone, kStopOne, 4}, E_VISA_NOT_SUPPORTED, 0, 0},
        {{9600, 8, kParityNone, kStopOne, 3}, E_VISA_ATTRIBUTE_STATE, 0, 0},
        {{115201, 8, kParityNone, kStopOne, kFlowNone}, E_VISA_ATTRIBUTE_STATE, 0, 0},
        {{0, 8, kParityNone, kStopOne, kFlowNone}, E_VISA_ATTRIBUTE_STATE, 0, 0},
    };
    constexpr tcflag_t kMask = CSIZE | PARENB | PARODD | CMSPAR | CSTOPB | CRTSCTS;
    for (const Case& c : cases) {
        termios t{};
        t.c_cflag = kMask;  // every bit the settings decide starts set
        t.c_iflag = IXON | IXOFF;
        std::string error;
        SCOPED_TRACE(testing::Message()
                     << c.s.baud_rate << " " << c.s.data_bits << " " << c.s.parity << " "
                     << c.s.stop_bits << " " << c.s.flow_control);
        ASSERT_EQ(SerialTermios(c.s, &t, &error), c.hr);
        if (FAILED(c.hr)) {
            EXPECT_FALSE(error.empty());
            EXPECT_EQ(t.c_cflag, kMask);  // untouched
            continue;
        }
        EXPECT_EQ(t.c_cflag & kMask, c.cflag);
        EXPECT_EQ(t.c_cflag & (CLOCAL | CREAD), tcflag_t(CLOCAL | CREAD));
        EXPECT_EQ(t.c_iflag & (IXON | IXOFF), c.iflag);
        EXPECT_EQ(t.c_lflag & (ECHO | ICANON), 0u);
    }
}

TEST(SerialSessionTest, SettingsReachTheLineAndRefusalsChangeNothing) {
    PtyEnd pty;
    auto msg = pty.Open(2000);
    auto serial = SerialOf(msg.get());
    ASSERT_TRUE(serial);
    termios initial = pty.Settings();
    EXPECT_EQ(::cfgetospeed(&initial), speed_t(B9600));
    ASSERT_EQ(serial->put_BaudRate(115200), S_OK);
    ASSERT_EQ(serial->put_StopBits(kStopTwo), S_OK);
    for (int refused = 0; refused < 2; ++refused) {
        termios t = pty.Settings();
        EXPECT_EQ(::cfgetospeed(&t), speed_t(B115200));
        EXPECT_EQ(t.c_cflag & CSTOPB, tcflag_t(CSTOPB));
        LONG baud = 0;
        SHORT stop = 0;
        ASSERT_EQ(serial->get_BaudRate(&baud), S_OK);
        ASSERT_EQ(serial->get_StopBits(&stop), S_OK);
        EXPECT_EQ(std::make_pair(baud, stop), std::make_pair(LONG{115200}, SHORT{kStopTwo}));
        // Refused values leave the line and the session as they were.
        EXPECT_EQ(serial->put_BaudRate(115201), E_VISA_ATTRIBUTE_STATE);
        EXPECT_NE(ThreadErrorText().find("115201"), std::string::npos);
        EXPECT_EQ(serial->put_StopBits(15), E_VISA_NOT_SUPPORTED);
    }
}

}  // namespace
}  // namespace qn::visa::test

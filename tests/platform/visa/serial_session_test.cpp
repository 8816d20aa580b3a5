// Serial sessions on a pseudo-terminal that the test drives from its other
// side: line settings reach the terminal, stray input and noise never shift
// a reply, a line that hangs up ends the read with a clear error.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <netinet/in.h>
#include <stdlib.h>
#include <sys/socket.h>
#include <termios.h>
#include <unistd.h>

#include <string>

#include "platform/visa/serial.h"
#include "platform/visa/serial_line.h"
#include "platform/visa/visa.h"
#include "tests/platform/visa/visa_test_util.h"

namespace qn::visa::test {
namespace {

using qn::com::Bstr;

// The controlling side of a new pseudo-terminal; path() is the serial port.
class Pty {
  public:
    Pty() {
        fd_ = ::posix_openpt(O_RDWR | O_NOCTTY | O_CLOEXEC);
        char name[128] = {};
        if (fd_ >= 0 && ::grantpt(fd_) == 0 && ::unlockpt(fd_) == 0 &&
            ::ptsname_r(fd_, name, sizeof name) == 0)
            path_ = name;
    }
    ~Pty() { HangUp(); }
    const std::string& path() const { return path_; }
    std::string Resource() const { return "ASRL" + path_ + "::INSTR"; }
    void Send(const std::string& bytes) {
        ASSERT_EQ(::write(fd_, bytes.data(), bytes.size()), ssize_t(bytes.size()));
    }
    // What the session wrote, up to and including the first line feed.
    std::string ReceiveLine() {
        std::string line;
        char c = 0;
        while (line.find('\n') == std::string::npos && ::read(fd_, &c, 1) == 1) line += c;
        return line;
    }
    tcflag_t cflag() const {
        termios t{};
        ::tcgetattr(fd_, &t);  // a master reads its terminal's settings
        return t.c_cflag;
    }
    speed_t speed() const {
        termios t{};
        ::tcgetattr(fd_, &t);
        return ::cfgetospeed(&t);
    }
    void HangUp() {
        if (fd_ >= 0) ::close(fd_);
        fd_ = -1;
    }

  private:
    int fd_ = -1;
    std::string path_;
};

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
    Pty pty;
    auto msg = OpenMessage(pty.Resource());
    auto serial = SerialOf(msg.get());
    ASSERT_TRUE(serial);
    EXPECT_EQ(pty.speed(), speed_t(B9600));
    ASSERT_EQ(serial->put_BaudRate(115200), S_OK);
    ASSERT_EQ(serial->put_StopBits(kStopTwo), S_OK);
    EXPECT_EQ(pty.speed(), speed_t(B115200));
    EXPECT_EQ(pty.cflag() & CSTOPB, tcflag_t(CSTOPB));
    // Refused values leave the line and the session as they were.
    EXPECT_EQ(serial->put_BaudRate(115201), E_VISA_ATTRIBUTE_STATE);
    EXPECT_NE(ThreadErrorText().find("115201"), std::string::npos);
    EXPECT_EQ(serial->put_StopBits(15), E_VISA_NOT_SUPPORTED);
    EXPECT_EQ(pty.speed(), speed_t(B115200));
    EXPECT_EQ(pty.cflag() & CSTOPB, tcflag_t(CSTOPB));
    LONG baud = 0;
    SHORT stop = 0;
    ASSERT_EQ(serial->get_BaudRate(&baud), S_OK);
    ASSERT_EQ(serial->get_StopBits(&stop), S_OK);
    EXPECT_EQ(baud, 115200);
    EXPECT_EQ(stop, kStopTwo);
}

TEST(SerialSessionTest, OnlySerialSessionsOfferLineSettings) {
    // A TCP socket session: a listening loopback socket is enough to open it.
    int fd = ::socket(AF_INET, SOCK_STREAM, 0);
    sockaddr_in addr{};
    addr.sin_family = AF_INET;
    addr.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    ASSERT_EQ(::bind(fd, reinterpret_cast<sockaddr*>(&addr), sizeof addr), 0);
    ASSERT_EQ(::listen(fd, 1), 0);
    socklen_t len = sizeof addr;
    ::getsockname(fd, reinterpret_cast<sockaddr*>(&addr), &len);
    auto msg =
        OpenMessage("TCPIP::127.0.0.1::" + std::to_string(ntohs(addr.sin_port)) + "::SOCKET");
    ComPtr<ISerial> serial;
    EXPECT_EQ(msg->QueryInterface(iid_of<ISerial>, serial.OutVoid()), E_NOINTERFACE);
    ::close(fd);
}

TEST(SerialSessionTest, NoiseAndStrayLinesNeverPassForAReply) {
    Pty pty;
    auto msg = OpenMessage(pty.Resource(), 200);
    ASSERT_TRUE(msg);
    std::string text;
    // Noise without a line end: the read ends by timeout, with what came.
    pty.Send(std::string("\x01\xff\x7f garbage", 12));
    EXPECT_EQ(ReadText(msg.get(), &text), E_VISA_TIMEOUT);
    // The rest of that noise and a stray line are dropped before the next
    // query is written; each query then gets its own reply.
    for (int i = 0; i < 10; ++i) {
        pty.Send("noise" + std::string(i, '#') + "\nSTRAY\n");
        ASSERT_EQ(Write(msg.get(), "Q" + std::to_string(i) + "?\n"), S_OK);
        EXPECT_EQ(pty.ReceiveLine(), "Q" + std::to_string(i) + "?\n");
        pty.Send("A" + std::to_string(i) + "\n");
        ASSERT_EQ(ReadText(msg.get(), &text), S_OK) << ThreadErrorText();
        EXPECT_EQ(text, "A" + std::to_string(i) + "\n");
    }
}

TEST(SerialSessionTest, LineHangingUpMidReadIsAConnectionLoss) {
    Pty pty;
    auto msg = OpenMessage(pty.Resource(), 2000);
    ASSERT_TRUE(msg);
    pty.Send("PARTIAL");
    pty.HangUp();
    std::string text;
    EXPECT_EQ(ReadText(msg.get(), &text), E_VISA_CONNECTION_LOST);
    EXPECT_NE(ThreadErrorText().find(pty.path()), std::string::npos);
    EXPECT_EQ(Write(msg.get(), "*IDN?\n"), E_VISA_CONNECTION_LOST);
    EXPECT_EQ(msg->Close(), S_OK);
}

}  // namespace
}  // namespace qn::visa::test

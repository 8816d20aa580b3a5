// The instrument's end of a message session, driven by the test from its own
// thread: a loopback socket, the controlling side of a pseudo-terminal (the
// serial line), and a stand-in USBTMC device that answers from a script.
#pragma once

#include <fcntl.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <stdlib.h>
#include <sys/socket.h>
#include <termios.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <deque>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "platform/visa/resource_name.h"
#include "platform/visa/session.h"
#include "platform/visa/usbtmc_device.h"
#include "tests/platform/visa/loopback_peer.h"
#include "tests/platform/visa/visa_test_util.h"

namespace qn::visa::test {

// Open: the session, termination character on. Send: one message (END after
// it where the bus has END), in pieces of `piece` bytes `gap_ms` apart when
// piece > 0. ReceiveLine: the next line the session wrote. HangUp: the
// instrument goes away after what was sent. LostText: in the error of a lost
// connection.
class InstrumentEnd {
  public:
    virtual ~InstrumentEnd() = default;
    virtual ComPtr<IMessage> Open(LONG timeout_ms) = 0;
    virtual void Send(const std::string& bytes, std::size_t piece = 0, int gap_ms = 1) = 0;
    virtual std::string ReceiveLine() = 0;
    virtual void HangUp() = 0;
    virtual std::string LostText() const = 0;
};

// A byte stream on a file descriptor: socket or pseudo-terminal.
class FdEnd : public InstrumentEnd {
  public:
    ~FdEnd() override { HangUp(); }
    void Send(const std::string& bytes, std::size_t piece = 0, int gap_ms = 1) override {
        Join();
        if (piece == 0) {
            WriteAll(bytes);
            return;
        }
        sender_ = std::thread([this, bytes, piece, gap_ms] {
            for (std::size_t off = 0; off < bytes.size(); off += piece) {
                if (off) std::this_thread::sleep_for(std::chrono::milliseconds(gap_ms));
                WriteAll(bytes.substr(off, piece));
            }
        });
    }
    std::string ReceiveLine() override {
        std::string line;
        char c = 0;
        pollfd p{fd_, POLLIN, 0};
        while (line.find('\n') == std::string::npos && ::poll(&p, 1, 5000) == 1 &&
               ::read(fd_, &c, 1) == 1)
            line += c;
        return line;
    }
    void HangUp() override {
        Join();
        if (fd_ >= 0) ::close(fd_);
        fd_ = -1;
    }
    // Waits until the bytes of the last Send are all written.
    void Join() {
        if (sender_.joinable()) sender_.join();
    }

  protected:
    void WriteAll(const std::string& bytes) {
        EXPECT_EQ(::write(fd_, bytes.data(), bytes.size()), ssize_t(bytes.size()));
    }
    int fd_ = -1;
    std::thread sender_;
};

class SocketEnd final : public FdEnd {
  public:
    SocketEnd() { listen_fd_ = ListenLoopback(&port_); }
    ~SocketEnd() override {
        HangUp();
        ::close(listen_fd_);
    }
    ComPtr<IMessage> Open(LONG timeout_ms) override {
        auto msg = OpenMessage(SocketResource(port_), timeout_ms);
        pollfd p{listen_fd_, POLLIN, 0};
        if (::poll(&p, 1, 5000) == 1) fd_ = ::accept4(listen_fd_, nullptr, nullptr, SOCK_CLOEXEC);
        EXPECT_GE(fd_, 0);
        int one = 1;  // each Send on the wire at once, as an instrument sends its replies
        ::setsockopt(fd_, IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
        return msg;
    }
    std::string LostText() const override { return "connection closed by 127.0.0.1"; }

  private:
    int listen_fd_ = -1;
    std::uint16_t port_ = 0;
};

// The controlling side of a new pseudo-terminal; path() is the serial port.
class PtyEnd final : public FdEnd {
  public:
    PtyEnd() {
        fd_ = ::posix_openpt(O_RDWR | O_NOCTTY | O_CLOEXEC);
        char name[128] = {};
        if (fd_ >= 0 && ::grantpt(fd_) == 0 && ::unlockpt(fd_) == 0 &&
            ::ptsname_r(fd_, name, sizeof name) == 0)
            path_ = name;
    }
    ComPtr<IMessage> Open(LONG timeout_ms) override {
        return OpenMessage("ASRL" + path_ + "::INSTR", timeout_ms);
    }
    std::string LostText() const override { return "line hung up: " + path_; }
    termios Settings() const {
        termios t{};
        ::tcgetattr(fd_, &t);  // a master reads its terminal's settings
        return t;
    }

  private:
    std::string path_;
};

// What the stand-in USBTMC device holds and saw.
struct UsbtmcScript {
    std::deque<std::string> replies;  // messages the device will answer, in order
    std::size_t piece = 1 << 20;      // bytes per transfer at most
    int reads_before_unplug = -1;     // transfers served before the device goes away
    std::string written;
    std::vector<std::uint32_t> timeouts;
    int clears = 0;
};

class StandInDevice final : public UsbtmcDevice {
  public:
    explicit StandInDevice(std::shared_ptr<UsbtmcScript> s) : s_(std::move(s)) {}
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
    int ReadStatusByte(BYTE* stb) override { return *stb = 0x50, 0; }

  private:
    std::shared_ptr<UsbtmcScript> s_;
};

// A session over a stand-in device at /dev/usbtmc9.
inline ComPtr<IMessage> UsbtmcSession(std::shared_ptr<UsbtmcScript> script, bool term_char,
                                      LONG timeout_ms = 1000) {
    ResourceName name = *ParseResourceName("USB0::0x1AB1::0x04CE::DS1ZA1::INSTR");
    auto session = qn::com::MakeComObject<MessageSession>(
        name,
        MakeUsbtmcTransport(std::make_unique<StandInDevice>(std::move(script)), "/dev/usbtmc9"));
    ComPtr<IMessage> msg;
    EXPECT_EQ(session->QueryInterface(iid_of<IMessage>, msg.OutVoid()), S_OK);
    msg->put_TerminationCharacterEnabled(term_char ? VARIANT_TRUE : VARIANT_FALSE);
    msg->put_Timeout(timeout_ms);
    return msg;
}

class UsbtmcEnd final : public InstrumentEnd {
  public:
    ComPtr<IMessage> Open(LONG timeout_ms) override {
        return UsbtmcSession(script_, true, timeout_ms);
    }
    void Send(const std::string& bytes, std::size_t piece, int) override {
        script_->piece = piece ? piece : 1 << 20;
        script_->replies.push_back(bytes);
    }
    std::string ReceiveLine() override {
        const std::size_t end = script_->written.find('\n');
        std::string line = script_->written.substr(0, end == std::string::npos ? end : end + 1);
        script_->written.erase(0, line.size());
        return line;
    }
    // One more transfer, then the device is unplugged.
    void HangUp() override { script_->reads_before_unplug = 1; }
    std::string LostText() const override { return "/dev/usbtmc9 is gone"; }

  private:
    std::shared_ptr<UsbtmcScript> script_ = std::make_shared<UsbtmcScript>();
};

}  // namespace qn::visa::test

#include "emulator/serial_line.h"

#include <fcntl.h>
#include <poll.h>
#include <stdlib.h>
#include <termios.h>
#include <unistd.h>

#include <cerrno>
#include <system_error>

#include "emulator/emulator.h"
#include "emulator/scpi_parser.h"

namespace qn::emu {
namespace {

void CloseFd(int& fd) {
    if (fd >= 0) ::close(fd);
    fd = -1;
}

}  // namespace

SerialLine::SerialLine(Emulator& emulator) : emulator_(emulator) {
    auto fail = [this](const char* what) {
        const int saved = errno;
        CloseFd(master_);
        CloseFd(terminal_);
        CloseFd(stop_[0]);
        CloseFd(stop_[1]);
        throw std::system_error(saved, std::generic_category(), what);
    };
    master_ = ::posix_openpt(O_RDWR | O_NOCTTY | O_NONBLOCK | O_CLOEXEC);
    if (master_ < 0) fail("posix_openpt");
    char name[128];
    if (::grantpt(master_) != 0 || ::unlockpt(master_) != 0 ||
        ::ptsname_r(master_, name, sizeof name) != 0)
        fail("pseudo-terminal set-up");
    terminal_ = ::open(name, O_RDWR | O_NOCTTY | O_CLOEXEC);
    if (terminal_ < 0) fail(name);
    // Raw line discipline: no echo, no line editing, no character translation.
    termios t{};
    if (::tcgetattr(terminal_, &t) != 0) fail("tcgetattr");
    ::cfmakeraw(&t);
    if (::tcsetattr(terminal_, TCSANOW, &t) != 0) fail("tcsetattr");
    if (::pipe2(stop_, O_CLOEXEC | O_NONBLOCK) != 0) fail("pipe2");
    path_ = name;
    thread_ = std::thread([this] { Serve(); });
}

SerialLine::~SerialLine() {
    const char byte = 1;
    [[maybe_unused]] const auto written = ::write(stop_[1], &byte, 1);
    thread_.join();
    CloseFd(master_);
    CloseFd(terminal_);
    CloseFd(stop_[0]);
    CloseFd(stop_[1]);
}

bool SerialLine::Wait(int fd, short events, int timeout_ms) const {
    for (;;) {
        pollfd fds[2] = {{fd, events, 0}, {stop_[0], POLLIN, 0}};
        const int n = ::poll(fds, 2, timeout_ms);
        if (n < 0 && errno == EINTR) continue;
        return n >= 0 && fds[1].revents == 0;
    }
}

bool SerialLine::WriteAll(std::string_view bytes) const {
    std::size_t sent = 0;
    while (sent < bytes.size()) {
        const ssize_t n = ::write(master_, bytes.data() + sent, bytes.size() - sent);
        if (n > 0) {
            sent += static_cast<std::size_t>(n);
            continue;
        }
        if (n < 0 && errno != EAGAIN && errno != EINTR) return false;
        if (!Wait(master_, POLLOUT, -1)) return false;
    }
    return true;
}

void SerialLine::Serve() {
    MessageFramer framer;
    std::string chunk(4096, '\0');
    while (Wait(master_, POLLIN, -1)) {
        const ssize_t n = ::read(master_, chunk.data(), chunk.size());
        if (n < 0 && (errno == EAGAIN || errno == EINTR)) continue;
        if (n <= 0) return;
        framer.Append(std::string_view(chunk.data(), static_cast<std::size_t>(n)));
        std::string reply;
        emulator_.RunMessages(framer, &reply);  // a serial line cannot be dropped: it stays up
        if (reply.empty()) continue;
        const auto delay = emulator_.reply_delay();
        // A delay is waited out unless the line stops meanwhile.
        if (delay.count() > 0 && !Wait(stop_[0], 0, static_cast<int>(delay.count()))) return;
        if (!WriteAll(reply)) return;
    }
}

}  // namespace qn::emu

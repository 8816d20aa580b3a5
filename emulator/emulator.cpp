#include "emulator/emulator.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <stdexcept>
#include <system_error>

#include "emulator/instrument.h"
#include "emulator/models.h"

namespace qn::emu {
namespace {

[[noreturn]] void ThrowErrno(const char* what) {
    throw std::system_error(errno, std::generic_category(), what);
}

ModelInfo ModelOrThrow(const std::string& name) {
    auto model = LookUpModel(name);
    if (!model) throw std::invalid_argument("unknown instrument model: " + name);
    return *model;
}

constexpr std::size_t kReadChunk = 64 * 1024;

}  // namespace

Emulator::Emulator(std::string model)
    : model_(std::move(model)), instrument_(std::make_unique<Instrument>(ModelOrThrow(model_))) {}

Emulator::~Emulator() {
    Stop();
}

std::uint16_t Emulator::Start(std::uint16_t port) {
    if (thread_.joinable()) throw std::logic_error("emulator already started");
    listener_ = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    if (listener_ < 0) ThrowErrno("socket");
    const int one = 1;
    ::setsockopt(listener_, SOL_SOCKET, SO_REUSEADDR, &one, sizeof one);
    sockaddr_in addr{};
    addr.sin_family = AF_INET;
    addr.sin_port = htons(port);
    addr.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t len = sizeof addr;
    if (::bind(listener_, reinterpret_cast<sockaddr*>(&addr), sizeof addr) != 0 ||
        ::listen(listener_, 8) != 0 ||
        ::getsockname(listener_, reinterpret_cast<sockaddr*>(&addr), &len) != 0) {
        const int saved = errno;
        ::close(listener_);
        listener_ = -1;
        throw std::system_error(saved, std::generic_category(), "bind/listen on 127.0.0.1");
    }
    if (::pipe2(wake_, O_CLOEXEC | O_NONBLOCK) != 0) {
        ::close(listener_);
        listener_ = -1;
        ThrowErrno("pipe2");
    }
    port_ = ntohs(addr.sin_port);
    stopping_ = false;
    thread_ = std::thread([this] { Run(); });
    return port_;
}

void Emulator::Stop() {
    if (!thread_.joinable()) return;
    stopping_ = true;
    const char byte = 1;
    [[maybe_unused]] const auto written = ::write(wake_[1], &byte, 1);
    thread_.join();
    for (int* fd : {&listener_, &wake_[0], &wake_[1]}) {
        if (*fd >= 0) ::close(*fd);
        *fd = -1;
    }
}

void Emulator::Run() {
    while (!stopping_) {
        pollfd fds[2] = {{listener_, POLLIN, 0}, {wake_[0], POLLIN, 0}};
        if (::poll(fds, 2, -1) < 0) {
            if (errno == EINTR) continue;
            return;
        }
        if (fds[1].revents != 0) return;
        const int client = ::accept4(listener_, nullptr, nullptr, SOCK_CLOEXEC);
        if (client < 0) continue;
        const int one = 1;
        ::setsockopt(client, IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
        Serve(client);
        ::close(client);
    }
}

void Emulator::Serve(int client) {
    MessageFramer framer;
    std::string chunk(kReadChunk, '\0');
    while (!stopping_) {
        pollfd fds[2] = {{client, POLLIN, 0}, {wake_[0], POLLIN, 0}};
        if (::poll(fds, 2, -1) < 0) {
            if (errno == EINTR) continue;
            return;
        }
        if (fds[1].revents != 0) return;
        const ssize_t n = ::recv(client, chunk.data(), chunk.size(), 0);
        if (n <= 0) return;  // closed by the client or failed
        framer.Append(std::string_view(chunk.data(), static_cast<std::size_t>(n)));
        // All messages that arrived together run before any reply is sent, so a query
        // followed by another message without reading its reply is interrupted (-410).
        while (auto message = framer.Next()) {
            if (!HandleMessage(*message)) return;
        }
        if (framer.TakeOverrun()) instrument_->Error(err::kInputBufferOverrun);
        if (instrument_->output_pending() && !SendReply(client, instrument_->TakeOutput())) return;
    }
}

bool Emulator::HandleMessage(const std::string& message) {
    // The faults in force when the message is logged decide its fate, so a test that has seen
    // the message in the log may change them without a race.
    bool drop = false;
    bool suppress = false;
    {
        std::lock_guard lock(mutex_);
        LogLocked(message);
        instrument_->status().SetEvents(faults_.forced_events);
        instrument_->set_waveform_override(faults_.waveform_data);
        drop = faults_.drop_on_query;
        suppress = faults_.suppress != 0;
    }
    instrument_->Execute(message);
    if (!instrument_->output_pending()) return true;
    std::lock_guard lock(mutex_);
    if (drop) faults_.drop_on_query = false;
    if (drop || suppress) {
        instrument_->TakeOutput();  // the reply is lost, as if never produced
        if (suppress && faults_.suppress > 0) --faults_.suppress;
    }
    return !drop;
}

bool Emulator::SendReply(int client, std::string reply) {
    std::chrono::milliseconds delay;
    bool garble = false;
    {
        std::lock_guard lock(mutex_);
        delay = faults_.delay;
        if (faults_.garble > 0) {
            --faults_.garble;
            garble = true;
        }
    }
    if (delay.count() > 0 && !SleepInterruptible(delay)) return false;
    if (garble) {
        // High-bit bytes never form a terminator, so the reply keeps its one line feed.
        for (std::size_t i = 0; i + 1 < reply.size(); ++i) {
            reply[i] = static_cast<char>((reply[i] ^ 0x5A) | 0x80);
        }
    }
    std::size_t sent = 0;
    while (sent < reply.size()) {
        const ssize_t n =
            ::send(client, reply.data() + sent, reply.size() - sent, MSG_NOSIGNAL | MSG_DONTWAIT);
        if (n > 0) {
            sent += static_cast<std::size_t>(n);
            continue;
        }
        if (n < 0 && errno != EAGAIN && errno != EWOULDBLOCK && errno != EINTR) return false;
        if (!WaitWritable(client)) return false;
    }
    return true;
}

bool Emulator::WaitWritable(int fd) {
    while (!stopping_) {
        pollfd fds[2] = {{fd, POLLOUT, 0}, {wake_[0], POLLIN, 0}};
        if (::poll(fds, 2, -1) < 0) {
            if (errno == EINTR) continue;
            return false;
        }
        if (fds[1].revents != 0) return false;
        if ((fds[0].revents & (POLLERR | POLLHUP)) != 0) return false;
        if ((fds[0].revents & POLLOUT) != 0) return true;
    }
    return false;
}

bool Emulator::SleepInterruptible(std::chrono::milliseconds duration) {
    pollfd fd{wake_[0], POLLIN, 0};
    return ::poll(&fd, 1, static_cast<int>(duration.count())) == 0;
}

void Emulator::LogLocked(const std::string& message) {
    received_.push_back(message);
    if (log_file_.is_open()) log_file_ << message << '\n' << std::flush;
}

void Emulator::SetLogFile(const std::string& path) {
    std::lock_guard lock(mutex_);
    log_file_.close();
    log_file_.open(path, std::ios::app | std::ios::binary);
    if (!log_file_) throw std::runtime_error("cannot open log file " + path);
}

std::vector<std::string> Emulator::ReceivedMessages() const {
    std::lock_guard lock(mutex_);
    return received_;
}

void Emulator::ClearReceivedMessages() {
    std::lock_guard lock(mutex_);
    received_.clear();
}

void Emulator::SetReplyDelay(std::chrono::milliseconds delay) {
    std::lock_guard lock(mutex_);
    faults_.delay = delay;
}

void Emulator::SuppressReplies(int count) {
    std::lock_guard lock(mutex_);
    faults_.suppress = count;
}

void Emulator::DropConnectionOnNextQuery() {
    std::lock_guard lock(mutex_);
    faults_.drop_on_query = true;
}

void Emulator::GarbleReplies(int count) {
    std::lock_guard lock(mutex_);
    faults_.garble = count;
}

void Emulator::ServeWaveformData(std::string raw_bytes) {
    std::lock_guard lock(mutex_);
    faults_.waveform_data = std::make_shared<const std::string>(std::move(raw_bytes));
}

void Emulator::ClearWaveformData() {
    std::lock_guard lock(mutex_);
    faults_.waveform_data.reset();
}

void Emulator::SetForcedEventStatusBits(std::uint8_t bits) {
    std::lock_guard lock(mutex_);
    faults_.forced_events = bits;
}

void Emulator::ClearFaults() {
    std::lock_guard lock(mutex_);
    faults_ = Faults{};
}

}  // namespace qn::emu

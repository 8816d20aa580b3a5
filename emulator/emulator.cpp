// The emulator's servers: listeners, one thread per connection, the shared instrument and the
// fault injection. The VXI-11 and portmapper protocols are in emulator_vxi11.cpp, HiSLIP in
// emulator_hislip.cpp.
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
#include "emulator/scpi_parser.h"

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


void Emulator::EnablePortmapper(std::uint16_t port) {
    portmapper_ = port;
}

void Emulator::SetIdleTimeout(std::chrono::milliseconds idle) {
    idle_ = idle;
}

int Emulator::Listen(std::uint16_t port, int type) {
    const int fd = ::socket(AF_INET, type | SOCK_CLOEXEC, 0);
    if (fd < 0) ThrowErrno("socket");
    const int one = 1;
    ::setsockopt(fd, SOL_SOCKET, SO_REUSEADDR, &one, sizeof one);
    sockaddr_in addr{};
    addr.sin_family = AF_INET;
    addr.sin_port = htons(port);
    addr.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    if (::bind(fd, reinterpret_cast<sockaddr*>(&addr), sizeof addr) != 0 ||
        (type == SOCK_STREAM && ::listen(fd, SOMAXCONN) != 0)) {
        const int saved = errno;
        ::close(fd);
        throw std::system_error(saved, std::generic_category(),
                                "bind/listen on 127.0.0.1:" + std::to_string(port));
    }
    return fd;
}

namespace {
std::uint16_t BoundPort(int fd) {
    sockaddr_in addr{};
    socklen_t len = sizeof addr;
    ::getsockname(fd, reinterpret_cast<sockaddr*>(&addr), &len);
    return ntohs(addr.sin_port);
}
}  // namespace

std::uint16_t Emulator::Start(std::uint16_t port) {
    if (acceptor_.joinable()) throw std::logic_error("emulator already started");
    if (portmapper_ && !vxi11_) throw std::logic_error("the portmapper needs the VXI-11 server");
    auto close_all = [this] {
        for (const Listener& l : listeners_) ::close(l.fd);
        listeners_.clear();
        if (portmapper_udp_ >= 0) ::close(portmapper_udp_);
        portmapper_udp_ = -1;
    };
    try {
        listeners_.push_back({Server::kRaw, Listen(port, SOCK_STREAM)});
        port_ = BoundPort(listeners_.back().fd);
        if (vxi11_) {
            listeners_.push_back({Server::kVxi11Core, Listen(0, SOCK_STREAM)});
            vxi11_port_ = BoundPort(listeners_.back().fd);
            listeners_.push_back({Server::kVxi11Abort, Listen(0, SOCK_STREAM)});
            abort_port_ = BoundPort(listeners_.back().fd);
        }
        if (hislip_sessions_) {
            listeners_.push_back({Server::kHislip, Listen(0, SOCK_STREAM)});
            hislip_port_ = BoundPort(listeners_.back().fd);
        }
        if (portmapper_) {
            listeners_.push_back({Server::kPortmapper, Listen(*portmapper_, SOCK_STREAM)});
            portmapper_port_ = BoundPort(listeners_.back().fd);
            portmapper_udp_ = Listen(portmapper_port_, SOCK_DGRAM);
        }
    } catch (...) {
        close_all();
        throw;
    }
    if (::pipe2(wake_, O_CLOEXEC | O_NONBLOCK) != 0) {
        close_all();
        ThrowErrno("pipe2");
    }
    stopping_ = false;
    acceptor_ = std::thread([this] { Accept(); });
    return port_;
}

void Emulator::Stop() {
    if (!acceptor_.joinable()) return;
    stopping_ = true;
    const char byte = 1;
    [[maybe_unused]] const auto written = ::write(wake_[1], &byte, 1);
    acceptor_.join();
    ReapWorkers(true);
    for (const Listener& l : listeners_) ::close(l.fd);
    listeners_.clear();
    if (portmapper_udp_ >= 0) ::close(portmapper_udp_);
    portmapper_udp_ = -1;
    for (int* fd : {&wake_[0], &wake_[1]}) {
        if (*fd >= 0) ::close(*fd);
        *fd = -1;
    }
}

void Emulator::Accept() {
    std::vector<pollfd> fds;
    for (const Listener& l : listeners_) fds.push_back({l.fd, POLLIN, 0});
    if (portmapper_udp_ >= 0) fds.push_back({portmapper_udp_, POLLIN, 0});
    fds.push_back({wake_[0], POLLIN, 0});
    while (!stopping_) {
        if (::poll(fds.data(), fds.size(), -1) < 0) {
            if (errno == EINTR) continue;
            return;
        }
        if (fds.back().revents != 0) return;
        ReapWorkers(false);
        for (std::size_t i = 0; i < listeners_.size(); ++i) {
            if (fds[i].revents == 0) continue;
            const int client = ::accept4(listeners_[i].fd, nullptr, nullptr, SOCK_CLOEXEC);
            if (client < 0) continue;
            const int one = 1;
            ::setsockopt(client, IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
            Spawn(listeners_[i].server, client);
        }
        if (portmapper_udp_ >= 0 && fds[listeners_.size()].revents != 0)
            AnswerPortmapperDatagram(portmapper_udp_);
    }
}

void Emulator::Spawn(Server server, int client) {
    auto done = std::make_shared<std::atomic<bool>>(false);
    std::lock_guard lock(workers_mutex_);
    workers_.push_back({std::thread([this, server, client, done] {
                            switch (server) {
                                case Server::kRaw: ServeRaw(client); break;
                                case Server::kVxi11Core: ServeVxi11(client, false); break;
                                case Server::kVxi11Abort: ServeVxi11(client, true); break;
                                case Server::kPortmapper: ServePortmapper(client); break;
                                case Server::kHislip: ServeHislip(client); break;
                            }
                            ::close(client);
                            *done = true;
                        }),
                        done});
}

void Emulator::ReapWorkers(bool all) {
    std::list<Worker> finished;
    {
        std::lock_guard lock(workers_mutex_);
        for (auto it = workers_.begin(); it != workers_.end();) {
            if (all || *it->done) {
                finished.splice(finished.end(), workers_, it++);
            } else {
                ++it;
            }
        }
    }
    for (Worker& w : finished) w.thread.join();
}

bool Emulator::WaitReadable(int fd, bool idle_limit) const {
    const int timeout = idle_limit && idle_.count() > 0 ? static_cast<int>(idle_.count()) : -1;
    while (!stopping_) {
        pollfd fds[2] = {{fd, POLLIN, 0}, {wake_[0], POLLIN, 0}};
        const int n = ::poll(fds, 2, timeout);
        if (n < 0 && errno == EINTR) continue;
        if (n <= 0 || fds[1].revents != 0) return false;  // failed, idle or stopping
        return true;
    }
    return false;
}

bool Emulator::WaitWritable(int fd) const {
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

bool Emulator::SendAll(int fd, std::string_view bytes) const {
    std::size_t sent = 0;
    while (sent < bytes.size()) {
        const ssize_t n =
            ::send(fd, bytes.data() + sent, bytes.size() - sent, MSG_NOSIGNAL | MSG_DONTWAIT);
        if (n > 0) {
            sent += static_cast<std::size_t>(n);
            continue;
        }
        if (n < 0 && errno != EAGAIN && errno != EWOULDBLOCK && errno != EINTR) return false;
        if (!WaitWritable(fd)) return false;
    }
    return true;
}

bool Emulator::SleepInterruptible(std::chrono::milliseconds duration) const {
    pollfd fd{wake_[0], POLLIN, 0};
    return ::poll(&fd, 1, static_cast<int>(duration.count())) == 0;
}

void Emulator::ServeRaw(int client) {
    MessageFramer framer;
    std::string chunk(kReadChunk, '\0');
    while (WaitReadable(client)) {
        const ssize_t n = ::recv(client, chunk.data(), chunk.size(), 0);
        if (n <= 0) return;  // closed by the client or failed
        framer.Append(std::string_view(chunk.data(), static_cast<std::size_t>(n)));
        std::shared_ptr<const std::string> reply;
        const bool keep = RunMessages(framer, &reply);
        if (reply && !reply->empty()) {
            const auto delay = reply_delay();
            if (delay.count() > 0 && !SleepInterruptible(delay)) return;
            if (!SendAll(client, *reply)) return;
        }
        if (!keep) return;
    }
}

bool Emulator::RunMessages(MessageFramer& framer, std::string* reply) {
    std::shared_ptr<const std::string> shared;
    const bool keep = RunMessages(framer, &shared);
    if (shared) *reply = *shared;
    return keep;
}

bool Emulator::RunMessages(MessageFramer& framer, std::shared_ptr<const std::string>* reply) {
    std::lock_guard lock(instrument_mutex_);
    // All messages that arrived together run before any reply is sent, so a query followed by
    // another message without reading its reply is interrupted (-410).
    bool keep = true;
    while (auto message = framer.Next()) {
        if (!HandleMessage(*message)) {
            keep = false;
            break;
        }
    }
    if (framer.TakeOverrun()) instrument_->Error(err::kInputBufferOverrun);
    if (instrument_->output_pending()) *reply = ProduceReply();
    return keep;
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

std::shared_ptr<const std::string> Emulator::ProduceReply() {
    std::shared_ptr<const std::string> shared = instrument_->TakeSharedOutput();
    bool garble = false;
    {
        std::lock_guard lock(mutex_);
        if (faults_.garble > 0) {
            --faults_.garble;
            garble = true;
        }
    }
    if (!garble) return shared;
    // Garbled in a copy (a prepared block stays as it is for the next query). High-bit bytes
    // never form a terminator, so the reply keeps its one line feed.
    std::string reply = *shared;
    for (std::size_t i = 0; i + 1 < reply.size(); ++i) {
        reply[i] = static_cast<char>((reply[i] ^ 0x5A) | 0x80);
    }
    return std::make_shared<const std::string>(std::move(reply));
}

void Emulator::DeviceClear() {
    std::lock_guard lock(instrument_mutex_);
    instrument_->TakeOutput();
}

std::uint8_t Emulator::StatusByte(bool reply_waiting) {
    std::lock_guard lock(instrument_mutex_);
    return instrument_->status().StatusByte(instrument_->message_available() || reply_waiting);
}

std::chrono::milliseconds Emulator::reply_delay() const {
    std::lock_guard lock(mutex_);
    return faults_.delay;
}

void Emulator::LogLocked(const std::string& message) {
    if (log_limit_ == 0) {
        ++log_dropped_;
    } else {
        while (received_.size() >= log_limit_) {
            received_.pop_front();
            ++log_dropped_;
        }
        received_.push_back(message);
    }
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
    return {received_.begin(), received_.end()};
}

void Emulator::ClearReceivedMessages() {
    std::lock_guard lock(mutex_);
    received_.clear();
}

void Emulator::SetLogLimit(std::size_t entries) {
    std::lock_guard lock(mutex_);
    log_limit_ = entries;
    while (received_.size() > log_limit_) {
        received_.pop_front();
        ++log_dropped_;
    }
}

std::uint64_t Emulator::DroppedLogEntries() const {
    std::lock_guard lock(mutex_);
    return log_dropped_;
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
    // Kept with its terminator, so that the reply is sent from this string as it is.
    raw_bytes += '\n';
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

void Emulator::OverrunIoTimeouts(bool on) {
    std::lock_guard lock(mutex_);
    faults_.overrun_io_timeouts = on;
}

bool Emulator::overruns_io_timeouts() const {
    std::lock_guard lock(mutex_);
    return faults_.overrun_io_timeouts;
}

void Emulator::ClearFaults() {
    std::lock_guard lock(mutex_);
    faults_ = Faults{};
}

}  // namespace qn::emu

// A scripted instrument on a loopback socket for the transport tests: a
// thread accepts one connection and plays the steps given before Start():
// expect exact bytes, send (whole or in chunks with pauses), pause, signal
// the test, drop the connection. Every wait is bounded, so a broken client
// fails the test instead of hanging it.
#pragma once

#include <arpa/inet.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <chrono>
#include <future>
#include <string>
#include <thread>
#include <vector>

namespace qn::visa::test {

// A listening loopback socket on a free port (stored in *port).
inline int ListenLoopback(std::uint16_t* port, int backlog = 4) {
    const int fd = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_in a{};
    a.sin_family = AF_INET;
    a.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    ::bind(fd, reinterpret_cast<sockaddr*>(&a), sizeof a);
    ::listen(fd, backlog);
    socklen_t len = sizeof a;
    ::getsockname(fd, reinterpret_cast<sockaddr*>(&a), &len);
    *port = ntohs(a.sin_port);
    return fd;
}

inline std::string SocketResource(std::uint16_t port) {
    return "TCPIP0::127.0.0.1::" + std::to_string(port) + "::SOCKET";
}

class LoopbackPeer {
  public:
    LoopbackPeer() { listen_fd_ = ListenLoopback(&port_); }
    ~LoopbackPeer() {
        if (thread_.joinable()) thread_.join();
        ::close(listen_fd_);
    }

    std::string Resource() const { return SocketResource(port_); }

    LoopbackPeer& Expect(std::string bytes) { return Add({Step::kExpect, std::move(bytes), 0, 0}); }
    // Sends data in pieces of chunk bytes (0: at once), pausing gap_ms between.
    LoopbackPeer& Send(std::string data, std::size_t chunk = 0, int gap_ms = 0) {
        return Add({Step::kSend, std::move(data), chunk, gap_ms});
    }
    LoopbackPeer& Pause(int ms) { return Add({Step::kPause, {}, 0, ms}); }
    // Fulfils the next of the futures handed out by Signal().
    LoopbackPeer& Notify() { return Add({Step::kNotify, {}, 0, 0}); }
    LoopbackPeer& Drop() { return Add({Step::kDrop, {}, 0, 0}); }

    std::future<void> Signal() {
        signals_.emplace_back();
        return signals_.back().get_future();
    }

    void Start() {
        thread_ = std::thread([this] { Run(); });
    }
    // Waits for the script's end; the failure text, empty when it all ran.
    std::string Finish() {
        if (thread_.joinable()) thread_.join();
        return failure_;
    }

  private:
    struct Step {
        enum Kind { kExpect, kSend, kPause, kNotify, kDrop } kind;
        std::string data;
        std::size_t chunk = 0;
        int ms = 0;
    };
    static constexpr int kWaitMs = 10000;

    LoopbackPeer& Add(Step s) {
        steps_.push_back(std::move(s));
        return *this;
    }

    bool ReadSome(int fd, std::string* into) {
        pollfd p{fd, POLLIN, 0};
        if (::poll(&p, 1, kWaitMs) <= 0) return false;
        char buf[4096];
        ssize_t n = ::recv(fd, buf, sizeof buf, 0);
        if (n <= 0) return false;
        into->append(buf, std::size_t(n));
        return true;
    }

    void Run() {
        pollfd p{listen_fd_, POLLIN, 0};
        if (::poll(&p, 1, kWaitMs) <= 0) {
            failure_ = "no client connected";
            return;
        }
        int fd = ::accept4(listen_fd_, nullptr, nullptr, SOCK_CLOEXEC);
        int one = 1;
        ::setsockopt(fd, IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
        std::string pending;
        std::size_t next_signal = 0;
        for (const Step& s : steps_) {
            if (!failure_.empty()) break;
            switch (s.kind) {
                case Step::kExpect:
                    while (pending.size() < s.data.size())
                        if (!ReadSome(fd, &pending)) break;
                    if (pending.compare(0, s.data.size(), s.data) != 0)
                        failure_ = "expected '" + s.data + "', got '" + pending + "'";
                    pending.erase(0, s.data.size());
                    break;
                case Step::kSend: {
                    std::size_t chunk = s.chunk ? s.chunk : s.data.size();
                    for (std::size_t off = 0; off < s.data.size(); off += chunk) {
                        if (off && s.ms)
                            std::this_thread::sleep_for(std::chrono::milliseconds(s.ms));
                        std::size_t n = std::min(chunk, s.data.size() - off);
                        if (::send(fd, s.data.data() + off, n, MSG_NOSIGNAL) != ssize_t(n)) break;
                    }
                    break;
                }
                case Step::kPause:
                    std::this_thread::sleep_for(std::chrono::milliseconds(s.ms));
                    break;
                case Step::kNotify:
                    if (next_signal < signals_.size()) signals_[next_signal++].set_value();
                    break;
                case Step::kDrop:
                    ::close(fd);
                    fd = -1;
                    break;
            }
        }
        for (; next_signal < signals_.size(); ++next_signal) signals_[next_signal].set_value();
        if (fd >= 0) {
            // Orderly end: wait for the client to close, so no reset loses data.
            ::shutdown(fd, SHUT_WR);
            std::string rest;
            while (ReadSome(fd, &rest)) {
            }
            ::close(fd);
        }
    }

    int listen_fd_ = -1;
    std::uint16_t port_ = 0;
    std::vector<Step> steps_;
    std::vector<std::promise<void>> signals_;
    std::thread thread_;
    std::string failure_;
};

}  // namespace qn::visa::test

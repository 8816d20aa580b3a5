// Loopback sockets for the benchmarks: a blocking client socket with
// TCP_NODELAY, whole sends and receives, the resource string of a socket
// server, and the bare line client a driver query is measured against.
#pragma once

#include <arpa/inet.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdint>
#include <string>
#include <string_view>

namespace qn::bench {

// A blocking loopback client socket; -1 when the connection failed.
inline int ConnectLoopback(std::uint16_t port) {
    const int fd = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_in a{};
    a.sin_family = AF_INET;
    a.sin_port = htons(port);
    a.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    int one = 1;
    ::setsockopt(fd, IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
    if (::connect(fd, reinterpret_cast<sockaddr*>(&a), sizeof a) != 0) {
        ::close(fd);
        return -1;
    }
    return fd;
}

// A listening loopback socket on a free port, stored in *port.
inline int ListenLoopback(std::uint16_t* port) {
    const int fd = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_in a{};
    a.sin_family = AF_INET;
    a.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    ::bind(fd, reinterpret_cast<sockaddr*>(&a), sizeof a);
    ::listen(fd, 16);
    socklen_t len = sizeof a;
    ::getsockname(fd, reinterpret_cast<sockaddr*>(&a), &len);
    *port = ntohs(a.sin_port);
    return fd;
}

inline bool SendAll(int fd, const char* p, std::size_t n) {
    while (n > 0) {
        const ssize_t r = ::send(fd, p, n, MSG_NOSIGNAL);
        if (r <= 0) return false;
        p += r;
        n -= std::size_t(r);
    }
    return true;
}

inline bool RecvAll(int fd, void* buf, std::size_t n) {
    auto* p = static_cast<char*>(buf);
    while (n > 0) {
        const ssize_t r = ::recv(fd, p, n, 0);
        if (r <= 0) return false;
        p += r;
        n -= std::size_t(r);
    }
    return true;
}

// Reads one reply line (up to and including "\n") from fd, a byte at a time
// so that nothing after the line is taken off the socket.
inline bool RecvLine(int fd, std::string* line) {
    line->clear();
    char c = 0;
    while (RecvAll(fd, &c, 1)) {
        line->push_back(c);
        if (c == '\n') return true;
    }
    return false;
}

inline std::string SocketResource(std::uint16_t port) {
    return "TCPIP0::127.0.0.1::" + std::to_string(port) + "::SOCKET";
}

// The least a client can do for a query: one send, replies received in
// chunks up to the line feed.
class LineClient {
  public:
    explicit LineClient(std::uint16_t port) : fd_(ConnectLoopback(port)) {}
    ~LineClient() {
        if (fd_ >= 0) ::close(fd_);
    }
    LineClient(const LineClient&) = delete;
    LineClient& operator=(const LineClient&) = delete;

    bool ok() const { return fd_ >= 0; }
    int fd() const { return fd_; }
    bool Send(std::string_view s) { return SendAll(fd_, s.data(), s.size()); }
    // The reply up to and including the line feed; false on end of stream.
    bool ReadLine(std::string* line) {
        line->clear();
        char buf[256];
        for (;;) {
            const ssize_t k = ::recv(fd_, buf, sizeof buf, 0);
            if (k <= 0) return false;
            line->append(buf, static_cast<std::size_t>(k));
            if (line->back() == '\n') return true;
        }
    }

  private:
    int fd_;
};

}  // namespace qn::bench

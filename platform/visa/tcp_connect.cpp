#include "platform/visa/tcp_connect.h"

#include <fcntl.h>
#include <netdb.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <condition_variable>
#include <cstring>
#include <memory>
#include <mutex>
#include <thread>

namespace qn::visa {
namespace {

struct AddrInfoFree {
    void operator()(addrinfo* p) const {
        if (p) freeaddrinfo(p);
    }
};
using AddrList = std::unique_ptr<addrinfo, AddrInfoFree>;

// Name resolution on a helper thread, so that a slow resolver cannot hold
// Open past its timeout. The thread owns its share of the state and ends on
// its own when the resolver returns.
struct ResolveState {
    std::mutex m;
    std::condition_variable cv;
    bool done = false;
    int rc = 0;
    AddrList list;
};

int Resolve(const std::string& host, std::uint16_t port, const Deadline& deadline, AddrList* out,
            std::string* error) {
    addrinfo hints{};
    hints.ai_family = AF_UNSPEC;
    hints.ai_socktype = SOCK_STREAM;
    hints.ai_flags = AI_NUMERICSERV | AI_NUMERICHOST;
    const std::string service = std::to_string(port);
    addrinfo* res = nullptr;
    if (getaddrinfo(host.c_str(), service.c_str(), &hints, &res) == 0) {
        out->reset(res);
        return 0;
    }
    auto st = std::make_shared<ResolveState>();
    hints.ai_flags = AI_NUMERICSERV | AI_ADDRCONFIG;
    std::thread([st, host, service, hints] {
        addrinfo* r = nullptr;
        int rc = getaddrinfo(host.c_str(), service.c_str(), &hints, &r);
        std::lock_guard<std::mutex> lock(st->m);
        st->rc = rc;
        st->list.reset(rc == 0 ? r : nullptr);
        st->done = true;
        st->cv.notify_all();
    }).detach();
    std::unique_lock<std::mutex> lock(st->m);
    for (;;) {
        if (st->done) break;
        if (deadline.infinite()) {
            st->cv.wait(lock);
        } else if (st->cv.wait_for(lock, std::chrono::milliseconds(deadline.PollMs())) ==
                       std::cv_status::timeout &&
                   deadline.Expired() && !st->done) {
            *error = "resolving host '" + host + "' timed out";
            return -1;
        }
    }
    if (st->rc != 0) {
        *error = "unknown host '" + host + "': " + gai_strerror(st->rc);
        return -1;
    }
    *out = std::move(st->list);
    return 0;
}


// Non-blocking connect to one address; 0 or an errno value (ETIMEDOUT when
// the deadline passed).
int ConnectOne(const addrinfo* a, const Deadline& deadline, FdHolder* fd) {
    fd->reset(
        ::socket(a->ai_family, a->ai_socktype | SOCK_NONBLOCK | SOCK_CLOEXEC, a->ai_protocol));
    if (fd->get() < 0) return errno;
    if (::connect(fd->get(), a->ai_addr, a->ai_addrlen) == 0) return 0;
    if (errno != EINPROGRESS) return errno;
    pollfd p{fd->get(), POLLOUT, 0};
    for (;;) {
        int n = ::poll(&p, 1, deadline.PollMs());
        if (n < 0 && errno == EINTR) continue;
        if (n < 0) return errno;
        if (n == 0) return ETIMEDOUT;
        break;
    }
    int err = 0;
    socklen_t len = sizeof err;
    if (::getsockopt(fd->get(), SOL_SOCKET, SO_ERROR, &err, &len) != 0) return errno;
    return err;
}

}  // namespace

std::string ErrnoText(int err) {
    return std::strerror(err);
}

void FdHolder::reset(int fd) {
    if (fd_ >= 0) ::close(fd_);
    fd_ = fd;
}

HRESULT ConnectTcp(const std::string& host, std::uint16_t port, const Deadline& deadline,
                   FdHolder* fd, std::string* error) {
    const std::string peer = host + ":" + std::to_string(port);
    AddrList list;
    if (Resolve(host, port, deadline, &list, error) != 0) return E_VISA_RESOURCE_NOT_FOUND;
    int err = ENOENT;
    for (const addrinfo* a = list.get(); a; a = a->ai_next) {
        err = ConnectOne(a, deadline, fd);
        if (err == 0) {
            int one = 1;
            ::setsockopt(fd->get(), IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
            return S_OK;
        }
        fd->reset();
        if (err == ETIMEDOUT) break;
    }
    *error = err == ETIMEDOUT ? "connecting to " + peer + " timed out"
                              : "cannot connect to " + peer + ": " + ErrnoText(err);
    return E_VISA_RESOURCE_NOT_FOUND;
}

HRESULT SendAll(int fd, const void* data, std::size_t size, const Deadline& deadline,
                const std::string& peer, std::size_t* sent, std::string* error) {
    *sent = 0;
    const char* p = static_cast<const char*>(data);
    while (*sent < size) {
        ssize_t r = ::send(fd, p + *sent, size - *sent, MSG_NOSIGNAL);
        if (r >= 0) {
            *sent += std::size_t(r);
            continue;
        }
        if (errno == EINTR) continue;
        if (errno == EPIPE || errno == ECONNRESET) {
            *error = "connection to " + peer + " lost while writing";
            return E_VISA_CONNECTION_LOST;
        }
        if (errno != EAGAIN && errno != EWOULDBLOCK) {
            *error = "send to " + peer + " failed: " + ErrnoText(errno);
            return E_VISA_IO;
        }
        pollfd pfd{fd, POLLOUT, 0};
        int k = ::poll(&pfd, 1, deadline.PollMs());
        if (k < 0 && errno != EINTR) {
            *error = "poll failed: " + ErrnoText(errno);
            return E_VISA_IO;
        }
        if (k == 0) {
            *error = "timeout writing to " + peer;
            return E_VISA_TIMEOUT;
        }
    }
    return S_OK;
}

HRESULT RecvSome(int fd, void* dst, std::size_t n, const Deadline& deadline,
                 const std::string& peer, std::size_t* got, std::string* error) {
    *got = 0;
    for (;;) {
        ssize_t r = ::recv(fd, dst, n, 0);
        if (r > 0) {
            *got = std::size_t(r);
            return S_OK;
        }
        if (r == 0) {
            *error = "connection closed by " + peer;
            return E_VISA_CONNECTION_LOST;
        }
        if (errno == EINTR) continue;
        if (errno == ECONNRESET) {
            *error = "connection reset by " + peer;
            return E_VISA_CONNECTION_LOST;
        }
        if (errno != EAGAIN && errno != EWOULDBLOCK) {
            *error = "receive from " + peer + " failed: " + ErrnoText(errno);
            return E_VISA_IO;
        }
        pollfd pfd{fd, POLLIN, 0};
        int k = ::poll(&pfd, 1, deadline.PollMs());
        if (k < 0 && errno != EINTR) {
            *error = "poll failed: " + ErrnoText(errno);
            return E_VISA_IO;
        }
        if (k == 0) {
            *error = "timeout reading from " + peer;
            return E_VISA_TIMEOUT;
        }
    }
}

}  // namespace qn::visa

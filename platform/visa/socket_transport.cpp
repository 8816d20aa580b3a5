// Raw TCP socket transport (TCPIP::host::port::SOCKET).
//
// The socket is non-blocking; every wait is a poll() bounded by the
// operation's deadline, so a timeout covers the whole operation. A raw socket
// has no END and no out-of-band device clear:
// - a read ends at the termination character (when enabled) or at the count;
//   a pause in the data is never taken as the end of a message;
// - Clear discards input received and not yet read and sends nothing (a
//   "*CLS" would clear the instrument's status registers, which a device
//   clear must not do);
// - the status byte is read with the "*STB?" common query.
// Every write first drops whatever input is waiting (a stray line, the late
// rest of a reply after a timeout), so that it is not taken for the answer to
// what is written now. A reply that arrives after that point cannot be told
// apart from the new one: the protocol has no message ids.
#include <fcntl.h>
#include <netdb.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <condition_variable>
#include <cstring>
#include <mutex>
#include <thread>
#include <vector>

#include "platform/visa/ieee488.h"
#include "platform/visa/resource_name.h"
#include "platform/visa/transport.h"

namespace qn::visa {
namespace {

constexpr std::size_t kBufferSize = 64 * 1024;
// Reads of at least this many bytes without a termination character go
// straight into the caller's memory.
constexpr std::size_t kDirectReadMin = 4096;
// DiscardInput stops after this much, should the peer never pause.
constexpr std::size_t kMaxDiscard = 256u * 1024 * 1024;

std::string ErrnoText(int err) {
    return std::strerror(err);
}

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

class FdHolder {
  public:
    explicit FdHolder(int fd = -1) : fd_(fd) {}
    FdHolder(const FdHolder&) = delete;
    FdHolder& operator=(const FdHolder&) = delete;
    ~FdHolder() { reset(); }
    int get() const { return fd_; }
    int release() { return std::exchange(fd_, -1); }
    void reset(int fd = -1) {
        if (fd_ >= 0) ::close(fd_);
        fd_ = fd;
    }

  private:
    int fd_;
};

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

class SocketTransport final : public Transport {
  public:
    SocketTransport(int fd, std::string peer)
        : fd_(fd), peer_(std::move(peer)), buf_(kBufferSize) {}
    ~SocketTransport() override { Close(); }

    HRESULT Read(const ReadRequest& req, const Deadline& deadline, ReadResult* result,
                 std::string* error) override;
    HRESULT Write(const BYTE* data, std::size_t size, bool send_end, const Deadline& deadline,
                  std::size_t* written, std::string* error) override;
    HRESULT Clear(const Deadline&, std::string*) override {
        DiscardInput();
        return S_OK;
    }
    HRESULT ReadStatusByte(const Deadline& deadline, BYTE* stb, std::string* error) override;
    void DiscardInput() override;
    void Close() override { fd_.reset(); }

  private:
    // Copies buffered bytes into the request; true when that ends the read.
    bool TakeBuffered(const ReadRequest& req, ReadResult* r);
    // Receives at least one byte into dst (at most n); waits until deadline.
    HRESULT RecvSome(BYTE* dst, std::size_t n, const Deadline& deadline, std::size_t* got,
                     std::string* error);

    FdHolder fd_;
    std::string peer_;  // "host:port", for messages
    std::vector<BYTE> buf_;
    std::size_t head_ = 0, tail_ = 0;  // unread bytes are buf_[head_, tail_)
    bool drained_ = false;             // the last receive emptied the socket's queue
};

bool SocketTransport::TakeBuffered(const ReadRequest& req, ReadResult* r) {
    std::size_t n = std::min(tail_ - head_, req.count - r->bytes);
    bool term = false;
    if (req.term_char_enabled && n) {
        const void* hit = std::memchr(&buf_[head_], req.term_char, n);
        if (hit) {
            n = std::size_t(static_cast<const BYTE*>(hit) - &buf_[head_]) + 1;
            term = true;
        }
    }
    if (n) std::memcpy(req.buf + r->bytes, &buf_[head_], n);
    head_ += n;
    r->bytes += n;
    if (head_ == tail_) head_ = tail_ = 0;
    if (term) r->end = kReadEndTermChar;
    return term || r->bytes == req.count;
}

HRESULT SocketTransport::RecvSome(BYTE* dst, std::size_t n, const Deadline& deadline,
                                  std::size_t* got, std::string* error) {
    // A short receive left the queue empty: wait first instead of asking again.
    bool wait_first = drained_;
    for (;;) {
        ssize_t r = wait_first ? -1 : ::recv(fd_.get(), dst, n, 0);
        if (wait_first) errno = EAGAIN;
        wait_first = false;
        if (r > 0) {
            *got = std::size_t(r);
            drained_ = std::size_t(r) < n;
            return S_OK;
        }
        if (r == 0) {
            *error = "connection closed by " + peer_;
            return E_VISA_CONNECTION_LOST;
        }
        if (errno == EINTR) continue;
        if (errno == ECONNRESET) {
            *error = "connection reset by " + peer_;
            return E_VISA_CONNECTION_LOST;
        }
        if (errno != EAGAIN && errno != EWOULDBLOCK) {
            *error = "receive from " + peer_ + " failed: " + ErrnoText(errno);
            return E_VISA_IO;
        }
        pollfd p{fd_.get(), POLLIN, 0};
        int k = ::poll(&p, 1, deadline.PollMs());
        if (k < 0 && errno != EINTR) {
            *error = "poll failed: " + ErrnoText(errno);
            return E_VISA_IO;
        }
        if (k == 0) {
            *error = "timeout reading from " + peer_;
            return E_VISA_TIMEOUT;
        }
    }
}

HRESULT SocketTransport::Read(const ReadRequest& req, const Deadline& deadline, ReadResult* result,
                              std::string* error) {
    *result = ReadResult{};
    if (fd_.get() < 0) {
        *error = "session closed";
        return E_VISA_INVALID_OBJECT;
    }
    if (req.count == 0) return S_OK;
    for (;;) {
        if (TakeBuffered(req, result)) return S_OK;
        // The buffer is empty here.
        if (req.return_available && result->bytes > 0) {
            ssize_t r = ::recv(fd_.get(), buf_.data(), buf_.size(), MSG_DONTWAIT);
            if (r <= 0) {  // nothing waiting (a close shows on the next read)
                result->end = kReadEndAvailable;
                return S_OK;
            }
            tail_ = std::size_t(r);
            continue;
        }
        const std::size_t want = req.count - result->bytes;
        std::size_t got = 0;
        HRESULT hr;
        if (!req.term_char_enabled && !req.return_available && want >= kDirectReadMin) {
            hr = RecvSome(req.buf + result->bytes, want, deadline, &got, error);
            result->bytes += got;
        } else {
            hr = RecvSome(buf_.data(), buf_.size(), deadline, &got, error);
            tail_ = got;
        }
        if (FAILED(hr)) return hr;
        if (result->bytes == req.count) return S_OK;
    }
}

HRESULT SocketTransport::Write(const BYTE* data, std::size_t size, bool /*send_end*/,
                               const Deadline& deadline, std::size_t* written, std::string* error) {
    *written = 0;
    if (fd_.get() < 0) {
        *error = "session closed";
        return E_VISA_INVALID_OBJECT;
    }
    // Whatever arrived unasked (a stray line, the late rest of an earlier
    // reply) must not pass for the reply to what is written now.
    DiscardInput();
    while (*written < size) {
        ssize_t r = ::send(fd_.get(), data + *written, size - *written, MSG_NOSIGNAL);
        if (r >= 0) {
            *written += std::size_t(r);
            continue;
        }
        if (errno == EINTR) continue;
        if (errno == EPIPE || errno == ECONNRESET) {
            *error = "connection to " + peer_ + " lost while writing";
            return E_VISA_CONNECTION_LOST;
        }
        if (errno != EAGAIN && errno != EWOULDBLOCK) {
            *error = "send to " + peer_ + " failed: " + ErrnoText(errno);
            return E_VISA_IO;
        }
        pollfd p{fd_.get(), POLLOUT, 0};
        int k = ::poll(&p, 1, deadline.PollMs());
        if (k < 0 && errno != EINTR) {
            *error = "poll failed: " + ErrnoText(errno);
            return E_VISA_IO;
        }
        if (k == 0) {
            *error = "timeout writing to " + peer_;
            return E_VISA_TIMEOUT;
        }
    }
    return S_OK;
}

void SocketTransport::DiscardInput() {
    head_ = tail_ = 0;
    if (fd_.get() < 0) return;
    for (std::size_t dropped = 0; dropped < kMaxDiscard;) {
        ssize_t r = ::recv(fd_.get(), buf_.data(), buf_.size(), MSG_DONTWAIT);
        if (r < 0 && errno == EINTR) continue;
        if (r <= 0) break;
        dropped += std::size_t(r);
    }
}

HRESULT SocketTransport::ReadStatusByte(const Deadline& deadline, BYTE* stb, std::string* error) {
    static constexpr char kQuery[] = "*STB?\n";
    std::size_t written = 0;
    HRESULT hr = Write(reinterpret_cast<const BYTE*>(kQuery), sizeof kQuery - 1, true, deadline,
                       &written, error);
    if (FAILED(hr)) return hr;
    BYTE reply[64];
    ReadRequest req{reply, sizeof reply, true, '\n', false};
    ReadResult r;
    hr = Read(req, deadline, &r, error);
    if (FAILED(hr)) return hr;
    std::string_view text(reinterpret_cast<const char*>(reply), r.bytes);
    while (!text.empty() && (text.front() == ' ' || text.front() == '\t')) text.remove_prefix(1);
    double v = 0;
    std::size_t used = 0;
    if (r.end != kReadEndTermChar || ParseNumber(text, true, &v, &used) != NumberParse::kOk ||
        !(v >= 0 && v <= 255)) {
        *error = "unreadable status byte reply '" + std::string(text.substr(0, 32)) + "'";
        return E_VISA_INVALID_FORMAT;
    }
    *stb = BYTE(v);
    return S_OK;
}

}  // namespace

HRESULT OpenSocketTransport(const ResourceName& name, LONG open_timeout_ms,
                            std::unique_ptr<Transport>* out, std::string* error) {
    const Deadline deadline = Deadline::FromTimeout(open_timeout_ms);
    const std::string peer = name.host + ":" + std::to_string(name.port);
    AddrList list;
    if (Resolve(name.host, name.port, deadline, &list, error) != 0)
        return E_VISA_RESOURCE_NOT_FOUND;
    int err = ENOENT;
    for (const addrinfo* a = list.get(); a; a = a->ai_next) {
        FdHolder fd;
        err = ConnectOne(a, deadline, &fd);
        if (err == 0) {
            int one = 1;
            ::setsockopt(fd.get(), IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
            *out = std::make_unique<SocketTransport>(fd.release(), peer);
            return S_OK;
        }
        if (err == ETIMEDOUT) break;
    }
    *error = err == ETIMEDOUT ? "connecting to " + peer + " timed out"
                              : "cannot connect to " + peer + ": " + ErrnoText(err);
    return E_VISA_RESOURCE_NOT_FOUND;
}

}  // namespace qn::visa

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
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <vector>

#include "platform/visa/ieee488.h"
#include "platform/visa/resource_name.h"
#include "platform/visa/tcp_connect.h"
#include "platform/visa/transport.h"

namespace qn::visa {
namespace {

constexpr std::size_t kBufferSize = 64 * 1024;
// Reads of at least this many bytes without a termination character go
// straight into the caller's memory.
constexpr std::size_t kDirectReadMin = 4096;
// DiscardInput stops after this much, should the peer never pause.
constexpr std::size_t kMaxDiscard = 256u * 1024 * 1024;

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
    return SendAll(fd_.get(), data, size, deadline, peer_, written, error);
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
    FdHolder fd;
    HRESULT hr =
        ConnectTcp(name.host, name.port, Deadline::FromTimeout(open_timeout_ms), &fd, error);
    if (FAILED(hr)) return hr;
    *out = std::make_unique<SocketTransport>(fd.release(),
                                             name.host + ":" + std::to_string(name.port));
    return S_OK;
}

}  // namespace qn::visa

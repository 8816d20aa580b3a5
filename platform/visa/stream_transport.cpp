#include "platform/visa/stream_transport.h"

#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

#include "platform/visa/ieee488.h"

namespace qn::visa {
namespace {

constexpr std::size_t kBufferSize = 64 * 1024;
// Reads of at least this many bytes without a termination character go
// straight into the caller's memory.
constexpr std::size_t kDirectReadMin = 4096;
// DiscardInput stops after this much, should the peer never pause.
constexpr std::size_t kMaxDiscard = 256u * 1024 * 1024;

// Errors after which the other end is gone: a reset connection, a serial
// adapter unplugged or a pseudo-terminal whose other side closed.
bool PeerGone(int err) {
    return err == ECONNRESET || err == EPIPE || err == EIO || err == ENODEV || err == ENXIO;
}

HRESULT WaitFor(int fd, short events, const Deadline& deadline, const std::string& what,
                std::string* error) {
    pollfd p{fd, events, 0};
    int k = ::poll(&p, 1, deadline.PollMs());
    if (k < 0 && errno != EINTR) {
        *error = "poll failed: " + ErrnoText(errno);
        return E_VISA_IO;
    }
    if (k == 0) {
        *error = "timeout " + what;
        return E_VISA_TIMEOUT;
    }
    return S_OK;
}

}  // namespace

StreamTransport::StreamTransport(int fd, Kind kind, std::string peer)
    : fd_(fd), kind_(kind), peer_(std::move(peer)), buf_(kBufferSize) {}

ssize_t StreamTransport::ReadNow(BYTE* dst, std::size_t n) {
    return ::read(fd_.get(), dst, n);
}

ssize_t StreamTransport::WriteNow(const BYTE* src, std::size_t n) {
    return kind_ == Kind::kSocket ? ::send(fd_.get(), src, n, MSG_NOSIGNAL)
                                  : ::write(fd_.get(), src, n);
}

bool StreamTransport::TakeBuffered(const ReadRequest& req, ReadResult* r) {
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

HRESULT StreamTransport::ReceiveSome(BYTE* dst, std::size_t n, const Deadline& deadline,
                                     std::size_t* got, std::string* error) {
    // A short receive left the queue empty: wait first instead of asking again.
    bool wait_first = drained_;
    for (;;) {
        ssize_t r = wait_first ? -1 : ReadNow(dst, n);
        if (wait_first) errno = EAGAIN;
        wait_first = false;
        if (r > 0) {
            *got = std::size_t(r);
            drained_ = std::size_t(r) < n;
            return S_OK;
        }
        if (r == 0) {
            *error = (kind_ == Kind::kSocket ? "connection closed by " : "line hung up: ") + peer_;
            return E_VISA_CONNECTION_LOST;
        }
        if (errno == EINTR) continue;
        if (PeerGone(errno)) {
            *error = peer_ + " is gone: " + ErrnoText(errno);
            return E_VISA_CONNECTION_LOST;
        }
        if (errno != EAGAIN && errno != EWOULDBLOCK) {
            *error = "receive from " + peer_ + " failed: " + ErrnoText(errno);
            return E_VISA_IO;
        }
        HRESULT hr = WaitFor(fd_.get(), POLLIN, deadline, "reading from " + peer_, error);
        if (FAILED(hr)) return hr;
    }
}

HRESULT StreamTransport::Read(const ReadRequest& req, const Deadline& deadline, ReadResult* result,
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
            ssize_t r = ReadNow(buf_.data(), buf_.size());
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
            hr = ReceiveSome(req.buf + result->bytes, want, deadline, &got, error);
            result->bytes += got;
        } else {
            hr = ReceiveSome(buf_.data(), buf_.size(), deadline, &got, error);
            tail_ = got;
        }
        if (FAILED(hr)) return hr;
        if (result->bytes == req.count) return S_OK;
    }
}

HRESULT StreamTransport::SendAllBy(const BYTE* data, std::size_t size, const Deadline& deadline,
                                   std::size_t* sent, std::string* error) {
    while (*sent < size) {
        ssize_t r = WriteNow(data + *sent, size - *sent);
        if (r >= 0) {
            *sent += std::size_t(r);
            continue;
        }
        if (errno == EINTR) continue;
        if (PeerGone(errno)) {
            *error = peer_ + " is gone while writing: " + ErrnoText(errno);
            return E_VISA_CONNECTION_LOST;
        }
        if (errno != EAGAIN && errno != EWOULDBLOCK) {
            *error = "write to " + peer_ + " failed: " + ErrnoText(errno);
            return E_VISA_IO;
        }
        HRESULT hr = WaitFor(fd_.get(), POLLOUT, deadline, "writing to " + peer_, error);
        if (FAILED(hr)) return hr;
    }
    return S_OK;
}

HRESULT StreamTransport::Write(const BYTE* data, std::size_t size, bool /*send_end*/,
                               const Deadline& deadline, std::size_t* written, std::string* error) {
    *written = 0;
    if (fd_.get() < 0) {
        *error = "session closed";
        return E_VISA_INVALID_OBJECT;
    }
    // Whatever arrived unasked (a stray line, the late rest of an earlier
    // reply) must not pass for the reply to what is written now.
    DiscardInput();
    return SendAllBy(data, size, deadline, written, error);
}

void StreamTransport::DiscardInput() {
    head_ = tail_ = 0;
    if (fd_.get() < 0) return;
    for (std::size_t dropped = 0; dropped < kMaxDiscard;) {
        ssize_t r = ReadNow(buf_.data(), buf_.size());
        if (r < 0 && errno == EINTR) continue;
        if (r <= 0) break;
        dropped += std::size_t(r);
    }
}

HRESULT StreamTransport::ReadStatusByte(const Deadline& deadline, BYTE* stb, std::string* error) {
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

HRESULT StreamTransport::Trigger(const Deadline& deadline, std::string* error) {
    static constexpr char kCommand[] = "*TRG\n";
    std::size_t written = 0;
    return Write(reinterpret_cast<const BYTE*>(kCommand), sizeof kCommand - 1, true, deadline,
                 &written, error);
}

}  // namespace qn::visa

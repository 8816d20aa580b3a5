// HiSLIP transport (TCPIP[n]::host::hislip[n][,port]::INSTR, port 4880 by
// default): a synchronous channel for the messages and their replies, an
// asynchronous one for device clear and the status byte.
//
// - Open connects the synchronous channel (Initialize, which gives the
//   session id), then the asynchronous one (AsyncInitialize with that id),
//   and exchanges the largest message sizes both ends accept.
// - A write is sent as Data messages of at most the server's size, the last
//   one DataEnd when END is to be sent. Every message carries the next
//   message id (growing by 2 from 0xFFFFFF00); replies carry the id of the
//   DataEnd they answer, so a reply to an earlier message (the late reply of
//   a query that timed out, the unread rest of one) is dropped, never taken
//   for the reply to the latest.
// - A read ends at the end of a DataEnd payload (END), at the termination
//   character when it is enabled, or at the count; the rest of a message
//   stays for the next read until the next write.
// - Every wait is bounded by the operation's one deadline. A message whose
//   header does not start with "HS" or whose payload is larger than this
//   client accepts breaks the stream: the connection is closed and later
//   calls fail with E_VISA_CONNECTION_LOST. An Error message from the server
//   fails the operation and leaves the session usable; a FatalError closes it.
// - Payloads are never held whole: data goes straight into the caller's
//   memory (through a small buffer when a termination character is looked
//   for), and the text of an Error message is kept up to a small bound.
// - A trigger is the Trigger message with the next message id; the
//   exclusive lock is asked for and given back on the asynchronous channel.
#include <poll.h>
#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <cstring>
#include <vector>

#include "platform/visa/hislip_protocol.h"
#include "platform/visa/resource_name.h"
#include "platform/visa/tcp_connect.h"
#include "platform/visa/transport.h"

namespace qn::visa {
namespace {

using namespace qn::hislip;

// The largest payload this client accepts (told to the server), and the
// largest piece a write is split into whatever the server accepts.
constexpr std::uint64_t kMaxPayload = 8u << 20;
constexpr std::uint64_t kMaxWritePiece = 8u << 20;
// Text kept of an Error or FatalError message, and the bound of the
// payload of any message that is not data.
constexpr std::size_t kMaxErrorText = 1024;
constexpr std::size_t kBufferSize = 64 * 1024;
// Payload reads of at least this many bytes without a termination character
// go straight into the caller's memory.
constexpr std::size_t kDirectReadMin = 4096;
// Two ASCII characters naming the client's maker, in the Initialize parameter.
constexpr std::uint16_t kVendorId = ('Q' << 8) | 'N';

// One TCP channel: headers through a buffer, payloads read in place, the
// payload still unread of the current message kept across calls (so a
// timeout in the middle of a message never puts the stream out of step).
class Channel {
  public:
    Channel(std::string peer, const char* name) : peer_(std::move(peer)), name_(name) {}

    void Attach(int fd) {
        fd_.reset(fd);
        buf_.assign(kBufferSize, 0);
        head_ = tail_ = 0;
        left_ = 0;
    }
    bool open() const { return fd_.get() >= 0; }
    void Close() { fd_.reset(); }
    std::uint64_t left() const { return left_; }
    bool Buffered() const { return tail_ > head_; }
    // True when the socket has input waiting now.
    bool Readable() const {
        pollfd p{fd_.get(), POLLIN, 0};
        return ::poll(&p, 1, 0) > 0;
    }
    const std::string& peer() const { return peer_; }

    HRESULT Send(std::uint8_t type, std::uint8_t control, std::uint32_t parameter,
                 const BYTE* payload, std::size_t size, const Deadline& deadline,
                 std::string* error) {
        if (!open()) return Lost(error);
        std::uint8_t header[kHeaderSize];
        EncodeHeader({type, control, parameter, size}, header);
        std::size_t sent = 0;
        HRESULT hr;
        if (size <= kBufferSize) {
            out_.assign(header, header + kHeaderSize);
            out_.insert(out_.end(), payload, payload + size);
            hr = SendAll(fd_.get(), out_.data(), out_.size(), deadline, peer_, &sent, error);
            if (FAILED(hr) && sent > 0) Close();  // a message cut short ends the stream
            return hr;
        }
        hr = SendAll(fd_.get(), header, kHeaderSize, deadline, peer_, &sent, error);
        if (SUCCEEDED(hr)) {
            sent = 0;
            hr = SendAll(fd_.get(), payload, size, deadline, peer_, &sent, error);
            if (FAILED(hr)) Close();
        } else if (sent > 0) {
            Close();
        }
        return hr;
    }
    HRESULT Send(std::uint8_t type, std::uint8_t control, std::uint32_t parameter,
                 std::string_view payload, const Deadline& deadline, std::string* error) {
        return Send(type, control, parameter, reinterpret_cast<const BYTE*>(payload.data()),
                    payload.size(), deadline, error);
    }

    // The next message's header; what is left of the current message's
    // payload is skipped first. A header without the prologue closes the
    // channel (after telling the peer) with E_VISA_IO.
    HRESULT NextHeader(const Deadline& deadline, Header* h, std::string* error) {
        HRESULT hr = Skip(deadline, error);
        if (FAILED(hr)) return hr;
        while (tail_ - head_ < kHeaderSize) {
            hr = Fill(deadline, error);
            if (FAILED(hr)) return hr;
        }
        if (!DecodeHeader(&buf_[head_], h)) {
            *error = "message without the HiSLIP prologue on the " + std::string(name_) +
                     " channel of " + peer_;
            Fatal(kFatalBadHeader, deadline);
            return E_VISA_IO;
        }
        head_ += kHeaderSize;
        left_ = h->length;
        return S_OK;
    }

    // Up to n bytes of the current payload into dst; with term >= 0 the copy
    // stops after that byte (*term_hit).
    HRESULT ReadPayload(BYTE* dst, std::size_t n, int term, const Deadline& deadline,
                        std::size_t* got, bool* term_hit, std::string* error) {
        *got = 0;
        *term_hit = false;
        const std::size_t want = std::size_t(std::min<std::uint64_t>(n, left_));
        if (want == 0) return S_OK;
        if (!Buffered()) {
            if (term < 0 && want >= kDirectReadMin) {
                HRESULT hr = RecvSome(fd_.get(), dst, want, deadline, peer_, got, error);
                if (FAILED(hr)) return Failed(hr);
                left_ -= *got;
                return S_OK;
            }
            HRESULT hr = Fill(deadline, error);
            if (FAILED(hr)) return hr;
        }
        std::size_t take = std::min(want, tail_ - head_);
        if (term >= 0) {
            const void* hit = std::memchr(&buf_[head_], term, take);
            if (hit) {
                take = std::size_t(static_cast<const BYTE*>(hit) - &buf_[head_]) + 1;
                *term_hit = true;
            }
        }
        std::memcpy(dst, &buf_[head_], take);
        head_ += take;
        left_ -= take;
        *got = take;
        return S_OK;
    }

    // The whole payload of a message that is not data, at most `bound` bytes
    // of it kept (the rest skipped).
    HRESULT ReadSmall(std::size_t bound, const Deadline& deadline, std::string* out,
                      std::string* error) {
        out->clear();
        while (left_ > 0 && out->size() < bound) {
            BYTE piece[256];
            std::size_t got = 0;
            bool hit = false;
            HRESULT hr = ReadPayload(piece, std::min(sizeof piece, bound - out->size()), -1,
                                     deadline, &got, &hit, error);
            if (FAILED(hr)) return hr;
            out->append(reinterpret_cast<const char*>(piece), got);
        }
        return Skip(deadline, error);
    }

    // Skips what is left of the current payload.
    HRESULT Skip(const Deadline& deadline, std::string* error) {
        while (left_ > 0) {
            if (!Buffered()) {
                HRESULT hr = Fill(deadline, error);
                if (FAILED(hr)) return hr;
            }
            const std::size_t take = std::size_t(std::min<std::uint64_t>(left_, tail_ - head_));
            head_ += take;
            left_ -= take;
        }
        return S_OK;
    }

    // Tells the peer why the connection ends, then closes it.
    void Fatal(std::uint8_t code, const Deadline& deadline) {
        std::string ignored;
        const std::string_view text = FatalCodeText(code);
        const int ms = deadline.PollMs();
        Send(kFatalError, code, 0, text, Deadline::FromTimeout(ms < 0 || ms > 100 ? 100 : ms),
             &ignored);
        Close();
    }

    HRESULT Lost(std::string* error) const {
        *error = "HiSLIP connection to " + peer_ + " is closed";
        return E_VISA_CONNECTION_LOST;
    }

  private:
    HRESULT Fill(const Deadline& deadline, std::string* error) {
        if (!open()) return Lost(error);
        if (head_ == tail_) head_ = tail_ = 0;
        if (tail_ == buf_.size()) {
            std::memmove(buf_.data(), &buf_[head_], tail_ - head_);
            tail_ -= head_;
            head_ = 0;
        }
        std::size_t got = 0;
        HRESULT hr =
            RecvSome(fd_.get(), &buf_[tail_], buf_.size() - tail_, deadline, peer_, &got, error);
        if (FAILED(hr)) return Failed(hr);
        tail_ += got;
        return S_OK;
    }
    // A closed or failed connection stays closed; a timeout keeps it.
    HRESULT Failed(HRESULT hr) {
        if (hr != E_VISA_TIMEOUT) Close();
        return hr;
    }

    FdHolder fd_;
    std::string peer_;
    const char* name_;
    std::vector<BYTE> buf_;
    std::vector<BYTE> out_;
    std::size_t head_ = 0, tail_ = 0;  // unread bytes are buf_[head_, tail_)
    std::uint64_t left_ = 0;           // payload of the current message not yet taken
};

class HislipTransport final : public Transport {
  public:
    explicit HislipTransport(const std::string& peer, const std::string& async_peer)
        : sync_(peer, "synchronous"), async_(async_peer, "asynchronous") {}
    ~HislipTransport() override { Close(); }

    HRESULT Open(const std::string& host, std::uint16_t port, const std::string& sub_address,
                 const Deadline& deadline, std::string* error);

    HRESULT Read(const ReadRequest& req, const Deadline& deadline, ReadResult* result,
                 std::string* error) override;
    HRESULT Write(const BYTE* data, std::size_t size, bool send_end, const Deadline& deadline,
                  std::size_t* written, std::string* error) override;
    HRESULT Clear(const Deadline& deadline, std::string* error) override;
    HRESULT ReadStatusByte(const Deadline& deadline, BYTE* stb, std::string* error) override;
    HRESULT Trigger(const Deadline& deadline, std::string* error) override;
    HRESULT Lock(LONG lock_timeout_ms, const Deadline& deadline, std::string* error) override;
    HRESULT Unlock(const Deadline& deadline, std::string* error) override;
    // The rest of the message being read is skipped before the next one.
    void DiscardInput() override { in_data_ = false; }
    void Close() override {
        sync_.Close();
        async_.Close();
    }
    bool HasEnd() const override { return true; }

  private:
    // The next Data or DataEnd message of the reply awaited, after dropping
    // stale replies, Interrupted and late clear acknowledgements.
    HRESULT NextReply(const Deadline& deadline, Header* h, std::string* error);
    // The next message of type `want` on the asynchronous channel (late
    // responses of timed-out requests dropped).
    HRESULT NextAsync(std::uint8_t want, const Deadline& deadline, Header* h, std::string* error);
    // Error and FatalError messages, and anything else unexpected, as a
    // failure of the operation.
    HRESULT Unexpected(Channel& ch, const Header& h, const Deadline& deadline, std::string* error);
    HRESULT CheckPayload(Channel& ch, const Header& h, std::uint64_t bound,
                         const Deadline& deadline, std::string* error);

    Channel sync_, async_;
    std::uint32_t next_id_ = kFirstMessageId;
    std::uint32_t awaited_id_ = 0;  // id of the last DataEnd sent
    bool awaiting_ = false;         // a DataEnd was sent since the session began or was cleared
    bool in_data_ = false;          // a reply message is being read
    bool data_end_ = false;         // ... and it is a DataEnd
    bool rmt_delivered_ = false;    // a whole reply was read since the last message sent
    std::uint64_t server_max_ = kMaxWritePiece;
    std::array<std::uint8_t, 256> owed_{};  // async responses still due to timed-out requests
};

HRESULT HislipTransport::CheckPayload(Channel& ch, const Header& h, std::uint64_t bound,
                                      const Deadline& deadline, std::string* error) {
    if (h.length <= bound) return S_OK;
    *error = MessageTypeName(h.type) + " message of " + std::to_string(h.length) + " bytes from " +
             ch.peer() + " exceeds the " + std::to_string(bound) + " bytes accepted";
    ch.Fatal(kFatalUnidentified, deadline);
    return E_VISA_IO;
}

HRESULT HislipTransport::Unexpected(Channel& ch, const Header& h, const Deadline& deadline,
                                    std::string* error) {
    HRESULT hr = CheckPayload(ch, h, kMaxPayload, deadline, error);
    if (FAILED(hr)) return hr;
    if (h.type != kError && h.type != kFatalError) {
        hr = ch.Skip(deadline, error);
        if (FAILED(hr)) return hr;
        *error = "unexpected " + MessageTypeName(h.type) + " message from " + ch.peer();
        return E_VISA_IO;
    }
    std::string text;
    hr = ch.ReadSmall(kMaxErrorText, deadline, &text, error);
    if (FAILED(hr)) return hr;
    for (char& c : text)
        if (static_cast<unsigned char>(c) < 0x20) c = ' ';
    const bool fatal = h.type == kFatalError;
    *error = std::string(fatal ? "fatal error" : "error") + " from " + ch.peer() + ": " +
             (fatal ? FatalCodeText(h.control) : ErrorCodeText(h.control)) +
             (text.empty() ? "" : " (" + text + ")");
    if (fatal) Close();
    return E_VISA_IO;
}

HRESULT HislipTransport::NextReply(const Deadline& deadline, Header* h, std::string* error) {
    for (bool first = true;; first = false) {
        if (!first && deadline.Expired()) {
            *error = "timeout reading from " + sync_.peer();
            return E_VISA_TIMEOUT;
        }
        HRESULT hr = sync_.NextHeader(deadline, h, error);
        if (FAILED(hr)) return hr;
        switch (h->type) {
            case kData:
            case kDataEnd:
                hr = CheckPayload(sync_, *h, kMaxPayload, deadline, error);
                if (FAILED(hr)) return hr;
                if (!awaiting_ || h->parameter == awaited_id_) return S_OK;
                continue;  // the reply to an earlier message: skipped with the next header
            case kInterrupted:
            case kDeviceClearAcknowledge:
                hr = CheckPayload(sync_, *h, kMaxErrorText, deadline, error);
                if (FAILED(hr)) return hr;
                continue;
            default:
                return Unexpected(sync_, *h, deadline, error);
        }
    }
}

HRESULT HislipTransport::NextAsync(std::uint8_t want, const Deadline& deadline, Header* h,
                                   std::string* error) {
    for (;;) {
        HRESULT hr = async_.NextHeader(deadline, h, error);
        if (FAILED(hr)) {
            if (hr == E_VISA_TIMEOUT && owed_[want] < 255) ++owed_[want];
            return hr;
        }
        const bool response =
            h->type == kAsyncStatusResponse || h->type == kAsyncDeviceClearAcknowledge ||
            h->type == kAsyncMaximumMessageSizeResponse || h->type == kAsyncLockResponse ||
            h->type == kAsyncLockInfoResponse || h->type == kAsyncRemoteLocalResponse;
        if (response || h->type == kAsyncServiceRequest || h->type == kAsyncInterrupted) {
            hr = CheckPayload(async_, *h, kMaxErrorText, deadline, error);
            if (FAILED(hr)) return hr;
            if (h->type == want && owed_[want] == 0) return S_OK;
            if (response && owed_[h->type] > 0) --owed_[h->type];
            continue;
        }
        return Unexpected(async_, *h, deadline, error);
    }
}

HRESULT HislipTransport::Open(const std::string& host, std::uint16_t port,
                              const std::string& sub_address, const Deadline& deadline,
                              std::string* error) {
    FdHolder fd;
    HRESULT hr = ConnectTcp(host, port, deadline, &fd, error);
    if (FAILED(hr)) return hr;
    sync_.Attach(fd.release());
    Header h;
    hr = sync_.Send(kInitialize, 0, (std::uint32_t(kProtocolVersion) << 16) | kVendorId,
                    sub_address, deadline, error);
    if (SUCCEEDED(hr)) hr = sync_.NextHeader(deadline, &h, error);
    if (SUCCEEDED(hr) && h.type != kInitializeResponse) hr = Unexpected(sync_, h, deadline, error);
    if (FAILED(hr)) return hr;
    const std::uint16_t session_id = std::uint16_t(h.parameter & 0xffff);
    hr = sync_.Skip(deadline, error);
    if (FAILED(hr)) return hr;

    hr = ConnectTcp(host, port, deadline, &fd, error);
    if (FAILED(hr)) return hr;
    async_.Attach(fd.release());
    hr = async_.Send(kAsyncInitialize, 0, session_id, {}, deadline, error);
    if (SUCCEEDED(hr)) hr = async_.NextHeader(deadline, &h, error);
    if (SUCCEEDED(hr) && h.type != kAsyncInitializeResponse)
        hr = Unexpected(async_, h, deadline, error);
    if (FAILED(hr)) return hr;

    hr = async_.Send(kAsyncMaximumMessageSize, 0, 0, EncodeSize(kMaxPayload), deadline, error);
    if (SUCCEEDED(hr)) hr = NextAsync(kAsyncMaximumMessageSizeResponse, deadline, &h, error);
    std::string size_text;
    if (SUCCEEDED(hr)) hr = async_.ReadSmall(16, deadline, &size_text, error);
    if (FAILED(hr)) return hr;
    std::uint64_t server_max = 0;
    if (!DecodeSize(size_text, &server_max) || server_max == 0) {
        *error = "bad maximum message size from " + async_.peer();
        return E_VISA_IO;
    }
    // Whether the server counts its header in the size or not, pieces this
    // small fit.
    server_max_ = std::clamp<std::uint64_t>(
        server_max > 2 * kHeaderSize ? server_max - kHeaderSize : server_max, 1, kMaxWritePiece);
    return S_OK;
}

HRESULT HislipTransport::Write(const BYTE* data, std::size_t size, bool send_end,
                               const Deadline& deadline, std::size_t* written, std::string* error) {
    *written = 0;
    if (size == 0 && !send_end) return S_OK;
    // The unread rest of a reply belongs to an earlier message.
    in_data_ = false;
    do {
        const std::size_t piece =
            std::size_t(std::min<std::uint64_t>(size - *written, server_max_));
        const bool end = send_end && *written + piece == size;
        const std::uint32_t id = next_id_;
        HRESULT hr = sync_.Send(end ? kDataEnd : kData, rmt_delivered_ ? kRmtDelivered : 0, id,
                                data + *written, piece, deadline, error);
        if (FAILED(hr)) return hr;
        rmt_delivered_ = false;
        next_id_ += kMessageIdStep;
        if (end) {
            awaited_id_ = id;
            awaiting_ = true;
        }
        *written += piece;
    } while (*written < size);
    return S_OK;
}

HRESULT HislipTransport::Read(const ReadRequest& req, const Deadline& deadline, ReadResult* result,
                              std::string* error) {
    *result = ReadResult{};
    if (!sync_.open()) return sync_.Lost(error);
    if (req.count == 0) return S_OK;
    for (;;) {
        if (!in_data_) {
            Header h;
            HRESULT hr = NextReply(deadline, &h, error);
            if (FAILED(hr)) return hr;
            in_data_ = true;
            data_end_ = h.type == kDataEnd;
        }
        while (sync_.left() > 0 && result->bytes < req.count) {
            if (req.return_available && result->bytes > 0 && !sync_.Buffered() &&
                !sync_.Readable()) {
                result->end = kReadEndAvailable;
                return S_OK;
            }
            std::size_t got = 0;
            bool term = false;
            HRESULT hr = sync_.ReadPayload(req.buf + result->bytes, req.count - result->bytes,
                                           req.term_char_enabled ? req.term_char : -1, deadline,
                                           &got, &term, error);
            result->bytes += got;
            if (FAILED(hr)) return hr;
            if (term && sync_.left() > 0) {
                result->end = kReadEndTermChar;
                return S_OK;
            }
        }
        if (sync_.left() == 0) {
            in_data_ = false;
            if (data_end_) {
                rmt_delivered_ = true;
                result->end = kReadEndEnd;
                return S_OK;
            }
            if (req.term_char_enabled && result->bytes > 0 &&
                req.buf[result->bytes - 1] == req.term_char) {
                result->end = kReadEndTermChar;
                return S_OK;
            }
        }
        if (result->bytes == req.count) {
            result->end = kReadEndCount;
            return S_OK;
        }
    }
}

HRESULT HislipTransport::Clear(const Deadline& deadline, std::string* error) {
    if (!sync_.open() || !async_.open()) return sync_.Lost(error);
    HRESULT hr = async_.Send(kAsyncDeviceClear, 0, 0, {}, deadline, error);
    Header h;
    if (SUCCEEDED(hr)) hr = NextAsync(kAsyncDeviceClearAcknowledge, deadline, &h, error);
    // Ask for the synchronized mode again; the acknowledgement ends what the
    // server sent before the clear.
    if (SUCCEEDED(hr)) hr = sync_.Send(kDeviceClearComplete, 0, 0, {}, deadline, error);
    while (SUCCEEDED(hr)) {
        hr = sync_.NextHeader(deadline, &h, error);
        if (FAILED(hr)) break;
        if (h.type == kDeviceClearAcknowledge) break;
        if (h.type == kError || h.type == kFatalError) {
            hr = Unexpected(sync_, h, deadline, error);
            break;
        }
        hr = CheckPayload(sync_, h, kMaxPayload, deadline, error);
    }
    if (FAILED(hr)) return hr;
    next_id_ = kFirstMessageId;
    awaiting_ = in_data_ = rmt_delivered_ = false;
    return sync_.Skip(deadline, error);
}

HRESULT HislipTransport::ReadStatusByte(const Deadline& deadline, BYTE* stb, std::string* error) {
    if (!async_.open()) return async_.Lost(error);
    HRESULT hr = async_.Send(kAsyncStatusQuery, rmt_delivered_ ? kRmtDelivered : 0,
                             next_id_ - kMessageIdStep, {}, deadline, error);
    if (FAILED(hr)) return hr;
    rmt_delivered_ = false;
    Header h;
    hr = NextAsync(kAsyncStatusResponse, deadline, &h, error);
    if (FAILED(hr)) return hr;
    *stb = h.control;
    return async_.Skip(deadline, error);
}

HRESULT HislipTransport::Trigger(const Deadline& deadline, std::string* error) {
    if (!sync_.open()) return sync_.Lost(error);
    in_data_ = false;  // the unread rest of a reply belongs to an earlier message
    HRESULT hr = sync_.Send(kTrigger, rmt_delivered_ ? kRmtDelivered : 0, next_id_, {}, deadline,
                            error);
    if (FAILED(hr)) return hr;
    rmt_delivered_ = false;
    next_id_ += kMessageIdStep;
    return S_OK;
}

// The exclusive lock: AsyncLock with the request bit, the time the server
// may wait for it as the parameter and no lock string; the answer comes once
// the server has the lock or gave up (control code 0: failed, 1: granted).
HRESULT HislipTransport::Lock(LONG lock_timeout_ms, const Deadline& deadline,
                              std::string* error) {
    if (!async_.open()) return async_.Lost(error);
    HRESULT hr = async_.Send(kAsyncLock, kLockRequest,
                             lock_timeout_ms < 0 ? 0xFFFFFFFFu : std::uint32_t(lock_timeout_ms),
                             {}, deadline, error);
    Header h;
    const Deadline reply_by =
        deadline.infinite() ? deadline : Deadline::FromTimeout(deadline.PollMs() + 250);
    if (SUCCEEDED(hr)) hr = NextAsync(kAsyncLockResponse, reply_by, &h, error);
    if (SUCCEEDED(hr)) hr = async_.Skip(reply_by, error);
    if (FAILED(hr)) return hr;
    if (h.control == kLockSuccess) return S_OK;
    *error = h.control == kLockFailure
                 ? "device locked by another session of " + async_.peer()
                 : "lock request refused by " + async_.peer() + " (code " +
                       std::to_string(h.control) + ")";
    return h.control == kLockFailure ? E_VISA_RSRC_LOCKED : E_VISA_IO;
}

HRESULT HislipTransport::Unlock(const Deadline& deadline, std::string* error) {
    if (!async_.open()) return async_.Lost(error);
    HRESULT hr =
        async_.Send(kAsyncLock, kLockRelease, next_id_ - kMessageIdStep, {}, deadline, error);
    Header h;
    if (SUCCEEDED(hr)) hr = NextAsync(kAsyncLockResponse, deadline, &h, error);
    if (SUCCEEDED(hr)) hr = async_.Skip(deadline, error);
    if (FAILED(hr)) return hr;
    if (h.control == kLockSuccess) return S_OK;
    *error = "no lock held with " + async_.peer() + " (code " + std::to_string(h.control) + ")";
    return E_VISA_SESSION_NOT_LOCKED;
}

// "hislip0" and the port of "hislip0,4881"; false for a bad port.
bool SplitDeviceName(const std::string& device, std::string* sub_address, std::uint16_t* port) {
    const std::size_t comma = device.find(',');
    *sub_address = device.substr(0, comma);
    if (comma == std::string::npos) return true;
    const std::string digits = device.substr(comma + 1);
    if (digits.empty() || digits.size() > 5 ||
        !std::all_of(digits.begin(), digits.end(), [](char c) { return c >= '0' && c <= '9'; }))
        return false;
    const unsigned long v = std::stoul(digits);
    if (v == 0 || v > 65535) return false;
    *port = std::uint16_t(v);
    return true;
}

}  // namespace

HRESULT OpenHislipTransport(const ResourceName& name, LONG open_timeout_ms,
                            std::unique_ptr<Transport>* out, std::string* error) {
    std::string sub_address;
    std::uint16_t port = name.port ? name.port : kDefaultPort;
    if (!SplitDeviceName(name.device_name, &sub_address, &port)) {
        *error = "invalid port in '" + name.device_name + "' (hislip<n>,<port>, port 1..65535)";
        return E_VISA_INVALID_RESOURCE_NAME;
    }
    const std::string peer = name.host + ":" + std::to_string(port);
    auto transport = std::make_unique<HislipTransport>(peer, peer + " (async)");
    HRESULT hr = transport->Open(name.host, port, sub_address,
                                 Deadline::FromTimeout(open_timeout_ms), error);
    if (FAILED(hr)) {
        *error = "HiSLIP session with " + peer + ": " + *error;
        return E_VISA_RESOURCE_NOT_FOUND;
    }
    *out = std::move(transport);
    return S_OK;
}

}  // namespace qn::visa

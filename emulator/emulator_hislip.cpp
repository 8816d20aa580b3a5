// The emulator's HiSLIP server, over the message codec of the driver's platform layer. A
// client's synchronous channel (opened with Initialize) carries its messages and their
// replies; its asynchronous channel (AsyncInitialize with the session id) the device clear,
// the status byte, the maximum message size and the lock requests. Both channels of a session
// share its state below; every session shares the one instrument.
#include <sys/socket.h>

#include <algorithm>
#include <condition_variable>
#include <limits>
#include <map>

#include "emulator/emulator.h"
#include "emulator/scpi_parser.h"
#include "platform/visa/hislip_protocol.h"

namespace qn::emu {

using namespace qn::hislip;

// One client session: what both of its channels see.
struct HislipSession {
    std::mutex m;
    std::condition_variable cv;
    std::uint64_t client_max = std::numeric_limits<std::uint64_t>::max();
    bool reply_pending = false;  // a reply was sent and the client has not said it read it
    std::uint32_t last_processed = kFirstMessageId - kMessageIdStep;
    bool async_attached = false;
    bool sync_done = false;
    int async_fd = -1;  // shut down when the synchronous channel ends
    std::uint16_t id = 0;
};

// The sessions, and the one holding the exclusive lock (0: none), which it keeps until it
// releases it or its synchronous channel ends.
struct HislipSessions {
    std::mutex m;
    std::condition_variable lock_cv;
    std::map<std::uint16_t, std::shared_ptr<HislipSession>> by_id;
    std::uint16_t next_id = 1;
    std::uint16_t lock_owner = 0;
};

namespace {

using Clock = std::chrono::steady_clock;

// The largest payload taken in one message, the bound of the payload of any message that is
// not data, and how long a status query waits for the message it names to be run.
constexpr std::uint64_t kServerMaxPayload = 1u << 20;
constexpr std::uint64_t kMaxControlPayload = 256;
constexpr auto kStatusWait = std::chrono::seconds(1);
constexpr std::uint16_t kVendorId = ('Q' << 8) | 'E';

// The asynchronous channel may stay quiet for long: it is not dropped when idle, but when its
// synchronous channel ends.
bool RecvExact(const Emulator& emu, int fd, char* dst, std::size_t n, bool idle_limit) {
    while (n > 0) {
        if (!emu.WaitReadable(fd, idle_limit)) return false;
        const ssize_t got = ::recv(fd, dst, n, 0);
        if (got <= 0) return false;
        dst += got;
        n -= static_cast<std::size_t>(got);
    }
    return true;
}

enum class Got { kHeader, kBadPrologue, kClosed };

Got ReadHeader(const Emulator& emu, int fd, Header* h, bool idle_limit = true) {
    char raw[kHeaderSize];
    if (!RecvExact(emu, fd, raw, sizeof raw, idle_limit)) return Got::kClosed;
    return DecodeHeader(reinterpret_cast<const std::uint8_t*>(raw), h) ? Got::kHeader
                                                                       : Got::kBadPrologue;
}

// Reads a payload of `length` bytes in pieces, handing each to `sink`.
template <class Sink>
bool ReadPayload(const Emulator& emu, int fd, std::uint64_t length, Sink&& sink,
                 bool idle_limit = true) {
    std::string piece;
    while (length > 0) {
        piece.resize(static_cast<std::size_t>(std::min<std::uint64_t>(length, 64 * 1024)));
        if (!RecvExact(emu, fd, piece.data(), piece.size(), idle_limit)) return false;
        sink(std::string_view(piece));
        length -= piece.size();
    }
    return true;
}

bool Skip(const Emulator& emu, int fd, std::uint64_t length) {
    return ReadPayload(emu, fd, length, [](std::string_view) {});
}

bool SendMessage(const Emulator& emu, int fd, std::uint8_t type, std::uint8_t control,
                 std::uint32_t parameter, std::string_view payload = {}) {
    std::uint8_t header[kHeaderSize];
    EncodeHeader({type, control, parameter, payload.size()}, header);
    return emu.SendAll(fd, {reinterpret_cast<const char*>(header), kHeaderSize}) &&
           emu.SendAll(fd, payload);
}

void SendFatal(const Emulator& emu, int fd, std::uint8_t code) {
    SendMessage(emu, fd, kFatalError, code, 0, FatalCodeText(code));
}

// A reply as Data messages of at most the client's size, the last one DataEnd.
bool SendReply(const Emulator& emu, int fd, std::string_view reply, std::uint32_t id,
               std::uint64_t client_max) {
    const std::uint64_t piece_max = std::max<std::uint64_t>(client_max, 1);
    do {
        const std::size_t n =
            static_cast<std::size_t>(std::min<std::uint64_t>(reply.size(), piece_max));
        const bool last = n == reply.size();
        if (!SendMessage(emu, fd, last ? kDataEnd : kData, 0, id, reply.substr(0, n))) return false;
        reply.remove_prefix(n);
    } while (!reply.empty());
    return true;
}

}  // namespace

std::uint8_t Emulator::ArbitrateLock(std::uint16_t session, std::uint8_t request,
                                     std::uint32_t timeout_ms) {
    HislipSessions& sessions = *hislip_sessions_;
    std::unique_lock lock(sessions.m);
    if (request == kLockRelease) {
        if (sessions.lock_owner != session) return kLockError;
        sessions.lock_owner = 0;
        sessions.lock_cv.notify_all();
        return kLockSuccess;
    }
    const auto until = Clock::now() + std::chrono::milliseconds(std::min(timeout_ms, 60000u));
    while (sessions.lock_owner != 0 && sessions.lock_owner != session) {
        const auto now = Clock::now();
        if (now >= until || stopping()) return kLockFailure;
        sessions.lock_cv.wait_until(lock, std::min(until, now + std::chrono::milliseconds(50)));
    }
    sessions.lock_owner = session;
    return kLockSuccess;
}

void Emulator::EnableHislip() {
    hislip_sessions_ = std::make_shared<HislipSessions>();
}

void Emulator::ServeHislip(int client) {
    Header h;
    const Got got = ReadHeader(*this, client, &h);
    if (got == Got::kBadPrologue) SendFatal(*this, client, kFatalBadHeader);
    if (got != Got::kHeader) return;
    HislipSessions& sessions = *hislip_sessions_;
    if (h.type == kInitialize) {
        std::string sub_address;
        if (h.length > kMaxControlPayload ||
            !ReadPayload(*this, client, h.length,
                         [&](std::string_view p) { sub_address.append(p); })) {
            SendFatal(*this, client, kFatalBadInitialization);
            return;
        }
        if (sub_address.rfind("hislip", 0) != 0) {
            SendMessage(*this, client, kFatalError, kFatalUnidentified, 0,
                        "unknown sub-address " + sub_address.substr(0, 64));
            return;
        }
        auto session = std::make_shared<HislipSession>();
        std::uint16_t id = 0;
        {
            std::lock_guard lock(sessions.m);
            do {
                id = sessions.next_id++;
            } while (id == 0 || sessions.by_id.count(id) != 0);
            sessions.by_id[id] = session;
            session->id = id;
        }
        if (SendMessage(*this, client, kInitializeResponse, 0,
                        (std::uint32_t{kProtocolVersion} << 16) | id))
            ServeHislipSync(client, *session);
        {
            std::lock_guard lock(sessions.m);
            sessions.by_id.erase(id);
            if (sessions.lock_owner == id) sessions.lock_owner = 0;
        }
        sessions.lock_cv.notify_all();
        std::lock_guard lock(session->m);
        session->sync_done = true;
        if (session->async_fd >= 0) ::shutdown(session->async_fd, SHUT_RDWR);
        return;
    }
    std::shared_ptr<HislipSession> session;
    if (h.type == kAsyncInitialize && h.length == 0) {
        std::lock_guard lock(sessions.m);
        const auto it = sessions.by_id.find(static_cast<std::uint16_t>(h.parameter & 0xffff));
        if (it != sessions.by_id.end()) {
            std::lock_guard session_lock(it->second->m);
            if (!it->second->async_attached && !it->second->sync_done) {
                session = it->second;
                session->async_attached = true;
                session->async_fd = client;
            }
        }
    }
    if (!session) {
        SendFatal(*this, client, kFatalBadInitialization);
        return;
    }
    if (SendMessage(*this, client, kAsyncInitializeResponse, 0, kVendorId))
        ServeHislipAsync(client, *session);
    std::lock_guard lock(session->m);
    session->async_fd = -1;  // the caller closes it
}

void Emulator::ServeHislipSync(int client, HislipSession& session) {
    MessageFramer framer;
    char last = '\n';  // the last byte received, across Data messages
    for (;;) {
        Header h;
        const Got got = ReadHeader(*this, client, &h);
        if (got == Got::kBadPrologue) SendFatal(*this, client, kFatalBadHeader);
        if (got != Got::kHeader) return;
        const std::uint64_t bound =
            h.type == kData || h.type == kDataEnd ? kServerMaxPayload : kMaxControlPayload;
        if (h.length > bound) {
            SendMessage(*this, client, kFatalError, kFatalUnidentified, 0, "message too large");
            return;
        }
        switch (h.type) {
            case kData:
            case kDataEnd: {
                if (!ReadPayload(*this, client, h.length, [&](std::string_view p) {
                        framer.Append(p);
                        last = p.back();
                    }))
                    return;
                std::string reply;
                bool keep = true;
                if (h.type == kDataEnd) {
                    // END ends the message even without a line feed.
                    if (last != '\n') framer.Append("\n");
                    last = '\n';
                    keep = RunMessages(framer, &reply);
                }
                std::uint64_t client_max = 0;
                {
                    std::lock_guard lock(session.m);
                    if (h.control & kRmtDelivered) session.reply_pending = false;
                    if (!reply.empty()) session.reply_pending = true;
                    session.last_processed = h.parameter;
                    client_max = session.client_max;
                }
                session.cv.notify_all();
                if (!keep) return;
                if (reply.empty()) break;
                const auto delay = reply_delay();
                if (delay.count() > 0 && !SleepInterruptible(delay)) return;
                if (!SendReply(*this, client, reply, h.parameter, client_max)) return;
                break;
            }
            case kDeviceClearComplete:
                if (!Skip(*this, client, h.length)) return;
                framer = MessageFramer();
                last = '\n';
                {
                    std::lock_guard lock(session.m);
                    session.reply_pending = false;
                    session.last_processed = kFirstMessageId - kMessageIdStep;
                }
                if (!SendMessage(*this, client, kDeviceClearAcknowledge, 0, 0)) return;
                break;
            case kTrigger: {
                if (!Skip(*this, client, h.length)) return;
                // A bus trigger is the *TRG common command, run as a message of its own.
                MessageFramer trigger;
                trigger.Append("*TRG\n");
                std::string ignored;
                if (!RunMessages(trigger, &ignored)) return;
                {
                    std::lock_guard lock(session.m);
                    session.last_processed = h.parameter;
                }
                session.cv.notify_all();
                break;
            }
            default:
                if (!Skip(*this, client, h.length) ||
                    !SendMessage(*this, client, kError, kErrorUnrecognizedMessageType, 0,
                                 MessageTypeName(h.type)))
                    return;
        }
    }
}

void Emulator::ServeHislipAsync(int client, HislipSession& session) {
    for (;;) {
        Header h;
        const Got got = ReadHeader(*this, client, &h, false);
        if (got == Got::kBadPrologue) SendFatal(*this, client, kFatalBadHeader);
        if (got != Got::kHeader) return;
        if (h.length > kMaxControlPayload) {
            SendMessage(*this, client, kFatalError, kFatalUnidentified, 0, "message too large");
            return;
        }
        std::string payload;
        if (!ReadPayload(
                *this, client, h.length, [&](std::string_view p) { payload.append(p); }, false))
            return;
        bool sent = true;
        switch (h.type) {
            case kAsyncMaximumMessageSize: {
                std::uint64_t size = 0;
                if (!DecodeSize(payload, &size)) {
                    sent = SendMessage(*this, client, kError, kErrorUnidentified, 0,
                                       "maximum message size needs 8 bytes");
                    break;
                }
                {
                    std::lock_guard lock(session.m);
                    session.client_max = size;
                }
                sent = SendMessage(*this, client, kAsyncMaximumMessageSizeResponse, 0, 0,
                                   EncodeSize(kServerMaxPayload));
                break;
            }
            case kAsyncDeviceClear:
                DeviceClear();
                {
                    std::lock_guard lock(session.m);
                    session.reply_pending = false;
                }
                sent = SendMessage(*this, client, kAsyncDeviceClearAcknowledge, 0, 0);
                break;
            case kAsyncStatusQuery: {
                bool pending = false;
                {
                    // The message the query names may still be on its way through the other
                    // channel: its reply decides the message-available bit.
                    std::unique_lock lock(session.m);
                    session.cv.wait_for(lock, kStatusWait, [&] {
                        return session.last_processed == h.parameter || stopping();
                    });
                    if (h.control & kRmtDelivered) session.reply_pending = false;
                    pending = session.reply_pending;
                }
                sent = SendMessage(*this, client, kAsyncStatusResponse, StatusByte(pending), 0);
                break;
            }
            case kAsyncLock:
                sent = SendMessage(*this, client, kAsyncLockResponse,
                                   ArbitrateLock(session.id, h.control, h.parameter), 0);
                break;
            case kAsyncLockInfo:
                sent = SendMessage(*this, client, kAsyncLockInfoResponse, 0, 0);
                break;
            case kAsyncRemoteLocalControl:
                sent = SendMessage(*this, client, kAsyncRemoteLocalResponse, 0, 0);
                break;
            default:
                sent = SendMessage(*this, client, kError, kErrorUnrecognizedMessageType, 0,
                                   MessageTypeName(h.type));
        }
        if (!sent) return;
    }
}

}  // namespace qn::emu

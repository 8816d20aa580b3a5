// The emulator's VXI-11 server (core and abort channels) and its portmapper, over the ONC RPC
// codec of the driver's platform layer. A link keeps its own message framer and output:
// device_write runs a message when END arrives, device_read hands out its reply.
//
// The links of every connection share one device lock: a call on another link waits for it
// (waitlock) up to its lock timeout, then fails with "locked by another link" (11). The lock
// ends with device_unlock, destroy_link or the connection of its link. The abort channel's
// device_abort ends the wait of a call in progress on the link (a read waiting for its
// reply, a call waiting for the lock) with "abort" (23); with nothing in progress it does
// nothing.
#include <arpa/inet.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <condition_variable>
#include <map>
#include <mutex>

#include "emulator/emulator.h"
#include "emulator/scpi_parser.h"
#include "platform/visa/onc_rpc.h"
#include "platform/visa/vxi11_protocol.h"

namespace qn::emu {
namespace {

using namespace qn::vxi11;
using Clock = std::chrono::steady_clock;

// Device-side limits: the largest write piece taken in one call, the largest record accepted
// (a write piece plus its header), and the longest a read waits for a reply.
constexpr std::uint32_t kMaxRecvSize = 64 * 1024;
constexpr std::size_t kMaxCallRecord = kMaxRecvSize + 1024;
constexpr std::size_t kMaxPortmapRecord = 4096;
constexpr std::uint32_t kMaxReadWaitMs = 60000;
constexpr std::size_t kMaxDeviceName = 64;

// Slices of the waits, so that a stopping emulator is noticed.
constexpr auto kWaitSlice = std::chrono::milliseconds(50);
constexpr std::int32_t kNoLink = -1;

}  // namespace

// One link: its message framer and the reply not yet read belong to the connection that made
// it; `busy` and `abort` are shared with the abort channel under Vxi11Links::m.
struct Vxi11Link {
    MessageFramer framer;
    std::string output;  // reply bytes not yet read
    Clock::time_point ready_at{};
    bool busy = false;   // a call is waiting (for its reply or for the lock)
    bool abort = false;  // device_abort asked to end that wait
};

// Every link of the server, and the one that holds the device lock.
struct Vxi11Links {
    std::mutex m;
    std::condition_variable cv;
    std::map<std::int32_t, std::shared_ptr<Vxi11Link>> by_id;
    std::int32_t lock_holder = kNoLink;
};

namespace {

// Waits under `lock` until done() holds, `until` passes, the link is aborted or the emulator
// stops; the device error the wait ends with (0 when done() holds).
template <class Done>
std::int32_t WaitOnLink(const Emulator& emu, Vxi11Links& links, Vxi11Link& link,
                        std::unique_lock<std::mutex>& lock, Clock::time_point until,
                        std::int32_t timeout_error, Done&& done) {
    link.busy = true;
    std::int32_t result = kNoError;
    for (;;) {
        if (done()) break;
        if (link.abort) {
            result = kAbort;
            break;
        }
        const auto now = Clock::now();
        if (now >= until || emu.stopping()) {
            result = timeout_error;
            break;
        }
        links.cv.wait_until(lock, std::min(until, now + kWaitSlice));
    }
    link.busy = link.abort = false;
    return result;
}

Clock::time_point After(std::uint32_t ms) {
    return Clock::now() + std::chrono::milliseconds(std::min(ms, kMaxReadWaitMs));
}

// Waits (with waitlock) for the lock another link holds; 0, kLockedByAnother or kAbort.
std::int32_t Access(const Emulator& emu, Vxi11Links& links, std::int32_t lid, Vxi11Link& link,
                    std::uint32_t flags, std::uint32_t lock_timeout) {
    std::unique_lock lock(links.m);
    auto free = [&] { return links.lock_holder == kNoLink || links.lock_holder == lid; };
    if (free()) return kNoError;
    if (!(flags & kFlagWaitLock)) return kLockedByAnother;
    return WaitOnLink(emu, links, link, lock, After(lock_timeout), kLockedByAnother, free);
}

// The results of a failed call: the error code and the zero fields that follow it.
std::string ErrorResults(std::uint32_t procedure, std::int32_t error) {
    rpc::XdrWriter w;
    w.I32(error);
    if (procedure == kDeviceRead) w.U32(0);  // reason; the data is empty
    if (procedure == kDeviceRead || procedure == kDeviceWrite || procedure == kDeviceReadStb)
        w.U32(0);
    return std::move(w.data());
}

std::string DeviceErrorOnly(std::int32_t error) {
    rpc::XdrWriter w;
    w.I32(error);
    return std::move(w.data());
}

// Serves RPC calls on one stream connection: handler(call, args, &results) gives the accept
// state of each; false from the loop means the connection ends.
template <class Handler>
void ServeRpcStream(const Emulator& emu, int fd, std::size_t max_record, Handler&& handler) {
    rpc::RecordReader reader(max_record);
    std::string chunk(64 * 1024, '\0'), record;
    while (emu.WaitReadable(fd)) {
        const ssize_t n = ::recv(fd, chunk.data(), chunk.size(), 0);
        if (n <= 0) return;
        std::string_view input(chunk.data(), static_cast<std::size_t>(n));
        for (;;) {
            const auto st = reader.Feed(&input, &record);
            if (st == rpc::RecordReader::Status::kTooLarge) return;
            if (st == rpc::RecordReader::Status::kNeedMore) break;
            rpc::CallHeader call;
            std::string_view args;
            if (!rpc::ParseCall(record, &call, &args)) return;
            std::string results;
            bool close = false;
            const rpc::AcceptStat stat = handler(call, args, &results, &close);
            if (close) return;
            if (!emu.SendAll(fd, rpc::FrameRecord(rpc::BuildReply(call.xid, stat, results))))
                return;
        }
    }
}

rpc::AcceptStat WrongProgram(const rpc::CallHeader& call, std::uint32_t program,
                             std::uint32_t low, std::uint32_t high, std::string* results) {
    if (call.program != program) return rpc::kProgUnavail;
    rpc::XdrWriter w;
    w.U32(low);
    w.U32(high);
    *results = std::move(w.data());
    return rpc::kProgMismatch;
}

}  // namespace

void Emulator::EnableVxi11() {
    vxi11_ = true;
    vxi11_links_ = std::make_shared<Vxi11Links>();
}

void Emulator::ServeVxi11(int client, bool abort_channel) {
    Vxi11Links& links = *vxi11_links_;
    if (abort_channel) {
        ServeRpcStream(*this, client, kMaxPortmapRecord, [&](const rpc::CallHeader& call,
                                                             std::string_view args,
                                                             std::string* results, bool*) {
            if (call.program != kAbortProgram || call.version != kVersion)
                return WrongProgram(call, kAbortProgram, kVersion, kVersion, results);
            if (call.procedure != kDeviceAbort) return rpc::kProcUnavail;
            rpc::XdrReader r(args);
            std::int32_t lid = 0;
            if (!r.I32(&lid)) return rpc::kGarbageArgs;
            std::int32_t error = kNoError;
            {
                std::lock_guard lock(links.m);
                const auto it = links.by_id.find(lid);
                if (it == links.by_id.end()) {
                    error = kInvalidLinkId;
                } else if (it->second->busy) {  // nothing in progress: nothing to end
                    it->second->abort = true;
                }
            }
            links.cv.notify_all();
            *results = DeviceErrorOnly(error);
            return rpc::kSuccess;
        });
        return;
    }
    // The links made on this connection end with it, and the lock with them.
    std::map<std::int32_t, std::shared_ptr<Vxi11Link>> mine;
    auto destroy = [&](std::int32_t lid) {
        {
            std::lock_guard lock(links.m);
            links.by_id.erase(lid);
            if (links.lock_holder == lid) links.lock_holder = kNoLink;
        }
        links.cv.notify_all();
        mine.erase(lid);
    };
    ServeRpcStream(*this, client, kMaxCallRecord, [&](const rpc::CallHeader& call,
                                                      std::string_view args, std::string* results,
                                                      bool* close) -> rpc::AcceptStat {
        if (call.program != kCoreProgram || call.version != kVersion)
            return WrongProgram(call, kCoreProgram, kVersion, kVersion, results);
        rpc::XdrReader r(args);
        if (call.procedure == kCreateLink) {
            std::int32_t client_id = 0;
            std::uint32_t lock_device = 0, lock_timeout = 0;
            std::string_view device;
            if (!r.I32(&client_id) || !r.U32(&lock_device) || !r.U32(&lock_timeout) ||
                !r.Opaque(&device, kMaxDeviceName))
                return rpc::kGarbageArgs;
            rpc::XdrWriter w;
            if (device.substr(0, 4) != "inst") {
                w.I32(kInvalidLinkId);  // only instN devices exist here
                for (int i = 0; i < 3; ++i) w.U32(0);
                *results = std::move(w.data());
                return rpc::kSuccess;
            }
            const std::int32_t lid = NewLinkId();
            auto link = std::make_shared<Vxi11Link>();
            {
                std::lock_guard lock(links.m);
                links.by_id[lid] = link;
            }
            mine[lid] = link;
            std::int32_t error = kNoError;
            if (lock_device) {
                error = Access(*this, links, lid, *link, kFlagWaitLock, lock_timeout);
                std::lock_guard lock(links.m);
                if (error == kNoError) links.lock_holder = lid;
            }
            if (error != kNoError) {
                destroy(lid);
                w.I32(error);
                for (int i = 0; i < 3; ++i) w.U32(0);
            } else {
                w.I32(kNoError);
                w.I32(lid);
                w.U32(abort_port());
                w.U32(kMaxRecvSize);
            }
            *results = std::move(w.data());
            return rpc::kSuccess;
        }
        std::int32_t lid = 0;
        if (!r.I32(&lid)) return rpc::kGarbageArgs;
        const auto link = mine.find(lid);
        if (link == mine.end()) {
            *results = ErrorResults(call.procedure, kInvalidLinkId);
            return rpc::kSuccess;
        }
        Vxi11Link& l = *link->second;
        // The arguments of the calls that wait for a lock another link holds.
        std::uint32_t flags = 0, lock_timeout = 0, io_timeout = 0, size = 0, term = 0;
        switch (call.procedure) {
            case kDeviceWrite:
                if (!r.U32(&io_timeout) || !r.U32(&lock_timeout) || !r.U32(&flags))
                    return rpc::kGarbageArgs;
                break;
            case kDeviceRead:
                if (!r.U32(&size) || !r.U32(&io_timeout) || !r.U32(&lock_timeout) ||
                    !r.U32(&flags) || !r.U32(&term))
                    return rpc::kGarbageArgs;
                break;
            case kDeviceReadStb:
            case kDeviceTrigger:
            case kDeviceClear:
            case kDeviceRemote:
            case kDeviceLocal:
            case kDeviceLock:
                if (!r.U32(&flags) || !r.U32(&lock_timeout)) return rpc::kGarbageArgs;
                if (call.procedure != kDeviceLock && !r.U32(&io_timeout))
                    return rpc::kGarbageArgs;
                break;
            default:
                break;
        }
        switch (call.procedure) {
            case kDeviceUnlock: {
                std::int32_t error = kNoLockHeld;
                {
                    std::lock_guard lock(links.m);
                    if (links.lock_holder == lid) {
                        links.lock_holder = kNoLink;
                        error = kNoError;
                    }
                }
                links.cv.notify_all();
                *results = DeviceErrorOnly(error);
                return rpc::kSuccess;
            }
            case kDestroyLink:
                destroy(lid);
                *results = DeviceErrorOnly(kNoError);
                return rpc::kSuccess;
            case kDeviceWrite:
            case kDeviceRead:
            case kDeviceReadStb:
            case kDeviceTrigger:
            case kDeviceClear:
            case kDeviceRemote:
            case kDeviceLocal:
            case kDeviceLock: {
                const std::int32_t error = Access(*this, links, lid, l, flags, lock_timeout);
                if (error != kNoError) {
                    *results = ErrorResults(call.procedure, error);
                    return rpc::kSuccess;
                }
                break;
            }
            default:
                *results = DeviceErrorOnly(kNotSupported);
                return rpc::kSuccess;
        }
        switch (call.procedure) {
            case kDeviceWrite: {
                std::string_view data;
                if (!r.Opaque(&data, kMaxRecvSize)) return rpc::kGarbageArgs;
                l.framer.Append(data);
                // END ends the message even without a line feed.
                if ((flags & kFlagEnd) && (data.empty() || data.back() != '\n'))
                    l.framer.Append("\n");
                std::string reply;
                const bool keep = RunMessages(l.framer, &reply);
                if (!keep) {
                    *close = true;
                    return rpc::kSuccess;
                }
                if (!reply.empty()) {
                    l.output = std::move(reply);
                    l.ready_at = Clock::now() + reply_delay();
                }
                rpc::XdrWriter w;
                w.I32(kNoError);
                w.U32(static_cast<std::uint32_t>(data.size()));
                *results = std::move(w.data());
                return rpc::kSuccess;
            }
            case kDeviceRead: {
                const auto wait_until =
                    After(overruns_io_timeouts() ? kMaxReadWaitMs : io_timeout);
                const bool arrives = !l.output.empty() && l.ready_at <= wait_until;
                std::int32_t error = kNoError;
                {
                    std::unique_lock lock(links.m);
                    error = WaitOnLink(*this, links, l, lock, arrives ? l.ready_at : wait_until,
                                       arrives ? kNoError : kIoTimeout, [] { return false; });
                }
                if (stopping()) {
                    *close = true;
                    return rpc::kSuccess;
                }
                if (error != kNoError) {
                    *results = ErrorResults(kDeviceRead, error);
                    return rpc::kSuccess;
                }
                std::size_t n = std::min<std::size_t>(size, l.output.size());
                std::uint32_t reason = 0;
                if (flags & kFlagTermCharSet) {
                    const std::size_t t = l.output.find(static_cast<char>(term));
                    if (t != std::string::npos && t < n) {
                        n = t + 1;
                        reason |= kReasonTermChar;
                    }
                }
                if (n == l.output.size()) reason |= kReasonEnd;
                if (n == size) reason |= kReasonRequestCount;
                rpc::XdrWriter w;
                w.I32(kNoError);
                w.U32(reason);
                w.Opaque(std::string_view(l.output).substr(0, n));
                l.output.erase(0, n);
                *results = std::move(w.data());
                return rpc::kSuccess;
            }
            case kDeviceReadStb: {
                rpc::XdrWriter w;
                w.I32(kNoError);
                w.U32(StatusByte(!l.output.empty()));
                *results = std::move(w.data());
                return rpc::kSuccess;
            }
            case kDeviceTrigger: {
                // A bus trigger is the *TRG common command, run as a message of its own.
                MessageFramer trigger;
                trigger.Append("*TRG\n");
                std::string ignored;
                if (!RunMessages(trigger, &ignored)) {
                    *close = true;
                    return rpc::kSuccess;
                }
                *results = DeviceErrorOnly(kNoError);
                return rpc::kSuccess;
            }
            case kDeviceClear:
                l.output.clear();
                l.framer = MessageFramer();
                DeviceClear();
                *results = DeviceErrorOnly(kNoError);
                return rpc::kSuccess;
            case kDeviceLock: {
                std::lock_guard lock(links.m);
                links.lock_holder = lid;
                *results = DeviceErrorOnly(kNoError);
                return rpc::kSuccess;
            }
            default:  // remote, local
                *results = DeviceErrorOnly(kNoError);
                return rpc::kSuccess;
        }
    });
    while (!mine.empty()) destroy(mine.begin()->first);
}

namespace {

// The answer of the portmapper (version 2 GETPORT) or rpcbind (versions 3 and 4 GETADDR) to
// one call: where the VXI-11 core channel listens.
rpc::AcceptStat Portmap(const rpc::CallHeader& call, std::string_view args, std::uint16_t core,
                        std::string* results) {
    if (call.program != rpc::kPortmapProgram || call.version < 2 || call.version > 4)
        return WrongProgram(call, rpc::kPortmapProgram, 2, 4, results);
    if (call.procedure == 0) return rpc::kSuccess;  // NULL
    if (call.procedure != rpc::kPortmapGetPort) return rpc::kProcUnavail;
    rpc::XdrReader r(args);
    std::uint32_t program = 0, version = 0;
    if (!r.U32(&program) || !r.U32(&version)) return rpc::kGarbageArgs;
    rpc::XdrWriter w;
    if (call.version == 2) {
        std::uint32_t protocol = 0;
        if (!r.U32(&protocol)) return rpc::kGarbageArgs;
        const bool ours = program == kCoreProgram && version == kVersion &&
                          protocol == rpc::kProtocolTcp;
        w.U32(ours ? core : 0);
    } else {
        std::string_view netid, addr, owner;
        if (!r.Opaque(&netid, 64) || !r.Opaque(&addr, 128) || !r.Opaque(&owner, 128))
            return rpc::kGarbageArgs;
        const bool ours = program == kCoreProgram && version == kVersion && netid == "tcp";
        w.Opaque(ours ? "127.0.0.1." + std::to_string(core >> 8) + "." +
                            std::to_string(core & 0xff)
                      : std::string());
    }
    *results = std::move(w.data());
    return rpc::kSuccess;
}

}  // namespace

void Emulator::ServePortmapper(int client) {
    ServeRpcStream(*this, client, kMaxPortmapRecord,
                   [&](const rpc::CallHeader& call, std::string_view args, std::string* results,
                       bool*) { return Portmap(call, args, vxi11_port(), results); });
}

void Emulator::AnswerPortmapperDatagram(int fd) {
    char buf[kMaxPortmapRecord];
    sockaddr_storage from{};
    socklen_t len = sizeof from;
    const ssize_t n =
        ::recvfrom(fd, buf, sizeof buf, MSG_DONTWAIT, reinterpret_cast<sockaddr*>(&from), &len);
    if (n <= 0) return;
    rpc::CallHeader call;
    std::string_view args;
    if (!rpc::ParseCall(std::string_view(buf, static_cast<std::size_t>(n)), &call, &args)) return;
    std::string results;
    const rpc::AcceptStat stat = Portmap(call, args, vxi11_port(), &results);
    const std::string reply = rpc::BuildReply(call.xid, stat, results);
    ::sendto(fd, reply.data(), reply.size(), MSG_DONTWAIT, reinterpret_cast<sockaddr*>(&from),
             len);
}

}  // namespace qn::emu

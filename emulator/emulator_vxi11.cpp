// The emulator's VXI-11 server (core and abort channels) and its portmapper, over the ONC RPC
// codec of the driver's platform layer. A link keeps its own message framer and output:
// device_write runs a message when END arrives, device_read hands out its reply.
#include <arpa/inet.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <map>

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

struct Link {
    MessageFramer framer;
    std::string output;  // reply bytes not yet read
    Clock::time_point ready_at{};
};

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

void Emulator::ServeVxi11(int client, bool abort_channel) {
    std::map<std::int32_t, Link> links;
    const std::uint32_t program = abort_channel ? kAbortProgram : kCoreProgram;
    ServeRpcStream(*this, client, kMaxCallRecord, [&](const rpc::CallHeader& call,
                                                      std::string_view args, std::string* results,
                                                      bool* close) -> rpc::AcceptStat {
        if (call.program != program || call.version != kVersion)
            return WrongProgram(call, program, kVersion, kVersion, results);
        rpc::XdrReader r(args);
        if (abort_channel) {
            if (call.procedure != kDeviceAbort) return rpc::kProcUnavail;
            *results = DeviceErrorOnly(kNoError);
            return rpc::kSuccess;
        }
        if (call.procedure == kCreateLink) {
            std::int32_t client_id = 0;
            std::uint32_t lock = 0, lock_timeout = 0;
            std::string_view device;
            if (!r.I32(&client_id) || !r.U32(&lock) || !r.U32(&lock_timeout) ||
                !r.Opaque(&device, kMaxDeviceName))
                return rpc::kGarbageArgs;
            rpc::XdrWriter w;
            if (device.substr(0, 4) != "inst") {
                w.I32(kInvalidLinkId);  // only instN devices exist here
                for (int i = 0; i < 3; ++i) w.U32(0);
            } else {
                const std::int32_t lid = NewLinkId();
                links[lid];
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
        const auto link = links.find(lid);
        if (link == links.end()) {
            *results = DeviceErrorOnly(kInvalidLinkId);
            if (call.procedure == kDeviceRead) *results += std::string(8, '\0');  // reason, data
            if (call.procedure == kDeviceWrite || call.procedure == kDeviceReadStb)
                *results += std::string(4, '\0');
            return rpc::kSuccess;
        }
        Link& l = link->second;
        switch (call.procedure) {
            case kDeviceWrite: {
                std::uint32_t io_timeout = 0, lock_timeout = 0, flags = 0;
                std::string_view data;
                if (!r.U32(&io_timeout) || !r.U32(&lock_timeout) || !r.U32(&flags) ||
                    !r.Opaque(&data, kMaxRecvSize))
                    return rpc::kGarbageArgs;
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
                std::uint32_t size = 0, io_timeout = 0, lock_timeout = 0, flags = 0, term = 0;
                if (!r.U32(&size) || !r.U32(&io_timeout) || !r.U32(&lock_timeout) ||
                    !r.U32(&flags) || !r.U32(&term))
                    return rpc::kGarbageArgs;
                const auto limit =
                    std::chrono::milliseconds(std::min(io_timeout, kMaxReadWaitMs));
                const auto wait_until = Clock::now() + limit;
                const bool arrives = !l.output.empty() && l.ready_at <= wait_until;
                const auto wait = std::chrono::duration_cast<std::chrono::milliseconds>(
                    (arrives ? l.ready_at : wait_until) - Clock::now());
                if (wait.count() > 0 && !SleepInterruptible(wait)) {
                    *close = true;
                    return rpc::kSuccess;
                }
                rpc::XdrWriter w;
                if (!arrives) {
                    w.I32(kIoTimeout);
                    w.U32(0);
                    w.Opaque({});
                    *results = std::move(w.data());
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
            case kDeviceClear:
                l.output.clear();
                l.framer = MessageFramer();
                DeviceClear();
                *results = DeviceErrorOnly(kNoError);
                return rpc::kSuccess;
            case kDeviceTrigger:
            case kDeviceRemote:
            case kDeviceLocal:
            case kDeviceLock:
            case kDeviceUnlock:
                *results = DeviceErrorOnly(kNoError);
                return rpc::kSuccess;
            case kDestroyLink:
                links.erase(link);
                *results = DeviceErrorOnly(kNoError);
                return rpc::kSuccess;
            default:
                *results = DeviceErrorOnly(kNotSupported);
                return rpc::kSuccess;
        }
    });
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

// VXI-11 transport (TCPIP[n]::host[:port][::name]::INSTR, name "inst0" by
// default): ONC RPC calls on the device's core channel.
//
// - The core channel's port comes from the resource string or, when it has
//   none, from the host's portmapper (port 111).
// - Every call carries the time left of the operation's deadline as the
//   device's I/O timeout; the wait for the reply ends a short grace after
//   that deadline, so a device that never answers is a timeout too.
// - Replies are matched by transaction id: the late reply of a call that
//   timed out is dropped, never taken for the reply of a later call.
// - Records are bounded before they are held; a reply that breaks the
//   protocol (a giant record, a short or garbled one) ends the connection,
//   and later calls fail cleanly.
// - device_write is split at the device's maxRecvSize, END on the last
//   piece; device_read ends at END, at the termination character when it is
//   enabled, or at the count.
// - Every operation waits for a lock another link holds as long as its own
//   deadline allows, then fails with E_VISA_RSRC_LOCKED.
// - A call the device does not answer by its deadline (plus a grace) is
//   ended on the device through the abort channel, opened on first use at
//   the port create_link named, so that the next call is served at once.
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstring>
#include <random>
#include <vector>

#include "platform/visa/onc_rpc.h"
#include "platform/visa/resource_name.h"
#include "platform/visa/tcp_connect.h"
#include "platform/visa/transport.h"
#include "platform/visa/vxi11_protocol.h"

namespace qn::visa {
namespace {

using namespace qn::vxi11;

constexpr std::uint16_t kPortmapPort = 111;
// The largest read asked for in one call, and the bound of a reply record.
constexpr std::uint32_t kMaxReadRequest = 8u << 20;
constexpr std::size_t kMaxRecord = kMaxReadRequest + 1024;
// How long after the deadline a reply is still awaited (the device reports
// its own timeout at the deadline).
constexpr auto kReplyGrace = std::chrono::milliseconds(250);
// Setting up and tearing down a link, and an abort through the abort channel.
constexpr LONG kCloseTimeoutMs = 300;
constexpr LONG kAbortTimeoutMs = 500;
constexpr std::uint32_t kInfiniteIoTimeout = 0xFFFFFFFFu;

std::uint32_t IoTimeout(const Deadline& d) {
    const int ms = d.PollMs();
    return ms < 0 ? kInfiniteIoTimeout : std::uint32_t(ms);
}

// What each device error code of a reply becomes.
struct DeviceErrorInfo {
    std::int32_t code;
    HRESULT hr;
    const char* text;
};
constexpr DeviceErrorInfo kDeviceErrors[] = {
    {kSyntaxError, E_VISA_IO, "syntax error"},
    {kNotAccessible, E_VISA_IO, "device not accessible"},
    {kInvalidLinkId, E_VISA_CONNECTION_LOST, "invalid link identifier"},
    {kParameterError, E_VISA_IO, "parameter error"},
    {kNotSupported, E_VISA_NOT_SUPPORTED, "operation not supported"},
    {kOutOfResources, E_VISA_IO, "out of resources"},
    {kLockedByAnother, E_VISA_RSRC_LOCKED, "device locked by another link"},
    {kNoLockHeld, E_VISA_SESSION_NOT_LOCKED, "no lock held by this link"},
    {kIoTimeout, E_VISA_TIMEOUT, "I/O timeout"},
    {kIoError, E_VISA_IO, "I/O error"},
    {kAbort, E_VISA_ABORT, "aborted"},
};

// One RPC client connection: calls of one program and version.
class RpcConnection {
  public:
    RpcConnection(int fd, std::string peer, std::uint32_t program, std::uint32_t version)
        : fd_(fd), peer_(std::move(peer)), program_(program), version_(version),
          reader_(kMaxRecord), rx_(256 * 1024) {
        std::random_device rd;
        xid_ = rd();
    }

    // Calls procedure with args; on success *results views the results in
    // *record. The wait for the reply ends by `until`.
    HRESULT Call(std::uint32_t procedure, const std::string& args, const Deadline& until,
                 std::string* record, std::string_view* results, std::string* error) {
        if (fd_.get() < 0) {
            *error = "connection to " + peer_ + " closed after a protocol error";
            return E_VISA_CONNECTION_LOST;
        }
        const std::uint32_t xid = ++xid_;
        const std::string call = rpc::FrameRecord(rpc::BuildCall(xid, program_, version_,
                                                                 procedure, args));
        std::size_t sent = 0;
        HRESULT hr = SendAll(fd_.get(), call.data(), call.size(), until, peer_, &sent, error);
        if (FAILED(hr)) return Broken(hr, sent > 0 && sent < call.size());
        // Bytes received after an earlier call's record first, then more from
        // the wire, fed to the reader straight from the receive buffer.
        const std::string held = std::move(pending_);
        pending_.clear();
        std::string_view input(held);
        for (;;) {
            rpc::RecordReader::Status st = reader_.Feed(&input, record);
            if (st == rpc::RecordReader::Status::kTooLarge) {
                *error = "reply record from " + peer_ + " exceeds " + std::to_string(kMaxRecord) +
                         " bytes";
                return Broken(E_VISA_IO, true);
            }
            if (st == rpc::RecordReader::Status::kRecord) {
                std::uint32_t rxid = 0;
                rpc::AcceptStat stat = rpc::kSuccess;
                rpc::ReplyStatus rs = rpc::ParseReply(*record, &rxid, &stat, results);
                if (rs == rpc::ReplyStatus::kMalformed) {
                    *error = "malformed RPC reply from " + peer_;
                    return Broken(E_VISA_IO, true);
                }
                if (rxid != xid) continue;  // the late reply of an earlier call
                pending_.assign(input);      // what follows belongs to later calls
                if (rs == rpc::ReplyStatus::kDenied || stat != rpc::kSuccess) {
                    *error = "RPC call " + std::to_string(procedure) + " refused by " + peer_ +
                             " (status " + std::to_string(int(stat)) + ")";
                    return E_VISA_IO;
                }
                return S_OK;
            }
            std::size_t got = 0;
            hr = RecvSome(fd_.get(), rx_.data(), rx_.size(), until, peer_, &got, error);
            if (FAILED(hr)) return Broken(hr, hr != E_VISA_TIMEOUT);
            input = std::string_view(rx_.data(), got);
        }
    }

    void Close() { fd_.reset(); }

  private:
    HRESULT Broken(HRESULT hr, bool close) {
        if (close) Close();
        return hr;
    }

    FdHolder fd_;
    std::string peer_;
    std::uint32_t program_, version_;
    std::uint32_t xid_ = 0;
    rpc::RecordReader reader_;
    std::vector<char> rx_;
    std::string pending_;  // received after the last call's record, not yet fed to the reader
};

Deadline WithGrace(const Deadline& d) {
    if (d.infinite()) return d;
    return Deadline::FromTimeout(LONG(d.PollMs() + kReplyGrace.count()));
}

class Vxi11Transport final : public Transport {
  public:
    Vxi11Transport(std::unique_ptr<RpcConnection> core, std::string host, std::string peer)
        : core_(std::move(core)), host_(std::move(host)), peer_(std::move(peer)) {}
    ~Vxi11Transport() override { Close(); }

    // With lock_timeout_ms >= -1 the link is made holding the device lock,
    // waiting that long for it (-2: no lock).
    HRESULT CreateLink(const std::string& device, LONG lock_timeout_ms, const Deadline& deadline,
                       std::string* error);

    HRESULT Read(const ReadRequest& req, const Deadline& deadline, ReadResult* result,
                 std::string* error) override;
    HRESULT Write(const BYTE* data, std::size_t size, bool send_end, const Deadline& deadline,
                  std::size_t* written, std::string* error) override;
    HRESULT Clear(const Deadline& deadline, std::string* error) override;
    HRESULT ReadStatusByte(const Deadline& deadline, BYTE* stb, std::string* error) override;
    HRESULT Trigger(const Deadline& deadline, std::string* error) override;
    HRESULT Lock(LONG lock_timeout_ms, const Deadline& deadline, std::string* error) override;
    HRESULT Unlock(const Deadline& deadline, std::string* error) override;
    // Each read is a request: nothing arrives unasked.
    void DiscardInput() override {}
    void Close() override;
    bool HasEnd() const override { return true; }

  private:
    // A call whose results start with a device error code.
    HRESULT DeviceCall(std::uint32_t procedure, const std::string& args, const Deadline& deadline,
                       rpc::XdrReader* results, std::string* error);
    std::string GenericParms(const Deadline& deadline) const;
    // Ends the operation in progress on the device through the abort
    // channel (opened on first use); the text says how that went.
    std::string Abort();

    std::unique_ptr<RpcConnection> core_;
    std::unique_ptr<RpcConnection> abort_;  // the abort channel once opened
    std::string host_;
    std::string peer_;
    std::string record_;
    std::int32_t lid_ = -1;
    std::uint32_t max_recv_ = 1024;
    std::uint16_t abort_port_ = 0;  // 0: the device offers no abort channel
};

HRESULT Vxi11Transport::DeviceCall(std::uint32_t procedure, const std::string& args,
                                   const Deadline& deadline, rpc::XdrReader* results,
                                   std::string* error) {
    std::string_view res;
    HRESULT hr = core_->Call(procedure, args, WithGrace(deadline), &record_, &res, error);
    if (FAILED(hr)) {
        // The device overran its own I/O timeout: the operation is ended
        // there so that the next call is served (its late reply is dropped
        // by its xid).
        if (hr == E_VISA_TIMEOUT)
            *error = "timeout waiting for " + peer_ +
                     (procedure == kDestroyLink ? std::string() : "; " + Abort());
        return hr;
    }
    *results = rpc::XdrReader(res);
    std::int32_t dev_error = 0;
    if (!results->I32(&dev_error)) {
        *error = "short reply from " + peer_;
        core_->Close();
        return E_VISA_IO;
    }
    if (dev_error == kNoError) return S_OK;
    DeviceErrorInfo info{dev_error, E_VISA_IO, "device error"};
    for (const DeviceErrorInfo& e : kDeviceErrors)
        if (e.code == dev_error) info = e;
    *error = std::string(info.text) + " (VXI-11 error " + std::to_string(dev_error) + ") from " +
             peer_;
    return info.hr;
}

// Every operation waits for a lock held by another link as long as it may
// wait at all (waitlock, the time left as the lock timeout), then fails
// with "device locked by another link".
std::string Vxi11Transport::GenericParms(const Deadline& deadline) const {
    rpc::XdrWriter w;
    w.I32(lid_);
    w.U32(kFlagWaitLock);
    w.U32(IoTimeout(deadline));  // lock timeout
    w.U32(IoTimeout(deadline));  // I/O timeout
    return std::move(w.data());
}

std::string Vxi11Transport::Abort() {
    if (abort_port_ == 0) return "the device has no abort channel";
    std::string error;
    const Deadline deadline = Deadline::FromTimeout(kAbortTimeoutMs);
    if (!abort_) {
        FdHolder fd;
        if (FAILED(ConnectTcp(host_, abort_port_, deadline, &fd, &error)))
            return "abort channel: " + error;
        abort_ = std::make_unique<RpcConnection>(
            fd.release(), host_ + ":" + std::to_string(abort_port_), kAbortProgram, kVersion);
    }
    rpc::XdrWriter w;
    w.I32(lid_);
    std::string record;
    std::string_view results;
    if (FAILED(abort_->Call(kDeviceAbort, w.data(), deadline, &record, &results, &error))) {
        abort_.reset();  // opened again for the next abort
        return "abort channel: " + error;
    }
    rpc::XdrReader r(results);
    std::int32_t dev_error = 0;
    if (!r.I32(&dev_error)) return "abort channel: short reply";
    return dev_error == kNoError ? "the operation was aborted"
                                 : "abort refused (VXI-11 error " + std::to_string(dev_error) + ")";
}

HRESULT Vxi11Transport::CreateLink(const std::string& device, LONG lock_timeout_ms,
                                   const Deadline& deadline, std::string* error) {
    rpc::XdrWriter w;
    w.I32(std::int32_t(::getpid() & 0x7fffffff));  // client id
    w.Bool(lock_timeout_ms >= kTimeoutInfinite);     // lockDevice
    w.U32(lock_timeout_ms < 0 ? (lock_timeout_ms == kTimeoutInfinite ? kInfiniteIoTimeout : 0)
                              : std::uint32_t(lock_timeout_ms));
    w.Opaque(device);
    rpc::XdrReader r("");
    HRESULT hr = DeviceCall(kCreateLink, w.data(), deadline, &r, error);
    if (FAILED(hr)) return hr;
    std::uint32_t abort_port = 0;
    if (!r.I32(&lid_) || !r.U32(&abort_port) || !r.U32(&max_recv_)) {
        *error = "short create_link reply from " + peer_;
        return E_VISA_IO;
    }
    abort_port_ = abort_port <= 65535 ? std::uint16_t(abort_port) : 0;
    // A device that takes less than a byte per call could not be written to.
    max_recv_ = std::clamp<std::uint32_t>(max_recv_, 1, kMaxReadRequest);
    return S_OK;
}

HRESULT Vxi11Transport::Write(const BYTE* data, std::size_t size, bool send_end,
                              const Deadline& deadline, std::size_t* written,
                              std::string* error) {
    *written = 0;
    do {
        const std::size_t piece = std::min<std::size_t>(size - *written, max_recv_);
        const bool last = *written + piece == size;
        rpc::XdrWriter w;
        w.data().reserve(piece + 32);
        w.I32(lid_);
        w.U32(IoTimeout(deadline));
        w.U32(IoTimeout(deadline));
        w.U32(kFlagWaitLock | (last && send_end ? kFlagEnd : 0));
        w.Opaque({reinterpret_cast<const char*>(data) + *written, piece});
        rpc::XdrReader r("");
        HRESULT hr = DeviceCall(kDeviceWrite, w.data(), deadline, &r, error);
        if (FAILED(hr)) return hr;
        std::uint32_t accepted = 0;
        if (!r.U32(&accepted) || accepted > piece) {
            *error = "bad device_write reply from " + peer_;
            return E_VISA_IO;
        }
        if (accepted == 0 && piece > 0) {
            *error = "device at " + peer_ + " accepted no data";
            return E_VISA_IO;
        }
        *written += accepted;
    } while (*written < size);
    return S_OK;
}

HRESULT Vxi11Transport::Read(const ReadRequest& req, const Deadline& deadline, ReadResult* result,
                             std::string* error) {
    *result = ReadResult{};
    if (req.count == 0) return S_OK;
    for (bool first = true; result->bytes < req.count; first = false) {
        // A device that keeps answering with less than asked (and no END)
        // still ends by the deadline.
        if (!first && deadline.Expired()) {
            *error = "timeout reading from " + peer_;
            return E_VISA_TIMEOUT;
        }
        const std::uint32_t want =
            std::uint32_t(std::min<std::size_t>(req.count - result->bytes, kMaxReadRequest));
        rpc::XdrWriter w;
        w.I32(lid_);
        w.U32(want);
        w.U32(IoTimeout(deadline));
        w.U32(IoTimeout(deadline));
        w.U32(kFlagWaitLock | (req.term_char_enabled ? kFlagTermCharSet : 0));
        w.U32(req.term_char);
        rpc::XdrReader r("");
        HRESULT hr = DeviceCall(kDeviceRead, w.data(), deadline, &r, error);
        if (FAILED(hr)) return hr;
        std::uint32_t reason = 0;
        std::string_view data;
        if (!r.U32(&reason) || !r.Opaque(&data, want)) {
            *error = "bad device_read reply from " + peer_;
            core_->Close();
            return E_VISA_IO;
        }
        if (!data.empty()) std::memcpy(req.buf + result->bytes, data.data(), data.size());
        result->bytes += data.size();
        if (reason & kReasonEnd) {
            result->end = kReadEndEnd;
            return S_OK;
        }
        if ((reason & kReasonTermChar) && req.term_char_enabled) {
            result->end = kReadEndTermChar;
            return S_OK;
        }
        if (req.return_available && result->bytes > 0) {
            result->end = kReadEndAvailable;
            return S_OK;
        }
    }
    result->end = kReadEndCount;
    return S_OK;
}

HRESULT Vxi11Transport::Clear(const Deadline& deadline, std::string* error) {
    rpc::XdrReader r("");
    return DeviceCall(kDeviceClear, GenericParms(deadline), deadline, &r, error);
}

HRESULT Vxi11Transport::ReadStatusByte(const Deadline& deadline, BYTE* stb, std::string* error) {
    rpc::XdrReader r("");
    HRESULT hr = DeviceCall(kDeviceReadStb, GenericParms(deadline), deadline, &r, error);
    if (FAILED(hr)) return hr;
    std::uint32_t v = 0;
    if (!r.U32(&v)) {
        *error = "short device_readstb reply from " + peer_;
        return E_VISA_IO;
    }
    *stb = BYTE(v);
    return S_OK;
}

HRESULT Vxi11Transport::Trigger(const Deadline& deadline, std::string* error) {
    rpc::XdrReader r("");
    return DeviceCall(kDeviceTrigger, GenericParms(deadline), deadline, &r, error);
}

HRESULT Vxi11Transport::Lock(LONG lock_timeout_ms, const Deadline& deadline, std::string* error) {
    rpc::XdrWriter w;
    w.I32(lid_);
    w.U32(lock_timeout_ms == 0 ? 0 : kFlagWaitLock);
    w.U32(lock_timeout_ms < 0 ? kInfiniteIoTimeout : std::uint32_t(lock_timeout_ms));
    rpc::XdrReader r("");
    return DeviceCall(kDeviceLock, w.data(), deadline, &r, error);
}

HRESULT Vxi11Transport::Unlock(const Deadline& deadline, std::string* error) {
    rpc::XdrWriter w;
    w.I32(lid_);
    rpc::XdrReader r("");
    return DeviceCall(kDeviceUnlock, w.data(), deadline, &r, error);
}

void Vxi11Transport::Close() {
    if (!core_) return;
    if (lid_ >= 0) {
        rpc::XdrWriter w;
        w.I32(lid_);
        rpc::XdrReader r("");
        std::string ignored;
        DeviceCall(kDestroyLink, w.data(), Deadline::FromTimeout(kCloseTimeoutMs), &r, &ignored);
        lid_ = -1;
    }
    core_.reset();
    abort_.reset();
}

// The core channel's port from the portmapper of host.
HRESULT PortFromPortmapper(const std::string& host, const Deadline& deadline, std::uint16_t* port,
                           std::string* error) {
    FdHolder fd;
    HRESULT hr = ConnectTcp(host, kPortmapPort, deadline, &fd, error);
    if (FAILED(hr)) {
        *error = "no portmapper: " + *error;
        return hr;
    }
    RpcConnection pm(fd.release(), host + ":111", rpc::kPortmapProgram, rpc::kPortmapVersion);
    rpc::XdrWriter w;
    for (std::uint32_t v : {kCoreProgram, kVersion, rpc::kProtocolTcp, 0u}) w.U32(v);
    std::string record;
    std::string_view results;
    hr = pm.Call(rpc::kPortmapGetPort, w.data(), deadline, &record, &results, error);
    if (FAILED(hr)) return E_VISA_RESOURCE_NOT_FOUND;
    rpc::XdrReader r(results);
    std::uint32_t p = 0;
    if (!r.U32(&p) || p == 0 || p > 65535) {
        *error = "no VXI-11 server registered with the portmapper of " + host;
        return E_VISA_RESOURCE_NOT_FOUND;
    }
    *port = std::uint16_t(p);
    return S_OK;
}

}  // namespace

namespace {

constexpr LONG kNoLinkLock = -2;

HRESULT OpenVxi11(const ResourceName& name, LONG open_timeout_ms, LONG lock_timeout_ms,
                  std::unique_ptr<Transport>* out, std::string* error) {
    const Deadline deadline = Deadline::FromTimeout(open_timeout_ms);
    std::uint16_t port = name.port;
    HRESULT hr = port ? S_OK : PortFromPortmapper(name.host, deadline, &port, error);
    if (FAILED(hr)) return hr;
    FdHolder fd;
    hr = ConnectTcp(name.host, port, deadline, &fd, error);
    if (FAILED(hr)) return hr;
    const std::string peer = name.host + ":" + std::to_string(port);
    auto transport = std::make_unique<Vxi11Transport>(
        std::make_unique<RpcConnection>(fd.release(), peer, kCoreProgram, kVersion), name.host,
        peer);
    hr = transport->CreateLink(name.device_name, lock_timeout_ms, deadline, error);
    if (FAILED(hr)) {
        *error = "create_link '" + name.device_name + "': " + *error;
        return hr == E_VISA_RSRC_LOCKED ? hr : E_VISA_RESOURCE_NOT_FOUND;
    }
    *out = std::move(transport);
    return S_OK;
}

}  // namespace

HRESULT OpenVxi11Transport(const ResourceName& name, LONG open_timeout_ms,
                           std::unique_ptr<Transport>* out, std::string* error) {
    return OpenVxi11(name, open_timeout_ms, kNoLinkLock, out, error);
}

HRESULT OpenVxi11TransportLocked(const ResourceName& name, LONG open_timeout_ms,
                                 std::unique_ptr<Transport>* out, std::string* error) {
    return OpenVxi11(name, open_timeout_ms, open_timeout_ms, out, error);
}

}  // namespace qn::visa

// ONC RPC over TCP, as far as VXI-11 needs it: XDR encoding of the basic
// types, record marking, and the call and reply messages with null
// authentication. Pure functions and small value types (no I/O), shared by
// the VXI-11 client transport and the emulator's VXI-11 and portmapper
// servers. Every length read from the wire is checked against a bound before
// anything is allocated or copied.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace qn::rpc {

// Programs and procedures used.
inline constexpr std::uint32_t kPortmapProgram = 100000;
inline constexpr std::uint32_t kPortmapVersion = 2;
inline constexpr std::uint32_t kPortmapGetPort = 3;
inline constexpr std::uint32_t kRpcbGetAddr = 3;  // rpcbind versions 3 and 4
inline constexpr std::uint32_t kProtocolTcp = 6;
inline constexpr std::uint32_t kProtocolUdp = 17;

// Accept states of a reply.
enum AcceptStat : std::uint32_t {
    kSuccess = 0,
    kProgUnavail = 1,
    kProgMismatch = 2,
    kProcUnavail = 3,
    kGarbageArgs = 4,
    kSystemErr = 5,
};

// XDR encoding into a growing buffer.
class XdrWriter {
  public:
    void U32(std::uint32_t v);
    void I32(std::int32_t v) { U32(static_cast<std::uint32_t>(v)); }
    void Bool(bool v) { U32(v ? 1 : 0); }
    // Variable-length opaque data or string: length, bytes, zero padding.
    void Opaque(std::string_view bytes);
    std::string& data() { return buf_; }

  private:
    std::string buf_;
};

// XDR decoding of a received message; every read fails (false) instead of
// running past the end, and variable-length items are refused above max.
class XdrReader {
  public:
    explicit XdrReader(std::string_view data) : data_(data) {}
    bool U32(std::uint32_t* v);
    bool I32(std::int32_t* v);
    // A view into the message (valid while the message is).
    bool Opaque(std::string_view* out, std::size_t max);
    std::size_t left() const { return data_.size() - pos_; }

  private:
    std::string_view data_;
    std::size_t pos_ = 0;
};

// Record marking on a stream: each record is one or more fragments, each
// preceded by four bytes holding the last-fragment bit and the length.
std::string FrameRecord(std::string_view body);

// Collects records from a stream. Bytes go in as they arrive; complete
// records come out. A record longer than the bound is an error, detected
// from its fragment headers before its data is held.
class RecordReader {
  public:
    enum class Status { kNeedMore, kRecord, kTooLarge };
    explicit RecordReader(std::size_t max_record) : max_(max_record) {}

    // Takes bytes from *input (advancing it) until a record is complete
    // (kRecord, the record in *record) or the input is used up (kNeedMore).
    // After kTooLarge the stream cannot be followed any more.
    Status Feed(std::string_view* input, std::string* record);
    // How many bytes the current fragment still needs (0 in a header): lets
    // a caller receive large fragments straight into place.
    std::size_t FragmentLeft() const { return in_header_ ? 0 : frag_left_; }
    void Reset();

  private:
    std::size_t max_;
    std::string record_;
    unsigned char header_[4] = {};
    std::size_t header_have_ = 0;
    bool in_header_ = true;
    bool last_ = false;
    std::size_t frag_left_ = 0;
    bool broken_ = false;
};

// A call with null credentials and verifier (the whole message, not framed).
std::string BuildCall(std::uint32_t xid, std::uint32_t program, std::uint32_t version,
                      std::uint32_t procedure, std::string_view args);

struct CallHeader {
    std::uint32_t xid = 0;
    std::uint32_t program = 0;
    std::uint32_t version = 0;
    std::uint32_t procedure = 0;
};
// Parses a call message; *args views the procedure's arguments.
bool ParseCall(std::string_view message, CallHeader* call, std::string_view* args);

// An accepted reply with a null verifier (not framed). For kProgMismatch
// the results are the low and high versions supported.
std::string BuildReply(std::uint32_t xid, AcceptStat stat, std::string_view results);

enum class ReplyStatus {
    kAccepted,   // *stat says how; *results views the results on kSuccess
    kDenied,     // rejected (RPC version or authentication)
    kMalformed,  // not a reply, or cut short
};
ReplyStatus ParseReply(std::string_view message, std::uint32_t* xid, AcceptStat* stat,
                       std::string_view* results);

}  // namespace qn::rpc

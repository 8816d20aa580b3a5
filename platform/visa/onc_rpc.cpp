#include "platform/visa/onc_rpc.h"

namespace qn::rpc {
namespace {

constexpr std::uint32_t kCall = 0;
constexpr std::uint32_t kReply = 1;
constexpr std::uint32_t kRpcVersion = 2;
constexpr std::uint32_t kMsgAccepted = 0;
constexpr std::uint32_t kLastFragment = 0x80000000u;
constexpr std::size_t kMaxAuthBody = 400;  // the protocol's limit

std::size_t Padded(std::size_t n) {
    return (n + 3) & ~std::size_t{3};
}

// Skips an authentication field (flavor, opaque body).
bool SkipAuth(XdrReader& r) {
    std::uint32_t flavor = 0;
    std::string_view body;
    return r.U32(&flavor) && r.Opaque(&body, kMaxAuthBody);
}

}  // namespace

void XdrWriter::U32(std::uint32_t v) {
    const char b[4] = {char(v >> 24), char(v >> 16), char(v >> 8), char(v)};
    buf_.append(b, 4);
}

void XdrWriter::Opaque(std::string_view bytes) {
    U32(static_cast<std::uint32_t>(bytes.size()));
    buf_.append(bytes);
    buf_.append(Padded(bytes.size()) - bytes.size(), '\0');
}

bool XdrReader::U32(std::uint32_t* v) {
    if (left() < 4) return false;
    const auto* p = reinterpret_cast<const unsigned char*>(data_.data() + pos_);
    *v = std::uint32_t(p[0]) << 24 | std::uint32_t(p[1]) << 16 | std::uint32_t(p[2]) << 8 | p[3];
    pos_ += 4;
    return true;
}

bool XdrReader::I32(std::int32_t* v) {
    std::uint32_t u = 0;
    if (!U32(&u)) return false;
    *v = static_cast<std::int32_t>(u);
    return true;
}

bool XdrReader::Opaque(std::string_view* out, std::size_t max) {
    std::uint32_t n = 0;
    if (!U32(&n) || n > max || Padded(n) > left()) return false;
    *out = data_.substr(pos_, n);
    pos_ += Padded(n);
    return true;
}

std::string FrameRecord(std::string_view body) {
    XdrWriter w;
    w.U32(kLastFragment | static_cast<std::uint32_t>(body.size()));
    w.data().append(body);
    return std::move(w.data());
}

void RecordReader::Reset() {
    record_.clear();
    header_have_ = 0;
    in_header_ = true;
    last_ = false;
    frag_left_ = 0;
    broken_ = false;
}

RecordReader::Status RecordReader::Feed(std::string_view* input, std::string* record) {
    if (broken_) return Status::kTooLarge;
    while (!input->empty() || (!in_header_ && frag_left_ == 0)) {
        if (in_header_) {
            while (header_have_ < 4 && !input->empty()) {
                header_[header_have_++] = static_cast<unsigned char>(input->front());
                input->remove_prefix(1);
            }
            if (header_have_ < 4) return Status::kNeedMore;
            const std::uint32_t h = std::uint32_t(header_[0]) << 24 |
                                    std::uint32_t(header_[1]) << 16 |
                                    std::uint32_t(header_[2]) << 8 | header_[3];
            header_have_ = 0;
            last_ = (h & kLastFragment) != 0;
            frag_left_ = h & ~kLastFragment;
            if (frag_left_ > max_ - record_.size()) {
                broken_ = true;
                record_.clear();
                return Status::kTooLarge;
            }
            in_header_ = false;
            record_.reserve(record_.size() + frag_left_);  // within the bound checked above
        }
        const std::size_t take = std::min(frag_left_, input->size());
        record_.append(input->substr(0, take));
        input->remove_prefix(take);
        frag_left_ -= take;
        if (frag_left_ > 0) return Status::kNeedMore;
        in_header_ = true;
        if (last_) {
            record->swap(record_);
            record_.clear();
            return Status::kRecord;
        }
    }
    return Status::kNeedMore;
}

std::string BuildCall(std::uint32_t xid, std::uint32_t program, std::uint32_t version,
                      std::uint32_t procedure, std::string_view args) {
    XdrWriter w;
    w.data().reserve(40 + args.size());
    for (std::uint32_t v : {xid, kCall, kRpcVersion, program, version, procedure, 0u, 0u, 0u, 0u})
        w.U32(v);
    w.data().append(args);
    return std::move(w.data());
}

bool ParseCall(std::string_view message, CallHeader* call, std::string_view* args) {
    XdrReader r(message);
    std::uint32_t type = 0, rpcvers = 0;
    if (!r.U32(&call->xid) || !r.U32(&type) || type != kCall || !r.U32(&rpcvers) ||
        rpcvers != kRpcVersion || !r.U32(&call->program) || !r.U32(&call->version) ||
        !r.U32(&call->procedure) || !SkipAuth(r) || !SkipAuth(r))
        return false;
    *args = message.substr(message.size() - r.left());
    return true;
}

std::string BuildReply(std::uint32_t xid, AcceptStat stat, std::string_view results) {
    XdrWriter w;
    for (std::uint32_t v : {xid, kReply, kMsgAccepted, 0u, 0u, std::uint32_t(stat)}) w.U32(v);
    w.data().append(results);
    return std::move(w.data());
}

ReplyStatus ParseReply(std::string_view message, std::uint32_t* xid, AcceptStat* stat,
                       std::string_view* results) {
    XdrReader r(message);
    std::uint32_t type = 0, reply_stat = 0, accept = 0;
    if (!r.U32(xid) || !r.U32(&type) || type != kReply || !r.U32(&reply_stat))
        return ReplyStatus::kMalformed;
    if (reply_stat != kMsgAccepted) return ReplyStatus::kDenied;
    if (!SkipAuth(r) || !r.U32(&accept)) return ReplyStatus::kMalformed;
    *stat = static_cast<AcceptStat>(accept);
    *results = message.substr(message.size() - r.left());
    return ReplyStatus::kAccepted;
}

}  // namespace qn::rpc

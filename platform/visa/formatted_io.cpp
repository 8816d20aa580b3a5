// The read side and the object plumbing of FormattedIO; the write side is
// in formatted_write.cpp.
#include "platform/visa/formatted_io.h"

#include <algorithm>
#include <cstring>

#include "platform/visa/errors.h"
#include "platform/visa/formatted_convert.h"
#include "platform/visa/operation_scope.h"

namespace qn::visa {
namespace {

constexpr GUID kFormattedIid = iid_of<IFormattedIO488>;
constexpr std::size_t kDefaultBufferSize = 4096;
constexpr std::size_t kMinBufferSize = 16;

bool IsBlank(char c) {
    return c == ' ' || c == '\t' || c == '\r';
}
bool IsFieldEnd(char c) {
    return IsBlank(c) || c == ',' || c == ';' || c == '\n';
}

}  // namespace

FormattedIO::FormattedIO() : rbuf_(kDefaultBufferSize), wsize_(kDefaultBufferSize) {}

HRESULT FormattedIO::Bound() const {
    return io_ ? S_OK
               : Report(E_VISA_INVALID_OBJECT, kFormattedIid,
                        "no session bound to the IO property");
}

Deadline FormattedIO::OpDeadline() const {
    LONG ms = kDefaultTimeoutMs;
    io_->get_Timeout(&ms);
    return Deadline::FromTimeout(ms);
}

std::string_view FormattedIO::Pending() const {
    return {reinterpret_cast<const char*>(rbuf_.data()) + rpos_, rend_ - rpos_};
}

void FormattedIO::Consume(std::size_t n) {
    rpos_ += n;
    if (rpos_ == rend_) rpos_ = rend_ = 0;
}

HRESULT FormattedIO::Fill(const Deadline& deadline, DWORD extra) {
    if (deadline.Expired())
        return Report(E_VISA_TIMEOUT, kFormattedIid, "timeout reading the reply");
    if (rpos_ > 0) {
        std::memmove(rbuf_.data(), rbuf_.data() + rpos_, rend_ - rpos_);
        rend_ -= rpos_;
        rpos_ = 0;
    }
    if (rend_ == rbuf_.size())
        return Report(E_VISA_INVALID_FORMAT, kFormattedIid,
                      "reply item longer than the read buffer");
    LONG got = 0, end = kReadEndCount;
    HRESULT hr = direct_->ReadInto(rbuf_.data() + rend_, LONG(rbuf_.size() - rend_),
                                   kReadAvailable | extra, &got, &end);
    rend_ += std::size_t(got);
    if (got > 0 || SUCCEEDED(hr)) {
        open_message_ = !(end == kReadEndTermChar || end == kReadEndEnd);
        last_end_ = end;
    }
    return hr;
}

// After a failed read nothing buffered of that reply can be trusted (a late
// rest of it would be taken for the next reply): forget it.
HRESULT FormattedIO::Settle(HRESULT hr) {
    if (FAILED(hr)) {
        rpos_ = rend_ = 0;
        open_message_ = false;
    }
    return hr;
}

// Waits for a new message when nothing of one is pending.
HRESULT FormattedIO::StartMessage(const Deadline& deadline) {
    if (rpos_ < rend_ || open_message_) return S_OK;
    return Fill(deadline);
}

HRESULT FormattedIO::ReadRest(const Deadline& deadline, std::string* out, DWORD extra) {
    out->clear();
    HRESULT hr = StartMessage(deadline);
    for (;;) {
        if (FAILED(hr)) return hr;
        out->append(Pending());
        Consume(rend_ - rpos_);
        if (!open_message_) return S_OK;
        if (LONGLONG(out->size()) > max_block_)
            return Resync(E_VISA_INVALID_FORMAT, "reply longer than the largest block accepted");
        hr = Fill(deadline, extra);
    }
}

// Skips blanks and separators; *at_end when the message has no more fields.
HRESULT FormattedIO::SkipSeparators(const Deadline& deadline, bool* at_end) {
    HRESULT hr = StartMessage(deadline);
    for (;;) {
        if (FAILED(hr)) return hr;
        std::string_view p = Pending();
        std::size_t i = 0;
        while (i < p.size() && (IsBlank(p[i]) || p[i] == ',' || p[i] == ';')) ++i;
        Consume(i);
        if (i < p.size()) {
            *at_end = p[i] == '\n';
            return S_OK;
        }
        if (!open_message_) {
            *at_end = true;
            return S_OK;
        }
        hr = Fill(deadline);
    }
}

// One field of the reply as type: a number for the numeric types (parsing
// stops where the number does), a blank- or separator-delimited token for
// BSTR and Any.
HRESULT FormattedIO::ReadField(LONG type, const Deadline& deadline, VARIANT* out) {
    VARTYPE vt = VT_EMPTY;
    if (HRESULT bad = fmt::AsciiTypeOrError(type, &vt); FAILED(bad)) return bad;
    bool at_end = false;
    HRESULT hr = SkipSeparators(deadline, &at_end);
    if (FAILED(hr)) return hr;
    if (at_end) return Report(E_VISA_INVALID_FORMAT, kFormattedIid, "no value left in the reply");
    for (;;) {
        std::string_view p = Pending();
        std::size_t used = 0;
        bool complete = false;
        if (vt == VT_BSTR || vt == VT_VARIANT) {
            while (used < p.size() && !IsFieldEnd(p[used])) ++used;
            complete = used < p.size() || !open_message_;
        } else {
            double v = 0;
            NumberParse r = ParseNumber(p, !open_message_, &v, &used);
            if (r == NumberParse::kNoNumber)
                return Report(E_VISA_INVALID_FORMAT, kFormattedIid,
                              "reply '" + std::string(p.substr(0, 40)) + "' holds no number");
            complete = r == NumberParse::kOk;
        }
        if (complete) {
            std::string error;
            hr = fmt::FieldToVariant(p.substr(0, used), vt, out, &error);
            Consume(used);
            return FAILED(hr) ? Report(hr, kFormattedIid, error) : hr;
        }
        hr = Fill(deadline);
        if (FAILED(hr)) return hr;
    }
}

HRESULT FormattedIO::DrainMessage(const Deadline& deadline) {
    if (!open_message_) {
        rpos_ = rend_ = 0;  // the buffer ends where the message does
        return S_OK;
    }
    // The message ends at the termination character when it is enabled;
    // without it, at END, or on a bus without END at the line feed.
    VARIANT_BOOL has_end = VARIANT_FALSE, term_enabled = VARIANT_FALSE;
    BYTE term = '\n';
    direct_->get_HasEnd(&has_end);
    io_->get_TerminationCharacterEnabled(&term_enabled);
    if (term_enabled) io_->get_TerminationCharacter(&term);
    if (term_enabled || !has_end) {
        // Bytes buffered while that character did not end reads may hold
        // the message's end; what follows it belongs to the next message.
        const void* hit = std::memchr(rbuf_.data() + rpos_, term, rend_ - rpos_);
        if (hit) {
            Consume(std::size_t(static_cast<const BYTE*>(hit) - (rbuf_.data() + rpos_)) + 1);
            open_message_ = false;
            return S_OK;
        }
    }
    rpos_ = rend_ = 0;
    const DWORD flags = term_enabled ? kReadDefault : kReadToMessageEnd;
    BYTE scratch[4096];
    while (open_message_) {
        if (deadline.Expired())
            return Report(E_VISA_TIMEOUT, kFormattedIid, "timeout flushing the reply");
        LONG got = 0, end = kReadEndCount;
        HRESULT hr = direct_->ReadInto(scratch, LONG(sizeof scratch), flags, &got, &end);
        if (FAILED(hr)) {
            open_message_ = false;
            return hr;
        }
        open_message_ = end == kReadEndCount;
    }
    return S_OK;
}

// After a malformed block: nothing of the reply can be trusted, so drop the
// buffer and what the session has received.
HRESULT FormattedIO::Resync(HRESULT hr, const std::string& why) {
    rpos_ = rend_ = 0;
    open_message_ = false;
    io_->Clear();
    return Report(hr, kFormattedIid, why);
}

HRESULT FormattedIO::ReadBlockHeader(bool seek, const Deadline& deadline, BlockHeader* h) {
    HRESULT hr = StartMessage(deadline);
    for (;;) {
        if (FAILED(hr)) return hr;
        std::string_view p = Pending();
        std::size_t skip = 0;
        while (skip < p.size() && p[skip] != '#' && (seek || IsBlank(p[skip]))) ++skip;
        Consume(skip);
        p = Pending();
        BlockParse r = ParseBlockHeader(p, std::uint64_t(max_block_), h);
        if (r == BlockParse::kOk) {
            Consume(h->header_size);
            return S_OK;
        }
        if (r == BlockParse::kTooLarge)
            return Resync(E_VISA_INVALID_FORMAT, "block header declares more than " +
                                                     std::to_string(max_block_) + " bytes");
        if (r != BlockParse::kNeedMore || !open_message_)
            return Resync(E_VISA_INVALID_FORMAT,
                          p.empty()
                              ? "reply holds no block"
                              : "malformed block header '" + std::string(p.substr(0, 12)) + "'");
        hr = Fill(deadline);
    }
}

HRESULT FormattedIO::ReadDefiniteBody(std::size_t length, BYTE* dst, std::size_t room,
                                      const Deadline& deadline, BlockResult* result) {
    result->total = length;
    // What the read buffer already holds.
    std::size_t have = std::min(rend_ - rpos_, length);
    std::size_t keep = std::min(have, room);
    if (keep) std::memcpy(dst, rbuf_.data() + rpos_, keep);
    Consume(have);
    // A read that stopped at a termination character which turned out to be
    // block data did not reach the end of the message.
    if (have && rpos_ == rend_ && last_end_ == kReadEndTermChar) open_message_ = true;
    result->stored = keep;
    std::size_t done = have;
    BYTE scratch[4096];
    while (done < length) {
        if (deadline.Expired())
            return Report(E_VISA_TIMEOUT, kFormattedIid, "timeout reading the block");
        const bool into_dst = result->stored < room;
        BYTE* where = into_dst ? dst + result->stored : scratch;
        std::size_t want = into_dst ? std::min(length - done, room - result->stored)
                                    : std::min(length - done, sizeof scratch);
        LONG got = 0, end = kReadEndCount;
        open_message_ = true;
        HRESULT hr = direct_->ReadInto(where, LONG(want), kReadIgnoreTermChar, &got, &end);
        done += std::size_t(got);
        if (into_dst) result->stored += std::size_t(got);
        if (FAILED(hr)) return hr;
        if (end == kReadEndEnd && done < length) {
            open_message_ = false;
            return Report(E_VISA_IO, kFormattedIid,
                          "block ended after " + std::to_string(done) + " of " +
                              std::to_string(length) + " bytes");
        }
    }
    return S_OK;
}

// The data of a "#0" block: everything up to the end of the message, the
// line feed that ends it removed. On a bus with END the data may hold line
// feeds (a read that stopped at one was not the end); without END the first
// line feed is the end, whatever the termination-character setting.
HRESULT FormattedIO::ReadIndefiniteBody(const Deadline& deadline, std::string* data) {
    VARIANT_BOOL has_end = VARIANT_FALSE;
    direct_->get_HasEnd(&has_end);
    if (has_end != VARIANT_FALSE) {
        if (last_end_ == kReadEndTermChar) open_message_ = true;
    } else if (open_message_) {
        const std::string_view p = Pending();
        const std::size_t lf = p.find('\n');
        if (lf != std::string_view::npos) {
            data->assign(p.substr(0, lf));
            Consume(lf + 1);
            open_message_ = false;
            return S_OK;
        }
    }
    HRESULT hr = ReadRest(deadline, data, kReadToMessageEnd);
    if (FAILED(hr)) return hr;
    if (!data->empty() && data->back() == '\n') data->pop_back();
    return S_OK;
}

HRESULT FormattedIO::ReadBlock(std::size_t elem, bool seek, bool flush, BlockTarget& target,
                               BlockResult* result) {
    const Deadline deadline = OpDeadline();
    BlockHeader h;
    HRESULT hr = ReadBlockHeader(seek, deadline, &h);
    if (FAILED(hr)) return hr;
    BYTE* dst = nullptr;
    std::size_t room = 0;
    if (h.indefinite) {
        std::string data;
        hr = ReadIndefiniteBody(deadline, &data);
        if (FAILED(hr)) return hr;
        if (data.size() % elem)
            return Report(E_VISA_INVALID_FORMAT, kFormattedIid,
                          "block length is not a whole number of elements");
        hr = target.Place(data.size(), &dst, &room);
        if (FAILED(hr)) return hr;
        result->total = data.size();
        result->stored = std::min(room, data.size());
        if (result->stored) std::memcpy(dst, data.data(), result->stored);
        return S_OK;
    }
    if (h.length % elem)
        return Resync(E_VISA_INVALID_FORMAT, "block of " + std::to_string(h.length) +
                                                 " bytes is not a whole number of " +
                                                 std::to_string(elem) + "-byte elements");
    hr = target.Place(std::size_t(h.length), &dst, &room);
    if (FAILED(hr)) return hr;
    hr = ReadDefiniteBody(std::size_t(h.length), dst, room, deadline, result);
    if (FAILED(hr)) return hr;
    return flush ? DrainMessage(deadline) : S_OK;
}

HRESULT FormattedIO::ReadIEEEBlock(LONG type, VARIANT_BOOL seekToBlock, VARIANT_BOOL flushToEND,
                                   VARIANT* pData) {
    if (!pData) return E_POINTER;
    VARTYPE vt = VT_EMPTY;
    if (HRESULT bad = fmt::BinaryTypeOrError(type, &vt); FAILED(bad)) return bad;
    return Guard(kFormattedIid, [&] {
        std::lock_guard<std::mutex> lock(m_);
        if (HRESULT b = Bound(); FAILED(b)) return b;
        OperationScope op(direct_.get());
        const std::size_t elem = fmt::PlainElementSize(vt);
        struct ArrayTarget final : BlockTarget {
            VARTYPE vt;
            std::size_t elem;
            qn::com::SafeArray array;
            HRESULT Place(std::size_t bytes, BYTE** dst, std::size_t* room) override {
                array = qn::com::SafeArray::Vector(vt, ULONG(bytes / elem));
                if (!array)
                    return Report(E_OUTOFMEMORY, kFormattedIid, "out of memory for the block");
                *dst = array.data<BYTE>();
                *room = bytes;
                return S_OK;
            }
        } target;
        target.vt = vt;
        target.elem = elem;
        BlockResult r;
        HRESULT hr = Settle(
            ReadBlock(elem, seekToBlock != VARIANT_FALSE, flushToEND != VARIANT_FALSE, target, &r));
        if (FAILED(hr)) return hr;
        if (elem > 1 && fmt::NeedsSwap(big_endian_))
            fmt::SwapBytes(target.array.data<BYTE>(), r.stored, elem);
        VariantClear(pData);
        pData->vt = VARTYPE(VT_ARRAY | vt);
        pData->parray = target.array.Detach();
        return S_OK;
    });
}

HRESULT FormattedIO::ReadIEEEBlockInto(LONG type, void* buf, LONG maxCount, LONG* pActualCount,
                                       VARIANT_BOOL seekToBlock, VARIANT_BOOL flushToEND) {
    if (!pActualCount || (!buf && maxCount > 0)) return E_POINTER;
    *pActualCount = 0;
    const VARTYPE vt = fmt::BinaryElementType(type);
    if (vt == VT_EMPTY || maxCount < 0)
        return Report(E_INVALIDARG, kFormattedIid, "unknown binary type or negative count");
    return Guard(kFormattedIid, [&] {
        std::lock_guard<std::mutex> lock(m_);
        if (HRESULT b = Bound(); FAILED(b)) return b;
        OperationScope op(direct_.get());
        const std::size_t elem = fmt::PlainElementSize(vt);
        struct BufferTarget final : BlockTarget {
            BYTE* buf;
            std::size_t room;
            HRESULT Place(std::size_t, BYTE** dst, std::size_t* r) override {
                *dst = buf;
                *r = room;
                return S_OK;
            }
        } target;
        target.buf = static_cast<BYTE*>(buf);
        target.room = std::size_t(maxCount) * elem;
        BlockResult r;
        HRESULT hr = Settle(
            ReadBlock(elem, seekToBlock != VARIANT_FALSE, flushToEND != VARIANT_FALSE, target, &r));
        if (elem > 1 && fmt::NeedsSwap(big_endian_)) fmt::SwapBytes(buf, r.stored, elem);
        *pActualCount = LONG(r.stored / elem);
        if (FAILED(hr)) return hr;
        if (r.total > r.stored)
            return Report(E_VISA_USER_BUFFER, kFormattedIid,
                          "block of " + std::to_string(r.total / elem) + " elements, room for " +
                              std::to_string(maxCount));
        return S_OK;
    });
}

HRESULT FormattedIO::ReadIEEEBlockToSink(LONG type, IBlockSink* sink, LONG* pActualCount,
                                         VARIANT_BOOL seekToBlock, VARIANT_BOOL flushToEND) {
    if (!pActualCount || !sink) return E_POINTER;
    *pActualCount = 0;
    const VARTYPE vt = fmt::BinaryElementType(type);
    if (vt == VT_EMPTY)
        return Report(E_INVALIDARG, kFormattedIid, "unknown binary type");
    return Guard(kFormattedIid, [&] {
        std::lock_guard<std::mutex> lock(m_);
        if (HRESULT b = Bound(); FAILED(b)) return b;
        const std::size_t elem = fmt::PlainElementSize(vt);
        struct SinkTarget final : BlockTarget {
            IBlockSink* sink;
            BYTE* data = nullptr;
            std::size_t refused = 0;
            HRESULT Place(std::size_t bytes, BYTE** dst, std::size_t* room) override {
                data = bytes ? sink->Reserve(bytes) : nullptr;
                if (!data) refused = bytes;
                *dst = data;
                *room = data ? bytes : 0;
                return S_OK;
            }
        } target;
        target.sink = sink;
        BlockResult r;
        // A refused reservation still reads the block to its end (into
        // nothing), so the next reply is not taken from the middle of this one.
        HRESULT hr = Settle(
            ReadBlock(elem, seekToBlock != VARIANT_FALSE, flushToEND != VARIANT_FALSE, target, &r));
        if (FAILED(hr)) return hr;
        if (target.refused)
            return Report(E_OUTOFMEMORY, kFormattedIid,
                          "no room for a block of " + std::to_string(target.refused) + " bytes");
        if (elem > 1 && fmt::NeedsSwap(big_endian_)) fmt::SwapBytes(target.data, r.stored, elem);
        *pActualCount = LONG(r.stored / elem);
        return S_OK;
    });
}

HRESULT FormattedIO::ReadString(BSTR* pString) {
    if (!pString) return E_POINTER;
    *pString = nullptr;
    return Guard(kFormattedIid, [&] {
        std::lock_guard<std::mutex> lock(m_);
        if (HRESULT b = Bound(); FAILED(b)) return b;
        OperationScope op(direct_.get());
        std::string text;
        HRESULT hr = Settle(ReadRest(OpDeadline(), &text));
        if (FAILED(hr)) return hr;
        *pString = qn::com::Utf8ToBstr(text);
        return *pString ? S_OK : E_OUTOFMEMORY;
    });
}

HRESULT FormattedIO::ReadNumber(LONG type, VARIANT_BOOL flushToEND, VARIANT* pData) {
    if (!pData) return E_POINTER;
    return Guard(kFormattedIid, [&] {
        std::lock_guard<std::mutex> lock(m_);
        if (HRESULT b = Bound(); FAILED(b)) return b;
        OperationScope op(direct_.get());
        const Deadline deadline = OpDeadline();
        qn::com::Variant value;
        HRESULT hr = ReadField(type, deadline, &value);
        if (flushToEND != VARIANT_FALSE) {
            HRESULT flushed = DrainMessage(deadline);
            if (SUCCEEDED(hr)) hr = flushed;
        }
        if (FAILED(Settle(hr))) return hr;
        return VariantCopy(pData, &value);
    });
}

HRESULT FormattedIO::ReadList(LONG type, BSTR listSeparator, VARIANT* pData) {
    if (!pData) return E_POINTER;
    VARTYPE vt = VT_EMPTY;
    if (HRESULT bad = fmt::AsciiTypeOrError(type, &vt); FAILED(bad)) return bad;
    return Guard(kFormattedIid, [&] {
        std::lock_guard<std::mutex> lock(m_);
        if (HRESULT b = Bound(); FAILED(b)) return b;
        OperationScope op(direct_.get());
        std::string text;
        HRESULT hr = Settle(ReadRest(OpDeadline(), &text));
        if (FAILED(hr)) return hr;
        std::string seps = listSeparator ? qn::com::BstrToUtf8(listSeparator) : std::string();
        if (seps.empty()) seps = ",";
        while (!text.empty() && (text.back() == '\n' || IsBlank(text.back()))) text.pop_back();
        std::vector<std::string_view> fields;
        for (std::size_t start = 0; !text.empty();) {
            std::size_t cut = text.find_first_of(seps, start);
            fields.push_back(std::string_view(text).substr(start, cut - start));
            if (cut == std::string::npos) break;
            start = cut + 1;
        }
        qn::com::SafeArray array = qn::com::SafeArray::Vector(vt, ULONG(fields.size()));
        if (!array) return Report(E_OUTOFMEMORY, kFormattedIid, "out of memory for the list");
        const std::size_t elem = SafeArrayGetElemsize(array.get());
        for (std::size_t i = 0; i < fields.size(); ++i) {
            qn::com::Variant v;
            std::string error;
            hr = fmt::FieldToVariant(fields[i], vt, &v, &error);
            if (FAILED(hr))
                return Report(hr, kFormattedIid,
                              "list element " + std::to_string(i) + ": " + error);
            hr = fmt::StoreElement(v, vt, array.data<BYTE>() + i * elem);
            if (FAILED(hr)) return hr;
        }
        VariantClear(pData);
        pData->vt = VARTYPE(VT_ARRAY | vt);
        pData->parray = array.Detach();
        return S_OK;
    });
}

HRESULT FormattedIO::FlushRead() {
    return Guard(kFormattedIid, [&] {
        std::lock_guard<std::mutex> lock(m_);
        if (HRESULT b = Bound(); FAILED(b)) return b;
        OperationScope op(direct_.get());
        return DrainMessage(OpDeadline());
    });
}

HRESULT FormattedIO::get_IO(IMessage** ppIO) {
    if (!ppIO) return E_POINTER;
    std::lock_guard<std::mutex> lock(m_);
    return io_.CopyTo(ppIO);
}

HRESULT FormattedIO::put_IO(IMessage* pIO) {
    return Guard(kFormattedIid, [&] {
        std::lock_guard<std::mutex> lock(m_);
        ComPtr<IMessageDirect> direct;
        if (pIO && FAILED(pIO->QueryInterface(iid_of<IMessageDirect>, direct.OutVoid())))
            return Report(E_NOINTERFACE, kFormattedIid, "the session offers no direct message I/O");
        io_ = ComPtr<IMessage>(pIO);
        direct_ = direct;
        rpos_ = rend_ = 0;
        open_message_ = false;
        wbuf_.clear();
        return S_OK;
    });
}

HRESULT FormattedIO::get_InstrumentBigEndian(VARIANT_BOOL* pVal) {
    if (!pVal) return E_POINTER;
    std::lock_guard<std::mutex> lock(m_);
    *pVal = big_endian_ ? VARIANT_TRUE : VARIANT_FALSE;
    return S_OK;
}

HRESULT FormattedIO::put_InstrumentBigEndian(VARIANT_BOOL val) {
    std::lock_guard<std::mutex> lock(m_);
    big_endian_ = val != VARIANT_FALSE;
    return S_OK;
}

HRESULT FormattedIO::get_MaxBlockBytes(LONGLONG* pVal) {
    if (!pVal) return E_POINTER;
    std::lock_guard<std::mutex> lock(m_);
    *pVal = max_block_;
    return S_OK;
}

HRESULT FormattedIO::put_MaxBlockBytes(LONGLONG val) {
    // SAFEARRAY element counts are 32-bit: larger blocks cannot be returned.
    if (val < 0 || val > 0x7fffffffLL)
        return Report(E_INVALIDARG, kFormattedIid, "block bound must be 0..2147483647 bytes");
    std::lock_guard<std::mutex> lock(m_);
    max_block_ = val;
    return S_OK;
}

HRESULT FormattedIO::SetBufferSize(LONG mask, LONG size) {
    if (size < LONG(kMinBufferSize) || mask == 0 || (mask & ~(IO_IN_BUF | IO_OUT_BUF)))
        return Report(E_INVALIDARG, kFormattedIid, "buffer mask or size invalid");
    return Guard(kFormattedIid, [&] {
        std::lock_guard<std::mutex> lock(m_);
        if (mask & IO_IN_BUF) {
            std::vector<BYTE> fresh(std::max(std::size_t(size), rend_ - rpos_));
            std::memcpy(fresh.data(), rbuf_.data() + rpos_, rend_ - rpos_);
            rend_ -= rpos_;
            rpos_ = 0;
            rbuf_.swap(fresh);
        }
        if (mask & IO_OUT_BUF) {
            wsize_ = std::size_t(size);
            if (io_ && wbuf_.size() >= wsize_) return SendBuffer();
        }
        return S_OK;
    });
}

HRESULT CreateFormattedIO488(IFormattedIO488** ppFormatted) {
    if (!ppFormatted) return E_POINTER;
    *ppFormatted = nullptr;
    return Guard(kFormattedIid, [&] {
        *ppFormatted = qn::com::MakeComObject<FormattedIO>().Detach();
        return S_OK;
    });
}

}  // namespace qn::visa

// The write side of FormattedIO: the write buffer, numbers, lists and
// binary blocks. Nothing is appended to what the caller writes: a message
// terminator, where the instrument needs one, is part of the caller's text.
#include <algorithm>
#include <cstring>

#include "platform/visa/errors.h"
#include "platform/visa/formatted_convert.h"
#include "platform/visa/formatted_io.h"
#include "platform/visa/operation_scope.h"

namespace qn::visa {
namespace {

constexpr GUID kFormattedIid = iid_of<IFormattedIO488>;

// The array a VARIANT holds, directly or by reference; null when none.
SAFEARRAY* ArrayOf(const VARIANT& v) {
    if (!(v.vt & VT_ARRAY)) return nullptr;
    return (v.vt & VT_BYREF) ? (v.pparray ? *v.pparray : nullptr) : v.parray;
}

}  // namespace

HRESULT FormattedIO::SendBuffer() {
    if (wbuf_.empty()) return S_OK;
    // A new message to the instrument ends interest in the unread rest of
    // the last reply: it must not pass for the reply to this one.
    rpos_ = rend_ = 0;
    open_message_ = false;
    std::string out;
    out.swap(wbuf_);  // the buffer is emptied also when the write fails
    LONG written = 0;
    return direct_->WriteFrom(reinterpret_cast<const BYTE*>(out.data()), LONG(out.size()),
                              &written);
}

HRESULT FormattedIO::Append(std::string_view bytes) {
    wbuf_.append(bytes);
    return wbuf_.size() >= wsize_ ? SendBuffer() : S_OK;
}

HRESULT FormattedIO::WriteString(BSTR data, VARIANT_BOOL flushAndEND) {
    return Guard(kFormattedIid, [&] {
        std::lock_guard<std::mutex> lock(m_);
        if (HRESULT b = Bound(); FAILED(b)) return b;
        OperationScope op(direct_.get());
        HRESULT hr = Append(qn::com::BstrToUtf8(data));
        return SUCCEEDED(hr) && flushAndEND != VARIANT_FALSE ? SendBuffer() : hr;
    });
}

HRESULT FormattedIO::WriteNumber(VARIANT data, LONG type, VARIANT_BOOL flushAndEND) {
    VARTYPE vt = VT_EMPTY;
    if (HRESULT bad = fmt::AsciiTypeOrError(type, &vt); FAILED(bad)) return bad;
    return Guard(kFormattedIid, [&] {
        std::lock_guard<std::mutex> lock(m_);
        if (HRESULT b = Bound(); FAILED(b)) return b;
        OperationScope op(direct_.get());
        const VARIANT* value = &data;
        if (data.vt == (VT_BYREF | VT_VARIANT) && data.pvarVal) value = data.pvarVal;
        std::string text, error;
        HRESULT hr = fmt::FormatValue(*value, vt, &text, &error);
        if (FAILED(hr)) return Report(hr, kFormattedIid, error);
        hr = Append(text);
        return SUCCEEDED(hr) && flushAndEND != VARIANT_FALSE ? SendBuffer() : hr;
    });
}

HRESULT FormattedIO::WriteList(VARIANT* data, LONG type, BSTR listSeparator,
                               VARIANT_BOOL flushAndEND) {
    if (!data) return E_POINTER;
    VARTYPE vt = VT_EMPTY;
    if (HRESULT bad = fmt::AsciiTypeOrError(type, &vt); FAILED(bad)) return bad;
    return Guard(kFormattedIid, [&] {
        std::lock_guard<std::mutex> lock(m_);
        if (HRESULT b = Bound(); FAILED(b)) return b;
        OperationScope op(direct_.get());
        const std::string sep = listSeparator ? qn::com::BstrToUtf8(listSeparator) : ",";
        std::string text, item, error;
        HRESULT hr = S_OK;
        if (SAFEARRAY* sa = ArrayOf(*data)) {
            const ULONG n = qn::com::SafeArrayCount(sa);
            for (ULONG i = 0; i < n; ++i) {
                // Each element as a VARIANT of the array's element type.
                qn::com::Variant element;
                if (sa->vt == VT_VARIANT) {
                    VariantCopy(&element, static_cast<VARIANT*>(sa->pvData) + i);
                } else if (sa->vt == VT_BSTR) {
                    element.vt = VT_BSTR;
                    BSTR s = static_cast<BSTR*>(sa->pvData)[i];
                    element.bstrVal = SysAllocStringLen(s, SysStringLen(s));
                } else if (std::size_t size = fmt::PlainElementSize(sa->vt)) {
                    element.vt = sa->vt;
                    std::memcpy(&element.llVal, static_cast<BYTE*>(sa->pvData) + i * size, size);
                } else {
                    return Report(DISP_E_TYPEMISMATCH, kFormattedIid,
                                  "unsupported array element type");
                }
                hr = fmt::FormatValue(element, vt, &item, &error);
                if (FAILED(hr))
                    return Report(hr, kFormattedIid,
                                  "list element " + std::to_string(i) + ": " + error);
                if (i) text += sep;
                text += item;
            }
        } else {
            const VARIANT* value = data->vt == (VT_BYREF | VT_VARIANT) ? data->pvarVal : data;
            hr = value ? fmt::FormatValue(*value, vt, &text, &error) : E_POINTER;
            if (FAILED(hr)) return Report(hr, kFormattedIid, error);
        }
        hr = Append(text);
        return SUCCEEDED(hr) && flushAndEND != VARIANT_FALSE ? SendBuffer() : hr;
    });
}

// Block data: sent straight from the caller's array when no byte swap is
// needed, else swapped through the write buffer in pieces.
HRESULT FormattedIO::SendBlockData(const BYTE* data, std::size_t bytes, std::size_t elem) {
    if (elem == 1 || !fmt::NeedsSwap(big_endian_)) {
        if (wbuf_.size() + bytes < wsize_)
            return Append({reinterpret_cast<const char*>(data), bytes});
        HRESULT hr = SendBuffer();
        if (FAILED(hr)) return hr;
        return direct_->WriteFrom(data, LONG(bytes), nullptr);
    }
    const std::size_t piece = std::max<std::size_t>(elem, (wsize_ / elem) * elem);
    std::string swapped;
    for (std::size_t off = 0; off < bytes; off += piece) {
        std::size_t n = std::min(piece, bytes - off);
        swapped.assign(reinterpret_cast<const char*>(data) + off, n);
        fmt::SwapBytes(swapped.data(), n, elem);
        HRESULT hr = Append(swapped);
        if (FAILED(hr)) return hr;
    }
    return S_OK;
}

HRESULT FormattedIO::WriteIEEEBlock(BSTR command, VARIANT data, VARIANT_BOOL flushAndEND) {
    SAFEARRAY* sa = ArrayOf(data);
    const std::size_t elem = sa ? fmt::PlainElementSize(sa->vt) : 0;
    if (elem == 0)
        return Report(DISP_E_TYPEMISMATCH, kFormattedIid,
                      "block data must be an array of numbers or bytes");
    return Guard(kFormattedIid, [&] {
        std::lock_guard<std::mutex> lock(m_);
        if (HRESULT b = Bound(); FAILED(b)) return b;
        OperationScope op(direct_.get());
        const std::size_t bytes = std::size_t(qn::com::SafeArrayCount(sa)) * elem;
        const std::string length = std::to_string(bytes);
        if (length.size() > 9)
            return Report(E_INVALIDARG, kFormattedIid, "block too long for a header");
        std::string head = qn::com::BstrToUtf8(command);
        head += '#';
        head += char('0' + length.size());
        head += length;
        HRESULT hr = Append(head);
        if (SUCCEEDED(hr)) hr = SendBlockData(static_cast<const BYTE*>(sa->pvData), bytes, elem);
        return SUCCEEDED(hr) && flushAndEND != VARIANT_FALSE ? SendBuffer() : hr;
    });
}

HRESULT FormattedIO::FlushWrite(VARIANT_BOOL /*sendEND*/) {
    return Guard(kFormattedIid, [&] {
        std::lock_guard<std::mutex> lock(m_);
        if (HRESULT b = Bound(); FAILED(b)) return b;
        OperationScope op(direct_.get());
        return SendBuffer();
    });
}

}  // namespace qn::visa

#include "io/provider.h"

#include "Quorlen731XXErrors.h"
#include "platform/com/errorinfo.h"

namespace qn {

namespace {
constexpr int kSendEnd = 0;
constexpr int kTermCharEnabled = 1;
constexpr LONG kStatusReplyChars = 100;
constexpr long kStatusErrorMask = 0x3C;  // query, device-dependent, execution, command error
// The most of an over-long reply that is read and dropped before the reply
// counts as never ending.
constexpr std::size_t kMaxDroppedReply = std::size_t{64} << 20;

// Leading white space, an optional sign, then digits up to the first non-digit.
long ParseStatusInteger(std::string_view s) {
    std::size_t i = 0;
    while (i < s.size() && (s[i] == ' ' || (s[i] >= '\t' && s[i] <= '\r'))) ++i;
    bool negative = false;
    if (i < s.size() && (s[i] == '+' || s[i] == '-')) negative = s[i++] == '-';
    long v = 0;
    for (; i < s.size() && s[i] >= '0' && s[i] <= '9'; ++i)
        if (v < 100000000) v = v * 10 + (s[i] - '0');
    return negative ? -v : v;
}
}  // namespace

HRESULT CDriverIOProvider::WriteWithTerminator(std::string_view cmd) {
    std::string msg(cmd);
    if (msg.size() < write_term_.size() ||
        msg.compare(msg.size() - write_term_.size(), write_term_.size(), write_term_) != 0)
        msg += write_term_;
    LONG written = 0;
    HRESULT hr = RawWrite(reinterpret_cast<const BYTE*>(msg.data()), static_cast<LONG>(msg.size()),
                          &written);
    if (SUCCEEDED(hr) && written < static_cast<LONG>(msg.size())) {
        com::SetThreadError(GUID_NULL, "VISA", "fewer characters were written than asked");
        return E_FAIL;
    }
    return hr;
}

HRESULT CDriverIOProvider::ReadRaw(std::string* out, std::size_t max_chars) {
    out->assign(max_chars, '\0');
    LONG actual = 0;
    HRESULT hr = RawRead(reinterpret_cast<BYTE*>(out->data()), static_cast<LONG>(max_chars),
                         &actual);
    out->resize(static_cast<std::size_t>(actual > 0 ? actual : 0));
    return hr;
}

HRESULT CDriverIOProvider::ReadReply(std::string* out, LONG max_chars, bool strip) {
    const std::size_t limit = max_chars > 0 ? static_cast<std::size_t>(max_chars) : 0;
    HRESULT hr = ReadRaw(out, limit);
    if (FAILED(hr)) return hr;
    const std::string_view term = read_term_;
    const bool ended = term.empty() || out->size() < limit ||
                       std::string_view(*out).ends_with(term);
    // Each read of the rest ends at the terminator, at the end of the
    // message or when the chunk is full; only a full chunk that does not end
    // in the terminator leaves more to read.
    for (std::size_t dropped = 0; !ended;) {
        BYTE chunk[4096];
        LONG actual = 0;
        hr = RawRead(chunk, static_cast<LONG>(sizeof chunk), &actual);
        if (FAILED(hr)) return hr;
        const std::size_t n = static_cast<std::size_t>(actual > 0 ? actual : 0);
        if (n < sizeof chunk || chunk[n - 1] == static_cast<BYTE>(term.back())) break;
        dropped += n;
        if (dropped > kMaxDroppedReply) {
            com::SetThreadError(GUID_NULL, "VISA", "the reply does not end");
            return E_FAIL;
        }
    }
    if (strip && out->size() >= term.size() && !term.empty() &&
        std::string_view(*out).ends_with(term))
        out->resize(out->size() - term.size());
    return S_OK;
}

HRESULT CDriverIOProvider::StatusCheck() {
    std::string reply;
    HRESULT hr = AsOneOperation([&] {
        static constexpr std::string_view kEsr = "*ESR?\n";
        LONG written = 0;
        HRESULT h =
            RawWrite(reinterpret_cast<const BYTE*>(kEsr.data()), LONG(kEsr.size()), &written);
        return SUCCEEDED(h) ? ReadReply(&reply, kStatusReplyChars, false) : h;
    });
    if (FAILED(hr)) {
        RawClear();
        return hr;
    }
    return (ParseStatusInteger(reply) & kStatusErrorMask) ? E_FAIL : S_OK;
}

HRESULT CDriverIOProvider::PollInstrumentErrors(const CErrorManagerBase& err) {
    if (!flags_ || !flags_->query_instrument_status) return S_OK;
    if (!initialized_) return err.Error(Msg::E_IVI_INSTRUMENT_STATUS);
    if (FAILED(StatusCheck())) return err.Error(Msg::E_IVI_INSTRUMENT_STATUS);
    return S_OK;
}

HRESULT CDriverIOProvider::ReportIOError(const CErrorManagerBase& err, HRESULT hr) {
    if (hr == kVisaTimeout) hr = kProviderTimeout;
    // The transport's own description, taken before the device clear can
    // replace it.
    com::ErrorRecord rec;
    std::string text = com::TakeThreadError(&rec) ? rec.description : std::string();
    if (text.empty() && !initialized_) text = "the I/O session is not open";
    if (initialized_) RawClear();
    HRESULT reported;
    if (hr == kProviderTimeout) {
        timed_out_ = true;
        reported = err.Error(Msg::E_QUORLEN731XX_IO_TIMEOUT, {text});
    } else {
        reported = err.Error(Msg::E_QUORLEN731XX_IO_GENERAL, {text});
    }
    if (initialized_ && flags_ && flags_->query_instrument_status) {
        // Clears the event status register; the outcome is not reported, and
        // the error information of the report above is kept.
        ComPtr<IErrorInfo> keep;
        GetErrorInfo(0, keep.Out());
        StatusCheck();
        SetErrorInfo(0, keep.get());
    }
    return reported;
}

// Device clear and serial poll are operations of their own: they end the
// timed-out state of an earlier one.
HRESULT CDriverIOProvider::DeviceClear() {
    timed_out_ = false;
    return initialized_ ? RawClear() : E_FAIL;
}
HRESULT CDriverIOProvider::ReadSTB(SHORT* stb) {
    if (!stb) return E_POINTER;
    timed_out_ = false;
    return initialized_ ? RawReadSTB(stb) : E_FAIL;
}

HRESULT CDriverIOProvider::SetIOTimeout(const CErrorManagerBase& err, LONG timeout) {
    return Run(err, kTimeoutSession, false, [&] { return RawSetTimeout(timeout); });
}
HRESULT CDriverIOProvider::GetIOTimeout(const CErrorManagerBase& err, LONG* timeout) {
    if (!timeout) return E_POINTER;
    return Run(err, kTimeoutSession, false, [&] { return RawGetTimeout(timeout); });
}

HRESULT CDriverIOProvider::GetVisaInterfaceType(const CErrorManagerBase& err, LONG* type) {
    if (!type) return E_POINTER;
    return Run(err, kTimeoutSession, false, [&] {
        SHORT t = 0;
        std::string rclass;
        HRESULT hr = RawInterface(&t, &rclass);
        if (FAILED(hr)) return hr;
        bool instr = rclass.size() == 5 && (rclass[0] | 0x20) == 'i' && (rclass[1] | 0x20) == 'n' &&
                     (rclass[2] | 0x20) == 's' && (rclass[3] | 0x20) == 't' &&
                     (rclass[4] | 0x20) == 'r';
        switch (t) {
            case 1: case 2: case 3: case 4: *type = t; break;
            case 6: *type = instr ? 6 : 7; break;
            case 7: *type = 8; break;
            default: *type = 0; break;
        }
        return S_OK;
    });
}

HRESULT CDriverIOProvider::SetSendEndEnabled(const CErrorManagerBase& err, bool on) {
    return Run(err, kTimeoutSession, false, [&] { return RawSetBool(kSendEnd, on); });
}
HRESULT CDriverIOProvider::GetSendEndEnabled(const CErrorManagerBase& err, bool* on) {
    if (!on) return E_POINTER;
    return Run(err, kTimeoutSession, false, [&] { return RawGetBool(kSendEnd, on); });
}
HRESULT CDriverIOProvider::SetTerminationCharacter(const CErrorManagerBase& err, BYTE c) {
    return Run(err, kTimeoutSession, false, [&] { return RawSetTermChar(c); });
}
HRESULT CDriverIOProvider::GetTerminationCharacter(const CErrorManagerBase& err, BYTE* c) {
    if (!c) return E_POINTER;
    return Run(err, kTimeoutSession, false, [&] { return RawGetTermChar(c); });
}
HRESULT CDriverIOProvider::SetTerminationCharacterEnabled(const CErrorManagerBase& err, bool on) {
    return Run(err, kTimeoutSession, false, [&] { return RawSetBool(kTermCharEnabled, on); });
}
HRESULT CDriverIOProvider::GetTerminationCharacterEnabled(const CErrorManagerBase& err, bool* on) {
    if (!on) return E_POINTER;
    return Run(err, kTimeoutSession, false, [&] { return RawGetBool(kTermCharEnabled, on); });
}

HRESULT CDriverIOProvider::Write(const CErrorManagerBase& err, std::string_view cmd, LONG timeout,
                                 bool poll) {
    return Run(err, timeout, poll, [&] { return WriteWithTerminator(cmd); });
}

HRESULT CDriverIOProvider::Query(const CErrorManagerBase& err, std::string_view cmd,
                                 std::string* reply, LONG max_chars, LONG timeout, bool poll) {
    return Run(err, timeout, poll, [&] {
        HRESULT hr = WriteWithTerminator(cmd);
        return SUCCEEDED(hr) ? ReadReply(reply, max_chars, true) : hr;
    });
}

HRESULT CDriverIOProvider::ReadText(const CErrorManagerBase& err, std::string* out,
                                    LONG max_chars, LONG timeout, bool strip, bool poll) {
    return Run(err, timeout, poll, [&] { return ReadReply(out, max_chars, strip); });
}

HRESULT CDriverIOProvider::ReadBytes(const CErrorManagerBase& err, SAFEARRAY** out, LONG count,
                                     LONG timeout, bool poll) {
    if (!out) return E_POINTER;
    if (count < 0) return E_INVALIDARG;
    return Run(err, timeout, poll, [&] { return RawReadArray(count, out); });
}

HRESULT CDriverIOProvider::ReadBuffer(const CErrorManagerBase& err, BYTE* buf, LONG count,
                                      LONG* actual, LONG timeout, bool poll) {
    if (!buf || !actual) return E_POINTER;
    if (count < 0) return E_INVALIDARG;
    *actual = 0;
    return Run(err, timeout, poll, [&] { return RawRead(buf, count, actual); });
}

HRESULT CDriverIOProvider::WriteBytes(const CErrorManagerBase& err, SAFEARRAY* psa, LONG count,
                                      LONG timeout, bool poll) {
    if (!psa) return E_POINTER;
    VARTYPE vt = 0;
    SafeArrayGetVartype(psa, &vt);
    ULONG size = com::SafeArrayCount(psa);
    if (SafeArrayGetDim(psa) != 1 || (vt != VT_UI1 && vt != VT_I1)) return E_INVALIDARG;
    if (count == -1) count = static_cast<LONG>(size);
    if (count < 0 || static_cast<ULONG>(count) > size) return E_INVALIDARG;
    return Run(err, timeout, poll, [&] {
        LONG written = 0;
        HRESULT hr = RawWrite(static_cast<const BYTE*>(psa->pvData), count, &written);
        if (SUCCEEDED(hr) && written < count) {
            com::SetThreadError(GUID_NULL, "VISA", "fewer bytes were written than asked");
            return E_FAIL;
        }
        return hr;
    });
}

HRESULT CDriverIOProvider::WriteBuffer(const CErrorManagerBase& err, const BYTE* buf, LONG count,
                                       LONG* actual, LONG timeout, bool poll) {
    if (!buf || !actual) return E_POINTER;
    if (count < 0) return E_INVALIDARG;
    *actual = 0;
    return Run(err, timeout, poll, [&] {
        HRESULT hr = RawWrite(buf, count, actual);
        if (SUCCEEDED(hr) && *actual < count) {
            com::SetThreadError(GUID_NULL, "VISA", "fewer bytes were written than asked");
            return E_FAIL;
        }
        return hr;
    });
}

namespace {

template <class T>
HRESULT HandOut(T* object, T** p, HRESULT absent) {
    if (!p) return E_POINTER;
    *p = object;
    if (!object) return absent;
    object->AddRef();
    return S_OK;
}

}  // namespace

HRESULT CDriverIOProvider::ioprvGetIVisaSessionPointer(IVisaSession** p) const {
    return HandOut<IVisaSession>(MessageInterface(), p, S_OK);
}
HRESULT CDriverIOProvider::ioprvGetIMessagePointer(IMessage** p) const {
    return HandOut(MessageInterface(), p, S_OK);
}
HRESULT CDriverIOProvider::ioprvGetIRegisterPointer(IRegister** p) const {
    return HandOut(RegisterInterface(), p, S_OK);
}
HRESULT CDriverIOProvider::ioprvGetIFormattedIO488Pointer(IFormattedIO488** p) const {
    return HandOut(FormattedInterface(), p, S_FALSE);
}

}  // namespace qn

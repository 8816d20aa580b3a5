#include "platform/visa/session.h"

#include <string>
#include <vector>

#include "platform/visa/errors.h"

namespace qn::visa {
namespace {

constexpr GUID kIidMessage = iid_of<IMessage>;
// ReadString reads in pieces of this size, so a large count allocates only
// what the reply needs.
constexpr std::size_t kStringChunk = 64 * 1024;

VARIANT_BOOL Bool(bool b) {
    return b ? VARIANT_TRUE : VARIANT_FALSE;
}

}  // namespace

MessageSession::MessageSession(ResourceName name, std::unique_ptr<Transport> transport,
                               bool locked)
    : name_(std::move(name)), transport_(std::move(transport)), lock_depth_(locked ? 1 : 0) {}

HRESULT MessageSession::QueryInterface(REFIID riid, void** ppv) {
    if (riid == iid_of<ISerial> && name_.interface_type != kInterfaceAsrl) {
        if (ppv) *ppv = nullptr;
        return ppv ? E_NOINTERFACE : E_POINTER;
    }
    return ComObject::QueryInterface(riid, ppv);
}

template <class T>
HRESULT MessageSession::GetSerial(T SerialSettings::*field, T* pVal) {
    if (!pVal) return E_POINTER;
    std::lock_guard<std::mutex> lock(io_);
    *pVal = serial_.*field;
    return S_OK;
}

template <class T>
HRESULT MessageSession::PutSerial(T SerialSettings::*field, T val) {
    return Guard(kIidMessage, [&] {
        std::lock_guard<std::mutex> lock(io_);
        if (!transport_) return Closed();
        SerialSettings next = serial_;
        next.*field = val;
        std::string error;
        HRESULT hr = transport_->ApplySerial(next, &error);
        if (FAILED(hr)) return Report(hr, kIidMessage, error);
        serial_ = next;
        return S_OK;
    });
}

HRESULT MessageSession::get_BaudRate(LONG* pVal) {
    return GetSerial(&SerialSettings::baud_rate, pVal);
}
HRESULT MessageSession::put_BaudRate(LONG val) {
    return PutSerial(&SerialSettings::baud_rate, val);
}
HRESULT MessageSession::get_DataBits(SHORT* pVal) {
    return GetSerial(&SerialSettings::data_bits, pVal);
}
HRESULT MessageSession::put_DataBits(SHORT val) {
    return PutSerial(&SerialSettings::data_bits, val);
}
HRESULT MessageSession::get_Parity(SHORT* pVal) {
    return GetSerial(&SerialSettings::parity, pVal);
}
HRESULT MessageSession::put_Parity(SHORT val) {
    return PutSerial(&SerialSettings::parity, val);
}
HRESULT MessageSession::get_StopBits(SHORT* pVal) {
    return GetSerial(&SerialSettings::stop_bits, pVal);
}
HRESULT MessageSession::put_StopBits(SHORT val) {
    return PutSerial(&SerialSettings::stop_bits, val);
}
HRESULT MessageSession::get_FlowControl(SHORT* pVal) {
    return GetSerial(&SerialSettings::flow_control, pVal);
}
HRESULT MessageSession::put_FlowControl(SHORT val) {
    return PutSerial(&SerialSettings::flow_control, val);
}

HRESULT MessageSession::Closed() const {
    return Report(E_VISA_INVALID_OBJECT, kIidMessage, "the session is closed");
}

Deadline MessageSession::CallDeadline() {
    std::lock_guard<std::mutex> lock(op_m_);
    if (op_depth_ > 0 && op_thread_ == std::this_thread::get_id()) return op_deadline_;
    return Deadline::FromTimeout(timeout_);
}

HRESULT MessageSession::BeginOperation() {
    std::lock_guard<std::mutex> lock(op_m_);
    if (op_depth_ == 0) {
        op_thread_ = std::this_thread::get_id();
        op_deadline_ = Deadline::FromTimeout(timeout_);
    } else if (op_thread_ != std::this_thread::get_id()) {
        return S_FALSE;
    }
    ++op_depth_;
    return S_OK;
}

HRESULT MessageSession::EndOperation() {
    std::lock_guard<std::mutex> lock(op_m_);
    if (op_depth_ == 0 || op_thread_ != std::this_thread::get_id()) return E_UNEXPECTED;
    --op_depth_;
    return S_OK;
}

HRESULT MessageSession::get_HasEnd(VARIANT_BOOL* pVal) {
    if (!pVal) return E_POINTER;
    std::lock_guard<std::mutex> lock(io_);
    if (!transport_) return Closed();
    *pVal = Bool(transport_->HasEnd());
    return S_OK;
}

HRESULT MessageSession::get_HardwareInterfaceType(SHORT* pVal) {
    if (!pVal) return E_POINTER;
    *pVal = SHORT(name_.interface_type);
    return S_OK;
}

HRESULT MessageSession::get_HardwareInterfaceNumber(SHORT* pVal) {
    if (!pVal) return E_POINTER;
    *pVal = SHORT(name_.board);
    return S_OK;
}

HRESULT MessageSession::get_ResourceClass(BSTR* pVal) {
    if (!pVal) return E_POINTER;
    *pVal = qn::com::Utf8ToBstr(name_.resource_class);
    return *pVal ? S_OK : E_OUTOFMEMORY;
}

HRESULT MessageSession::get_ResourceName(BSTR* pVal) {
    if (!pVal) return E_POINTER;
    return Guard(kIidMessage, [&] {
        *pVal = qn::com::Utf8ToBstr(name_.Canonical());
        return *pVal ? S_OK : E_OUTOFMEMORY;
    });
}

HRESULT MessageSession::get_Timeout(LONG* pVal) {
    if (!pVal) return E_POINTER;
    *pVal = timeout_.load();
    return S_OK;
}

HRESULT MessageSession::put_Timeout(LONG val) {
    if (val < kTimeoutInfinite)
        return Report(E_VISA_ATTRIBUTE_STATE, kIidMessage,
                      "timeout " + std::to_string(val) + " ms: use 0 or more, or -1 for none");
    timeout_ = val;
    return S_OK;
}

HRESULT MessageSession::Close() {
    std::lock_guard<std::mutex> lock(io_);
    if (transport_) transport_->Close();  // ends the link, and with it the device lock
    transport_.reset();
    lock_depth_ = 0;
    return S_OK;
}

HRESULT MessageSession::LockExclusive(LONG lock_timeout_ms, std::string* error) {
    if (lock_timeout_ms < kTimeoutInfinite) {
        *error = "lock timeout " + std::to_string(lock_timeout_ms) +
                 " ms: use 0 or more, or -1 for none";
        return E_INVALIDARG;
    }
    std::lock_guard<std::mutex> lock(io_);
    if (!transport_) {
        *error = "the session is closed";
        return E_VISA_INVALID_OBJECT;
    }
    if (lock_depth_ == 0) {
        HRESULT hr =
            transport_->Lock(lock_timeout_ms, Deadline::FromTimeout(lock_timeout_ms), error);
        if (FAILED(hr)) return hr;
    }
    ++lock_depth_;
    return S_OK;
}

HRESULT MessageSession::LockRsrc(LONG type, LONG lockTimeout, BSTR /*requestedKey*/,
                                 BSTR* accessKey) {
    if (accessKey) *accessKey = nullptr;
    if (type == kSharedLock)
        return Report(E_VISA_NOT_SUPPORTED, kIidMessage, "shared locks are not offered");
    if (type != kExclusiveLock)
        return Report(E_VISA_INVALID_LOCK_TYPE, kIidMessage,
                      "lock type " + std::to_string(type) + ": use the exclusive lock (1)");
    return Guard(kIidMessage, [&] {
        std::string error;
        HRESULT hr = LockExclusive(lockTimeout, &error);
        if (FAILED(hr)) return Report(hr, kIidMessage, "lock: " + error);
        if (accessKey) {
            *accessKey = qn::com::Utf8ToBstr("");
            if (!*accessKey) return E_OUTOFMEMORY;
        }
        return S_OK;
    });
}

HRESULT MessageSession::UnlockRsrc() {
    return Guard(kIidMessage, [&] {
        std::lock_guard<std::mutex> lock(io_);
        if (!transport_) return Closed();
        if (lock_depth_ == 0)
            return Report(E_VISA_SESSION_NOT_LOCKED, kIidMessage, "the session holds no lock");
        if (--lock_depth_ > 0) return S_OK;
        std::string error;
        HRESULT hr = transport_->Unlock(CallDeadline(), &error);
        return FAILED(hr) ? Report(hr, kIidMessage, "unlock: " + error) : hr;
    });
}

HRESULT MessageSession::get_LockState(LONG* pVal) {
    if (!pVal) return E_POINTER;
    std::lock_guard<std::mutex> lock(io_);
    *pVal = lock_depth_ > 0 ? kExclusiveLock : kNoLock;
    return S_OK;
}

HRESULT MessageSession::AssertTrigger(SHORT protocol) {
    if (protocol != kTriggerProtocolDefault)
        return Report(E_VISA_INVALID_PROTOCOL, kIidMessage,
                      "trigger protocol " + std::to_string(protocol) +
                          ": only the default protocol (0) is offered");
    return Guard(kIidMessage, [&] {
        std::lock_guard<std::mutex> lock(io_);
        if (!transport_) return Closed();
        std::string error;
        HRESULT hr = transport_->Trigger(CallDeadline(), &error);
        return FAILED(hr) ? Report(hr, kIidMessage, "trigger: " + error) : hr;
    });
}

HRESULT MessageSession::Clear() {
    return Guard(kIidMessage, [&] {
        std::lock_guard<std::mutex> lock(io_);
        if (!transport_) return Closed();
        std::string error;
        HRESULT hr = transport_->Clear(CallDeadline(), &error);
        return FAILED(hr) ? Report(hr, kIidMessage, "device clear: " + error) : hr;
    });
}

HRESULT MessageSession::ReadSTB(SHORT* pStatusByte) {
    if (!pStatusByte) return E_POINTER;
    return Guard(kIidMessage, [&] {
        std::lock_guard<std::mutex> lock(io_);
        if (!transport_) return Closed();
        std::string error;
        BYTE stb = 0;
        HRESULT hr = transport_->ReadStatusByte(CallDeadline(), &stb, &error);
        if (FAILED(hr)) return Report(hr, kIidMessage, "read status byte: " + error);
        *pStatusByte = stb;
        return S_OK;
    });
}

HRESULT MessageSession::ReadLocked(BYTE* buf, std::size_t count, DWORD flags,
                                   const Deadline& deadline, ReadResult* result) {
    if (!transport_) return Closed();
    ReadRequest req;
    req.buf = buf;
    req.count = count;
    req.term_char_enabled = term_enabled_ && !(flags & kReadIgnoreTermChar);
    req.term_char = term_char_;
    if (flags & kReadToMessageEnd) {
        req.term_char_enabled = !transport_->HasEnd();
        req.term_char = '\n';
    }
    req.return_available = (flags & kReadAvailable) != 0;
    std::string error;
    HRESULT hr = transport_->Read(req, deadline, result, &error);
    return FAILED(hr) ? Report(hr, kIidMessage, error) : hr;
}

HRESULT MessageSession::Read(LONG count, SAFEARRAY** pBuffer) {
    if (!pBuffer) return E_POINTER;
    *pBuffer = nullptr;
    if (count < 0) return Report(E_INVALIDARG, kIidMessage, "negative read count");
    return Guard(kIidMessage, [&] {
        qn::com::SafeArray array = qn::com::SafeArray::Vector(VT_UI1, ULONG(count));
        if (!array) return Report(E_OUTOFMEMORY, kIidMessage, "out of memory for the read");
        std::lock_guard<std::mutex> lock(io_);
        ReadResult r;
        HRESULT hr = ReadLocked(array.data<BYTE>(), std::size_t(count), kReadDefault,
                                CallDeadline(), &r);
        if (FAILED(hr)) return hr;
        // Shrink the bound to what arrived; the allocation stays with the array.
        array.get()->rgsabound[0].cElements = ULONG(r.bytes);
        *pBuffer = array.Detach();
        return S_OK;
    });
}

HRESULT MessageSession::ReadString(LONG count, BSTR* pBuffer) {
    if (!pBuffer) return E_POINTER;
    *pBuffer = nullptr;
    if (count < 0) return Report(E_INVALIDARG, kIidMessage, "negative read count");
    return Guard(kIidMessage, [&] {
        std::lock_guard<std::mutex> lock(io_);
        const Deadline deadline = CallDeadline();
        std::string text;
        for (std::size_t left = std::size_t(count); left > 0;) {
            std::size_t chunk = std::min(left, kStringChunk);
            std::size_t old = text.size();
            text.resize(old + chunk);
            ReadResult r;
            HRESULT hr =
                ReadLocked(reinterpret_cast<BYTE*>(&text[old]), chunk, kReadDefault, deadline, &r);
            if (FAILED(hr)) return hr;
            text.resize(old + r.bytes);
            left -= r.bytes;
            if (r.end != kReadEndCount) break;
        }
        *pBuffer = qn::com::Utf8ToBstr(text);
        return *pBuffer ? S_OK : E_OUTOFMEMORY;
    });
}

HRESULT MessageSession::WriteBytes(const BYTE* data, std::size_t size, LONG* pRetCount) {
    std::lock_guard<std::mutex> lock(io_);
    if (!transport_) return Closed();
    std::string error;
    std::size_t written = 0;
    HRESULT hr =
        transport_->Write(data, size, send_end_, CallDeadline(), &written, &error);
    if (pRetCount) *pRetCount = LONG(written);
    return FAILED(hr) ? Report(hr, kIidMessage, error) : hr;
}

HRESULT MessageSession::Write(SAFEARRAY** buffer, LONG count, LONG* pRetCount) {
    if (!buffer || !*buffer || !pRetCount) return E_POINTER;
    *pRetCount = 0;
    SAFEARRAY* sa = *buffer;
    if (sa->cDims != 1 || (sa->vt != VT_UI1 && sa->vt != VT_I1))
        return Report(E_INVALIDARG, kIidMessage, "write needs a one-dimensional byte array");
    const ULONG size = qn::com::SafeArrayCount(sa);
    if (count == -1) count = LONG(size);
    if (count < 0 || ULONG(count) > size)
        return Report(E_INVALIDARG, kIidMessage, "write count outside the array");
    return Guard(kIidMessage, [&] {
        return WriteBytes(static_cast<const BYTE*>(sa->pvData), std::size_t(count), pRetCount);
    });
}

HRESULT MessageSession::WriteString(BSTR buffer, LONG* pRetCount) {
    if (!pRetCount) return E_POINTER;
    *pRetCount = 0;
    return Guard(kIidMessage, [&] {
        std::string text = qn::com::BstrToUtf8(buffer);
        return WriteBytes(reinterpret_cast<const BYTE*>(text.data()), text.size(), pRetCount);
    });
}

HRESULT MessageSession::get_SendEndEnabled(VARIANT_BOOL* pVal) {
    if (!pVal) return E_POINTER;
    *pVal = Bool(send_end_);
    return S_OK;
}

HRESULT MessageSession::put_SendEndEnabled(VARIANT_BOOL val) {
    send_end_ = val != VARIANT_FALSE;
    return S_OK;
}

HRESULT MessageSession::get_TerminationCharacter(BYTE* pVal) {
    if (!pVal) return E_POINTER;
    *pVal = term_char_;
    return S_OK;
}

HRESULT MessageSession::put_TerminationCharacter(BYTE val) {
    term_char_ = val;
    return S_OK;
}

HRESULT MessageSession::get_TerminationCharacterEnabled(VARIANT_BOOL* pVal) {
    if (!pVal) return E_POINTER;
    *pVal = Bool(term_enabled_);
    return S_OK;
}

HRESULT MessageSession::put_TerminationCharacterEnabled(VARIANT_BOOL val) {
    term_enabled_ = val != VARIANT_FALSE;
    return S_OK;
}

HRESULT MessageSession::ReadInto(BYTE* buf, LONG count, DWORD flags, LONG* pActual, LONG* pEnd) {
    if (!pActual || (!buf && count > 0)) return E_POINTER;
    *pActual = 0;
    if (count < 0) return Report(E_INVALIDARG, kIidMessage, "negative read count");
    return Guard(kIidMessage, [&] {
        std::lock_guard<std::mutex> lock(io_);
        ReadResult r;
        HRESULT hr =
            ReadLocked(buf, std::size_t(count), flags, CallDeadline(), &r);
        *pActual = LONG(r.bytes);
        if (pEnd) *pEnd = r.end;
        return hr;
    });
}

HRESULT MessageSession::WriteFrom(const BYTE* buf, LONG count, LONG* pActual) {
    if (pActual) *pActual = 0;
    if (!buf && count > 0) return E_POINTER;
    if (count < 0) return Report(E_INVALIDARG, kIidMessage, "negative write count");
    return Guard(kIidMessage, [&] { return WriteBytes(buf, std::size_t(count), pActual); });
}

}  // namespace qn::visa

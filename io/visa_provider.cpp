#include "io/visa_provider.h"

#include <cstring>

#include "core/options.h"
#include "platform/com/errorinfo.h"

namespace qn {

namespace {

constexpr LONG kOpenTimeoutMs = 2000;

HRESULT Translate(HRESULT hr) { return hr == kVisaTimeout ? kProviderTimeout : hr; }

// The thread's error description (taken), or "" when none.
std::string TakeDescription() {
    com::ErrorRecord rec;
    return com::TakeThreadError(&rec) ? rec.description : std::string();
}

}  // namespace

HRESULT CVisaComIOProvider::Open(const CErrorManagerBase& err, const SessionFlags* flags,
                                 const std::string& resource) {
    if (!flags) return E_INVALIDARG;
    Close();
    SetOwnerFlags(flags);
    initialized_ = true;

    ComPtr<IResourceManager> manager;
    HRESULT hr = visa::CreateResourceManager(manager.Out());
    if (FAILED(hr)) {
        TakeDescription();
        return err.Publish(hr,
                           "Could not create instance of VISA-COM Global Resource Manager "
                           "Component. Make sure it is installed properly.");
    }
    com::Bstr name(resource), options("");
    hr = manager->Open(name.get(), visa::kNoLock, kOpenTimeoutMs, options.get(), session_.Out());
    if (FAILED(hr)) {
        std::string why = TakeDescription();
        return why.empty() ? err.Error(Msg::E_IVI_RESOURCE_UNKNOWN)
                           : err.ErrorWithExtra(Msg::E_IVI_RESOURCE_UNKNOWN, why);
    }
    hr = session_.As(message_);
    if (FAILED(hr)) return err.Publish(hr, "The VISA session offers no message-based I/O.");
    session_.As(direct_);
    if (FAILED(session_.As(register_))) register_.reset();

    hr = visa::CreateFormattedIO488(formatted_.Out());
    if (FAILED(hr))
        return err.Publish(hr,
                           "Could not create instance of VISA-COM FormattedIO488 Component. Make "
                           "sure it is installed properly.");
    formatted_.As(formatted_direct_);
    hr = formatted_->put_IO(message_.get());
    if (FAILED(hr)) return Translate(hr);

    SHORT type = 0;
    std::string rclass;
    hr = RawInterface(&type, &rclass);
    if (FAILED(hr)) return hr;
    bool socket = type == visa::kInterfaceTcpip &&
                  ToUpper(resource).find("::SOCKET") != std::string::npos;
    if (type == visa::kInterfaceAsrl || socket) {
        // Line-feed-terminated messages on buses without an end marker.
        hr = RawSetTermChar('\n');
        if (SUCCEEDED(hr)) hr = RawSetBool(1, true);
        if (SUCCEEDED(hr)) hr = RawSetBool(0, true);
        if (FAILED(hr)) return Translate(hr);
    }
    return S_OK;
}

void CVisaComIOProvider::Close() {
    formatted_direct_.reset();
    formatted_.reset();
    session_.reset();
    direct_.reset();
    message_.reset();
    register_.reset();
    receive_.Release();
    initialized_ = false;
    timed_out_ = false;
    SetOwnerFlags(nullptr);
}

HRESULT CVisaComIOProvider::RawWrite(const BYTE* data, LONG count, LONG* written) {
    *written = 0;
    if (direct_) return Translate(direct_->WriteFrom(data, count, written));
    if (!message_) return E_FAIL;
    com::SafeArray arr = com::SafeArray::Vector(VT_UI1, static_cast<ULONG>(count));
    if (!arr) return E_OUTOFMEMORY;
    if (count) std::memcpy(arr.data<BYTE>(), data, static_cast<std::size_t>(count));
    SAFEARRAY* p = arr.get();
    return Translate(message_->Write(&p, count, written));
}

HRESULT CVisaComIOProvider::RawRead(BYTE* buf, LONG count, LONG* actual) {
    *actual = 0;
    if (direct_) return Translate(direct_->ReadInto(buf, count, visa::kReadDefault, actual, nullptr));
    if (!message_) return E_FAIL;
    com::SafeArray arr;
    HRESULT hr = Translate(message_->Read(count, arr.Out()));
    if (FAILED(hr)) return hr;
    // Never more than the caller's buffer holds, whatever the session returned.
    const ULONG got = arr.size();
    *actual = static_cast<LONG>(got < static_cast<ULONG>(count) ? got : static_cast<ULONG>(count));
    if (*actual) std::memcpy(buf, arr.data<BYTE>(), static_cast<std::size_t>(*actual));
    return hr;
}

HRESULT CVisaComIOProvider::RawReadArray(LONG count, SAFEARRAY** out) {
    if (!message_) return E_FAIL;
    return Translate(message_->Read(count, out));
}

HRESULT CVisaComIOProvider::RawClear() { return message_ ? Translate(message_->Clear()) : E_FAIL; }
HRESULT CVisaComIOProvider::RawReadSTB(SHORT* stb) {
    return message_ ? Translate(message_->ReadSTB(stb)) : E_FAIL;
}
HRESULT CVisaComIOProvider::RawGetTimeout(LONG* ms) {
    return session_ ? Translate(session_->get_Timeout(ms)) : E_FAIL;
}
HRESULT CVisaComIOProvider::RawSetTimeout(LONG ms) {
    return session_ ? Translate(session_->put_Timeout(ms)) : E_FAIL;
}

HRESULT CVisaComIOProvider::RawInterface(SHORT* type, std::string* resource_class) {
    if (!session_) return E_FAIL;
    HRESULT hr = session_->get_HardwareInterfaceType(type);
    if (FAILED(hr)) return Translate(hr);
    com::Bstr rc;
    hr = session_->get_ResourceClass(rc.Out());
    *resource_class = rc.utf8();
    return Translate(hr);
}

HRESULT CVisaComIOProvider::RawGetBool(int which, bool* v) {
    if (!message_) return E_FAIL;
    VARIANT_BOOL b = VARIANT_FALSE;
    HRESULT hr = which == 0 ? message_->get_SendEndEnabled(&b)
                            : message_->get_TerminationCharacterEnabled(&b);
    *v = b != VARIANT_FALSE;
    return Translate(hr);
}

HRESULT CVisaComIOProvider::RawSetBool(int which, bool v) {
    if (!message_) return E_FAIL;
    VARIANT_BOOL b = v ? VARIANT_TRUE : VARIANT_FALSE;
    return Translate(which == 0 ? message_->put_SendEndEnabled(b)
                                : message_->put_TerminationCharacterEnabled(b));
}

HRESULT CVisaComIOProvider::RawGetTermChar(BYTE* c) {
    return message_ ? Translate(message_->get_TerminationCharacter(c)) : E_FAIL;
}
HRESULT CVisaComIOProvider::RawSetTermChar(BYTE c) {
    return message_ ? Translate(message_->put_TerminationCharacter(c)) : E_FAIL;
}

bool CVisaComIOProvider::RawBeginOperation() {
    return direct_ && direct_->BeginOperation() == S_OK;
}
void CVisaComIOProvider::RawEndOperation() {
    if (direct_) direct_->EndOperation();
}

}  // namespace qn

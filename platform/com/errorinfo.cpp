#include "platform/com/errorinfo.h"

#include <mutex>

namespace {

class ErrorInfo final
    : public qn::com::ComObject<ErrorInfo, IErrorInfo, ICreateErrorInfo> {
public:
    HRESULT GetGUID(GUID* p) override {
        if (!p) return E_INVALIDARG;
        *p = guid_;
        return S_OK;
    }
    HRESULT GetSource(BSTR* p) override { return Copy(source_, p); }
    HRESULT GetDescription(BSTR* p) override { return Copy(description_, p); }
    HRESULT GetHelpFile(BSTR* p) override { return Copy(help_file_, p); }
    HRESULT GetHelpContext(DWORD* p) override {
        if (!p) return E_INVALIDARG;
        *p = help_context_;
        return S_OK;
    }
    HRESULT SetGUID(REFGUID g) override {
        guid_ = g;
        return S_OK;
    }
    HRESULT SetSource(LPCOLESTR s) override { return Assign(source_, s); }
    HRESULT SetDescription(LPCOLESTR s) override { return Assign(description_, s); }
    HRESULT SetHelpFile(LPCOLESTR s) override { return Assign(help_file_, s); }
    HRESULT SetHelpContext(DWORD c) override {
        help_context_ = c;
        return S_OK;
    }

private:
    static HRESULT Copy(const std::u16string& s, BSTR* p) {
        if (!p) return E_INVALIDARG;
        *p = SysAllocStringLen(s.data(), UINT(s.size()));
        return *p ? S_OK : E_OUTOFMEMORY;
    }
    static HRESULT Assign(std::u16string& dst, LPCOLESTR s) {
        dst = s ? std::u16string(s) : std::u16string();
        return S_OK;
    }

    GUID guid_ = GUID_NULL;
    std::u16string source_, description_, help_file_;
    DWORD help_context_ = 0;
};

// The calling thread's error information (one reference held).
ComPtr<IErrorInfo>& ThreadSlot() {
    thread_local ComPtr<IErrorInfo> slot;
    return slot;
}

}  // namespace

HRESULT CreateErrorInfo(ICreateErrorInfo** pp) {
    if (!pp) return E_INVALIDARG;
    *pp = nullptr;
    try {
        auto obj = qn::com::MakeComObject<ErrorInfo>();
        return obj->QueryInterface(iid_of<ICreateErrorInfo>, reinterpret_cast<void**>(pp));
    } catch (const std::bad_alloc&) {
        return E_OUTOFMEMORY;
    }
}

HRESULT SetErrorInfo(DWORD reserved, IErrorInfo* p) {
    if (reserved != 0) return E_INVALIDARG;
    ThreadSlot() = ComPtr<IErrorInfo>(p);
    return S_OK;
}

HRESULT GetErrorInfo(DWORD reserved, IErrorInfo** pp) {
    if (reserved != 0 || !pp) return E_INVALIDARG;
    *pp = ThreadSlot().Detach();
    return *pp ? S_OK : S_FALSE;
}

namespace qn::com {

HRESULT SetThreadError(REFGUID guid, std::string_view source, std::string_view description,
                       std::string_view help_file, DWORD help_context) {
    ComPtr<ICreateErrorInfo> create;
    HRESULT hr = CreateErrorInfo(create.Out());
    if (FAILED(hr)) return hr;
    create->SetGUID(guid);
    create->SetSource(Utf8ToUtf16(source).c_str());
    create->SetDescription(Utf8ToUtf16(description).c_str());
    if (!help_file.empty()) create->SetHelpFile(Utf8ToUtf16(help_file).c_str());
    create->SetHelpContext(help_context);
    ComPtr<IErrorInfo> info;
    hr = create.As(info);
    if (FAILED(hr)) return hr;
    return SetErrorInfo(0, info.get());
}

bool TakeThreadError(ErrorRecord* out) {
    ComPtr<IErrorInfo> info;
    if (GetErrorInfo(0, info.Out()) != S_OK || !info) return false;
    if (out) {
        info->GetGUID(&out->guid);
        Bstr s;
        info->GetSource(s.Out());
        out->source = s.utf8();
        info->GetDescription(s.Out());
        out->description = s.utf8();
        info->GetHelpFile(s.Out());
        out->help_file = s.utf8();
        info->GetHelpContext(&out->help_context);
    }
    return true;
}

}  // namespace qn::com

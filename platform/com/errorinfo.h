// Per-thread error information: IErrorInfo, ICreateErrorInfo,
// ISupportErrorInfo and CreateErrorInfo / SetErrorInfo / GetErrorInfo.
#pragma once

#include <string>

#include "platform/com/bstr.h"
#include "platform/com/unknown.h"

struct IErrorInfo : IUnknown {
    QN_INTERFACE_ID("1cf2b120-547d-101b-8e65-08002b2bd119");
    virtual HRESULT GetGUID(GUID* pGUID) = 0;
    virtual HRESULT GetSource(BSTR* pBstrSource) = 0;
    virtual HRESULT GetDescription(BSTR* pBstrDescription) = 0;
    virtual HRESULT GetHelpFile(BSTR* pBstrHelpFile) = 0;
    virtual HRESULT GetHelpContext(DWORD* pdwHelpContext) = 0;
};

struct ICreateErrorInfo : IUnknown {
    QN_INTERFACE_ID("22f03340-547d-101b-8e65-08002b2bd119");
    virtual HRESULT SetGUID(REFGUID rguid) = 0;
    virtual HRESULT SetSource(LPCOLESTR szSource) = 0;
    virtual HRESULT SetDescription(LPCOLESTR szDescription) = 0;
    virtual HRESULT SetHelpFile(LPCOLESTR szHelpFile) = 0;
    virtual HRESULT SetHelpContext(DWORD dwHelpContext) = 0;
};

struct ISupportErrorInfo : IUnknown {
    QN_INTERFACE_ID("df0b3d60-548f-101b-8e65-08002b2bd119");
    virtual HRESULT InterfaceSupportsErrorInfo(REFIID riid) = 0;
};

// A new, empty error-information object.
HRESULT CreateErrorInfo(ICreateErrorInfo** pperrinfo);
// Installs perrinfo (may be null, which clears) as the calling thread's error
// information; dwReserved must be 0.
HRESULT SetErrorInfo(DWORD dwReserved, IErrorInfo* perrinfo);
// Hands the thread's error information to the caller and clears the slot;
// S_FALSE with a null result when there is none.
HRESULT GetErrorInfo(DWORD dwReserved, IErrorInfo** pperrinfo);

namespace qn::com {

// A readable copy of an error-information object.
struct ErrorRecord {
    GUID guid = GUID_NULL;
    std::string source;
    std::string description;
    std::string help_file;
    DWORD help_context = 0;
};

// Sets the thread's error information in one call.
HRESULT SetThreadError(REFGUID guid, std::string_view source, std::string_view description,
                       std::string_view help_file = {}, DWORD help_context = 0);
// Takes the thread's error information (clearing it, like GetErrorInfo);
// false when there is none.
bool TakeThreadError(ErrorRecord* out);

}  // namespace qn::com

// Class activation: GUID text, ProgID lookup, the in-process class table and
// CoCreateInstance, which finds a class either in that table or in the
// registry store (HKCR\CLSID\{clsid}\InprocServer32 names the module, which
// is opened with dlopen and asked for its class factory by DllGetClassObject).
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/com/types.h"
#include "platform/com/unknown.h"

using LPOLESTR = OLECHAR*;

constexpr DWORD COINIT_MULTITHREADED = 0x0;
constexpr DWORD COINIT_APARTMENTTHREADED = 0x2;

// Per-thread initialisation count: S_OK for the first call on a thread, S_FALSE
// after. Activation works without it; it exists for code written against COM.
HRESULT CoInitializeEx(void* reserved, DWORD coinit);
HRESULT CoInitialize(void* reserved);
void CoUninitialize();

// Creates an object of class clsid. CLSCTX_INPROC_SERVER must be in ctx.
// With an outer unknown, riid must be IUnknown (CLASS_E_NOAGGREGATION otherwise).
// Errors: E_POINTER, REGDB_E_CLASSNOTREG (no such class), CO_E_DLLNOTFOUND
// (module cannot be loaded), CO_E_ERRORINDLL (no DllGetClassObject), or the
// module's own result; the thread's error info then says which module and why.
HRESULT CoCreateInstance(REFCLSID clsid, IUnknown* outer, DWORD ctx, REFIID riid, void** ppv);
HRESULT CoGetClassObject(REFCLSID clsid, DWORD ctx, void* reserved, REFIID riid, void** ppv);
// Unloads registry-loaded modules whose DllCanUnloadNow answers S_OK.
void CoFreeUnusedLibraries();

// "{XXXXXXXX-XXXX-XXXX-XXXX-XXXXXXXXXXXX}" with upper-case hex digits; returns the
// characters written including the NUL (39), or 0 when cchMax is too small.
int StringFromGUID2(REFGUID guid, LPOLESTR lpsz, int cchMax);
// Parses a braced GUID; text without a brace is taken as a ProgID. A null string
// gives GUID_NULL. CO_E_CLASSSTRING when the text is neither.
HRESULT CLSIDFromString(LPCOLESTR lpsz, CLSID* pclsid);
// HKCR\<ProgID>\CurVer (when present) names the versioned ProgID; the CLSID is
// the default value of HKCR\<ProgID>\CLSID. CO_E_CLASSSTRING when unknown.
HRESULT CLSIDFromProgID(LPCOLESTR lpszProgID, CLSID* pclsid);

namespace qn::com {

std::string GuidToString(REFGUID guid);                     // braced, upper case
std::optional<GUID> GuidFromString(std::string_view text);  // braced, any case

// The in-process class table: classes built into a loaded library, activated
// by CLSID without a registry entry. The table holds a reference to factory.
// Registering a CLSID again replaces the factory.
HRESULT RegisterClassFactory(REFCLSID clsid, IClassFactory* factory);
HRESULT RevokeClassFactory(REFCLSID clsid);

}  // namespace qn::com

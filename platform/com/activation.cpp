// Class activation through the in-process class table or the registry store.
#include "platform/com/activation.h"

#include <dlfcn.h>

#include <cstdio>
#include <cstring>
#include <map>
#include <mutex>
#include <new>

#include "platform/com/bstr.h"
#include "platform/com/errorinfo.h"
#include "platform/com/registry.h"

namespace {

using DllGetClassObjectFn = HRESULT (*)(REFCLSID, REFIID, void**);
using DllCanUnloadNowFn = HRESULT (*)();

struct GuidLess {
    bool operator()(const GUID& a, const GUID& b) const {
        if (a.Data1 != b.Data1) return a.Data1 < b.Data1;
        if (a.Data2 != b.Data2) return a.Data2 < b.Data2;
        if (a.Data3 != b.Data3) return a.Data3 < b.Data3;
        return std::memcmp(a.Data4, b.Data4, sizeof a.Data4) < 0;
    }
};

// The in-process class table.
struct ClassTable {
    std::mutex m;
    std::map<GUID, ComPtr<IClassFactory>, GuidLess> factories;
    static ClassTable& Instance() {
        static ClassTable t;
        return t;
    }
};

// Modules opened for registry classes, by path; kept open until
// CoFreeUnusedLibraries finds them unused.
struct ModuleTable {
    std::mutex m;
    std::map<std::string, void*> handles;
    static ModuleTable& Instance() {
        static ModuleTable t;
        return t;
    }
};

HRESULT Fail(HRESULT hr, const std::string& text) {
    qn::com::SetThreadError(GUID_NULL, "CoCreateInstance", text);
    return hr;
}

// The factory object of a registered in-process class, or null.
ComPtr<IClassFactory> FindBuiltIn(REFCLSID clsid) {
    ClassTable& t = ClassTable::Instance();
    std::lock_guard<std::mutex> g(t.m);
    auto it = t.factories.find(clsid);
    return it == t.factories.end() ? ComPtr<IClassFactory>() : it->second;
}

// dlopen once per path; the handle stays in the table.
void* OpenModule(const std::string& path, std::string* error) {
    ModuleTable& t = ModuleTable::Instance();
    std::lock_guard<std::mutex> g(t.m);
    auto it = t.handles.find(path);
    if (it != t.handles.end()) return it->second;
    void* h = ::dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (!h) {
        const char* why = ::dlerror();
        *error = why ? why : "dlopen failed";
        return nullptr;
    }
    t.handles.emplace(path, h);
    return h;
}

HRESULT GetRegisteredClassObject(REFCLSID clsid, REFIID riid, void** ppv) {
    const std::string key =
        "HKEY_CLASSES_ROOT\\CLSID\\" + qn::com::GuidToString(clsid) + "\\InprocServer32";
    qn::com::RegistryTree tree;
    const std::string file = qn::com::RegistryFilePath();
    qn::com::RegistryStatus loaded = qn::com::LoadRegistryFile(file, &tree);
    if (!loaded.ok) return Fail(REGDB_E_CLASSNOTREG, loaded.error);
    std::optional<std::string> module = tree.GetValue(key);
    if (!module || module->empty())
        return Fail(REGDB_E_CLASSNOTREG,
                    "class " + qn::com::GuidToString(clsid) + " is not registered in " + file);
    std::string error;
    void* handle = OpenModule(*module, &error);
    if (!handle) return Fail(CO_E_DLLNOTFOUND, "cannot load " + *module + ": " + error);
    auto get = reinterpret_cast<DllGetClassObjectFn>(::dlsym(handle, "DllGetClassObject"));
    if (!get) return Fail(CO_E_ERRORINDLL, *module + " does not export DllGetClassObject");
    return get(clsid, riid, ppv);
}

thread_local int t_init_count = 0;

}  // namespace

HRESULT CoInitializeEx(void*, DWORD) {
    return t_init_count++ == 0 ? S_OK : S_FALSE;
}
HRESULT CoInitialize(void* reserved) {
    return CoInitializeEx(reserved, COINIT_APARTMENTTHREADED);
}
void CoUninitialize() {
    if (t_init_count > 0) --t_init_count;
}

HRESULT CoGetClassObject(REFCLSID clsid, DWORD ctx, void*, REFIID riid, void** ppv) {
    if (!ppv) return E_POINTER;
    *ppv = nullptr;
    if (!(ctx & CLSCTX_INPROC_SERVER)) return REGDB_E_CLASSNOTREG;
    try {
        if (ComPtr<IClassFactory> builtin = FindBuiltIn(clsid))
            return builtin->QueryInterface(riid, ppv);
        return GetRegisteredClassObject(clsid, riid, ppv);
    } catch (const std::bad_alloc&) {
        return E_OUTOFMEMORY;
    }
}

HRESULT CoCreateInstance(REFCLSID clsid, IUnknown* outer, DWORD ctx, REFIID riid, void** ppv) {
    if (!ppv) return E_POINTER;
    *ppv = nullptr;
    if (outer && riid != iid_of<IUnknown>) return CLASS_E_NOAGGREGATION;
    ComPtr<IClassFactory> factory;
    HRESULT hr = CoGetClassObject(clsid, ctx, nullptr, iid_of<IClassFactory>, factory.OutVoid());
    if (FAILED(hr)) return hr;
    if (!factory) return E_UNEXPECTED;
    hr = factory->CreateInstance(outer, riid, ppv);
    if (FAILED(hr)) *ppv = nullptr;
    return hr;
}

void CoFreeUnusedLibraries() {
    ModuleTable& t = ModuleTable::Instance();
    std::lock_guard<std::mutex> g(t.m);
    for (auto it = t.handles.begin(); it != t.handles.end();) {
        auto can_unload =
            reinterpret_cast<DllCanUnloadNowFn>(::dlsym(it->second, "DllCanUnloadNow"));
        if (can_unload && can_unload() == S_OK) {
            ::dlclose(it->second);
            it = t.handles.erase(it);
        } else {
            ++it;
        }
    }
}

int StringFromGUID2(REFGUID guid, LPOLESTR lpsz, int cchMax) {
    std::string text = qn::com::GuidToString(guid);
    if (!lpsz || cchMax < int(text.size()) + 1) return 0;
    for (std::size_t i = 0; i < text.size(); ++i) lpsz[i] = char16_t(text[i]);
    lpsz[text.size()] = 0;
    return int(text.size()) + 1;
}

HRESULT CLSIDFromString(LPCOLESTR lpsz, CLSID* pclsid) {
    if (!pclsid) return E_INVALIDARG;
    *pclsid = GUID_NULL;
    if (!lpsz) return S_OK;
    std::string text = qn::com::Utf16ToUtf8(lpsz);
    if (!text.empty() && text[0] != '{') return CLSIDFromProgID(lpsz, pclsid);
    std::optional<GUID> g = qn::com::GuidFromString(text);
    if (!g) return CO_E_CLASSSTRING;
    *pclsid = *g;
    return S_OK;
}

HRESULT CLSIDFromProgID(LPCOLESTR lpszProgID, CLSID* pclsid) {
    if (!lpszProgID || !pclsid) return E_INVALIDARG;
    *pclsid = GUID_NULL;
    try {
        qn::com::RegistryTree tree;
        if (!qn::com::LoadRegistryFile(qn::com::RegistryFilePath(), &tree).ok)
            return CO_E_CLASSSTRING;
        std::string progid = qn::com::Utf16ToUtf8(lpszProgID);
        // Follow CurVer from a version-independent ProgID; a few hops at most (no loops).
        for (int hop = 0; hop < 4 && !progid.empty() && progid.find('\\') == std::string::npos;
             ++hop) {
            const std::string key = "HKEY_CLASSES_ROOT\\" + progid;
            std::optional<std::string> cur = tree.GetValue(key + "\\CurVer");
            if (cur && !cur->empty() && *cur != progid) {
                progid = *cur;
                continue;
            }
            std::optional<std::string> clsid = tree.GetValue(key + "\\CLSID");
            std::optional<GUID> g = clsid ? qn::com::GuidFromString(*clsid) : std::nullopt;
            if (!g) return CO_E_CLASSSTRING;
            *pclsid = *g;
            return S_OK;
        }
        return CO_E_CLASSSTRING;
    } catch (const std::bad_alloc&) {
        return E_OUTOFMEMORY;
    }
}

namespace qn::com {

std::string GuidToString(REFGUID g) {
    char buf[40];
    std::snprintf(buf, sizeof buf, "{%08X-%04X-%04X-%02X%02X-%02X%02X%02X%02X%02X%02X}",
                  unsigned(g.Data1), unsigned(g.Data2), unsigned(g.Data3), g.Data4[0], g.Data4[1],
                  g.Data4[2], g.Data4[3], g.Data4[4], g.Data4[5], g.Data4[6], g.Data4[7]);
    return buf;
}

std::optional<GUID> GuidFromString(std::string_view s) {
    if (s.size() != 38 || s.front() != '{' || s.back() != '}') return std::nullopt;
    s = s.substr(1, 36);
    std::uint8_t bytes[16];
    std::size_t b = 0;
    for (std::size_t i = 0; i < s.size();) {
        if (i == 8 || i == 13 || i == 18 || i == 23) {
            if (s[i] != '-') return std::nullopt;
            ++i;
            continue;
        }
        int v = 0;
        for (int k = 0; k < 2; ++k, ++i) {
            char c = s[i];
            int d = c >= '0' && c <= '9'   ? c - '0'
                    : c >= 'a' && c <= 'f' ? c - 'a' + 10
                    : c >= 'A' && c <= 'F' ? c - 'A' + 10
                                           : -1;
            if (d < 0) return std::nullopt;
            v = v * 16 + d;
        }
        bytes[b++] = std::uint8_t(v);
    }
    GUID g{};
    g.Data1 = std::uint32_t(bytes[0]) << 24 | std::uint32_t(bytes[1]) << 16 |
              std::uint32_t(bytes[2]) << 8 | bytes[3];
    g.Data2 = std::uint16_t(bytes[4] << 8 | bytes[5]);
    g.Data3 = std::uint16_t(bytes[6] << 8 | bytes[7]);
    for (int i = 0; i < 8; ++i) g.Data4[i] = bytes[8 + i];
    return g;
}

HRESULT RegisterClassFactory(REFCLSID clsid, IClassFactory* factory) {
    if (!factory) return E_INVALIDARG;
    try {
        ClassTable& t = ClassTable::Instance();
        ComPtr<IClassFactory> previous(factory);  // after the swap: the replaced one,
        std::lock_guard<std::mutex> g(t.m);       // released once the lock is left
        std::swap(t.factories[clsid], previous);
        return S_OK;
    } catch (const std::bad_alloc&) {
        return E_OUTOFMEMORY;
    }
}

HRESULT RevokeClassFactory(REFCLSID clsid) {
    ComPtr<IClassFactory> removed;  // released after the table lock is left
    ClassTable& t = ClassTable::Instance();
    std::lock_guard<std::mutex> g(t.m);
    auto it = t.factories.find(clsid);
    if (it == t.factories.end()) return S_FALSE;
    removed = std::move(it->second);
    t.factories.erase(it);
    return S_OK;
}

}  // namespace qn::com

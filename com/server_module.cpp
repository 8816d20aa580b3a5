// The module's exported entry points: class objects, unload query and
// self-registration into the registry store.
#include <dlfcn.h>
#include <limits.h>
#include <stdlib.h>

#include <memory>
#include <new>
#include <string>

#include "Quorlen731XXErrors.h"
#include "Quorlen731XXIds.h"
#include "com/class_factory.h"
#include "com/exports.h"
#include "com/registration.h"
#include "platform/com/errorinfo.h"
#include "platform/com/registry.h"

namespace qn::server {

namespace {

// A symbol of this module only (internal linkage, so never interposed),
// whose address tells dladdr which loaded file holds the module.
const char kModuleAnchor = 0;

// The full path of the file this module was loaded from.
bool ModulePath(std::string* path, std::string* error) {
    Dl_info info{};
    if (::dladdr(&kModuleAnchor, &info) == 0 || !info.dli_fname || !*info.dli_fname) {
        *error = "cannot determine the path of the driver module";
        return false;
    }
    if (info.dli_fname[0] == '/') {
        *path = info.dli_fname;
        return true;
    }
    std::unique_ptr<char, decltype(&::free)> full(::realpath(info.dli_fname, nullptr), &::free);
    if (!full) {
        *error = std::string("cannot resolve the driver module path ") + info.dli_fname;
        return false;
    }
    *path = full.get();
    return true;
}

HRESULT Fail(std::string_view what, const std::string& why) {
    com::SetThreadError(GUID_NULL, kQuorlen731XXProgId,
                        "Quorlen731XX: " + std::string(what) + ": " + why);
    return SELFREG_E_CLASS;
}

// Registers (install) or unregisters the module in one locked, atomic update
// of the registry file: either every entry is written or none.
HRESULT UpdateRegistration(bool install) {
    const char* what = install ? "registration failed" : "unregistration failed";
    std::string module, error;
    if (!ModulePath(&module, &error) && install) return Fail(what, error);
    const Replacements replacements = ModuleReplacements(module);
    const std::string file = com::RegistryFilePath();
    com::RegistryStatus status = com::UpdateRegistryFile(file, [&](com::RegistryTree& tree) {
        if (!install) return RemoveRegistration(tree, replacements);
        return ApplyRegistration(tree, replacements, &error);
    });
    if (!status.ok) return Fail(what, status.error);
    if (!error.empty()) return Fail(what, error + " in " + file);
    return S_OK;
}

template <class F>
HRESULT Guarded(F&& body) {
    try {
        return body();
    } catch (const std::bad_alloc&) {
        return E_IVI_OUT_OF_MEMORY;
    } catch (...) {
        return E_UNEXPECTED;
    }
}

}  // namespace

}  // namespace qn::server

HRESULT DllGetClassObject(REFCLSID clsid, REFIID riid, void** ppv) {
    if (!ppv) return E_POINTER;
    *ppv = nullptr;
    if (!(clsid == CLSID_Quorlen731XX)) return CLASS_E_CLASSNOTAVAILABLE;
    return qn::server::Guarded([&] {
        // A factory per request: a live factory counts as an object, so the
        // module is not unloaded while a client still holds one.
        auto factory = qn::com::MakeComObject<qn::server::ClassFactory>();
        return factory->QueryInterface(riid, ppv);
    });
}

HRESULT DllCanUnloadNow() {
    return qn::com::ModuleLockCount().load() == 0 && qn::server::ServerLockCount() == 0 ? S_OK
                                                                                        : S_FALSE;
}

HRESULT DllRegisterServer() {
    return qn::server::Guarded([] { return qn::server::UpdateRegistration(true); });
}

HRESULT DllUnregisterServer() {
    return qn::server::Guarded([] { return qn::server::UpdateRegistration(false); });
}

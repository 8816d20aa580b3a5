// The root object's link to an IVI-C session of the C API. The C API binds
// a handle to the COM object it creates; a COM client can then learn that
// handle, and attaching is only possible to a session that already exists.
#include "core/c_session_link.h"

#include <mutex>

#include "Quorlen731XXErrors.h"
#include "core/root.h"

namespace qn {

namespace {

// The root object behind `driver`, or null for any other object.
Quorlen731XX* RootBehind(IUnknown* driver) {
    if (!driver) return nullptr;
    ComPtr<IIviDriver> itf;
    if (FAILED(driver->QueryInterface(iid_of<IIviDriver>, itf.OutVoid())) || !itf) return nullptr;
    return dynamic_cast<Quorlen731XX*>(itf.get());
}

constexpr MemberInfo kAttach{"AttachToExistingCSession", "IIviDriver", &iid_of<IIviDriver>,
                             FrameVariant::A, {}, {}, {}, {}};
constexpr MemberInfo kHandle{"get_NativeCHandle", "IIviDriver", &iid_of<IIviDriver>,
                             FrameVariant::A, {}, {}, {}, {"pVal"}};

}  // namespace

// The handle is written under the session lock, which the members reading
// it hold through their frame.
void LinkCSession(IUnknown* driver, LONG vi) {
    if (Quorlen731XX* root = RootBehind(driver)) {
        std::lock_guard<com::CriticalSection> lock(root->Core().lock);
        root->Core().c_session_handle = vi;
    }
}

void UnlinkCSession(IUnknown* driver, LONG vi) {
    if (Quorlen731XX* root = RootBehind(driver)) {
        std::lock_guard<com::CriticalSection> lock(root->Core().lock);
        if (root->Core().c_session_handle == vi) root->Core().c_session_handle = 0;
    }
}

HRESULT Quorlen731XX::AttachToExistingCSession() {
    return RunFrame(*this, kAttach, [&]() -> HRESULT {
        if (Core().c_session_handle != 0) return S_OK;
        return Errors().Error(Msg::E_IVI_METHOD_NOT_SUPPORTED, {"AttachToExistingCSession"});
    });
}

HRESULT Quorlen731XX::get_NativeCHandle(LONG* pVal) {
    return RunFrame(
        *this, kHandle,
        [&]() -> HRESULT {
            const LONG handle = Core().c_session_handle;
            if (handle == 0)
                return Errors().Error(Msg::E_IVI_PROPERTY_NOT_SUPPORTED, {"get_NativeCHandle"});
            *pVal = handle;
            return S_OK;
        },
        out(pVal));
}

}  // namespace qn

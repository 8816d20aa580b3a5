// The root object's link to an IVI-C session of the C API. The C API binds
// a handle to the COM object it creates; a COM client can then learn that
// handle, and attaching is only possible to a session that already exists.
#include "Quorlen731XXErrors.h"
#include "core/root.h"

namespace qn {

namespace {

constexpr MemberInfo kAttach{"AttachToExistingCSession", "IIviDriver", &iid_of<IIviDriver>,
                             FrameVariant::A, {}, {}, {}, {}};
constexpr MemberInfo kHandle{"get_NativeCHandle", "IIviDriver", &iid_of<IIviDriver>,
                             FrameVariant::A, {}, {}, {}, {"pVal"}};

}  // namespace

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
            if (Core().c_session_handle == 0)
                return Errors().Error(Msg::E_IVI_PROPERTY_NOT_SUPPORTED, {"get_NativeCHandle"});
            *pVal = Core().c_session_handle;
            return S_OK;
        },
        out(pVal));
}

}  // namespace qn

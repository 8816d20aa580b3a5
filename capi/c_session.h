// What every C function shares: the driver object of a session handle, the
// conversion of a result code with its error record, the string rule, and the
// guard that keeps exceptions inside the library.
#pragma once

#include <new>
#include <string_view>

#include "capi/session_data.h"
#include "capi/status_table.h"
#include "platform/com/bstr.h"
#include "platform/com/unknown.h"
#include "visatype.h"

namespace qn::capi {

// Converts `hr` to its C status. The calling thread's error information, when
// there is any, is recorded with the session (its description, or an empty
// text when it has none); a failure without error information is recorded with
// the status's own text.
ViStatus Convert(ViSession vi, HRESULT hr);

// Records `status` with `text` for the session (or session 0) and returns it.
ViStatus Fail(ViSession vi, ViStatus status, std::string_view text);

// The generic failure for a null result pointer, recorded with the name of
// the parameter.
ViStatus NullResult(ViSession vi, std::string_view parameter);

// The data of a session, with a reference held for the call. A session that
// is invalid, closed or being closed gives the session library's status,
// unchanged.
ViStatus SessionOf(ViSession vi, SessionRef* out);
// The driver object of a session, with a reference held for the call.
ViStatus DriverOf(ViSession vi, ComPtr<IUnknown>* out);

// The interface `Itf` of the session's driver object.
template <class Itf>
ViStatus InterfaceOf(ViSession vi, ComPtr<Itf>* out) {
    ComPtr<IUnknown> driver;
    ViStatus status = DriverOf(vi, &driver);
    if (status != VI_SUCCESS) return status;
    return Convert(vi, driver.As(*out));
}

// Creates a session bound to `driver` (one reference added); *vi is 0 on
// failure. `private_object`: no client holds the object (see SessionData).
ViStatus Attach(IUnknown* driver, bool private_object, ViSession* vi);
// Takes the driver object out of a session; the reference the session held
// goes to *driver. Other threads see the session as invalid from then on; the
// handle itself stays until IviSession_Dispose, so errors can still be
// recorded for it.
ViStatus Detach(ViSession vi, ComPtr<IUnknown>* driver);

// The string rule: with a null buffer or a size of 0 nothing is written and
// the size needed (length + 1) is returned; a buffer too small receives a
// truncated, terminated copy and the size needed is returned; otherwise the
// whole text is copied and 0 is returned. A negative size is refused with
// IVI_ERROR_INVALID_VALUE (recorded for the session).
ViStatus CopyString(ViSession vi, std::string_view text, ViInt32 size, ViChar* buffer);
inline ViStatus CopyString(ViSession vi, BSTR text, ViInt32 size, ViChar* buffer) {
    return CopyString(vi, com::BstrToUtf8(text), size, buffer);
}

// The first nonzero status of a call, in call order.
inline ViStatus First(ViStatus a, ViStatus b) { return a != VI_SUCCESS ? a : b; }

// Runs `body` (returning a ViStatus) so that no exception leaves the library:
// out of memory becomes IVI_ERROR_OUT_OF_MEMORY, anything else the generic
// failure, both recorded for the session.
template <class Body>
ViStatus Guard(ViSession vi, Body&& body) noexcept {
    try {
        return body();
    } catch (const std::bad_alloc&) {
        return Fail(vi, kOutOfMemory, "Could not allocate necessary memory.");
    } catch (...) {
        return Fail(vi, kFailure, "Unexpected failure inside the driver.");
    }
}

}  // namespace qn::capi

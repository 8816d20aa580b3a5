// Failure reporting shared by the VISA objects: every failing member leaves a
// description in the thread's error information, and no exception leaves a
// member.
#pragma once

#include <new>
#include <string_view>

#include "platform/com/errorinfo.h"

namespace qn::visa {

// Sets the thread's error information (source "VISA") and returns hr.
inline HRESULT Report(HRESULT hr, REFGUID iid, std::string_view text) {
    qn::com::SetThreadError(iid, "VISA", text);
    return hr;
}

// Runs body, turning exceptions into HRESULTs (std::bad_alloc into
// E_OUTOFMEMORY).
template <class Body>
HRESULT Guard(REFGUID iid, Body&& body) noexcept {
    try {
        return body();
    } catch (const std::bad_alloc&) {
        return Report(E_OUTOFMEMORY, iid, "out of memory");
    } catch (...) {
        return Report(E_UNEXPECTED, iid, "unexpected internal failure");
    }
}

}  // namespace qn::visa

// The call pattern of the operation functions: the session's driver object,
// the interface that carries the member, the member call, its converted
// result; results are copied back only after success.
#pragma once

#include <type_traits>

#include "capi/c_session.h"

namespace qn::capi {

// Calls `member(Itf*)` (returning an HRESULT) on the session's interface `Itf`.
template <class Itf, class Member>
ViStatus CallOn(ViSession vi, Member&& member) {
    ComPtr<Itf> itf;
    ViStatus status = InterfaceOf(vi, &itf);
    if (status != VI_SUCCESS) return status;
    return Convert(vi, member(itf.get()));
}

// A member without parameters, as one C function.
template <class Itf>
ViStatus CallSimple(ViSession vi, HRESULT (Itf::*member)()) {
    return Guard(vi, [&] { return CallOn<Itf>(vi, [&](Itf* itf) { return (itf->*member)(); }); });
}

// A text result copied by the string rule into a buffer of `size`.
struct TextResult {
    ViInt32 size;
    ViChar* buffer;
    BSTR text = nullptr;
    ~TextResult() { SysFreeString(text); }
    ViStatus CopyOut(ViSession vi) const { return CopyString(vi, text, size, buffer); }
};

// Saturates a 32-bit count into a 16-bit C result.
inline ViInt16 ToInt16(LONG v) {
    return static_cast<ViInt16>(v > 32767 ? 32767 : v < -32768 ? -32768 : v);
}

}  // namespace qn::capi

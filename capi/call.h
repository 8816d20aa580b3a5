// The call pattern of the operation functions: the session's driver object,
// the interface that carries the member, the member call, its converted
// result; results are copied back only after success.
#pragma once

#include <string>
#include <tuple>
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

// A C argument as the member's parameter type `P`: enumerations from their
// ViInt32 value, texts as BSTRs, booleans as VARIANT_BOOL (any nonzero value
// true), numbers as they are.
template <class P>
struct MemberArg {
    template <class A>
    explicit MemberArg(A a) : value(static_cast<P>(a)) {}
    P get() const { return value; }
    P value;
};
template <>
struct MemberArg<BSTR> {
    explicit MemberArg(ViConstString s) : value(s) {}
    BSTR get() const { return value.get(); }
    com::Bstr value;
};
template <>
struct MemberArg<VARIANT_BOOL> {
    explicit MemberArg(ViBoolean b) : value(b ? VARIANT_TRUE : VARIANT_FALSE) {}
    VARIANT_BOOL get() const { return value; }
    VARIANT_BOOL value;
};

// A member with input parameters only, as one C function: each C argument
// becomes the member's parameter of the same position.
template <class Itf, class... P, class... A>
ViStatus CallMethod(ViSession vi, HRESULT (Itf::*member)(P...), A... args) {
    static_assert(sizeof...(P) == sizeof...(A), "one C argument per member parameter");
    return Guard(vi, [&] {
        std::tuple<MemberArg<P>...> converted{MemberArg<P>(args)...};
        return CallOn<Itf>(vi, [&](Itf* itf) {
            return std::apply([&](const auto&... a) { return (itf->*member)(a.get()...); },
                              converted);
        });
    });
}

// A text result copied by the string rule into a buffer of `size`.
struct TextResult {
    ViInt32 size;
    ViChar* buffer;
    BSTR text = nullptr;
    ~TextResult() { SysFreeString(text); }
    ViStatus CopyOut(ViSession vi) const { return CopyString(vi, text, size, buffer); }
};

// A text by the string rule, taken from `produce` (a callable that fills a
// std::string and returns the C status of getting it) unless an earlier call
// of the same queue left one that did not fit: a text too long for the
// buffer stays with the session and the next call delivers it again.
template <class Produce>
ViStatus DeliverText(ViSession vi, SessionData::Queue queue, ViInt32 bufferSize, ViChar buffer[],
                     Produce&& produce) {
    return Guard(vi, [&]() -> ViStatus {
        if (bufferSize < 0) return CopyString(vi, std::string_view{}, bufferSize, buffer);
        SessionRef session;
        ViStatus status = SessionOf(vi, &session);
        if (status != VI_SUCCESS) return status;
        std::string text;
        if (!session->TakePending(queue, &text)) {
            status = produce(&text);
            if (status < 0) return status;
        }
        const ViStatus copied = CopyString(vi, text, bufferSize, buffer);
        if (copied > 0 && !text.empty()) session->KeepPending(queue, std::move(text));
        return First(status, copied);
    });
}

// Saturates a 32-bit count into a 16-bit C result.
inline ViInt16 ToInt16(LONG v) {
    return static_cast<ViInt16>(v > 32767 ? 32767 : v < -32768 ? -32768 : v);
}

}  // namespace qn::capi

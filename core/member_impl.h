// The implementing side of the member tables (include/QnMemberTable.h).
//
// Interfaces implemented by one object may share member names (the
// class-compliant IIviScopeAcquisition and the instrument-specific
// IQuorlen731XXAcquisition both have get_TimePerRecord), so a class never
// overrides interface members directly: it derives from Tie<Interface, Impl>,
// whose overrides call the class's uniquely named entries
// <Interface>_get_<Name>, <Interface>_<Method>. core/ties.h defines the ties.
//
// A class declares its entries with
//   #include "core/member_entries_begin.h"
//   #include "members/IQuorlen731XXAcquisition.def"
//   #include "QnEndMembers.h"
// and a source file defines them after defining QN_CLASS
//   #include "core/member_definitions_begin.h"
//   #include "members/IQuorlen731XXAcquisition.def"
//   #include "QnEndMembers.h"
// Each entry runs the method frame with a constant MemberInfo built from its row.
#pragma once

#include <type_traits>

#include "QnMemberTable.h"
#include "Quorlen731XXErrors.h"
#include "core/frame.h"
#include "io/io_manager.h"
#include "platform/com/com.h"

namespace qn {

constexpr MemberInfo PropertyMember(std::string_view itf, std::string_view entry, const GUID& iid,
                                    bool is_get, SimValue sim, std::string_view key,
                                    std::string_view command) {
    const bool simulated = sim.kind != SimValue::Kind::None;
    FrameVariant v = is_get ? (simulated ? FrameVariant::F : FrameVariant::D)
                            : (simulated ? FrameVariant::G : FrameVariant::E);
    return MemberInfo{entry, itf, &iid, v, simulated ? key : std::string_view(), sim, command,
                      {"val"}};
}

constexpr MemberInfo NavigationMember(std::string_view itf, std::string_view entry,
                                      const GUID& iid) {
    return MemberInfo{entry, itf, &iid, FrameVariant::A, {}, {}, {}, {"val"}};
}

template <class... Wrappers>
constexpr MemberInfo MethodMember(std::string_view itf, std::string_view entry, const GUID& iid,
                                  std::string_view command,
                                  std::array<std::string_view, kMaxFrameParams> params) {
    constexpr bool has_out = (false || ... || Wrappers::kIsOut);
    return MemberInfo{entry,   itf, &iid, has_out ? FrameVariant::C : FrameVariant::B, {}, {},
                      command, params};
}

// The default read: the row's read command queried and converted by type.
template <VARTYPE Vt, class T>
HRESULT DefaultGetBody(CDriverNode& node, T* val) {
    CDriverIOManager io(node);
    if constexpr (Vt == VT_BOOL) {
        return io.InstrQueryCommandBool(val);
    } else if constexpr (std::is_same_v<T, BSTR>) {
        std::string reply;
        HRESULT hr = io.InstrQueryCommand(&reply);
        // A reply read before a failing status check is delivered with it.
        if (FAILED(hr) && hr != E_IVI_INSTRUMENT_STATUS) return hr;
        *val = com::Utf8ToBstr(reply);
        if (!*val) throw std::bad_alloc();
        return hr;
    } else {
        static_assert(!std::is_enum_v<T>, "an enumerated property needs a CUSTOM read body");
        return io.InstrQueryCommand(val);
    }
}

// The default write: the row's write command, already formatted by the frame.
inline HRESULT DefaultPutBody(CDriverNode& node) {
    return CDriverIOManager(node).InstrPrintCommand();
}

// Forwarding of a class-compliant member to its instrument-specific
// counterpart (which runs its own frame); enumeration values are passed on
// value for value.
template <class C, class U, class T>
HRESULT ForwardGet(C* target, HRESULT (C::*get)(U*), T* val) {
    if (!target) return E_UNEXPECTED;
    U tmp{};
    HRESULT hr = (target->*get)(&tmp);
    *val = static_cast<T>(tmp);
    return hr;
}
template <class C, class U, class T>
HRESULT ForwardPut(C* target, HRESULT (C::*put)(U), T val) {
    if (!target) return E_UNEXPECTED;
    return (target->*put)(static_cast<U>(val));
}

// The tie of an interface to its implementing class; specialised per
// interface in core/ties.h.
template <class Itf, class Impl>
struct Tie;

}  // namespace qn

// Parameter pieces used by the expansions below.
#define QN_P_WRAP_In(T, N) ::qn::In<T>{N}
#define QN_P_WRAP_Out(T, N) ::qn::Out<T>{N}
#define QN_P_WRAP_InBool(T, N) ::qn::In<VARIANT_BOOL, VT_BOOL>{N}
#define QN_P_WRAP_OutBool(T, N) ::qn::Out<VARIANT_BOOL, VT_BOOL>{N}
#define QN_P_WRAP(Dir, T, N) QN_P_WRAP_##Dir(T, N)
#define QN_P_WTYPE_In(T) ::qn::In<T>
#define QN_P_WTYPE_Out(T) ::qn::Out<T>
#define QN_P_WTYPE_InBool(T) ::qn::In<VARIANT_BOOL, VT_BOOL>
#define QN_P_WTYPE_OutBool(T) ::qn::Out<VARIANT_BOOL, VT_BOOL>
#define QN_P_WTYPE(Dir, T, N) QN_P_WTYPE_##Dir(T)
#define QN_P_STR(Dir, T, N) #N

// Tie rows: the interface member calls the class's entry.
#define QN_TIE_PROPERTY(Itf, Name, CType, Vt, Access, Sim, GetCmd, PutCmd, GetBody, PutBody)  \
    QN_IF_GET_##Access(HRESULT get_##Name(CType* val) override {                               \
        return static_cast<Impl*>(this)->Itf##_get_##Name(val);                                \
    })                                                                                         \
    QN_IF_PUT_##Access(HRESULT put_##Name(CType val) override {                                \
        return static_cast<Impl*>(this)->Itf##_put_##Name(val);                                \
    })
#define QN_TIE_NAVIGATION(Itf, Name, Target)                                                   \
    HRESULT get_##Name(Target** val) override {                                                \
        return static_cast<Impl*>(this)->Itf##_get_##Name(val);                                \
    }
#define QN_TIE_METHOD(Itf, Name, Cmd, Body, ...)                                               \
    HRESULT Name(QN_FOR_EACH(QN_P_DECL, __VA_ARGS__)) override {                               \
        return static_cast<Impl*>(this)->Itf##_##Name(QN_FOR_EACH(QN_P_NAME, __VA_ARGS__));    \
    }
#define QN_TIE_METHOD0(Itf, Name, Cmd, Body)                                                   \
    HRESULT Name() override { return static_cast<Impl*>(this)->Itf##_##Name(); }

// Entry declarations inside the implementing class (and the custom bodies).
#define QN_BODY_DECL_GET_DEFAULT(Itf, Name, CType)
#define QN_BODY_DECL_GET_FORWARD(Itf, Name, CType)
#define QN_BODY_DECL_GET_NONE(Itf, Name, CType)
#define QN_BODY_DECL_GET_CUSTOM(Itf, Name, CType) HRESULT Itf##_get_##Name##_Body(CType* val);
#define QN_BODY_DECL_PUT_DEFAULT(Itf, Name, CType)
#define QN_BODY_DECL_PUT_FORWARD(Itf, Name, CType)
#define QN_BODY_DECL_PUT_NONE(Itf, Name, CType)
#define QN_BODY_DECL_PUT_CUSTOM(Itf, Name, CType) HRESULT Itf##_put_##Name##_Body(CType val);
#define QN_ENTRY_PROPERTY(Itf, Name, CType, Vt, Access, Sim, GetCmd, PutCmd, GetBody, PutBody) \
    QN_IF_GET_##Access(HRESULT Itf##_get_##Name(CType* val);)                                 \
    QN_IF_PUT_##Access(HRESULT Itf##_put_##Name(CType val);)                                  \
    QN_BODY_DECL_GET_##GetBody(Itf, Name, CType) QN_BODY_DECL_PUT_##PutBody(Itf, Name, CType)
#define QN_ENTRY_NAVIGATION(Itf, Name, Target) HRESULT Itf##_get_##Name(Target** val);
#define QN_BODY_DECL_METHOD_CUSTOM(Itf, Name, ...) \
    HRESULT Itf##_##Name##_Body(QN_FOR_EACH(QN_P_DECL, __VA_ARGS__));
#define QN_BODY_DECL_METHOD_FORWARD(Itf, Name, ...)
#define QN_ENTRY_METHOD(Itf, Name, Cmd, Body, ...)                     \
    HRESULT Itf##_##Name(QN_FOR_EACH(QN_P_DECL, __VA_ARGS__));         \
    QN_BODY_DECL_METHOD_##Body(Itf, Name, __VA_ARGS__)
#define QN_BODY_DECL_METHOD0_CUSTOM(Itf, Name) HRESULT Itf##_##Name##_Body();
#define QN_BODY_DECL_METHOD0_FORWARD(Itf, Name)
#define QN_ENTRY_METHOD0(Itf, Name, Cmd, Body) \
    HRESULT Itf##_##Name();                    \
    QN_BODY_DECL_METHOD0_##Body(Itf, Name)

// Bodies called by the defined entries.
#define QN_GET_BODY_DEFAULT(Itf, Name, CType, Vt) ::qn::DefaultGetBody<Vt>(*this, val)
#define QN_GET_BODY_CUSTOM(Itf, Name, CType, Vt) Itf##_get_##Name##_Body(val)
#define QN_GET_BODY_FORWARD(Itf, Name, CType, Vt)                                            \
    [&](auto* target) {                                                                      \
        return ::qn::ForwardGet(target, &std::remove_pointer_t<decltype(target)>::get_##Name, \
                                val);                                                        \
    }(Counterpart(static_cast<Itf*>(nullptr)))
#define QN_PUT_BODY_DEFAULT(Itf, Name, CType, Vt) ::qn::DefaultPutBody(*this)
#define QN_PUT_BODY_CUSTOM(Itf, Name, CType, Vt) Itf##_put_##Name##_Body(val)
#define QN_PUT_BODY_FORWARD(Itf, Name, CType, Vt)                                            \
    [&](auto* target) {                                                                      \
        return ::qn::ForwardPut(target, &std::remove_pointer_t<decltype(target)>::put_##Name, \
                                val);                                                        \
    }(Counterpart(static_cast<Itf*>(nullptr)))
#define QN_METHOD_BODY_CUSTOM(Itf, Name, ...) \
    Itf##_##Name##_Body(QN_FOR_EACH(QN_P_NAME, __VA_ARGS__))
#define QN_METHOD_BODY_FORWARD(Itf, Name, ...)                 \
    [&](auto* target) -> HRESULT {                             \
        if (!target) return E_UNEXPECTED;                      \
        return target->Name(QN_FOR_EACH(QN_P_NAME, __VA_ARGS__)); \
    }(Counterpart(static_cast<Itf*>(nullptr)))
#define QN_METHOD0_BODY_CUSTOM(Itf, Name) Itf##_##Name##_Body()
#define QN_METHOD0_BODY_FORWARD(Itf, Name)      \
    [&](auto* target) -> HRESULT {              \
        if (!target) return E_UNEXPECTED;       \
        return target->Name();                  \
    }(Counterpart(static_cast<Itf*>(nullptr)))

// Entry definitions in a source file; QN_CLASS names the implementing class.
#define QN_DEFINE_PROPERTY(Itf, Name, CType, Vt, Access, Sim, GetCmd, PutCmd, GetBody, PutBody) \
    QN_IF_GET_##Access(HRESULT QN_CLASS::Itf##_get_##Name(CType* val) {                        \
        static constexpr ::qn::MemberInfo kMember = ::qn::PropertyMember(                      \
            #Itf, "get_" #Name, iid_of<Itf>, true, Sim, #Itf "." #Name, GetCmd);               \
        return ::qn::RunFrame(                                                                 \
            *this, kMember, [&] { return QN_GET_BODY_##GetBody(Itf, Name, CType, Vt); },       \
            ::qn::Out<CType, Vt>{val});                                                        \
    })                                                                                         \
    QN_IF_PUT_##Access(HRESULT QN_CLASS::Itf##_put_##Name(CType val) {                         \
        static constexpr ::qn::MemberInfo kMember = ::qn::PropertyMember(                      \
            #Itf, "put_" #Name, iid_of<Itf>, false, Sim, #Itf "." #Name, PutCmd);              \
        return ::qn::RunFrame(                                                                 \
            *this, kMember, [&] { return QN_PUT_BODY_##PutBody(Itf, Name, CType, Vt); },       \
            ::qn::In<CType, Vt>{val});                                                         \
    })
#define QN_DEFINE_NAVIGATION(Itf, Name, Target)                                                \
    HRESULT QN_CLASS::Itf##_get_##Name(Target** val) {                                         \
        static constexpr ::qn::MemberInfo kMember =                                            \
            ::qn::NavigationMember(#Itf, "get_" #Name, iid_of<Itf>);                           \
        return ::qn::RunFrame(                                                                 \
            *this, kMember,                                                                    \
            [&] {                                                                              \
                *val = static_cast<Target*>(this);                                             \
                (*val)->AddRef();                                                              \
                return S_OK;                                                                   \
            },                                                                                 \
            ::qn::Out<Target*>{val});                                                          \
    }
#define QN_DEFINE_METHOD(Itf, Name, Cmd, Body, ...)                                            \
    HRESULT QN_CLASS::Itf##_##Name(QN_FOR_EACH(QN_P_DECL, __VA_ARGS__)) {                      \
        static constexpr ::qn::MemberInfo kMember =                                            \
            ::qn::MethodMember<QN_FOR_EACH(QN_P_WTYPE, __VA_ARGS__)>(                          \
                #Itf, #Name, iid_of<Itf>, Cmd, {QN_FOR_EACH(QN_P_STR, __VA_ARGS__)});          \
        return ::qn::RunFrame(                                                                 \
            *this, kMember, [&] { return QN_METHOD_BODY_##Body(Itf, Name, __VA_ARGS__); },     \
            QN_FOR_EACH(QN_P_WRAP, __VA_ARGS__));                                              \
    }
#define QN_DEFINE_METHOD0(Itf, Name, Cmd, Body)                                                \
    HRESULT QN_CLASS::Itf##_##Name() {                                                         \
        static constexpr ::qn::MemberInfo kMember =                                            \
            ::qn::MethodMember<>(#Itf, #Name, iid_of<Itf>, Cmd, {});                           \
        return ::qn::RunFrame(*this, kMember,                                                  \
                              [&] { return QN_METHOD0_BODY_##Body(Itf, Name); });              \
    }

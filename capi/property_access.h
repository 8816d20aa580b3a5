// Typed access to a driver property through its COM interface, for the
// attribute functions. Every property of the member tables (and of the
// inherent interfaces) gets one PropertyAccess: its C type, taken from the
// member's own signature, and a getter and a setter that ask the target object
// for the interface and call the member through its full frame.
#pragma once

#include <span>
#include <string_view>
#include <type_traits>

#include "platform/com/bstr.h"
#include "platform/com/safearray.h"
#include "platform/com/unknown.h"
#include "visatype.h"

namespace qn::capi {

enum class CType : unsigned char { kInt32, kReal64, kBoolean, kString, kSession };

std::string_view CTypeName(CType t);

// One value crossing the attribute functions; only the member of the
// attribute's type is used.
struct AttrValue {
    ViInt32 i32 = 0;
    ViReal64 r64 = 0.0;
    ViBoolean boolean = VI_FALSE;
    com::Bstr str;
};

// Both are called with the property's interface pointer (as IUnknown*).
using PropertyGet = HRESULT (*)(IUnknown* itf, AttrValue* out);
using PropertyPut = HRESULT (*)(IUnknown* itf, const AttrValue& in);

struct PropertyAccess {
    std::string_view key;  // "Interface.Property"
    const IID* iid;        // the interface that carries the property
    CType type;
    PropertyGet get;  // null for a write-only property
    PropertyPut put;  // null for a read-only property
};

// Every property the driver has, from the member tables and the inherent
// interfaces.
std::span<const PropertyAccess> Properties();
// The property of a key, or null.
const PropertyAccess* FindProperty(std::string_view key);

// The C type of a member's value type; `vt` tells booleans from 16-bit
// integers where the member table gives it (VT_EMPTY: a 16-bit value is a
// boolean, as everywhere in the inherent interfaces).
template <class T>
constexpr CType CTypeOf(VARTYPE vt = VT_EMPTY) {
    if constexpr (std::is_same_v<T, double>) return CType::kReal64;
    else if constexpr (std::is_same_v<T, BSTR>) return CType::kString;
    else if constexpr (std::is_same_v<T, VARIANT_BOOL>)
        return vt == VT_EMPTY || vt == VT_BOOL ? CType::kBoolean : CType::kInt32;
    else {
        static_assert(std::is_enum_v<T> || std::is_same_v<T, LONG>, "unsupported property type");
        return CType::kInt32;
    }
}

namespace detail {

template <class T>
void Store(T v, CType type, AttrValue* out) {
    if constexpr (std::is_same_v<T, double>) out->r64 = v;
    else if constexpr (std::is_same_v<T, BSTR>) out->str = com::Bstr::Adopt(v);
    else if constexpr (std::is_same_v<T, VARIANT_BOOL>) {
        if (type == CType::kBoolean) out->boolean = v ? VI_TRUE : VI_FALSE;
        else out->i32 = v;
    } else out->i32 = static_cast<ViInt32>(v);
}

template <class T>
T Load(const AttrValue& in, CType type) {
    if constexpr (std::is_same_v<T, double>) return in.r64;
    else if constexpr (std::is_same_v<T, BSTR>) return in.str.get();
    else if constexpr (std::is_same_v<T, VARIANT_BOOL>) {
        if (type == CType::kBoolean) return in.boolean ? VARIANT_TRUE : VARIANT_FALSE;
        return static_cast<VARIANT_BOOL>(in.i32);
    } else return static_cast<T>(in.i32);
}

}  // namespace detail

template <class Itf, class T, HRESULT (Itf::*Get)(T*), VARTYPE Vt = VT_EMPTY>
HRESULT GetThunk(IUnknown* itf, AttrValue* out) {
    T v{};
    const HRESULT hr = (static_cast<Itf*>(itf)->*Get)(&v);
    if (SUCCEEDED(hr)) detail::Store<T>(v, CTypeOf<T>(Vt), out);
    else if constexpr (std::is_same_v<T, BSTR>) SysFreeString(v);
    return hr;
}

template <class Itf, class T, HRESULT (Itf::*Put)(T), VARTYPE Vt = VT_EMPTY>
HRESULT PutThunk(IUnknown* itf, const AttrValue& in) {
    return (static_cast<Itf*>(itf)->*Put)(detail::Load<T>(in, CTypeOf<T>(Vt)));
}

}  // namespace qn::capi

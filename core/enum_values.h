// Which values an enumeration accepts, from the value sets generated out of
// the enumeration header (qn_enum_sets.h). Most enumerations are closed sets;
// the ones below are checked by their methods.
#pragma once

#include <algorithm>
#include <iterator>

#include "qn_enum_sets.h"

namespace qn {

enum class EnumKind {
    Closed,  // one of the members
    Open,    // not checked here: the members name common values, or the method
             // checks its own range with its own message
};
template <class E>
inline constexpr EnumKind kEnumKind = EnumKind::Closed;
// A time-out in milliseconds, handed unchanged to the I/O timeout.
template <>
inline constexpr EnumKind kEnumKind<Quorlen731XXTimeOutEnum> = EnumKind::Open;
// The reasons for a service request are a bit set whose range the method
// checks itself (bits between the named ones are accepted and ignored).
template <>
inline constexpr EnumKind kEnumKind<Quorlen731XXSRQReasonEnum> = EnumKind::Open;
// The register methods name an unknown sub-register in their own words.
template <>
inline constexpr EnumKind kEnumKind<Quorlen731XXStatusSubRegisterEnum> = EnumKind::Open;

template <class E>
constexpr bool InEnumSet(E value) {
    const LONG v = static_cast<LONG>(value);
    constexpr const auto& kValues = EnumSet<E>::kValues;
    if constexpr (kEnumKind<E> == EnumKind::Open) {
        return true;
    } else {
        return std::find(std::begin(kValues), std::end(kValues), v) != std::end(kValues);
    }
}

}  // namespace qn

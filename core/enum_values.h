// Which values an enumeration accepts, from the value sets generated out of
// the enumeration header (qn_enum_sets.h). Most enumerations are closed sets;
// the two below are read differently.
#pragma once

#include <algorithm>
#include <iterator>

#include "qn_enum_sets.h"

namespace qn {

enum class EnumKind {
    Closed,  // one of the members
    Flags,   // any combination of the member bits, 0 included
    Open,    // any value: the members only name common ones
};
template <class E>
inline constexpr EnumKind kEnumKind = EnumKind::Closed;
// A time-out in milliseconds, handed unchanged to the I/O timeout.
template <>
inline constexpr EnumKind kEnumKind<Quorlen731XXTimeOutEnum> = EnumKind::Open;
// The reasons for a service request are a bit set.
template <>
inline constexpr EnumKind kEnumKind<Quorlen731XXSRQReasonEnum> = EnumKind::Flags;

template <class E>
constexpr bool InEnumSet(E value) {
    const LONG v = static_cast<LONG>(value);
    constexpr const auto& kValues = EnumSet<E>::kValues;
    if constexpr (kEnumKind<E> == EnumKind::Open) {
        return true;
    } else if constexpr (kEnumKind<E> == EnumKind::Flags) {
        LONG all = 0;
        for (LONG bit : kValues) all |= bit;
        return (v & ~all) == 0;
    } else {
        return std::find(std::begin(kValues), std::end(kValues), v) != std::end(kValues);
    }
}

}  // namespace qn

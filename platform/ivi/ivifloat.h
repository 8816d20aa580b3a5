// Special floating-point values of the IVI shared floating-point library: the
// value a double query returns when the reply holds no number.
#pragma once

#include <cmath>
#include <limits>

namespace qn::ivi {

// A quiet NaN: "no number was read". Compare with IsIviNaN, never with ==.
constexpr double IviFloatNaN() noexcept {
    return std::numeric_limits<double>::quiet_NaN();
}
constexpr double IviFloatPositiveInfinity() noexcept {
    return std::numeric_limits<double>::infinity();
}
constexpr double IviFloatNegativeInfinity() noexcept {
    return -std::numeric_limits<double>::infinity();
}
inline bool IsIviNaN(double v) noexcept {
    return std::isnan(v);
}

}  // namespace qn::ivi

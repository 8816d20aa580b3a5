// Simulation values: the value a simulated read returns before the first
// write. Every simulated property has one value for every model, so each
// member-table row carries it as a constant SimValue literal that the method
// frame reads directly; no model-keyed map is built for them.
#pragma once

#include <cstdint>

#include "platform/com/types.h"

namespace qn {

// Constant description of a simulation value, usable in constexpr member
// tables: a type tag and the value in the matching field.
struct SimValue {
    enum class Kind : std::uint8_t { None, Short, Long, Double, String };
    Kind kind = Kind::None;
    LONG integer = 0;  // Short and Long (booleans as short: VARIANT_TRUE is -1)
    double real = 0.0;
    const char* text = nullptr;  // String, UTF-8, static storage

    static constexpr SimValue Short(SHORT v) { return {Kind::Short, v, 0.0, nullptr}; }
    static constexpr SimValue Long(LONG v) { return {Kind::Long, v, 0.0, nullptr}; }
    static constexpr SimValue Double(double v) { return {Kind::Double, 0, v, nullptr}; }
    static constexpr SimValue String(const char* v) { return {Kind::String, 0, 0.0, v}; }
};

}  // namespace qn

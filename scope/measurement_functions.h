// The automatic measurements the instrument offers: for each function value
// its SCPI keyword, the form of its query, its display name and the kinds
// of measurement object that accept it.
#pragma once

#include <string_view>

#include "io/enum_command.h"
#include "platform/com/types.h"

namespace qn {

enum class MeasurementForm {
    kPlain,        // ":MEAS:<token>?"
    kComplement,   // ":MEAS:<token>?", the result is 100 - reply
    kTwoSources,   // ":MEAS:<token>? <source>,<second source>"
    kValueAtTime,  // ":MEAS:<token>? <time>,<source>"
    kTimeAtValue,  // ":MEAS:<token>? <level>, <signed occurrence>, <source>"
    kTimeOfEdge,   // ":MEAS:<token>? <signed occurrence>, <source>"
};

// Which kinds of measurement object accept a function; every function is
// accepted on an analog channel.
enum MeasurementKinds : unsigned {
    kAnalogOnly = 0,
    kOnDigital = 1,
    kOnExternal = 2,
    kOnMath = 4,
};

struct MeasurementFunction {
    LONG value;
    MeasurementForm form;
    std::string_view name;  // what FunctionName returns
    unsigned kinds;         // MeasurementKinds bits
};

// The row of `value`, or null outside the table.
const MeasurementFunction* FindMeasurementFunction(LONG value);

// SCPI keywords of the functions; model-specific rows are searched before
// the rows for every model.
const CEnumCommandTable& MeasurementTokens();

// The instrument's value for "no result".
inline constexpr double kNoMeasurementResult = 9.9e37;

}  // namespace qn

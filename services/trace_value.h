// Text of traced parameter values. A value is described by its VARIANT type
// and a pointer to where it lives, the way a VT_BYREF VARIANT describes it,
// so that nothing is copied or converted unless a trace is being recorded.
#pragma once

#include <string>
#include <vector>

#include "platform/com/safearray.h"
#include "platform/com/types.h"
#include "platform/com/variant.h"

namespace qn {

// Text of a value of base type `vt` (no VT_ARRAY, no VT_BYREF) stored at `p`:
// "<empty>", "<null>", "%d", 64-bit decimal, "%.15g", "true"/"false", the
// text of a string, "<variant>", "<interface>" or "<unknown>". A null `p`
// reads as "<null>".
std::string FormatTraceValue(VARTYPE vt, const void* p);

// Text of the value a VARIANT holds, by value or by reference. Arrays have
// no single text: use DescribeTraceArray.
std::string FormatTraceVariant(const VARIANT& v);

// The array attributes of a traced parameter.
struct TraceArrayText {
    int numDims = 0;
    std::string dimSizes;               // element count of each dimension, joined by ","
    std::vector<std::string> elements;  // values of a one-dimensional array, from index 0
};

// Describes `psa` (may be null). Elements are listed only for a
// one-dimensional array, at most `maxElements` of them, and only when
// `withElements`; an element that cannot be read ends the list.
TraceArrayText DescribeTraceArray(SAFEARRAY* psa, bool withElements, long maxElements);

}  // namespace qn

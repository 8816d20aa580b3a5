// The conversion of the driver's result codes (HRESULTs) into C statuses, and
// the texts Qn731XX_error_message gives for C statuses. Both tables are built
// once per process from the driver's message table and never change.
#pragma once

#include <string_view>

#include "platform/com/types.h"
#include "visatype.h"

namespace qn::capi {

// The generic failure status: a failure without a row of its own, or a null
// pointer given for a result.
inline constexpr ViStatus kFailure = static_cast<ViStatus>(0x80000000u);

// Statuses of the attribute functions themselves.
inline constexpr ViStatus kAttributeNotRecognized = static_cast<ViStatus>(0xBFFA000Cu);
inline constexpr ViStatus kAttributeReadOnly = static_cast<ViStatus>(0xBFFA000Du);
inline constexpr ViStatus kAttributeWrongType = static_cast<ViStatus>(0xBFFA0015u);
inline constexpr ViStatus kBadlyFormedSelector = static_cast<ViStatus>(0xBFFA0066u);
inline constexpr ViStatus kOutOfMemory = static_cast<ViStatus>(0xBFFA0056u);

// The C status of a result code: the row of the conversion table, else the
// generic failure for a negative code and 0 otherwise.
ViStatus ToCStatus(HRESULT hr);

// The text of a C status (the driver's message text without its name prefix,
// placeholders kept), or an empty view when there is none.
std::string_view StatusText(ViStatus status);

}  // namespace qn::capi

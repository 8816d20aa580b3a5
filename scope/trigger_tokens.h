// The instrument tokens of the trigger enumerations, the TV signal formats
// with their line counts, and the parsers of the trigger replies that are
// more than one token (range replies, TV mode replies).
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "Quorlen731XXEnums.h"
#include "io/enum_command.h"

namespace qn {

const CEnumCommandTable& TriggerTypeTokens();       // ":TRIG:MODE"
const CEnumCommandTable& TriggerCouplingTokens();   // ":TRIG:COUP?" replies
const CEnumCommandTable& TriggerModifierTokens();   // ":TRIG:SWE"
const CEnumCommandTable& TriggerSlopeTokens();      // ":TRIG:SLOP", state clock slope
const CEnumCommandTable& ACLineSlopeTokens();       // Either has no token
const CEnumCommandTable& GlitchConditionTokens();   // ":TRIG:GLIT:QUAL"
const CEnumCommandTable& GlitchPolarityTokens();    // ":TRIG:GLIT:POL"; Either has no token
const CEnumCommandTable& TvEventTokens();           // ":TRIG:TV:MODE"
const CEnumCommandTable& TvPolarityTokens();        // ":TRIG:TV:POL"
const CEnumCommandTable& TvSignalFormatTokens();    // "TRIG:TV:STAN"

// The command that selects one trigger coupling (AC to noise reject); empty
// for a value that has none (TV coupling cannot be selected).
std::string_view TriggerCouplingCommand(LONG coupling);

// The duration qualifier of a width condition (":TRIG:DUR:QUAL INR"), empty
// for a value outside the enumeration.
std::string_view WidthQualifierCommand(LONG condition);

// Line counts of a TV signal format: lines in the first field (the line
// numbering of the field-selecting commands) and lines in the frame (the
// largest line number the format has).
struct TvLineCounts {
    LONG per_field;
    LONG per_frame;
};
TvLineCounts TvLinesOf(LONG signal_format);

// A ":TRIG:TV:MODE?" reply in the short forms some firmware sends, brought
// to the token of TvEventTokens ("LINEF2" -> "LINE", "FIE1" -> "FIELD1").
std::string NormalizeTvModeReply(std::string_view reply);

// Field `index` (from 0) of a comma-separated numeric reply with any double
// quotes removed ("\"1e-06\",\"2e-06\""); nullopt when the field is missing
// or is not a number.
std::optional<double> NumericReplyField(std::string_view reply, std::size_t index);

}  // namespace qn

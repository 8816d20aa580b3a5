// Parsers of the measurement subsystem's replies. Each is strict: a reply
// that does not have exactly the expected fields, or a number that does not
// fit its type, is refused rather than read partly.
#pragma once

#include <string>
#include <string_view>

#include "platform/com/types.h"

namespace qn {

// The threshold definition "THR,<mode>,<high>,<mid>,<low>": the mode is a
// word of upper-case letters, the levels finite decimal numbers.
struct ThresholdReply {
    std::string mode;
    double high = 0.0;
    double mid = 0.0;
    double low = 0.0;
};
bool ParseThresholdReply(std::string_view reply, ThresholdReply* out);

// Two decimal integers "<a>,<b>" (the delay definition and the activity
// counters); each must fit a 32-bit LONG.
bool ParseIntegerPair(std::string_view reply, LONG* a, LONG* b);

// The measurement sources "<first>[,<second>]", blanks trimmed; the second
// is empty when there is no comma.
void SplitSourcesReply(std::string_view reply, std::string* first, std::string* second);

// A source name the instrument reported can be put into a command only when
// it is a plain word (no blanks, separators or control bytes).
bool IsSourceWord(std::string_view s);

}  // namespace qn

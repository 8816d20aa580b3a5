// Numeric replies of instrument queries: a decimal number read from the start
// of the reply (leading white space skipped, parsing stops at the first
// character that cannot continue the number) and its typed conversions.
#pragma once

#include <string_view>

#include "platform/com/types.h"

namespace qn {

struct ReplyNumber {
    double value = 0.0;  // 0 when no digits were found
    bool found = false;  // the reply began (after white space) with a number
};

ReplyNumber ParseReplyNumber(std::string_view reply);

// The conversions of a parsed reply: long truncates toward zero (saturating
// at the 32-bit range, NaN gives 0), short is the low 16 bits of that long,
// bool the low 8 bits, float the double rounded to single precision; a
// double reply without a number is the IVI "no number" value (a quiet NaN).
LONG ReplyToLong(const ReplyNumber& n);
SHORT ReplyToShort(const ReplyNumber& n);
bool ReplyToBool(const ReplyNumber& n);
float ReplyToFloat(const ReplyNumber& n);
double ReplyToDouble(const ReplyNumber& n);

}  // namespace qn

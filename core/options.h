// The option-string grammar shared by the Initialize option string and every
// DriverSetup text.
//
//   * The DriverSetup part is found first: the whole string is upper-cased
//     and searched for "DRIVERSETUP="; everything after it is the DriverSetup
//     text, and only the part before it holds ordinary options. So DriverSetup
//     must be the last option, its text may contain commas, and a blank
//     before its "=" hides it.
//   * Pairs are runs of the form  name=value  where neither part contains a
//     comma or "=" and neither is empty; anything between such runs (commas,
//     stray words, a pair with an empty side) is skipped without error. Name
//     and value are trimmed. A later pair with exactly the same name replaces
//     an earlier one, keeping the earlier one's place; pairs are processed in
//     the order their names first appeared.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qn {

struct OptionPair {
    std::string name;   // trimmed, case as written
    std::string value;  // trimmed
};

struct SplitOptionString {
    std::string ordinary;      // the part before "DriverSetup="
    std::string driver_setup;  // the text after it (empty when absent)
    bool has_driver_setup = false;
};

SplitOptionString SplitDriverSetup(std::string_view options);

// The pairs of an option or DriverSetup text, in processing order.
std::vector<OptionPair> ParseOptionPairs(std::string_view text);

// "true", "VI_TRUE", "1" / "false", "VI_FALSE", "0", any letter case.
std::optional<bool> ParseBooleanWord(std::string_view word);

// Leading white space, an optional sign, then decimal digits as far as they
// go; no digits reads as 0. Saturates at the 32-bit range.
long ParseDecimalPrefix(std::string_view text);

std::string ToLower(std::string_view s);
std::string ToUpper(std::string_view s);
std::string_view TrimBlanks(std::string_view s);
bool EqualsNoCase(std::string_view a, std::string_view b);

}  // namespace qn

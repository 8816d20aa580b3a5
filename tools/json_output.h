// The --json output of qn731xx: one object per command on one line.
#pragma once

#include <nlohmann/json.hpp>

namespace qn::tools {

// Fields keep the order they were added in.
using Json = nlohmann::ordered_json;

// Prints `j` and a line feed to stdout. Text that is not valid UTF-8 (an
// instrument's reply may hold any byte) is printed with U+FFFD in place of
// the bad bytes instead of failing.
void PrintJson(const Json& j);

}  // namespace qn::tools

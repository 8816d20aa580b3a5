// Applies an option string and DriverSetup texts to the session state.
#pragma once

#include <string_view>

#include "core/error_manager.h"
#include "core/session.h"

namespace qn {

// Processes an Initialize option string: its DriverSetup text first, then
// the ordinary options. Stops at the first failure and returns it.
HRESULT ProcessOptionString(DriverSession& s, const CErrorManagerBase& err,
                            std::string_view options);

// Parses and processes a DriverSetup text (the DriverSetup table is cleared
// first and DriverSetup remembers the text).
HRESULT ProcessDriverSetupText(DriverSession& s, const CErrorManagerBase& err,
                               std::string_view text);

// One ordinary option: the six session flags by case-insensitive name;
// unknown names are recorded only.
HRESULT ProcessInitOption(DriverSession& s, const CErrorManagerBase& err, std::string_view name,
                          std::string_view value);

}  // namespace qn

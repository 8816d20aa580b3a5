// Shared helpers of the qn731xx commands: opening a session from the common
// options and reporting driver errors.
#pragma once

#include <string>

#include "core/root.h"
#include "tools/cli_args.h"

namespace qn::tools {

// The options every session-opening command accepts.
extern const OptionSpec kSessionOptions[6];

// The thread's error description after a failed call, or "" when none.
std::string LastErrorText();
// Prints "error 0x...: (NAME) description" to stderr and returns 1.
int ReportFailure(const char* what, HRESULT hr);

// Creates the driver and initializes it from the session options.
HRESULT OpenSession(const CliArgs& args, ComPtr<Quorlen731XX>* driver);

}  // namespace qn::tools

// Shared helpers of the qn731xx commands: opening a session from the common
// options and reporting driver errors.
#pragma once

#include <memory>
#include <string>

#include "core/root.h"
#include "emulator/emulator.h"
#include "tools/cli_args.h"

namespace qn::tools {

// The options every session-opening command accepts.
extern const OptionSpec kSessionOptions[7];

// A driver session, and the embedded emulator it talks to when the command
// was given no resource.
struct ToolSession {
    std::unique_ptr<emu::Emulator> emulator;
    ComPtr<Quorlen731XX> driver;
};

// The thread's error description after a failed call, or "" when none.
std::string LastErrorText();
// Prints "error 0x...: (NAME) description" to stderr and returns 1.
int ReportFailure(const char* what, HRESULT hr);

// As ReportFailure; when the instrument reported errors (a failed status
// check), also prints the instrument's error queue as the driver reads it.
int ReportFailure(Quorlen731XX* driver, const char* what, HRESULT hr);

// Creates the driver and initializes it from the session options. Without
// --resource (and without --simulate) an emulator of --model (default
// QDS4032A) is started on loopback and opened through its raw socket.
HRESULT OpenSession(const CliArgs& args, ToolSession* session);

}  // namespace qn::tools

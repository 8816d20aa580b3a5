// Shared helpers of the qn731xx commands: opening a session from the common
// options and reporting driver errors.
#pragma once

#include <memory>
#include <string>

#include "core/root.h"
#include "emulator/emulator.h"
#include "tools/command_line.h"

namespace qn::tools {

// A driver session, and the embedded emulator it talks to when the command
// was given no resource.
struct ToolSession {
    std::unique_ptr<emu::Emulator> emulator;
    ComPtr<Quorlen731XX> driver;
};

// The thread's error description after a failed call, or "" when none.
std::string LastErrorText();
// Prints "WHAT failed: error 0x... (NAME)" and the description to stderr
// and returns 1.
int ReportFailure(const std::string& what, HRESULT hr);

// As ReportFailure; when the instrument reported errors (a failed status
// check), also prints the instrument's error queue as the driver reads it.
int ReportFailure(Quorlen731XX* driver, const std::string& what, HRESULT hr);

// Prints the instrument's error queue to stderr as the driver reads it;
// returns the number of errors printed.
int PrintInstrumentErrors(Quorlen731XX* driver);

// Creates the driver and initializes it from the session options, with the
// status check on unless --no-status-check (an explicit QueryInstrStatus
// in --options still wins). Without --resource (and
// without --simulate) an emulator of --model is started on loopback and
// opened through its raw socket.
HRESULT OpenSession(const SessionOptions& options, ToolSession* session);

// Closes the session: 0, or 1 after reporting the failure.
int CloseSession(ToolSession& session);

}  // namespace qn::tools

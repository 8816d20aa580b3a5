// Argument checks and reply formatting shared by the command handlers. Each check reports the
// SCPI error itself and returns nullopt/false, so a handler can simply return.
#pragma once

#include <optional>
#include <span>
#include <string>
#include <string_view>

#include "emulator/command_tree.h"
#include "emulator/instrument.h"

namespace qn::emu {

// Exactly `count` arguments (-109 missing, -108 too many).
bool ExpectArgs(Instrument& inst, const Call& call, std::size_t count);
// Between `min` and `max` arguments.
bool ExpectArgs(Instrument& inst, const Call& call, std::size_t min, std::size_t max);

// Decimal number (NR1/NR2/NR3); -104 for anything else.
std::optional<double> NumberArg(Instrument& inst, const Argument& arg);
// Number within [min, max]; -222 outside.
std::optional<double> NumberInRange(Instrument& inst, const Argument& arg, double min, double max);
// Integer within [min, max]; -222 outside.
std::optional<int> IntegerInRange(Instrument& inst, const Argument& arg, int min, int max);
// ON/OFF/1/0 (any non-zero number is ON).
std::optional<bool> BoolArg(Instrument& inst, const Argument& arg);
// Quoted string argument; -104 for other kinds.
std::optional<std::string> StringArg(Instrument& inst, const Argument& arg);
// Character data matched against long/short patterns such as "NORMal"; returns the short form
// in upper case, -224 when nothing matches.
std::optional<std::string> TokenArg(Instrument& inst, const Argument& arg,
                                    std::span<const char* const> patterns);

std::string FormatNumber(double value);
std::string FormatBool(bool value);
std::string Quote(std::string_view text);

// Handler of a common command that takes no argument.
bool NoArgs(Instrument& inst, const Call& call);

}  // namespace qn::emu

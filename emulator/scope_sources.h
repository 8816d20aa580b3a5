// Waveform source names ("CHAN1", "POD2", "MATH") as the scope commands take them.
#pragma once

#include <optional>
#include <string>

#include "emulator/command_tree.h"
#include "emulator/instrument.h"

namespace qn::emu {

// Canonical source ("CHAN<n>", "POD<n>", "DIG<d>", "MATH") from CHANnel<n>/POD<n>/DIGital<d>/MATH/FUNCtion,
// refused with -224 when the model has no such source.
std::optional<std::string> SourceArg(Instrument& inst, const Argument& arg);
bool IsDisplayed(Instrument& inst, const std::string& source);

// The channel addressed by the header suffix; -114 beyond the model's channel count.
ChannelSettings* ChannelOf(Instrument& inst, const Call& call);

}  // namespace qn::emu

// Selection of the waveform source that the instrument's :WAV subsystem
// works on, and the horizontal reference point. Every points-related
// acquisition property and every waveform read selects a displayed source
// first. The functions take the root object's node: their traffic goes
// through its I/O manager and their failures through its error manager.
#pragma once

#include <string_view>

#include "core/node.h"
#include "platform/com/types.h"

namespace qn {

// The screen position of the horizontal reference (":TIM:REF?").
enum class TimeReference : LONG { kLeft = 0, kCenter = 1, kRight = 2 };

// Fraction of the record that lies left of the reference point:
// LEFT 0.1, CENT 0.5, RIGHT 0.9.
double TimeReferenceFraction(TimeReference reference);

// Sends ":STAT? <source>" and reads an integer: the source is displayed when
// the reply is exactly 1.
HRESULT IsSourceDisplayed(CDriverNode& root, std::string_view source, bool* displayed);

// Selects `source` with ":WAV:SOUR <source>" when it is displayed; otherwise
// fails with E_IVISCOPE_CHANNEL_NOT_ENABLED and sends nothing more.
HRESULT SetWaveformSource(CDriverNode& root, std::string_view source);

// Keeps the current waveform source when it is displayed; otherwise selects
// the first displayed analog channel, then pod (probed once per digital
// channel it carries, in channel order), then the math waveform. Fails with
// E_IVISCOPE_CHANNEL_NOT_ENABLED when nothing is displayed; a failing query
// ends the search with its error.
HRESULT EnsureWaveformSourceDisplayed(CDriverNode& root);

// Sends ":TIM:REF?" and maps "LEFT", "CENT" and "RIGHT" (also the short
// form "RIGH" that instruments answer); any other reply fails with
// E_IVI_UNEXPECTED_RESPONSE.
HRESULT GetTimeReference(CDriverNode& root, TimeReference* reference);

}  // namespace qn

// The writers of the trigger shadow (scope/trigger_shadow.h) and the trigger
// I/O helpers the trigger members share. Each writer sends its type's
// settings only while its pending flag is set and its type is the current
// trigger type, and clears the flag after a successful send; a failing
// writer keeps the flag, so the next write or type selection tries again.
// All run inside the frame of the member that calls them.
#pragma once

#include <string>
#include <string_view>

#include "core/features.h"
#include "core/node.h"
#include "io/enum_command.h"
#include "scope/trigger_shadow.h"

namespace qn {

HRESULT WriteTriggerEdge(CDriverNode& node);
HRESULT WriteTriggerGlitch(CDriverNode& node);
HRESULT WriteTriggerWidth(CDriverNode& node);
HRESULT WriteTriggerPattern(CDriverNode& node);
HRESULT WriteTriggerState(CDriverNode& node);

// The mask and pattern words of the pattern and state commands: the analog
// bits of four-channel instruments, the two channels and external input of
// two-channel ones, or the two channels above the digital bits of
// two-channel instruments with digital channels.
struct PatternWords {
    LONG mask;
    LONG pattern;
};
PatternWords TriggerPatternWords(const FeatureRecord& f, const TriggerShadow::Pattern& p);

// The duration-trigger pattern and mask of the shadow's trigger source and
// width polarity (refused: Either polarity, sources the pattern cannot
// express on this instrument).
HRESULT GetTriggerDurationPatternMask(CDriverNode& node, LONG* pattern, LONG* mask);

// Stores `val` into a shadow field and sets its type's pending flag when the
// value differs from the stored one.
template <class T>
void StoreTriggerSetting(T& field, const T& val, bool& pending) {
    if (field == val) return;
    field = val;
    pending = true;
}

// Queries `command` and looks its trimmed reply up in `table`; a reply
// without a row is E_IVI_UNEXPECTED_RESPONSE naming the reply.
HRESULT QueryTriggerToken(CDriverNode& node, std::string_view command,
                          const CEnumCommandTable& table, LONG* value);
// E_IVI_UNEXPECTED_RESPONSE with the reply in its text.
HRESULT UnexpectedTriggerReply(CDriverNode& node, std::string_view command,
                               std::string_view reply);

}  // namespace qn

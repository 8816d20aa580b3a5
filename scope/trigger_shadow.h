// TriggerShadow: the session's record of the trigger configuration of every
// trigger type, and of which type's settings have not reached the instrument
// yet. The instrument holds the settings of one trigger type at a time; the
// shadow keeps the others so that selecting a type sends its settings.
//
// A set pending flag means the settings of its type changed since they were
// last sent. A type's writer sends only while the flag is set and its type is
// the current one, then clears the flag. The session never reads the shadow
// back from the instrument.
//
// Start values (docs/behaviour.md lists them): every pending flag is set, so
// the first time a type is selected or written its whole configuration goes
// out; the rest are the instrument's own reset values where it has one.
#pragma once

#include <string>

#include "Quorlen731XXEnums.h"

namespace qn {

struct TriggerShadow {
    Quorlen731XXTriggerTypeEnum type = Quorlen731XXTriggerEdge;
    std::string source = "CHAN1";  // instrument name of the trigger source

    Quorlen731XXTriggerSlopeEnum edge_slope = Quorlen731XXTriggerSlopePositive;
    bool edge_pending = true;

    Quorlen731XXACLineSlopeEnum ac_line_slope = Quorlen731XXACLinePositive;

    double glitch_width = 0.0;  // s; the instrument's coerced width after a write
    Quorlen731XXGlitchPolarityEnum glitch_polarity = Quorlen731XXGlitchPositive;
    Quorlen731XXGlitchConditionEnum glitch_condition = Quorlen731XXGlitchLessThan;
    bool glitch_pending = true;

    double width_low = 0.0;   // s
    double width_high = 0.0;  // s
    Quorlen731XXWidthPolarityEnum width_polarity = Quorlen731XXWidthPositive;
    Quorlen731XXWidthConditionEnum width_condition = Quorlen731XXWidthWithin;
    bool width_pending = true;

    Quorlen731XXTVTriggerEventEnum tv_event = Quorlen731XXTVEventField1;
    LONG tv_line = 1;

    // Masks and patterns: analog bits 0-3 are channels 1-4 and bit 4 the
    // external input; digital bit n is digital channel n.
    struct Pattern {
        LONG analog_mask = 0;
        LONG analog_pattern = 0;
        LONG digital_mask = 0;
        LONG digital_pattern = 0;
    };
    Pattern pattern;
    Quorlen731XXPatternMatchingModeEnum pattern_condition = Quorlen731XXPatternEnter;
    bool pattern_pending = true;

    Pattern state;
    Quorlen731XXTriggerSlopeEnum state_clock_slope = Quorlen731XXTriggerSlopePositive;
    std::string state_clock_source = "UserChannel1";  // driver source name
    bool state_pending = true;
};

}  // namespace qn

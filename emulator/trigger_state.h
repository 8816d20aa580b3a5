// Trigger settings of the emulated oscilloscope (part of the settings that *RST restores and
// *SAV/*RCL store). Tokens are kept in their upper-case short form, as the queries return them.
#pragma once

#include <string>

namespace qn::emu {

struct PatternWords {
    int pattern = 0;
    int mask = 0;
};

struct TriggerSettings {
    std::string mode = "EDGE";    // EDGE, GLIT, TV, PATT, DUR, SEQ
    std::string source = "CHAN1";  // edge source: CHAN<n>, DIG<n>, EXT, LINE
    std::string slope = "POS";     // POS, NEG, EITH, ALT
    double level = 0.0;            // V
    std::string sweep = "AUTO";    // AUTO, NORM, AUTL
    std::string coupling = "DC";   // AC, DC, LFR, TV
    std::string reject = "OFF";    // OFF, HFR, LFR
    bool noise_reject = false;
    double holdoff = 60e-9;  // s

    std::string glitch_source = "CHAN1";
    std::string glitch_qualifier = "LESS";  // LESS, GRE, RANG
    std::string glitch_polarity = "POS";
    double glitch_less = 2e-9;     // s
    double glitch_greater = 2e-9;  // s

    std::string duration_qualifier = "INR";  // INR, OUTR, LESS, GRE
    double duration_low = 2e-9;              // s
    double duration_high = 10e-9;            // s
    PatternWords duration_pattern{1, 1};

    std::string tv_source = "CHAN1";
    std::string tv_mode = "FIELD1";
    std::string tv_standard = "NTSC";
    std::string tv_polarity = "NEG";
    int tv_line = 1;

    PatternWords pattern;
    std::string pattern_clock;  // empty: no clock (pattern trigger)
    std::string pattern_clock_slope;

    PatternWords sequence_patterns[2];
    std::string sequence_find = "PATT1,ENT,NONE";
    std::string sequence_trigger = "PATT2,EXIT,NONE";
    std::string sequence_reset = "NONE,NONE,NONE";
};

}  // namespace qn::emu

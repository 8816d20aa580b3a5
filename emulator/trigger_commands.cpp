// Trigger subsystem: mode, sources, edge, glitch, duration (width), TV, pattern and sequence
// triggers, coupling, reject filters, holdoff, level and sweep. Sources the model lacks and
// numbers outside the hardware's range are refused with -222; settings needing a feature the
// model does not have (auto-level sweep, external input, sequence trigger) with -221.
#include <algorithm>
#include <array>
#include <cctype>
#include <cstdio>

#include "emulator/handler_util.h"

namespace qn::emu {
namespace {

constexpr std::array<const char*, 6> kModes = {"EDGE", "GLITch", "TV", "PATTern", "DURation",
                                                "SEQuence"};
constexpr std::array<const char*, 4> kSlopes = {"POSitive", "NEGative", "EITHer", "ALTernate"};
constexpr std::array<const char*, 2> kPolarities = {"POSitive", "NEGative"};
constexpr std::array<const char*, 3> kSweeps = {"AUTO", "NORMal", "AUTLevel"};
constexpr std::array<const char*, 4> kCouplings = {"AC", "DC", "LFReject", "TV"};
constexpr std::array<const char*, 3> kRejects = {"OFF", "HFReject", "LFReject"};
constexpr std::array<const char*, 3> kGlitchQualifiers = {"LESSthan", "GREaterthan", "RANGe"};
constexpr std::array<const char*, 4> kDurationQualifiers = {"INRange", "OUTRange", "LESSthan",
                                                             "GREaterthan"};
constexpr std::array<const char*, 10> kTvModes = {"FIELD1", "FIELD2", "ALLF",   "ALLL",  "LINE",
                                                  "LINEA",  "LINEV",  "VERT",   "LINEF1",
                                                  "LINEF2"};
constexpr std::array<const char*, 9> kTvStandards = {"NTSC",      "PAL",        "SECam",
                                                     "PALM",      "GENeric",    "P480L60HZ",
                                                     "P720L60HZ", "P1080L24HZ", "I1080L50HZ"};

struct Limits {
    double min;
    double max;
};
constexpr double kMinWidth = 2e-9;  // s, narrowest pulse the qualifiers resolve
constexpr double kMaxWidth = 10.0;  // s
constexpr Limits kLevel{-1000.0, 1000.0};  // V
constexpr Limits kHoldoff{60e-9, 10.0};    // s
constexpr int kMaxTvLine = 1125;

TriggerSettings& Trig(Instrument& inst) { return inst.settings().trigger; }

// Which kinds of source a trigger takes.
struct SourceKinds {
    bool digital = true;
    bool external = true;
    bool line = false;
};

constexpr SourceKinds kEdgeSources{true, true, true};
constexpr SourceKinds kGlitchSources{true, true, false};
constexpr SourceKinds kTvSources{false, false, false};

std::string Upper(std::string s) {
    for (char& c : s) c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    return s;
}

// "CHAN<n>", "DIG<n>", "EXT" or "LINE" (long forms accepted), checked against the model.
std::optional<std::string> TriggerSourceArg(Instrument& inst, const Argument& arg,
                                            SourceKinds kinds) {
    if (arg.kind != Argument::Kind::kText) {
        inst.Error(err::kDataType);
        return std::nullopt;
    }
    const std::string word = Upper(arg.value);
    std::size_t digits = word.size();
    while (digits > 0 && std::isdigit(static_cast<unsigned char>(word[digits - 1]))) --digits;
    const std::string letters = word.substr(0, digits);
    const std::string number = word.substr(digits);
    const int n = number.empty() || number.size() > 3 ? -1 : std::stoi(number);
    const ModelInfo& m = inst.model();
    if ((letters == "CHAN" || letters == "CHANNEL") && n >= 1) {
        if (n <= m.analog_channels) return "CHAN" + std::to_string(n);
        inst.Error(err::kDataOutOfRange);
        return std::nullopt;
    }
    if ((letters == "DIG" || letters == "DIGITAL") && n >= 0 && kinds.digital) {
        if (n < m.pods * kPodSize) return "DIG" + std::to_string(n);
        inst.Error(err::kDataOutOfRange);
        return std::nullopt;
    }
    if ((word == "EXT" || word == "EXTERNAL") && kinds.external) {
        if (m.Has(kFeatExtTrigger)) return std::string("EXT");
        inst.Error(err::kSettingsConflict);
        return std::nullopt;
    }
    if (word == "LINE" && kinds.line) return word;
    inst.Error(err::kIllegalParameter);
    return std::nullopt;
}

template <std::string TriggerSettings::*Member, const SourceKinds& Kinds>
void SetSource(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = TriggerSourceArg(inst, call.arg(0), Kinds)) Trig(inst).*Member = *v;
}

template <std::string TriggerSettings::*Member>
void QueryText(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = Trig(inst).*Member;
}

template <std::string TriggerSettings::*Member, const auto& Tokens>
void SetToken(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = TokenArg(inst, call.arg(0), Tokens)) Trig(inst).*Member = *v;
}

template <double TriggerSettings::*Member, const Limits& L>
void SetNumber(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = NumberInRange(inst, call.arg(0), L.min, L.max)) Trig(inst).*Member = *v;
}

template <double TriggerSettings::*Member>
void QueryNumber(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = FormatNumber(Trig(inst).*Member);
}

void SetMode(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    const auto v = TokenArg(inst, call.arg(0), kModes);
    if (!v) return;
    if (*v == "SEQ" && !inst.model().Has(kFeatSequence)) {
        inst.Error(err::kSettingsConflict);
        return;
    }
    Trig(inst).mode = *v;
}

void SetSweep(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    const auto v = TokenArg(inst, call.arg(0), kSweeps);
    if (!v) return;
    if (*v == "AUTL" && !inst.model().Has(kFeatAutoLevel)) {
        inst.Error(err::kSettingsConflict);
        return;
    }
    Trig(inst).sweep = *v;
}

void SetNoiseReject(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = BoolArg(inst, call.arg(0))) Trig(inst).noise_reject = *v;
}
void QueryNoiseReject(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = FormatBool(Trig(inst).noise_reject);
}

// The glitch qualifier's width: both limits are coerced into the qualifier's range.
template <double TriggerSettings::*Member>
void SetGlitchWidth(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = NumberArg(inst, call.arg(0))) {
        Trig(inst).*Member = std::clamp(*v, kMinWidth, kMaxWidth);
    }
}

void SetDurationRange(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 2)) return;
    const auto low = NumberInRange(inst, call.arg(0), kMinWidth, kMaxWidth);
    if (!low) return;
    const auto high = NumberInRange(inst, call.arg(1), kMinWidth, kMaxWidth);
    if (!high) return;
    if (*high < *low) {
        inst.Error(err::kSettingsConflict);
        return;
    }
    Trig(inst).duration_low = *low;
    Trig(inst).duration_high = *high;
}
void QueryDurationRange(Instrument& inst, Call& call) {
    if (!NoArgs(inst, call)) return;
    call.reply = FormatNumber(Trig(inst).duration_low) + "," +
                 FormatNumber(Trig(inst).duration_high);
}

std::optional<PatternWords> PatternArgs(Instrument& inst, const Call& call) {
    const auto pattern = IntegerInRange(inst, call.arg(0), 0, 0xFFFFF);
    if (!pattern) return std::nullopt;
    const auto mask = IntegerInRange(inst, call.arg(1), 0, 0xFFFFF);
    if (!mask) return std::nullopt;
    return PatternWords{*pattern, *mask};
}
std::string FormatPattern(const PatternWords& w) {
    return std::to_string(w.pattern) + "," + std::to_string(w.mask);
}

void SetDurationPattern(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 2)) return;
    if (auto w = PatternArgs(inst, call)) Trig(inst).duration_pattern = *w;
}
void QueryDurationPattern(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = FormatPattern(Trig(inst).duration_pattern);
}

// pattern,mask[,clock source,clock slope]: with a clock it is the state trigger.
void SetPattern(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 2, 4)) return;
    if (call.arg_count() == 3) {
        inst.Error(err::kMissingParameter);
        return;
    }
    const auto w = PatternArgs(inst, call);
    if (!w) return;
    std::string clock, slope;
    if (call.arg_count() == 4) {
        const auto c = TriggerSourceArg(inst, call.arg(2), {true, false, false});
        if (!c) return;
        const auto s = TokenArg(inst, call.arg(3), kSlopes);
        if (!s) return;
        clock = *c;
        slope = *s;
    }
    TriggerSettings& t = Trig(inst);
    t.pattern = *w;
    t.pattern_clock = clock;
    t.pattern_clock_slope = slope;
}
void QueryPattern(Instrument& inst, Call& call) {
    if (!NoArgs(inst, call)) return;
    const TriggerSettings& t = Trig(inst);
    call.reply = FormatPattern(t.pattern);
    if (!t.pattern_clock.empty()) call.reply += "," + t.pattern_clock + "," + t.pattern_clock_slope;
}

void SetTvLine(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 1)) return;
    if (auto v = IntegerInRange(inst, call.arg(0), 1, kMaxTvLine)) Trig(inst).tv_line = *v;
}
void QueryTvLine(Instrument& inst, Call& call) {
    if (NoArgs(inst, call)) call.reply = std::to_string(Trig(inst).tv_line);
}

PatternWords* SequencePattern(Instrument& inst, const Call& call) {
    const int n = call.suffix(0);
    if (n < 1 || n > 2) {
        inst.Error(err::kSuffixOutOfRange);
        return nullptr;
    }
    return &Trig(inst).sequence_patterns[n - 1];
}
void SetSequencePattern(Instrument& inst, Call& call) {
    PatternWords* p = SequencePattern(inst, call);
    if (!p || !ExpectArgs(inst, call, 2)) return;
    if (auto w = PatternArgs(inst, call)) *p = *w;
}
void QuerySequencePattern(Instrument& inst, Call& call) {
    PatternWords* p = SequencePattern(inst, call);
    if (p && NoArgs(inst, call)) call.reply = FormatPattern(*p);
}

// A sequence step: three character words (event, qualifier, count or NONE).
template <std::string TriggerSettings::*Member>
void SetSequenceStep(Instrument& inst, Call& call) {
    if (!ExpectArgs(inst, call, 3)) return;
    std::string text;
    for (std::size_t i = 0; i < 3; ++i) {
        if (call.arg(i).kind != Argument::Kind::kText) {
            inst.Error(err::kDataType);
            return;
        }
        text += (i ? "," : "") + Upper(call.arg(i).value);
    }
    Trig(inst).*Member = text;
}


constexpr CommandSpec kTrigger[] = {
    {"TRIGger:MODE", SetMode, QueryText<&TriggerSettings::mode>},
    {"TRIGger:SOURce", SetSource<&TriggerSettings::source, kEdgeSources>,
     QueryText<&TriggerSettings::source>},
    {"TRIGger:EDGE:SOURce", SetSource<&TriggerSettings::source, kEdgeSources>,
     QueryText<&TriggerSettings::source>},
    {"TRIGger:SLOPe", SetToken<&TriggerSettings::slope, kSlopes>,
     QueryText<&TriggerSettings::slope>},
    {"TRIGger:EDGE:SLOPe", SetToken<&TriggerSettings::slope, kSlopes>,
     QueryText<&TriggerSettings::slope>},
    {"TRIGger:LEVel", SetNumber<&TriggerSettings::level, kLevel>,
     QueryNumber<&TriggerSettings::level>},
    {"TRIGger:SWEep", SetSweep, QueryText<&TriggerSettings::sweep>},
    {"TRIGger:COUPling", SetToken<&TriggerSettings::coupling, kCouplings>,
     QueryText<&TriggerSettings::coupling>},
    {"TRIGger:REJect", SetToken<&TriggerSettings::reject, kRejects>,
     QueryText<&TriggerSettings::reject>},
    {"TRIGger:NREJect", SetNoiseReject, QueryNoiseReject},
    {"TRIGger:HOLDoff", SetNumber<&TriggerSettings::holdoff, kHoldoff>,
     QueryNumber<&TriggerSettings::holdoff>},
    {"TRIGger:GLITch:SOURce", SetSource<&TriggerSettings::glitch_source, kGlitchSources>,
     QueryText<&TriggerSettings::glitch_source>},
    {"TRIGger:GLITch:QUALifier", SetToken<&TriggerSettings::glitch_qualifier, kGlitchQualifiers>,
     QueryText<&TriggerSettings::glitch_qualifier>},
    {"TRIGger:GLITch:POLarity", SetToken<&TriggerSettings::glitch_polarity, kPolarities>,
     QueryText<&TriggerSettings::glitch_polarity>},
    {"TRIGger:GLITch:LESSthan", SetGlitchWidth<&TriggerSettings::glitch_less>,
     QueryNumber<&TriggerSettings::glitch_less>},
    {"TRIGger:GLITch:GREaterthan", SetGlitchWidth<&TriggerSettings::glitch_greater>,
     QueryNumber<&TriggerSettings::glitch_greater>},
    {"TRIGger:DURation:QUALifier",
     SetToken<&TriggerSettings::duration_qualifier, kDurationQualifiers>,
     QueryText<&TriggerSettings::duration_qualifier>},
    {"TRIGger:DURation:RANGe", SetDurationRange, QueryDurationRange},
    {"TRIGger:DURation:PATTern", SetDurationPattern, QueryDurationPattern},
    {"TRIGger:TV:SOURce", SetSource<&TriggerSettings::tv_source, kTvSources>,
     QueryText<&TriggerSettings::tv_source>},
    {"TRIGger:TV:MODE", SetToken<&TriggerSettings::tv_mode, kTvModes>,
     QueryText<&TriggerSettings::tv_mode>},
    {"TRIGger:TV:STANdard", SetToken<&TriggerSettings::tv_standard, kTvStandards>,
     QueryText<&TriggerSettings::tv_standard>},
    {"TRIGger:TV:POLarity", SetToken<&TriggerSettings::tv_polarity, kPolarities>,
     QueryText<&TriggerSettings::tv_polarity>},
    {"TRIGger:TV:LINE", SetTvLine, QueryTvLine},
    {"TRIGger:PATTern", SetPattern, QueryPattern},
    {"TRIGger:SEQuence:PATTern#", SetSequencePattern, QuerySequencePattern, kFeatSequence},
    {"TRIGger:SEQuence:FIND", SetSequenceStep<&TriggerSettings::sequence_find>,
     QueryText<&TriggerSettings::sequence_find>, kFeatSequence},
    {"TRIGger:SEQuence:TRIGger", SetSequenceStep<&TriggerSettings::sequence_trigger>,
     QueryText<&TriggerSettings::sequence_trigger>, kFeatSequence},
    {"TRIGger:SEQuence:RESet", SetSequenceStep<&TriggerSettings::sequence_reset>,
     QueryText<&TriggerSettings::sequence_reset>, kFeatSequence},
};

}  // namespace

std::span<const CommandSpec> TriggerCommands() {
    return kTrigger;
}

}  // namespace qn::emu

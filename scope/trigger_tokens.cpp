#include "scope/trigger_tokens.h"

#include <array>
#include <cstdlib>

#include "core/options.h"
#include "io/reply_number.h"

namespace qn {

const CEnumCommandTable& TriggerTypeTokens() {
    // Width selects its mode in its own writer; Runt and Immediate have none.
    static const CEnumCommandTable t{
        {"", Quorlen731XXTriggerEdge, "EDGE"},    {"", Quorlen731XXTriggerWidth, "GLIT"},
        {"", Quorlen731XXTriggerGlitch, "GLIT"},  {"", Quorlen731XXTriggerTV, "TV"},
        {"", Quorlen731XXTriggerACLine, "EDGE"},  {"", Quorlen731XXTriggerPattern, "PATT"},
        {"", Quorlen731XXTriggerState, "PATT"}};
    return t;
}

const CEnumCommandTable& TriggerCouplingTokens() {
    static const CEnumCommandTable t{{"", Quorlen731XXTriggerCouplingAC, "AC"},
                                     {"", Quorlen731XXTriggerCouplingDC, "DC"},
                                     {"", Quorlen731XXTriggerCouplingHFReject, "HFR"},
                                     {"", Quorlen731XXTriggerCouplingLFReject, "LFR"},
                                     {"", Quorlen731XXTriggerCouplingNoiseReject, "1"},
                                     {"", Quorlen731XXTriggerCouplingTV, "TV"}};
    return t;
}

const CEnumCommandTable& TriggerModifierTokens() {
    static const CEnumCommandTable t{{"", Quorlen731XXTriggerModifierNone, "NORM"},
                                     {"", Quorlen731XXTriggerModifierAuto, "AUTO"},
                                     {"", Quorlen731XXTriggerModifierAutoLevel, "AUTL"}};
    return t;
}

const CEnumCommandTable& TriggerSlopeTokens() {
    static const CEnumCommandTable t{{"", Quorlen731XXTriggerSlopeNegative, "NEG"},
                                     {"", Quorlen731XXTriggerSlopePositive, "POS"},
                                     {"", Quorlen731XXTriggerSlopeEither, "EITH"},
                                     {"", Quorlen731XXTriggerSlopeAlternate, "ALT"}};
    return t;
}

const CEnumCommandTable& ACLineSlopeTokens() {
    static const CEnumCommandTable t{{"", Quorlen731XXACLinePositive, "POS"},
                                     {"", Quorlen731XXACLineNegative, "NEG"}};
    return t;
}

const CEnumCommandTable& GlitchConditionTokens() {
    static const CEnumCommandTable t{{"", Quorlen731XXGlitchLessThan, "LESS"},
                                     {"", Quorlen731XXGlitchGreaterThan, "GRE"}};
    return t;
}

const CEnumCommandTable& GlitchPolarityTokens() {
    static const CEnumCommandTable t{{"", Quorlen731XXGlitchPositive, "POS"},
                                     {"", Quorlen731XXGlitchNegative, "NEG"}};
    return t;
}

const CEnumCommandTable& TvEventTokens() {
    static const CEnumCommandTable t{
        {"", Quorlen731XXTVEventField1, "FIELD1"},
        {"", Quorlen731XXTVEventField2, "FIELD2"},
        {"", Quorlen731XXTVEventAnyField, "ALLF"},
        {"", Quorlen731XXTVEventAnyLine, "ALLL"},
        {"", Quorlen731XXTVEventLineNumber, "LINE"},
        {"", Quorlen731XXTVEventLineNumberAlternate, "LINEA"},
        {"", Quorlen731XXTVEventLineNumberVertical, "LINEV"},
        {"", Quorlen731XXTVEventVertical, "VERT"}};
    return t;
}

const CEnumCommandTable& TvPolarityTokens() {
    static const CEnumCommandTable t{{"", Quorlen731XXTVTriggerPositive, "POS"},
                                     {"", Quorlen731XXTVTriggerNegative, "NEG"}};
    return t;
}

namespace {

struct TvFormat {
    LONG value;
    std::string_view token;
    TvLineCounts lines;
};
// Interlaced formats number the second field's lines after the first's;
// the progressive ones and the generic format count one field.
constexpr TvFormat kTvFormats[] = {
    {Quorlen731XXTVSignalFormatNTSC, "NTSC", {263, 525}},
    {Quorlen731XXTVSignalFormatPAL, "PAL", {313, 625}},
    {Quorlen731XXTVSignalFormatSECAM, "SEC", {313, 625}},
    {Quorlen731XXTVSignalFormatPALM, "PALM", {263, 525}},
    {Quorlen731XXTVSignalFormatGeneric, "GEN", {1024, 1024}},
    {Quorlen731XXTVSignalFormatP480, "P480L60HZ", {263, 525}},
    {Quorlen731XXTVSignalFormatP720, "P720L60HZ", {263, 750}},
    {Quorlen731XXTVSignalFormatP1080, "P1080L24HZ", {263, 1125}},
    {Quorlen731XXTVSignalFormatI1080, "I1080L50HZ", {263, 1125}},
};

struct Rename {
    std::string_view from, to;
};
constexpr Rename kTvModeReplies[] = {
    {"LFI1", "LINE"}, {"LFI2", "LINE"},   {"LINEF1", "LINE"}, {"LINEF2", "LINE"},
    {"FIE1", "FIELD1"}, {"FIE2", "FIELD2"}, {"ALIN", "ALLL"},   {"AFI", "ALLF"},
    {"LALT", "LINEA"}, {"LVER", "LINEV"},
};

struct CouplingWrite {
    LONG value;
    std::string_view command;
};
constexpr CouplingWrite kCouplingWrites[] = {
    {Quorlen731XXTriggerCouplingAC, ":TRIG:COUP AC;REJ OFF;NREJ OFF"},
    {Quorlen731XXTriggerCouplingDC, ":TRIG:COUP DC;REJ OFF;NREJ OFF"},
    {Quorlen731XXTriggerCouplingHFReject, ":TRIG:COUP DC;REJ HFR;NREJ OFF"},
    {Quorlen731XXTriggerCouplingLFReject, ":TRIG:COUP LFR;NREJ OFF"},
    {Quorlen731XXTriggerCouplingNoiseReject, ":TRIG:COUP DC;REJ OFF;NREJ ON"},
};

}  // namespace

const CEnumCommandTable& TvSignalFormatTokens() {
    static const CEnumCommandTable t = [] {
        return CEnumCommandTable{{"", kTvFormats[0].value, kTvFormats[0].token},
                                 {"", kTvFormats[1].value, kTvFormats[1].token},
                                 {"", kTvFormats[2].value, kTvFormats[2].token},
                                 {"", kTvFormats[3].value, kTvFormats[3].token},
                                 {"", kTvFormats[4].value, kTvFormats[4].token},
                                 {"", kTvFormats[5].value, kTvFormats[5].token},
                                 {"", kTvFormats[6].value, kTvFormats[6].token},
                                 {"", kTvFormats[7].value, kTvFormats[7].token},
                                 {"", kTvFormats[8].value, kTvFormats[8].token}};
    }();
    return t;
}

TvLineCounts TvLinesOf(LONG signal_format) {
    for (const TvFormat& f : kTvFormats)
        if (f.value == signal_format) return f.lines;
    return {263, 525};
}

std::string_view TriggerCouplingCommand(LONG coupling) {
    for (const CouplingWrite& w : kCouplingWrites)
        if (w.value == coupling) return w.command;
    return {};
}

std::string_view WidthQualifierCommand(LONG condition) {
    switch (condition) {
        case Quorlen731XXWidthWithin: return ":TRIG:DUR:QUAL INR";
        case Quorlen731XXWidthOutside: return ":TRIG:DUR:QUAL OUTR";
        default: return {};
    }
}

std::string NormalizeTvModeReply(std::string_view reply) {
    const std::string_view r = TrimBlanks(reply);
    for (const Rename& n : kTvModeReplies)
        if (r == n.from) return std::string(n.to);
    return std::string(r);
}

std::optional<double> NumericReplyField(std::string_view reply, std::size_t index) {
    std::string text;
    text.reserve(reply.size());
    for (char c : reply)
        if (c != '"') text += c;
    std::string_view rest = text;
    for (std::size_t i = 0; i < index; ++i) {
        const std::size_t comma = rest.find(',');
        if (comma == std::string_view::npos) return std::nullopt;
        rest.remove_prefix(comma + 1);
    }
    const std::string_view field = TrimBlanks(rest.substr(0, rest.find(',')));
    const ReplyNumber n = ParseReplyNumber(field);
    if (!n.found) return std::nullopt;
    return n.value;
}

}  // namespace qn

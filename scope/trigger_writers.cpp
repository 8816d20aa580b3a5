#include "scope/trigger_writers.h"

#include "Quorlen731XXErrors.h"
#include "core/options.h"
#include "core/session_core.h"
#include "io/io_manager.h"
#include "scope/source_names.h"
#include "scope/trigger_tokens.h"

namespace qn {

namespace cmd {
constexpr std::string_view kSlope = ":TRIG:SLOP %s";
constexpr std::string_view kGlitchMode = ":TRIG:MODE GLIT";
constexpr std::string_view kGlitchQualifier = ":TRIG:GLIT:QUAL %s;:TRIG:GLIT:POL %s";
constexpr std::string_view kGlitchWidth = ":TRIG:GLIT:LESS %.15g;:TRIG:GLIT:GRE %.15g";
constexpr std::string_view kGlitchWidthQuery = ":TRIG:GLIT:LESS?";
constexpr std::string_view kDurationMode = ":TRIG:MODE DUR;%s;%s";
constexpr std::string_view kDurationRange = ":TRIG:DUR:RANG %.15g,%.15g";
constexpr std::string_view kDurationPattern = "TRIG:DUR:PATT %i,%i";
constexpr std::string_view kPatternEnter = ":TRIG:PATT %i,%i;:TRIG:MODE PATT";
constexpr std::string_view kPatternExitWords = ":TRIG:SEQ:PATT1 %i,%i;:TRIG:SEQ:PATT2 %i,%i";
constexpr std::string_view kPatternExitSequence =
    ":TRIG:SEQ:FIND PATT1,ENT,NONE;TRIG PATT2,EXIT,NONE;RES NONE,NONE,NONE;:TRIG:MODE SEQ";
constexpr std::string_view kState = ":TRIG:PATT %i,%i,%s,%s;:TRIG:MODE PATT";
}  // namespace cmd

namespace {

// The duration mask bit of an analog channel: its own bit on analog-only
// instruments, above the sixteen digital bits on mixed-signal ones.
struct ChannelBit {
    std::string_view source;
    LONG min_channels;
    LONG analog_bit;
    LONG mixed_bit;
    const char* missing;  // the error's value when the channel is absent
};
constexpr ChannelBit kChannelBits[] = {
    {"CHAN1", 1, 1, 65536, "Channel1"},
    {"CHAN2", 2, 2, 131072, "Channel2"},
    {"CHAN3", 3, 4, 262144, "Channel3"},
    {"CHAN4", 4, 8, 524288, "Channel4"},
};

bool Due(bool pending, const TriggerShadow& t, Quorlen731XXTriggerTypeEnum type) {
    return pending && t.type == type;
}

std::string_view Token(CDriverNode& node, const CEnumCommandTable& table, LONG value) {
    return table.TokenOf(node.Core().Model(), value);
}

}  // namespace

HRESULT UnexpectedTriggerReply(CDriverNode& node, std::string_view command,
                               std::string_view reply) {
    std::string extra = "Reply to " + std::string(TrimBlanks(command)) + ": \"" +
                        std::string(reply.substr(0, 64)) + "\"";
    return node.Errors().ErrorWithExtra(Msg::E_IVI_UNEXPECTED_RESPONSE, extra);
}

HRESULT QueryTriggerToken(CDriverNode& node, std::string_view command,
                          const CEnumCommandTable& table, LONG* value) {
    std::string reply;
    HRESULT hr = CDriverIOManager(node).InstrQuery(command, &reply, 127);
    if (FAILED(hr)) return hr;
    auto v = table.ValueOf(node.Core().Model(), TrimBlanks(reply));
    if (!v) return UnexpectedTriggerReply(node, command, reply);
    *value = *v;
    return hr;
}

HRESULT WriteTriggerEdge(CDriverNode& node) {
    TriggerShadow& t = node.Core().trigger;
    if (!Due(t.edge_pending, t, Quorlen731XXTriggerEdge)) return S_OK;
    const std::string_view slope = Token(node, TriggerSlopeTokens(), t.edge_slope);
    if (slope.empty()) return node.Errors().InvalidValue("put_Slope", "val", t.edge_slope);
    HRESULT hr = CDriverIOManager(node).InstrPrintf(cmd::kSlope, slope);
    if (SUCCEEDED(hr)) t.edge_pending = false;
    return hr;
}

HRESULT WriteTriggerGlitch(CDriverNode& node) {
    TriggerShadow& t = node.Core().trigger;
    if (!Due(t.glitch_pending, t, Quorlen731XXTriggerGlitch)) return S_OK;
    const std::string_view condition = Token(node, GlitchConditionTokens(), t.glitch_condition);
    if (condition.empty())
        return node.Errors().InvalidValue("put_condition", "val", t.glitch_condition);
    const std::string_view polarity = Token(node, GlitchPolarityTokens(), t.glitch_polarity);
    if (polarity.empty())
        return node.Errors().InvalidValue("put_polarity", "val", t.glitch_polarity);
    CDriverIOManager io(node);
    HRESULT hr = io.InstrPrintf(cmd::kGlitchMode);
    if (SUCCEEDED(hr)) hr = io.InstrPrintf(cmd::kGlitchQualifier, condition, polarity);
    if (SUCCEEDED(hr)) hr = io.InstrPrintf(cmd::kGlitchWidth, t.glitch_width, t.glitch_width);
    if (FAILED(hr)) return hr;
    // The instrument coerces the width to its resolution; keep its value so
    // that writing the coerced width again sends nothing.
    double width = 0.0;
    hr = io.InstrQuery(cmd::kGlitchWidthQuery, &width);
    if (SUCCEEDED(hr)) t.glitch_width = width;
    t.glitch_pending = false;
    return hr;
}

HRESULT GetTriggerDurationPatternMask(CDriverNode& node, LONG* pattern, LONG* mask) {
    const TriggerShadow& t = node.Core().trigger;
    const FeatureRecord& f = node.Core().features;
    if (t.width_polarity != Quorlen731XXWidthPositive &&
        t.width_polarity != Quorlen731XXWidthNegative)
        return node.Errors().InvalidValue("GetTriggerDurationPatternMask", "polarity",
                                          t.width_polarity);
    const bool mixed = f.digital_channel_count > 0;
    const std::string_view source = t.source;
    LONG m = -1;
    if (source == "EXT") {
        if (mixed)
            return node.Errors().InvalidValue("TriggerWidthConfigure", "Source", "external");
        m = 16;
    }
    for (const ChannelBit& c : kChannelBits) {
        if (source != c.source) continue;
        if (f.analog_channel_count < c.min_channels)
            return node.Errors().InvalidValue("TriggerWidthConfigure", "Source", c.missing);
        m = mixed ? c.mixed_bit : c.analog_bit;
    }
    if (m < 0) {
        // A digital channel is its own bit; anything else has no bit.
        if (!mixed)
            return node.Errors().InvalidValue("TriggerWidthConfigure", "Source", "digital");
        m = 0;
        if (source.substr(0, 3) == "DIG" && source.size() > 3) {
            const std::string bit(source.substr(3));
            char* end = nullptr;
            const long n = std::strtol(bit.c_str(), &end, 10);
            if (end && *end == '\0' && n >= 0 && n < 16) m = LONG(1) << n;
        }
    }
    *mask = m;
    *pattern = t.width_polarity == Quorlen731XXWidthPositive ? m : 0;
    return S_OK;
}

HRESULT WriteTriggerWidth(CDriverNode& node) {
    TriggerShadow& t = node.Core().trigger;
    if (!Due(t.width_pending, t, Quorlen731XXTriggerWidth)) return S_OK;
    const std::string_view qualifier = WidthQualifierCommand(t.width_condition);
    if (qualifier.empty())
        return node.Errors().InvalidValue("put_condition", "val", t.width_condition);
    // The pattern is checked before anything is sent, so a source the
    // duration trigger cannot use leaves the instrument's mode alone.
    LONG pattern = 0, mask = 0;
    HRESULT hr = GetTriggerDurationPatternMask(node, &pattern, &mask);
    if (FAILED(hr)) return hr;
    const std::string range = FormatCommandArgs(cmd::kDurationRange, t.width_low, t.width_high);
    CDriverIOManager io(node);
    hr = io.InstrPrintf(cmd::kDurationMode, qualifier, std::string_view(range));
    if (SUCCEEDED(hr)) hr = io.InstrPrintf(cmd::kDurationPattern, pattern, mask);
    if (SUCCEEDED(hr)) t.width_pending = false;
    return hr;
}

PatternWords TriggerPatternWords(const FeatureRecord& f, const TriggerShadow::Pattern& p) {
    if (f.analog_channel_count >= 4) return {p.analog_mask & 31, p.analog_pattern & 31};
    if (f.digital_channel_count <= 0) return {p.analog_mask & 19, p.analog_pattern & 19};
    return {((p.analog_mask & 3) << 16) | p.digital_mask,
            ((p.analog_pattern & 3) << 16) | p.digital_pattern};
}

HRESULT WriteTriggerPattern(CDriverNode& node) {
    TriggerShadow& t = node.Core().trigger;
    if (!Due(t.pattern_pending, t, Quorlen731XXTriggerPattern)) return S_OK;
    const PatternWords w = TriggerPatternWords(node.Core().features, t.pattern);
    CDriverIOManager io(node);
    HRESULT hr = S_OK;
    if (t.pattern_condition == Quorlen731XXPatternEnter) {
        hr = io.InstrPrintf(cmd::kPatternEnter, w.pattern, w.mask);
    } else {
        if (!node.Core().features.sequence_trigger)
            return node.Errors().Error(Msg::E_QUORLEN731XX_MODEL_NOT_SUPPORTED,
                                       {"TriggerPatternExitCondition"});
        hr = io.InstrPrintf(cmd::kPatternExitWords, w.pattern, w.mask, w.pattern, w.mask);
        if (SUCCEEDED(hr)) hr = io.InstrPrintf(cmd::kPatternExitSequence);
    }
    if (SUCCEEDED(hr)) t.pattern_pending = false;
    return hr;
}

HRESULT WriteTriggerState(CDriverNode& node) {
    TriggerShadow& t = node.Core().trigger;
    if (!Due(t.state_pending, t, Quorlen731XXTriggerState)) return S_OK;
    const PatternWords w = TriggerPatternWords(node.Core().features, t.state);
    const std::string_view slope = Token(node, TriggerSlopeTokens(), t.state_clock_slope);
    if (slope.empty())
        return node.Errors().InvalidValue("WriteTriggerState", "m_eTriggerStateClockSlope",
                                          t.state_clock_slope);
    std::string clock;
    HRESULT hr = VirtualToSCPI(node, t.state_clock_source, {true, false}, &clock);
    if (FAILED(hr)) return hr;
    hr = CDriverIOManager(node).InstrPrintf(cmd::kState, w.pattern, w.mask,
                                            std::string_view(clock), slope);
    if (SUCCEEDED(hr)) t.state_pending = false;
    return hr;
}

}  // namespace qn

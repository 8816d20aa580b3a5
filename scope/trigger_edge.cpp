// The edge, AC-line, glitch, width and runt triggers on the root object.
// Their settings are kept in the session's trigger shadow and reach the
// instrument through the writers of scope/trigger_writers.h. A value the
// instrument could not take is refused before it enters the shadow, so a
// refused value never blocks later writes of its type.
#include "Quorlen731XXErrors.h"
#include "core/member_impl.h"
#include "core/root.h"
#include "scope/trigger_tokens.h"
#include "scope/trigger_writers.h"

namespace qn {

#define QN_CLASS Quorlen731XX
#include "core/member_definitions_begin.h"
#include "members/IQuorlen731XXTriggerEdge.def"
#include "members/IQuorlen731XXTriggerAcLine.def"
#include "members/IQuorlen731XXTriggerGlitch.def"
#include "members/IQuorlen731XXTriggerWidth.def"
#include "members/IQuorlen731XXTriggerRunt.def"
#include "QnEndMembers.h"
#undef QN_CLASS

namespace {

namespace cmd {
#include "scope/row_commands_begin.h"
#include "members/IQuorlen731XXTriggerEdge.def"
#include "members/IQuorlen731XXTriggerAcLine.def"
#include "members/IQuorlen731XXTriggerGlitch.def"
#include "members/IQuorlen731XXTriggerWidth.def"
#include "QnEndMembers.h"
}  // namespace cmd

bool IsWidthPolarity(LONG v) {
    return v == Quorlen731XXWidthPositive || v == Quorlen731XXWidthNegative;
}

}  // namespace

// Edge ----------------------------------------------------------------------

HRESULT Quorlen731XX::IQuorlen731XXTriggerEdge_get_Slope_Body(Quorlen731XXTriggerSlopeEnum* val) {
    LONG v = 0;
    HRESULT hr = QueryTriggerToken(*this, cmd::IQuorlen731XXTriggerEdge_Slope_Read,
                                   TriggerSlopeTokens(), &v);
    if (FAILED(hr)) return hr;
    *val = static_cast<Quorlen731XXTriggerSlopeEnum>(v);
    Core().trigger.edge_slope = *val;
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerEdge_put_Slope_Body(Quorlen731XXTriggerSlopeEnum val) {
    if (TriggerSlopeTokens().TokenOf(Core().Model(), val).empty())
        return Errors().InvalidValue("put_Slope", "val", std::int32_t{val});
    TriggerShadow& t = Core().trigger;
    t.edge_slope = val;
    t.edge_pending = true;
    return WriteTriggerEdge(*this);
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerEdge_Configure_Body(BSTR Source, double Level,
                                                              Quorlen731XXTriggerSlopeEnum Slope) {
    IQuorlen731XXTrigger* trigger = this;
    HRESULT hr = trigger->put_Source(Source);
    if (SUCCEEDED(hr)) hr = trigger->put_Level(Level);
    if (SUCCEEDED(hr)) hr = static_cast<IQuorlen731XXTriggerEdge*>(this)->put_Slope(Slope);
    return hr;
}

// AC line -------------------------------------------------------------------

HRESULT Quorlen731XX::IQuorlen731XXTriggerAcLine_get_Slope_Body(Quorlen731XXACLineSlopeEnum* val) {
    *val = Core().trigger.ac_line_slope;
    return S_OK;
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerAcLine_put_Slope_Body(Quorlen731XXACLineSlopeEnum val) {
    const std::string_view token = ACLineSlopeTokens().TokenOf(Core().Model(), val);
    if (token.empty()) return Errors().InvalidValue("put_Slope", "val", std::int32_t{val});
    TriggerShadow& t = Core().trigger;
    HRESULT hr = S_OK;
    if (t.type == Quorlen731XXTriggerACLine)
        hr = CDriverIOManager(*this).InstrPrintf(cmd::IQuorlen731XXTriggerAcLine_Slope_Write,
                                                 token);
    t.ac_line_slope = val;
    return hr;
}

// Glitch --------------------------------------------------------------------

HRESULT Quorlen731XX::IQuorlen731XXTriggerGlitch_get_condition_Body(
    Quorlen731XXGlitchConditionEnum* val) {
    LONG v = 0;
    HRESULT hr = QueryTriggerToken(*this, cmd::IQuorlen731XXTriggerGlitch_condition_Read,
                                   GlitchConditionTokens(), &v);
    if (FAILED(hr)) return hr;
    *val = static_cast<Quorlen731XXGlitchConditionEnum>(v);
    Core().trigger.glitch_condition = *val;
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerGlitch_put_condition_Body(
    Quorlen731XXGlitchConditionEnum val) {
    TriggerShadow& t = Core().trigger;
    if (val == t.glitch_condition) return S_OK;
    if (GlitchConditionTokens().TokenOf(Core().Model(), val).empty())
        return Errors().InvalidValue("put_condition", "val", std::int32_t{val});
    StoreTriggerSetting(t.glitch_condition, val, t.glitch_pending);
    return WriteTriggerGlitch(*this);
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerGlitch_get_polarity_Body(
    Quorlen731XXGlitchPolarityEnum* val) {
    LONG v = 0;
    HRESULT hr = QueryTriggerToken(*this, cmd::IQuorlen731XXTriggerGlitch_polarity_Read,
                                   GlitchPolarityTokens(), &v);
    if (SUCCEEDED(hr)) *val = static_cast<Quorlen731XXGlitchPolarityEnum>(v);
    return hr;
}

// The polarity is also sent on its own, so the instrument has it even while
// another trigger type is current; a failure of that command is reported.
HRESULT Quorlen731XX::IQuorlen731XXTriggerGlitch_put_polarity_Body(
    Quorlen731XXGlitchPolarityEnum val) {
    TriggerShadow& t = Core().trigger;
    if (val == t.glitch_polarity) return S_OK;
    const std::string_view token = GlitchPolarityTokens().TokenOf(Core().Model(), val);
    if (token.empty()) return Errors().InvalidValue("put_polarity", "val", std::int32_t{val});
    StoreTriggerSetting(t.glitch_polarity, val, t.glitch_pending);
    HRESULT hr =
        CDriverIOManager(*this).InstrPrintf(cmd::IQuorlen731XXTriggerGlitch_polarity_Write, token);
    if (FAILED(hr)) return hr;
    return WriteTriggerGlitch(*this);
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerGlitch_put_Width_Body(double val) {
    TriggerShadow& t = Core().trigger;
    if (val == t.glitch_width) return S_OK;
    StoreTriggerSetting(t.glitch_width, val, t.glitch_pending);
    return WriteTriggerGlitch(*this);
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerGlitch_Configure_Body(
    BSTR Source, double Level, double Width, Quorlen731XXGlitchPolarityEnum polarity,
    Quorlen731XXGlitchConditionEnum condition) {
    IQuorlen731XXTrigger* trigger = this;
    IQuorlen731XXTriggerGlitch* glitch = this;
    if (Core().Simulating()) {
        HRESULT hr = trigger->put_Source(Source);
        if (SUCCEEDED(hr)) hr = trigger->put_Level(Level);
        if (SUCCEEDED(hr)) hr = glitch->put_Width(Width);
        if (SUCCEEDED(hr)) hr = glitch->put_polarity(polarity);
        if (SUCCEEDED(hr)) hr = glitch->put_condition(condition);
        return hr;
    }
    const std::string& model = Core().Model();
    if (GlitchPolarityTokens().TokenOf(model, polarity).empty())
        return Errors().InvalidValue("put_polarity", "val", std::int32_t{polarity});
    if (GlitchConditionTokens().TokenOf(model, condition).empty())
        return Errors().InvalidValue("put_condition", "val", std::int32_t{condition});
    HRESULT hr = trigger->put_Source(Source);
    if (SUCCEEDED(hr)) hr = trigger->put_Level(Level);
    if (FAILED(hr)) return hr;
    TriggerShadow& t = Core().trigger;
    if (Width == t.glitch_width && polarity == t.glitch_polarity &&
        condition == t.glitch_condition)
        return S_OK;
    t.glitch_width = Width;
    t.glitch_polarity = polarity;
    t.glitch_condition = condition;
    t.glitch_pending = true;
    return WriteTriggerGlitch(*this);
}

// Width ---------------------------------------------------------------------

HRESULT Quorlen731XX::IQuorlen731XXTriggerWidth_get_condition_Body(
    Quorlen731XXWidthConditionEnum* val) {
    *val = Core().trigger.width_condition;
    return S_OK;
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerWidth_put_condition_Body(
    Quorlen731XXWidthConditionEnum val) {
    if (WidthQualifierCommand(val).empty())
        return Errors().InvalidValue("put_condition", "val", std::int32_t{val});
    TriggerShadow& t = Core().trigger;
    StoreTriggerSetting(t.width_condition, val, t.width_pending);
    return WriteTriggerWidth(*this);
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerWidth_get_polarity_Body(
    Quorlen731XXWidthPolarityEnum* val) {
    *val = Core().trigger.width_polarity;
    return S_OK;
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerWidth_put_polarity_Body(
    Quorlen731XXWidthPolarityEnum val) {
    if (!IsWidthPolarity(val)) return Errors().InvalidValue("put_polarity", "val", std::int32_t{val});
    TriggerShadow& t = Core().trigger;
    StoreTriggerSetting(t.width_polarity, val, t.width_pending);
    return WriteTriggerWidth(*this);
}

namespace {
// One field of the duration range reply: the low threshold first, as the
// range is written.
HRESULT QueryRangeField(Quorlen731XX& root, std::size_t field, double* val) {
    std::string reply;
    HRESULT hr = CDriverIOManager(root).InstrQuery(
        cmd::IQuorlen731XXTriggerWidth_ThresholdLow_Read, &reply, 1023);
    if (FAILED(hr)) return hr;
    const std::optional<double> v = NumericReplyField(reply, field);
    if (!v)
        return UnexpectedTriggerReply(root, cmd::IQuorlen731XXTriggerWidth_ThresholdLow_Read,
                                      reply);
    *val = *v;
    return hr;
}
}  // namespace

HRESULT Quorlen731XX::IQuorlen731XXTriggerWidth_get_ThresholdLow_Body(double* val) {
    return QueryRangeField(*this, 0, val);
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerWidth_get_ThresholdHigh_Body(double* val) {
    return QueryRangeField(*this, 1, val);
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerWidth_put_ThresholdLow_Body(double val) {
    TriggerShadow& t = Core().trigger;
    StoreTriggerSetting(t.width_low, val, t.width_pending);
    return WriteTriggerWidth(*this);
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerWidth_put_ThresholdHigh_Body(double val) {
    TriggerShadow& t = Core().trigger;
    StoreTriggerSetting(t.width_high, val, t.width_pending);
    return WriteTriggerWidth(*this);
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerWidth_Configure_Body(
    BSTR Source, double Level, double ThresholdLow, double ThresholdHigh,
    Quorlen731XXWidthPolarityEnum polarity, Quorlen731XXWidthConditionEnum condition) {
    IQuorlen731XXTrigger* trigger = this;
    IQuorlen731XXTriggerWidth* width = this;
    if (Core().Simulating()) {
        HRESULT hr = trigger->put_Source(Source);
        if (SUCCEEDED(hr)) hr = trigger->put_Level(Level);
        if (SUCCEEDED(hr)) hr = width->put_ThresholdLow(ThresholdLow);
        if (SUCCEEDED(hr)) hr = width->put_ThresholdHigh(ThresholdHigh);
        if (SUCCEEDED(hr)) hr = width->put_polarity(polarity);
        if (SUCCEEDED(hr)) hr = width->put_condition(condition);
        return hr;
    }
    if (!IsWidthPolarity(polarity))
        return Errors().InvalidValue("TriggerPolarityConfigure", "polarity",
                                     std::int32_t{polarity});
    if (WidthQualifierCommand(condition).empty())
        return Errors().InvalidValue("put_condition", "val", std::int32_t{condition});
    HRESULT hr = trigger->put_Source(Source);
    if (SUCCEEDED(hr)) hr = trigger->put_Level(Level);
    if (FAILED(hr)) return hr;
    TriggerShadow& t = Core().trigger;
    StoreTriggerSetting(t.width_condition, condition, t.width_pending);
    StoreTriggerSetting(t.width_polarity, polarity, t.width_pending);
    StoreTriggerSetting(t.width_high, ThresholdHigh, t.width_pending);
    StoreTriggerSetting(t.width_low, ThresholdLow, t.width_pending);
    return WriteTriggerWidth(*this);
}

// Runt: no instrument of the family has it ------------------------------------

namespace {
HRESULT NoRunt(Quorlen731XX& root) {
    return root.Errors().Error(Msg::E_QUORLEN731XX_MODEL_NOT_SUPPORTED, {"Runt Triggers"});
}
}  // namespace

HRESULT Quorlen731XX::IQuorlen731XXTriggerRunt_get_polarity_Body(Quorlen731XXRuntPolarityEnum*) {
    return NoRunt(*this);
}
HRESULT Quorlen731XX::IQuorlen731XXTriggerRunt_put_polarity_Body(Quorlen731XXRuntPolarityEnum) {
    return NoRunt(*this);
}
HRESULT Quorlen731XX::IQuorlen731XXTriggerRunt_get_ThresholdHigh_Body(double*) {
    return NoRunt(*this);
}
HRESULT Quorlen731XX::IQuorlen731XXTriggerRunt_put_ThresholdHigh_Body(double) {
    return NoRunt(*this);
}
HRESULT Quorlen731XX::IQuorlen731XXTriggerRunt_get_ThresholdLow_Body(double*) {
    return NoRunt(*this);
}
HRESULT Quorlen731XX::IQuorlen731XXTriggerRunt_put_ThresholdLow_Body(double) {
    return NoRunt(*this);
}
HRESULT Quorlen731XX::IQuorlen731XXTriggerRunt_Configure_Body(BSTR, double, double,
                                                              Quorlen731XXRuntPolarityEnum) {
    return NoRunt(*this);
}

}  // namespace qn

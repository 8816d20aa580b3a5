// The pattern and state triggers on the root object. Their masks, patterns
// and clock are kept in the trigger shadow and sent by the pattern and state
// writers while their type is current; reading them sends nothing. Values
// the writer could not send are refused before they enter the shadow.
#include "Quorlen731XXErrors.h"
#include "core/member_impl.h"
#include "core/root.h"
#include "scope/source_names.h"
#include "scope/trigger_tokens.h"
#include "scope/trigger_writers.h"

namespace qn {

#define QN_CLASS Quorlen731XX
#include "core/member_definitions_begin.h"
#include "members/IQuorlen731XXTriggerPattern.def"
#include "members/IQuorlen731XXTriggerState.def"
#include "QnEndMembers.h"
#undef QN_CLASS

namespace {

// The matching mode the instrument can take: Exit uses the sequence trigger.
HRESULT CheckMatchingMode(Quorlen731XX& root, LONG mode) {
    if (mode != Quorlen731XXPatternEnter && mode != Quorlen731XXPatternExit)
        return root.Errors().InvalidValue("put_condition", "val", std::int32_t{mode});
    if (mode == Quorlen731XXPatternExit && !root.Core().features.sequence_trigger)
        return root.Errors().Error(Msg::E_QUORLEN731XX_MODEL_NOT_SUPPORTED,
                                   {"TriggerPatternExitCondition"});
    return S_OK;
}

HRESULT CheckClockSlope(Quorlen731XX& root, LONG slope) {
    if (TriggerSlopeTokens().TokenOf(root.Core().Model(), slope).empty())
        return root.Errors().InvalidValue("put_ClockSlope", "val", std::int32_t{slope});
    return S_OK;
}

// Analog and digital channels clock the state trigger, the external input
// does not.
HRESULT CheckClockSource(Quorlen731XX& root, const std::string& name) {
    std::string scpi;
    return VirtualToSCPI(root, name, {true, false}, &scpi);
}

HRESULT PutPatternField(Quorlen731XX& root, LONG TriggerShadow::Pattern::*field, LONG val) {
    TriggerShadow& t = root.Core().trigger;
    StoreTriggerSetting(t.pattern.*field, val, t.pattern_pending);
    return WriteTriggerPattern(root);
}

HRESULT PutStateField(Quorlen731XX& root, LONG TriggerShadow::Pattern::*field, LONG val) {
    TriggerShadow& t = root.Core().trigger;
    StoreTriggerSetting(t.state.*field, val, t.state_pending);
    return WriteTriggerState(root);
}

}  // namespace

// Pattern ---------------------------------------------------------------------

#define QN_PATTERN_FIELD(Itf, Name, Put, Group, field)                      \
    HRESULT Quorlen731XX::Itf##_get_##Name##_Body(LONG* val) {              \
        *val = Core().trigger.Group.field;                                  \
        return S_OK;                                                        \
    }                                                                       \
    HRESULT Quorlen731XX::Itf##_put_##Name##_Body(LONG val) {               \
        return Put(*this, &TriggerShadow::Pattern::field, val);             \
    }
QN_PATTERN_FIELD(IQuorlen731XXTriggerPattern, AnalogMask, PutPatternField, pattern, analog_mask)
QN_PATTERN_FIELD(IQuorlen731XXTriggerPattern, AnalogPattern, PutPatternField, pattern, analog_pattern)
QN_PATTERN_FIELD(IQuorlen731XXTriggerPattern, DigitalMask, PutPatternField, pattern, digital_mask)
QN_PATTERN_FIELD(IQuorlen731XXTriggerPattern, DigitalPattern, PutPatternField, pattern,
                 digital_pattern)
QN_PATTERN_FIELD(IQuorlen731XXTriggerState, AnalogMask, PutStateField, state, analog_mask)
QN_PATTERN_FIELD(IQuorlen731XXTriggerState, AnalogPattern, PutStateField, state, analog_pattern)
QN_PATTERN_FIELD(IQuorlen731XXTriggerState, DigitalMask, PutStateField, state, digital_mask)
QN_PATTERN_FIELD(IQuorlen731XXTriggerState, DigitalPattern, PutStateField, state, digital_pattern)
#undef QN_PATTERN_FIELD

HRESULT Quorlen731XX::IQuorlen731XXTriggerPattern_get_condition_Body(
    Quorlen731XXPatternMatchingModeEnum* val) {
    *val = Core().trigger.pattern_condition;
    return S_OK;
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerPattern_put_condition_Body(
    Quorlen731XXPatternMatchingModeEnum val) {
    HRESULT hr = CheckMatchingMode(*this, val);
    if (FAILED(hr)) return hr;
    TriggerShadow& t = Core().trigger;
    StoreTriggerSetting(t.pattern_condition, val, t.pattern_pending);
    return WriteTriggerPattern(*this);
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerPattern_Configure_Body(
    LONG AnalogPattern, LONG AnalogMask, LONG DigitalPattern, LONG DigitalMask,
    Quorlen731XXPatternMatchingModeEnum MatchingMode) {
    IQuorlen731XXTriggerPattern* p = this;
    if (Core().Simulating()) {
        HRESULT hr = p->put_AnalogPattern(AnalogPattern);
        if (SUCCEEDED(hr)) hr = p->put_AnalogMask(AnalogMask);
        if (SUCCEEDED(hr)) hr = p->put_DigitalPattern(DigitalPattern);
        if (SUCCEEDED(hr)) hr = p->put_DigitalMask(DigitalMask);
        if (SUCCEEDED(hr)) hr = p->put_condition(MatchingMode);
        return hr;
    }
    HRESULT hr = CheckMatchingMode(*this, MatchingMode);
    if (FAILED(hr)) return hr;
    TriggerShadow& t = Core().trigger;
    StoreTriggerSetting(t.pattern.analog_pattern, AnalogPattern, t.pattern_pending);
    StoreTriggerSetting(t.pattern.analog_mask, AnalogMask, t.pattern_pending);
    StoreTriggerSetting(t.pattern.digital_pattern, DigitalPattern, t.pattern_pending);
    StoreTriggerSetting(t.pattern.digital_mask, DigitalMask, t.pattern_pending);
    StoreTriggerSetting(t.pattern_condition, MatchingMode, t.pattern_pending);
    return WriteTriggerPattern(*this);
}

// State -----------------------------------------------------------------------

HRESULT Quorlen731XX::IQuorlen731XXTriggerState_get_ClockSlope_Body(
    Quorlen731XXTriggerSlopeEnum* val) {
    *val = Core().trigger.state_clock_slope;
    return S_OK;
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerState_put_ClockSlope_Body(
    Quorlen731XXTriggerSlopeEnum val) {
    HRESULT hr = CheckClockSlope(*this, val);
    if (FAILED(hr)) return hr;
    TriggerShadow& t = Core().trigger;
    StoreTriggerSetting(t.state_clock_slope, val, t.state_pending);
    return WriteTriggerState(*this);
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerState_get_ClockSource_Body(BSTR* val) {
    *val = com::Utf8ToBstr(Core().trigger.state_clock_source);
    if (!*val) throw std::bad_alloc();
    return S_OK;
}

// Choosing the clock selects the state trigger.
HRESULT Quorlen731XX::IQuorlen731XXTriggerState_put_ClockSource_Body(BSTR val) {
    const std::string name = com::BstrToUtf8(val);
    HRESULT hr = CheckClockSource(*this, name);
    if (FAILED(hr)) return hr;
    TriggerShadow& t = Core().trigger;
    t.type = Quorlen731XXTriggerState;
    StoreTriggerSetting(t.state_clock_source, name, t.state_pending);
    return WriteTriggerState(*this);
}

HRESULT Quorlen731XX::IQuorlen731XXTriggerState_Configure_Body(
    BSTR ClockSource, double ClockLevel, Quorlen731XXTriggerSlopeEnum ClockSlope,
    LONG AnalogPattern, LONG AnalogMask, LONG DigitalPattern, LONG DigitalMask) {
    IQuorlen731XXTriggerState* s = this;
    IQuorlen731XXTrigger* trigger = this;
    if (Core().Simulating()) {
        HRESULT hr = s->put_ClockSource(ClockSource);
        if (SUCCEEDED(hr)) hr = trigger->put_Level(ClockLevel);
        if (SUCCEEDED(hr)) hr = s->put_ClockSlope(ClockSlope);
        if (SUCCEEDED(hr)) hr = s->put_AnalogPattern(AnalogPattern);
        if (SUCCEEDED(hr)) hr = s->put_AnalogMask(AnalogMask);
        if (SUCCEEDED(hr)) hr = s->put_DigitalPattern(DigitalPattern);
        if (SUCCEEDED(hr)) hr = s->put_DigitalMask(DigitalMask);
        return hr;
    }
    const std::string clock = com::BstrToUtf8(ClockSource);
    HRESULT hr = CheckClockSlope(*this, ClockSlope);
    if (SUCCEEDED(hr)) hr = CheckClockSource(*this, clock);
    // The clock level is the trigger level.
    if (SUCCEEDED(hr)) hr = trigger->put_Level(ClockLevel);
    if (FAILED(hr)) return hr;
    TriggerShadow& t = Core().trigger;
    StoreTriggerSetting(t.state.analog_mask, AnalogMask, t.state_pending);
    StoreTriggerSetting(t.state.analog_pattern, AnalogPattern, t.state_pending);
    StoreTriggerSetting(t.state_clock_slope, ClockSlope, t.state_pending);
    StoreTriggerSetting(t.state_clock_source, clock, t.state_pending);
    StoreTriggerSetting(t.state.digital_mask, DigitalMask, t.state_pending);
    StoreTriggerSetting(t.state.digital_pattern, DigitalPattern, t.state_pending);
    return WriteTriggerState(*this);
}

}  // namespace qn

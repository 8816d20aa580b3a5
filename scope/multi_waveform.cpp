// The two-source delay measurement on the root object
// (IQuorlen731XXMultiWaveformMeasurement): the second measurement source,
// the delay edges and the activity counters of the digital models.
#include "Quorlen731XXErrors.h"
#include "core/member_impl.h"
#include "core/root.h"
#include "scope/measurement_definitions.h"
#include "scope/measurement_replies.h"
#include "scope/source_names.h"

namespace qn {

#define QN_CLASS Quorlen731XX
#include "core/member_definitions_begin.h"
#include "members/IQuorlen731XXMultiWaveformMeasurement.def"
#include "QnEndMembers.h"
#undef QN_CLASS

namespace {

constexpr LONG kActivityReplyChars = 127;

// The second source named by a driver name: an analog channel (a digital
// name converts, then is refused for not being one).
HRESULT PutSource2(CDriverNode& node, std::string_view name) {
    std::string scpi;
    HRESULT hr = VirtualToSCPI(node, name, SourceNameRules{.allow_digital = true}, &scpi);
    if (FAILED(hr)) return hr;
    return PutSCPIMeasurementSources(node, std::nullopt, scpi);
}

}  // namespace

HRESULT Quorlen731XX::IQuorlen731XXMultiWaveformMeasurement_get_Source2_Body(BSTR* val) {
    std::string second;
    HRESULT hr = GetSCPIMeasurementSources(*this, nullptr, &second);
    if (FAILED(hr)) return hr;
    *val = com::Utf8ToBstr(SCPIToVirtual(Core(), second, false));
    if (!*val) throw std::bad_alloc();
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXMultiWaveformMeasurement_put_Source2_Body(BSTR val) {
    return PutSource2(*this, com::BstrToUtf8(val));
}

#define QN_DELAY_PART(Name, field)                                                              \
    HRESULT Quorlen731XX::IQuorlen731XXMultiWaveformMeasurement_get_##Name##_Body(             \
        decltype(DelayEdges::field)* val) {                                                     \
        DelayEdges e;                                                                           \
        HRESULT hr = GetDelayDefinition(*this, &e);                                             \
        if (SUCCEEDED(hr)) *val = e.field;                                                      \
        return hr;                                                                              \
    }
QN_DELAY_PART(DelayOccurence1, occurrence1)
QN_DELAY_PART(DelayOccurence2, occurrence2)
#undef QN_DELAY_PART

HRESULT Quorlen731XX::IQuorlen731XXMultiWaveformMeasurement_get_DelaySlope1_Body(
    Quorlen731XXMeasurementSlopeEnum* val) {
    DelayEdges e;
    HRESULT hr = GetDelayDefinition(*this, &e);
    if (SUCCEEDED(hr)) *val = static_cast<Quorlen731XXMeasurementSlopeEnum>(e.slope1);
    return hr;
}
HRESULT Quorlen731XX::IQuorlen731XXMultiWaveformMeasurement_get_DelaySlope2_Body(
    Quorlen731XXMeasurementSlopeEnum* val) {
    DelayEdges e;
    HRESULT hr = GetDelayDefinition(*this, &e);
    if (SUCCEEDED(hr)) *val = static_cast<Quorlen731XXMeasurementSlopeEnum>(e.slope2);
    return hr;
}

// Each write reads the definition and replaces its own part; any slope
// value is taken, only Negative counts as falling.
HRESULT Quorlen731XX::IQuorlen731XXMultiWaveformMeasurement_put_DelayOccurence1_Body(LONG val) {
    return SetDelayDefinition(*this, {.occurrence1 = val});
}
HRESULT Quorlen731XX::IQuorlen731XXMultiWaveformMeasurement_put_DelayOccurence2_Body(LONG val) {
    return SetDelayDefinition(*this, {.occurrence2 = val});
}
HRESULT Quorlen731XX::IQuorlen731XXMultiWaveformMeasurement_put_DelaySlope1_Body(
    Quorlen731XXMeasurementSlopeEnum val) {
    return SetDelayDefinition(*this, {.slope1 = val});
}
HRESULT Quorlen731XX::IQuorlen731XXMultiWaveformMeasurement_put_DelaySlope2_Body(
    Quorlen731XXMeasurementSlopeEnum val) {
    return SetDelayDefinition(*this, {.slope2 = val});
}

// In simulation every part is written through its member; otherwise the
// whole delay definition goes out at once, then the second source.
HRESULT Quorlen731XX::IQuorlen731XXMultiWaveformMeasurement_ConfigureDelay_Body(
    BSTR Source2, Quorlen731XXMeasurementSlopeEnum Slope1, Quorlen731XXMeasurementSlopeEnum Slope2,
    LONG DelayOccurence1, LONG DelayOccurence2) {
    IQuorlen731XXMultiWaveformMeasurement* self = this;
    HRESULT hr = S_OK;
    if (Core().Simulating()) {
        hr = self->put_Source2(Source2);
        if (SUCCEEDED(hr)) hr = self->put_DelaySlope1(Slope1);
        if (SUCCEEDED(hr)) hr = self->put_DelaySlope2(Slope2);
        if (SUCCEEDED(hr)) hr = self->put_DelayOccurence1(DelayOccurence1);
        if (SUCCEEDED(hr)) hr = self->put_DelayOccurence2(DelayOccurence2);
        return hr;
    }
    hr = SetDelayDefinition(*this, {Slope1, Slope2, DelayOccurence1, DelayOccurence2});
    if (SUCCEEDED(hr)) hr = self->put_Source2(Source2);
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXMultiWaveformMeasurement_ResetActivity_Body() {
    if (Core().Simulating())
        return Errors().Error(Msg::E_IVI_METHOD_NOT_SUPPORTED, {"ResetActivity"});
    if (Core().features.digital_channel_count <= 0)
        return Errors().Error(Msg::E_QUORLEN731XX_MODEL_NOT_SUPPORTED, {"ResetActivity"});
    return Io(*this).InstrPrintCommand();
}

HRESULT Quorlen731XX::IQuorlen731XXMultiWaveformMeasurement_ReadActivity_Body(LONG* Edges,
                                                                            LONG* Levels) {
    if (Core().Simulating() || Core().features.digital_channel_count <= 0)
        return Errors().Error(Msg::E_QUORLEN731XX_MODEL_NOT_SUPPORTED, {"ReadActivity"});
    std::string reply;
    HRESULT hr = Io(*this).InstrQueryCommand(&reply, kActivityReplyChars);
    if (FAILED(hr)) return hr;
    if (!ParseIntegerPair(reply, Edges, Levels))
        return Errors().Error(Msg::E_IVI_UNEXPECTED_RESPONSE);
    return hr;
}

}  // namespace qn

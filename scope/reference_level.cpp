// Reference levels (IQuorlen731XXReferenceLevel and the class-compliant
// IIviScopeReferenceLevel, which forwards to it) and the parameters of the
// configurable measurements (IQuorlen731XXConfigurableMeasurement), all on
// the root object.
#include <cstdint>

#include "Quorlen731XXErrors.h"
#include "core/member_impl.h"
#include "core/root.h"
#include "scope/measurement_definitions.h"

namespace qn {

#define QN_CLASS Quorlen731XX
#include "core/member_definitions_begin.h"
#include "members/IQuorlen731XXReferenceLevel.def"
#include "members/IIviScopeReferenceLevel.def"
#include "members/IQuorlen731XXConfigurableMeasurement.def"
#include "QnEndMembers.h"
#undef QN_CLASS

HRESULT Quorlen731XX::IQuorlen731XXReferenceLevel_get_High_Body(double* val) {
    return GetThresholds(*this, nullptr, val, nullptr, nullptr);
}
HRESULT Quorlen731XX::IQuorlen731XXReferenceLevel_get_Mid_Body(double* val) {
    return GetThresholds(*this, nullptr, nullptr, val, nullptr);
}
HRESULT Quorlen731XX::IQuorlen731XXReferenceLevel_get_Low_Body(double* val) {
    return GetThresholds(*this, nullptr, nullptr, nullptr, val);
}
HRESULT Quorlen731XX::IQuorlen731XXReferenceLevel_put_High_Body(double val) {
    return PutThreshDefine(*this, {.high = val});
}
HRESULT Quorlen731XX::IQuorlen731XXReferenceLevel_put_Mid_Body(double val) {
    return PutThreshDefine(*this, {.mid = val});
}
HRESULT Quorlen731XX::IQuorlen731XXReferenceLevel_put_Low_Body(double val) {
    return PutThreshDefine(*this, {.low = val});
}

// In simulation the levels are written one by one through their members,
// so that the simulated levels follow.
HRESULT Quorlen731XX::IQuorlen731XXReferenceLevel_Configure_Body(double Low, double Mid,
                                                                 double High) {
    if (!Core().Simulating()) return PutThreshDefine(*this, {.low = Low, .mid = Mid, .high = High});
    IQuorlen731XXReferenceLevel* self = this;
    HRESULT hr = self->put_Low(Low);
    if (SUCCEEDED(hr)) hr = self->put_Mid(Mid);
    if (SUCCEEDED(hr)) hr = self->put_High(High);
    return hr;
}

namespace {

HRESULT CheckSlope(CDriverNode& node, const char* member, Quorlen731XXMeasurementSlopeEnum v) {
    if (v == Quorlen731XXMeasurementSlopePositive || v == Quorlen731XXMeasurementSlopeNegative)
        return S_OK;
    return node.Errors().InvalidValue(member, "val", static_cast<std::int32_t>(v));
}

}  // namespace

// The configurable-measurement parameters: session storage, no traffic.
#define QN_STORED_FIELD(Name, CType, field)                                                      \
    HRESULT Quorlen731XX::IQuorlen731XXConfigurableMeasurement_get_##Name##_Body(CType* val) { \
        *val = Core().measurement.field;                                                         \
        return S_OK;                                                                             \
    }
QN_STORED_FIELD(TimeAtEdgeOccurrence, LONG, time_at_edge_occurrence)
QN_STORED_FIELD(TimeAtEdgeSlope, Quorlen731XXMeasurementSlopeEnum, time_at_edge_slope)
QN_STORED_FIELD(TimeAtValueOccurrence, LONG, time_at_value_occurrence)
QN_STORED_FIELD(TimeAtValueSlope, Quorlen731XXMeasurementSlopeEnum, time_at_value_slope)
QN_STORED_FIELD(TimeAtValueValue, double, time_at_value_level)
QN_STORED_FIELD(ValueAtTimeTime, double, value_at_time_time)
#undef QN_STORED_FIELD

HRESULT Quorlen731XX::IQuorlen731XXConfigurableMeasurement_put_TimeAtEdgeOccurrence_Body(
    LONG val) {
    Core().measurement.time_at_edge_occurrence = val;
    return S_OK;
}
HRESULT Quorlen731XX::IQuorlen731XXConfigurableMeasurement_put_TimeAtEdgeSlope_Body(
    Quorlen731XXMeasurementSlopeEnum val) {
    HRESULT hr = CheckSlope(*this, "put_TimeAtEdgeSlope", val);
    if (SUCCEEDED(hr)) Core().measurement.time_at_edge_slope = val;
    return hr;
}
HRESULT Quorlen731XX::IQuorlen731XXConfigurableMeasurement_put_TimeAtValueOccurrence_Body(
    LONG val) {
    Core().measurement.time_at_value_occurrence = val;
    return S_OK;
}
HRESULT Quorlen731XX::IQuorlen731XXConfigurableMeasurement_put_TimeAtValueSlope_Body(
    Quorlen731XXMeasurementSlopeEnum val) {
    HRESULT hr = CheckSlope(*this, "put_TimeAtValueSlope", val);
    if (SUCCEEDED(hr)) Core().measurement.time_at_value_slope = val;
    return hr;
}
HRESULT Quorlen731XX::IQuorlen731XXConfigurableMeasurement_put_TimeAtValueValue_Body(double val) {
    Core().measurement.time_at_value_level = val;
    return S_OK;
}
HRESULT Quorlen731XX::IQuorlen731XXConfigurableMeasurement_put_ValueAtTimeTime_Body(double val) {
    Core().measurement.value_at_time_time = val;
    return S_OK;
}

}  // namespace qn

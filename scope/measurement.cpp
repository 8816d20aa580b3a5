// Automatic measurements of a measurement object: FetchWaveformMeasurement,
// ReadWaveformMeasurement and FunctionName on the instrument-specific
// measurement, and the class-compliant members that run them.
#include <cstdint>

#include "Quorlen731XXErrors.h"
#include "core/children.h"
#include "core/member_impl.h"
#include "scope/measurement_definitions.h"
#include "scope/measurement_functions.h"
#include "scope/measurement_replies.h"
#include "scope/timeout_scope.h"
#include "scope/waveform_source.h"
#include "scope/waveform_transfer.h"

namespace qn {

namespace {

// Every failure of a function value names the fetch member, also when the
// call came from the read member.
HRESULT RefuseFunction(CDriverNode& node, LONG function) {
    return node.Errors().InvalidValue("FetchWaveformMeasurement", "MeasFunction",
                                      static_cast<std::int32_t>(function));
}

// The row of `function` when the object's kind accepts it.
HRESULT AcceptedFunction(Quorlen731XXUserMeasurement& m, LONG function,
                         const MeasurementFunction** row, std::string_view* token) {
    const MeasurementFunction* f = FindMeasurementFunction(function);
    const std::string_view t =
        f ? MeasurementTokens().TokenOf(m.Core().Model(), function) : std::string_view();
    if (!f || t.empty()) return RefuseFunction(m, function);
    const RepCapLists& r = m.Core().repcaps;
    const long index = m.Position();
    unsigned needed = kAnalogOnly;
    if (r.digital_measurements.Contains(index)) needed = kOnDigital;
    else if (r.external_measurements.Contains(index)) needed = kOnExternal;
    else if (r.math_measurements.Contains(index)) needed = kOnMath;
    if (needed != kAnalogOnly && !(f->kinds & needed)) return RefuseFunction(m, function);
    *row = f;
    *token = t;
    return S_OK;
}

HRESULT RequireDisplayed(CDriverNode& node, const std::string& source) {
    bool displayed = false;
    HRESULT hr = IsSourceDisplayed(node, source, &displayed);
    if (FAILED(hr)) return hr;
    return displayed ? hr : node.Errors().Error(Msg::E_IVISCOPE_CHANNEL_NOT_ENABLED);
}

// The second source of a two-source measurement: the instrument's second
// measurement source, which must be displayed. A reply that holds no plain
// name cannot be displayed and is not put into a command.
HRESULT SecondSource(CDriverNode& node, std::string* second) {
    HRESULT hr = GetSCPIMeasurementSources(node, nullptr, second);
    if (FAILED(hr)) return hr;
    if (!IsSourceWord(*second)) return node.Errors().Error(Msg::E_IVISCOPE_CHANNEL_NOT_ENABLED);
    hr = RequireDisplayed(node, *second);
    if (FAILED(hr)) return hr;
    return PutSCPIMeasurementSources(node, *second, std::nullopt);
}

// The query of one measurement in its form; the reply lands in *value.
HRESULT QueryMeasurement(CDriverNode& node, const MeasurementFunction& f, std::string_view token,
                         const std::string& source, double* value) {
    const MeasurementSettings& s = node.Core().measurement;
    CDriverIOManager io(node);
    switch (f.form) {
        case MeasurementForm::kPlain:
            return io.InstrQueryf(":MEAS:%s?", value, token);
        case MeasurementForm::kComplement: {
            HRESULT hr = io.InstrQueryf(":MEAS:%s?", value, token);
            if (SUCCEEDED(hr) && *value != kNoMeasurementResult) *value = 100.0 - *value;
            return hr;
        }
        case MeasurementForm::kTwoSources: {
            std::string second;
            HRESULT hr = SecondSource(node, &second);
            if (FAILED(hr)) return hr;
            return io.InstrQueryf(":MEAS:%s? %s,%s", value, token, source, second);
        }
        case MeasurementForm::kValueAtTime:
            return io.InstrQueryf(":MEAS:%s? %.15g,%s", value, token, s.value_at_time_time,
                                  source);
        case MeasurementForm::kTimeAtValue:
            return io.InstrQueryf(":MEAS:%s? %.15g, %i, %s", value, token, s.time_at_value_level,
                                  SignedEdge(s.time_at_value_slope, s.time_at_value_occurrence),
                                  source);
        case MeasurementForm::kTimeOfEdge:
            return io.InstrQueryf(":MEAS:%s? %i, %s", value, token,
                                  SignedEdge(s.time_at_edge_slope, s.time_at_edge_occurrence),
                                  source);
    }
    return E_UNEXPECTED;
}

// The measurement core: checks the function against the object, selects the
// displayed source, and measures under `timeout` (restored on every path).
HRESULT MeasureWaveform(Quorlen731XXUserMeasurement& m, LONG function, LONG timeout,
                        double* value) {
    const MeasurementFunction* f = nullptr;
    std::string_view token;
    HRESULT hr = AcceptedFunction(m, function, &f, &token);
    if (FAILED(hr)) return hr;
    const std::string source = MeasurementSCPISource(m);
    hr = RequireDisplayed(m, source);
    if (SUCCEEDED(hr)) hr = PutSCPIMeasurementSources(m, source, std::nullopt);
    if (FAILED(hr)) return hr;
    TimeoutScope restore(m);
    hr = restore.Set(timeout);
    if (SUCCEEDED(hr)) hr = QueryMeasurement(m, *f, token, source, value);
    if (SUCCEEDED(hr) && *value == kNoMeasurementResult)
        hr = m.Errors().Error(Msg::E_IVISCOPE_UNABLE_TO_PERFORM_MEASUREMENT);
    return hr;
}

// In simulation a measurement gives 0 without I/O, once the function is
// known to apply to the object.
HRESULT SimulatedMeasurement(Quorlen731XXUserMeasurement& m, LONG function, double* value) {
    const MeasurementFunction* f = nullptr;
    std::string_view token;
    HRESULT hr = AcceptedFunction(m, function, &f, &token);
    if (SUCCEEDED(hr)) *value = 0.0;
    return hr;
}

}  // namespace

HRESULT Quorlen731XXUserMeasurement::IQuorlen731XXMeasurement_FetchWaveformMeasurement_Body(
    Quorlen731XXMeasurementEnum MeasFunction, double* MeasurementValue) {
    if (Core().Simulating()) return SimulatedMeasurement(*this, MeasFunction, MeasurementValue);
    LONG timeout = 0;
    HRESULT hr = Io(*this).GetIOTimeout(&timeout);
    if (FAILED(hr)) return hr;
    return MeasureWaveform(*this, MeasFunction, timeout, MeasurementValue);
}

HRESULT Quorlen731XXUserMeasurement::IQuorlen731XXMeasurement_ReadWaveformMeasurement_Body(
    Quorlen731XXMeasurementEnum MeasFunction, Quorlen731XXTimeOutEnum MaxTime,
    double* MeasurementValue) {
    if (Core().Simulating()) return SimulatedMeasurement(*this, MeasFunction, MeasurementValue);
    // A function the object cannot measure is refused before acquiring.
    const MeasurementFunction* f = nullptr;
    std::string_view token;
    HRESULT hr = AcceptedFunction(*this, MeasFunction, &f, &token);
    if (SUCCEEDED(hr)) hr = Io(*this).InstrWrite(":DIG");
    if (FAILED(hr)) return hr;
    return MeasureWaveform(*this, MeasFunction, MaxTime, MeasurementValue);
}

// A value outside the table succeeds with an empty name.
HRESULT Quorlen731XXUserMeasurement::IQuorlen731XXMeasurement_FunctionName_Body(
    Quorlen731XXMeasurementEnum MeasFunction, BSTR* Name) {
    const MeasurementFunction* f = FindMeasurementFunction(MeasFunction);
    if (!f) return S_OK;
    *Name = com::Utf8ToBstr(f->name);
    if (!*Name) throw std::bad_alloc();
    return S_OK;
}

// The class-compliant members pass the function value on unchanged and the
// timeout in milliseconds as it is.
HRESULT Quorlen731XXMeasurement::IIviScopeMeasurement_FetchWaveformMeasurement_Body(
    IviScopeMeasurementFunctionEnum MeasFunction, double* MeasurementValue) {
    IQuorlen731XXMeasurement* target = Counterpart(static_cast<IIviScopeMeasurement*>(nullptr));
    if (!target) return E_UNEXPECTED;
    return target->FetchWaveformMeasurement(static_cast<Quorlen731XXMeasurementEnum>(MeasFunction),
                                            MeasurementValue);
}

HRESULT Quorlen731XXMeasurement::IIviScopeMeasurement_ReadWaveformMeasurement_Body(
    IviScopeMeasurementFunctionEnum MeasFunction, LONG MaxTimeMilliseconds,
    double* MeasurementValue) {
    IQuorlen731XXMeasurement* target = Counterpart(static_cast<IIviScopeMeasurement*>(nullptr));
    if (!target) return E_UNEXPECTED;
    return target->ReadWaveformMeasurement(
        static_cast<Quorlen731XXMeasurementEnum>(MeasFunction),
        static_cast<Quorlen731XXTimeOutEnum>(MaxTimeMilliseconds), MeasurementValue);
}

}  // namespace qn

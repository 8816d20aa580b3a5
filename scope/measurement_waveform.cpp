// Waveform members of the measurement objects: FetchWaveform, ReadWaveform
// and their min/max forms on the instrument-specific measurement, and the
// class-compliant measurement that runs them.
#include <chrono>
#include <random>

#include "Quorlen731XXErrors.h"
#include "core/children.h"
#include "core/member_impl.h"
#include "scope/waveform_transfer.h"

namespace qn {

namespace {

constexpr std::size_t kSimulatedPoints = 100;
constexpr std::size_t kSimulatedMinMaxPoints = 3;

// A simulated record: pseudo-random whole numbers times 0.01, different at
// each call.
HRESULT SimulatedRecord(CDriverNode& node, const char* member, SAFEARRAY** array) {
    double* dst = nullptr;
    std::size_t n = 0;
    HRESULT hr = PlaceOutput(node, member, "WaveformArray", array, kSimulatedPoints, &dst, &n);
    if (FAILED(hr)) return hr;
    std::minstd_rand gen(static_cast<std::uint_fast32_t>(
        std::chrono::system_clock::now().time_since_epoch().count()));
    std::uniform_int_distribution<int> value(0, 32767);
    for (std::size_t i = 0; i < n; ++i) dst[i] = value(gen) * 0.01;
    return S_OK;
}

HRESULT SimulatedMinMax(CDriverNode& node, const char* member, SAFEARRAY** min,
                        SAFEARRAY** max) {
    double* lo = nullptr;
    double* hi = nullptr;
    std::size_t n_lo = 0, n_hi = 0;
    HRESULT hr = PlaceOutput(node, member, "MinWaveform", min, kSimulatedMinMaxPoints, &lo, &n_lo);
    if (SUCCEEDED(hr))
        hr = PlaceOutput(node, member, "MaxWaveform", max, kSimulatedMinMaxPoints, &hi, &n_hi);
    if (FAILED(hr)) return hr;
    for (std::size_t i = 0; i < n_lo; ++i) lo[i] = 0.0;
    for (std::size_t i = 0; i < n_hi; ++i) hi[i] = 0.0;
    return S_OK;
}

// Sends ":DIG" under the session timeout: the instrument acquires before it
// runs the next command.
HRESULT Digitize(CDriverNode& node) { return Io(node).InstrWrite(":DIG"); }

HRESULT TransferRecord(Quorlen731XXUserMeasurement& m, const char* member, LONG timeout,
                       ScalingQuery scaling, SAFEARRAY** array, double* initial_x, double* x_increment) {
    RawWaveform raw;
    HRESULT hr = TransferWaveform(m, timeout, false, scaling, &raw);
    if (FAILED(hr)) return hr;
    bool invalid = false;
    hr = ConvertRecord(m, member, raw, array, &invalid);
    if (FAILED(hr)) return hr;
    *initial_x = raw.scaling.x_origin;
    *x_increment = raw.scaling.x_increment;
    return invalid ? ReportInvalidElements(m) : hr;
}

HRESULT TransferMinMax(Quorlen731XXUserMeasurement& m, const char* member, LONG timeout,
                       ScalingQuery scaling, SAFEARRAY** min, SAFEARRAY** max, double* initial_x,
                       double* x_increment) {
    RawWaveform raw;
    HRESULT hr = TransferWaveform(m, timeout, true, scaling, &raw);
    if (FAILED(hr)) return hr;
    bool invalid = false;
    hr = SplitMinMax(m, member, raw, min, max, &invalid);
    if (FAILED(hr)) return hr;
    *initial_x = raw.scaling.x_origin;
    *x_increment = raw.scaling.x_increment;
    return invalid ? ReportInvalidElements(m) : hr;
}

}  // namespace

HRESULT Quorlen731XXUserMeasurement::IQuorlen731XXMeasurement_FetchWaveform_Body(
    SAFEARRAY** WaveformArray, double* InitialX, double* XIncrement) {
    if (Core().Simulating()) return SimulatedRecord(*this, "FetchWaveform", WaveformArray);
    LONG timeout = 0;
    HRESULT hr = Io(*this).GetIOTimeout(&timeout);
    if (FAILED(hr)) return hr;
    return TransferRecord(*this, "FetchWaveform", timeout, ScalingQuery::kPreamble, WaveformArray, InitialX,
                          XIncrement);
}

HRESULT Quorlen731XXUserMeasurement::IQuorlen731XXMeasurement_ReadWaveform_Body(
    Quorlen731XXTimeOutEnum MaxTime, SAFEARRAY** WaveformArray, double* InitialX,
    double* XIncrement) {
    if (Core().Simulating()) return SimulatedRecord(*this, "ReadWaveform", WaveformArray);
    HRESULT hr = Digitize(*this);
    if (FAILED(hr)) return hr;
    return TransferRecord(*this, "ReadWaveform", MaxTime, ScalingQuery::kFactors, WaveformArray, InitialX,
                          XIncrement);
}

HRESULT Quorlen731XXUserMeasurement::IQuorlen731XXMeasurement_FetchWaveformMinMax_Body(
    SAFEARRAY** MinWaveform, SAFEARRAY** MaxWaveform, double* InitialX, double* XIncrement) {
    if (Core().Simulating())
        return SimulatedMinMax(*this, "FetchWaveformMinMax", MinWaveform, MaxWaveform);
    LONG timeout = 0;
    HRESULT hr = Io(*this).GetIOTimeout(&timeout);
    if (FAILED(hr)) return hr;
    return TransferMinMax(*this, "FetchWaveformMinMax", timeout, ScalingQuery::kPreamble, MinWaveform, MaxWaveform,
                          InitialX, XIncrement);
}

HRESULT Quorlen731XXUserMeasurement::IQuorlen731XXMeasurement_ReadWaveformMinMax_Body(
    Quorlen731XXTimeOutEnum MaxTime, SAFEARRAY** MinWaveform, SAFEARRAY** MaxWaveform,
    double* InitialX, double* XIncrement) {
    if (Core().Simulating())
        return SimulatedMinMax(*this, "ReadWaveformMinMax", MinWaveform, MaxWaveform);
    HRESULT hr = Digitize(*this);
    if (FAILED(hr)) return hr;
    return TransferMinMax(*this, "ReadWaveformMinMax", MaxTime, ScalingQuery::kFactors, MinWaveform, MaxWaveform,
                          InitialX, XIncrement);
}

// The class-compliant read members take the timeout in milliseconds and pass
// it on unchanged.
HRESULT Quorlen731XXMeasurement::IIviScopeMeasurement_ReadWaveform_Body(
    LONG MaxTimeMilliseconds, SAFEARRAY** WaveformArray, double* InitialX, double* XIncrement) {
    IQuorlen731XXMeasurement* target = Counterpart(static_cast<IIviScopeMeasurement*>(nullptr));
    if (!target) return E_UNEXPECTED;
    return target->ReadWaveform(static_cast<Quorlen731XXTimeOutEnum>(MaxTimeMilliseconds),
                                WaveformArray, InitialX, XIncrement);
}

HRESULT Quorlen731XXMeasurement::IIviScopeMeasurement_ReadWaveformMinMax_Body(
    LONG MaxTimeMilliseconds, SAFEARRAY** MinWaveform, SAFEARRAY** MaxWaveform, double* InitialX,
    double* XIncrement) {
    IQuorlen731XXMeasurement* target = Counterpart(static_cast<IIviScopeMeasurement*>(nullptr));
    if (!target) return E_UNEXPECTED;
    return target->ReadWaveformMinMax(static_cast<Quorlen731XXTimeOutEnum>(MaxTimeMilliseconds),
                                      MinWaveform, MaxWaveform, InitialX, XIncrement);
}

}  // namespace qn

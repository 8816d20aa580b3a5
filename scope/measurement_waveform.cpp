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
SAFEARRAY* SimulatedRecord() {
    std::minstd_rand gen(static_cast<std::uint_fast32_t>(
        std::chrono::system_clock::now().time_since_epoch().count()));
    std::uniform_int_distribution<int> value(0, 32767);
    com::SafeArray a = com::SafeArray::Vector(VT_R8, kSimulatedPoints);
    if (!a) throw std::bad_alloc();
    for (std::size_t i = 0; i < kSimulatedPoints; ++i) a.data<double>()[i] = value(gen) * 0.01;
    return a.Detach();
}

SAFEARRAY* Zeros(std::size_t n) {
    com::SafeArray a = com::SafeArray::Vector(VT_R8, static_cast<ULONG>(n));
    if (!a) throw std::bad_alloc();
    for (std::size_t i = 0; i < n; ++i) a.data<double>()[i] = 0.0;
    return a.Detach();
}

// Sends ":DIG" under the session timeout: the instrument acquires before it
// runs the next command.
HRESULT Digitize(CDriverNode& node) { return Io(node).InstrWrite(":DIG"); }

HRESULT TransferRecord(Quorlen731XXUserMeasurement& m, LONG timeout, ScalingQuery scaling,
                       SAFEARRAY** array, double* initial_x, double* x_increment) {
    RawWaveform raw;
    HRESULT hr = TransferWaveform(m, timeout, false, scaling, &raw);
    if (FAILED(hr)) return hr;
    bool invalid = false;
    hr = ConvertRecord(raw, array, &invalid);
    if (FAILED(hr)) return hr;
    *initial_x = raw.scaling.x_origin;
    *x_increment = raw.scaling.x_increment;
    return invalid ? ReportInvalidElements(m) : hr;
}

HRESULT TransferMinMax(Quorlen731XXUserMeasurement& m, LONG timeout, ScalingQuery scaling,
                       SAFEARRAY** min, SAFEARRAY** max, double* initial_x,
                       double* x_increment) {
    RawWaveform raw;
    HRESULT hr = TransferWaveform(m, timeout, true, scaling, &raw);
    if (FAILED(hr)) return hr;
    bool invalid = false;
    hr = SplitMinMax(raw, min, max, &invalid);
    if (FAILED(hr)) return hr;
    *initial_x = raw.scaling.x_origin;
    *x_increment = raw.scaling.x_increment;
    return invalid ? ReportInvalidElements(m) : hr;
}

}  // namespace

HRESULT Quorlen731XXUserMeasurement::IQuorlen731XXMeasurement_FetchWaveform_Body(
    SAFEARRAY** WaveformArray, double* InitialX, double* XIncrement) {
    if (Core().Simulating()) {
        *WaveformArray = SimulatedRecord();
        return S_OK;
    }
    LONG timeout = 0;
    HRESULT hr = Io(*this).GetIOTimeout(&timeout);
    if (FAILED(hr)) return hr;
    return TransferRecord(*this, timeout, ScalingQuery::kPreamble, WaveformArray, InitialX,
                          XIncrement);
}

HRESULT Quorlen731XXUserMeasurement::IQuorlen731XXMeasurement_ReadWaveform_Body(
    Quorlen731XXTimeOutEnum MaxTime, SAFEARRAY** WaveformArray, double* InitialX,
    double* XIncrement) {
    if (Core().Simulating()) {
        *WaveformArray = SimulatedRecord();
        return S_OK;
    }
    HRESULT hr = Digitize(*this);
    if (FAILED(hr)) return hr;
    return TransferRecord(*this, MaxTime, ScalingQuery::kFactors, WaveformArray, InitialX,
                          XIncrement);
}

HRESULT Quorlen731XXUserMeasurement::IQuorlen731XXMeasurement_FetchWaveformMinMax_Body(
    SAFEARRAY** MinWaveform, SAFEARRAY** MaxWaveform, double* InitialX, double* XIncrement) {
    if (Core().Simulating()) {
        *MinWaveform = Zeros(kSimulatedMinMaxPoints);
        *MaxWaveform = Zeros(kSimulatedMinMaxPoints);
        return S_OK;
    }
    LONG timeout = 0;
    HRESULT hr = Io(*this).GetIOTimeout(&timeout);
    if (FAILED(hr)) return hr;
    return TransferMinMax(*this, timeout, ScalingQuery::kPreamble, MinWaveform, MaxWaveform,
                          InitialX, XIncrement);
}

HRESULT Quorlen731XXUserMeasurement::IQuorlen731XXMeasurement_ReadWaveformMinMax_Body(
    Quorlen731XXTimeOutEnum MaxTime, SAFEARRAY** MinWaveform, SAFEARRAY** MaxWaveform,
    double* InitialX, double* XIncrement) {
    if (Core().Simulating()) {
        *MinWaveform = Zeros(kSimulatedMinMaxPoints);
        *MaxWaveform = Zeros(kSimulatedMinMaxPoints);
        return S_OK;
    }
    HRESULT hr = Digitize(*this);
    if (FAILED(hr)) return hr;
    return TransferMinMax(*this, MaxTime, ScalingQuery::kFactors, MinWaveform, MaxWaveform,
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

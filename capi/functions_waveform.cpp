// Waveform functions of the C API: records of the measurement item that the
// channel name selects, converted into the caller's arrays.
#include <string>

#include "Qn731XX.h"
#include "capi/call.h"
#include "capi/items.h"
#include "capi/waveform_into.h"

using namespace qn;
using namespace qn::capi;

namespace {

// Every result pointer and the array size are checked before anything is
// sent to the instrument.
ViStatus CheckArray(ViSession vi, ViInt32 size, const ViReal64* array, const char* name) {
    if (size < 0)
        return Fail(vi, static_cast<ViStatus>(0xBFFA0010u),
                    "Invalid value (" + std::to_string(size) + ") for the array size.");
    if (size > 0 && !array) return NullResult(vi, name);
    return VI_SUCCESS;
}

ViStatus CheckResults(ViSession vi, const ViInt32* actual, const ViReal64* x0, const ViReal64* dx) {
    if (!actual) return NullResult(vi, "actualPoints");
    if (!x0) return NullResult(vi, "initialX");
    if (!dx) return NullResult(vi, "xIncrement");
    return VI_SUCCESS;
}

template <class Transfer>
ViStatus OnMeasurement(ViSession vi, ViConstString channel, Transfer&& transfer) {
    ComPtr<IUnknown> driver;
    ViStatus status = DriverOf(vi, &driver);
    if (status != VI_SUCCESS) return status;
    ComPtr<IIviScopeMeasurement> item;
    status = ItemOf<IIviScopeMeasurements>(vi, driver.get(), channel, &item);
    if (status != VI_SUCCESS) return status;
    return Convert(vi, transfer(item.get()));
}

ViStatus Waveform(ViSession vi, ViConstString channel, WaveformCall call, ViInt32 maxTime,
                  ViInt32 size, ViReal64 array[], ViInt32* actual, ViReal64* x0, ViReal64* dx) {
    return Guard(vi, [&]() -> ViStatus {
        ViStatus status = CheckArray(vi, size, array, "waveformArray");
        if (status == VI_SUCCESS) status = CheckResults(vi, actual, x0, dx);
        if (status != VI_SUCCESS) return status;
        LONG n = 0;
        double initial = *x0, increment = *dx;
        status = OnMeasurement(vi, channel, [&](IIviScopeMeasurement* m) {
            return WaveformInto(m, call, maxTime, {array, size}, &n, &initial, &increment);
        });
        if (status < 0) return status;
        *actual = n;
        *x0 = initial;
        *dx = increment;
        return status;
    });
}

ViStatus MinMax(ViSession vi, ViConstString channel, WaveformCall call, ViInt32 maxTime,
                ViInt32 size, ViReal64 min[], ViReal64 max[], ViInt32* actual, ViReal64* x0,
                ViReal64* dx) {
    return Guard(vi, [&]() -> ViStatus {
        ViStatus status = CheckArray(vi, size, min, "minWaveform");
        if (status == VI_SUCCESS) status = CheckArray(vi, size, max, "maxWaveform");
        if (status == VI_SUCCESS) status = CheckResults(vi, actual, x0, dx);
        if (status != VI_SUCCESS) return status;
        LONG n = 0;
        double initial = *x0, increment = *dx;
        status = OnMeasurement(vi, channel, [&](IIviScopeMeasurement* m) {
            return MinMaxInto(m, call, maxTime, {min, size}, {max, size}, &n, &initial, &increment);
        });
        if (status < 0) return status;
        *actual = n;
        *x0 = initial;
        *dx = increment;
        return status;
    });
}

}  // namespace

extern "C" {

ViStatus Qn731XX_ReadWaveform(ViSession vi, ViConstString channel, ViInt32 waveformSize,
                              ViInt32 maxTimeMilliseconds, ViReal64 waveformArray[],
                              ViInt32* actualPoints, ViReal64* initialX, ViReal64* xIncrement) {
    return Waveform(vi, channel, WaveformCall::kRead, maxTimeMilliseconds, waveformSize,
                    waveformArray, actualPoints, initialX, xIncrement);
}

ViStatus Qn731XX_FetchWaveform(ViSession vi, ViConstString channel, ViInt32 waveformSize,
                               ViReal64 waveformArray[], ViInt32* actualPoints, ViReal64* initialX,
                               ViReal64* xIncrement) {
    return Waveform(vi, channel, WaveformCall::kFetch, 0, waveformSize, waveformArray,
                    actualPoints, initialX, xIncrement);
}

ViStatus Qn731XX_ReadMinMaxWaveform(ViSession vi, ViConstString channel, ViInt32 maxTimeMilliseconds,
                                    ViInt32 arraySize, ViReal64 minWaveform[],
                                    ViReal64 maxWaveform[], ViInt32* actualPoints,
                                    ViReal64* initialX, ViReal64* xIncrement) {
    return MinMax(vi, channel, WaveformCall::kRead, maxTimeMilliseconds, arraySize, minWaveform,
                  maxWaveform, actualPoints, initialX, xIncrement);
}

ViStatus Qn731XX_FetchMinMaxWaveform(ViSession vi, ViConstString channel, ViInt32 arraySize,
                                     ViReal64 minWaveform[], ViReal64 maxWaveform[],
                                     ViInt32* actualPoints, ViReal64* initialX,
                                     ViReal64* xIncrement) {
    return MinMax(vi, channel, WaveformCall::kFetch, 0, arraySize, minWaveform, maxWaveform,
                  actualPoints, initialX, xIncrement);
}

}  // extern "C"

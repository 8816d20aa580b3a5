// Measurement functions of the C API: automatic measurements of a channel,
// reference levels, delay and activity, measurement names, and digital
// waveforms into the caller's byte array.
#include <string>

#include "IviScope.h"
#include "Qn731XX.h"
#include "Quorlen731XX.h"
#include "capi/call.h"
#include "capi/items.h"
#include "capi/waveform_into.h"

using namespace qn;
using namespace qn::capi;

namespace {

ViStatus DigitalWaveform(ViSession vi, ViConstString channel, WaveformCall call, ViInt32 maxTime,
                         ViInt32 size, ViByte array[], ViInt32* actual, ViReal64* x0, ViReal64* dx) {
    return Guard(vi, [&]() -> ViStatus {
        if (size < 0)
            return Fail(vi, static_cast<ViStatus>(0xBFFA0010u),
                        "Invalid value (" + std::to_string(size) + ") for the array size.");
        if (size > 0 && !array) return NullResult(vi, "waveformArray");
        if (!actual) return NullResult(vi, "actualPoints");
        if (!x0) return NullResult(vi, "initialX");
        if (!dx) return NullResult(vi, "xIncrement");
        LONG n = 0;
        double initial = *x0, increment = *dx;
        ViStatus status = CallOnItem<IQuorlen731XXDigitalChannels>(
            vi, channel, [&](IQuorlen731XXDigitalChannel* d) {
                return DigitalInto(d, call, maxTime, {array, size}, &n, &initial, &increment);
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

ViStatus Qn731XX_FetchWaveformMeasurement(ViSession vi, ViConstString channel,
                                          ViInt32 measFunction, ViReal64* measurement) {
    return Guard(vi, [&]() -> ViStatus {
        if (!measurement) return NullResult(vi, "measurement");
        double value = 0;
        ViStatus status = CallOnItem<IIviScopeMeasurements>(vi, channel, [&](IIviScopeMeasurement* m) {
            return m->FetchWaveformMeasurement(
                static_cast<IviScopeMeasurementFunctionEnum>(measFunction), &value);
        });
        if (status >= 0) *measurement = value;
        return status;
    });
}

ViStatus Qn731XX_ReadWaveformMeasurement(ViSession vi, ViConstString channel, ViInt32 measFunction,
                                         ViInt32 maxTimeMilliseconds, ViReal64* measurement) {
    return Guard(vi, [&]() -> ViStatus {
        if (!measurement) return NullResult(vi, "measurement");
        double value = 0;
        ViStatus status = CallOnItem<IIviScopeMeasurements>(vi, channel, [&](IIviScopeMeasurement* m) {
            return m->ReadWaveformMeasurement(
                static_cast<IviScopeMeasurementFunctionEnum>(measFunction), maxTimeMilliseconds,
                &value);
        });
        if (status >= 0) *measurement = value;
        return status;
    });
}

ViStatus Qn731XX_MeasurementFunctionName(ViSession vi, ViConstString measurement,
                                         ViInt32 measFunction, ViInt32 bufferSize, ViChar name[]) {
    return Guard(vi, [&]() -> ViStatus {
        if (bufferSize < 0) return CopyString(vi, std::string_view{}, bufferSize, name);
        TextResult text{bufferSize, name};
        ViStatus status = CallOnItem<IQuorlen731XXMeasurements>(
            vi, measurement, [&](IQuorlen731XXMeasurement* m) {
                return m->FunctionName(static_cast<Quorlen731XXMeasurementEnum>(measFunction),
                                       &text.text);
            });
        return status < 0 ? status : First(status, text.CopyOut(vi));
    });
}

ViStatus Qn731XX_ConfigureRefLevels(ViSession vi, ViReal64 low, ViReal64 mid, ViReal64 high) {
    return CallMethod(vi, &IIviScopeReferenceLevel::Configure, low, mid, high);
}

ViStatus Qn731XX_MultiWaveformMeasurementResetActivity(ViSession vi) {
    return CallSimple(vi, &IQuorlen731XXMultiWaveformMeasurement::ResetActivity);
}

ViStatus Qn731XX_MultiWaveformMeasurementReadActivity(ViSession vi, ViInt32* edges,
                                                      ViInt32* levels) {
    return Guard(vi, [&]() -> ViStatus {
        if (!edges) return NullResult(vi, "edges");
        if (!levels) return NullResult(vi, "levels");
        LONG e = 0, l = 0;
        ViStatus status = CallOn<IQuorlen731XXMultiWaveformMeasurement>(
            vi, [&](IQuorlen731XXMultiWaveformMeasurement* m) { return m->ReadActivity(&e, &l); });
        if (status >= 0) {
            *edges = e;
            *levels = l;
        }
        return status;
    });
}

ViStatus Qn731XX_MultiWaveformMeasurementConfigureDelay(ViSession vi, ViConstString source2,
                                                        ViInt32 slope1, ViInt32 slope2,
                                                        ViInt32 delayOccurence1,
                                                        ViInt32 delayOccurence2) {
    return CallMethod(vi, &IQuorlen731XXMultiWaveformMeasurement::ConfigureDelay, source2, slope1,
                      slope2, delayOccurence1, delayOccurence2);
}

ViStatus Qn731XX_DigitalChannelFetchDigitalWaveform(ViSession vi, ViConstString digitalChannel,
                                                    ViInt32 waveformSize, ViByte waveformArray[],
                                                    ViInt32* actualPoints, ViReal64* initialX,
                                                    ViReal64* xIncrement) {
    return DigitalWaveform(vi, digitalChannel, WaveformCall::kFetch, 0, waveformSize,
                           waveformArray, actualPoints, initialX, xIncrement);
}

ViStatus Qn731XX_DigitalChannelReadDigitalWaveform(ViSession vi, ViConstString digitalChannel,
                                                   ViInt32 waveformSize, ViInt32 maxTimeMilliseconds,
                                                   ViByte waveformArray[], ViInt32* actualPoints,
                                                   ViReal64* initialX, ViReal64* xIncrement) {
    return DigitalWaveform(vi, digitalChannel, WaveformCall::kRead, maxTimeMilliseconds,
                           waveformSize, waveformArray, actualPoints, initialX, xIncrement);
}

}  // extern "C"

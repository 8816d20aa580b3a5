#include "capi/waveform_into.h"

#include <algorithm>
#include <cstring>

#include "platform/com/safearray.h"

namespace qn::capi {

namespace {

// Copies the first points of `record` that fit into `out`; the count copied.
LONG CopyPoints(const com::SafeArray& record, CallerArray out) {
    const ULONG count = record ? record.size() : 0;
    const LONG n = static_cast<LONG>(std::min<ULONG>(count, static_cast<ULONG>(std::max<LONG>(out.size, 0))));
    if (n > 0) std::memcpy(out.data, record.data<double>(), static_cast<std::size_t>(n) * sizeof(double));
    return n;
}

LONG CopyBytes(const com::SafeArray& record, CallerBytes out) {
    const ULONG count = record ? record.size() : 0;
    const LONG n = static_cast<LONG>(std::min<ULONG>(count, static_cast<ULONG>(std::max<LONG>(out.size, 0))));
    if (n > 0) std::memcpy(out.data, record.data<unsigned char>(), static_cast<std::size_t>(n));
    return n;
}

}  // namespace

HRESULT DigitalInto(IQuorlen731XXDigitalChannel* d, WaveformCall call, LONG max_time,
                    CallerBytes out, LONG* actual, double* x0, double* dx) {
    com::SafeArray record;
    const HRESULT hr =
        call == WaveformCall::kRead
            ? d->ReadDigitalWaveform(static_cast<Quorlen731XXTimeOutEnum>(max_time), record.Out(), x0, dx)
            : d->FetchDigitalWaveform(record.Out(), x0, dx);
    if (FAILED(hr)) return hr;
    *actual = CopyBytes(record, out);
    return hr;
}

HRESULT WaveformInto(IIviScopeMeasurement* m, WaveformCall call, LONG max_time, CallerArray out,
                     LONG* actual, double* x0, double* dx) {
    com::SafeArray record;
    const HRESULT hr = call == WaveformCall::kRead ? m->ReadWaveform(max_time, record.Out(), x0, dx)
                                                   : m->FetchWaveform(record.Out(), x0, dx);
    if (FAILED(hr)) return hr;
    *actual = CopyPoints(record, out);
    return hr;
}

HRESULT MinMaxInto(IIviScopeMeasurement* m, WaveformCall call, LONG max_time, CallerArray min,
                   CallerArray max, LONG* actual, double* x0, double* dx) {
    com::SafeArray min_record;
    com::SafeArray max_record;
    const HRESULT hr =
        call == WaveformCall::kRead
            ? m->ReadWaveformMinMax(max_time, min_record.Out(), max_record.Out(), x0, dx)
            : m->FetchWaveformMinMax(min_record.Out(), max_record.Out(), x0, dx);
    if (FAILED(hr)) return hr;
    const LONG n_min = CopyPoints(min_record, min);
    const LONG n_max = CopyPoints(max_record, max);
    *actual = std::min(n_min, n_max);
    return hr;
}

}  // namespace qn::capi

// The caller's arrays go to the waveform members as arrays over the caller's
// memory, so a record is converted straight into them: no copy, and nothing
// allocated per call.
#include "capi/waveform_into.h"

#include <algorithm>

#include "platform/com/safearray.h"

namespace qn::capi {

namespace {

// An array over the caller's memory (room for `size` elements; none for a
// negative size) and, after the call, the count the member put into it.
class Borrowed {
public:
    Borrowed(VARTYPE vt, void* data, LONG size)
        : array_(com::SafeArray::Over(vt, size > 0 ? data : nullptr,
                                      size > 0 ? static_cast<ULONG>(size) : 0)),
          given_(array_.get()) {}
    SAFEARRAY** Out() { return &given_; }
    // Elements written; 0 when there was no array to write into.
    LONG Count() const {
        return given_ == array_.get() && array_ ? static_cast<LONG>(array_.size()) : 0;
    }
    bool Ok() const { return static_cast<bool>(array_); }

private:
    com::SafeArray array_;
    SAFEARRAY* given_;
};

}  // namespace

HRESULT DigitalInto(IQuorlen731XXDigitalChannel* d, WaveformCall call, LONG max_time,
                    CallerBytes out, LONG* actual, double* x0, double* dx) {
    Borrowed record(VT_UI1, out.data, out.size);
    if (!record.Ok()) return E_OUTOFMEMORY;
    const HRESULT hr =
        call == WaveformCall::kRead
            ? d->ReadDigitalWaveform(static_cast<Quorlen731XXTimeOutEnum>(max_time), record.Out(),
                                     x0, dx)
            : d->FetchDigitalWaveform(record.Out(), x0, dx);
    if (FAILED(hr)) return hr;
    *actual = record.Count();
    return hr;
}

HRESULT WaveformInto(IIviScopeMeasurement* m, WaveformCall call, LONG max_time, CallerArray out,
                     LONG* actual, double* x0, double* dx) {
    Borrowed record(VT_R8, out.data, out.size);
    if (!record.Ok()) return E_OUTOFMEMORY;
    const HRESULT hr = call == WaveformCall::kRead
                           ? m->ReadWaveform(max_time, record.Out(), x0, dx)
                           : m->FetchWaveform(record.Out(), x0, dx);
    if (FAILED(hr)) return hr;
    *actual = record.Count();
    return hr;
}

HRESULT MinMaxInto(IIviScopeMeasurement* m, WaveformCall call, LONG max_time, CallerArray min,
                   CallerArray max, LONG* actual, double* x0, double* dx) {
    Borrowed lo(VT_R8, min.data, min.size), hi(VT_R8, max.data, max.size);
    if (!lo.Ok() || !hi.Ok()) return E_OUTOFMEMORY;
    const HRESULT hr = call == WaveformCall::kRead
                           ? m->ReadWaveformMinMax(max_time, lo.Out(), hi.Out(), x0, dx)
                           : m->FetchWaveformMinMax(lo.Out(), hi.Out(), x0, dx);
    if (FAILED(hr)) return hr;
    *actual = std::min(lo.Count(), hi.Count());
    return hr;
}

}  // namespace qn::capi

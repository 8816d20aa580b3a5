// Waveform transfers of a measurement item into the caller's arrays. This is
// the one place that knows how a record reaches a caller's array.
#pragma once

#include "IviScope.h"
#include "Quorlen731XX.h"

namespace qn::capi {

// A caller's array: at most `size` points are written.
struct CallerArray {
    double* data;
    LONG size;
};

enum class WaveformCall { kFetch, kRead };

// Transfers one record (a new acquisition first for kRead, waiting at most
// `max_time` ms) into `out`; *actual is the number of points written, the
// first points of the record when the array is shorter. *x0 and *dx go in
// as the caller's values and come back as the record's.
HRESULT WaveformInto(IIviScopeMeasurement* m, WaveformCall call, LONG max_time, CallerArray out,
                     LONG* actual, double* x0, double* dx);

// The same for a min/max record into two arrays of `size` points each.
HRESULT MinMaxInto(IIviScopeMeasurement* m, WaveformCall call, LONG max_time, CallerArray min,
                   CallerArray max, LONG* actual, double* x0, double* dx);

// A caller's byte array of a digital channel.
struct CallerBytes {
    unsigned char* data;
    LONG size;
};

// The same for a digital channel's record of bytes.
HRESULT DigitalInto(IQuorlen731XXDigitalChannel* d, WaveformCall call, LONG max_time,
                    CallerBytes out, LONG* actual, double* x0, double* dx);

}  // namespace qn::capi

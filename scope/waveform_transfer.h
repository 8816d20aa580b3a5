// Waveform transfer of one measurement object: source selection, data
// format, scaling factors, record type check and the binary block read, and
// the conversion of the raw record into the caller's arrays of doubles.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

#include "core/node.h"
#include "platform/com/safearray.h"
#include "scope/waveform_scaling.h"

namespace qn {

class Quorlen731XXUserMeasurement;

// How the scaling factors are read: the fetch members read the preamble,
// the read members query each factor.
enum class ScalingQuery { kPreamble, kFactors };

// A record as it came from the instrument: its elements lie in the session's
// receive buffer (host order), valid until the next block read or Close.
struct RawWaveform {
    // Signed 16-bit words most significant byte first as they were sent, or
    // bytes of a digital source.
    const void* data = nullptr;
    std::size_t count = 0;  // words or bytes
    bool bytes = false;
    int bit = 0;  // the digital channel's bit within each byte
    WaveformScaling scaling;
};

// The wire name of the measurement's source: "POD%i" for a digital
// measurement (eight channels per pod), "MATH" for the math measurement,
// otherwise "CHAN%i" with the channel number its name carries.
std::string MeasurementSourceName(const Quorlen731XXUserMeasurement& m);

// The name the measurement subsystem gives the same source: "DIG%i" with
// the digital channel's index for a digital measurement, otherwise as
// above.
std::string MeasurementSCPISource(const Quorlen731XXUserMeasurement& m);

// The transfer core: selects the source, sets the data format, reads the
// scaling factors and the record type under `timeout` (restored afterwards,
// on every path), and reads the data. A record whose type differs from the
// expected one (`peak`: a peak-detect record) fails with
// E_IVISCOPE_INVALID_ACQ_TYPE.
HRESULT TransferWaveform(Quorlen731XXUserMeasurement& m, LONG timeout, bool peak,
                         ScalingQuery scaling, RawWaveform* out);

// Sends ":WAV:PRE?" and reads the scaling factors from the preamble; a
// preamble that does not parse is E_IVI_UNEXPECTED_RESPONSE.
HRESULT ReadPreamble(CDriverNode& node, WaveformScaling* s);
// Sends `command` and reads the IEEE 488.2 binary block of its reply
// (elements of BinaryType_I2 or BinaryType_UI1; the declared length bounded
// by the session's block limit) with the instrument-status check and the
// termination character switched off; both are restored on every path.
HRESULT QueryBinaryBlock(CDriverNode& node, std::string_view command, LONG element_type,
                         com::SafeArray* out);

// Sends ":WAV:DATA?" and reads the binary block of `element_type`
// (BinaryType_I2 or BinaryType_UI1) into the session's receive buffer, with
// the instrument-status check and the termination character switched off;
// both are restored on every path.
HRESULT ReadWaveformData(CDriverNode& node, LONG element_type, RawWaveform* out);

// The output array of a record of `n` points, in the order of preference:
// - the caller's array over its own memory (FADF_FIXEDSIZE, as the C API
//   passes it): it receives the first points that fit and its bound becomes
//   their count; one of another type or shape fails with E_IVI_INVALID_VALUE
//   naming `member` and `param`;
// - the caller's array when it is a one-dimensional, unlocked array of `vt`
//   of exactly n elements from index 0: reused as it is, no allocation;
// - otherwise a new array, and the caller's array (unless locked) destroyed,
//   as an array passed by reference is.
// *dst receives the first element, *placed the number of points it has room for.
HRESULT PlaceOutput(CDriverNode& node, const char* member, const char* param, SAFEARRAY** array,
                    VARTYPE vt, std::size_t n, void** dst, std::size_t* placed);
inline HRESULT PlaceOutput(CDriverNode& node, const char* member, const char* param,
                           SAFEARRAY** array, std::size_t n, double** dst, std::size_t* placed) {
    void* p = nullptr;
    HRESULT hr = PlaceOutput(node, member, param, array, VT_R8, n, &p, placed);
    *dst = static_cast<double*>(p);
    return hr;
}

// Converts the whole record into the output array (PlaceOutput); *invalid
// tells whether any point had no data (NaN in the array).
HRESULT ConvertRecord(CDriverNode& node, const char* member, const RawWaveform& raw,
                      SAFEARRAY** out, bool* invalid);

// Splits a peak-detect record of N elements, minimum first in each pair, into
// two arrays of N / 2 doubles (PlaceOutput); an odd last element is not used.
HRESULT SplitMinMax(CDriverNode& node, const char* member, const RawWaveform& raw,
                    SAFEARRAY** min, SAFEARRAY** max, bool* invalid);

// The warning a transfer returns when points without data were delivered:
// S_IVISCOPE_INVALID_WFM_ELEMENT, the invalid-element text as error information.
HRESULT ReportInvalidElements(CDriverNode& node);

}  // namespace qn

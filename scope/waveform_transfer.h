// Waveform transfer of one measurement object: source selection, data
// format, scaling factors, record type check and the binary block read, and
// the conversion of the raw record into the caller's arrays of doubles.
#pragma once

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

// A record as it came from the instrument.
struct RawWaveform {
    com::SafeArray data;  // VT_I2 words, or VT_UI1 bytes of a digital source
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
// (BinaryType_I2 or BinaryType_UI1) with the instrument-status check and the
// termination character switched off; both are restored on every path.
HRESULT ReadWaveformData(CDriverNode& node, LONG element_type, com::SafeArray* out);

// Converts the whole record into a new array of doubles; *invalid tells
// whether any point had no data (NaN in the array).
HRESULT ConvertRecord(const RawWaveform& raw, SAFEARRAY** out, bool* invalid);

// Splits a peak-detect record of N elements, minimum first in each pair, into
// two new arrays of N / 2 doubles; an odd last element is not used.
HRESULT SplitMinMax(const RawWaveform& raw, SAFEARRAY** min, SAFEARRAY** max, bool* invalid);

// The warning a transfer returns when points without data were delivered:
// S_IVISCOPE_INVALID_WFM_ELEMENT, the invalid-element text as error information.
HRESULT ReportInvalidElements(CDriverNode& node);

}  // namespace qn

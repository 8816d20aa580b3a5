// The waveform transfer core shared by the fetch and read members of the
// measurement objects.
#include "scope/waveform_transfer.h"

#include <cctype>
#include <cstring>
#include <utility>
#include <vector>

#include "Quorlen731XXErrors.h"
#include "core/children.h"
#include "io/io_manager.h"
#include "platform/com/errorinfo.h"
#include "platform/visa/visa.h"
#include "scope/timeout_scope.h"
#include "scope/waveform_source.h"

namespace qn {

namespace {

constexpr LONG kDigitalChannelsPerPod = 8;

// The number at the end of a measurement name ("UserChannel2" -> 2); 0 when
// the name ends without one.
long TrailingNumber(std::string_view name) {
    std::size_t start = name.size();
    while (start > 0 && std::isdigit(static_cast<unsigned char>(name[start - 1]))) --start;
    long n = 0;
    for (std::size_t i = start; i < name.size() && n < 1000000; ++i) n = n * 10 + (name[i] - '0');
    return n;
}

bool IsByteSource(std::string_view source) {
    return source.find("DIG") != std::string_view::npos ||
           source.find("POD") != std::string_view::npos;
}

// The instrument-status check after each operation, off for a binary read
// (its "*ESR?" would be sent in the middle of the block's message) and put
// back on every path.
class StatusPollingOff {
public:
    explicit StatusPollingOff(SessionCore& core)
        : flag_(core.session.flags.query_instrument_status), saved_(flag_) {
        flag_ = false;
    }
    ~StatusPollingOff() { flag_ = saved_; }

private:
    bool& flag_;
    bool saved_;
};

// The termination character, disabled so that a data byte equal to it does
// not end the read, and enabled again on every path.
class TermCharOff {
public:
    explicit TermCharOff(CDriverNode& node) : node_(node) {}
    HRESULT Disable() {
        CDriverIOManager io(node_);
        bool on = false;
        HRESULT hr = io.GetTerminationCharacterEnabled(&on);
        if (FAILED(hr) || !on) return hr;
        hr = io.SetTerminationCharacterEnabled(false);
        restore_ = SUCCEEDED(hr);
        return hr;
    }
    HRESULT Restore() {
        if (!std::exchange(restore_, false)) return S_OK;
        return CDriverIOManager(node_).SetTerminationCharacterEnabled(true);
    }
    ~TermCharOff() {
        KeepErrorInfo keep;
        Restore();
    }

private:
    CDriverNode& node_;
    bool restore_ = false;
};

HRESULT ReadFactors(CDriverNode& node, WaveformScaling* s) {
    CDriverIOManager io(node);
    HRESULT hr = io.InstrQuery(":WAV:YINC?", &s->y_increment);
    if (SUCCEEDED(hr)) hr = io.InstrQuery(":WAV:YOR?", &s->y_origin);
    if (SUCCEEDED(hr)) hr = io.InstrQuery(":WAV:YREF?", &s->y_reference);
    if (SUCCEEDED(hr)) hr = io.InstrQuery(":WAV:XINC?", &s->x_increment);
    if (SUCCEEDED(hr)) hr = io.InstrQuery(":WAV:XOR?", &s->x_origin);
    return hr;
}

HRESULT CheckRecordType(CDriverNode& node, bool peak) {
    std::string type;
    HRESULT hr = Io(node).InstrQuery(":WAV:TYPE?", &type, 127);
    if (FAILED(hr)) return hr;
    if ((type == "PEAK") != peak) return node.Errors().Error(Msg::E_IVISCOPE_INVALID_ACQ_TYPE);
    return S_OK;
}

com::SafeArray NewVector(std::size_t n) {
    com::SafeArray a = com::SafeArray::Vector(VT_R8, static_cast<ULONG>(n));
    if (!a) throw std::bad_alloc();
    return a;
}

}  // namespace

std::string MeasurementSourceName(const Quorlen731XXUserMeasurement& m) {
    const RepCapLists& r = m.Core().repcaps;
    const long index = m.Position();
    if (r.digital_measurements.Contains(index))
        return "POD" + std::to_string((index - r.digital_measurements.first) /
                                          kDigitalChannelsPerPod + 1);
    if (r.math_measurements.Contains(index)) return "MATH";
    const long channel = TrailingNumber(m.Name());
    return "CHAN" + std::to_string(channel > 0 ? channel : index);
}

HRESULT ReadPreamble(CDriverNode& node, WaveformScaling* s) {
    std::string reply;
    HRESULT hr = Io(node).InstrQuery(":WAV:PRE?", &reply, 255);
    if (FAILED(hr)) return hr;
    if (!ParsePreamble(reply, s)) return node.Errors().Error(Msg::E_IVI_UNEXPECTED_RESPONSE);
    return S_OK;
}

std::string MeasurementSCPISource(const Quorlen731XXUserMeasurement& m) {
    const RepCapLists& r = m.Core().repcaps;
    if (r.digital_measurements.Contains(m.Position()))
        return "DIG" + std::to_string(m.Position() - r.digital_measurements.first);
    return MeasurementSourceName(m);
}

HRESULT QueryBinaryBlock(CDriverNode& node, std::string_view command, LONG element_type,
                         com::SafeArray* out) {
    StatusPollingOff polling(node.Core());
    CDriverIOManager io(node);
    HRESULT hr = io.InstrWrite(command);
    if (FAILED(hr)) return hr;
    TermCharOff term(node);
    hr = term.Disable();
    if (FAILED(hr)) return hr;
    com::Variant block;
    hr = io.FormattedReadIEEEBlock(element_type, false, false, &block);
    if (FAILED(hr)) return hr;
    // The rest of the message (its terminator, or bytes beyond the declared
    // length) is discarded with the termination character enabled again: a
    // transport without an end-of-message signal ends the message only there.
    hr = term.Restore();
    if (SUCCEEDED(hr)) hr = io.FormattedFlushRead();
    if (FAILED(hr)) return hr;
    const VARTYPE expected =
        element_type == visa::BinaryType_UI1 ? VARTYPE(VT_ARRAY | VT_UI1) : VARTYPE(VT_ARRAY | VT_I2);
    if (block.vt != expected || !block.parray)
        return node.Errors().Error(Msg::E_IVI_UNEXPECTED_RESPONSE);
    // The array the block was read into becomes the result: no copy.
    *out = com::SafeArray(std::exchange(block.parray, nullptr));
    block.vt = VT_EMPTY;
    return S_OK;
}

HRESULT ReadWaveformData(CDriverNode& node, LONG element_type, com::SafeArray* out) {
    return QueryBinaryBlock(node, ":WAV:DATA?", element_type, out);
}

HRESULT TransferWaveform(Quorlen731XXUserMeasurement& m, LONG timeout, bool peak,
                         ScalingQuery scaling, RawWaveform* out) {
    const std::string source = MeasurementSourceName(m);
    HRESULT hr = SetWaveformSource(m, source);
    if (FAILED(hr)) return hr;
    out->bytes = IsByteSource(source);
    CDriverIOManager io(m);
    hr = io.InstrWrite(out->bytes ? ":WAV:FORM BYTE;UNS 1" : ":WAV:FORM WORD;UNS 0;BYT MSBF");
    if (FAILED(hr)) return hr;
    TimeoutScope restore(m);
    hr = restore.Set(timeout);
    if (SUCCEEDED(hr))
        hr = scaling == ScalingQuery::kPreamble ? ReadPreamble(m, &out->scaling)
                                                : ReadFactors(m, &out->scaling);
    if (SUCCEEDED(hr)) hr = CheckRecordType(m, peak);
    if (SUCCEEDED(hr))
        hr = ReadWaveformData(m, out->bytes ? visa::BinaryType_UI1 : visa::BinaryType_I2,
                              &out->data);
    if (FAILED(hr)) return hr;
    const RepCapLists& r = m.Core().repcaps;
    if (out->bytes && r.digital_measurements.Contains(m.Position()))
        out->bit = static_cast<int>((m.Position() - r.digital_measurements.first) %
                                    kDigitalChannelsPerPod);
    return S_OK;
}

HRESULT ConvertRecord(const RawWaveform& raw, SAFEARRAY** out, bool* invalid) {
    const std::size_t n = raw.data.size();
    com::SafeArray result = NewVector(n);
    *invalid = false;
    if (raw.bytes)
        ExtractBit(raw.data.data<std::uint8_t>(), n, raw.bit, result.data<double>());
    else
        *invalid = ConvertWords(raw.data.data<std::int16_t>(), n, raw.scaling,
                                result.data<double>());
    *out = result.Detach();
    return S_OK;
}

HRESULT SplitMinMax(const RawWaveform& raw, SAFEARRAY** min, SAFEARRAY** max, bool* invalid) {
    const std::size_t pairs = raw.data.size() / 2;
    com::SafeArray lo = NewVector(pairs), hi = NewVector(pairs);
    *invalid = false;
    if (raw.bytes) {
        std::vector<double> bits(2 * pairs);
        ExtractBit(raw.data.data<std::uint8_t>(), bits.size(), raw.bit, bits.data());
        for (std::size_t k = 0; k < pairs; ++k) {
            lo.data<double>()[k] = bits[2 * k];
            hi.data<double>()[k] = bits[2 * k + 1];
        }
    } else {
        *invalid = ConvertWordPairs(raw.data.data<std::int16_t>(), pairs, raw.scaling,
                                    lo.data<double>(), hi.data<double>());
    }
    *min = lo.Detach();
    *max = hi.Detach();
    return S_OK;
}

HRESULT ReportInvalidElements(CDriverNode& node) {
    std::string text;
    FormatMessageText(static_cast<std::uint32_t>(Msg::E_QUORLEN731XX_INVALID_WAVEFORM_ELEMENT), {},
                      &text);
    return node.Errors().Publish(S_IVISCOPE_INVALID_WFM_ELEMENT, text);
}

}  // namespace qn

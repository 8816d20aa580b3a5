// The waveform transfer core shared by the fetch and read members of the
// measurement objects.
#include "scope/waveform_transfer.h"

#include <algorithm>
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

namespace {

// Sends `command` and runs `read` for the binary block of its reply, with
// the instrument-status check and the termination character switched off
// (both restored on every path); the rest of the message is discarded.
template <class Read>
HRESULT QueryBlock(CDriverNode& node, std::string_view command, Read&& read) {
    StatusPollingOff polling(node.Core());
    CDriverIOManager io(node);
    HRESULT hr = io.InstrWrite(command);
    if (FAILED(hr)) return hr;
    TermCharOff term(node);
    hr = term.Disable();
    if (FAILED(hr)) return hr;
    hr = read(io);
    if (FAILED(hr)) return hr;
    // The rest of the message (its terminator, or bytes beyond the declared
    // length) is discarded with the termination character enabled again: a
    // transport without an end-of-message signal ends the message only there.
    hr = term.Restore();
    if (SUCCEEDED(hr)) hr = io.FormattedFlushRead();
    return hr;
}

}  // namespace

HRESULT QueryBinaryBlock(CDriverNode& node, std::string_view command, LONG element_type,
                         com::SafeArray* out) {
    com::Variant block;
    HRESULT hr = QueryBlock(node, command, [&](CDriverIOManager& io) {
        return io.FormattedReadIEEEBlock(element_type, false, false, &block);
    });
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

HRESULT ReadWaveformData(CDriverNode& node, LONG element_type, RawWaveform* out) {
    const void* view = nullptr;
    LONG count = 0;
    HRESULT hr = QueryBlock(node, ":WAV:DATA?", [&](CDriverIOManager& io) {
        return io.FormattedReadIEEEBlockToSession(element_type, &view, &count, false, false);
    });
    if (FAILED(hr)) return hr;
    out->data = view;
    out->count = std::size_t(count);
    return S_OK;
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
        hr = ReadWaveformData(m, visa::BinaryType_UI1, out);
    if (FAILED(hr)) return hr;
    if (!out->bytes) {
        // Words stay in the order they came in; the conversion reads them so.
        if (out->count % 2)
            return m.Errors().Error(Msg::E_QUORLEN731XX_IO_GENERAL,
                                    {"block of " + std::to_string(out->count) +
                                     " bytes is not a whole number of 16-bit words"});
        out->count /= 2;
    }
    const RepCapLists& r = m.Core().repcaps;
    if (out->bytes && r.digital_measurements.Contains(m.Position()))
        out->bit = static_cast<int>((m.Position() - r.digital_measurements.first) %
                                    kDigitalChannelsPerPod);
    return S_OK;
}

HRESULT PlaceOutput(CDriverNode& node, const char* member, const char* param, SAFEARRAY** array,
                    VARTYPE vt, std::size_t n, void** dst, std::size_t* placed) {
    SAFEARRAY* given = *array;
    const bool plain_vector = given && given->cDims == 1 && given->vt == vt &&
                              given->rgsabound[0].lLbound == 0 && given->cLocks == 0;
    *placed = n;
    if (given && (given->fFeatures & FADF_FIXEDSIZE)) {
        if (!plain_vector)
            return node.Errors().InvalidValue(member, param,
                                              std::int32_t(com::SafeArrayCount(given)));
        *placed = std::min<std::size_t>(n, given->rgsabound[0].cElements);
        given->rgsabound[0].cElements = ULONG(*placed);
        *dst = given->pvData;
        return S_OK;
    }
    if (plain_vector && given->rgsabound[0].cElements == n) {
        *dst = given->pvData;
        return S_OK;
    }
    com::SafeArray fresh = com::SafeArray::Vector(vt, static_cast<ULONG>(n));
    if (!fresh) throw std::bad_alloc();
    if (given && given->cLocks == 0) SafeArrayDestroy(given);
    *dst = fresh.get()->pvData;
    *array = fresh.Detach();
    return S_OK;
}

HRESULT ConvertRecord(CDriverNode& node, const char* member, const RawWaveform& raw,
                      SAFEARRAY** out, bool* invalid) {
    double* dst = nullptr;
    std::size_t n = 0;
    HRESULT hr = PlaceOutput(node, member, "WaveformArray", out, raw.count, &dst, &n);
    if (FAILED(hr)) return hr;
    *invalid = false;
    if (raw.bytes)
        ExtractBit(static_cast<const std::uint8_t*>(raw.data), n, raw.bit, dst);
    else
        *invalid = ConvertWordsMsbFirst(static_cast<const std::uint8_t*>(raw.data), n, raw.scaling,
                                        dst);
    return S_OK;
}

HRESULT SplitMinMax(CDriverNode& node, const char* member, const RawWaveform& raw,
                    SAFEARRAY** min, SAFEARRAY** max, bool* invalid) {
    double* lo = nullptr;
    double* hi = nullptr;
    std::size_t n_lo = 0, n_hi = 0;
    HRESULT hr = PlaceOutput(node, member, "MinWaveform", min, raw.count / 2, &lo, &n_lo);
    if (SUCCEEDED(hr)) hr = PlaceOutput(node, member, "MaxWaveform", max, raw.count / 2, &hi, &n_hi);
    if (FAILED(hr)) return hr;
    // Arrays of the caller's memory with different room both get the pairs
    // that fit into each.
    const std::size_t pairs = std::min(n_lo, n_hi);
    if (n_lo != pairs) (*min)->rgsabound[0].cElements = ULONG(pairs);
    if (n_hi != pairs) (*max)->rgsabound[0].cElements = ULONG(pairs);
    *invalid = false;
    if (raw.bytes) {
        const auto* bytes = static_cast<const std::uint8_t*>(raw.data);
        const unsigned shift = static_cast<unsigned>(raw.bit) & 7u;
        for (std::size_t k = 0; k < pairs; ++k) {
            lo[k] = static_cast<double>((bytes[2 * k] >> shift) & 1u);
            hi[k] = static_cast<double>((bytes[2 * k + 1] >> shift) & 1u);
        }
    } else {
        *invalid = ConvertWordPairsMsbFirst(static_cast<const std::uint8_t*>(raw.data), pairs,
                                            raw.scaling, lo, hi);
    }
    return S_OK;
}

HRESULT ReportInvalidElements(CDriverNode& node) {
    std::string text;
    FormatMessageText(static_cast<std::uint32_t>(Msg::E_QUORLEN731XX_INVALID_WAVEFORM_ELEMENT), {},
                      &text);
    return node.Errors().Publish(S_IVISCOPE_INVALID_WFM_ELEMENT, text);
}

}  // namespace qn

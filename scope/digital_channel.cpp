// Digital channels (IQuorlen731XXDigitalChannel): display, label and logic
// threshold per channel, and the transfer of the raw bytes of the pod the
// channel belongs to.
#include <cstring>

#include "Quorlen731XXErrors.h"
#include "core/children.h"
#include "core/member_impl.h"
#include "platform/visa/visa.h"
#include "scope/timeout_scope.h"
#include "scope/waveform_source.h"
#include "scope/waveform_transfer.h"

namespace qn {

#define QN_CLASS Quorlen731XXUserDigitalChannel
#include "core/member_definitions_begin.h"
#include "members/IQuorlen731XXDigitalChannel.def"
#include "QnEndMembers.h"
#undef QN_CLASS

namespace {

constexpr long kChannelsPerPod = 8;
constexpr ULONG kSimulatedBytes = 100;

HRESULT ZeroBytes(CDriverNode& node, const char* member, SAFEARRAY** array) {
    void* dst = nullptr;
    std::size_t n = 0;
    HRESULT hr =
        PlaceOutput(node, member, "WaveformArray", array, VT_UI1, kSimulatedBytes, &dst, &n);
    if (SUCCEEDED(hr) && n) std::memset(dst, 0, n);
    return hr;
}

// Selects the channel's pod, reads its preamble and bytes under `timeout`
// (restored on every path) and hands the bytes over unchanged.
HRESULT TransferPod(Quorlen731XXUserDigitalChannel& d, const char* member, LONG timeout,
                    SAFEARRAY** bytes,
                    double* initial_x, double* x_increment) {
    const std::string pod = "POD" + std::to_string(d.CommandNumber() / kChannelsPerPod + 1);
    HRESULT hr = SetWaveformSource(d, pod);
    if (SUCCEEDED(hr)) hr = Io(d).InstrWrite(":WAV:FORM BYTE;UNS 1");
    if (FAILED(hr)) return hr;
    WaveformScaling scaling;
    RawWaveform data;
    {
        TimeoutScope restore(d);
        hr = restore.Set(timeout);
        if (SUCCEEDED(hr)) hr = ReadPreamble(d, &scaling);
        if (SUCCEEDED(hr)) hr = ReadWaveformData(d, visa::BinaryType_UI1, &data);
        if (FAILED(hr)) return hr;
    }
    void* dst = nullptr;
    std::size_t n = 0;
    hr = PlaceOutput(d, member, "WaveformArray", bytes, VT_UI1, data.count, &dst, &n);
    if (FAILED(hr)) return hr;
    if (n) std::memcpy(dst, data.data, n);
    *initial_x = scaling.x_origin;
    *x_increment = scaling.x_increment;
    return S_OK;
}

}  // namespace

HRESULT Quorlen731XXUserDigitalChannel::IQuorlen731XXDigitalChannel_FetchDigitalWaveform_Body(
    SAFEARRAY** WaveformArray, double* InitialX, double* XIncrement) {
    if (Core().Simulating()) return ZeroBytes(*this, "FetchDigitalWaveform", WaveformArray);
    LONG timeout = 0;
    HRESULT hr = Io(*this).GetIOTimeout(&timeout);
    if (FAILED(hr)) return hr;
    return TransferPod(*this, "FetchDigitalWaveform", timeout, WaveformArray, InitialX, XIncrement);
}

HRESULT Quorlen731XXUserDigitalChannel::IQuorlen731XXDigitalChannel_ReadDigitalWaveform_Body(
    Quorlen731XXTimeOutEnum MaxTime, SAFEARRAY** WaveformArray, double* InitialX,
    double* XIncrement) {
    if (Core().Simulating()) return ZeroBytes(*this, "ReadDigitalWaveform", WaveformArray);
    HRESULT hr = Io(*this).InstrWrite(":DIG");
    if (FAILED(hr)) return hr;
    return TransferPod(*this, "ReadDigitalWaveform", MaxTime, WaveformArray, InitialX, XIncrement);
}

}  // namespace qn

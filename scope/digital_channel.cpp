// Digital channels (IQuorlen731XXDigitalChannel): display, label and logic
// threshold per channel, and the transfer of the raw bytes of the pod the
// channel belongs to.
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

SAFEARRAY* ZeroBytes() {
    com::SafeArray a = com::SafeArray::Vector(VT_UI1, kSimulatedBytes);
    if (!a) throw std::bad_alloc();
    for (ULONG i = 0; i < kSimulatedBytes; ++i) a.data<std::uint8_t>()[i] = 0;
    return a.Detach();
}

// Selects the channel's pod, reads its preamble and bytes under `timeout`
// (restored on every path) and hands the bytes over unchanged.
HRESULT TransferPod(Quorlen731XXUserDigitalChannel& d, LONG timeout, SAFEARRAY** bytes,
                    double* initial_x, double* x_increment) {
    const std::string pod = "POD" + std::to_string(d.CommandNumber() / kChannelsPerPod + 1);
    HRESULT hr = SetWaveformSource(d, pod);
    if (SUCCEEDED(hr)) hr = Io(d).InstrWrite(":WAV:FORM BYTE;UNS 1");
    if (FAILED(hr)) return hr;
    WaveformScaling scaling;
    com::SafeArray data;
    {
        TimeoutScope restore(d);
        hr = restore.Set(timeout);
        if (SUCCEEDED(hr)) hr = ReadPreamble(d, &scaling);
        if (SUCCEEDED(hr)) hr = ReadWaveformData(d, visa::BinaryType_UI1, &data);
        if (FAILED(hr)) return hr;
    }
    *initial_x = scaling.x_origin;
    *x_increment = scaling.x_increment;
    *bytes = data.Detach();
    return S_OK;
}

}  // namespace

HRESULT Quorlen731XXUserDigitalChannel::IQuorlen731XXDigitalChannel_FetchDigitalWaveform_Body(
    SAFEARRAY** WaveformArray, double* InitialX, double* XIncrement) {
    if (Core().Simulating()) {
        *WaveformArray = ZeroBytes();
        return S_OK;
    }
    LONG timeout = 0;
    HRESULT hr = Io(*this).GetIOTimeout(&timeout);
    if (FAILED(hr)) return hr;
    return TransferPod(*this, timeout, WaveformArray, InitialX, XIncrement);
}

HRESULT Quorlen731XXUserDigitalChannel::IQuorlen731XXDigitalChannel_ReadDigitalWaveform_Body(
    Quorlen731XXTimeOutEnum MaxTime, SAFEARRAY** WaveformArray, double* InitialX,
    double* XIncrement) {
    if (Core().Simulating()) {
        *WaveformArray = ZeroBytes();
        return S_OK;
    }
    HRESULT hr = Io(*this).InstrWrite(":DIG");
    if (FAILED(hr)) return hr;
    return TransferPod(*this, MaxTime, WaveformArray, InitialX, XIncrement);
}

}  // namespace qn

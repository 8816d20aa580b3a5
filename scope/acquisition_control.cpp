// Acquisition control on the measurements collections of the root object:
// Initiate, Abort, Status, AutoSetup and IsWaveformElementInvalid, on the
// instrument-specific interface and, calling it, the class-compliant one.
#include <cmath>

#include "Quorlen731XXErrors.h"
#include "core/member_impl.h"
#include "core/root.h"

namespace qn {

namespace {

constexpr LONG kOperationComplete = 1;     // standard event bit 0
constexpr LONG kRunBit = 8;                // operation condition bit 3
constexpr SHORT kEventStatusSummary = 0x20;  // status byte bit 5

IQuorlen731XXStatus* StatusOf(Quorlen731XX* root) { return root; }

HRESULT ReadRegister(Quorlen731XX* root, Quorlen731XXStatusRegisterEnum reg,
                     Quorlen731XXStatusSubRegisterEnum sub, LONG* value) {
    return StatusOf(root)->get_Register(reg, sub, value);
}

HRESULT WriteEventEnable(Quorlen731XX* root, LONG value) {
    return StatusOf(root)->put_Register(Quorlen731XXStatusRegisterStandardEvent,
                                        Quorlen731XXStatusSubRegisterEnable, value);
}

// The status byte by the session's serial poll; a failure is reported as an
// I/O failure of the calling object.
HRESULT SerialPoll(Quorlen731XX& root, SHORT* stb) {
    HRESULT hr = Io(root).ReadSTB(stb);
    return FAILED(hr) ? root.Core().io->ReportIOError(root.Errors(), hr) : hr;
}

}  // namespace

HRESULT Quorlen731XX::IQuorlen731XXMeasurements_Initiate_Body() {
    if (Core().Simulating()) return S_OK;
    static_cast<IQuorlen731XXMeasurements*>(this)->Abort();
    if (!Core().features.digitize_command) {
        Quorlen731XXAcquisitionTypeEnum type = Quorlen731XXAcquisitionTypeNormal;
        HRESULT hr = static_cast<IQuorlen731XXAcquisition*>(this)->get_Type(&type);
        if (FAILED(hr)) return hr;
        if (type != Quorlen731XXAcquisitionTypeAverage) return Io(*this).InstrWrite(":SING");
    }
    AcquisitionControl& acq = Core().acquisition_control;
    LONG saved = 0;
    HRESULT hr = ReadRegister(this, Quorlen731XXStatusRegisterStandardEvent,
                              Quorlen731XXStatusSubRegisterEnable, &saved);
    if (FAILED(hr)) return hr;
    acq.saved_event_status_enable = saved;
    hr = WriteEventEnable(this, kOperationComplete);
    if (FAILED(hr)) return hr;
    acq.pending = true;
    LONG events = 0;  // reading the event register clears the old events
    hr = ReadRegister(this, Quorlen731XXStatusRegisterStandardEvent,
                      Quorlen731XXStatusSubRegisterEvent, &events);
    if (FAILED(hr)) return hr;
    // No status check after this command: its "*ESR?" would read, and so
    // clear, the operation-complete event that Status waits for.
    return Io(*this).InstrWriteNoPoll(":DIG;*OPC");
}

HRESULT Quorlen731XX::IQuorlen731XXMeasurements_Abort_Body() {
    if (Core().Simulating()) return S_OK;
    AcquisitionControl& acq = Core().acquisition_control;
    if (acq.pending) {
        SHORT stb = 0;
        for (int i = 0; i < 2; ++i)
            if (HRESULT hr = SerialPoll(*this, &stb); FAILED(hr)) return hr;
    }
    if (HRESULT hr = Io(*this).DeviceClear(); FAILED(hr))
        return Core().io->ReportIOError(Errors(), hr);
    if (acq.pending) {
        acq.pending = false;
        if (HRESULT hr = WriteEventEnable(this, acq.saved_event_status_enable); FAILED(hr))
            return hr;
    }
    return Io(*this).InstrWrite(":STOP");
}

HRESULT Quorlen731XX::IQuorlen731XXMeasurements_Status_Body(Quorlen731XXAcquisitionStatusEnum* val) {
    if (Core().Simulating()) {
        *val = Quorlen731XXAcqInProgress;
        return S_OK;
    }
    *val = Quorlen731XXAcqStatusUnknown;
    AcquisitionControl& acq = Core().acquisition_control;
    if (!acq.pending) {
        LONG condition = 0;
        HRESULT hr = ReadRegister(this, Quorlen731XXStatusRegisterOperation,
                                  Quorlen731XXStatusSubRegisterCondition, &condition);
        if (FAILED(hr)) return hr;
        *val = (condition & kRunBit) ? Quorlen731XXAcqInProgress : Quorlen731XXAcqComplete;
        return S_OK;
    }
    SHORT stb = 0;
    HRESULT hr = SerialPoll(*this, &stb);
    if (FAILED(hr)) return hr;
    if ((stb & kEventStatusSummary) == 0) {
        *val = Quorlen731XXAcqInProgress;
        return S_OK;
    }
    *val = Quorlen731XXAcqComplete;
    acq.pending = false;
    return WriteEventEnable(this, acq.saved_event_status_enable);
}

HRESULT Quorlen731XX::IQuorlen731XXMeasurements_AutoSetup_Body() {
    if (Core().Simulating()) return S_OK;
    return Io(*this).InstrPrintCommand();
}

HRESULT Quorlen731XX::IQuorlen731XXMeasurements_IsWaveformElementInvalid_Body(double Element,
                                                                              VARIANT_BOOL* val) {
    *val = !Core().Simulating() && std::isnan(Element) ? VARIANT_TRUE : VARIANT_FALSE;
    return S_OK;
}

// The class-compliant collection runs the instrument-specific members.
HRESULT Quorlen731XX::IIviScopeMeasurements_Initiate_Body() {
    return static_cast<IQuorlen731XXMeasurements*>(this)->Initiate();
}
HRESULT Quorlen731XX::IIviScopeMeasurements_Abort_Body() {
    return static_cast<IQuorlen731XXMeasurements*>(this)->Abort();
}
HRESULT Quorlen731XX::IIviScopeMeasurements_Status_Body(IviScopeAcquisitionStatusEnum* val) {
    Quorlen731XXAcquisitionStatusEnum status = Quorlen731XXAcqStatusUnknown;
    HRESULT hr = static_cast<IQuorlen731XXMeasurements*>(this)->Status(&status);
    *val = static_cast<IviScopeAcquisitionStatusEnum>(status);
    return hr;
}
HRESULT Quorlen731XX::IIviScopeMeasurements_AutoSetup_Body() {
    return static_cast<IQuorlen731XXMeasurements*>(this)->AutoSetup();
}
HRESULT Quorlen731XX::IIviScopeMeasurements_IsWaveformElementInvalid_Body(double Element,
                                                                          VARIANT_BOOL* val) {
    return static_cast<IQuorlen731XXMeasurements*>(this)->IsWaveformElementInvalid(Element, val);
}

}  // namespace qn

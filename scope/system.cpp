// IQuorlen731XXSystem on the root object: the instrument's clock and serial
// number, the session's I/O timeout and tracing switch, the formatted-I/O
// object for direct I/O, the operation-complete wait and the front panel.
// The setup and screen-image members are in system_state.cpp.
#include <algorithm>

#include "Quorlen731XXErrors.h"
#include "core/member_impl.h"
#include "core/root.h"

namespace qn {

#define QN_CLASS Quorlen731XX
#include "core/member_definitions_begin.h"
#include "members/IQuorlen731XXSystem.def"
#include "QnEndMembers.h"
#undef QN_CLASS

namespace {

// The shortest I/O timeout and operation-complete wait the driver uses (ms).
constexpr LONG kMinTimeoutMs = 100;

// Instrument-status polling off for one operation, then set back to the
// value the caller read beforehand, on every path.
class PollingOverride {
public:
    PollingOverride(SessionCore& core, bool restore_to)
        : flag_(core.session.flags.query_instrument_status), restore_to_(restore_to) {
        flag_ = false;
    }
    ~PollingOverride() { flag_ = restore_to_; }
    PollingOverride(const PollingOverride&) = delete;
    PollingOverride& operator=(const PollingOverride&) = delete;

private:
    bool& flag_;
    bool restore_to_;
};

}  // namespace

HRESULT Quorlen731XX::IQuorlen731XXSystem_get_TimeoutMilliseconds_Body(LONG* val) {
    return Io(*this).GetIOTimeout(val);
}

HRESULT Quorlen731XX::IQuorlen731XXSystem_put_TimeoutMilliseconds_Body(LONG val) {
    return Io(*this).SetIOTimeout(std::max(val, kMinTimeoutMs));
}

HRESULT Quorlen731XX::IQuorlen731XXSystem_get_TraceEnabled_Body(VARIANT_BOOL* val) {
    *val = Core().tracer.GetEnabled() ? VARIANT_TRUE : VARIANT_FALSE;
    return S_OK;
}

// Switching tracing off saves what was recorded so far; switching it on
// starts recording into the session's trace file at once.
HRESULT Quorlen731XX::IQuorlen731XXSystem_put_TraceEnabled_Body(VARIANT_BOOL val) {
    CTraceOwner& tracer = Core().tracer;
    const bool on = val != VARIANT_FALSE;
    if (on == tracer.GetEnabled()) return S_OK;
    if (!on) {
        if (tracer.IsRecording()) tracer.Save();
        return tracer.SetEnabled(false);
    }
    HRESULT hr = tracer.SetEnabled(true);
    if (FAILED(hr)) return hr;
    hr = tracer.StartSessionTracing();
    if (FAILED(hr)) {
        // A file that cannot be written leaves tracing off, as it reads.
        tracer.SetEnabled(false);
        return hr;
    }
    return S_OK;
}

HRESULT Quorlen731XX::IQuorlen731XXSystem_get_AsyncEventsEnabled_Body(VARIANT_BOOL*) {
    return Errors().Error(Msg::E_IVI_PROPERTY_NOT_SUPPORTED, {"get_AsyncEventsEnabled"});
}

HRESULT Quorlen731XX::IQuorlen731XXSystem_put_AsyncEventsEnabled_Body(VARIANT_BOOL) {
    return Errors().Error(Msg::E_IVI_PROPERTY_NOT_SUPPORTED, {"put_AsyncEventsEnabled"});
}

HRESULT Quorlen731XX::IQuorlen731XXSystem_get_IO_Body(IFormattedIO488** pVal) {
    if (Core().Simulating())
        return Errors().Error(Msg::E_QUORLEN731XX_IO_GENERAL,
                              {"I/O not available while Simulating"});
    HRESULT hr = Core().io->ioprvGetIFormattedIO488Pointer(pVal);
    if (FAILED(hr)) return hr;
    if (!*pVal)
        return Errors().Error(Msg::E_QUORLEN731XX_IO_GENERAL,
                              {"the session has no formatted I/O object"});
    return S_OK;
}

// "*OPC?" with its own wait time and without the status check (whose
// "*ESR?" would queue behind the pending operation); the polling setting
// comes back whatever happened. No reply within the wait time is
// E_QUORLEN731XX_MAX_TIME_EXCEEDED.
HRESULT Quorlen731XX::IQuorlen731XXSystem_WaitForOperationComplete_Body(LONG MaxTimeMilliseconds) {
    if (Core().Simulating()) return S_OK;
    const LONG wait = std::max(MaxTimeMilliseconds, kMinTimeoutMs);
    VARIANT_BOOL polling = VARIANT_FALSE;
    if (FAILED(static_cast<IIviDriverOperation*>(this)->get_QueryInstrumentStatus(&polling)))
        return Errors().Error(Msg::E_IVI_UNEXPECTED_RESPONSE);
    PollingOverride off(Core(), polling != VARIANT_FALSE);
    LONG value = -1;
    HRESULT hr = Io(*this).InstrQuery("*OPC?", &value, wait);
    if (value == -1)
        return Errors().Error(Msg::E_QUORLEN731XX_MAX_TIME_EXCEEDED, {"WaitForOperationComplete"});
    return hr;
}

// The methods with a fixed command send it unless the session simulates.
HRESULT Quorlen731XX::SendRowCommand() {
    if (Core().Simulating()) return S_OK;
    return Io(*this).InstrPrintCommand();
}

HRESULT Quorlen731XX::IQuorlen731XXSystem_SaveState_Body(BSTR) { return SendRowCommand(); }
HRESULT Quorlen731XX::IQuorlen731XXSystem_RecallState_Body(BSTR) { return SendRowCommand(); }
HRESULT Quorlen731XX::IQuorlen731XXSystem_EnableLocalControls_Body() { return SendRowCommand(); }
HRESULT Quorlen731XX::IQuorlen731XXSystem_DisableLocalControls_Body() { return SendRowCommand(); }

}  // namespace qn

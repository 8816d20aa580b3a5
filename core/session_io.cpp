// The session's instrument steps: opening and closing the I/O session,
// identifying the instrument, and the queries of the inherent operations.
// Until a transport is wired in, a session can only simulate.
#include "core/inherent.h"
#include "core/root.h"

namespace qn {

// Applies the trace options of DriverSetup and opens the trace file.
// Tracing never fails Initialize: a file that cannot be written leaves the
// session untraced.
HRESULT Quorlen731XX::StartTracing() {
    const TraceSettings& t = Core().session.trace;
    CTraceOwner& tracer = Core().tracer;
    tracer.SetTraceName(t.name);
    tracer.SetTraceTransform(t.transform);
    tracer.SetSizeLimit(t.size_max);
    tracer.SetTraceArrays(t.arrays);
    tracer.SetArrayLimit(t.array_size_max);
    tracer.SetSaveInterval(t.save_interval);
    if (t.enabled_given || tracer.GetEnabled()) {
        if (FAILED(tracer.SetEnabled(t.enabled))) return S_OK;
    }
    if (tracer.GetEnabled() && !tracer.IsRecording()) tracer.StartSessionTracing();
    return S_OK;
}

void Quorlen731XX::SaveTrace() { Core().tracer.SaveOnClose(); }

HRESULT Quorlen731XX::OpenIo() { return Errors().Error(Msg::E_IVI_RESOURCE_UNKNOWN); }
void Quorlen731XX::CloseIo() {}
HRESULT Quorlen731XX::StartSession() { return S_OK; }
void Quorlen731XX::EndSession() {}
void Quorlen731XX::ResetChildren() {}
HRESULT Quorlen731XX::QueryIdentity() { return S_OK; }

HRESULT Quorlen731XX::QueryInteger(std::string_view, long, LONG*) {
    return Errors().Error(Msg::E_QUORLEN731XX_IO_GENERAL, {"no I/O session is open"});
}
HRESULT Quorlen731XX::QueryErrorText(std::string*) {
    return Errors().Error(Msg::E_QUORLEN731XX_IO_GENERAL, {"no I/O session is open"});
}
HRESULT Quorlen731XX::ClearStatus() {
    return Errors().Error(Msg::E_QUORLEN731XX_IO_GENERAL, {"no I/O session is open"});
}

}  // namespace qn

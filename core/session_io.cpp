// The session's instrument steps: opening and closing the I/O session,
// identifying the instrument, and the queries of the inherent operations.
#include "core/inherent.h"
#include "core/options.h"
#include "core/root.h"
#include "io/io_manager.h"

namespace qn {

// Applies the trace options of DriverSetup and opens the trace file.
// Tracing never fails Initialize: a file that cannot be written leaves the
// session untraced, with tracing switched off so that TraceEnabled tells.
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
    if (tracer.GetEnabled() && !tracer.IsRecording() && FAILED(tracer.StartSessionTracing()))
        tracer.SetEnabled(false);
    return S_OK;
}

void Quorlen731XX::SaveTrace() { Core().tracer.SaveOnClose(); }

HRESULT Quorlen731XX::OpenIo() {
    SessionCore& core = Core();
    HRESULT hr = core.io->Open(Errors(), &core.session.flags, core.session.io_resource_descriptor);
    // A failed open keeps nothing: the session stays closed.
    if (FAILED(hr)) core.io->Close();
    return hr;
}

void Quorlen731XX::CloseIo() { Core().io->Close(); }

// "*IDN?": manufacturer, model, serial number and firmware revision, each
// trimmed; missing fields stay empty. The model replaces any earlier one.
HRESULT Quorlen731XX::QueryIdentity() {
    std::string reply;
    HRESULT hr = Io(*this).InstrQuery(kIdentityQuery, &reply, 1024);
    if (FAILED(hr)) return hr;
    InstrumentIdentity& id = Core().session.identity;
    id = InstrumentIdentity{};
    id.reply = reply;
    std::string* fields[] = {&id.manufacturer, &id.model, &id.serial_number,
                             &id.firmware_revision};
    std::size_t start = 0;
    for (std::string* f : fields) {
        if (start > reply.size()) break;
        std::size_t comma = reply.find(',', start);
        std::size_t end = comma == std::string::npos ? reply.size() : comma;
        *f = std::string(TrimBlanks(std::string_view(reply).substr(start, end - start)));
        start = comma == std::string::npos ? reply.size() + 1 : comma + 1;
    }
    id.known = true;
    Core().session.model = id.model;
    return S_OK;
}

HRESULT Quorlen731XX::QueryInteger(std::string_view command, long timeout_ms, LONG* value) {
    return Io(*this).InstrQuery(command, value, static_cast<LONG>(timeout_ms));
}

HRESULT Quorlen731XX::QueryErrorText(std::string* reply) {
    // The query itself must not run the status check.
    bool& qis = Core().session.flags.query_instrument_status;
    bool saved = qis;
    qis = false;
    HRESULT hr = Io(*this).InstrQuery(kErrorQueryCommand, reply, 1023);
    qis = saved;
    return hr;
}

HRESULT Quorlen731XX::ClearStatus() { return Io(*this).InstrWrite(kClearStatusCommand); }

}  // namespace qn

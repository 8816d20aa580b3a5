#include "tools/session_util.h"

#include <cstdio>

#include "Quorlen731XXErrors.h"
#include "core/error_table.h"

namespace qn::tools {

std::string LastErrorText() {
    com::ErrorRecord rec;
    return com::TakeThreadError(&rec) ? rec.description : std::string();
}

int ReportFailure(const std::string& what, HRESULT hr) {
    std::string text = LastErrorText();
    const char* name = "";
    for (const ErrorEntry& e : ErrorTable())
        if (e.hr == hr) name = e.name;
    std::fprintf(stderr, "%s failed: error 0x%08X%s%s%s\n%s\n", what.c_str(),
                 static_cast<unsigned>(hr), *name ? " (" : "", name, *name ? ")" : "",
                 text.c_str());
    return 1;
}

int PrintInstrumentErrors(Quorlen731XX* driver) {
    // The queue holds a handful of entries; stop at "no error" or a failure.
    int printed = 0;
    for (; printed < 10; ++printed) {
        LONG code = 0;
        com::Bstr message;
        if (FAILED(driver->ErrorQuery(&code, message.Out())) || code == 0) break;
        std::fprintf(stderr, "instrument error %ld: %s\n", static_cast<long>(code),
                     message.utf8().c_str());
    }
    return printed;
}

int ReportFailure(Quorlen731XX* driver, const std::string& what, HRESULT hr) {
    ReportFailure(what, hr);
    if (hr == E_IVI_INSTRUMENT_STATUS) PrintInstrumentErrors(driver);
    return 1;
}

HRESULT OpenSession(const SessionOptions& o, ToolSession* session) {
    session->driver = com::MakeComObject<Quorlen731XX>();
    std::string resource = o.resource;
    // Pairs given later replace earlier ones, so the user's own options win
    // over the ones put in front of them here.
    std::string options = o.options;
    if (o.simulate) options = options.empty() ? "Simulate=true" : "Simulate=true," + options;
    if (!o.no_status_check)
        options = options.empty() ? "QueryInstrStatus=true"
                                  : "QueryInstrStatus=true," + options;
    if (!o.simulate && resource.empty()) {
        try {
            session->emulator = std::make_unique<emu::Emulator>(o.model);
            std::uint16_t port = session->emulator->Start();
            resource = "TCPIP0::127.0.0.1::" + std::to_string(port) + "::SOCKET";
        } catch (const std::exception& e) {
            std::fprintf(stderr, "cannot start the embedded emulator: %s\n", e.what());
            return E_FAIL;
        }
    }
    com::Bstr r(resource), opts(options);
    return session->driver->Initialize(r.get(), o.id_query ? VARIANT_TRUE : VARIANT_FALSE,
                                       o.reset ? VARIANT_TRUE : VARIANT_FALSE, opts.get());
}

int CloseSession(ToolSession& session) {
    HRESULT hr = session.driver->Close();
    return FAILED(hr) ? ReportFailure("Close", hr) : 0;
}

}  // namespace qn::tools

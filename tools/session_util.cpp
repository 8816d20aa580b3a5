#include "tools/session_util.h"

#include <cstdio>

#include "Quorlen731XXErrors.h"
#include "core/error_table.h"

namespace qn::tools {

const OptionSpec kSessionOptions[7] = {
    {"resource", true, "VISA resource or logical name (default: the embedded emulator)"},
    {"model", true, "model of the embedded emulator (default QDS4032A)"},
    {"options", true, "option string, e.g. \"Simulate=true,DriverSetup=Model=QDS4032A\""},
    {"simulate", false, "simulate the instrument"},
    {"id-query", false, "check the instrument model"},
    {"reset", false, "reset the instrument after opening"},
    {"json", false, "print one JSON object"},
};

std::string LastErrorText() {
    com::ErrorRecord rec;
    return com::TakeThreadError(&rec) ? rec.description : std::string();
}

int ReportFailure(const char* what, HRESULT hr) {
    std::string text = LastErrorText();
    const char* name = "";
    for (const ErrorEntry& e : ErrorTable())
        if (e.hr == hr) name = e.name;
    std::fprintf(stderr, "%s failed: error 0x%08X%s%s%s\n%s\n", what, static_cast<unsigned>(hr),
                 *name ? " (" : "", name, *name ? ")" : "", text.c_str());
    return 1;
}

int ReportFailure(Quorlen731XX* driver, const char* what, HRESULT hr) {
    ReportFailure(what, hr);
    if (hr != E_IVI_INSTRUMENT_STATUS) return 1;
    // The queue holds a handful of entries; stop at "no error" or a failure.
    for (int i = 0; i < 10; ++i) {
        LONG code = 0;
        com::Bstr message;
        if (FAILED(driver->ErrorQuery(&code, message.Out())) || code == 0) break;
        std::fprintf(stderr, "instrument error %ld: %s\n", static_cast<long>(code),
                     message.utf8().c_str());
    }
    return 1;
}

HRESULT OpenSession(const CliArgs& args, ToolSession* session) {
    session->driver = com::MakeComObject<Quorlen731XX>();
    std::string resource = args.Value("resource").value_or("");
    std::string options = args.Value("options").value_or("");
    // An explicit Simulate in the user's options still wins, since a later
    // pair replaces an earlier one.
    if (args.Has("simulate")) {
        options = options.empty() ? "Simulate=true" : "Simulate=true," + options;
    } else if (resource.empty()) {
        try {
            session->emulator =
                std::make_unique<emu::Emulator>(args.Value("model").value_or("QDS4032A"));
            std::uint16_t port = session->emulator->Start();
            resource = "TCPIP0::127.0.0.1::" + std::to_string(port) + "::SOCKET";
        } catch (const std::exception& e) {
            std::fprintf(stderr, "cannot start the embedded emulator: %s\n", e.what());
            return E_FAIL;
        }
    }
    com::Bstr r(resource), o(options);
    return session->driver->Initialize(r.get(),
                                       args.Has("id-query") ? VARIANT_TRUE : VARIANT_FALSE,
                                       args.Has("reset") ? VARIANT_TRUE : VARIANT_FALSE, o.get());
}

}  // namespace qn::tools

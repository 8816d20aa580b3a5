#include "tools/session_util.h"

#include <cstdio>

#include "core/error_table.h"

namespace qn::tools {

const OptionSpec kSessionOptions[6] = {
    {"resource", true, "VISA resource or logical name (default: simulate)"},
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

HRESULT OpenSession(const CliArgs& args, ComPtr<Quorlen731XX>* driver) {
    *driver = com::MakeComObject<Quorlen731XX>();
    std::string resource = args.Value("resource").value_or("");
    std::string options = args.Value("options").value_or("");
    // Without a resource the session simulates; an explicit Simulate in the
    // user's options still wins, since a later pair replaces an earlier one.
    if (resource.empty() || args.Has("simulate"))
        options = options.empty() ? "Simulate=true" : "Simulate=true," + options;
    com::Bstr r(resource), o(options);
    return (*driver)->Initialize(r.get(), args.Has("id-query") ? VARIANT_TRUE : VARIANT_FALSE,
                                 args.Has("reset") ? VARIANT_TRUE : VARIANT_FALSE, o.get());
}

}  // namespace qn::tools

// qn731xx info: opens a session and prints its flags, the instrument identity
// and the option tables.
#include <cstdio>
#include <string>
#include <vector>

#include "core/inherent.h"
#include "core/session_core.h"
#include "tools/commands.h"
#include "tools/json.h"
#include "tools/session_util.h"

namespace qn::tools {

namespace {

const char* OnOff(bool b) { return b ? "on" : "off"; }

struct FlagRow {
    const char* label;
    const char* json;
    bool SessionFlags::*flag;
};
constexpr FlagRow kFlags[] = {
    {"Cache", "cache", &SessionFlags::cache},
    {"InterchangeCheck", "interchange_check", &SessionFlags::interchange_check},
    {"QueryInstrumentStatus", "query_instrument_status", &SessionFlags::query_instrument_status},
    {"RangeCheck", "range_check", &SessionFlags::range_check},
    {"RecordCoercions", "record_coercions", &SessionFlags::record_coercions},
    {"Simulate", "simulate", &SessionFlags::simulate},
};

std::string SettingText(const InitialSetting& v) {
    if (const auto* s = std::get_if<std::string>(&v)) return *s;
    if (const auto* l = std::get_if<long>(&v)) return std::to_string(*l);
    if (const auto* d = std::get_if<double>(&v)) return std::to_string(*d);
    return std::get<bool>(v) ? "true" : "false";
}

void PrintTable(const char* title, const std::map<std::string, std::string>& t) {
    std::printf("%s\n", title);
    if (t.empty()) std::printf("  (none)\n");
    for (const auto& [k, v] : t) std::printf("  %-22s %s\n", k.c_str(), v.c_str());
}

void PrintText(const SessionCore& core) {
    const DriverSession& s = core.session;
    std::printf("Session\n");
    std::printf("  %-22s %s\n", "Initialized", s.initialized ? "yes" : "no");
    std::printf("  %-22s %s\n", "IoResourceDescriptor", s.io_resource_descriptor.c_str());
    std::printf("  %-22s %s\n", "LogicalName", s.logical_name.c_str());
    std::printf("  %-22s %s\n", "DriverSetup", s.driver_setup.c_str());
    for (const FlagRow& f : kFlags) std::printf("  %-22s %s\n", f.label, OnOff(s.flags.*f.flag));
    std::printf("Instrument\n");
    std::printf("  %-22s %s\n", "Model", s.model.c_str());
    std::printf("  %-22s %s\n", "Manufacturer", InstrumentManufacturer(core).c_str());
    std::printf("  %-22s %s\n", "FirmwareRevision", InstrumentFirmwareRevision(core).c_str());
    PrintTable("Init options", s.init_options);
    PrintTable("DriverSetup options", s.driver_setup_options);
    std::map<std::string, std::string> settings;
    for (const auto& [k, v] : s.initial_settings) settings[k] = SettingText(v);
    PrintTable("Initial settings", settings);
    std::printf("Trace\n  %-22s %s\n", "Trace", OnOff(s.trace.enabled));
    if (!s.trace.name.empty()) std::printf("  %-22s %s\n", "TraceName", s.trace.name.c_str());
}

void PrintJson(const SessionCore& core) {
    const DriverSession& s = core.session;
    JsonWriter j;
    j.BeginObject();
    j.Field("model", s.model);
    j.Field("manufacturer", InstrumentManufacturer(core));
    j.Field("firmware_revision", InstrumentFirmwareRevision(core));
    j.Field("io_resource_descriptor", s.io_resource_descriptor);
    j.Field("logical_name", s.logical_name);
    j.Field("driver_setup", s.driver_setup);
    for (const FlagRow& f : kFlags) j.Field(f.json, s.flags.*f.flag);
    j.Key("init_options");
    j.StringMap(s.init_options);
    j.Key("driver_setup_options");
    j.StringMap(s.driver_setup_options);
    j.EndObject();
    std::printf("%s\n", j.str().c_str());
}

}  // namespace

int InfoCommand(std::span<char*> argv) {
    CliArgs args;
    std::string error;
    if (!args.Parse(kSessionOptions, argv, &error)) {
        std::fprintf(stderr, "qn731xx info: %s\n%s", error.c_str(),
                     OptionHelp(kSessionOptions).c_str());
        return 2;
    }
    ToolSession session;
    HRESULT hr = OpenSession(args, &session);
    if (FAILED(hr)) return ReportFailure("Initialize", hr);
    ComPtr<Quorlen731XX>& driver = session.driver;
    if (args.Has("json"))
        PrintJson(driver->Core());
    else
        PrintText(driver->Core());
    hr = driver->Close();
    if (FAILED(hr)) return ReportFailure("Close", hr);
    return 0;
}

}  // namespace qn::tools

// qn731xx info: opens a session and prints the driver and instrument
// identity, the session flags, the feature record, the collections, the
// option tables and the instrument's error queue head (ErrorQuery).
#include <cstdio>
#include <string>
#include <vector>

#include "Quorlen731XX.h"
#include "core/inherent.h"
#include "core/session_core.h"
#include "tools/commands.h"
#include "tools/json_output.h"
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

// The feature record as rows: label, JSON key, and the value as text or number.
struct FeatureRow {
    const char* label;
    const char* json;
    bool FeatureRecord::*flag;
    LONG FeatureRecord::*count;
    double FeatureRecord::*real;
};
constexpr FeatureRow kFeatures[] = {
    {"AnalogChannelCount", "analog_channel_count", nullptr, &FeatureRecord::analog_channel_count, nullptr},
    {"DigitalChannelCount", "digital_channel_count", nullptr, &FeatureRecord::digital_channel_count, nullptr},
    {"Bandwidth", "bandwidth", nullptr, nullptr, &FeatureRecord::bandwidth},
    {"BandwidthLimit", "bandwidth_limit", nullptr, nullptr, &FeatureRecord::bandwidth_limit},
    {"GroundCoupling", "ground_coupling", &FeatureRecord::ground_coupling, nullptr, nullptr},
    {"FiftyOhmInput", "fifty_ohm_input", &FeatureRecord::fifty_ohm_input, nullptr, nullptr},
    {"ChannelProtection", "channel_protection", &FeatureRecord::channel_protection, nullptr, nullptr},
    {"ProbeSkew", "probe_skew", &FeatureRecord::probe_skew, nullptr, nullptr},
    {"AutoLevelSweep", "auto_level_sweep", &FeatureRecord::auto_level_sweep, nullptr, nullptr},
    {"ExternalTriggerInput", "external_trigger_input", &FeatureRecord::external_trigger_input, nullptr, nullptr},
    {"SequenceTrigger", "sequence_trigger", &FeatureRecord::sequence_trigger, nullptr, nullptr},
    {"DigitizeCommand", "digitize_command", &FeatureRecord::digitize_command, nullptr, nullptr},
    {"EarlyFamily", "early_family", &FeatureRecord::early_family, nullptr, nullptr},
    {"WaveformPointLimit", "waveform_point_limit", nullptr, &FeatureRecord::waveform_point_limit, nullptr},
    {"CountedMaximumPoints", "counted_maximum_points", &FeatureRecord::counted_maximum_points, nullptr, nullptr},
    {"DisplayLabels", "display_labels", &FeatureRecord::display_labels, nullptr, nullptr},
};

std::string FeatureText(const FeatureRecord& f, const FeatureRow& r) {
    if (r.flag) return f.*r.flag ? "yes" : "no";
    if (r.count) return std::to_string(f.*r.count);
    char buf[32];
    std::snprintf(buf, sizeof buf, "%g Hz", f.*r.real);
    return buf;
}

// Everything info shows, read through the driver's interfaces where they
// exist.
struct Info {
    std::string description, identifier, revision, vendor, group_capabilities;
    std::string model, manufacturer, firmware;
    std::vector<std::string> supported_models;
    std::vector<std::pair<std::string, std::vector<std::string>>> collections;
    LONG error_code = 0;
    std::string error_message;
};

std::string Text(IIviDriverIdentity* id, HRESULT (IIviDriverIdentity::*get)(BSTR*)) {
    com::Bstr s;
    return SUCCEEDED((id->*get)(s.Out())) ? s.utf8() : std::string();
}

template <class Collection>
std::vector<std::string> Names(Quorlen731XX* driver) {
    ComPtr<Collection> c;
    std::vector<std::string> names;
    if (FAILED(ComPtr<IIviDriver>(driver).As(c))) return names;
    LONG n = 0;
    if (FAILED(c->get_Count(&n))) return names;
    for (LONG i = 1; i <= n; ++i) {
        com::Bstr s;
        if (SUCCEEDED(c->get_Name(i, s.Out()))) names.push_back(s.utf8());
    }
    return names;
}

Info Gather(Quorlen731XX* driver) {
    Info info;
    IIviDriverIdentity* id = driver;
    info.description = Text(id, &IIviDriverIdentity::get_Description);
    info.identifier = Text(id, &IIviDriverIdentity::get_Identifier);
    info.revision = Text(id, &IIviDriverIdentity::get_Revision);
    info.vendor = Text(id, &IIviDriverIdentity::get_Vendor);
    info.group_capabilities = Text(id, &IIviDriverIdentity::get_GroupCapabilities);
    info.model = Text(id, &IIviDriverIdentity::get_InstrumentModel);
    info.manufacturer = Text(id, &IIviDriverIdentity::get_InstrumentManufacturer);
    info.firmware = Text(id, &IIviDriverIdentity::get_InstrumentFirmwareRevision);
    std::string list = Text(id, &IIviDriverIdentity::get_SupportedInstrumentModels);
    for (std::size_t start = 0; start < list.size();) {
        std::size_t comma = list.find(',', start);
        if (comma == std::string::npos) comma = list.size();
        info.supported_models.push_back(list.substr(start, comma - start));
        start = comma + 1;
    }
    info.collections = {
        {"IIviScopeChannels", Names<IIviScopeChannels>(driver)},
        {"IIviScopeMeasurements", Names<IIviScopeMeasurements>(driver)},
        {"IQuorlen731XXChannels", Names<IQuorlen731XXChannels>(driver)},
        {"IQuorlen731XXMeasurements", Names<IQuorlen731XXMeasurements>(driver)},
        {"IQuorlen731XXDigitalChannels", Names<IQuorlen731XXDigitalChannels>(driver)},
    };
    com::Bstr message;
    if (SUCCEEDED(driver->ErrorQuery(&info.error_code, message.Out())))
        info.error_message = message.utf8();
    else
        info.error_message = LastErrorText();
    return info;
}

std::string Joined(const std::vector<std::string>& v) {
    std::string out;
    for (const std::string& s : v) out += (out.empty() ? "" : ", ") + s;
    return out.empty() ? "(none)" : out;
}

void PrintTable(const char* title, const std::map<std::string, std::string>& t) {
    std::printf("%s\n", title);
    if (t.empty()) std::printf("  (none)\n");
    for (const auto& [k, v] : t) std::printf("  %-22s %s\n", k.c_str(), v.c_str());
}

void PrintText(const SessionCore& core, const Info& info) {
    const DriverSession& s = core.session;
    std::printf("Driver\n");
    std::printf("  %-22s %s\n", "Description", info.description.c_str());
    std::printf("  %-22s %s %s (%s)\n", "Identifier", info.identifier.c_str(),
                info.revision.c_str(), info.vendor.c_str());
    std::printf("  %-22s %zu\n", "SupportedModels", info.supported_models.size());
    std::printf("Instrument\n");
    std::printf("  %-22s %s\n", "Model", info.model.c_str());
    std::printf("  %-22s %s\n", "Manufacturer", info.manufacturer.c_str());
    std::printf("  %-22s %s\n", "FirmwareRevision", info.firmware.c_str());
    std::printf("  %-22s %ld, \"%s\"\n", "ErrorQuery", static_cast<long>(info.error_code),
                info.error_message.c_str());
    std::printf("Session\n");
    std::printf("  %-22s %s\n", "IoResourceDescriptor", s.io_resource_descriptor.c_str());
    std::printf("  %-22s %s\n", "LogicalName", s.logical_name.c_str());
    std::printf("  %-22s %s\n", "DriverSetup", s.driver_setup.c_str());
    for (const FlagRow& f : kFlags) std::printf("  %-22s %s\n", f.label, OnOff(s.flags.*f.flag));
    std::printf("  %-22s %s\n", "Trace", OnOff(s.trace.enabled));
    std::printf("Features\n");
    for (const FeatureRow& r : kFeatures)
        std::printf("  %-22s %s\n", r.label, FeatureText(core.features, r).c_str());
    std::printf("Collections\n");
    for (const auto& [name, items] : info.collections)
        std::printf("  %-29s %s\n", name.c_str(), Joined(items).c_str());
    PrintTable("Init options", s.init_options);
    PrintTable("DriverSetup options", s.driver_setup_options);
}

void PrintJsonInfo(const SessionCore& core, const Info& info) {
    const DriverSession& s = core.session;
    Json j = {{"model", info.model},
              {"manufacturer", info.manufacturer},
              {"firmware_revision", info.firmware},
              {"io_resource_descriptor", s.io_resource_descriptor},
              {"logical_name", s.logical_name},
              {"driver_setup", s.driver_setup}};
    for (const FlagRow& f : kFlags) j[f.json] = s.flags.*f.flag;
    Json& features = j["features"] = Json::object();
    for (const FeatureRow& r : kFeatures) {
        if (r.flag) features[r.json] = core.features.*r.flag;
        else if (r.count) features[r.json] = core.features.*r.count;
        else features[r.json] = core.features.*r.real;
    }
    j["driver"] = {{"description", info.description},
                   {"identifier", info.identifier},
                   {"revision", info.revision},
                   {"vendor", info.vendor},
                   {"group_capabilities", info.group_capabilities}};
    j["supported_models"] = info.supported_models;
    Json& collections = j["collections"] = Json::object();
    for (const auto& [name, items] : info.collections) collections[name] = items;
    j["error_query"] = {{"code", info.error_code}, {"message", info.error_message}};
    j["init_options"] = s.init_options;
    j["driver_setup_options"] = s.driver_setup_options;
    PrintJson(j);
}

}  // namespace

int InfoCommand(std::span<char*> argv) {
    SessionOptions options;
    auto app = CommandApp(
        "info", "Open a session and print its flags, the instrument identity and the option tables.",
        &options);
    if (auto rc = ParseCommandLine(*app, argv)) return *rc;
    ToolSession session;
    HRESULT hr = OpenSession(options, &session);
    if (FAILED(hr)) return ReportFailure(session.driver.get(), "Initialize", hr);
    Quorlen731XX* driver = session.driver.get();
    Info info = Gather(driver);
    if (options.json)
        PrintJsonInfo(driver->Core(), info);
    else
        PrintText(driver->Core(), info);
    return CloseSession(session);
}

}  // namespace qn::tools

// The IVI configuration store: driver sessions, logical names, hardware
// assets and software modules with their data components, read from one XML
// file (schema in docs/configuration-store.md). Plain C++, no COM needed.
//
// Loading never throws: a missing file is reported as an absent store, a
// malformed one as an error whose text names the file, the position and the
// problem (the XML parser's own message for syntax errors).
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace qn::ivi {

enum class DataType { kString, kInteger, kReal, kBoolean, kStructure, kApiReference };

// The type's name as written in the store ("String", "Integer", "Real",
// "Boolean", "Structure", "APIReference").
std::string_view DataTypeName(DataType type);

// One data component: a typed value, or (Structure) a list of components.
struct DataComponent {
    std::string name;
    std::string description;
    DataType type = DataType::kString;
    // kString / kApiReference: std::string, kInteger: int32, kReal: double,
    // kBoolean: bool, kStructure: monostate.
    std::variant<std::monostate, std::string, std::int32_t, double, bool> value;
    std::vector<DataComponent> children;  // kStructure only
};

// The name of the structure that holds a session's or module's initial settings.
inline constexpr std::string_view kConfigurableInitialSettings = "Configurable Initial Settings";

// The components of the Structure named `name` in `components`, or null.
const std::vector<DataComponent>* FindStructure(const std::vector<DataComponent>& components,
                                                std::string_view name);
// Component `index` of a list, counting from 1; null outside 1..size.
const DataComponent* DataComponentAt(const std::vector<DataComponent>& components, long index);

// A run of numbered virtual names: each k in [start, end] maps virtual name + k
// to MapTo + (physical_start + k - start).
struct VirtualRange {
    std::int32_t start = 0;
    std::int32_t end = 0;
    std::int32_t physical_start = 0;
};

struct VirtualName {
    std::string name;
    std::string map_to;
    std::vector<VirtualRange> ranges;
};

// Lower-case virtual name -> physical name.
using VirtualNameMap = std::map<std::string, std::string>;

// The six session flags, with the driver's defaults for attributes not given.
struct SessionFlags {
    bool cache = true;
    bool interchange_check = false;
    bool query_instr_status = false;
    bool range_check = true;
    bool record_coercions = false;
    bool simulate = false;
};

struct HardwareAsset {
    std::string name;
    std::string description;
    std::string resource_descriptor;
};

struct SoftwareModule {
    std::string name;
    std::string description;
    std::vector<DataComponent> data_components;
};

struct DriverSession {
    std::string name;
    std::string description;
    std::string hardware_asset;       // asset name, empty when the session has none
    std::string resource_descriptor;  // the asset's I/O resource descriptor
    std::string software_module;      // module name, may be empty
    SessionFlags flags;
    std::string driver_setup;
    std::vector<VirtualName> virtual_names;
    VirtualNameMap virtual_name_map;  // ExpandVirtualNames(virtual_names), built at load
    std::vector<DataComponent> data_components;

    bool HasHardwareAsset() const { return !hardware_asset.empty(); }
};

// Expands virtual names into the flat translation map. Fails (returning false
// with a message) when two entries produce the same lower-case virtual name.
bool ExpandVirtualNames(const std::vector<VirtualName>& names, VirtualNameMap* out,
                        std::string* error);

struct LogicalName {
    std::string name;
    std::string session;
};

enum class LoadStatus { kLoaded, kAbsent, kError };

struct LoadResult;

class ConfigStore {
  public:
    // Reads the store from `path`: kAbsent when the file does not exist,
    // kError (with `error`) when it cannot be read or is not a valid store.
    static LoadResult Load(const std::string& path);
    // Reads a store from XML text; `origin` names it in error messages.
    static LoadResult Parse(std::string_view xml, std::string_view origin = "<memory>");
    // Loads from ProcessDefaultLocation() when not empty, else MasterLocation().
    static LoadResult LoadDefault();

    // $IVI_CONFIG_STORE when set and not empty, else "".
    static std::string ProcessDefaultLocation();
    // The system-wide store, /etc/ivi/IviConfigurationStore.xml.
    static std::string MasterLocation();

    // The session called `name`, or the session a logical name `name` refers
    // to (logical names are looked up first); null when there is none. Names
    // compare exactly (case-sensitive).
    const DriverSession* FindSession(std::string_view name) const;
    const SoftwareModule* FindSoftwareModule(std::string_view name) const;
    const HardwareAsset* FindHardwareAsset(std::string_view name) const;

    const std::vector<DriverSession>& sessions() const { return sessions_; }
    const std::vector<LogicalName>& logical_names() const { return logical_names_; }
    const std::vector<SoftwareModule>& software_modules() const { return modules_; }
    const std::vector<HardwareAsset>& hardware_assets() const { return assets_; }

  private:
    friend class StoreReader;
    std::vector<DriverSession> sessions_;
    std::vector<LogicalName> logical_names_;
    std::vector<SoftwareModule> modules_;
    std::vector<HardwareAsset> assets_;
};

struct LoadResult {
    LoadStatus status = LoadStatus::kAbsent;
    ConfigStore store;  // meaningful when status == kLoaded
    std::string error;  // set when status == kError
    bool loaded() const { return status == LoadStatus::kLoaded; }
};

}  // namespace qn::ivi

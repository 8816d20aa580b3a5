// Reads the configuration store's XML (schema in docs/configuration-store.md)
// into a ConfigStore. The reader is strict: unknown elements or attributes,
// bad values, duplicate names and dangling references are errors, so that a
// misspelt flag cannot be silently ignored.
#include <charconv>
#include <cmath>
#include <functional>
#include <limits>
#include <pugixml.hpp>

#include "platform/ivi/config_store.h"

namespace qn::ivi {

namespace {

// Thrown inside the reader only; Parse turns it into a LoadResult.
struct StoreError {
    std::ptrdiff_t offset;
    std::string message;
};

[[noreturn]] void Fail(const pugi::xml_node& node, std::string message) {
    throw StoreError{node.offset_debug(), std::move(message)};
}

std::string_view Trim(std::string_view s) {
    const char* blanks = " \t\r\n";
    std::size_t b = s.find_first_not_of(blanks);
    if (b == std::string_view::npos) return {};
    return s.substr(b, s.find_last_not_of(blanks) - b + 1);
}

bool EqualsNoCase(std::string_view a, std::string_view b) {
    if (a.size() != b.size()) return false;
    for (std::size_t i = 0; i < a.size(); ++i) {
        auto lower = [](char c) { return c >= 'A' && c <= 'Z' ? char(c - 'A' + 'a') : c; };
        if (lower(a[i]) != lower(b[i])) return false;
    }
    return true;
}

// Every attribute of `node` must be one of `allowed`.
void CheckAttributes(const pugi::xml_node& node, std::initializer_list<std::string_view> allowed) {
    for (const pugi::xml_attribute& a : node.attributes()) {
        bool known = false;
        for (std::string_view name : allowed) known = known || name == a.name();
        if (!known)
            Fail(node,
                 std::string("unknown attribute \"") + a.name() + "\" on <" + node.name() + ">");
    }
}

std::string Required(const pugi::xml_node& node, const char* attribute) {
    pugi::xml_attribute a = node.attribute(attribute);
    std::string_view value = a ? Trim(a.value()) : std::string_view();
    if (value.empty())
        Fail(node, std::string("<") + node.name() + "> needs a non-empty \"" + attribute +
                       "\" attribute");
    return std::string(value);
}

std::string Optional(const pugi::xml_node& node, const char* attribute) {
    return std::string(Trim(node.attribute(attribute).value()));
}

bool ParseBool(std::string_view text, bool* out) {
    text = Trim(text);
    if (EqualsNoCase(text, "true") || text == "1") return *out = true, true;
    if (EqualsNoCase(text, "false") || text == "0") return *out = false, true;
    return false;
}

bool ParseInt32(std::string_view text, std::int32_t* out) {
    text = Trim(text);
    if (!text.empty() && text[0] == '+') text.remove_prefix(1);
    auto [end, ec] = std::from_chars(text.data(), text.data() + text.size(), *out);
    return !text.empty() && ec == std::errc() && end == text.data() + text.size();
}

bool ParseReal(std::string_view text, double* out) {
    text = Trim(text);
    if (!text.empty() && text[0] == '+') text.remove_prefix(1);
    auto [end, ec] = std::from_chars(text.data(), text.data() + text.size(), *out);
    return !text.empty() && ec == std::errc() && end == text.data() + text.size() &&
           std::isfinite(*out);
}

bool FlagAttribute(const pugi::xml_node& node, const char* name, bool fallback) {
    pugi::xml_attribute a = node.attribute(name);
    if (!a) return fallback;
    bool v = false;
    if (!ParseBool(a.value(), &v))
        Fail(node, std::string("attribute \"") + name + "\" must be true, false, 1 or 0, not \"" +
                       a.value() + "\"");
    return v;
}

// Rejects a second item of the same name in one list.
template <class T>
void CheckUnique(const std::vector<T>& items, const pugi::xml_node& node, const char* what) {
    for (std::size_t i = 0; i + 1 < items.size(); ++i)
        if (items[i].name == items.back().name)
            Fail(node, std::string(what) + " \"" + items.back().name + "\" is defined twice");
}

struct TypeEntry {
    std::string_view name;
    DataType type;
};
constexpr TypeEntry kTypes[] = {
    {"String", DataType::kString},       {"Integer", DataType::kInteger},
    {"Real", DataType::kReal},           {"Boolean", DataType::kBoolean},
    {"Structure", DataType::kStructure}, {"APIReference", DataType::kApiReference},
};

constexpr int kMaxStructureDepth = 32;

DataComponent ReadDataComponent(const pugi::xml_node& node, int depth);

std::vector<DataComponent> ReadDataComponents(const pugi::xml_node& parent, int depth,
                                              const std::function<void(pugi::xml_node)>& other) {
    std::vector<DataComponent> list;
    for (const pugi::xml_node& child : parent.children()) {
        if (child.type() != pugi::node_element) continue;
        if (std::string_view(child.name()) == "DataComponent") {
            list.push_back(ReadDataComponent(child, depth));
            CheckUnique(list, child, "data component");
        } else {
            other(child);
        }
    }
    return list;
}

DataComponent ReadDataComponent(const pugi::xml_node& node, int depth) {
    if (depth > kMaxStructureDepth) Fail(node, "structures are nested too deeply");
    CheckAttributes(node, {"name", "type", "value", "description"});
    DataComponent c;
    c.name = Required(node, "name");
    c.description = Optional(node, "description");
    std::string type = Required(node, "type");
    const TypeEntry* entry = nullptr;
    for (const TypeEntry& t : kTypes)
        if (t.name == type) entry = &t;
    if (!entry)
        Fail(node, "data component \"" + c.name + "\" has unknown type \"" + type +
                       "\" (String, Integer, Real, Boolean, Structure or APIReference)");
    c.type = entry->type;
    pugi::xml_attribute value = node.attribute("value");
    if (c.type == DataType::kStructure) {
        if (value) Fail(node, "structure \"" + c.name + "\" takes no value");
        c.children = ReadDataComponents(node, depth + 1, [](pugi::xml_node n) {
            Fail(n, std::string("unexpected <") + n.name() + "> in a structure");
        });
        return c;
    }
    if (node.find_child([](pugi::xml_node n) { return n.type() == pugi::node_element; }))
        Fail(node, "data component \"" + c.name + "\" of type " + type + " has child elements");
    if (!value) Fail(node, "data component \"" + c.name + "\" needs a \"value\" attribute");
    std::string_view text = value.value();
    bool ok = true;
    switch (c.type) {
        case DataType::kString:
        case DataType::kApiReference:
            c.value = std::string(text);
            break;
        case DataType::kInteger: {
            std::int32_t v = 0;
            ok = ParseInt32(text, &v);
            c.value = v;
            break;
        }
        case DataType::kReal: {
            double v = 0;
            ok = ParseReal(text, &v);
            c.value = v;
            break;
        }
        case DataType::kBoolean: {
            bool v = false;
            ok = ParseBool(text, &v);
            c.value = v;
            break;
        }
        case DataType::kStructure:
            break;
    }
    if (!ok)
        Fail(node, "data component \"" + c.name + "\": \"" + std::string(text) +
                       "\" is not a valid " + type + " value");
    return c;
}

constexpr long long kMaxRangeCount = 100000;

VirtualRange ReadRange(const pugi::xml_node& node) {
    CheckAttributes(node, {"start", "end", "physicalStart"});
    VirtualRange r;
    const std::pair<const char*, std::int32_t*> fields[] = {
        {"start", &r.start}, {"end", &r.end}, {"physicalStart", &r.physical_start}};
    for (auto [name, field] : fields) {
        std::string text = Required(node, name);
        if (!ParseInt32(text, field) || *field < 0)
            Fail(node, std::string("range attribute \"") + name +
                           "\" must be a non-negative integer, not \"" + text + "\"");
    }
    if (r.end < r.start) Fail(node, "range end is below its start");
    long long count = static_cast<long long>(r.end) - r.start + 1;
    if (count > kMaxRangeCount) Fail(node, "range holds more than 100000 names");
    if (r.physical_start + count - 1 > std::numeric_limits<std::int32_t>::max())
        Fail(node, "range's physical indices exceed 2147483647");
    return r;
}

VirtualName ReadVirtualName(const pugi::xml_node& node) {
    CheckAttributes(node, {"name", "mapTo"});
    VirtualName v;
    v.name = Required(node, "name");
    v.map_to = Required(node, "mapTo");
    for (const pugi::xml_node& child : node.children()) {
        if (child.type() != pugi::node_element) continue;
        if (std::string_view(child.name()) != "Range")
            Fail(child, std::string("unexpected <") + child.name() + "> in <VirtualName>");
        v.ranges.push_back(ReadRange(child));
    }
    return v;
}

}  // namespace

// Builds a ConfigStore from a parsed document (friend of ConfigStore).
class StoreReader {
  public:
    static void Read(const pugi::xml_node& root, ConfigStore* store) {
        if (std::string_view(root.name()) != "IviConfigurationStore")
            Fail(root, std::string("the root element is <") + root.name() +
                           ">, expected <IviConfigurationStore>");
        CheckAttributes(root, {"version"});
        std::string version = Optional(root, "version");
        if (!version.empty() && version != "1") Fail(root, "unsupported store version " + version);
        for (const pugi::xml_node& child : root.children()) {
            if (child.type() != pugi::node_element) continue;
            std::string_view name = child.name();
            if (name == "HardwareAsset") {
                ReadAsset(child, store);
            } else if (name == "SoftwareModule") {
                ReadModule(child, store);
            } else if (name == "DriverSession") {
                ReadSession(child, store);
            } else if (name == "LogicalName") {
                ReadLogicalName(child, store);
            } else {
                Fail(child, std::string("unexpected <") + child.name() + "> in the store");
            }
        }
        Resolve(root, store);
    }

  private:
    static void ReadAsset(const pugi::xml_node& node, ConfigStore* store) {
        CheckAttributes(node, {"name", "resourceDescriptor", "description"});
        store->assets_.push_back({Required(node, "name"), Optional(node, "description"),
                                  Required(node, "resourceDescriptor")});
        CheckUnique(store->assets_, node, "hardware asset");
        NoChildren(node);
    }

    static void ReadModule(const pugi::xml_node& node, ConfigStore* store) {
        CheckAttributes(node, {"name", "description"});
        SoftwareModule m;
        m.name = Required(node, "name");
        m.description = Optional(node, "description");
        m.data_components = ReadDataComponents(node, 0, [](pugi::xml_node n) {
            Fail(n, std::string("unexpected <") + n.name() + "> in <SoftwareModule>");
        });
        store->modules_.push_back(std::move(m));
        CheckUnique(store->modules_, node, "software module");
    }

    static void ReadSession(const pugi::xml_node& node, ConfigStore* store) {
        CheckAttributes(node, {"name", "description", "hardwareAsset", "softwareModule", "cache",
                               "interchangeCheck", "queryInstrStatus", "rangeCheck",
                               "recordCoercions", "simulate"});
        DriverSession s;
        s.name = Required(node, "name");
        s.description = Optional(node, "description");
        s.hardware_asset = Optional(node, "hardwareAsset");
        s.software_module = Optional(node, "softwareModule");
        const SessionFlags defaults;
        s.flags.cache = FlagAttribute(node, "cache", defaults.cache);
        s.flags.interchange_check =
            FlagAttribute(node, "interchangeCheck", defaults.interchange_check);
        s.flags.query_instr_status =
            FlagAttribute(node, "queryInstrStatus", defaults.query_instr_status);
        s.flags.range_check = FlagAttribute(node, "rangeCheck", defaults.range_check);
        s.flags.record_coercions =
            FlagAttribute(node, "recordCoercions", defaults.record_coercions);
        s.flags.simulate = FlagAttribute(node, "simulate", defaults.simulate);
        bool have_setup = false;
        s.data_components = ReadDataComponents(node, 0, [&](pugi::xml_node n) {
            std::string_view name = n.name();
            if (name == "VirtualName") {
                s.virtual_names.push_back(ReadVirtualName(n));
            } else if (name == "DriverSetup" && !have_setup) {
                CheckAttributes(n, {});
                NoChildren(n);
                s.driver_setup = n.text().get();
                have_setup = true;
            } else {
                Fail(n, std::string("unexpected <") + n.name() + "> in <DriverSession>");
            }
        });
        std::string error;
        if (!ExpandVirtualNames(s.virtual_names, &s.virtual_name_map, &error))
            Fail(node, "session \"" + s.name + "\": " + error);
        store->sessions_.push_back(std::move(s));
        CheckUnique(store->sessions_, node, "driver session");
    }

    static void ReadLogicalName(const pugi::xml_node& node, ConfigStore* store) {
        CheckAttributes(node, {"name", "session"});
        store->logical_names_.push_back({Required(node, "name"), Required(node, "session")});
        CheckUnique(store->logical_names_, node, "logical name");
        NoChildren(node);
    }

    static void NoChildren(const pugi::xml_node& node) {
        if (pugi::xml_node c =
                node.find_child([](pugi::xml_node n) { return n.type() == pugi::node_element; }))
            Fail(c, std::string("unexpected <") + c.name() + "> in <" + node.name() + ">");
    }

    // Checks the references between entries once everything is read.
    static void Resolve(const pugi::xml_node& root, ConfigStore* store) {
        auto find = [&](const char* element, const std::string& name) {
            for (const pugi::xml_node& n : root.children(element))
                if (Trim(n.attribute("name").value()) == name) return n;
            return root;
        };
        for (DriverSession& s : store->sessions_) {
            pugi::xml_node node = find("DriverSession", s.name);
            if (s.HasHardwareAsset()) {
                const HardwareAsset* asset = store->FindHardwareAsset(s.hardware_asset);
                if (!asset)
                    Fail(node, "session \"" + s.name + "\" names the unknown hardware asset \"" +
                                   s.hardware_asset + "\"");
                s.resource_descriptor = asset->resource_descriptor;
            }
            if (!s.software_module.empty() && !store->FindSoftwareModule(s.software_module))
                Fail(node, "session \"" + s.name + "\" names the unknown software module \"" +
                               s.software_module + "\"");
        }
        for (const LogicalName& l : store->logical_names_) {
            bool found = false;
            for (const DriverSession& s : store->sessions_) found = found || s.name == l.session;
            if (!found)
                Fail(find("LogicalName", l.name), "logical name \"" + l.name +
                                                      "\" refers to the unknown session \"" +
                                                      l.session + "\"");
        }
    }
};

namespace {

// "line L, column C" of a byte offset in `text` (both from 1).
std::string Position(std::string_view text, std::ptrdiff_t offset) {
    if (offset < 0 || static_cast<std::size_t>(offset) > text.size()) return "offset unknown";
    long line = 1, column = 1;
    for (std::ptrdiff_t i = 0; i < offset; ++i) {
        if (text[static_cast<std::size_t>(i)] == '\n') {
            ++line;
            column = 1;
        } else {
            ++column;
        }
    }
    return "line " + std::to_string(line) + ", column " + std::to_string(column) + " (offset " +
           std::to_string(offset) + ")";
}

}  // namespace

LoadResult ConfigStore::Parse(std::string_view xml, std::string_view origin) {
    LoadResult result;
    result.status = LoadStatus::kError;
    try {
        pugi::xml_document doc;
        pugi::xml_parse_result parsed = doc.load_buffer(xml.data(), xml.size());
        if (!parsed) {
            result.error = std::string(origin) + ": " + Position(xml, parsed.offset) + ": " +
                           parsed.description();
            return result;
        }
        ConfigStore store;
        StoreReader::Read(doc.document_element(), &store);
        result.store = std::move(store);
        result.status = LoadStatus::kLoaded;
    } catch (const StoreError& e) {
        result.error = std::string(origin) + ": " + Position(xml, e.offset) + ": " + e.message;
    } catch (const std::bad_alloc&) {
        result.error = std::string(origin) + ": out of memory";
    }
    return result;
}

}  // namespace qn::ivi

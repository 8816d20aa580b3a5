// Lookups, store locations and the virtual-name expansion of the
// configuration store. The XML reading is in config_store_xml.cpp.
#include "platform/ivi/config_store.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>

namespace qn::ivi {

namespace {

template <class T>
const T* FindByName(const std::vector<T>& items, std::string_view name) {
    auto it = std::find_if(items.begin(), items.end(), [&](const T& t) { return t.name == name; });
    return it == items.end() ? nullptr : &*it;
}

std::string Lower(std::string s) {
    for (char& c : s)
        if (c >= 'A' && c <= 'Z') c = char(c - 'A' + 'a');
    return s;
}

// Reads a whole file. Returns false with errno-style text on failure; sets
// *missing when the file does not exist.
constexpr long kMaxStoreBytes = 64L * 1024 * 1024;

bool ReadFile(const std::string& path, std::string* out, bool* missing, std::string* error) {
    *missing = false;
    std::unique_ptr<std::FILE, int (*)(std::FILE*)> f(std::fopen(path.c_str(), "rb"), &std::fclose);
    if (!f) {
        *missing = errno == ENOENT || errno == ENOTDIR;
        *error = path + ": " + std::strerror(errno);
        return false;
    }
    char buf[65536];
    std::size_t n;
    while ((n = std::fread(buf, 1, sizeof buf, f.get())) > 0) {
        out->append(buf, n);
        if (long(out->size()) > kMaxStoreBytes) {
            *error = path + ": file is larger than 64 MiB";
            return false;
        }
    }
    if (std::ferror(f.get())) {
        *error = path + ": " + std::strerror(errno);
        return false;
    }
    return true;
}

}  // namespace

std::string_view DataTypeName(DataType type) {
    switch (type) {
        case DataType::kString:
            return "String";
        case DataType::kInteger:
            return "Integer";
        case DataType::kReal:
            return "Real";
        case DataType::kBoolean:
            return "Boolean";
        case DataType::kStructure:
            return "Structure";
        case DataType::kApiReference:
            return "APIReference";
    }
    return "";
}

const std::vector<DataComponent>* FindStructure(const std::vector<DataComponent>& components,
                                                std::string_view name) {
    for (const DataComponent& c : components)
        if (c.type == DataType::kStructure && c.name == name) return &c.children;
    return nullptr;
}

const DataComponent* DataComponentAt(const std::vector<DataComponent>& components, long index) {
    if (index < 1 || static_cast<unsigned long>(index) > components.size()) return nullptr;
    return &components[static_cast<std::size_t>(index - 1)];
}

bool ExpandVirtualNames(const std::vector<VirtualName>& names, VirtualNameMap* out,
                        std::string* error) {
    out->clear();
    auto add = [&](std::string key, std::string value) {
        key = Lower(std::move(key));
        if (!out->emplace(key, std::move(value)).second) {
            *error = "virtual name \"" + key + "\" is defined more than once";
            return false;
        }
        return true;
    };
    for (const VirtualName& v : names) {
        if (v.ranges.empty()) {
            if (!add(v.name, v.map_to)) return false;
            continue;
        }
        for (const VirtualRange& r : v.ranges) {
            // 64-bit arithmetic: the loader bounds the ranges, this keeps it safe anyway.
            for (long long k = r.start; k <= r.end; ++k) {
                long long physical = r.physical_start + (k - r.start);
                if (!add(v.name + std::to_string(k), v.map_to + std::to_string(physical)))
                    return false;
            }
        }
    }
    return true;
}

LoadResult ConfigStore::Load(const std::string& path) {
    LoadResult result;
    try {
        std::string text, error;
        bool missing = false;
        if (!ReadFile(path, &text, &missing, &error)) {
            result.status = missing ? LoadStatus::kAbsent : LoadStatus::kError;
            if (!missing) result.error = error;
            return result;
        }
        return Parse(text, path);
    } catch (const std::bad_alloc&) {
        result.status = LoadStatus::kError;
        result.error = path + ": out of memory";
        return result;
    }
}

LoadResult ConfigStore::LoadDefault() {
    std::string path = ProcessDefaultLocation();
    return Load(path.empty() ? MasterLocation() : path);
}

std::string ConfigStore::ProcessDefaultLocation() {
    const char* env = std::getenv("IVI_CONFIG_STORE");
    return env ? std::string(env) : std::string();
}

std::string ConfigStore::MasterLocation() {
    return "/etc/ivi/IviConfigurationStore.xml";
}

const DriverSession* ConfigStore::FindSession(std::string_view name) const {
    if (const LogicalName* logical = FindByName(logical_names_, name))
        return FindByName(sessions_, logical->session);
    return FindByName(sessions_, name);
}

const SoftwareModule* ConfigStore::FindSoftwareModule(std::string_view name) const {
    return FindByName(modules_, name);
}

const HardwareAsset* ConfigStore::FindHardwareAsset(std::string_view name) const {
    return FindByName(assets_, name);
}

}  // namespace qn::ivi

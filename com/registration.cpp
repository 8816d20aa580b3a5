#include "com/registration.h"

#include "Quorlen731XXIds.h"
#include "platform/com/activation.h"

namespace qn::server {

namespace {

// One line of the registration script: a value (or a bare key when name is
// null) at parent\key. The parent is never removed; the first component of
// key is the key this entry owns.
struct ScriptEntry {
    std::string_view parent;
    std::string_view key;
    const char* name;
    std::string_view value;
};

constexpr ScriptEntry kScript[] = {
    // Module script: the AppID and the module's pointer to it.
    {"HKCR\\AppID", "%APPID%", "", kQuorlen731XXAppIdName},
    {"HKCR\\AppID", kQuorlen731XXModuleAppIdKey, "AppID", "%APPID%"},
    // The ProgIDs.
    {"HKCR", "%PROGID%", "", "%DESCRIPTION%"},
    {"HKCR", "%PROGID%\\CLSID", "", "%CLSID%"},
    {"HKCR", "%VIPROGID%", "", "%DESCRIPTION%"},
    {"HKCR", "%VIPROGID%\\CLSID", "", "%CLSID%"},
    {"HKCR", "%VIPROGID%\\CurVer", "", "%PROGID%"},
    // The class.
    {"HKCR\\CLSID", "%CLSID%", "", "%DESCRIPTION%"},
    {"HKCR\\CLSID", "%CLSID%", "AppID", "%APPID%"},
    {"HKCR\\CLSID", "%CLSID%\\ProgID", "", "%PROGID%"},
    {"HKCR\\CLSID", "%CLSID%\\VersionIndependentProgID", "", "%VIPROGID%"},
    {"HKCR\\CLSID", "%CLSID%\\Programmable", nullptr, ""},
    {"HKCR\\CLSID", "%CLSID%\\%MODULETYPE%", "", "%Module_Raw%"},
    {"HKCR\\CLSID", "%CLSID%\\%MODULETYPE%", "ThreadingModel", "Both"},
    {"HKCR\\CLSID", "%CLSID%\\TypeLib", "", "%MODULEGUID%"},
    {"HKCR\\CLSID", "%CLSID%\\Implemented Categories\\%CATID1%", nullptr, ""},
    {"HKCR\\CLSID", "%CLSID%\\Implemented Categories\\%CATID2%", nullptr, ""},
    // The type information, held by the module itself.
    {"HKCR\\TypeLib", "%LIBID%\\%LIBVERSION%", "", kQuorlen731XXLibDescription},
    {"HKCR\\TypeLib", "%LIBID%\\%LIBVERSION%\\FLAGS", "", "0"},
    {"HKCR\\TypeLib", "%LIBID%\\%LIBVERSION%\\0\\linux64", "", "%Module_Raw%"},
};

bool SameNoCase(std::string_view a, std::string_view b) {
    return !com::NoCaseLess()(a, b) && !com::NoCaseLess()(b, a);
}

// Expands each backslash-separated component of a key path on its own, so
// that a replacement can never add or remove a level of the path.
std::optional<std::vector<std::string>> ExpandKeyPath(std::string_view path,
                                                      const Replacements& r) {
    std::vector<std::string> parts;
    std::size_t start = 0;
    while (true) {
        std::size_t end = path.find('\\', start);
        std::string_view raw =
            path.substr(start, end == std::string_view::npos ? end : end - start);
        std::optional<std::string> part = ExpandPlaceholders(raw, r);
        if (!part || part->empty() || part->find('\\') != std::string::npos) return std::nullopt;
        parts.push_back(std::move(*part));
        if (end == std::string_view::npos) return parts;
        start = end + 1;
    }
}

std::string Join(const std::vector<std::string>& parts) {
    std::string out;
    for (const std::string& p : parts) out += (out.empty() ? "" : "\\") + p;
    return out;
}

// The full path of an entry's key, or of the key it owns (parent plus the
// first component of key).
std::optional<std::string> EntryPath(const ScriptEntry& e, const Replacements& r, bool owned) {
    std::optional<std::vector<std::string>> parent = ExpandKeyPath(e.parent, r);
    std::optional<std::vector<std::string>> key = ExpandKeyPath(e.key, r);
    if (!parent || !key) return std::nullopt;
    if (owned) key->resize(1);
    parent->insert(parent->end(), key->begin(), key->end());
    return Join(*parent);
}

}  // namespace

std::optional<std::string> ExpandPlaceholders(std::string_view text, const Replacements& r) {
    std::string out;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (text[i] != '%') {
            out += text[i];
            continue;
        }
        std::size_t close = text.find('%', i + 1);
        if (close == std::string_view::npos) return std::nullopt;
        std::string_view name = text.substr(i + 1, close - i - 1);
        i = close;
        if (name.empty()) {
            out += '%';
            continue;
        }
        const Replacement* found = nullptr;
        for (const Replacement& rep : r)
            if (SameNoCase(rep.name, name)) found = &rep;
        if (!found) return std::nullopt;
        out += found->value;
    }
    return out;
}

Replacements ModuleReplacements(const std::string& module_path) {
    using com::GuidToString;
    std::string quoted;
    for (char c : module_path) quoted += c == '\'' ? std::string("''") : std::string(1, c);
    return {
        {"APPID", GuidToString(APPID_Quorlen731XX)},
        {"Module", quoted},
        {"Module_Raw", module_path},
        {"MODULEGUID", GuidToString(LIBID_Quorlen731XXLib)},
        {"MODULETYPE", "InprocServer32"},
        {"CLSID", GuidToString(CLSID_Quorlen731XX)},
        {"PROGID", kQuorlen731XXProgId},
        {"VIPROGID", kQuorlen731XXVersionIndependentProgId},
        {"DESCRIPTION", kQuorlen731XXDescription},
        {"LIBID", GuidToString(LIBID_Quorlen731XXLib)},
        {"LIBVERSION", kQuorlen731XXLibVersion},
        {"CATID1", GuidToString(CATID_Quorlen731XXIviDrivers)},
        {"CATID2", GuidToString(CATID_Quorlen731XXIviScopeDrivers)},
    };
}

bool ApplyRegistration(com::RegistryTree& tree, const Replacements& r, std::string* error) {
    RemoveRegistration(tree, r);
    for (const ScriptEntry& e : kScript) {
        std::optional<std::string> path = EntryPath(e, r, false);
        std::optional<std::string> value = ExpandPlaceholders(e.value, r);
        if (!path || !value) {
            *error = "cannot expand the registration entry " + std::string(e.parent) + "\\" +
                     std::string(e.key);
            return false;
        }
        bool ok = e.name ? tree.SetValue(*path, e.name, *value) : tree.CreateKey(*path) != nullptr;
        if (!ok) {
            *error =
                "cannot write " + *path + (e.name ? " value \"" + std::string(e.name) + "\"" : "");
            return false;
        }
    }
    return true;
}

bool RemoveRegistration(com::RegistryTree& tree, const Replacements& r) {
    bool removed = false;
    for (const ScriptEntry& e : kScript) {
        std::optional<std::string> owned = EntryPath(e, r, true);
        if (owned && tree.DeleteTree(*owned)) removed = true;
    }
    return removed;
}

}  // namespace qn::server

#include "scope/source_names.h"

#include "Quorlen731XXErrors.h"
#include "core/options.h"

namespace qn {

namespace {

constexpr std::string_view kExternal = "VAL_EXTERNAL";

// The instance `name` resolves to in class `c`, or null.
const RepCapInstance* FindIn(const SessionCore& core, RepCapClass c, std::string_view name) {
    return core.repcaps.Find(c, name, core.virtual_names);
}

bool StartsWith(std::string_view s, std::string_view prefix) {
    return s.substr(0, prefix.size()) == prefix;
}

// The one-step virtual-name translation of the repeated-capability lookup.
std::string Translate(const SessionCore& core, std::string name) {
    auto v = core.virtual_names.find(ToLower(name));
    return v == core.virtual_names.end() ? name : v->second;
}

}  // namespace

HRESULT VirtualToSCPI(CDriverNode& node, std::string_view name, SourceNameRules rules,
                      std::string* scpi) {
    const SessionCore& core = node.Core();
    for (RepCapClass c : {RepCapClass::kUserChannel, RepCapClass::kChannel}) {
        if (const RepCapInstance* r = FindIn(core, c, name)) {
            *scpi = "CHAN" + std::to_string(r->position);
            return S_OK;
        }
    }
    if (rules.allow_digital) {
        if (const RepCapInstance* r = FindIn(core, RepCapClass::kUserDigitalChannel, name)) {
            *scpi = "DIG" + std::to_string(r->position - 1);
            return S_OK;
        }
    }
    if (rules.allow_external && TrimBlanks(name) == kExternal) {
        *scpi = "EXT";
        return S_OK;
    }
    return node.Errors().InvalidValue("VirtualToSCPI", "bstrVirtualSource", name);
}

std::string SCPIToVirtual(const SessionCore& core, std::string_view scpi, bool class_compliant) {
    std::string name;
    if (scpi == "EXT") {
        name = kExternal;
    } else if (scpi == "LINE") {
        name = "LINE";
    } else if (StartsWith(scpi, "CHAN")) {
        name = std::string(class_compliant ? "Channel" : "UserChannel") +
               std::string(scpi.substr(4, 1));
    } else if (StartsWith(scpi, "DIG")) {
        name = "UserDigitalChannel" + std::string(scpi.substr(3, 2));
    } else {
        name = scpi;
    }
    return Translate(core, std::move(name));
}

bool IsInstrumentSourceName(std::string_view scpi) {
    auto numbered = [&](std::string_view prefix) {
        if (!StartsWith(scpi, prefix) || scpi.size() == prefix.size()) return false;
        for (char c : scpi.substr(prefix.size()))
            if (c < '0' || c > '9') return false;
        return true;
    };
    return scpi == "EXT" || scpi == "LINE" || numbered("CHAN") || numbered("DIG");
}

}  // namespace qn

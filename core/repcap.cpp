#include "core/repcap.h"

#include "core/options.h"

namespace qn {

const std::vector<RepCapInstance>* RepCapLists::List(RepCapClass c) const {
    int i = static_cast<int>(c);
    return built_[i] ? &lists_[i] : nullptr;
}

std::vector<RepCapInstance>& RepCapLists::Build(RepCapClass c) {
    int i = static_cast<int>(c);
    built_[i] = true;
    lists_[i].clear();
    return lists_[i];
}

void RepCapLists::Clear() {
    for (int i = 0; i < static_cast<int>(RepCapClass::kCount); ++i) {
        lists_[i].clear();
        built_[i] = false;
    }
    digital_measurements = math_measurements = external_measurements = IndexRange{};
}

const RepCapInstance* RepCapLists::Find(
    RepCapClass c, std::string_view name,
    const std::map<std::string, std::string>& virtual_names) const {
    const std::vector<RepCapInstance>* list = List(c);
    if (!list) return nullptr;
    name = TrimBlanks(name);
    if (list->size() == 1 && name.empty()) return &list->front();
    std::string physical(name);
    auto v = virtual_names.find(ToLower(name));
    if (v != virtual_names.end()) {
        physical = v->second;
        auto again = virtual_names.find(ToLower(physical));
        if (again != virtual_names.end()) physical = again->second;
    }
    for (const RepCapInstance& r : *list)
        if (EqualsNoCase(r.name, physical)) return &r;
    return nullptr;
}

}  // namespace qn

#include "services/simulation.h"

namespace qn {

void CSimulationTable::Add(std::string_view key, const SimValue& v) {
    if (key.empty()) return;
    std::string k(key);
    switch (v.kind) {
        case SimValue::Kind::Short:
            maps_.insert_or_assign(std::move(k), CSimulationMap<SHORT>{CSimulationInfo<SHORT>(
                                                     "", static_cast<SHORT>(v.integer))});
            break;
        case SimValue::Kind::Long:
            maps_.insert_or_assign(std::move(k),
                                   CSimulationMap<LONG>{CSimulationInfo<LONG>("", v.integer)});
            break;
        case SimValue::Kind::Double:
            maps_.insert_or_assign(std::move(k),
                                   CSimulationMap<double>{CSimulationInfo<double>("", v.real)});
            break;
        case SimValue::Kind::String:
            maps_.insert_or_assign(std::move(k), CSimulationMap<BSTR>{CSimulationInfo<BSTR>(
                                                     "", v.text ? v.text : "")});
            break;
        case SimValue::Kind::None:
            break;
    }
}

}  // namespace qn

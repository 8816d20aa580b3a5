#include "io/enum_command.h"

namespace qn {

CEnumCommandTable::CEnumCommandTable(std::initializer_list<CEnumCommandRow> rows) {
    for (const CEnumCommandRow& r : rows)
        rows_.push_back(Row{std::string(r.model), r.value, std::string(r.token)});
}

std::optional<LONG> CEnumCommandTable::ValueOf(std::string_view model, std::string_view token) const {
    for (std::string_view m : {model, std::string_view()}) {
        for (const Row& r : rows_)
            if (r.model == m && r.token == token) return r.value;
        if (model.empty()) break;
    }
    return std::nullopt;
}

std::string_view CEnumCommandTable::TokenOf(std::string_view model, LONG value) const {
    for (std::string_view m : {model, std::string_view()}) {
        for (const Row& r : rows_)
            if (r.model == m && r.value == value) return r.token;
        if (model.empty()) break;
    }
    return {};
}

}  // namespace qn

// Enumeration-to-token tables: which SCPI token the instrument uses for each
// value of an enumeration, per model ("" = every model).
#pragma once

#include <initializer_list>
#include <optional>
#include <vector>
#include <string>
#include <string_view>

#include "platform/com/types.h"
#include "services/model_map.h"

namespace qn {

struct CEnumCommandRow {
    std::string_view model;  // "" = every model
    LONG value;
    std::string_view token;
};

// One enumeration's table, built once from its rows: model -> (token -> value).
class CEnumCommandTable {
public:
    CEnumCommandTable(std::initializer_list<CEnumCommandRow> rows);
    // The value of `token` (exact, case-sensitive), looked up among the rows
    // of `model` first, then among the rows for every model.
    std::optional<LONG> ValueOf(std::string_view model, std::string_view token) const;
    // The token of `value`, by the same rule; empty when there is none.
    std::string_view TokenOf(std::string_view model, LONG value) const;

private:
    struct Row {
        std::string model;
        LONG value;
        std::string token;
    };
    std::vector<Row> rows_;
};

}  // namespace qn

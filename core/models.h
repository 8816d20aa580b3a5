// The supported-model table: 65 models in 7 families, looked up by the exact
// model string (case-sensitive, whole string).
#pragma once

#include <span>
#include <string>
#include <string_view>

#include "services/model_map.h"

namespace qn {

inline constexpr std::string_view kDefaultModel = "QDS4032A";

struct CSupportedModelRow {
    std::string_view model;
    std::string_view family;
};

// A row of the validator's model map: the model is the key, the family the value.
class CSupportedModel : public CModelBasedType {
public:
    CSupportedModel(std::string model, std::string family)
        : CModelBasedType(std::move(model)), family_(std::move(family)) {}
    const std::string& Family() const { return family_; }

private:
    std::string family_;
};

// The table in its fixed order (families, then models, as listed).
std::span<const CSupportedModelRow> SupportedModelRows();

// Process-wide validator, built on first use and never changed.
class CSupportedModelValidator {
public:
    static const CSupportedModelValidator& Instance();
    bool IsSupported(std::string_view model) const;
    // The family of an exactly matching model; empty when unsupported.
    std::string_view FamilyOf(std::string_view model) const;
    bool IsInFamily(std::string_view model, std::string_view family) const;
    // Every model name joined with "," in the table's order.
    const std::string& ModelList() const { return list_; }

private:
    CSupportedModelValidator();
    CModelBasedMap<CSupportedModel> models_;
    std::string list_;
};

}  // namespace qn

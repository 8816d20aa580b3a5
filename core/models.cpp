#include "core/models.h"

#include <array>


namespace qn {

namespace {

// Model name -> family, in the order the families and models are listed.
constexpr std::array kSupportedModels = {
    CSupportedModelRow{"QMS4104B", "4XXXB"},
    CSupportedModelRow{"QMS4054B", "4XXXB"},
    CSupportedModelRow{"QMS4052B", "4XXXB"},
    CSupportedModelRow{"QMS4034B", "4XXXB"},
    CSupportedModelRow{"QMS4032B", "4XXXB"},
    CSupportedModelRow{"QMS4012B", "4XXXB"},
    CSupportedModelRow{"QMS4014B", "4XXXB"},
    CSupportedModelRow{"QDS4014B", "4XXXB"},
    CSupportedModelRow{"QDS4052B", "4XXXB"},
    CSupportedModelRow{"QDS4054B", "4XXXB"},
    CSupportedModelRow{"QDS4032B", "4XXXB"},
    CSupportedModelRow{"QDS4034B", "4XXXB"},
    CSupportedModelRow{"QDS4012B", "4XXXB"},
    CSupportedModelRow{"QDS4104B", "4XXXB"},
    CSupportedModelRow{"QMS4014A", "4XXXA"},
    CSupportedModelRow{"QMS4012A", "4XXXA"},
    CSupportedModelRow{"QDS4014A", "4XXXA"},
    CSupportedModelRow{"QDS4012A", "4XXXA"},
    CSupportedModelRow{"QMS4104A", "4XXXA"},
    CSupportedModelRow{"QMS4054A", "4XXXA"},
    CSupportedModelRow{"QMS4034A", "4XXXA"},
    CSupportedModelRow{"QMS4102A", "4XXXA"},
    CSupportedModelRow{"QMS4052A", "4XXXA"},
    CSupportedModelRow{"QMS4032A", "4XXXA"},
    CSupportedModelRow{"QDS4104A", "4XXXA"},
    CSupportedModelRow{"QDS4054A", "4XXXA"},
    CSupportedModelRow{"QDS4034A", "4XXXA"},
    CSupportedModelRow{"QDS4102A", "4XXXA"},
    CSupportedModelRow{"QDS4052A", "4XXXA"},
    CSupportedModelRow{"QDS4032A", "4XXXA"},
    CSupportedModelRow{"QDS2012A", "2XXXA"},
    CSupportedModelRow{"QDS2014A", "2XXXA"},
    CSupportedModelRow{"QDS2032A", "2XXXA"},
    CSupportedModelRow{"QDS2034A", "2XXXA"},
    CSupportedModelRow{"QDS2052A", "2XXXA"},
    CSupportedModelRow{"QDS2054A", "2XXXA"},
    CSupportedModelRow{"QDS3034L", "3XXXL"},
    CSupportedModelRow{"QDS3104L", "3XXXL"},
    CSupportedModelRow{"QDS3054L", "3XXXL"},
    CSupportedModelRow{"QDS3014L", "3XXXL"},
    CSupportedModelRow{"QMS3104A", "3XXXA"},
    CSupportedModelRow{"QDS3104A", "3XXXA"},
    CSupportedModelRow{"QMS3102A", "3XXXA"},
    CSupportedModelRow{"QDS3102A", "3XXXA"},
    CSupportedModelRow{"QMS3054A", "3XXXA"},
    CSupportedModelRow{"QDS3054A", "3XXXA"},
    CSupportedModelRow{"QMS3052A", "3XXXA"},
    CSupportedModelRow{"QDS3052A", "3XXXA"},
    CSupportedModelRow{"QMS3034A", "3XXXA"},
    CSupportedModelRow{"QDS3034A", "3XXXA"},
    CSupportedModelRow{"QMS3032A", "3XXXA"},
    CSupportedModelRow{"QDS3032A", "3XXXA"},
    CSupportedModelRow{"QMS3014A", "3XXXA"},
    CSupportedModelRow{"QDS3014A", "3XXXA"},
    CSupportedModelRow{"QMS3012A", "3XXXA"},
    CSupportedModelRow{"QDS3012A", "3XXXA"},
    CSupportedModelRow{"73142D", "7314X"},
    CSupportedModelRow{"73142A", "7314X"},
    CSupportedModelRow{"73141D", "7314X"},
    CSupportedModelRow{"73141A", "7314X"},
    CSupportedModelRow{"73124A", "7312X"},
    CSupportedModelRow{"73122D", "7312X"},
    CSupportedModelRow{"73122A", "7312X"},
    CSupportedModelRow{"73121D", "7312X"},
    CSupportedModelRow{"73121A", "7312X"},
};

}  // namespace

std::span<const CSupportedModelRow> SupportedModelRows() { return kSupportedModels; }

const CSupportedModelValidator& CSupportedModelValidator::Instance() {
    static const CSupportedModelValidator v;
    return v;
}

CSupportedModelValidator::CSupportedModelValidator() {
    for (const CSupportedModelRow& r : kSupportedModels) {
        models_.AddRow(CSupportedModel(std::string(r.model), std::string(r.family)));
        if (!list_.empty()) list_ += ',';
        list_ += r.model;
    }
}

bool CSupportedModelValidator::IsSupported(std::string_view model) const {
    // The map's fallback row for "" does not exist, so Lookup is exact here;
    // an empty model string is never supported.
    return !model.empty() && models_.Lookup(model) != nullptr;
}

std::string_view CSupportedModelValidator::FamilyOf(std::string_view model) const {
    if (model.empty()) return {};
    const CSupportedModel* m = models_.Lookup(model);
    return m ? std::string_view(m->Family()) : std::string_view();
}

bool CSupportedModelValidator::IsInFamily(std::string_view model, std::string_view family) const {
    return !family.empty() && FamilyOf(model) == family;
}

}  // namespace qn

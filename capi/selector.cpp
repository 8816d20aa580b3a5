#include "capi/selector.h"

#include <string_view>

#include "capi/c_session.h"

namespace qn::capi {

namespace {

std::string_view Trim(std::string_view s) {
    const auto first = s.find_first_not_of(" \t");
    if (first == std::string_view::npos) return {};
    return s.substr(first, s.find_last_not_of(" \t") - first + 1);
}

}  // namespace

ViStatus FirstSelectorName(ViSession vi, ViConstString selector, std::string_view* name) {
    std::string_view rest = selector ? selector : "";
    std::string_view first;
    bool is_first = true;
    bool bad = Trim(rest).empty();
    while (!bad) {
        const std::size_t comma = rest.find(',');
        const std::string_view element = Trim(rest.substr(0, comma));
        if (element.empty() || element.find_first_of(":[]") != std::string_view::npos) bad = true;
        if (is_first) first = element;
        is_first = false;
        if (comma == std::string_view::npos) break;
        rest.remove_prefix(comma + 1);
    }
    if (bad) return Fail(vi, kBadlyFormedSelector, "The repeated capability selector is badly-formed.");
    *name = first;
    return VI_SUCCESS;
}

}  // namespace qn::capi

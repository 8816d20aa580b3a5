#include "capi/selector.h"

#include <string_view>

#include "capi/c_session.h"

namespace qn::capi {

namespace {

bool IsBlank(char c) { return c == ' ' || c == '\t'; }

}  // namespace

// One pass over the selector (it is parsed on every attribute call, so no
// per-character searches): each comma-separated element, trimmed of blanks,
// must be non-empty and free of ':', '[' and ']'.
ViStatus FirstSelectorName(ViSession vi, ViConstString selector, std::string_view* name) {
    const char* p = selector ? selector : "";
    std::string_view first;
    bool bad = false;
    for (bool is_first = true;; is_first = false) {
        while (IsBlank(*p)) ++p;
        const char* const begin = p;
        const char* end = p;
        for (; *p != '\0' && *p != ','; ++p) {
            if (*p == ':' || *p == '[' || *p == ']') bad = true;
            if (!IsBlank(*p)) end = p + 1;
        }
        if (end == begin) bad = true;
        if (is_first) first = std::string_view(begin, static_cast<std::size_t>(end - begin));
        if (*p == '\0') break;
        ++p;
    }
    if (bad) return Fail(vi, kBadlyFormedSelector, "The repeated capability selector is badly-formed.");
    *name = first;
    return VI_SUCCESS;
}

}  // namespace qn::capi

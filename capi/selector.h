// Repeated-capability selectors given to the C API: a list of names
// separated by commas, of which the C functions use the first.
#pragma once

#include <string_view>

#include "visatype.h"

namespace qn::capi {

// The first name of `selector`, trimmed. An empty selector, an empty element
// of the list, or a name with more than one level ("a:b", "[...]") is refused
// as a badly formed selector (recorded for the session).
// The name is a view into `selector`.
ViStatus FirstSelectorName(ViSession vi, ViConstString selector, std::string_view* name);

}  // namespace qn::capi

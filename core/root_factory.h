// Creation of the root driver object (the class factory and the C API use it).
#pragma once

#include "platform/com/unknown.h"

namespace qn {

// Creates a new Quorlen731XX object and returns its interface `riid`. With an
// outer unknown the object is aggregated and only IID_IUnknown may be asked
// for (the inner, non-delegating unknown is returned).
HRESULT CreateQuorlen731XX(IUnknown* outer, REFIID riid, void** ppv);

}  // namespace qn

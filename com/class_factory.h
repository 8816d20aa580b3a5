// The class factory of the creatable Quorlen731XX class and the module's
// server-lock count (IClassFactory::LockServer).
#pragma once

#include "platform/com/unknown.h"

namespace qn::server {

// Creates Quorlen731XX objects. With an outer unknown the object is
// aggregated: only IID_IUnknown may be asked for, and the inner
// (non-delegating) unknown is returned.
class ClassFactory final : public com::ComObject<ClassFactory, IClassFactory> {
  public:
    HRESULT CreateInstance(IUnknown* outer, REFIID riid, void** ppv) override;
    // Counts server locks; an unlock without a matching lock is refused with
    // E_UNEXPECTED and leaves the count unchanged.
    HRESULT LockServer(bool lock) override;
};

// Server locks currently held through LockServer, by any factory object.
long ServerLockCount();

}  // namespace qn::server

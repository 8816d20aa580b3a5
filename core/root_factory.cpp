#include "core/root_factory.h"

#include "core/root.h"

namespace qn {

HRESULT CreateQuorlen731XX(IUnknown* outer, REFIID riid, void** ppv) {
    if (!ppv) return E_POINTER;
    *ppv = nullptr;
    if (outer && !(riid == iid_of<IUnknown>)) return CLASS_E_NOAGGREGATION;
    try {
        ComPtr<Quorlen731XX> obj = com::MakeComObject<Quorlen731XX>();
        if (outer) {
            // The reference taken at creation becomes the outer object's
            // reference on the inner unknown.
            Quorlen731XX* raw = obj.Detach();
            raw->SetOuterUnknown(outer);
            *ppv = raw->InnerUnknown();
            return S_OK;
        }
        return obj->QueryInterface(riid, ppv);
    } catch (const std::bad_alloc&) {
        return E_OUTOFMEMORY;
    }
}

}  // namespace qn

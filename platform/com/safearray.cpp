#include "platform/com/safearray.h"

#include <cstdlib>
#include <cstring>
#include <limits>

#include "platform/com/bstr.h"
#include "platform/com/large_memory.h"
#include "platform/com/variant.h"

namespace {

ULONG ElementSize(VARTYPE vt) {
    switch (vt) {
        case VT_UI1:
        case VT_I1:
            return 1;
        case VT_I2:
        case VT_UI2:
        case VT_BOOL:
            return 2;
        case VT_I4:
        case VT_UI4:
        case VT_R4:
        case VT_INT:
        case VT_UINT:
        case VT_ERROR:
            return 4;
        case VT_R8:
        case VT_I8:
        case VT_UI8:
            return 8;
        case VT_BSTR:
            return sizeof(BSTR);
        case VT_UNKNOWN:
        case VT_DISPATCH:
            return sizeof(IUnknown*);
        case VT_VARIANT:
            return sizeof(VARIANT);
        default:
            return 0;
    }
}

// Flat element offset for a set of indices, or -1 when out of bounds.
long long Offset(const SAFEARRAY* psa, const LONG* idx) {
    long long off = 0;
    long long stride = 1;
    // Dimension 1 varies fastest.
    for (UINT d = 0; d < psa->cDims; ++d) {
        const SAFEARRAYBOUND& b = psa->rgsabound[d];
        long long i = static_cast<long long>(idx[d]) - b.lLbound;
        if (i < 0 || i >= static_cast<long long>(b.cElements)) return -1;
        off += i * stride;
        stride *= b.cElements;
    }
    return off;
}

void DestroyElements(SAFEARRAY* psa) {
    ULONG n = qn::com::SafeArrayCount(psa);
    if (!psa->pvData) return;
    if (psa->vt == VT_BSTR) {
        auto* p = static_cast<BSTR*>(psa->pvData);
        for (ULONG i = 0; i < n; ++i) SysFreeString(p[i]);
    } else if (psa->vt == VT_VARIANT) {
        auto* p = static_cast<VARIANT*>(psa->pvData);
        for (ULONG i = 0; i < n; ++i) VariantClear(&p[i]);
    } else if (psa->vt == VT_UNKNOWN || psa->vt == VT_DISPATCH) {
        auto* p = static_cast<IUnknown**>(psa->pvData);
        for (ULONG i = 0; i < n; ++i)
            if (p[i]) p[i]->Release();
    }
}

// Elements of a large array live in a mapping of their own (its size kept
// in front of them), so the pages of a multi-megabyte waveform come in
// huge-page units and go back to the system when the array is destroyed.
constexpr USHORT kFeatureMapped = 0x4000;  // internal: not one of the published flags
constexpr std::size_t kMappingHeader = 64;

void* AllocateElements(std::size_t bytes, USHORT* features) {
    if (bytes >= qn::com::kLargeMemoryBytes) {
        std::size_t mapped = 0;
        auto* base = static_cast<char*>(qn::com::MapLargeMemory(bytes + kMappingHeader, &mapped));
        if (base) {
            std::memcpy(base, &mapped, sizeof mapped);
            *features = USHORT(*features | kFeatureMapped);
            return base + kMappingHeader;
        }
    }
    // calloc: zero elements are valid null BSTRs, empty VARIANTs, null pointers.
    return std::calloc(1, bytes);
}

void FreeElements(SAFEARRAY* psa) {
    if (!(psa->fFeatures & kFeatureMapped)) {
        std::free(psa->pvData);
        return;
    }
    char* base = static_cast<char*>(psa->pvData) - kMappingHeader;
    std::size_t mapped = 0;
    std::memcpy(&mapped, base, sizeof mapped);
    qn::com::UnmapLargeMemory(base, mapped);
}

}  // namespace

namespace qn::com {
ULONG SafeArrayCount(const SAFEARRAY* psa) {
    if (!psa) return 0;
    ULONG n = 1;
    for (UINT d = 0; d < psa->cDims; ++d) n *= psa->rgsabound[d].cElements;
    return n;
}
}  // namespace qn::com

SAFEARRAY* SafeArrayCreate(VARTYPE vt, UINT cDims, const SAFEARRAYBOUND* bounds) {
    ULONG size = ElementSize(vt);
    if (size == 0 || cDims == 0 || cDims > kSafeArrayMaxDims || !bounds) return nullptr;
    unsigned long long count = 1;
    for (UINT d = 0; d < cDims; ++d) {
        count *= bounds[d].cElements;
        if (count > std::numeric_limits<ULONG>::max()) return nullptr;
        // Every element must have an index that a LONG can hold (SafeArrayGetUBound).
        long long upper = static_cast<long long>(bounds[d].lLbound) + bounds[d].cElements - 1;
        if (upper > std::numeric_limits<LONG>::max()) return nullptr;
    }
    unsigned long long bytes = count * size;
    if (bytes > std::numeric_limits<std::size_t>::max() / 2) return nullptr;
    auto* psa = static_cast<SAFEARRAY*>(std::calloc(1, sizeof(SAFEARRAY)));
    if (!psa) return nullptr;
    psa->cDims = USHORT(cDims);
    psa->cbElements = size;
    psa->vt = vt;
    for (UINT d = 0; d < cDims; ++d) psa->rgsabound[d] = bounds[d];
    if (bytes) {
        psa->pvData = AllocateElements(static_cast<std::size_t>(bytes), &psa->fFeatures);
        if (!psa->pvData) {
            std::free(psa);
            return nullptr;
        }
    }
    return psa;
}

SAFEARRAY* SafeArrayCreateVector(VARTYPE vt, LONG lLbound, ULONG cElements) {
    SAFEARRAYBOUND b{cElements, lLbound};
    return SafeArrayCreate(vt, 1, &b);
}

HRESULT SafeArrayDestroy(SAFEARRAY* psa) {
    if (!psa) return S_OK;
    if (psa->cLocks) return DISP_E_ARRAYISLOCKED;
    if (!(psa->fFeatures & FADF_STATIC)) {
        DestroyElements(psa);
        FreeElements(psa);
    }
    std::free(psa);
    return S_OK;
}

SAFEARRAY* SafeArrayCreateVectorOver(VARTYPE vt, void* data, ULONG count) {
    if (vt != VT_R8 && vt != VT_R4 && vt != VT_I4 && vt != VT_I2 && vt != VT_UI1) return nullptr;
    if (!data && count > 0) return nullptr;
    auto* psa = static_cast<SAFEARRAY*>(std::calloc(1, sizeof(SAFEARRAY)));
    if (!psa) return nullptr;
    psa->cDims = 1;
    psa->fFeatures = FADF_STATIC | FADF_FIXEDSIZE;
    psa->cbElements = ElementSize(vt);
    psa->vt = vt;
    psa->pvData = data;
    psa->rgsabound[0] = SAFEARRAYBOUND{count, 0};
    return psa;
}

UINT SafeArrayGetDim(SAFEARRAY* psa) { return psa ? psa->cDims : 0; }
UINT SafeArrayGetElemsize(SAFEARRAY* psa) { return psa ? psa->cbElements : 0; }

HRESULT SafeArrayGetLBound(SAFEARRAY* psa, UINT nDim, LONG* plLbound) {
    if (!psa || !plLbound) return E_INVALIDARG;
    if (nDim < 1 || nDim > psa->cDims) return DISP_E_BADINDEX;
    *plLbound = psa->rgsabound[nDim - 1].lLbound;
    return S_OK;
}

HRESULT SafeArrayGetUBound(SAFEARRAY* psa, UINT nDim, LONG* plUbound) {
    if (!psa || !plUbound) return E_INVALIDARG;
    if (nDim < 1 || nDim > psa->cDims) return DISP_E_BADINDEX;
    const SAFEARRAYBOUND& b = psa->rgsabound[nDim - 1];
    *plUbound = static_cast<LONG>(static_cast<long long>(b.lLbound) + b.cElements - 1);
    return S_OK;
}

HRESULT SafeArrayGetVartype(SAFEARRAY* psa, VARTYPE* pvt) {
    if (!psa || !pvt) return E_INVALIDARG;
    *pvt = psa->vt;
    return S_OK;
}

HRESULT SafeArrayAccessData(SAFEARRAY* psa, void** ppv) {
    if (!psa || !ppv) return E_INVALIDARG;
    ++psa->cLocks;
    *ppv = psa->pvData;
    return S_OK;
}

HRESULT SafeArrayUnaccessData(SAFEARRAY* psa) {
    if (!psa) return E_INVALIDARG;
    if (psa->cLocks == 0) return E_UNEXPECTED;
    --psa->cLocks;
    return S_OK;
}

HRESULT SafeArrayGetElement(SAFEARRAY* psa, const LONG* indices, void* pv) {
    if (!psa || !indices || !pv) return E_INVALIDARG;
    long long off = Offset(psa, indices);
    if (off < 0) return DISP_E_BADINDEX;
    const char* src = static_cast<const char*>(psa->pvData) + off * psa->cbElements;
    if (psa->vt == VT_BSTR) {
        BSTR s = *reinterpret_cast<const BSTR*>(src);
        BSTR copy = s ? SysAllocStringLen(s, SysStringLen(s)) : nullptr;
        if (s && !copy) return E_OUTOFMEMORY;
        *static_cast<BSTR*>(pv) = copy;
    } else if (psa->vt == VT_VARIANT) {
        auto* dst = static_cast<VARIANT*>(pv);
        VariantInit(dst);
        return VariantCopy(dst, reinterpret_cast<const VARIANT*>(src));
    } else if (psa->vt == VT_UNKNOWN || psa->vt == VT_DISPATCH) {
        IUnknown* p = *reinterpret_cast<IUnknown* const*>(src);
        if (p) p->AddRef();
        *static_cast<IUnknown**>(pv) = p;
    } else {
        std::memcpy(pv, src, psa->cbElements);
    }
    return S_OK;
}

HRESULT SafeArrayPutElement(SAFEARRAY* psa, const LONG* indices, const void* pv) {
    if (!psa || !indices) return E_INVALIDARG;
    long long off = Offset(psa, indices);
    if (off < 0) return DISP_E_BADINDEX;
    char* dst = static_cast<char*>(psa->pvData) + off * psa->cbElements;
    if (psa->vt == VT_BSTR) {
        BSTR s = static_cast<BSTR>(const_cast<void*>(pv));
        BSTR copy = s ? SysAllocStringLen(s, SysStringLen(s)) : nullptr;
        if (s && !copy) return E_OUTOFMEMORY;
        BSTR* slot = reinterpret_cast<BSTR*>(dst);
        SysFreeString(*slot);
        *slot = copy;
    } else if (psa->vt == VT_VARIANT) {
        if (!pv) return E_INVALIDARG;
        return VariantCopy(reinterpret_cast<VARIANT*>(dst), static_cast<const VARIANT*>(pv));
    } else if (psa->vt == VT_UNKNOWN || psa->vt == VT_DISPATCH) {
        auto* p = static_cast<IUnknown*>(const_cast<void*>(pv));
        if (p) p->AddRef();
        IUnknown** slot = reinterpret_cast<IUnknown**>(dst);
        if (*slot) (*slot)->Release();
        *slot = p;
    } else {
        if (!pv) return E_INVALIDARG;
        std::memcpy(dst, pv, psa->cbElements);
    }
    return S_OK;
}

HRESULT SafeArrayCopy(SAFEARRAY* psa, SAFEARRAY** out) {
    if (!out) return E_INVALIDARG;
    *out = nullptr;
    if (!psa) return S_OK;
    SAFEARRAY* copy = SafeArrayCreate(psa->vt, psa->cDims, psa->rgsabound);
    if (!copy) return E_OUTOFMEMORY;
    ULONG n = qn::com::SafeArrayCount(psa);
    if (psa->vt == VT_BSTR || psa->vt == VT_VARIANT || psa->vt == VT_UNKNOWN ||
        psa->vt == VT_DISPATCH) {
        // Element-wise, so owned BSTRs, variants and references are duplicated.
        for (ULONG i = 0; i < n; ++i) {
            char* s = static_cast<char*>(psa->pvData) + std::size_t(i) * psa->cbElements;
            char* d = static_cast<char*>(copy->pvData) + std::size_t(i) * psa->cbElements;
            HRESULT hr = S_OK;
            if (psa->vt == VT_BSTR) {
                BSTR b = *reinterpret_cast<BSTR*>(s);
                *reinterpret_cast<BSTR*>(d) = b ? SysAllocStringLen(b, SysStringLen(b)) : nullptr;
                if (b && !*reinterpret_cast<BSTR*>(d)) hr = E_OUTOFMEMORY;
            } else if (psa->vt == VT_VARIANT) {
                hr = VariantCopy(reinterpret_cast<VARIANT*>(d), reinterpret_cast<VARIANT*>(s));
            } else {
                IUnknown* p = *reinterpret_cast<IUnknown**>(s);
                if (p) p->AddRef();
                *reinterpret_cast<IUnknown**>(d) = p;
            }
            if (FAILED(hr)) {
                SafeArrayDestroy(copy);
                return hr;
            }
        }
    } else if (n) {
        std::memcpy(copy->pvData, psa->pvData, std::size_t(n) * psa->cbElements);
    }
    *out = copy;
    return S_OK;
}

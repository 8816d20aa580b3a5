// SAFEARRAY: one- and two-dimensional arrays of VT_R8, VT_R4, VT_UI1, VT_I2,
// VT_I4, VT_BOOL, VT_BSTR and VT_VARIANT with per-dimension bounds.
#pragma once

#include <utility>

#include "platform/com/types.h"

// VARIANT type codes (the subset the driver uses).
enum VARENUM : VARTYPE {
    VT_EMPTY = 0,
    VT_NULL = 1,
    VT_I2 = 2,
    VT_I4 = 3,
    VT_R4 = 4,
    VT_R8 = 5,
    VT_BSTR = 8,
    VT_DISPATCH = 9,
    VT_ERROR = 10,
    VT_BOOL = 11,
    VT_VARIANT = 12,
    VT_UNKNOWN = 13,
    VT_I1 = 16,
    VT_UI1 = 17,
    VT_UI2 = 18,
    VT_UI4 = 19,
    VT_I8 = 20,
    VT_UI8 = 21,
    VT_INT = 22,
    VT_UINT = 23,
    VT_ARRAY = 0x2000,
    VT_BYREF = 0x4000,
    VT_TYPEMASK = 0x0fff,
};

struct SAFEARRAYBOUND {
    ULONG cElements;
    LONG lLbound;
};

constexpr USHORT kSafeArrayMaxDims = 2;

// fFeatures flags. A static array's elements belong to its creator:
// SafeArrayDestroy frees the descriptor only. A fixed-size array is never
// replaced by a callee that fills it.
constexpr USHORT FADF_STATIC = 0x0002;
constexpr USHORT FADF_FIXEDSIZE = 0x0010;

struct SAFEARRAY {
    USHORT cDims;
    USHORT fFeatures;
    ULONG cbElements;
    ULONG cLocks;
    void* pvData;
    VARTYPE vt;  // element type, kept with the array (SafeArrayGetVartype)
    // Bounds in the order given to SafeArrayCreate (dimension 1 first).
    SAFEARRAYBOUND rgsabound[kSafeArrayMaxDims];
};

SAFEARRAY* SafeArrayCreate(VARTYPE vt, UINT cDims, const SAFEARRAYBOUND* bounds);
SAFEARRAY* SafeArrayCreateVector(VARTYPE vt, LONG lLbound, ULONG cElements);
HRESULT SafeArrayDestroy(SAFEARRAY* psa);
// A one-dimensional array (lower bound 0) over `count` elements of plain type
// `vt` (VT_R8, VT_R4, VT_I4, VT_I2, VT_UI1) that the caller owns and keeps
// alive as long as the array: FADF_STATIC | FADF_FIXEDSIZE. Null for any
// other type or a null `data` with a nonzero count.
SAFEARRAY* SafeArrayCreateVectorOver(VARTYPE vt, void* data, ULONG count);
HRESULT SafeArrayCopy(SAFEARRAY* psa, SAFEARRAY** out);
UINT SafeArrayGetDim(SAFEARRAY* psa);
UINT SafeArrayGetElemsize(SAFEARRAY* psa);
HRESULT SafeArrayGetLBound(SAFEARRAY* psa, UINT nDim, LONG* plLbound);  // nDim from 1
HRESULT SafeArrayGetUBound(SAFEARRAY* psa, UINT nDim, LONG* plUbound);
HRESULT SafeArrayGetVartype(SAFEARRAY* psa, VARTYPE* pvt);
HRESULT SafeArrayAccessData(SAFEARRAY* psa, void** ppv);
HRESULT SafeArrayUnaccessData(SAFEARRAY* psa);
// Element access by one index per dimension (dimension 1 first). BSTR and
// VARIANT elements are copied in and out.
HRESULT SafeArrayGetElement(SAFEARRAY* psa, const LONG* indices, void* pv);
HRESULT SafeArrayPutElement(SAFEARRAY* psa, const LONG* indices, const void* pv);

namespace qn::com {

// Total element count of an array (0 for null).
ULONG SafeArrayCount(const SAFEARRAY* psa);

// Owning holder of one SAFEARRAY.
class SafeArray {
public:
    SafeArray() = default;
    explicit SafeArray(SAFEARRAY* p) : p_(p) {}
    SafeArray(const SafeArray&) = delete;
    SafeArray& operator=(const SafeArray&) = delete;
    SafeArray(SafeArray&& o) noexcept : p_(std::exchange(o.p_, nullptr)) {}
    SafeArray& operator=(SafeArray&& o) noexcept {
        if (this != &o) {
            reset();
            p_ = std::exchange(o.p_, nullptr);
        }
        return *this;
    }
    ~SafeArray() { reset(); }

    static SafeArray Vector(VARTYPE vt, ULONG count, LONG lbound = 0) {
        return SafeArray(SafeArrayCreateVector(vt, lbound, count));
    }
    // An array over the caller's memory (SafeArrayCreateVectorOver).
    static SafeArray Over(VARTYPE vt, void* data, ULONG count) {
        return SafeArray(SafeArrayCreateVectorOver(vt, data, count));
    }
    SAFEARRAY* get() const { return p_; }
    SAFEARRAY** Out() {
        reset();
        return &p_;
    }
    [[nodiscard]] SAFEARRAY* Detach() { return std::exchange(p_, nullptr); }
    void reset() {
        if (SAFEARRAY* p = std::exchange(p_, nullptr)) SafeArrayDestroy(p);
    }
    explicit operator bool() const { return p_ != nullptr; }
    ULONG size() const { return SafeArrayCount(p_); }
    // Direct element pointer for arrays of plain values (no lock taken:
    // the holder owns the array).
    template <class T>
    T* data() const {
        return p_ ? static_cast<T*>(p_->pvData) : nullptr;
    }

private:
    SAFEARRAY* p_ = nullptr;
};

}  // namespace qn::com

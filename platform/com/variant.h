// VARIANT (the subset the driver uses) and the OLE helpers VarR8Round and
// VarBstrCmp.
#pragma once

#include "platform/com/bstr.h"
#include "platform/com/safearray.h"
#include "platform/com/types.h"
#include "platform/com/unknown.h"

struct VARIANT {
    VARTYPE vt;
    WORD wReserved1;
    WORD wReserved2;
    WORD wReserved3;
    union {
        LONGLONG llVal;
        ULONGLONG ullVal;
        LONG lVal;
        ULONG ulVal;
        INT intVal;
        UINT uintVal;
        BYTE bVal;
        CHAR cVal;
        SHORT iVal;
        USHORT uiVal;
        FLOAT fltVal;
        DOUBLE dblVal;
        VARIANT_BOOL boolVal;
        HRESULT scode;
        BSTR bstrVal;
        IUnknown* punkVal;
        SAFEARRAY* parray;
        BYTE* pbVal;
        SHORT* piVal;
        LONG* plVal;
        LONGLONG* pllVal;
        FLOAT* pfltVal;
        DOUBLE* pdblVal;
        VARIANT_BOOL* pboolVal;
        BSTR* pbstrVal;
        IUnknown** ppunkVal;
        SAFEARRAY** pparray;
        VARIANT* pvarVal;
        void* byref;
    };
};

void VariantInit(VARIANT* v);
// Frees what the variant owns (BSTR, array, interface reference) and empties it.
HRESULT VariantClear(VARIANT* v);
// Deep copy; dest is cleared first.
HRESULT VariantCopy(VARIANT* dest, const VARIANT* src);

// Rounds to nDig decimal places; exact halves go to the even neighbour.
HRESULT VarR8Round(double dblIn, int nDig, double* pdblOut);

constexpr HRESULT VARCMP_LT = 0;
constexpr HRESULT VARCMP_EQ = 1;
constexpr HRESULT VARCMP_GT = 2;
constexpr HRESULT VARCMP_NULL = 3;
constexpr ULONG NORM_IGNORECASE = 0x1;
constexpr LCID LOCALE_USER_DEFAULT = 0x400;
// Compares two BSTRs by code unit (a null BSTR equals an empty one);
// NORM_IGNORECASE folds ASCII letters.
HRESULT VarBstrCmp(BSTR left, BSTR right, LCID lcid, ULONG flags);

namespace qn::com {

// Owning VARIANT holder.
class Variant : public VARIANT {
public:
    Variant() { VariantInit(this); }
    Variant(const Variant& o) : Variant() { VariantCopy(this, &o); }
    Variant& operator=(const Variant& o) {
        if (this != &o) VariantCopy(this, &o);
        return *this;
    }
    ~Variant() { VariantClear(this); }
    static Variant Long(LONG v) {
        Variant r;
        r.vt = VT_I4;
        r.lVal = v;
        return r;
    }
    static Variant Double(double v) {
        Variant r;
        r.vt = VT_R8;
        r.dblVal = v;
        return r;
    }
    static Variant Bool(bool v) {
        Variant r;
        r.vt = VT_BOOL;
        r.boolVal = v ? VARIANT_TRUE : VARIANT_FALSE;
        return r;
    }
    static Variant String(std::string_view utf8) {
        Variant r;
        r.vt = VT_BSTR;
        r.bstrVal = Utf8ToBstr(utf8);
        return r;
    }
};

}  // namespace qn::com

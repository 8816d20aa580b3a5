#include "platform/com/variant.h"

#include <cmath>
#include <cstring>

void VariantInit(VARIANT* v) {
    if (!v) return;
    std::memset(v, 0, sizeof(*v));
    v->vt = VT_EMPTY;
}

HRESULT VariantClear(VARIANT* v) {
    if (!v) return E_INVALIDARG;
    if (!(v->vt & VT_BYREF)) {
        if (v->vt & VT_ARRAY) {
            SafeArrayDestroy(v->parray);
        } else if (v->vt == VT_BSTR) {
            SysFreeString(v->bstrVal);
        } else if ((v->vt == VT_UNKNOWN || v->vt == VT_DISPATCH) && v->punkVal) {
            v->punkVal->Release();
        }
    }
    VariantInit(v);
    return S_OK;
}

HRESULT VariantCopy(VARIANT* dest, const VARIANT* src) {
    if (!dest || !src) return E_INVALIDARG;
    if (dest == src) return S_OK;
    VARIANT tmp = *src;
    if (!(src->vt & VT_BYREF)) {
        if (src->vt & VT_ARRAY) {
            HRESULT hr = SafeArrayCopy(src->parray, &tmp.parray);
            if (FAILED(hr)) return hr;
        } else if (src->vt == VT_BSTR && src->bstrVal) {
            tmp.bstrVal = SysAllocStringLen(src->bstrVal, SysStringLen(src->bstrVal));
            if (!tmp.bstrVal) return E_OUTOFMEMORY;
        } else if ((src->vt == VT_UNKNOWN || src->vt == VT_DISPATCH) && src->punkVal) {
            src->punkVal->AddRef();
        }
    }
    VariantClear(dest);
    *dest = tmp;
    return S_OK;
}

HRESULT VarR8Round(double dblIn, int nDig, double* pdblOut) {
    if (!pdblOut || nDig < 0) return E_INVALIDARG;
    double scale = std::pow(10.0, nDig);
    double x = dblIn * scale;
    // From 2^52 on a scaled double has no fractional part, so rounding leaves the input as
    // it is; this also covers infinities, NaN and a scale that overflows to infinity.
    if (!(std::fabs(x) < 0x1p52)) {
        *pdblOut = dblIn;
        return S_OK;
    }
    double whole = std::trunc(x);
    double fract = x - whole;  // same sign as x
    double r;
    if (fract > 0.5)
        r = whole + 1.0;
    else if (fract == 0.5)
        r = whole + std::fmod(whole, 2.0);  // odd whole goes up to the even neighbour
    else if (fract > -0.5)
        r = whole;
    else if (fract == -0.5)
        r = whole + std::fmod(whole, 2.0);  // fmod is negative for negative odd wholes
    else
        r = whole - 1.0;
    *pdblOut = r / scale;
    return S_OK;
}

HRESULT VarBstrCmp(BSTR left, BSTR right, LCID /*lcid*/, ULONG flags) {
    std::u16string_view a = qn::com::BstrView(left);
    std::u16string_view b = qn::com::BstrView(right);
    auto fold = [flags](char16_t c) -> char16_t {
        if ((flags & NORM_IGNORECASE) && c >= u'A' && c <= u'Z') return char16_t(c - u'A' + u'a');
        return c;
    };
    std::size_t n = a.size() < b.size() ? a.size() : b.size();
    for (std::size_t i = 0; i < n; ++i) {
        char16_t x = fold(a[i]), y = fold(b[i]);
        if (x != y) return x < y ? VARCMP_LT : VARCMP_GT;
    }
    if (a.size() == b.size()) return VARCMP_EQ;
    return a.size() < b.size() ? VARCMP_LT : VARCMP_GT;
}

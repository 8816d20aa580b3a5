#include "platform/visa/formatted_convert.h"

#include <bit>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <limits>

#include "platform/visa/errors.h"
#include "platform/visa/ieee488.h"

namespace qn::visa::fmt {
namespace {

struct TypeRow {
    LONG code;
    VARTYPE vt;
    bool binary;  // also a binary-block type
};

constexpr TypeRow kTypes[] = {
    {ASCIIType_I2, VT_I2, true},      {ASCIIType_I4, VT_I4, true},
    {ASCIIType_R4, VT_R4, true},      {ASCIIType_R8, VT_R8, true},
    {ASCIIType_BSTR, VT_BSTR, false}, {ASCIIType_Any, VT_VARIANT, false},
    {ASCIIType_UI1, VT_UI1, true},
};

struct IntRange {
    VARTYPE vt;
    double low, high;
};

constexpr IntRange kIntRanges[] = {
    {VT_I2, -32768.0, 32767.0},
    {VT_I4, -2147483648.0, 2147483647.0},
    {VT_UI1, 0.0, 255.0},
};

std::string_view Trim(std::string_view s) {
    auto blank = [](char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n'; };
    while (!s.empty() && blank(s.front())) s.remove_prefix(1);
    while (!s.empty() && blank(s.back())) s.remove_suffix(1);
    return s;
}

// The value of a VARIANT holding a number, or false.
bool NumberOf(const VARIANT& v, double* out) {
    switch (v.vt) {
        case VT_I2:
            *out = v.iVal;
            return true;
        case VT_I4:
        case VT_INT:
            *out = v.lVal;
            return true;
        case VT_R4:
            *out = v.fltVal;
            return true;
        case VT_R8:
            *out = v.dblVal;
            return true;
        case VT_UI1:
            *out = v.bVal;
            return true;
        case VT_I1:
            *out = v.cVal;
            return true;
        case VT_UI2:
            *out = v.uiVal;
            return true;
        case VT_UI4:
        case VT_UINT:
            *out = v.ulVal;
            return true;
        case VT_I8:
            *out = double(v.llVal);
            return true;
        case VT_UI8:
            *out = double(v.ullVal);
            return true;
        case VT_BOOL:
            *out = v.boolVal ? 1 : 0;
            return true;
        default:
            return false;
    }
}

// "%.15g" (digits 15) or "%.7g" (digits 7) of v.
std::string Printf(int digits, double v) {
    char buf[64];
    std::snprintf(buf, sizeof buf, "%.*g", digits, v);
    return buf;
}

}  // namespace

VARTYPE AsciiElementType(LONG type) {
    for (const TypeRow& r : kTypes)
        if (r.code == type) return r.vt;
    return VT_EMPTY;
}

VARTYPE BinaryElementType(LONG type) {
    for (const TypeRow& r : kTypes)
        if (r.code == type && r.binary) return r.vt;
    return VT_EMPTY;
}

std::size_t PlainElementSize(VARTYPE vt) {
    switch (vt) {
        case VT_UI1:
        case VT_I1:
            return 1;
        case VT_I2:
        case VT_UI2:
            return 2;
        case VT_I4:
        case VT_UI4:
        case VT_R4:
        case VT_INT:
        case VT_UINT:
            return 4;
        case VT_R8:
        case VT_I8:
        case VT_UI8:
            return 8;
        default:
            return 0;
    }
}

HRESULT FieldToVariant(std::string_view text, VARTYPE vt, VARIANT* out, std::string* error) {
    VariantClear(out);
    text = Trim(text);
    if (vt == VT_BSTR) {
        out->bstrVal = qn::com::Utf8ToBstr(text);
        if (!out->bstrVal) return E_OUTOFMEMORY;
        out->vt = VT_BSTR;
        return S_OK;
    }
    double v = 0;
    std::size_t used = 0;
    bool number = ParseNumber(text, true, &v, &used) == NumberParse::kOk && used == text.size();
    if (vt == VT_VARIANT) {
        if (!number) return FieldToVariant(text, VT_BSTR, out, error);
        vt = VT_R8;
    }
    if (!number) {
        *error = "reply field '" + std::string(text.substr(0, 40)) + "' is not a number";
        return E_VISA_INVALID_FORMAT;
    }
    for (const IntRange& r : kIntRanges) {
        if (r.vt != vt) continue;
        double t = std::trunc(v);
        if (!(t >= r.low && t <= r.high)) {
            *error = "reply value " + std::string(text.substr(0, 40)) + " out of range";
            return DISP_E_OVERFLOW;
        }
        out->vt = vt;
        if (vt == VT_I2) out->iVal = SHORT(t);
        if (vt == VT_I4) out->lVal = LONG(t);
        if (vt == VT_UI1) out->bVal = BYTE(t);
        return S_OK;
    }
    if (vt == VT_R4) {
        out->vt = VT_R4;
        out->fltVal = float(v);
    } else {
        out->vt = VT_R8;
        out->dblVal = v;
    }
    return S_OK;
}

HRESULT StoreElement(const VARIANT& value, VARTYPE vt, void* dst) {
    if (vt == VT_VARIANT) return VariantCopy(static_cast<VARIANT*>(dst), &value);
    if (vt == VT_BSTR) {
        BSTR copy = value.vt == VT_BSTR
                        ? SysAllocStringLen(value.bstrVal, SysStringLen(value.bstrVal))
                        : nullptr;
        if (!copy) return E_OUTOFMEMORY;
        *static_cast<BSTR*>(dst) = copy;
        return S_OK;
    }
    if (value.vt != vt) return E_UNEXPECTED;
    std::memcpy(dst, &value.llVal, PlainElementSize(vt));
    return S_OK;
}

HRESULT FormatValue(const VARIANT& value, VARTYPE vt, std::string* out, std::string* error) {
    if (value.vt == VT_BSTR && (vt == VT_BSTR || vt == VT_VARIANT)) {
        *out = qn::com::BstrToUtf8(value.bstrVal);
        return S_OK;
    }
    double v = 0;
    if (!NumberOf(value, &v)) {
        *error = "value of VARIANT type " + std::to_string(value.vt) + " is not a number";
        return DISP_E_TYPEMISMATCH;
    }
    if (vt == VT_VARIANT) vt = value.vt == VT_R8 ? VT_R8 : value.vt == VT_R4 ? VT_R4 : VT_I4;
    if (vt == VT_VARIANT || vt == VT_BSTR) vt = VT_R8;
    for (const IntRange& r : kIntRanges) {
        if (r.vt != vt) continue;
        double n = std::nearbyint(v);
        if (!(n >= r.low && n <= r.high)) {
            *error = "value " + Printf(15, v) + " out of range for the element type";
            return DISP_E_OVERFLOW;
        }
        *out = std::to_string(static_cast<long long>(n));
        return S_OK;
    }
    *out = vt == VT_R4 ? Printf(7, double(float(v))) : Printf(15, v);
    return S_OK;
}

HRESULT AsciiTypeOrError(LONG type, VARTYPE* vt) {
    *vt = AsciiElementType(type);
    if (*vt != VT_EMPTY) return S_OK;
    return Report(E_INVALIDARG, iid_of<IFormattedIO488>, "unknown ASCII type " + std::to_string(type));
}

HRESULT BinaryTypeOrError(LONG type, VARTYPE* vt) {
    *vt = BinaryElementType(type);
    if (*vt != VT_EMPTY) return S_OK;
    return Report(E_INVALIDARG, iid_of<IFormattedIO488>, "unknown binary type " + std::to_string(type));
}

bool NeedsSwap(bool instrument_big_endian) {
    return instrument_big_endian != (std::endian::native == std::endian::big);
}

}  // namespace qn::visa::fmt

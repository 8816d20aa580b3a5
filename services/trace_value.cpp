#include "services/trace_value.h"

#include <cstdio>

#include "platform/com/bstr.h"

namespace qn {
namespace {

template <class T>
T Read(const void* p) {
    return *static_cast<const T*>(p);
}

std::string Real(double v) {
    char buf[64];
    int n = std::snprintf(buf, sizeof buf, "%.15g", v);
    return std::string(buf, n > 0 ? static_cast<std::size_t>(n) : 0);
}

// Control characters other than tab, line feed and carriage return, and the
// non-characters U+FFFE/U+FFFF, cannot appear in an XML 1.0 document; they
// are replaced so that a trace file always parses.
std::string XmlSafeText(BSTR s) {
    std::u16string text(com::BstrView(s));
    for (char16_t& c : text) {
        bool control = c < 0x20 && c != u'\t' && c != u'\n' && c != u'\r';
        if (control || c == 0xFFFE || c == 0xFFFF) c = u'?';
    }
    return com::Utf16ToUtf8(text);
}

}  // namespace

std::string FormatTraceValue(VARTYPE vt, const void* p) {
    if (vt == VT_EMPTY) return "<empty>";
    if (vt == VT_NULL || !p) return "<null>";
    switch (vt) {
        case VT_I1:
            return std::to_string(int(Read<signed char>(p)));
        case VT_UI1:
            return std::to_string(int(Read<BYTE>(p)));
        case VT_I2:
            return std::to_string(int(Read<SHORT>(p)));
        case VT_UI2:
            return std::to_string(int(Read<USHORT>(p)));
        case VT_I4:
        case VT_INT:
            return std::to_string(int(Read<LONG>(p)));
        // Unsigned 32-bit values are written unsigned: "%d" would show large
        // values as negative numbers.
        case VT_UI4:
        case VT_UINT:
            return std::to_string(unsigned(Read<ULONG>(p)));
        case VT_I8:
            return std::to_string(static_cast<long long>(Read<LONGLONG>(p)));
        case VT_UI8:
            return std::to_string(static_cast<unsigned long long>(Read<ULONGLONG>(p)));
        case VT_R4:
            return Real(double(Read<FLOAT>(p)));
        case VT_R8:
            return Real(Read<DOUBLE>(p));
        case VT_BOOL:
            return Read<VARIANT_BOOL>(p) ? "true" : "false";
        case VT_BSTR:
            return XmlSafeText(Read<BSTR>(p));
        case VT_VARIANT:
            return "<variant>";
        case VT_DISPATCH:
        case VT_UNKNOWN:
            return "<interface>";
        default:
            return "<unknown>";
    }
}

std::string FormatTraceVariant(const VARIANT& v) {
    VARTYPE base = v.vt & VT_TYPEMASK;
    if (v.vt & VT_BYREF) return FormatTraceValue(base, v.byref);
    if (base == VT_VARIANT) return "<variant>";
    // The value members of the union all start at its first byte.
    return FormatTraceValue(base, &v.llVal);
}

TraceArrayText DescribeTraceArray(SAFEARRAY* psa, bool withElements, long maxElements) {
    TraceArrayText t;
    if (!psa) return t;
    t.numDims = static_cast<int>(SafeArrayGetDim(psa));
    for (int d = 0; d < t.numDims; ++d) {
        if (d) t.dimSizes += ',';
        t.dimSizes += std::to_string(psa->rgsabound[d].cElements);
    }
    if (!withElements || t.numDims != 1 || maxElements <= 0) return t;
    VARTYPE vt = VT_EMPTY;
    if (FAILED(SafeArrayGetVartype(psa, &vt))) return t;
    long count = static_cast<long>(psa->rgsabound[0].cElements);
    long n = count < maxElements ? count : maxElements;
    for (long i = 0; i < n; ++i) {
        LONG index = psa->rgsabound[0].lLbound + static_cast<LONG>(i);
        if (vt == VT_BSTR) {
            com::Bstr s;
            if (FAILED(SafeArrayGetElement(psa, &index, s.Out()))) break;
            BSTR raw = s.get();
            t.elements.push_back(FormatTraceValue(VT_BSTR, &raw));
        } else if (vt == VT_VARIANT) {
            com::Variant e;
            if (FAILED(SafeArrayGetElement(psa, &index, static_cast<VARIANT*>(&e)))) break;
            t.elements.push_back(e.vt & VT_ARRAY ? "<unknown>" : FormatTraceVariant(e));
        } else if (vt == VT_UNKNOWN || vt == VT_DISPATCH) {
            t.elements.emplace_back("<interface>");  // not read: reading takes a reference
        } else {
            alignas(8) unsigned char buf[16] = {};
            if (SafeArrayGetElemsize(psa) > sizeof buf) break;
            if (FAILED(SafeArrayGetElement(psa, &index, buf))) break;
            t.elements.push_back(FormatTraceValue(vt, buf));
        }
    }
    return t;
}

}  // namespace qn

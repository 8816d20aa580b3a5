// Base types of the COM / OLE Automation substitute: the fixed-width Windows
// type names, HRESULT and its standard codes, GUIDs.
#pragma once

#include <cstddef>
#include <cstdint>

using HRESULT = std::int32_t;
using LONG = std::int32_t;
using ULONG = std::uint32_t;
using SHORT = std::int16_t;
using USHORT = std::uint16_t;
using BYTE = std::uint8_t;
using CHAR = char;
using WORD = std::uint16_t;
using DWORD = std::uint32_t;
using INT = std::int32_t;
using UINT = std::uint32_t;
using LONGLONG = std::int64_t;
using ULONGLONG = std::uint64_t;
using FLOAT = float;
using DOUBLE = double;
using LCID = std::uint32_t;
using VARIANT_BOOL = std::int16_t;
using OLECHAR = char16_t;
using BSTR = OLECHAR*;
using LPCOLESTR = const OLECHAR*;
using VARTYPE = std::uint16_t;

static_assert(sizeof(HRESULT) == 4 && sizeof(LONG) == 4 && sizeof(ULONG) == 4,
              "HRESULT, LONG and ULONG are 32-bit on every platform");
static_assert(sizeof(VARIANT_BOOL) == 2, "VARIANT_BOOL is 16-bit");
static_assert(sizeof(OLECHAR) == 2, "BSTR characters are UTF-16 code units");
static_assert(sizeof(double) == 8 && sizeof(float) == 4, "IEEE 754 binary64/binary32");

constexpr VARIANT_BOOL VARIANT_TRUE = -1;
constexpr VARIANT_BOOL VARIANT_FALSE = 0;

constexpr bool SUCCEEDED(HRESULT hr) { return hr >= 0; }
constexpr bool FAILED(HRESULT hr) { return hr < 0; }

// HRESULT from its unsigned bit pattern, e.g. HRESULT_FROM_BITS(0x80004005).
constexpr HRESULT HRESULT_FROM_BITS(std::uint32_t bits) { return static_cast<HRESULT>(bits); }

constexpr HRESULT S_OK = 0;
constexpr HRESULT S_FALSE = 1;
constexpr HRESULT E_NOTIMPL = HRESULT_FROM_BITS(0x80004001);
constexpr HRESULT E_NOINTERFACE = HRESULT_FROM_BITS(0x80004002);
constexpr HRESULT E_POINTER = HRESULT_FROM_BITS(0x80004003);
constexpr HRESULT E_ABORT = HRESULT_FROM_BITS(0x80004004);
constexpr HRESULT E_FAIL = HRESULT_FROM_BITS(0x80004005);
constexpr HRESULT E_UNEXPECTED = HRESULT_FROM_BITS(0x8000FFFF);
constexpr HRESULT E_ACCESSDENIED = HRESULT_FROM_BITS(0x80070005);
constexpr HRESULT E_OUTOFMEMORY = HRESULT_FROM_BITS(0x8007000E);
constexpr HRESULT E_INVALIDARG = HRESULT_FROM_BITS(0x80070057);
constexpr HRESULT DISP_E_EXCEPTION = HRESULT_FROM_BITS(0x80020009);
constexpr HRESULT DISP_E_TYPEMISMATCH = HRESULT_FROM_BITS(0x80020005);
constexpr HRESULT DISP_E_BADINDEX = HRESULT_FROM_BITS(0x8002000B);
constexpr HRESULT DISP_E_ARRAYISLOCKED = HRESULT_FROM_BITS(0x8002000D);
constexpr HRESULT DISP_E_OVERFLOW = HRESULT_FROM_BITS(0x8002000A);
constexpr HRESULT CLASS_E_NOAGGREGATION = HRESULT_FROM_BITS(0x80040110);
constexpr HRESULT CLASS_E_CLASSNOTAVAILABLE = HRESULT_FROM_BITS(0x80040111);
constexpr HRESULT REGDB_E_CLASSNOTREG = HRESULT_FROM_BITS(0x80040154);
constexpr HRESULT CO_E_CLASSSTRING = HRESULT_FROM_BITS(0x800401F3);
constexpr HRESULT CO_E_DLLNOTFOUND = HRESULT_FROM_BITS(0x8004018F);
constexpr HRESULT CO_E_ERRORINDLL = HRESULT_FROM_BITS(0x800401F9);
constexpr HRESULT SELFREG_E_CLASS = HRESULT_FROM_BITS(0x80040201);

// Server contexts for CoCreateInstance.
constexpr DWORD CLSCTX_INPROC_SERVER = 0x1;
constexpr DWORD CLSCTX_ALL = 23;

struct GUID {
    std::uint32_t Data1;
    std::uint16_t Data2;
    std::uint16_t Data3;
    std::uint8_t Data4[8];

    friend constexpr bool operator==(const GUID& a, const GUID& b) {
        if (a.Data1 != b.Data1 || a.Data2 != b.Data2 || a.Data3 != b.Data3) return false;
        for (int i = 0; i < 8; ++i)
            if (a.Data4[i] != b.Data4[i]) return false;
        return true;
    }
};
using IID = GUID;
using CLSID = GUID;
using REFIID = const IID&;
using REFCLSID = const CLSID&;
using REFGUID = const GUID&;

namespace qn::com::detail {
constexpr std::uint32_t HexDigit(char c) {
    return c >= '0' && c <= '9'   ? std::uint32_t(c - '0')
           : c >= 'a' && c <= 'f' ? std::uint32_t(c - 'a' + 10)
           : c >= 'A' && c <= 'F' ? std::uint32_t(c - 'A' + 10)
                                  : throw "invalid hex digit in GUID literal";
}
constexpr std::uint32_t Hex(const char* s, int n) {
    std::uint32_t v = 0;
    for (int i = 0; i < n; ++i) v = v * 16 + HexDigit(s[i]);
    return v;
}
}  // namespace qn::com::detail

// GUID from its registry text without braces, "xxxxxxxx-xxxx-xxxx-xxxx-xxxxxxxxxxxx".
// Evaluated at compile time when used in a constant expression.
constexpr GUID MakeGuid(const char (&s)[37]) {
    using qn::com::detail::Hex;
    if (s[8] != '-' || s[13] != '-' || s[18] != '-' || s[23] != '-') throw "malformed GUID literal";
    GUID g{Hex(s, 8), std::uint16_t(Hex(s + 9, 4)), std::uint16_t(Hex(s + 14, 4)), {}};
    g.Data4[0] = std::uint8_t(Hex(s + 19, 2));
    g.Data4[1] = std::uint8_t(Hex(s + 21, 2));
    for (int i = 0; i < 6; ++i) g.Data4[2 + i] = std::uint8_t(Hex(s + 24 + 2 * i, 2));
    return g;
}

constexpr GUID GUID_NULL{0, 0, 0, {0, 0, 0, 0, 0, 0, 0, 0}};

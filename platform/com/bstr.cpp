#include "platform/com/bstr.h"

#include <cstdlib>
#include <cstring>
#include <limits>

namespace {
// Layout: [uint32 byte length][characters][NUL]; the BSTR points at the characters.
constexpr std::size_t kPrefix = sizeof(std::uint32_t);
constexpr UINT kMaxChars = (std::numeric_limits<std::uint32_t>::max() - 16) / 2;

std::uint32_t* Header(BSTR s) {
    return reinterpret_cast<std::uint32_t*>(reinterpret_cast<char*>(s) - kPrefix);
}
}  // namespace

BSTR SysAllocStringLen(LPCOLESTR s, UINT len) {
    if (len > kMaxChars) return nullptr;
    std::size_t bytes = std::size_t(len) * sizeof(OLECHAR);
    char* block = static_cast<char*>(std::malloc(kPrefix + bytes + sizeof(OLECHAR)));
    if (!block) return nullptr;
    auto byte_len = static_cast<std::uint32_t>(bytes);
    std::memcpy(block, &byte_len, kPrefix);
    BSTR out = reinterpret_cast<BSTR>(block + kPrefix);
    if (s)
        std::memcpy(out, s, bytes);
    else
        std::memset(out, 0, bytes);
    out[len] = 0;
    return out;
}

BSTR SysAllocString(LPCOLESTR s) {
    if (!s) return nullptr;
    UINT n = 0;
    while (s[n]) ++n;
    return SysAllocStringLen(s, n);
}

void SysFreeString(BSTR s) {
    if (s) std::free(Header(s));
}

UINT SysStringByteLen(BSTR s) { return s ? *Header(s) : 0; }
UINT SysStringLen(BSTR s) { return SysStringByteLen(s) / sizeof(OLECHAR); }

namespace qn::com {

namespace {
constexpr char32_t kReplacement = 0xFFFD;

void AppendUtf8(std::string& out, char32_t c) {
    if (c < 0x80) {
        out += char(c);
    } else if (c < 0x800) {
        out += char(0xC0 | (c >> 6));
        out += char(0x80 | (c & 0x3F));
    } else if (c < 0x10000) {
        out += char(0xE0 | (c >> 12));
        out += char(0x80 | ((c >> 6) & 0x3F));
        out += char(0x80 | (c & 0x3F));
    } else {
        out += char(0xF0 | (c >> 18));
        out += char(0x80 | ((c >> 12) & 0x3F));
        out += char(0x80 | ((c >> 6) & 0x3F));
        out += char(0x80 | (c & 0x3F));
    }
}

void AppendUtf16(std::u16string& out, char32_t c) {
    if (c < 0x10000) {
        out += char16_t(c);
    } else {
        c -= 0x10000;
        out += char16_t(0xD800 + (c >> 10));
        out += char16_t(0xDC00 + (c & 0x3FF));
    }
}
}  // namespace

std::u16string Utf8ToUtf16(std::string_view s) {
    std::u16string out;
    out.reserve(s.size());
    std::size_t i = 0;
    const std::size_t n = s.size();
    while (i < n) {
        auto b = static_cast<unsigned char>(s[i]);
        if (b < 0x80) {
            out += char16_t(b);
            ++i;
            continue;
        }
        int len = b >= 0xF0 && b <= 0xF4 ? 4 : b >= 0xE0 ? 3 : b >= 0xC2 && b <= 0xDF ? 2 : 0;
        if (b > 0xF4) len = 0;
        char32_t c = len == 2 ? (b & 0x1F) : len == 3 ? (b & 0x0F) : (b & 0x07);
        int got = 1;
        bool ok = len != 0;
        for (; ok && got < len; ++got) {
            if (i + got >= n) {
                ok = false;
                break;
            }
            auto cb = static_cast<unsigned char>(s[i + got]);
            if ((cb & 0xC0) != 0x80) {
                ok = false;
                break;
            }
            c = (c << 6) | (cb & 0x3F);
        }
        // Reject overlong forms, surrogates and values beyond U+10FFFF.
        if (ok && ((len == 3 && c < 0x800) || (len == 4 && (c < 0x10000 || c > 0x10FFFF)) ||
                   (c >= 0xD800 && c <= 0xDFFF)))
            ok = false;
        if (ok) {
            AppendUtf16(out, c);
            i += len;
        } else {
            out += char16_t(kReplacement);
            i += got > 1 ? got : 1;  // skip the lead byte and the continuation bytes it took
        }
    }
    return out;
}

std::string Utf16ToUtf8(std::u16string_view s) {
    std::string out;
    out.reserve(s.size());
    for (std::size_t i = 0; i < s.size(); ++i) {
        char32_t c = s[i];
        if (c >= 0xD800 && c <= 0xDBFF && i + 1 < s.size() && s[i + 1] >= 0xDC00 &&
            s[i + 1] <= 0xDFFF) {
            c = 0x10000 + ((c - 0xD800) << 10) + (s[i + 1] - 0xDC00);
            ++i;
        } else if (c >= 0xD800 && c <= 0xDFFF) {
            c = kReplacement;  // lone surrogate
        }
        AppendUtf8(out, c);
    }
    return out;
}

std::u16string_view BstrView(BSTR s) {
    return s ? std::u16string_view(s, SysStringLen(s)) : std::u16string_view();
}

std::string BstrToUtf8(BSTR s) { return Utf16ToUtf8(BstrView(s)); }

BSTR Utf8ToBstr(std::string_view s) {
    // Plain ASCII (the usual case for SCPI text) converts without a temporary.
    bool ascii = true;
    for (char c : s)
        if (static_cast<unsigned char>(c) >= 0x80) {
            ascii = false;
            break;
        }
    if (ascii) {
        if (s.size() > kMaxChars) return nullptr;
        BSTR out = SysAllocStringLen(nullptr, UINT(s.size()));
        if (!out) return nullptr;
        for (std::size_t i = 0; i < s.size(); ++i) out[i] = char16_t(static_cast<unsigned char>(s[i]));
        return out;
    }
    std::u16string u = Utf8ToUtf16(s);
    if (u.size() > kMaxChars) return nullptr;
    return SysAllocStringLen(u.data(), UINT(u.size()));
}

}  // namespace qn::com

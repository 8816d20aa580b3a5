// BSTR: a length-prefixed, NUL-terminated UTF-16 string allocated only here,
// and the conversions between BSTRs and the driver's narrow UTF-8 strings.
// Conversions never fail on invalid input: a malformed sequence becomes
// U+FFFD (REPLACEMENT CHARACTER).
#pragma once

#include <string>
#include <string_view>
#include <utility>

#include "platform/com/types.h"

BSTR SysAllocString(LPCOLESTR s);
BSTR SysAllocStringLen(LPCOLESTR s, UINT len);  // s may be null: len characters of zero
void SysFreeString(BSTR s);
UINT SysStringLen(BSTR s);      // characters, 0 for null
UINT SysStringByteLen(BSTR s);  // bytes, 0 for null

namespace qn::com {

std::u16string Utf8ToUtf16(std::string_view s);
std::string Utf16ToUtf8(std::u16string_view s);
std::string BstrToUtf8(BSTR s);          // null reads as ""
BSTR Utf8ToBstr(std::string_view s);     // new BSTR, null only when out of memory
std::u16string_view BstrView(BSTR s);    // null reads as ""

// Owning holder of one BSTR.
class Bstr {
public:
    Bstr() = default;
    explicit Bstr(std::string_view utf8) : s_(Utf8ToBstr(utf8)) {}
    explicit Bstr(const char* utf8) : s_(Utf8ToBstr(utf8 ? utf8 : "")) {}
    explicit Bstr(std::u16string_view u) : s_(SysAllocStringLen(u.data(), UINT(u.size()))) {}
    Bstr(const Bstr& o) : s_(o.s_ ? SysAllocStringLen(o.s_, SysStringLen(o.s_)) : nullptr) {}
    Bstr(Bstr&& o) noexcept : s_(std::exchange(o.s_, nullptr)) {}
    Bstr& operator=(Bstr o) noexcept {
        std::swap(s_, o.s_);
        return *this;
    }
    ~Bstr() { SysFreeString(s_); }

    static Bstr Adopt(BSTR s) {
        Bstr b;
        b.s_ = s;
        return b;
    }
    BSTR get() const { return s_; }
    BSTR* Out() {
        reset();
        return &s_;
    }
    [[nodiscard]] BSTR Detach() { return std::exchange(s_, nullptr); }
    BSTR Copy() const { return s_ ? SysAllocStringLen(s_, SysStringLen(s_)) : nullptr; }
    void reset() { SysFreeString(std::exchange(s_, nullptr)); }
    UINT size() const { return SysStringLen(s_); }
    bool empty() const { return size() == 0; }
    std::string utf8() const { return BstrToUtf8(s_); }
    std::u16string_view view() const { return BstrView(s_); }

private:
    BSTR s_ = nullptr;
};

}  // namespace qn::com

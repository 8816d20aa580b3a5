// BSTR allocation and the UTF-8 <-> UTF-16 conversions, including malformed input.
#include "platform/com/bstr.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

using qn::com::Bstr;
using qn::com::Utf16ToUtf8;
using qn::com::Utf8ToUtf16;

TEST(Bstr, LengthPrefixTerminatorAndEmbeddedNul) {
    const char16_t text[] = u"ab\0cd";
    Bstr b = Bstr::Adopt(SysAllocStringLen(text, 5));
    ASSERT_NE(b.get(), nullptr);
    EXPECT_EQ(SysStringLen(b.get()), 5u);
    EXPECT_EQ(SysStringByteLen(b.get()), 10u);
    EXPECT_EQ(b.get()[5], u'\0');
    EXPECT_EQ(b.view(), std::u16string_view(text, 5));
    EXPECT_EQ(b.utf8(), std::string("ab\0cd", 5));

    // SysAllocString stops at the first NUL; a null source gives a null BSTR.
    Bstr c = Bstr::Adopt(SysAllocString(text));
    EXPECT_EQ(c.size(), 2u);
    EXPECT_EQ(SysAllocString(nullptr), nullptr);
    EXPECT_EQ(SysStringLen(nullptr), 0u);
    EXPECT_EQ(SysStringByteLen(nullptr), 0u);
    SysFreeString(nullptr);
}

TEST(Bstr, NullSourceGivesZeroedCharactersAndHugeLengthFails) {
    Bstr b = Bstr::Adopt(SysAllocStringLen(nullptr, 3));
    ASSERT_NE(b.get(), nullptr);
    EXPECT_EQ(b.view(), std::u16string_view(u"\0\0\0", 3));
    EXPECT_EQ(SysAllocStringLen(u"x", 0xFFFFFFFFu), nullptr);
    EXPECT_EQ(SysAllocStringLen(u"x", 0x80000000u), nullptr);
}

struct Utf8Case {
    const char* name;
    std::string in;
    std::u16string out;
};

// Each malformed sequence becomes U+FFFD and decoding resumes right after it.
const std::vector<Utf8Case> kUtf8Cases = {
    {"ascii", "AZ", u"AZ"},
    {"two_byte", "\xC3\xA9", u"\u00E9"},
    {"three_byte", "\xE2\x82\xAC", u"\u20AC"},
    {"four_byte", "\xF0\x9F\x98\x80", u"\U0001F600"},
    {"max_code_point", "\xF4\x8F\xBF\xBF", u"\U0010FFFF"},
    {"beyond_max", "\xF4\x90\x80\x80x", u"\uFFFDx"},
    {"lead_f5", "\xF5\x80\x80\x80", u"\uFFFD\uFFFD\uFFFD\uFFFD"},
    {"overlong_c0", "\xC0\xAFx", u"\uFFFD\uFFFDx"},
    {"overlong_three", "\xE0\x80\xAFx", u"\uFFFDx"},
    {"overlong_four", "\xF0\x80\x80\xAFx", u"\uFFFDx"},
    {"encoded_surrogate", "\xED\xA0\x80x", u"\uFFFDx"},
    {"truncated_at_end", "a\xE2\x82", u"a\uFFFD"},
    {"truncated_mid", "\xE2\x82x", u"\uFFFDx"},
    {"truncated_four", "\xF0\x9F\x98", u"\uFFFD"},
    {"lone_continuation", "\x80x\xBF", u"\uFFFDx\uFFFD"},
    {"byte_ff", "\xFF\xFE", u"\uFFFD\uFFFD"},
    {"embedded_nul", std::string("a\0b", 3), std::u16string(u"a\0b", 3)},
};

TEST(Utf8ToUtf16, DecodesValidAndReplacesInvalid) {
    for (const auto& c : kUtf8Cases) {
        EXPECT_EQ(Utf8ToUtf16(c.in), c.out) << c.name;
        Bstr b = Bstr::Adopt(qn::com::Utf8ToBstr(c.in));
        ASSERT_NE(b.get(), nullptr) << c.name;
        EXPECT_EQ(b.view(), c.out) << c.name;
    }
}

TEST(Utf8ToUtf16, EveryHighByteAloneIsReplaced) {
    for (int byte = 0x80; byte <= 0xFF; ++byte) {
        std::string in{'<', char(byte), '>'};
        EXPECT_EQ(Utf8ToUtf16(in), u"<\uFFFD>") << std::hex << byte;
    }
}

TEST(Utf16ToUtf8, EncodesPairsAndReplacesLoneSurrogates) {
    EXPECT_EQ(Utf16ToUtf8(u"\u00E9\u20AC"), "\xC3\xA9\xE2\x82\xAC");
    EXPECT_EQ(Utf16ToUtf8(u"\U0010FFFF"), "\xF4\x8F\xBF\xBF");
    const char16_t lone_high[] = {0xD800, u'x', 0};
    const char16_t lone_low[] = {0xDC00, 0};
    const char16_t high_at_end[] = {u'a', 0xDBFF, 0};
    const char16_t reversed[] = {0xDC00, 0xD800, 0};
    EXPECT_EQ(Utf16ToUtf8(lone_high), "\xEF\xBF\xBDx");
    EXPECT_EQ(Utf16ToUtf8(lone_low), "\xEF\xBF\xBD");
    EXPECT_EQ(Utf16ToUtf8(high_at_end), "a\xEF\xBF\xBD");
    EXPECT_EQ(Utf16ToUtf8(reversed), "\xEF\xBF\xBD\xEF\xBF\xBD");
}

TEST(Utf8ToUtf16, RoundTripsEveryScalarValueSample) {
    for (char32_t c :
         {0x7Fu, 0x80u, 0x7FFu, 0x800u, 0xD7FFu, 0xE000u, 0xFFFDu, 0xFFFFu, 0x10000u, 0x10FFFFu}) {
        std::u16string u;
        if (c < 0x10000) {
            u += char16_t(c);
        } else {
            u += char16_t(0xD800 + ((c - 0x10000) >> 10));
            u += char16_t(0xDC00 + ((c - 0x10000) & 0x3FF));
        }
        EXPECT_EQ(Utf8ToUtf16(Utf16ToUtf8(u)), u) << std::hex << unsigned(c);
    }
}

}  // namespace

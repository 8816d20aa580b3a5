#include "services/trace_value.h"

#include <gtest/gtest.h>

#include <cstdint>

#include "platform/com/bstr.h"
#include "platform/com/safearray.h"
#include "platform/com/variant.h"

namespace qn {
namespace {

com::Variant Make(VARTYPE vt, std::uint64_t bits) {
    com::Variant v;
    v.vt = vt;
    v.ullVal = bits;
    return v;
}

TEST(TraceValue, EveryVariantTypeByValue) {
    struct Case {
        com::Variant v;
        const char* text;
    } cases[] = {
        {Make(VT_EMPTY, 0), "<empty>"},
        {Make(VT_NULL, 0), "<null>"},
        {Make(VT_I1, 0xFF), "-1"},
        {Make(VT_UI1, 0xFF), "255"},
        {Make(VT_I2, 0xFFFE), "-2"},
        {Make(VT_UI2, 0xFFFE), "65534"},
        {Make(VT_I4, 0xFFFFFFFD), "-3"},
        {Make(VT_INT, 42), "42"},
        {Make(VT_UI4, 4000000000u), "4000000000"},
        {Make(VT_UINT, 4000000001u), "4000000001"},
        {Make(VT_I8, 0xFFFFFFFFFFFFFFFFull), "-1"},
        {Make(VT_UI8, 0xFFFFFFFFFFFFFFFFull), "18446744073709551615"},
        {com::Variant::Double(0.1), "0.1"},
        {com::Variant::Double(1.0 / 3), "0.333333333333333"},
        {com::Variant::Double(-2.5e-12), "-2.5e-12"},
        {com::Variant::Bool(true), "true"},
        {com::Variant::Bool(false), "false"},
        {com::Variant::String("CHAN1"), "CHAN1"},
        {Make(VT_UNKNOWN, 0), "<interface>"},
        {Make(VT_DISPATCH, 0), "<interface>"},
        {Make(VT_ERROR, 0), "<unknown>"},
    };
    for (const Case& c : cases) EXPECT_EQ(FormatTraceVariant(c.v), c.text) << "vt " << c.v.vt;
    com::Variant r4 = Make(VT_R4, 0);
    r4.fltVal = 0.5f;
    EXPECT_EQ(FormatTraceVariant(r4), "0.5");
}

TEST(TraceValue, ByReferenceReadsThroughThePointer) {
    VARIANT_BOOL b = VARIANT_TRUE;
    double d = 1e300;
    LONG l = -7;
    VARIANT inner;
    VariantInit(&inner);
    com::Bstr s("x<y");
    BSTR raw = s.get();
    struct Case {
        VARTYPE vt;
        void* p;
        const char* text;
    } cases[] = {
        {VT_BOOL, &b, "true"},
        {VT_R8, &d, "1e+300"},
        {VT_I4, &l, "-7"},
        {VT_BSTR, &raw, "x<y"},
        {VT_VARIANT, &inner, "<variant>"},
        {VT_I4, nullptr, "<null>"},
    };
    for (const Case& c : cases) {
        VARIANT v;
        VariantInit(&v);
        v.vt = VARTYPE(c.vt | VT_BYREF);
        v.byref = c.p;
        EXPECT_EQ(FormatTraceVariant(v), c.text) << "vt " << c.vt;
    }
}

TEST(TraceValue, ControlCharactersCannotBreakTheXml) {
    com::Bstr s(
        std::u16string_view(u"a\x01"
                            u"b\tc\xFFFF"));
    BSTR raw = s.get();
    EXPECT_EQ(FormatTraceValue(VT_BSTR, &raw), "a?b\tc?");
    BSTR null = nullptr;
    EXPECT_EQ(FormatTraceValue(VT_BSTR, &null), "");
}

TEST(TraceValue, ArraysListAtMostTheLimitOfOneDimensionalElements) {
    com::SafeArray v = com::SafeArray::Vector(VT_R8, 3);
    for (LONG i = 0; i < 3; ++i) {
        double x = i + 0.5;
        SafeArrayPutElement(v.get(), &i, &x);
    }
    SAFEARRAYBOUND b2[2] = {{2, 0}, {3, 0}};
    com::SafeArray m(SafeArrayCreate(VT_I4, 2, b2));
    com::SafeArray strings = com::SafeArray::Vector(VT_BSTR, 2, 1);
    LONG idx = 1;
    SafeArrayPutElement(strings.get(), &idx, com::Bstr("a&b").get());

    struct Case {
        SAFEARRAY* psa;
        bool with;
        long limit;
        int dims;
        const char* sizes;
        std::vector<std::string> elements;
    } cases[] = {
        {v.get(), true, 10, 1, "3", {"0.5", "1.5", "2.5"}},
        {v.get(), true, 2, 1, "3", {"0.5", "1.5"}},
        {v.get(), true, 0, 1, "3", {}},
        {v.get(), false, 10, 1, "3", {}},
        {m.get(), true, 10, 2, "2,3", {}},
        {strings.get(), true, 10, 1, "2", {"a&b", ""}},
        {nullptr, true, 10, 0, "", {}},
    };
    for (const Case& c : cases) {
        TraceArrayText t = DescribeTraceArray(c.psa, c.with, c.limit);
        EXPECT_EQ(t.numDims, c.dims);
        EXPECT_EQ(t.dimSizes, c.sizes);
        EXPECT_EQ(t.elements, c.elements) << c.sizes << " limit " << c.limit;
    }
}

}  // namespace
}  // namespace qn

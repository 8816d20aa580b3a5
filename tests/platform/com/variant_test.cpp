// VARIANT copy/clear ownership, VarR8Round (round half to even) and VarBstrCmp.
#include "platform/com/variant.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <vector>

namespace {

using qn::com::Bstr;
using qn::com::Variant;

TEST(Variant, CopyDuplicatesStringsAndArrays) {
    Variant s = Variant::String("hello");
    Variant t = s;
    ASSERT_EQ(t.vt, VT_BSTR);
    EXPECT_NE(t.bstrVal, s.bstrVal);
    EXPECT_EQ(qn::com::BstrToUtf8(t.bstrVal), "hello");

    Variant a;
    a.vt = VT_ARRAY | VT_R8;
    a.parray = SafeArrayCreateVector(VT_R8, 0, 4);
    ASSERT_NE(a.parray, nullptr);
    static_cast<double*>(a.parray->pvData)[2] = 2.5;
    Variant b;
    b = a;
    ASSERT_EQ(b.vt, VT_ARRAY | VT_R8);
    EXPECT_NE(b.parray, a.parray);
    EXPECT_EQ(static_cast<double*>(b.parray->pvData)[2], 2.5);

    b = s;  // replacing an array frees it (checked by the leak sanitizer)
    EXPECT_EQ(qn::com::BstrToUtf8(b.bstrVal), "hello");
}

TEST(Variant, ClearEmptiesAndByRefIsNotOwned) {
    Bstr owned("by reference");
    BSTR raw = owned.get();
    VARIANT v;
    VariantInit(&v);
    v.vt = VT_BSTR | VT_BYREF;
    v.pbstrVal = &raw;
    VARIANT copy;
    VariantInit(&copy);
    ASSERT_EQ(VariantCopy(&copy, &v), S_OK);
    EXPECT_EQ(copy.pbstrVal, &raw);
    EXPECT_EQ(VariantClear(&copy), S_OK);
    EXPECT_EQ(VariantClear(&v), S_OK);
    EXPECT_EQ(v.vt, VT_EMPTY);
    EXPECT_EQ(VariantClear(nullptr), E_INVALIDARG);
    EXPECT_EQ(VariantCopy(nullptr, &v), E_INVALIDARG);
    EXPECT_EQ(owned.utf8(), "by reference");  // still alive: the variants did not free it
}

struct RoundCase {
    double in;
    int digits;
    double out;
};

TEST(VarR8Round, RoundsExactHalvesToEven) {
    const std::vector<RoundCase> cases = {
        {2.5, 0, 2.0},
        {3.5, 0, 4.0},
        {-2.5, 0, -2.0},
        {-3.5, 0, -4.0},
        {0.5, 0, 0.0},
        {1.5, 0, 2.0},
        {2.4, 0, 2.0},
        {2.6, 0, 3.0},
        {-2.6, 0, -3.0},
        {0.125, 2, 0.12},
        {0.375, 2, 0.38},
        {-0.125, 2, -0.12},
        {12345.0, 3, 12345.0},
        {1.000000000000001, 14, 1.0},
        {1.000000000000002, 14, 1.0},
        {1.00000000000001, 14, 1.00000000000001},
    };
    for (const auto& c : cases) {
        double r = -99;
        ASSERT_EQ(VarR8Round(c.in, c.digits, &r), S_OK) << c.in;
        EXPECT_DOUBLE_EQ(r, c.out) << c.in << " at " << c.digits;
    }
}

TEST(VarR8Round, LargeValuesAndNonFiniteInputsPassThrough) {
    const double inf = std::numeric_limits<double>::infinity();
    for (auto [in, digits] : std::vector<std::pair<double, int>>{
             {1e300, 10}, {-1e300, 10}, {1.5, 400}, {inf, 2}, {-inf, 0}, {4503599627370497.0, 0}}) {
        double r = 0;
        ASSERT_EQ(VarR8Round(in, digits, &r), S_OK);
        EXPECT_EQ(r, in) << in << " at " << digits;
    }
    double r = 0;
    ASSERT_EQ(VarR8Round(std::nan(""), 2, &r), S_OK);
    EXPECT_TRUE(std::isnan(r));
    EXPECT_EQ(VarR8Round(1.0, -1, &r), E_INVALIDARG);
    EXPECT_EQ(VarR8Round(1.0, 2, nullptr), E_INVALIDARG);
}

TEST(VarBstrCmp, OrdersByCodeUnitWithOptionalAsciiCaseFolding) {
    struct Case {
        const char* a;
        const char* b;
        ULONG flags;
        HRESULT expected;
    };
    for (Case c : {Case{"abc", "abc", 0, VARCMP_EQ}, Case{"abc", "ABC", 0, VARCMP_GT},
                   Case{"abc", "ABC", NORM_IGNORECASE, VARCMP_EQ}, Case{"ab", "abc", 0, VARCMP_LT},
                   Case{"abd", "abc", 0, VARCMP_GT}, Case{"", "", 0, VARCMP_EQ}}) {
        Bstr a(c.a), b(c.b);
        EXPECT_EQ(VarBstrCmp(a.get(), b.get(), LOCALE_USER_DEFAULT, c.flags), c.expected)
            << c.a << " vs " << c.b;
    }
    Bstr empty("");
    EXPECT_EQ(VarBstrCmp(nullptr, empty.get(), 0, 0), VARCMP_EQ);
    Bstr with_nul(std::u16string_view(u"a\0b", 3));
    Bstr prefix(std::u16string_view(u"a", 1));
    EXPECT_EQ(VarBstrCmp(with_nul.get(), prefix.get(), 0, 0), VARCMP_GT);
}

}  // namespace

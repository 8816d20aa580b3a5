// SAFEARRAY creation, bounds, typed element access, copies and ownership of
// BSTR/VARIANT elements (leaks show up under AddressSanitizer).
#include "platform/com/safearray.h"

#include <gtest/gtest.h>

#include <cstring>
#include <limits>
#include <tuple>
#include <vector>

#include "platform/com/bstr.h"
#include "platform/com/variant.h"

namespace {

using qn::com::Bstr;
using qn::com::SafeArray;

constexpr LONG kLongMin = std::numeric_limits<LONG>::min();
constexpr LONG kLongMax = std::numeric_limits<LONG>::max();

TEST(SafeArray, OneDimensionalBoundsAndTypeForEachPlainElementType) {
    struct Case {
        VARTYPE vt;
        UINT size;
    };
    for (Case c : {Case{VT_R8, 8}, Case{VT_UI1, 1}, Case{VT_I2, 2}, Case{VT_I4, 4},
                   Case{VT_BSTR, sizeof(BSTR)}, Case{VT_VARIANT, sizeof(VARIANT)}}) {
        SafeArray sa = SafeArray::Vector(c.vt, 5, -2);
        ASSERT_TRUE(sa) << c.vt;
        LONG lo = 0, hi = 0;
        VARTYPE vt = 0;
        EXPECT_EQ(SafeArrayGetLBound(sa.get(), 1, &lo) | SafeArrayGetUBound(sa.get(), 1, &hi) |
                      SafeArrayGetVartype(sa.get(), &vt),
                  S_OK);
        EXPECT_EQ(std::make_tuple(SafeArrayGetDim(sa.get()), SafeArrayGetElemsize(sa.get()), lo, hi,
                                  vt, sa.size()),
                  std::make_tuple(UINT{1}, c.size, LONG{-2}, LONG{2}, c.vt, std::size_t{5}));
        EXPECT_EQ(SafeArrayGetLBound(sa.get(), 2, &lo), DISP_E_BADINDEX);
        EXPECT_EQ(SafeArrayGetUBound(sa.get(), 0, &hi), DISP_E_BADINDEX);
    }
}

template <class T>
void ExpectPutGetRoundTrip(VARTYPE vt, T value) {
    SafeArray sa = SafeArray::Vector(vt, 3, 1);
    ASSERT_TRUE(sa);
    for (LONG i : {1, 3}) {
        EXPECT_EQ(SafeArrayPutElement(sa.get(), &i, &value), S_OK);
        T back{};
        EXPECT_EQ(SafeArrayGetElement(sa.get(), &i, &back), S_OK);
        EXPECT_EQ(back, value);
    }
    T zero{};
    LONG mid = 2;
    EXPECT_EQ(SafeArrayGetElement(sa.get(), &mid, &zero), S_OK);
    EXPECT_EQ(zero, T{});  // new arrays start zeroed
    for (LONG bad : {LONG{0}, LONG{4}, kLongMin, kLongMax}) {
        EXPECT_EQ(SafeArrayPutElement(sa.get(), &bad, &value), DISP_E_BADINDEX);
        EXPECT_EQ(SafeArrayGetElement(sa.get(), &bad, &zero), DISP_E_BADINDEX);
    }
}

TEST(SafeArray, PlainElementsRoundTripAndIndicesAreBoundsChecked) {
    ExpectPutGetRoundTrip<double>(VT_R8, -1.5e300);
    ExpectPutGetRoundTrip<BYTE>(VT_UI1, 0xA5);
    ExpectPutGetRoundTrip<SHORT>(VT_I2, -12345);
    ExpectPutGetRoundTrip<LONG>(VT_I4, -123456789);
}

TEST(SafeArray, TwoDimensionalLayoutHasDimensionOneFastest) {
    SAFEARRAYBOUND b[2] = {{3, 0}, {2, 10}};  // 3 rows (dim 1) x 2 columns (dim 2) from 10
    SafeArray sa(SafeArrayCreate(VT_I4, 2, b));
    ASSERT_TRUE(sa);
    EXPECT_EQ(sa.size(), 6u);
    LONG hi = 0;
    EXPECT_EQ(SafeArrayGetUBound(sa.get(), 2, &hi), S_OK);
    EXPECT_EQ(hi, 11);
    for (LONG j = 10; j <= 11; ++j)
        for (LONG i = 0; i <= 2; ++i) {
            LONG idx[2] = {i, j};
            LONG v = 100 * j + i;
            ASSERT_EQ(SafeArrayPutElement(sa.get(), idx, &v), S_OK);
        }
    const LONG* data = sa.data<LONG>();
    EXPECT_EQ(std::vector<LONG>(data, data + 6),
              (std::vector<LONG>{1000, 1001, 1002, 1100, 1101, 1102}));
    LONG out_of_range[2] = {0, 12};
    LONG v = 0;
    EXPECT_EQ(SafeArrayGetElement(sa.get(), out_of_range, &v), DISP_E_BADINDEX);
}

TEST(SafeArray, RejectsBadShapesAndOverflowingSizes) {
    SAFEARRAYBOUND one{4, 0};
    EXPECT_EQ(SafeArrayCreate(VT_EMPTY, 1, &one), nullptr);
    EXPECT_EQ(SafeArrayCreate(VT_R8, 0, &one), nullptr);
    EXPECT_EQ(SafeArrayCreate(VT_R8, 3, &one), nullptr);
    EXPECT_EQ(SafeArrayCreate(VT_R8, 1, nullptr), nullptr);
    SAFEARRAYBOUND huge[2] = {{0x10000, 0}, {0x10001, 0}};  // count beyond 32 bits
    EXPECT_EQ(SafeArrayCreate(VT_R8, 2, huge), nullptr);
    SAFEARRAYBOUND max2[2] = {{0xFFFFFFFF, 0}, {0xFFFFFFFF, 0}};
    EXPECT_EQ(SafeArrayCreate(VT_UI1, 2, max2), nullptr);
    // An upper bound that does not fit in a LONG cannot be described.
    EXPECT_EQ(SafeArrayCreateVector(VT_UI1, kLongMax, 2), nullptr);
    SafeArray last(SafeArrayCreateVector(VT_UI1, kLongMax, 1));
    ASSERT_TRUE(last);
    LONG hi = 0;
    EXPECT_EQ(SafeArrayGetUBound(last.get(), 1, &hi), S_OK);
    EXPECT_EQ(hi, kLongMax);
}

TEST(SafeArray, BstrElementsAreCopiedInAndOutAndFreedWithTheArray) {
    SafeArray sa = SafeArray::Vector(VT_BSTR, 3);
    Bstr text("voltage");
    LONG i = 1;
    ASSERT_EQ(SafeArrayPutElement(sa.get(), &i, text.get()), S_OK);
    ASSERT_EQ(SafeArrayPutElement(sa.get(), &i, text.get()), S_OK);  // replaces, frees the old
    EXPECT_NE(sa.data<BSTR>()[1], text.get());
    Bstr back;
    ASSERT_EQ(SafeArrayGetElement(sa.get(), &i, back.Out()), S_OK);
    EXPECT_NE(back.get(), sa.data<BSTR>()[1]);
    EXPECT_EQ(back.utf8(), "voltage");
    LONG empty_slot = 0;
    EXPECT_EQ(SafeArrayGetElement(sa.get(), &empty_slot, back.Out()), S_OK);
    EXPECT_EQ(back.get(), nullptr);

    SafeArray copy;
    ASSERT_EQ(SafeArrayCopy(sa.get(), copy.Out()), S_OK);
    EXPECT_NE(copy.data<BSTR>()[1], sa.data<BSTR>()[1]);
    sa.reset();
    EXPECT_EQ(qn::com::BstrToUtf8(copy.data<BSTR>()[1]), "voltage");
}

TEST(SafeArray, VariantElementsOwnTheirContents) {
    SafeArray sa = SafeArray::Vector(VT_VARIANT, 2);
    qn::com::Variant s = qn::com::Variant::String("abc");
    LONG i = 0;
    ASSERT_EQ(SafeArrayPutElement(sa.get(), &i, &s), S_OK);
    qn::com::Variant out;
    VariantClear(&out);
    ASSERT_EQ(SafeArrayGetElement(sa.get(), &i, &out), S_OK);
    ASSERT_EQ(out.vt, VT_BSTR);
    EXPECT_NE(out.bstrVal, s.bstrVal);
    EXPECT_EQ(qn::com::BstrToUtf8(out.bstrVal), "abc");

    SafeArray copy;
    ASSERT_EQ(SafeArrayCopy(sa.get(), copy.Out()), S_OK);
    EXPECT_NE(copy.data<VARIANT>()[0].bstrVal, sa.data<VARIANT>()[0].bstrVal);
}

TEST(SafeArray, LockedArrayIsNotDestroyed) {
    SAFEARRAY* psa = SafeArrayCreateVector(VT_BSTR, 0, 1);
    LONG i = 0;
    Bstr text("kept");
    ASSERT_EQ(SafeArrayPutElement(psa, &i, text.get()), S_OK);
    void* data = nullptr;
    ASSERT_EQ(SafeArrayAccessData(psa, &data), S_OK);
    EXPECT_EQ(data, psa->pvData);
    EXPECT_EQ(SafeArrayDestroy(psa), DISP_E_ARRAYISLOCKED);
    EXPECT_EQ(SafeArrayUnaccessData(psa), S_OK);
    EXPECT_EQ(SafeArrayUnaccessData(psa), E_UNEXPECTED);
    EXPECT_EQ(SafeArrayDestroy(psa), S_OK);
    EXPECT_EQ(SafeArrayDestroy(nullptr), S_OK);
}

// An array over the caller's memory: elements read and written in place,
// copies own their memory, destroying it leaves the memory alone (a stack
// buffer: a free of it would be caught by the sanitizers).
TEST(SafeArray, ArrayOverCallerMemoryNeverFreesIt) {
    double memory[3] = {1.5, -2.5, 4.0};
    SAFEARRAY* psa = SafeArrayCreateVectorOver(VT_R8, memory, 3);
    ASSERT_NE(psa, nullptr);
    EXPECT_EQ(psa->fFeatures & (FADF_STATIC | FADF_FIXEDSIZE), FADF_STATIC | FADF_FIXEDSIZE);
    LONG i = 2;
    double v = 9.0;
    ASSERT_EQ(SafeArrayPutElement(psa, &i, &v), S_OK);
    EXPECT_EQ(memory[2], 9.0);
    SafeArray copy;
    ASSERT_EQ(SafeArrayCopy(psa, copy.Out()), S_OK);
    EXPECT_NE(copy.data<double>(), memory);
    EXPECT_EQ(copy.get()->fFeatures & FADF_STATIC, 0);
    EXPECT_EQ(SafeArrayDestroy(psa), S_OK);
    EXPECT_EQ(memory[0], 1.5);
    EXPECT_EQ(SafeArrayCreateVectorOver(VT_BSTR, memory, 3), nullptr);
    EXPECT_EQ(SafeArrayCreateVectorOver(VT_R8, nullptr, 3), nullptr);
    SafeArray empty = SafeArray::Over(VT_R8, nullptr, 0);
    EXPECT_TRUE(empty);
}

// Arrays from just below to well above the size that is mapped on its own:
// zeroed, every element writable, copies equal, and a shrunk bound (as a
// short read leaves) still gives the whole memory back.
TEST(SafeArray, LargeArraysAreZeroedWritableAndFreedWhateverTheirBound) {
    for (const ULONG count : {524287u, 524288u, 3000001u}) {
        SCOPED_TRACE(count);
        SafeArray sa = SafeArray::Vector(VT_R8, count);
        ASSERT_TRUE(sa);
        double* d = sa.data<double>();
        bool zero = true;
        for (ULONG i = 0; i < count; i += 4093) zero = zero && d[i] == 0.0;
        EXPECT_TRUE(zero && d[count - 1] == 0.0);
        for (ULONG i = 0; i < count; ++i) d[i] = double(i);
        SafeArray copy;
        ASSERT_EQ(SafeArrayCopy(sa.get(), copy.Out()), S_OK);
        EXPECT_EQ(std::memcmp(copy.data<double>(), d, std::size_t(count) * sizeof(double)), 0);
        sa.get()->rgsabound[0].cElements = 3;
    }
}

TEST(SafeArray, EmptyArraysAndNullArguments) {
    SafeArray empty = SafeArray::Vector(VT_R8, 0), sa = SafeArray::Vector(VT_I4, 1), copy;
    LONG i = 0, v = 0;
    EXPECT_EQ(SafeArrayGetElement(empty.get(), &i, &v), DISP_E_BADINDEX);
    EXPECT_EQ(SafeArrayCopy(empty.get(), copy.Out()), S_OK);
    EXPECT_EQ(copy.size(), 0u);
    EXPECT_EQ(SafeArrayGetElement(nullptr, &i, &v), E_INVALIDARG);
    EXPECT_EQ(SafeArrayGetElement(sa.get(), nullptr, &v), E_INVALIDARG);
    EXPECT_EQ(SafeArrayGetElement(sa.get(), &i, nullptr), E_INVALIDARG);
    EXPECT_EQ(SafeArrayPutElement(sa.get(), &i, nullptr), E_INVALIDARG);
    EXPECT_EQ(SafeArrayCopy(sa.get(), nullptr), E_INVALIDARG);
    SAFEARRAY* out = reinterpret_cast<SAFEARRAY*>(1);
    EXPECT_EQ(SafeArrayCopy(nullptr, &out), S_OK);
    EXPECT_EQ(out, nullptr);
}

}  // namespace

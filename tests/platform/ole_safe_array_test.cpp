// COleSafeArray: one-dimensional arrays made, filled, read, resized and
// copied; attach and detach of ownership; failures as COleException.
#include "support/counting_unknown.h"
#include "support/ole_text.h"

#include <vaskel/framework/ole_safe_array.h>

#include <gtest/gtest.h>

#include <climits>
#include <limits>

namespace {

using vaskel::COleException;
using vaskel::COleSafeArray;
using vaskel_test::CountingUnknown;
using vaskel_test::Ole;

template <class Call>
HRESULT ThrownBy(Call call) {
    try {
        call();
    } catch (const COleException& e) {
        return e.m_sc;
    }
    return S_OK;
}

TEST(COleSafeArray, StartsEmptyAndIsAVariant) {
    COleSafeArray array;
    EXPECT_EQ(array.vt, VT_EMPTY);
    EXPECT_EQ(array.GetDim(), 0u);
    LPVARIANT asVariant = array;
    EXPECT_EQ(asVariant, static_cast<VARIANT*>(&array));
    const COleSafeArray& constant = array;
    LPCVARIANT asConst = constant;
    EXPECT_EQ(asConst, static_cast<const VARIANT*>(&array));
}

TEST(COleSafeArray, CreateOneDimCopiesTheSourceWithItsBounds) {
    const LONG values[] = {10, 20, 30};
    COleSafeArray array;
    array.CreateOneDim(VT_I4, 3, values, -1);
    EXPECT_EQ(array.vt, VT_ARRAY | VT_I4);
    EXPECT_EQ(array.GetDim(), 1u);
    EXPECT_EQ(array.GetOneDimSize(), 3u);
    EXPECT_EQ(array.GetElemSize(), 4u);
    long lower = 0, upper = 0;
    array.GetLBound(1, &lower);
    array.GetUBound(1, &upper);
    EXPECT_EQ(lower, -1);
    EXPECT_EQ(upper, 1);
    for (long i = -1; i <= 1; ++i) {
        LONG value = 0;
        array.GetElement(&i, &value);
        EXPECT_EQ(value, values[i + 1]);
    }
}

TEST(COleSafeArray, CreateOneDimWithoutSourceIsZeroed) {
    COleSafeArray array;
    array.CreateOneDim(VT_R8, 2);
    long index = 1;
    double value = 7;
    array.GetElement(&index, &value);
    EXPECT_EQ(value, 0.0);
    value = 2.5;
    array.PutElement(&index, &value);
    value = 0;
    array.GetElement(&index, &value);
    EXPECT_EQ(value, 2.5);
}

TEST(COleSafeArray, StringsAndVariantsAreCopiedDeeply) {
    BSTR texts[] = {SysAllocString(Ole("one").c_str()), SysAllocString(Ole("two").c_str())};
    COleSafeArray strings;
    strings.CreateOneDim(VT_BSTR, 2, texts);
    SysFreeString(texts[0]);
    SysFreeString(texts[1]);
    long index = 1;
    BSTR read = nullptr;
    strings.GetElement(&index, &read);
    EXPECT_EQ(Ole(read), Ole("two"));
    SysFreeString(read);

    COleSafeArray variants;
    variants.CreateOneDim(VT_VARIANT, 1);
    VARIANT in;
    VariantInit(&in);
    in.vt = VT_BSTR;
    in.bstrVal = SysAllocString(Ole("text").c_str());
    index = 0;
    variants.PutElement(&index, &in);
    VariantClear(&in);
    VARIANT out;
    VariantInit(&out);
    variants.GetElement(&index, &out);
    ASSERT_EQ(out.vt, VT_BSTR);
    EXPECT_EQ(Ole(out.bstrVal), Ole("text"));
    VariantClear(&out);
}

TEST(COleSafeArray, InterfacesAreReferencedAndReleased) {
    CountingUnknown object;
    IUnknown* items[] = {&object, &object};
    {
        COleSafeArray array;
        array.CreateOneDim(VT_UNKNOWN, 2, items);
        EXPECT_EQ(object.references, 3u);
        array.ResizeOneDim(1);
        EXPECT_EQ(object.references, 2u);
        COleSafeArray copy(array);
        EXPECT_EQ(object.references, 3u);
    }
    EXPECT_EQ(object.references, 1u);
}

TEST(COleSafeArray, ResizeKeepsElementsAndLowerBound) {
    BSTR texts[] = {SysAllocString(Ole("a").c_str()), SysAllocString(Ole("b").c_str()),
                    SysAllocString(Ole("c").c_str())};
    COleSafeArray array;
    array.CreateOneDim(VT_BSTR, 3, texts, 5);
    for (BSTR text : texts)
        SysFreeString(text);

    array.ResizeOneDim(5);
    EXPECT_EQ(array.GetOneDimSize(), 5u);
    long lower = 0, upper = 0;
    array.GetLBound(1, &lower);
    array.GetUBound(1, &upper);
    EXPECT_EQ(lower, 5);
    EXPECT_EQ(upper, 9);
    const char* expected[] = {"a", "b", "c", "", ""};
    for (long i = 5; i <= 9; ++i) {
        BSTR text = nullptr;
        array.GetElement(&i, &text);
        EXPECT_EQ(Ole(text), Ole(expected[i - 5])) << i;
        SysFreeString(text);
    }

    array.ResizeOneDim(1);
    EXPECT_EQ(array.GetOneDimSize(), 1u);
    long index = 5;
    BSTR text = nullptr;
    array.GetElement(&index, &text);
    EXPECT_EQ(Ole(text), Ole("a"));
    SysFreeString(text);

    array.ResizeOneDim(0);
    EXPECT_EQ(array.GetOneDimSize(), 0u);
}

TEST(COleSafeArray, CopiesAreIndependent) {
    const short values[] = {1, 2};
    COleSafeArray original;
    original.CreateOneDim(VT_I2, 2, values);
    COleSafeArray copy(original);
    COleSafeArray assigned;
    assigned.CreateOneDim(VT_R8, 4);
    assigned = original;
    EXPECT_EQ(assigned.vt, VT_ARRAY | VT_I2);
    EXPECT_NE(copy.parray, original.parray);
    EXPECT_NE(assigned.parray, original.parray);

    long index = 0;
    short value = 9;
    original.PutElement(&index, &value);
    copy.GetElement(&index, &value);
    EXPECT_EQ(value, 1);
    assigned.GetElement(&index, &value);
    EXPECT_EQ(value, 1);

    COleSafeArray& alias = assigned;
    assigned = alias;
    EXPECT_EQ(assigned.GetOneDimSize(), 2u);
}

TEST(COleSafeArray, DetachAndAttachMoveOwnership) {
    COleSafeArray array;
    array.CreateOneDim(VT_I4, 3);
    SAFEARRAY* raw = array.parray;
    VARIANT detached = array.Detach();
    EXPECT_EQ(array.vt, VT_EMPTY);
    EXPECT_EQ(array.GetDim(), 0u);
    EXPECT_EQ(detached.vt, VT_ARRAY | VT_I4);
    EXPECT_EQ(detached.parray, raw);

    COleSafeArray other;
    other.CreateOneDim(VT_I2, 1);
    other.Attach(detached);
    EXPECT_EQ(detached.vt, VT_EMPTY);
    EXPECT_EQ(other.parray, raw);
    EXPECT_EQ(other.GetOneDimSize(), 3u);

    other.Clear();
    EXPECT_EQ(other.vt, VT_EMPTY);
}

TEST(COleSafeArray, AttachRefusesAVariantWithoutAnArray) {
    VARIANT number;
    VariantInit(&number);
    number.vt = VT_I4;
    number.lVal = 4;
    COleSafeArray array;
    array.CreateOneDim(VT_I4, 2);
    EXPECT_EQ(ThrownBy([&] { array.Attach(number); }), E_INVALIDARG);
    EXPECT_EQ(number.vt, VT_I4);
    EXPECT_EQ(array.GetOneDimSize(), 2u);
    EXPECT_EQ(ThrownBy([&] { COleSafeArray fromNumber(number); }), DISP_E_TYPEMISMATCH);
}

TEST(COleSafeArray, CreateMakesSeveralDimensions) {
    SAFEARRAYBOUND bounds[] = {{2, 0}, {3, 1}};
    COleSafeArray array;
    array.Create(VT_I4, 2, bounds);
    EXPECT_EQ(array.GetDim(), 2u);
    long lower = 0, upper = 0;
    array.GetLBound(2, &lower);
    array.GetUBound(2, &upper);
    EXPECT_EQ(lower, 1);
    EXPECT_EQ(upper, 3);
    long indices[] = {1, 3};
    LONG value = 42;
    array.PutElement(indices, &value);
    value = 0;
    array.GetElement(indices, &value);
    EXPECT_EQ(value, 42);
    // Only a vector has a one-dimensional size.
    EXPECT_EQ(ThrownBy([&] { array.GetOneDimSize(); }), E_INVALIDARG);
    EXPECT_EQ(ThrownBy([&] { array.ResizeOneDim(1); }), E_INVALIDARG);
}

TEST(COleSafeArrayFailures, ReportTheSystemsError) {
    COleSafeArray array;
    array.CreateOneDim(VT_I4, 2);
    long index = 2;
    LONG value = 0;
    EXPECT_EQ(ThrownBy([&] { array.GetElement(&index, &value); }), DISP_E_BADINDEX);
    EXPECT_EQ(ThrownBy([&] { array.PutElement(&index, &value); }), DISP_E_BADINDEX);
    long bound = 0;
    EXPECT_EQ(ThrownBy([&] { array.GetLBound(2, &bound); }), DISP_E_BADINDEX);
    EXPECT_EQ(ThrownBy([&] { array.GetUBound(0, &bound); }), DISP_E_BADINDEX);

    void* data = nullptr;
    array.AccessData(&data);
    EXPECT_EQ(ThrownBy([&] { array.ResizeOneDim(4); }), DISP_E_ARRAYISLOCKED);
    EXPECT_EQ(ThrownBy([&] { array.Clear(); }), DISP_E_ARRAYISLOCKED);
    EXPECT_EQ(ThrownBy([&] { array.CreateOneDim(VT_I2, 1); }), DISP_E_ARRAYISLOCKED);
    array.UnaccessData();
    EXPECT_EQ(array.GetOneDimSize(), 2u);
}

TEST(COleSafeArrayFailures, AnEmptyValueHasNoArray) {
    COleSafeArray array;
    long bound = 0;
    EXPECT_EQ(ThrownBy([&] { array.GetOneDimSize(); }), E_INVALIDARG);
    EXPECT_EQ(ThrownBy([&] { array.GetLBound(1, &bound); }), E_INVALIDARG);
    EXPECT_EQ(ThrownBy([&] { array.ResizeOneDim(3); }), E_INVALIDARG);
    LONG value = 0;
    EXPECT_EQ(ThrownBy([&] { array.GetElement(&bound, &value); }), E_INVALIDARG);
}

// long is wider than LONG on 64-bit POSIX; bounds and indices past the
// LONG range are refused, never cut.
TEST(COleSafeArrayFailures, BoundsOutsideLongAreRefused) {
    const long longMax = std::numeric_limits<LONG>::max();
    COleSafeArray array;
    EXPECT_EQ(ThrownBy([&] { array.CreateOneDim(VT_I4, 2, nullptr, longMax); }), E_INVALIDARG);
    EXPECT_EQ(array.vt, VT_EMPTY);
    array.CreateOneDim(VT_I4, 1, nullptr, longMax);
    EXPECT_EQ(array.GetOneDimSize(), 1u);
    EXPECT_EQ(ThrownBy([&] { array.ResizeOneDim(2); }), E_INVALIDARG);
    EXPECT_EQ(array.GetOneDimSize(), 1u);
#if LONG_MAX > 0x7FFFFFFFL
    {
        const long wide = longMax + 1;
        EXPECT_EQ(ThrownBy([&] { array.CreateOneDim(VT_I4, 1, nullptr, wide); }), E_INVALIDARG);
        EXPECT_EQ(array.GetOneDimSize(), 1u);
        // Cut to 32 bits this would be a valid index.
        long index = wide * 2 + longMax;
        LONG value = 0;
        EXPECT_EQ(ThrownBy([&] { array.GetElement(&index, &value); }), E_INVALIDARG);
    }
#endif
}

} // namespace

// Variants: the record's layout, and clearing and copying values that own
// strings, interfaces and arrays.
#include "support/counting_unknown.h"
#include "support/wine.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cstddef>
#include <cstring>

namespace {

using vaskel_test::CountingUnknown;

VARIANT Holding(BSTR text) {
    VARIANT value;
    VariantInit(&value);
    value.vt = VT_BSTR;
    value.bstrVal = text;
    return value;
}

VARIANT Holding(IUnknown* object) {
    VARIANT value;
    VariantInit(&value);
    value.vt = VT_UNKNOWN;
    value.punkVal = object;
    return value;
}

TEST(VariantLayout, MatchesTheSystemRecord) {
    EXPECT_EQ(sizeof(VARIANT), 8 + 2 * sizeof(void*));
    EXPECT_EQ(offsetof(VARIANT, vt), 0u);
    EXPECT_EQ(offsetof(VARIANT, lVal), 8u);
    EXPECT_EQ(offsetof(VARIANT, llVal), 8u);
    EXPECT_EQ(offsetof(VARIANT, punkVal), 8u);
    EXPECT_EQ(sizeof(DECIMAL), 16u);
    EXPECT_EQ(sizeof(CY), 8u);
    EXPECT_EQ(VARIANT_TRUE, -1);

    // A decimal overlays the whole variant, its reserved word the type code.
    VARIANT value;
    value.decVal.Lo64 = 12345;
    value.decVal.Hi32 = 0;
    value.decVal.signscale = 0;
    value.vt = VT_DECIMAL;
    EXPECT_EQ(value.decVal.wReserved, VT_DECIMAL);
    EXPECT_EQ(value.decVal.Lo64, 12345u);
}

TEST(VariantClear, FreesOwnedValuesAndEmpties) {
    CountingUnknown object;
    object.AddRef();
    VARIANT value = Holding(&object);
    EXPECT_EQ(VariantClear(&value), S_OK);
    EXPECT_EQ(value.vt, VT_EMPTY);
    EXPECT_EQ(object.references, 1u);

    const OLECHAR text[] = {'x', 0};
    value = Holding(SysAllocString(text));
    EXPECT_EQ(VariantClear(&value), S_OK);
    EXPECT_EQ(value.vt, VT_EMPTY);

    value.vt = VT_ARRAY | VT_I4;
    value.parray = SafeArrayCreateVector(VT_I4, 0, 3);
    EXPECT_EQ(VariantClear(&value), S_OK);
    EXPECT_EQ(value.vt, VT_EMPTY);
}

TEST(VariantClear, LeavesReferencedValuesAlone) {
    CountingUnknown object;
    IUnknown* pointer = &object;
    VARIANT value;
    value.vt = VT_UNKNOWN | VT_BYREF;
    value.ppunkVal = &pointer;
    EXPECT_EQ(VariantClear(&value), S_OK);
    EXPECT_EQ(value.vt, VT_EMPTY);
    EXPECT_EQ(object.references, 1u);
}

TEST(VariantClear, RefusesTypesAVariantCannotHold) {
    for (VARTYPE vt :
         {VARTYPE(15), VARTYPE(0x7f), VARTYPE(VT_VECTOR | VT_I4), VARTYPE(VT_RESERVED | VT_I4)}) {
        VARIANT value;
        value.vt = vt;
        EXPECT_EQ(VariantClear(&value), DISP_E_BADVARTYPE) << vt;
        EXPECT_EQ(value.vt, vt);
    }
}

TEST(VariantCopy, DuplicatesStringsWithEveryByte) {
    BSTR text = SysAllocStringByteLen("a\0bcd", 5);
    VARIANT source = Holding(text), copy;
    VariantInit(&copy);
    ASSERT_EQ(VariantCopy(&copy, &source), S_OK);
    ASSERT_EQ(copy.vt, VT_BSTR);
    EXPECT_NE(copy.bstrVal, text);
    EXPECT_EQ(SysStringByteLen(copy.bstrVal), 5u);
    EXPECT_EQ(std::memcmp(copy.bstrVal, "a\0bcd", 5), 0);
    copy.bstrVal[0] = 'z';
    EXPECT_EQ(text[0], 'a');
    EXPECT_EQ(VariantClear(&copy), S_OK);
    EXPECT_EQ(VariantClear(&source), S_OK);
}

TEST(VariantCopy, KeepsInterfaceReferencesBalanced) {
    CountingUnknown first, second;
    VARIANT source = Holding(&first), copy = Holding(&second);
    second.AddRef();
    ASSERT_EQ(VariantCopy(&copy, &source), S_OK);
    EXPECT_EQ(copy.punkVal, &first);
    EXPECT_EQ(first.references, 2u);
    // The value the destination held is released.
    EXPECT_EQ(second.references, 1u);
    EXPECT_EQ(VariantClear(&copy), S_OK);
    EXPECT_EQ(first.references, 1u);
}

TEST(VariantCopy, CopiesArraysIndependently) {
    VARIANT source, copy;
    VariantInit(&copy);
    source.vt = VT_ARRAY | VT_I4;
    source.parray = SafeArrayCreateVector(VT_I4, 0, 2);
    LONG index = 1, number = 7;
    ASSERT_EQ(SafeArrayPutElement(source.parray, &index, &number), S_OK);
    ASSERT_EQ(VariantCopy(&copy, &source), S_OK);
    EXPECT_NE(copy.parray, source.parray);
    number = 8;
    ASSERT_EQ(SafeArrayPutElement(source.parray, &index, &number), S_OK);
    LONG read = 0;
    ASSERT_EQ(SafeArrayGetElement(copy.parray, &index, &read), S_OK);
    EXPECT_EQ(read, 7);
    EXPECT_EQ(VariantClear(&copy), S_OK);
    EXPECT_EQ(VariantClear(&source), S_OK);
}

TEST(VariantCopy, CopiesReferencesAsReferences) {
    LONG number = 5;
    VARIANT source, copy;
    VariantInit(&copy);
    source.vt = VT_I4 | VT_BYREF;
    source.plVal = &number;
    ASSERT_EQ(VariantCopy(&copy, &source), S_OK);
    EXPECT_EQ(copy.vt, VT_I4 | VT_BYREF);
    EXPECT_EQ(copy.plVal, &number);
}

TEST(VariantCopy, RefusesABadSourceAndKeepsTheDestination) {
    VARIANT source, copy;
    source.vt = VT_VECTOR | VT_I4;
    copy.vt = VT_I4;
    copy.lVal = 3;
    EXPECT_EQ(VariantCopy(&copy, &source), DISP_E_BADVARTYPE);
    EXPECT_EQ(copy.vt, VT_I4);
    EXPECT_EQ(copy.lVal, 3);
}

TEST(VariantCopyInd, CopiesWhatReferencesPointAt) {
    LONG number = 42;
    VARIANT source, copy;
    VariantInit(&copy);
    source.vt = VT_I4 | VT_BYREF;
    source.plVal = &number;
    ASSERT_EQ(VariantCopyInd(&copy, &source), S_OK);
    EXPECT_EQ(copy.vt, VT_I4);
    EXPECT_EQ(copy.lVal, 42);

    const OLECHAR chars[] = {'h', 'i', 0};
    BSTR text = SysAllocString(chars);
    source.vt = VT_BSTR | VT_BYREF;
    source.pbstrVal = &text;
    ASSERT_EQ(VariantCopyInd(&copy, &source), S_OK);
    ASSERT_EQ(copy.vt, VT_BSTR);
    EXPECT_NE(copy.bstrVal, text);
    EXPECT_EQ(SysStringLen(copy.bstrVal), 2u);
    EXPECT_EQ(VariantClear(&copy), S_OK);

    DECIMAL decimal = {};
    decimal.Lo64 = 99;
    decimal.sign = DECIMAL_NEG;
    source.vt = VT_DECIMAL | VT_BYREF;
    source.pdecVal = &decimal;
    ASSERT_EQ(VariantCopyInd(&copy, &source), S_OK);
    EXPECT_EQ(copy.vt, VT_DECIMAL);
    EXPECT_EQ(copy.decVal.Lo64, 99u);
    EXPECT_EQ(copy.decVal.sign, DECIMAL_NEG);
    SysFreeString(text);
}

TEST(VariantCopyInd, CopiesAReferencedVariantDeeply) {
    CountingUnknown object;
    VARIANT inner = Holding(&object), source, copy;
    VariantInit(&copy);
    source.vt = VT_VARIANT | VT_BYREF;
    source.pvarVal = &inner;
    ASSERT_EQ(VariantCopyInd(&copy, &source), S_OK);
    EXPECT_EQ(copy.vt, VT_UNKNOWN);
    EXPECT_EQ(object.references, 2u);
    EXPECT_EQ(VariantClear(&copy), S_OK);
    EXPECT_EQ(object.references, 1u);

    VARIANT outer;
    outer.vt = VT_VARIANT | VT_BYREF;
    outer.pvarVal = &source;
    EXPECT_EQ(VariantCopyInd(&copy, &outer), E_INVALIDARG);
}

TEST(VariantCopyInd, ReplacesAReferenceInPlace) {
    SHORT number = -2;
    VARIANT value;
    value.vt = VT_I2 | VT_BYREF;
    value.piVal = &number;
    ASSERT_EQ(VariantCopyInd(&value, &value), S_OK);
    EXPECT_EQ(value.vt, VT_I2);
    EXPECT_EQ(value.iVal, -2);
}

TEST(VariantCopyInd, RefusesANullReference) {
    if (vaskel_test::RunningOnWine())
        GTEST_SKIP() << "the system follows the null reference";
    VARIANT source, copy;
    VariantInit(&copy);
    source.vt = VT_I4 | VT_BYREF;
    source.plVal = nullptr;
    EXPECT_EQ(VariantCopyInd(&copy, &source), E_INVALIDARG);
    EXPECT_EQ(copy.vt, VT_EMPTY);
}

} // namespace

// Vector views of safe arrays: sizes and bounds, element views of each
// element type, clamped iterator moves, the four ownership options, moving
// elements out, and the raw element helpers.
#include "support/counting_unknown.h"
#include "support/ole_text.h"

#include <vaskel/value.h>

#include <gtest/gtest.h>

#include <cstring>

namespace {

using vaskel::const_safearrayiterator;
using vaskel::EVariantOwnershipOptions;
using vaskel::orvariant_t;
using vaskel::safearrayvector;
using vaskel::tmpvariant_t;
using vaskel_test::CountingUnknown;
using vaskel_test::Ole;

// A variant that holds a new vector of count elements from lowerBound.
orvariant_t ArrayOf(VARTYPE type, ULONG count, LONG lowerBound = 0) {
    orvariant_t value;
    value.parray = SafeArrayCreateVector(type, lowerBound, count);
    value.vt = static_cast<VARTYPE>(VT_ARRAY | type);
    return value;
}

orvariant_t LongsFrom(LONG lowerBound, std::initializer_list<LONG> values) {
    orvariant_t array = ArrayOf(VT_I4, static_cast<ULONG>(values.size()), lowerBound);
    LONG* data = nullptr;
    SafeArrayAccessData(array.parray, reinterpret_cast<void**>(&data));
    std::copy(values.begin(), values.end(), data);
    SafeArrayUnaccessData(array.parray);
    return array;
}

orvariant_t Strings(std::initializer_list<const char*> texts) {
    orvariant_t array = ArrayOf(VT_BSTR, static_cast<ULONG>(texts.size()));
    BSTR* data = nullptr;
    SafeArrayAccessData(array.parray, reinterpret_cast<void**>(&data));
    for (const char* text : texts)
        *data++ = SysAllocString(Ole(text).c_str());
    SafeArrayUnaccessData(array.parray);
    return array;
}

template <typename Action>
HRESULT ThrownCode(Action action) {
    try {
        action();
    } catch (const _com_error& error) {
        return error.Error();
    }
    return S_OK;
}

TEST(SafeArrayVectorShape, ShowsASingleValueAsOneElement) {
    orvariant_t value(7L);
    const safearrayvector vector(value, vaskel::OwnershipBorrow);
    EXPECT_EQ(vector.size(), 1u);
    EXPECT_EQ(vector.GetArrayType(), VT_I4);
    EXPECT_EQ(vector.at(0).vt, VT_I4);
    EXPECT_EQ(vector.at(0).lVal, 7);
    EXPECT_EQ(vector.at(1).vt, VT_EMPTY);
}

TEST(SafeArrayVectorShape, CountsFromTheLowerBound) {
    orvariant_t array = LongsFrom(5, {50, 60, 70, 80, 90});
    const safearrayvector vector(array, vaskel::OwnershipBorrow);
    EXPECT_EQ(vector.size(), 5u);
    EXPECT_EQ(vector.front().lVal, 50);
    EXPECT_EQ(vector[2].lVal, 70);
    EXPECT_EQ(vector.back().lVal, 90);
    EXPECT_EQ(vector.at(5).vt, VT_EMPTY);
    EXPECT_EQ(vector.at(0xFFFFFFFFu).vt, VT_EMPTY);
}

TEST(SafeArrayVectorShape, LocksTheArrayWhileShowingIt) {
    orvariant_t array = LongsFrom(0, {1});
    {
        const safearrayvector vector(array, vaskel::OwnershipBorrow);
        EXPECT_EQ(array.parray->cLocks, 1u);
        EXPECT_EQ(SafeArrayDestroy(array.parray), DISP_E_ARRAYISLOCKED);
    }
    EXPECT_EQ(array.parray->cLocks, 0u);
}

TEST(SafeArrayVectorShape, ShowsBytesInOrder) {
    orvariant_t array = ArrayOf(VT_UI1, 3);
    BYTE* data = nullptr;
    SafeArrayAccessData(array.parray, reinterpret_cast<void**>(&data));
    data[0] = 1;
    data[1] = 2;
    data[2] = 255;
    SafeArrayUnaccessData(array.parray);
    const safearrayvector vector(array, vaskel::OwnershipBorrow);
    BYTE expected[] = {1, 2, 255};
    int i = 0;
    for (auto it = vector.begin(); it != vector.end(); ++it, ++i) {
        EXPECT_EQ((*it).vt, VT_UI1);
        EXPECT_EQ((*it).bVal, expected[i]);
    }
    EXPECT_EQ(i, 3);
}

TEST(SafeArrayVectorShape, ShowsEveryElementKind) {
    orvariant_t doubles = ArrayOf(VT_R8, 2);
    static_cast<double*>(doubles.parray->pvData)[1] = 2.5;
    EXPECT_EQ(safearrayvector(doubles, vaskel::OwnershipBorrow).at(1).dblVal, 2.5);

    orvariant_t decimals = ArrayOf(VT_DECIMAL, 2);
    static_cast<DECIMAL*>(decimals.parray->pvData)[1].Lo64 = 42;
    const tmpvariant_t decimal = safearrayvector(decimals, vaskel::OwnershipBorrow).at(1);
    EXPECT_EQ(decimal.vt, VT_DECIMAL);
    EXPECT_EQ(decimal.decVal.Lo64, 42u);

    orvariant_t variants = ArrayOf(VT_VARIANT, 2);
    VARIANT* slots = static_cast<VARIANT*>(variants.parray->pvData);
    slots[1].vt = VT_I2;
    slots[1].iVal = -4;
    const tmpvariant_t element = safearrayvector(variants, vaskel::OwnershipBorrow).at(1);
    EXPECT_EQ(element.vt, VT_I2);
    EXPECT_EQ(element.iVal, -4);

    orvariant_t strings = Strings({"zero", "one"});
    const safearrayvector vector(strings, vaskel::OwnershipBorrow);
    EXPECT_EQ(vector.at(1).vt, VT_BSTR);
    EXPECT_EQ(Ole(vector.at(1).bstrVal), Ole("one"));
    EXPECT_EQ(vector.at(1).bstrVal, static_cast<BSTR*>(strings.parray->pvData)[1]); // a view
}

TEST(SafeArrayVectorShape, HandlesEmptyArrays) {
    orvariant_t array = ArrayOf(VT_I4, 0);
    const safearrayvector vector(array, vaskel::OwnershipBorrow);
    EXPECT_TRUE(vector.empty());
    EXPECT_TRUE(vector.begin() == vector.end());
    EXPECT_EQ(vector.front().vt, VT_EMPTY);
    EXPECT_EQ(vector.back().vt, VT_EMPTY);
}

TEST(SafeArrayVectorShape, RefusesElementsItCannotShow) {
    orvariant_t currency = ArrayOf(VT_CY, 2);
    const safearrayvector vector(currency, vaskel::OwnershipBorrow);
    EXPECT_EQ(vector.size(), 2u);
    EXPECT_EQ(ThrownCode([&] { vector.begin(); }), E_INVALIDARG);

    orvariant_t empty = ArrayOf(VT_CY, 0);
    EXPECT_EQ(ThrownCode([&] { safearrayvector(empty, vaskel::OwnershipBorrow).begin(); }), S_OK);
}

TEST(SafeArrayVectorShape, RefusesArraysByReferenceAndMismatchedStrides) {
    orvariant_t array = LongsFrom(0, {1, 2});
    VARIANT reference;
    VariantInit(&reference);
    reference.vt = VT_ARRAY | VT_BYREF | VT_I4;
    reference.pparray = &array.parray;
    safearrayvector vector;
    EXPECT_EQ(vector.Set(reference, vaskel::OwnershipBorrow), E_INVALIDARG);

    // Four-byte elements read as eight-byte ones would run past the end.
    VARIANT lying;
    VariantInit(&lying);
    lying.vt = VT_ARRAY | VT_R8;
    lying.parray = array.parray;
    EXPECT_EQ(vector.Set(lying, vaskel::OwnershipBorrow), E_INVALIDARG);
    EXPECT_EQ(array.parray->cLocks, 0u);
}

TEST(SafeArrayIterator, ClampsMovesAtBothEnds) {
    orvariant_t array = LongsFrom(0, {10, 20, 30});
    const safearrayvector vector(array, vaskel::OwnershipBorrow);
    auto first = vector.begin();
    --first;
    EXPECT_EQ(first.GetIndex(), 0u);
    EXPECT_EQ((*first).lVal, 10);
    auto last = vector.end();
    last + 5;
    EXPECT_EQ(last.GetIndex(), 3u);
    EXPECT_EQ((*last).vt, VT_EMPTY);
    last - 1;
    EXPECT_EQ((*last).lVal, 30);
    auto walker = vector.begin();
    const auto before = walker++;
    EXPECT_EQ((*before).lVal, 10);
    EXPECT_EQ((*walker).lVal, 20);
    const auto again = walker--;
    EXPECT_EQ((*again).lVal, 20);
    EXPECT_EQ((*walker).lVal, 10);
    EXPECT_TRUE(walker == vector.begin());
}

TEST(SafeArrayVectorOwnership, CopiesTakesAndBorrows) {
    orvariant_t source = Strings({"a", "b"});
    {
        safearrayvector copy(source, vaskel::OwnershipCopy);
        EXPECT_TRUE(copy.CanTransferElementOwnership());
        EXPECT_NE(copy.at(0).bstrVal, static_cast<BSTR*>(source.parray->pvData)[0]);
    }
    EXPECT_EQ(source.parray->cLocks, 0u);

    orvariant_t constant = Strings({"c"});
    safearrayvector vector;
    EXPECT_EQ(vector.Set(static_cast<const VARIANT&>(constant), vaskel::OwnershipTake),
              E_INVALIDARG);
    EXPECT_EQ(vector.Set(static_cast<const VARIANT&>(constant), vaskel::OwnershipTakeConst), S_OK);
    EXPECT_EQ(constant.vt, VT_EMPTY);
    EXPECT_EQ(Ole(vector.at(0).bstrVal), Ole("c"));

    orvariant_t taken = Strings({"d"});
    EXPECT_EQ(vector.Set(taken, vaskel::OwnershipTake), S_OK);
    EXPECT_EQ(taken.vt, VT_EMPTY);
    EXPECT_EQ(Ole(vector.at(0).bstrVal), Ole("d"));
}

TEST(SafeArrayVectorOwnership, KeepsItsContentsWhenSetFails) {
    orvariant_t array = LongsFrom(0, {1, 2});
    safearrayvector vector(array, vaskel::OwnershipBorrow);
    const orvariant_t empty;
    EXPECT_EQ(vector.Set(static_cast<const VARIANT&>(empty), vaskel::OwnershipBorrow), E_INVALIDARG);
    EXPECT_EQ(vector.Set(array, static_cast<EVariantOwnershipOptions>(7)), E_INVALIDARG);
    EXPECT_EQ(vector.size(), 2u);
    EXPECT_EQ(vector.at(1).lVal, 2);
    vector.Reset();
    EXPECT_EQ(vector.size(), 0u);
    EXPECT_EQ(array.parray->cLocks, 0u);
}

TEST(SafeArrayVectorOwnership, CopiesOfVectorsReleaseOnce) {
    CountingUnknown object;
    {
        orvariant_t array = ArrayOf(VT_UNKNOWN, 1);
        static_cast<IUnknown**>(array.parray->pvData)[0] = &object;
        object.AddRef();
        safearrayvector owner(array, vaskel::OwnershipTake);
        safearrayvector copy(owner);
        EXPECT_EQ(object.references, 3u);
        safearrayvector borrower(copy.at(0), vaskel::OwnershipBorrow);
        safearrayvector second(borrower);
        second = owner;
        EXPECT_EQ(object.references, 4u);
    }
    EXPECT_EQ(object.references, 1u);
}

TEST(SafeArrayVectorOwnership, MovesElementsOutOfOwnedArrays) {
    orvariant_t source = Strings({"zero", "one"});
    safearrayvector owner(source, vaskel::OwnershipTake);
    orvariant_t out(5L);
    owner.TransferElementOwnership(1, out);
    EXPECT_EQ(out.vt, VT_BSTR);
    EXPECT_EQ(Ole(out.bstrVal), Ole("one"));
    EXPECT_EQ(owner.at(1).bstrVal, nullptr);
    EXPECT_EQ(ThrownCode([&] { owner.TransferElementOwnership(2, out); }), E_UNEXPECTED);

    orvariant_t borrowedArray = Strings({"x"});
    safearrayvector borrower(borrowedArray, vaskel::OwnershipBorrow);
    EXPECT_FALSE(borrower.CanTransferElementOwnership());
    EXPECT_EQ(ThrownCode([&] { borrower.TransferElementOwnership(0, out); }), E_UNEXPECTED);

    orvariant_t single("alone");
    safearrayvector holder(single, vaskel::OwnershipTake);
    holder.TransferElementOwnership(0, out);
    EXPECT_EQ(Ole(out.bstrVal), Ole("alone"));
    EXPECT_EQ(holder.at(0).vt, VT_EMPTY);
}

TEST(SafeArrayElementHelpers, SizeMoveResetAndConvertRawElements) {
    EXPECT_EQ(safearrayvector::GetDataSize(VT_BOOL), 2u);
    EXPECT_EQ(safearrayvector::GetDataSize(VT_R4), 4u);
    EXPECT_EQ(safearrayvector::GetDataSize(VT_BSTR), sizeof(BSTR));
    EXPECT_EQ(safearrayvector::GetDataSize(VT_UI8), 8u);
    EXPECT_EQ(safearrayvector::GetDataSize(VT_DECIMAL), 16u);
    EXPECT_EQ(safearrayvector::GetDataSize(VT_I1), 1u);
    EXPECT_EQ(safearrayvector::GetDataSize(VT_CY), 0u);
    EXPECT_EQ(safearrayvector::GetDataSize(VT_ERROR), 0u);

    SHORT shorts[3] = {1, 2, 3};
    void* cursor = shorts;
    EXPECT_TRUE(safearrayvector::MoveDataPointer(VT_I2, cursor, 2));
    EXPECT_EQ(cursor, &shorts[2]);
    EXPECT_FALSE(safearrayvector::MoveDataPointer(VT_CY, cursor, 1));
    EXPECT_EQ(cursor, &shorts[2]);

    EXPECT_EQ(safearrayvector::ResetDataValue(VT_I2, &shorts[0]), S_OK);
    EXPECT_EQ(shorts[0], 0);
    DECIMAL decimal{};
    EXPECT_EQ(safearrayvector::ResetDataValue(VT_DECIMAL, &decimal), E_NOTIMPL);
    EXPECT_EQ(safearrayvector::ResetDataValue(VT_CY, &decimal), E_NOTIMPL);

    VARIANT out;
    VariantInit(&out);
    EXPECT_EQ(safearrayvector::SetVariantValue(out, VT_CY, shorts, true), E_NOTIMPL);
    EXPECT_EQ(out.vt, VT_EMPTY);
    EXPECT_EQ(safearrayvector::SetVariantValue(out, VT_I2, &shorts[1], true), S_OK);
    EXPECT_EQ(out.vt, VT_I2);
    EXPECT_EQ(out.iVal, 2);
}

TEST(SafeArrayElementHelpers, StoreVariantsIntoRawElements) {
    BSTR slot = nullptr;
    orvariant_t text("kept");
    EXPECT_EQ(safearrayvector::GetVariantValue(&slot, static_cast<const VARIANT&>(text)), S_OK);
    EXPECT_NE(slot, text.bstrVal); // a copy
    EXPECT_EQ(Ole(slot), Ole("kept"));
    SysFreeString(slot);

    const BSTR held = text.bstrVal;
    EXPECT_EQ(safearrayvector::GetVariantValue(&slot, text, false), S_OK);
    EXPECT_EQ(slot, held); // taken over
    EXPECT_EQ(text.vt, VT_EMPTY);
    SysFreeString(slot);

    double number = 0;
    EXPECT_EQ(safearrayvector::GetVariantValue(&number, orvariant_t(2.5, VT_DATE)), S_OK);
    EXPECT_EQ(number, 2.5);

    CY currency{};
    orvariant_t money(currency);
    EXPECT_EQ(safearrayvector::GetVariantValue(&number, money, false), E_NOTIMPL);
    EXPECT_EQ(money.vt, VT_CY); // untouched on failure
}

} // namespace

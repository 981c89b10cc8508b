// The owning variant: construction and assignment by type, ownership of
// strings and interfaces, typed access, numbers and text; the three-state flag.
#include "support/counting_unknown.h"
#include "support/ole_text.h"

#include <vaskel/value.h>

#include <gtest/gtest.h>

#include <cstring>

namespace {

using vaskel::CDateTime;
using vaskel::orvariant_t;
using vaskel::tristate_bool;
using vaskel_test::CountingUnknown;
using vaskel_test::Ole;

template <typename Action>
HRESULT ThrownCode(Action action) {
    try {
        action();
    } catch (const _com_error& error) {
        return error.Error();
    }
    return S_OK;
}

TEST(OrVariantConstruction, GivesEachScalarItsAutomationType) {
    EXPECT_EQ(orvariant_t().vt, VT_EMPTY);
    EXPECT_EQ(orvariant_t(short(-3)).vt, VT_I2);
    EXPECT_EQ(orvariant_t(7L).lVal, 7);
    EXPECT_EQ(orvariant_t(7L).vt, VT_I4);
    EXPECT_EQ(orvariant_t(1.5f).vt, VT_R4);
    EXPECT_EQ(orvariant_t(2.5).vt, VT_R8);
    EXPECT_EQ(orvariant_t(2.5, VT_DATE).vt, VT_DATE);
    EXPECT_EQ(orvariant_t(CDateTime(45000.25)).vt, VT_DATE);
    EXPECT_EQ(orvariant_t(CDateTime(45000.25)).date, 45000.25);
    EXPECT_EQ(orvariant_t(static_cast<unsigned char>(200)).vt, VT_UI1);
    EXPECT_EQ(orvariant_t('x').vt, VT_I1);
    EXPECT_EQ(orvariant_t(static_cast<unsigned short>(9)).vt, VT_UI2);
    EXPECT_EQ(orvariant_t(9UL).vt, VT_UI4);
    EXPECT_EQ(orvariant_t(9).vt, VT_INT);
    EXPECT_EQ(orvariant_t(9U).vt, VT_UINT);
    EXPECT_EQ(orvariant_t(-9LL).llVal, -9);
    EXPECT_EQ(orvariant_t(-9LL).vt, VT_I8);
    EXPECT_EQ(orvariant_t(9ULL).vt, VT_UI8);
    CY cy;
    cy.int64 = 12345;
    EXPECT_EQ(orvariant_t(cy).cyVal.int64, 12345);
}

TEST(OrVariantConstruction, StoresBooleansAsMinusOneOrZero) {
    const orvariant_t yes(true);
    EXPECT_EQ(yes.vt, VT_BOOL);
    EXPECT_EQ(yes.boolVal, VARIANT_TRUE);
    EXPECT_EQ(yes.GetAsDouble(), -1.0);
    EXPECT_EQ(orvariant_t(false).boolVal, VARIANT_FALSE);
    EXPECT_EQ(orvariant_t(short(5), VT_BOOL).boolVal, VARIANT_TRUE);
    EXPECT_EQ(orvariant_t(5L, VT_BOOL).boolVal, VARIANT_TRUE);
    EXPECT_EQ(orvariant_t(0L, VT_BOOL).boolVal, VARIANT_FALSE);
}

TEST(OrVariantConstruction, RefusesTypesTheValueCannotTake) {
    EXPECT_EQ(ThrownCode([] { orvariant_t(short(5), VT_R4); }), E_INVALIDARG);
    EXPECT_EQ(ThrownCode([] { orvariant_t(5L, VT_R8); }), E_INVALIDARG);
    EXPECT_EQ(ThrownCode([] { orvariant_t(5.0, VT_I4); }), E_INVALIDARG);
    EXPECT_EQ(ThrownCode([] { orvariant_t(static_cast<const VARIANT*>(nullptr)); }), E_POINTER);
    const orvariant_t error(static_cast<long>(E_FAIL), VT_ERROR);
    EXPECT_EQ(error.vt, VT_ERROR);
    EXPECT_EQ(error.scode, E_FAIL);
}

TEST(OrVariantConstruction, KeepsTheWholeDecimal) {
    DECIMAL value{};
    value.scale = 2;
    value.sign = DECIMAL_NEG;
    value.Hi32 = 1;
    value.Lo64 = 0x123456789ULL;
    const orvariant_t wrapped(value);
    EXPECT_EQ(wrapped.vt, VT_DECIMAL);
    EXPECT_EQ(wrapped.decVal.scale, 2);
    EXPECT_EQ(wrapped.decVal.sign, DECIMAL_NEG);
    EXPECT_EQ(wrapped.decVal.Hi32, 1u);
    EXPECT_EQ(wrapped.decVal.Lo64, 0x123456789ULL);
}

TEST(OrVariantStrings, MakesStringsOfWideAnsiAndCompilerText) {
    const orvariant_t wide(Ole("wide").c_str());
    EXPECT_EQ(wide.vt, VT_BSTR);
    EXPECT_EQ(Ole(wide.bstrVal), Ole("wide"));
    const orvariant_t ansi("ansi");
    EXPECT_EQ(Ole(ansi.bstrVal), Ole("ansi"));
    EXPECT_EQ(orvariant_t(static_cast<const char*>(nullptr)).bstrVal, nullptr);
    EXPECT_EQ(orvariant_t(static_cast<const OLECHAR*>(nullptr)).bstrVal, nullptr);
    EXPECT_EQ(orvariant_t(_bstr_t()).bstrVal, nullptr);
}

TEST(OrVariantStrings, CopiesACompilerStringByteForByte) {
    // Three bytes: an odd length that a character copy would round.
    BSTR odd = SysAllocStringByteLen("abc", 3);
    const _bstr_t source(odd, false);
    const orvariant_t copy(source);
    ASSERT_EQ(copy.vt, VT_BSTR);
    EXPECT_EQ(SysStringByteLen(copy.bstrVal), 3u);
    EXPECT_EQ(std::memcmp(copy.bstrVal, "abc", 3), 0);
    EXPECT_NE(copy.bstrVal, odd);
}

TEST(OrVariantOwnership, CopiesDeeplyAndTakesOverWithoutCopy) {
    orvariant_t original("text");
    orvariant_t copy(original);
    EXPECT_NE(copy.bstrVal, original.bstrVal);
    EXPECT_EQ(Ole(copy.bstrVal), Ole("text"));

    VARIANT source;
    VariantInit(&source);
    source.vt = VT_BSTR;
    source.bstrVal = SysAllocString(Ole("moved").c_str());
    const BSTR held = source.bstrVal;
    orvariant_t taken(source, false);
    EXPECT_EQ(source.vt, VT_EMPTY);
    EXPECT_EQ(taken.bstrVal, held);
    EXPECT_EQ(VariantClear(&source), S_OK); // frees nothing

    orvariant_t target(5L);
    VARIANT other;
    VariantInit(&other);
    other.vt = VT_BSTR;
    other.bstrVal = SysAllocString(Ole("other").c_str());
    target.TransferOwnership(other);
    EXPECT_EQ(other.vt, VT_EMPTY);
    EXPECT_EQ(Ole(target.bstrVal), Ole("other"));
}

TEST(OrVariantOwnership, BalancesInterfaceReferences) {
    CountingUnknown object;
    {
        orvariant_t held(&object);
        EXPECT_EQ(object.references, 2u);
        orvariant_t copy(held);
        EXPECT_EQ(object.references, 3u);
        copy = 5L;
        EXPECT_EQ(object.references, 2u);
        held = static_cast<IUnknown*>(&object); // reassigning the held pointer keeps it alive
        EXPECT_EQ(object.references, 2u);
        orvariant_t adopted(static_cast<IUnknown*>(&object), false);
        adopted.vt = VT_EMPTY; // gave no reference, so releases none
    }
    EXPECT_EQ(object.references, 1u);
}

TEST(OrVariantAssignment, KeepsCompatibleTypes) {
    orvariant_t error(3L, VT_ERROR);
    error = 7L;
    EXPECT_EQ(error.vt, VT_ERROR);
    EXPECT_EQ(error.scode, 7);

    orvariant_t flag(true);
    flag = 7L;
    EXPECT_EQ(flag.vt, VT_BOOL);
    EXPECT_EQ(flag.boolVal, VARIANT_TRUE);
    flag = short(0);
    EXPECT_EQ(flag.vt, VT_BOOL);
    EXPECT_EQ(flag.boolVal, VARIANT_FALSE);

    orvariant_t date(1.0, VT_DATE);
    date = 2.5;
    EXPECT_EQ(date.vt, VT_DATE);
    EXPECT_EQ(date.date, 2.5);
}

TEST(OrVariantAssignment, ReleasesTheOldContentWhenTheTypeChanges) {
    orvariant_t value("a string that must be freed");
    value = 2.5;
    EXPECT_EQ(value.vt, VT_R8);
    value = 4L;
    EXPECT_EQ(value.vt, VT_I4);
    value = "again";
    value = Ole("wide").c_str();
    EXPECT_EQ(Ole(value.bstrVal), Ole("wide"));
    orvariant_t& same = value;
    value = same; // onto itself: kept, not cleared first
    EXPECT_EQ(Ole(value.bstrVal), Ole("wide"));
    value = orvariant_t(9ULL);
    EXPECT_EQ(value.vt, VT_UI8);
    DECIMAL decimal{};
    decimal.Lo64 = 5;
    value = decimal;
    EXPECT_EQ(value.vt, VT_DECIMAL);
    EXPECT_EQ(value.decVal.Lo64, 5u);
    EXPECT_EQ(ThrownCode([&] { value = static_cast<const VARIANT*>(nullptr); }), E_POINTER);
}

TEST(OrVariantAccess, GivesStringsAndInterfacesOnlyForTheirTypes) {
    const orvariant_t number(5L);
    EXPECT_EQ(number.GetBSTR(false), nullptr);
    EXPECT_EQ(ThrownCode([&] { number.GetBSTR(true); }), DISP_E_TYPEMISMATCH);
    EXPECT_EQ(ThrownCode([&] { number.GetIDispatch(true); }), DISP_E_TYPEMISMATCH);
    EXPECT_EQ(ThrownCode([&] { number.GetIUnknown(true); }), DISP_E_TYPEMISMATCH);

    const orvariant_t text("x");
    EXPECT_EQ(text.GetBSTR(true), text.bstrVal);

    VARIANT dispatch;
    VariantInit(&dispatch);
    CountingUnknown object;
    dispatch.vt = VT_DISPATCH;
    dispatch.punkVal = &object; // never called through IDispatch
    const orvariant_t wrapped(dispatch);
    EXPECT_EQ(wrapped.GetIUnknown(false), static_cast<IUnknown*>(&object));
    EXPECT_EQ(wrapped.GetIDispatch(true), wrapped.pdispVal);
    EXPECT_EQ(object.references, 2u);
}

TEST(OrVariantNumbers, ReadEveryScalarAndTruncateTowardZero) {
    EXPECT_EQ(orvariant_t('\xFF').GetAsDouble(), -1.0);
    EXPECT_EQ(orvariant_t(static_cast<unsigned char>(255)).GetAsDouble(), 255.0);
    EXPECT_EQ(orvariant_t(static_cast<unsigned short>(65535)).GetAsDouble(), 65535.0);
    EXPECT_EQ(orvariant_t(4294967295UL).GetAsDouble(), 4294967295.0);
    EXPECT_EQ(orvariant_t(0xFFFFFFFFFFFFFFFFULL).GetAsDouble(), 18446744073709551616.0);
    EXPECT_EQ(orvariant_t(-5LL).GetAsDouble(), -5.0);
    EXPECT_EQ(orvariant_t("12").GetAsDouble(), 0.0); // text is never parsed
    EXPECT_EQ(orvariant_t().GetAsDouble(), 0.0);

    EXPECT_EQ(orvariant_t(2.9).GetAsIntegral(), 2);
    EXPECT_EQ(orvariant_t(-2.9).GetAsIntegral(), -2);
    EXPECT_EQ(orvariant_t(-1.0).GetAsUnsignedIntegral(), 4294967295u);
    EXPECT_EQ(orvariant_t(4294967296.0 + 7).GetAsUnsignedIntegral(), 7u);
    EXPECT_EQ(orvariant_t(1e300).GetAsIntegral(), 0);
}

TEST(OrVariantText, ConvertsOnlyStringsUnlessAskedTo) {
    EXPECT_EQ(orvariant_t(42L).GetAsString(), "");
    EXPECT_EQ(orvariant_t(42L).ToString(), "42");
    EXPECT_EQ(orvariant_t(-2.5).ToString(), "-2.5");
    EXPECT_EQ(orvariant_t("plain").ToString(), "plain");
    VARIANT null;
    VariantInit(&null);
    null.vt = VT_NULL;
    EXPECT_EQ(ThrownCode([&] { orvariant_t(null).ToString(); }), DISP_E_TYPEMISMATCH);
}

TEST(OrVariantText, ClassifiesByTheTypeWord) {
    EXPECT_TRUE(orvariant_t(3L).IsSignedIntegral());
    EXPECT_TRUE(orvariant_t(3UL).IsUnsignedIntegral());
    EXPECT_TRUE(orvariant_t(3.0).IsFloatingPoint());
    EXPECT_TRUE(orvariant_t("s").IsString());
    EXPECT_FALSE(orvariant_t("s").IsNumeric());
    orvariant_t array;
    array.vt = VT_ARRAY | VT_I4;
    EXPECT_FALSE(array.IsNumeric());
    EXPECT_FALSE(array.IsIntegral());
    array.vt = VT_EMPTY;
}

TEST(OrVariantOrder, IsLessOnlyWhenTheSystemSaysSo) {
    EXPECT_TRUE(orvariant_t(1L) < orvariant_t(2.5));
    EXPECT_FALSE(orvariant_t(2L) < orvariant_t(2L));
    EXPECT_FALSE(orvariant_t(3L) < orvariant_t(2L));
    EXPECT_TRUE(orvariant_t("a") < orvariant_t("b"));
    VARIANT null;
    VariantInit(&null);
    null.vt = VT_NULL;
    EXPECT_FALSE(orvariant_t(null) < orvariant_t(1L));
    EXPECT_FALSE(orvariant_t(1L) < orvariant_t(null));
}

TEST(TristateBool, OrdersFalseTrueUnknown) {
    const tristate_bool unknown;
    EXPECT_TRUE(unknown.IsUnknown());
    EXPECT_FALSE(static_cast<bool>(unknown));
    EXPECT_TRUE(unknown == false);
    EXPECT_FALSE(unknown == tristate_bool(false));
    EXPECT_TRUE(tristate_bool(true) < unknown);
    EXPECT_TRUE(tristate_bool::False() < tristate_bool::True());
    EXPECT_EQ(sizeof(tristate_bool), 1u);

    tristate_bool value = true;
    EXPECT_TRUE(value.IsTrue());
    value.SetAsFalse();
    EXPECT_TRUE(value.IsFalse());
    value.SetAsUnknown();
    EXPECT_EQ(value, tristate_bool::Unknown());
    value = false;
    EXPECT_TRUE(value == false);
}

} // namespace

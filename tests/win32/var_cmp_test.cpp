// VarCmp: numbers of mixed types by value, texts, empty and null, and the
// types it refuses. On Windows the function is the system's; the results
// were taken from the documentation and from Wine's oleaut32. Texts compare
// here by code unit where the system compares linguistically, so the shared
// cases are those both orders agree on.
#include "support/wine.h"
#include "win32/variant_cases.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <limits>
#include <string>

namespace {

using vaskel_test::RunningOnWine;

using vaskel_test::kEnglishUs;
using vaskel_test::kOwnImplementation;
using vaskel_test::Var;

struct Text : Var {
    explicit Text(const std::string& ascii) {
        std::basic_string<OLECHAR> wide(ascii.begin(), ascii.end());
        v.vt = VT_BSTR;
        v.bstrVal = SysAllocStringLen(wide.data(), static_cast<UINT>(wide.size()));
    }
    explicit Text(const std::basic_string<OLECHAR>& wide) {
        v.vt = VT_BSTR;
        v.bstrVal = SysAllocStringLen(wide.data(), static_cast<UINT>(wide.size()));
    }
};

struct Number : Var {
    Number(VARTYPE vt, double value) {
        v.vt = vt;
        switch (vt) {
        case VT_R4:
            v.fltVal = static_cast<float>(value);
            break;
        case VT_R8:
        case VT_DATE:
            v.dblVal = value;
            break;
        case VT_CY:
            v.cyVal.int64 = static_cast<LONGLONG>(value * 10000);
            break;
        case VT_BOOL:
            v.boolVal = value != 0 ? VARIANT_TRUE : VARIANT_FALSE;
            break;
        case VT_I2:
            v.iVal = static_cast<SHORT>(value);
            break;
        case VT_UI1:
            v.bVal = static_cast<BYTE>(value);
            break;
        case VT_UI4:
            v.ulVal = static_cast<ULONG>(value);
            break;
        case VT_I8:
            v.llVal = static_cast<LONGLONG>(value);
            break;
        default:
            v.vt = VT_I4;
            v.lVal = static_cast<LONG>(value);
            break;
        }
    }
};

struct Decimal : Var {
    Decimal(BYTE scale, bool negative, ULONGLONG lo) {
        v.decVal.scale = scale;
        v.decVal.sign = negative ? DECIMAL_NEG : 0;
        v.decVal.Hi32 = 0;
        v.decVal.Lo64 = lo;
        v.vt = VT_DECIMAL;
    }
};

HRESULT Compare(Var& left, Var& right, ULONG flags = 0, LCID lcid = kEnglishUs) {
    return VarCmp(&left.v, &right.v, lcid, flags);
}

TEST(VarCmp, NumbersOfMixedTypesByValue) {
    struct Case {
        VARTYPE leftType;
        double left;
        VARTYPE rightType;
        double right;
        HRESULT expected;
    } const cases[] = {
        {VT_I4, 1, VT_I4, 2, VARCMP_LT},
        {VT_I4, 2, VT_I4, 2, VARCMP_EQ},
        {VT_I4, 3, VT_I4, 2, VARCMP_GT},
        {VT_UI1, 200, VT_I2, 200, VARCMP_EQ},
        {VT_BOOL, 1, VT_I4, -1, VARCMP_EQ},
        {VT_BOOL, 1, VT_I4, 0, VARCMP_LT},
        {VT_BOOL, 1, VT_BOOL, 0, VARCMP_LT},
        {VT_DATE, 2.5, VT_R8, 2.5, VARCMP_EQ},
        {VT_DATE, 2.5, VT_I4, 3, VARCMP_LT},
        {VT_CY, 2.5, VT_R8, 2.5, VARCMP_EQ},
        {VT_CY, 2.5, VT_R4, 2.5, VARCMP_EQ},
        {VT_CY, 2.5, VT_I4, 2, VARCMP_GT},
        {VT_R8, 0.5, VT_R4, 0.25, VARCMP_GT},
        {VT_R8, -1e300, VT_I8, -5, VARCMP_LT},
        // A float against a double compares as floats.
        {VT_R4, 0.1, VT_R8, 0.1, VARCMP_EQ},
    };
    for (const Case& c : cases) {
        Number left(c.leftType, c.left), right(c.rightType, c.right);
        EXPECT_EQ(Compare(left, right), c.expected)
            << c.leftType << " " << c.left << " vs " << c.rightType << " " << c.right;
        // And the other way round.
        const HRESULT reversed = c.expected == VARCMP_LT   ? VARCMP_GT
                                 : c.expected == VARCMP_GT ? VARCMP_LT
                                                           : c.expected;
        EXPECT_EQ(Compare(right, left), reversed) << c.left << " vs " << c.right;
    }

    Decimal twoAndHalf(1, false, 25), minusTwoAndHalf(1, true, 25);
    Number two(VT_I4, 2), doubleTwoAndHalf(VT_R8, 2.5), currency(VT_CY, 2.5);
    EXPECT_EQ(Compare(twoAndHalf, two), VARCMP_GT);
    EXPECT_EQ(Compare(twoAndHalf, doubleTwoAndHalf), VARCMP_EQ);
    EXPECT_EQ(Compare(twoAndHalf, currency), VARCMP_EQ);
    EXPECT_EQ(Compare(minusTwoAndHalf, two), VARCMP_LT);

    // Integers compare exactly, past the doubles' 53 bits.
    Var big, smaller;
    big.v.vt = smaller.v.vt = VT_I8;
    big.v.llVal = 9007199254740993LL;
    smaller.v.llVal = 9007199254740992LL;
    EXPECT_EQ(Compare(big, smaller), VARCMP_GT);
    Number doubleSmaller(VT_R8, 9007199254740992.0);
    EXPECT_EQ(Compare(big, doubleSmaller), VARCMP_EQ); // as doubles

    // Empty is zero.
    Var empty, otherEmpty;
    Number zero(VT_I4, 0), minusOne(VT_I4, -1);
    EXPECT_EQ(Compare(empty, zero), VARCMP_EQ);
    EXPECT_EQ(Compare(empty, minusOne), VARCMP_GT);
    EXPECT_EQ(Compare(empty, otherEmpty), VARCMP_EQ);
}

TEST(VarCmp, TextsByTheirCharacters) {
    struct Case {
        const char* left;
        const char* right;
        ULONG flags;
        HRESULT expected;
    } const cases[] = {
        {"abc", "abc", 0, VARCMP_EQ},
        {"abc", "abd", 0, VARCMP_LT},
        {"b", "a", 0, VARCMP_GT},
        {"ab", "abc", 0, VARCMP_LT},
        {"abc", "ab", 0, VARCMP_GT},
        {"", "a", 0, VARCMP_LT},
        {"_", "a", 0, VARCMP_LT},
        {"[", "a", 0, VARCMP_LT},
        {"abc", "ABC", NORM_IGNORECASE, VARCMP_EQ},
        {"a", "B", NORM_IGNORECASE, VARCMP_LT},
        {"Apple", "banana", NORM_IGNORECASE, VARCMP_LT},
        {"10", "9", 0, VARCMP_LT}, // texts, not numbers
    };
    for (const Case& c : cases) {
        Text left(c.left), right(c.right);
        EXPECT_EQ(Compare(left, right, c.flags), c.expected)
            << '"' << c.left << "\" vs \"" << c.right << "\" flags " << c.flags;
    }
    // Lengths count, not a NUL inside.
    Text withNul(std::basic_string<OLECHAR>{'a', 'b', 0, 'c'}), ab("ab");
    EXPECT_EQ(Compare(withNul, ab), VARCMP_GT);
    // A null string is the empty one, and so is VT_EMPTY against a text.
    Var null, empty;
    null.v.vt = VT_BSTR;
    null.v.bstrVal = nullptr;
    Text blank(""), abc("abc");
    EXPECT_EQ(Compare(null, blank), VARCMP_EQ);
    EXPECT_EQ(Compare(empty, blank), VARCMP_EQ);
    EXPECT_EQ(Compare(null, empty), VARCMP_EQ);
    EXPECT_EQ(Compare(empty, abc), VARCMP_LT);
    EXPECT_EQ(Compare(abc, empty), VARCMP_GT);
    EXPECT_EQ(Compare(abc, null), VARCMP_GT);

    Text e(std::basic_string<OLECHAR>{0xE9}), capitalE(std::basic_string<OLECHAR>{0xC9});
    EXPECT_EQ(Compare(e, capitalE, NORM_IGNORECASE), VARCMP_EQ);

    if (kOwnImplementation) {
        // By code unit: capitals first. The system sorts linguistically
        // ("a" < "B", "abc" < "ABC").
        Text a("a"), capitalB("B"), lower("abc"), upper("ABC");
        EXPECT_EQ(Compare(a, capitalB), VARCMP_GT);
        EXPECT_EQ(Compare(lower, upper), VARCMP_GT);
        // Texts in a locale this platform does not know.
        EXPECT_EQ(Compare(lower, upper, 0, 0x407), E_INVALIDARG);
        Number one(VT_I4, 1), two(VT_I4, 2);
        EXPECT_EQ(Compare(one, two, 0, 0x407), VARCMP_LT); // numbers need no locale
    }
}

TEST(VarCmp, AnyNumberIsLessThanAnyText) {
    Text ten("10"), five("5"), blanks(" 5 "), word("abc"), truth("True"), date("1/1/1900");
    Number number(VT_I4, 5), fifty(VT_I4, 50), real(VT_R8, 5), yes(VT_BOOL, 1), day(VT_DATE, 2.5);
    EXPECT_EQ(Compare(number, ten), VARCMP_LT);
    EXPECT_EQ(Compare(ten, number), VARCMP_GT);
    EXPECT_EQ(Compare(fifty, ten), VARCMP_LT);
    EXPECT_EQ(Compare(five, number), VARCMP_GT);
    EXPECT_EQ(Compare(blanks, number), VARCMP_GT);
    EXPECT_EQ(Compare(word, number), VARCMP_GT);
    EXPECT_EQ(Compare(number, word), VARCMP_LT);
    EXPECT_EQ(Compare(real, word), VARCMP_LT);
    EXPECT_EQ(Compare(five, real), VARCMP_GT);
    EXPECT_EQ(Compare(yes, truth), VARCMP_LT);
    EXPECT_EQ(Compare(day, date), VARCMP_LT);
}

TEST(VarCmp, NullAndRefusedTypes) {
    Var null, otherNull, empty, error, otherError, unknown, dispatch;
    null.v.vt = otherNull.v.vt = VT_NULL;
    error.v.vt = otherError.v.vt = VT_ERROR;
    error.v.scode = otherError.v.scode = 0;
    unknown.v.vt = VT_UNKNOWN;
    unknown.v.punkVal = nullptr;
    dispatch.v.vt = VT_DISPATCH;
    dispatch.v.pdispVal = nullptr;
    Number number(VT_I4, 0);
    Text text("abc");
    EXPECT_EQ(Compare(null, number), VARCMP_NULL);
    EXPECT_EQ(Compare(number, null), VARCMP_NULL);
    EXPECT_EQ(Compare(null, otherNull), VARCMP_NULL);
    EXPECT_EQ(Compare(null, text), VARCMP_NULL);
    EXPECT_EQ(Compare(null, empty), VARCMP_NULL);

    EXPECT_EQ(Compare(error, otherError), VARCMP_EQ);
    EXPECT_EQ(Compare(error, number), DISP_E_TYPEMISMATCH);
    EXPECT_EQ(Compare(error, null), DISP_E_TYPEMISMATCH);
    EXPECT_EQ(Compare(unknown, number), DISP_E_TYPEMISMATCH);
    EXPECT_EQ(Compare(dispatch, number), DISP_E_TYPEMISMATCH);
    EXPECT_EQ(Compare(dispatch, null), DISP_E_TYPEMISMATCH);

    // Type codes VarCmp cannot hold; cleared by hand, as VariantClear
    // refuses some of them.
    VARIANT raw, zero;
    VariantInit(&raw);
    VariantInit(&zero);
    zero.vt = VT_I4;
    zero.lVal = 0;
    raw.vt = VT_VARIANT;
    EXPECT_EQ(VarCmp(&raw, &zero, kEnglishUs, 0), DISP_E_TYPEMISMATCH);
    raw.vt = 15;
    EXPECT_EQ(VarCmp(&raw, &zero, kEnglishUs, 0), DISP_E_TYPEMISMATCH);
    raw.vt = 0x7ff;
    EXPECT_EQ(VarCmp(&raw, &zero, kEnglishUs, 0), DISP_E_BADVARTYPE);
    raw.vt = VT_RECORD;
    EXPECT_EQ(VarCmp(&zero, &raw, kEnglishUs, 0), DISP_E_BADVARTYPE);
    raw.vt = VT_ARRAY | VT_I4;
    raw.parray = nullptr;
    EXPECT_EQ(VarCmp(&raw, &zero, kEnglishUs, 0), DISP_E_BADVARTYPE);
}

TEST(VarCmp, ByReferenceOperands) {
    if (RunningOnWine())
        GTEST_SKIP() << "Wine refuses by-reference operands with DISP_E_BADVARTYPE";
    LONG five = 5;
    BSTR abc = SysAllocString(Text("abc").v.bstrVal);
    Var numberReference, textReference, variantReference;
    numberReference.v.vt = VT_I4 | VT_BYREF;
    numberReference.v.plVal = &five;
    textReference.v.vt = VT_BSTR | VT_BYREF;
    textReference.v.pbstrVal = &abc;
    Number number(VT_I4, 5), four(VT_I4, 4);
    Text text("abc");
    variantReference.v.vt = VT_VARIANT | VT_BYREF;
    variantReference.v.pvarVal = &four.v;
    EXPECT_EQ(Compare(numberReference, number), VARCMP_EQ);
    EXPECT_EQ(Compare(textReference, text), VARCMP_EQ);
    EXPECT_EQ(Compare(variantReference, number), VARCMP_LT);
    EXPECT_EQ(Compare(numberReference, textReference), VARCMP_LT);
    SysFreeString(abc);
}

TEST(VarCmp, WholeRangeOfUnsignedIntegers) {
    if (!kOwnImplementation)
        GTEST_SKIP() << "the system decides (Wine refuses unsigned values past the signed "
                        "type's range against signed ones with a type mismatch)";
    Var largest, minusOne;
    largest.v.vt = VT_UI8;
    largest.v.ullVal = ~0ULL;
    minusOne.v.vt = VT_I8;
    minusOne.v.llVal = -1;
    EXPECT_EQ(Compare(largest, minusOne), VARCMP_GT);
    EXPECT_EQ(Compare(minusOne, largest), VARCMP_LT);
    Number negative(VT_I2, -5), unsignedLarge(VT_UI4, 4000000000.0);
    EXPECT_EQ(Compare(negative, unsignedLarge), VARCMP_LT);
    EXPECT_EQ(Compare(unsignedLarge, negative), VARCMP_GT);
}

} // namespace

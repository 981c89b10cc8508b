// Variants, BSTRs, locale information and system error texts as text.
#include "support/ole_text.h"
#include "support/wine.h"

#include <vaskel/text.h>

#include <gtest/gtest.h>

using namespace vaskel;
using vaskel_test::Ole;

namespace {

struct Variant : VARIANT {
    Variant() { VariantInit(this); }
    ~Variant() { VariantClear(this); }
};

TEST(VariantAsText, ConvertsOnlyStringsHeldByValue) {
    Variant text;
    text.vt = VT_BSTR;
    text.bstrVal = SysAllocString(Ole("hello").c_str());
    EXPECT_STREQ(AsString(text), "hello");
    CString out("old");
    EXPECT_EQ(&AsString(out, text), &out);
    EXPECT_STREQ(out, "hello");

    Variant null;
    null.vt = VT_BSTR;
    null.bstrVal = nullptr; // a null BSTR is an empty string
    EXPECT_STREQ(AsString(null), "");

    Variant number;
    number.vt = VT_I4;
    number.lVal = 5;
    EXPECT_STREQ(AsString(number), "");

    VARIANT reference;
    VariantInit(&reference);
    reference.vt = VT_BSTR | VT_BYREF;
    reference.pbstrVal = &text.bstrVal;
    EXPECT_STREQ(AsString(reference), "");
}

TEST(VariantAsULong, TakesUnsignedValuesAndConvertsTheRest) {
    Variant value;
    value.vt = VT_UI4;
    value.ulVal = 4000000000u;
    DWORD out = 0;
    EXPECT_TRUE(AsULong(value, out));
    EXPECT_EQ(out, 4000000000u);

    Variant text;
    text.vt = VT_BSTR;
    text.bstrVal = SysAllocString(Ole("1234").c_str());
    EXPECT_TRUE(AsULong(text, out));
    EXPECT_EQ(out, 1234u);

    Variant large;
    large.vt = VT_R8;
    large.dblVal = 1e10;
    out = 77;
    EXPECT_FALSE(AsULong(large, out)) << "out of the unsigned range";
    EXPECT_EQ(out, 77u);

    Variant word;
    word.vt = VT_BSTR;
    word.bstrVal = SysAllocString(Ole("many").c_str());
    EXPECT_FALSE(AsULong(word, out));
    EXPECT_EQ(out, 77u);
}

TEST(BstrComparison, ComparesWholeLengthsByCodeUnit) {
    BSTR empty = SysAllocString(Ole("").c_str());
    BSTR ab = SysAllocString(Ole("ab").c_str());
    BSTR abc = SysAllocString(Ole("abc").c_str());
    BSTR b = SysAllocString(Ole("b").c_str());
    const OLECHAR withNul[] = {'a', 'b', 0, 'c'};
    BSTR abNulC = SysAllocStringLen(withNul, 4);
    const OLECHAR high[] = {0xE9};
    BSTR accented = SysAllocStringLen(high, 1);

    EXPECT_EQ(VKCompareBSTR(nullptr, empty), 0);
    EXPECT_EQ(VKCompareBSTR(nullptr, nullptr), 0);
    EXPECT_EQ(VKCompareBSTR(ab, abc), -1);
    EXPECT_EQ(VKCompareBSTR(abc, ab), 1);
    EXPECT_EQ(VKCompareBSTR(b, abc), 1);
    EXPECT_EQ(VKCompareBSTR(ab, ab), 0);
    EXPECT_EQ(VKCompareBSTR(ab, abNulC), -1) << "units after a NUL count";
    EXPECT_EQ(VKCompareBSTR(accented, b), 1) << "code units compare unsigned";

    for (BSTR text : {empty, ab, abc, b, abNulC, accented})
        SysFreeString(text);
}

TEST(LocaleText, ReadsTheEnglishCurrencyName) {
    CString name("untouched");
    EXPECT_TRUE(GetCurrencyName(MAKELCID(MAKELANGID(LANG_ENGLISH, SUBLANG_ENGLISH_US), SORT_DEFAULT),
                                name));
    EXPECT_STREQ(name, "US Dollar");
    EXPECT_STREQ(GetCurrencyName(0x409), "US Dollar");
    EXPECT_STREQ(vaskel::GetLocaleInfoA(0x409, LOCALE_SDECIMAL), ".");
}

TEST(LocaleText, LeavesTheOutputAloneOnFailure) {
    CString out("untouched");
    EXPECT_FALSE(vaskel::GetLocaleInfoA(0x409, 0xFFFF, out));
    EXPECT_STREQ(out, "untouched");
    EXPECT_FALSE(GetCurrencyName(0x12345, out));
    EXPECT_STREQ(out, "untouched");
    EXPECT_STREQ(GetCurrencyName(0x12345), "");
}

TEST(ErrorText, GivesTheSystemTextWithItsLineBreak) {
    const CString text = KXFormatErrorMessage(ERROR_FILE_NOT_FOUND);
    ASSERT_GT(text.GetLength(), 2);
    EXPECT_STREQ(text.Right(2), "\r\n");
    // Wine words its message table differently from Windows.
    if (!vaskel_test::RunningOnWine()) {
        EXPECT_STREQ(text, "The system cannot find the file specified.\r\n");
    }
    EXPECT_STREQ(KXFormatErrorMessage(0x2FFFFFFF), "");
}

} // namespace

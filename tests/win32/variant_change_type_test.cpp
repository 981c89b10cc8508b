// VariantChangeType and VariantChangeTypeEx: number text, rounding, range
// edges, the special types and the destination's handling. On Windows the
// functions are the system's, so every case that Windows and vaskel agree on
// runs there too; the results were taken from the Windows documentation and
// from Wine's oleaut32.
#include "support/counting_unknown.h"
#include "support/wine.h"
#include "win32/variant_cases.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <limits>
#include <random>
#include <string>
#include <vector>

namespace {

using vaskel_test::CountingUnknown;
using vaskel_test::RunningOnWine;

using vaskel_test::kEnglishUs;
using vaskel_test::kOwnImplementation;
using vaskel_test::Var;

BSTR Bstr(const std::string& ascii) {
    std::basic_string<OLECHAR> wide(ascii.begin(), ascii.end());
    return SysAllocStringLen(wide.data(), static_cast<UINT>(wide.size()));
}

std::string Ascii(BSTR text) {
    std::string result;
    for (UINT i = 0; i < SysStringLen(text); ++i)
        result += text[i] < 0x80 ? static_cast<char>(text[i]) : '?';
    return result;
}

// Sets an integer type's field from the low bits of a value.
void SetInteger(VARIANT& v, VARTYPE vt, long long bits) {
    VariantClear(&v);
    v.vt = vt;
    switch (vt) {
    case VT_I1:
    case VT_UI1:
        v.bVal = static_cast<BYTE>(bits);
        break;
    case VT_I2:
    case VT_UI2:
    case VT_BOOL:
        v.uiVal = static_cast<USHORT>(bits);
        break;
    case VT_I4:
    case VT_UI4:
    case VT_INT:
    case VT_UINT:
    case VT_ERROR:
        v.ulVal = static_cast<ULONG>(bits);
        break;
    default:
        v.ullVal = static_cast<ULONGLONG>(bits);
        break;
    }
}

// An integer type's value, signed or not, as a 64-bit pattern.
long long IntegerOf(const VARIANT& v) {
    switch (v.vt) {
    case VT_I1:
        return v.cVal;
    case VT_UI1:
        return v.bVal;
    case VT_I2:
    case VT_BOOL:
        return v.iVal;
    case VT_UI2:
        return v.uiVal;
    case VT_I4:
    case VT_INT:
    case VT_ERROR:
        return v.lVal;
    case VT_UI4:
    case VT_UINT:
        return static_cast<long long>(v.ulVal);
    case VT_CY:
        return v.cyVal.int64;
    default:
        return v.llVal;
    }
}

void SetText(VARIANT& v, const std::string& text) {
    VariantClear(&v);
    v.vt = VT_BSTR;
    v.bstrVal = Bstr(text);
}

void SetReal(VARIANT& v, VARTYPE vt, double value) {
    VariantClear(&v);
    v.vt = vt;
    if (vt == VT_R4)
        v.fltVal = static_cast<float>(value);
    else
        v.dblVal = value;
}

void SetDecimal(VARIANT& v, BYTE scale, bool negative, ULONG hi, ULONGLONG lo) {
    VariantClear(&v);
    v.decVal.scale = scale;
    v.decVal.sign = negative ? DECIMAL_NEG : 0;
    v.decVal.Hi32 = hi;
    v.decVal.Lo64 = lo;
    v.vt = VT_DECIMAL;
}

struct Result {
    HRESULT hr;
    std::string text; // for VT_BSTR
};

// Changes a copy of the source to text.
Result ToText(VARIANT& source, USHORT flags = 0, LCID lcid = kEnglishUs) {
    Var text;
    const HRESULT hr = VariantChangeTypeEx(&text, &source, lcid, flags, VT_BSTR);
    Result result{hr, {}};
    if (SUCCEEDED(hr)) {
        EXPECT_EQ(text.v.vt, VT_BSTR);
        result.text = Ascii(text.v.bstrVal);
    }
    return result;
}

const char* TypeName(VARTYPE vt) {
    switch (vt) {
    case VT_I1:
        return "VT_I1";
    case VT_UI1:
        return "VT_UI1";
    case VT_I2:
        return "VT_I2";
    case VT_UI2:
        return "VT_UI2";
    case VT_I4:
        return "VT_I4";
    case VT_UI4:
        return "VT_UI4";
    case VT_INT:
        return "VT_INT";
    case VT_UINT:
        return "VT_UINT";
    case VT_I8:
        return "VT_I8";
    case VT_UI8:
        return "VT_UI8";
    case VT_R4:
        return "VT_R4";
    case VT_R8:
        return "VT_R8";
    case VT_CY:
        return "VT_CY";
    case VT_DATE:
        return "VT_DATE";
    case VT_BSTR:
        return "VT_BSTR";
    case VT_BOOL:
        return "VT_BOOL";
    case VT_DECIMAL:
        return "VT_DECIMAL";
    case VT_EMPTY:
        return "VT_EMPTY";
    case VT_NULL:
        return "VT_NULL";
    case VT_ERROR:
        return "VT_ERROR";
    default:
        return "other";
    }
}

constexpr VARTYPE kIntegerTypes[] = {VT_I1,  VT_UI1, VT_I2,   VT_UI2, VT_I4,
                                     VT_UI4, VT_INT, VT_UINT, VT_I8,  VT_UI8};

// ---------------------------------------------------------------- to text

TEST(VariantChangeTypeText, DoublesWithFifteenDigitsAndExponentsPastThem) {
    struct Case {
        double value;
        const char* text;
    } const cases[] = {
        {0, "0"},
        {1, "1"},
        {-1, "-1"},
        {0.1, "0.1"},
        {-0.5, "-0.5"},
        {1.0 / 3, "0.333333333333333"},
        {2.0 / 3, "0.666666666666667"},
        {123.456, "123.456"},
        {123456.78901234567, "123456.789012346"},
        {100000000000000.0, "100000000000000"},
        {999999999999999.0, "999999999999999"},
        {999999999999999.38, "999999999999999"},
        {99999999999999.906, "99999999999999.9"},
        {999999999999999.5, "1E+15"},
        {1e15, "1E+15"},
        {1234567890123456.0, "1.23456789012346E+15"},
        {2.5e15, "2.5E+15"},
        {1e16, "1E+16"},
        {1e20, "1E+20"},
        {1e300, "1E+300"},
        {1.7976931348623157e308, "1.79769313486232E+308"},
        {0.0001, "0.0001"},
        {0.00012345, "0.00012345"},
        {0.00012345678901234567, "0.000123456789012346"},
        {9.99999999999999e-5, "9.99999999999999E-05"},
        {5e-5, "5E-05"},
        {1.5e-5, "1.5E-05"},
        {1e-5, "1E-05"},
        {4.9406564584124654e-324, "4.94065645841247E-324"},
    };
    Var value;
    for (const Case& c : cases) {
        SetReal(value.v, VT_R8, c.value);
        const Result result = ToText(value.v);
        EXPECT_EQ(result.hr, S_OK) << c.text;
        EXPECT_EQ(result.text, c.text);
    }
}

TEST(VariantChangeTypeText, FloatsWithSevenDigits) {
    struct Case {
        float value;
        const char* text;
    } const cases[] = {
        {0.1f, "0.1"},
        {1.0f / 3, "0.3333333"},
        {0.5f, "0.5"},
        {123.456f, "123.456"},
        {1234567.f, "1234567"},
        {9999999.f, "9999999"},
        {1e7f, "1E+07"},
        {12345678.f, "1.234568E+07"},
        {16777216.f, "1.677722E+07"},
        {3.4e38f, "3.4E+38"},
        {0.0001f, "0.0001"},
        {1e-5f, "1E-05"},
        {1.5e-45f, "1.401298E-45"},
    };
    Var value;
    for (const Case& c : cases) {
        SetReal(value.v, VT_R4, c.value);
        const Result result = ToText(value.v);
        EXPECT_EQ(result.hr, S_OK) << c.text;
        EXPECT_EQ(result.text, c.text);
    }
}

TEST(VariantChangeTypeText, IntegersInDecimal) {
    struct Case {
        VARTYPE vt;
        long long bits;
        const char* text;
    } const cases[] = {
        {VT_I1, -5, "-5"},
        {VT_I1, -128, "-128"},
        {VT_UI1, 200, "200"},
        {VT_I2, 32767, "32767"},
        {VT_I2, -32768, "-32768"},
        {VT_UI2, 65535, "65535"},
        {VT_I4, 0, "0"},
        {VT_I4, -2147483647 - 1, "-2147483648"},
        {VT_UI4, 4294967295LL, "4294967295"},
        {VT_INT, -7, "-7"},
        {VT_UINT, 4000000000LL, "4000000000"},
        {VT_I8, std::numeric_limits<long long>::min(), "-9223372036854775808"},
        {VT_I8, std::numeric_limits<long long>::max(), "9223372036854775807"},
        {VT_UI8, -1, "18446744073709551615"},
    };
    Var value;
    for (const Case& c : cases) {
        SetInteger(value.v, c.vt, c.bits);
        const Result result = ToText(value.v);
        EXPECT_EQ(result.hr, S_OK) << TypeName(c.vt) << " " << c.text;
        EXPECT_EQ(result.text, c.text) << TypeName(c.vt);
    }
}

TEST(VariantChangeTypeText, CurrencyAndDecimalWithTheirDigits) {
    struct CyCase {
        long long raw;
        const char* text;
    } const currency[] = {
        {15000, "1.5"},
        {1, "0.0001"},
        {-10000, "-1"},
        {0, "0"},
        {std::numeric_limits<long long>::max(), "922337203685477.5807"},
        {std::numeric_limits<long long>::min(), "-922337203685477.5808"},
    };
    Var value;
    for (const CyCase& c : currency) {
        VariantClear(&value);
        value.v.vt = VT_CY;
        value.v.cyVal.int64 = c.raw;
        const Result result = ToText(value.v);
        EXPECT_EQ(result.hr, S_OK);
        EXPECT_EQ(result.text, c.text);
    }
    struct DecCase {
        BYTE scale;
        bool negative;
        ULONG hi;
        ULONGLONG lo;
        const char* text;
    } const decimals[] = {
        {2, true, 0, 12345, "-123.45"},
        {0, false, 0xFFFFFFFF, ~0ULL, "79228162514264337593543950335"},
        {28, false, 0, 1, "0.0000000000000000000000000001"},
        {3, false, 0, 1000, "1"},
        {1, false, 0, 0, "0"},
    };
    for (const DecCase& c : decimals) {
        SetDecimal(value.v, c.scale, c.negative, c.hi, c.lo);
        const Result result = ToText(value.v);
        EXPECT_EQ(result.hr, S_OK);
        EXPECT_EQ(result.text, c.text);
    }
}

TEST(VariantChangeTypeText, BooleansAsNumbersOrWords) {
    Var value;
    SetInteger(value.v, VT_BOOL, VARIANT_TRUE);
    EXPECT_EQ(ToText(value.v).text, "-1");
    EXPECT_EQ(ToText(value.v, VARIANT_NOVALUEPROP).text, "-1");
    EXPECT_EQ(ToText(value.v, VARIANT_ALPHABOOL).text, "True");
    EXPECT_EQ(ToText(value.v, VARIANT_LOCALBOOL).text, "True");
    SetInteger(value.v, VT_BOOL, VARIANT_FALSE);
    EXPECT_EQ(ToText(value.v).text, "0");
    EXPECT_EQ(ToText(value.v, VARIANT_ALPHABOOL).text, "False");
    EXPECT_EQ(ToText(value.v, VARIANT_LOCALBOOL).text, "False");
    // A true that is not -1 prints as stored.
    SetInteger(value.v, VT_BOOL, 1);
    EXPECT_EQ(ToText(value.v).text, "1");
    EXPECT_EQ(ToText(value.v, VARIANT_ALPHABOOL).text, "True");
}

TEST(VariantChangeTypeText, EmptyDatesAndLocales) {
    Var value;
    const Result empty = ToText(value.v);
    EXPECT_EQ(empty.hr, S_OK);
    EXPECT_EQ(empty.text, "");

    SetReal(value.v, VT_DATE, 45351.5);
    EXPECT_EQ(ToText(value.v).text, "2/29/2024 12:00:00 PM");
    // The variant flags are no date flags: the whole date prints.
    EXPECT_EQ(ToText(value.v, VARIANT_NOVALUEPROP).text, "2/29/2024 12:00:00 PM");
    EXPECT_EQ(ToText(value.v, 0, LOCALE_INVARIANT).text, "02/29/2024 12:00:00");
    SetReal(value.v, VT_DATE, 45351);
    EXPECT_EQ(ToText(value.v).text, "2/29/2024");
    SetReal(value.v, VT_DATE, 0.25);
    EXPECT_EQ(ToText(value.v).text, "6:00:00 AM");
    SetReal(value.v, VT_DATE, 1e10);
    EXPECT_EQ(ToText(value.v).hr, E_INVALIDARG);

    for (LCID lcid :
         {LOCALE_NEUTRAL, LOCALE_USER_DEFAULT, LOCALE_SYSTEM_DEFAULT, LOCALE_INVARIANT}) {
        SetReal(value.v, VT_R8, 1.5);
        EXPECT_EQ(ToText(value.v, 0, lcid).text, "1.5") << lcid;
    }
    if (kOwnImplementation) {
        // Only the locales of VarBstrFromDate are known here.
        EXPECT_EQ(ToText(value.v, 0, 0x407).hr, E_INVALIDARG);
        SetInteger(value.v, VT_I4, 5);
        EXPECT_EQ(ToText(value.v, 0, 0x12345).hr, E_INVALIDARG);
    }
}

// -------------------------------------------------------------- from text

struct Parsed {
    HRESULT hr;
    VARIANT value;
};

HRESULT FromText(const std::string& text, VARTYPE vt, VARIANT* result, USHORT flags = 0) {
    Var source;
    SetText(source.v, text);
    VariantClear(result);
    return VariantChangeTypeEx(result, &source, kEnglishUs, flags, vt);
}

TEST(VariantChangeTypeFromText, Integers) {
    struct Case {
        const char* text;
        VARTYPE vt;
        HRESULT hr;
        long long value;
    } const cases[] = {
        {" 12 ", VT_I4, S_OK, 12},
        {"\t7\t", VT_I4, S_OK, 7},
        {"+5", VT_I4, S_OK, 5},
        {"- 5", VT_I4, S_OK, -5},
        {"5-", VT_I4, S_OK, -5},
        {"(5)", VT_I4, S_OK, -5},
        {"$5", VT_I4, S_OK, 5},
        {"1,234.5", VT_I4, S_OK, 1234},
        {"1,234.5", VT_I2, S_OK, 1234},
        {"1,234.5", VT_UI1, DISP_E_OVERFLOW, 0},
        {"1,2,3", VT_I4, S_OK, 123},
        {"5,", VT_I4, S_OK, 5},
        {"1.", VT_I4, S_OK, 1},
        {".5", VT_I4, S_OK, 0},
        {"2.5", VT_I4, S_OK, 2},
        {"3.5", VT_I4, S_OK, 4},
        {"-2.5", VT_I4, S_OK, -2},
        {"3.5", VT_UI1, S_OK, 4},
        {"-2.5", VT_UI1, DISP_E_OVERFLOW, 0},
        {"1e3", VT_I4, S_OK, 1000},
        {"1E+2", VT_I2, S_OK, 100},
        {"1e-2", VT_I4, S_OK, 0},
        {"1e3", VT_UI1, DISP_E_OVERFLOW, 0},
        {"32767", VT_I2, S_OK, 32767},
        {"32768", VT_I2, DISP_E_OVERFLOW, 0},
        {"-32768", VT_I2, S_OK, -32768},
        {"-32769", VT_I2, DISP_E_OVERFLOW, 0},
        {"2147483647", VT_I4, S_OK, 2147483647},
        {"2147483648", VT_I4, DISP_E_OVERFLOW, 0},
        {"2147483647.5", VT_I4, DISP_E_OVERFLOW, 0},
        {"2147483647.5", VT_I8, S_OK, 2147483648LL},
        {"-0", VT_I4, S_OK, 0},
        {"0.0", VT_I2, S_OK, 0},
        {"&H10", VT_I4, S_OK, 16},
        {"&h1f", VT_I2, S_OK, 31},
        {"&O17", VT_I4, S_OK, 15},
        {"&HFFFF", VT_I2, S_OK, -1},
        {"&HFFFF", VT_I4, S_OK, 65535},
        {"&HFFFF", VT_UI1, DISP_E_OVERFLOW, 0},
        {"&H8000", VT_I2, S_OK, -32768},
        {"&HFFFFFFFF", VT_I4, S_OK, -1},
        {"&HFFFFFFFF", VT_I8, S_OK, 4294967295LL},
        {"&HFFFFFFFF", VT_I2, DISP_E_OVERFLOW, 0},
        {"abc", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {"", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {" ", VT_I2, DISP_E_TYPEMISMATCH, 0},
        {"12abc", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {"0x10", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {"1e", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {"1e+", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {"1d3", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {"1E2.5", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {"--5", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {"1 000", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {",5", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {"1.2.3", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {"%5", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {"1%", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {"&B101", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {"&H", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {"&HG", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {"&o8", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {"#1#", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {"True", VT_I4, DISP_E_TYPEMISMATCH, 0},
        {"1.5e400", VT_I4, DISP_E_OVERFLOW, 0},
        {" 12 ", VT_CY, S_OK, 120000},
        {"1,234.5", VT_CY, S_OK, 12345000},
        {"-2.5", VT_CY, S_OK, -25000},
        {"1e-2", VT_CY, S_OK, 100},
        {"922337203685477.5808", VT_CY, DISP_E_OVERFLOW, 0},
        {"9223372036854775807", VT_I8, S_OK, std::numeric_limits<long long>::max()},
        {"9223372036854775808", VT_I8, DISP_E_OVERFLOW, 0},
        {"18446744073709551615", VT_UI8, S_OK, -1},
        {"18446744073709551616", VT_UI8, DISP_E_OVERFLOW, 0},
    };
    for (const Case& c : cases) {
        Var result;
        const HRESULT hr = FromText(c.text, c.vt, &result.v);
        EXPECT_EQ(hr, c.hr) << '"' << c.text << "\" to " << TypeName(c.vt);
        if (SUCCEEDED(hr) && SUCCEEDED(c.hr)) {
            EXPECT_EQ(result.v.vt, c.vt);
            EXPECT_EQ(IntegerOf(result.v), c.value) << '"' << c.text << "\" to " << TypeName(c.vt);
        } else {
            EXPECT_EQ(result.v.vt, VT_EMPTY) << "a failure leaves the destination";
        }
    }
}

TEST(VariantChangeTypeFromText, CurrencyExactly) {
    if (RunningOnWine())
        GTEST_SKIP() << "Wine reads currency text through a double: \"0.00005\" is 1, the "
                        "largest currency overflows";
    struct Case {
        const char* text;
        long long value;
    } const cases[] = {
        {"0.00005", 0},
        {"0.00015", 2},
        {"0.00025", 2},
        {"0.000250001", 3},
        {"922337203685477.5807", std::numeric_limits<long long>::max()},
        {"-922337203685477.5808", std::numeric_limits<long long>::min()},
    };
    for (const Case& c : cases) {
        Var result;
        ASSERT_EQ(FromText(c.text, VT_CY, &result.v), S_OK) << c.text;
        EXPECT_EQ(result.v.cyVal.int64, c.value) << c.text;
    }
}

// Equal doubles; under Wine, whose text reader is not correctly rounded,
// within a relative 1e-15.
bool SameReal(double a, double b) {
    if (a == b)
        return true;
    return RunningOnWine() && std::fabs(a - b) <= std::fabs(b) * 1e-15;
}

TEST(VariantChangeTypeFromText, Reals) {
    struct Case {
        const char* text;
        VARTYPE vt;
        HRESULT hr;
        double value;
    } const cases[] = {
        {" 12 ", VT_R8, S_OK, 12},
        {"1,234.5", VT_R8, S_OK, 1234.5},
        {"1,234.5", VT_R4, S_OK, 1234.5},
        {".5", VT_R8, S_OK, 0.5},
        {"1e-2", VT_R8, S_OK, 0.01},
        {"1e-2", VT_R4, S_OK, 0.01f},
        {"(5)", VT_R8, S_OK, -5},
        {"2147483648", VT_R8, S_OK, 2147483648.0},
        {"0.1", VT_R8, S_OK, 0.1},
        {"0.333333333333333", VT_R8, S_OK, 0.333333333333333},
        {"1.79769313486232E+308", VT_R8, DISP_E_OVERFLOW, 0},
        {"1.79769313486231E+308", VT_R8, S_OK, 1.79769313486231e308},
        {"1E-05", VT_R8, S_OK, 1e-5},
        {"&H10", VT_R8, S_OK, 16},
        {"1.5e400", VT_R8, DISP_E_OVERFLOW, 0},
        {"1.5e400", VT_R4, DISP_E_OVERFLOW, 0},
        {"1e39", VT_R4, DISP_E_OVERFLOW, 0},
        {"abc", VT_R8, DISP_E_TYPEMISMATCH, 0},
        {"", VT_R4, DISP_E_TYPEMISMATCH, 0},
    };
    for (const Case& c : cases) {
        Var result;
        const HRESULT hr = FromText(c.text, c.vt, &result.v);
        EXPECT_EQ(hr, c.hr) << '"' << c.text << "\" to " << TypeName(c.vt);
        if (SUCCEEDED(hr) && SUCCEEDED(c.hr)) {
            ASSERT_EQ(result.v.vt, c.vt);
            if (c.vt == VT_R4)
                EXPECT_EQ(result.v.fltVal, static_cast<float>(c.value)) << c.text;
            else
                EXPECT_TRUE(SameReal(result.v.dblVal, c.value)) << c.text;
        }
    }
    Var negativeZero;
    ASSERT_EQ(FromText("-0", VT_R8, &negativeZero.v), S_OK);
    EXPECT_TRUE(std::signbit(negativeZero.v.dblVal));
}

TEST(VariantChangeTypeFromText, Decimals) {
    struct Case {
        const char* text;
        HRESULT hr;
        BYTE scale;
        BYTE sign;
        ULONGLONG lo;
    } const cases[] = {
        {" 12 ", S_OK, 0, 0, 12},
        {"1,234.5", S_OK, 1, 0, 12345},
        {"-2.5", S_OK, 1, DECIMAL_NEG, 25},
        {"(5)", S_OK, 0, DECIMAL_NEG, 5},
        {"1e-2", S_OK, 2, 0, 1},
        {"1e3", S_OK, 0, 0, 1000},
        {"0.0", S_OK, 1, 0, 0},
        {"-0", S_OK, 0, 0, 0},
        {"&HFFFF", S_OK, 0, 0, 65535},
        {"abc", DISP_E_TYPEMISMATCH, 0, 0, 0},
        {"1.5e400", DISP_E_OVERFLOW, 0, 0, 0},
        {"79228162514264337593543950336", DISP_E_OVERFLOW, 0, 0, 0},
    };
    for (const Case& c : cases) {
        Var result;
        const HRESULT hr = FromText(c.text, VT_DECIMAL, &result.v);
        EXPECT_EQ(hr, c.hr) << c.text;
        if (SUCCEEDED(hr) && SUCCEEDED(c.hr)) {
            ASSERT_EQ(result.v.vt, VT_DECIMAL);
            EXPECT_EQ(result.v.decVal.scale, c.scale) << c.text;
            EXPECT_EQ(result.v.decVal.sign, c.sign) << c.text;
            EXPECT_EQ(result.v.decVal.Hi32, 0u) << c.text;
            EXPECT_EQ(result.v.decVal.Lo64, c.lo) << c.text;
        }
    }
    Var largest;
    ASSERT_EQ(FromText("79228162514264337593543950335", VT_DECIMAL, &largest.v), S_OK);
    EXPECT_EQ(largest.v.decVal.Hi32, 0xFFFFFFFFu);
    EXPECT_EQ(largest.v.decVal.Lo64, ~0ULL);
    EXPECT_EQ(largest.v.decVal.scale, 0);
}

TEST(VariantChangeTypeFromText, BooleansFromWordsOrNumbers) {
    struct Case {
        const char* text;
        HRESULT hr;
        VARIANT_BOOL value;
    } const cases[] = {
        {"True", S_OK, VARIANT_TRUE},       {"TRUE", S_OK, VARIANT_TRUE},
        {"false", S_OK, VARIANT_FALSE},     {"#TRUE#", S_OK, VARIANT_TRUE},
        {"1", S_OK, VARIANT_TRUE},          {"-1", S_OK, VARIANT_TRUE},
        {"0", S_OK, VARIANT_FALSE},         {"0.0", S_OK, VARIANT_FALSE},
        {"2.5", S_OK, VARIANT_TRUE},        {"0.4", S_OK, VARIANT_TRUE},
        {" 12 ", S_OK, VARIANT_TRUE},       {"&H10", S_OK, VARIANT_TRUE},
        {" true ", DISP_E_TYPEMISMATCH, 0}, {"yes", DISP_E_TYPEMISMATCH, 0},
        {"On", DISP_E_TYPEMISMATCH, 0},     {"tru", DISP_E_TYPEMISMATCH, 0},
        {"", DISP_E_TYPEMISMATCH, 0},       {"1.5e400", DISP_E_OVERFLOW, 0},
    };
    for (USHORT flags : {0, VARIANT_ALPHABOOL, VARIANT_LOCALBOOL}) {
        for (const Case& c : cases) {
            Var result;
            const HRESULT hr = FromText(c.text, VT_BOOL, &result.v, flags);
            EXPECT_EQ(hr, c.hr) << c.text;
            if (SUCCEEDED(hr) && SUCCEEDED(c.hr)) {
                ASSERT_EQ(result.v.vt, VT_BOOL);
                EXPECT_EQ(result.v.boolVal, c.value) << c.text;
            }
        }
    }
}

TEST(VariantChangeTypeFromText, DatesThroughVarDateFromStr) {
    Var result;
    ASSERT_EQ(FromText("2/29/2024 1:00:00 PM", VT_DATE, &result.v), S_OK);
    EXPECT_EQ(result.v.vt, VT_DATE);
    EXPECT_NEAR(result.v.date, 45351 + 13.0 / 24, 1e-9);
    Var wrong;
    EXPECT_EQ(FromText("abc", VT_DATE, &wrong.v), DISP_E_TYPEMISMATCH);
    EXPECT_EQ(FromText("45351.5", VT_DATE, &wrong.v), DISP_E_TYPEMISMATCH);
}

// ------------------------------------------------------ between numbers

// Clears what the result held, then changes the source into it.
HRESULT Change(VARIANT& source, VARTYPE vt, VARIANT* result) {
    VariantClear(result);
    return VariantChangeType(result, &source, 0, vt);
}

TEST(VariantChangeTypeNumbers, DoublesRoundHalfToEvenAndOverflow) {
    struct Case {
        double value;
        VARTYPE vt;
        HRESULT hr;
        long long expected;
    } const cases[] = {
        {2.5, VT_I4, S_OK, 2},
        {3.5, VT_I4, S_OK, 4},
        {-2.5, VT_I4, S_OK, -2},
        {-0.5, VT_I4, S_OK, 0},
        {0.5, VT_I2, S_OK, 0},
        {1.5, VT_I2, S_OK, 2},
        {-0.5, VT_UI1, S_OK, 0},
        {-1, VT_UI1, DISP_E_OVERFLOW, 0},
        {-2.5, VT_UI2, DISP_E_OVERFLOW, 0},
        {127.5, VT_I1, DISP_E_OVERFLOW, 0},
        {-128.5, VT_I1, S_OK, -128},
        {127.5, VT_UI1, S_OK, 128},
        {255.5, VT_UI1, DISP_E_OVERFLOW, 0},
        {32767.5, VT_I2, DISP_E_OVERFLOW, 0},
        {-32768.5, VT_I2, S_OK, -32768},
        {32767.5, VT_UI2, S_OK, 32768},
        {65535.5, VT_UI2, DISP_E_OVERFLOW, 0},
        {2147483647.5, VT_I4, DISP_E_OVERFLOW, 0},
        {-2147483648.5, VT_I4, S_OK, -2147483647 - 1},
        {2147483647.5, VT_INT, DISP_E_OVERFLOW, 0},
        {4294967295.5, VT_UI4, DISP_E_OVERFLOW, 0},
        {4294967295.5, VT_I8, S_OK, 4294967296LL},
        {9.2233720368547758e18, VT_I8, DISP_E_OVERFLOW, 0},
        {9.2233720368547758e18, VT_UI8, S_OK, static_cast<long long>(1ULL << 63)},
        {1.8446744073709552e19, VT_UI8, DISP_E_OVERFLOW, 0},
        {1e19, VT_UI8, S_OK, static_cast<long long>(10000000000000000000ULL)},
        {-1e19, VT_I8, DISP_E_OVERFLOW, 0},
        {1e30, VT_UI8, DISP_E_OVERFLOW, 0},
        {2.5, VT_CY, S_OK, 25000},
        {0.00015, VT_CY, S_OK, 1}, // just below half a unit: 1.4999999999999999e-04
        {0.00005, VT_CY, S_OK, 1}, // just above half a unit: 5.0000000000000002e-05
        {922337203685477.62, VT_CY, DISP_E_OVERFLOW, 0},
        {1e19, VT_CY, DISP_E_OVERFLOW, 0},
    };
    for (const Case& c : cases) {
        Var source, result;
        SetReal(source.v, VT_R8, c.value);
        const HRESULT hr = Change(source.v, c.vt, &result.v);
        EXPECT_EQ(hr, c.hr) << c.value << " to " << TypeName(c.vt);
        if (SUCCEEDED(hr) && SUCCEEDED(c.hr)) {
            EXPECT_EQ(result.v.vt, c.vt);
            EXPECT_EQ(IntegerOf(result.v), c.expected) << c.value << " to " << TypeName(c.vt);
        }
        // The same through a date and a float where they hold the value.
        if (std::fabs(c.value) < 2958465 && c.vt != VT_CY) {
            SetReal(source.v, VT_DATE, c.value);
            EXPECT_EQ(Change(source.v, c.vt, &result.v), c.hr) << "date " << c.value;
            if (SUCCEEDED(c.hr)) {
                EXPECT_EQ(IntegerOf(result.v), c.expected);
            }
            VariantClear(&result.v);
        }
    }
}

TEST(VariantChangeTypeNumbers, IntegersKeepTheirRangeButChangeSignByBits) {
    struct Case {
        VARTYPE from;
        long long value;
        VARTYPE to;
        HRESULT hr;
        long long expected;
    } const cases[] = {
        {VT_I4, 32767, VT_I2, S_OK, 32767},
        {VT_I4, 32768, VT_I2, DISP_E_OVERFLOW, 0},
        {VT_I4, -32769, VT_I2, DISP_E_OVERFLOW, 0},
        {VT_I4, 127, VT_I1, S_OK, 127},
        {VT_I4, 128, VT_I1, DISP_E_OVERFLOW, 0},
        {VT_I4, 255, VT_UI1, S_OK, 255},
        {VT_I4, 256, VT_UI1, DISP_E_OVERFLOW, 0},
        {VT_I4, -1, VT_UI1, DISP_E_OVERFLOW, 0},
        {VT_I4, 65535, VT_UI2, S_OK, 65535},
        {VT_I4, 65536, VT_UI2, DISP_E_OVERFLOW, 0},
        {VT_I4, -1, VT_UI2, DISP_E_OVERFLOW, 0},
        {VT_I4, -1, VT_UI8, DISP_E_OVERFLOW, 0},
        {VT_I4, -1, VT_I8, S_OK, -1},
        // Same width: the bits.
        {VT_I4, -1, VT_UI4, S_OK, 4294967295LL},
        {VT_I4, -1, VT_UINT, S_OK, 4294967295LL},
        {VT_UINT, 4000000000LL, VT_I4, S_OK, -294967296},
        {VT_I1, -5, VT_UI1, S_OK, 251},
        {VT_UI1, 200, VT_I1, S_OK, -56},
        {VT_UI8, -1, VT_I8, S_OK, -1},
        {VT_I8, std::numeric_limits<long long>::min(), VT_UI8, S_OK,
         std::numeric_limits<long long>::min()},
        // True is all bits set in the unsigned types.
        {VT_BOOL, VARIANT_TRUE, VT_I4, S_OK, -1},
        {VT_BOOL, VARIANT_TRUE, VT_I1, S_OK, -1},
        {VT_BOOL, VARIANT_TRUE, VT_UI1, S_OK, 255},
        {VT_BOOL, VARIANT_TRUE, VT_UI2, S_OK, 65535},
        {VT_BOOL, VARIANT_TRUE, VT_UI4, S_OK, 4294967295LL},
        {VT_BOOL, VARIANT_TRUE, VT_UI8, S_OK, -1},
        {VT_BOOL, VARIANT_TRUE, VT_CY, S_OK, -10000},
        {VT_BOOL, 1, VT_I4, S_OK, 1},
        {VT_I4, 5, VT_BOOL, S_OK, VARIANT_TRUE},
        {VT_I4, 0, VT_BOOL, S_OK, VARIANT_FALSE},
        {VT_I8, 922337203685476LL, VT_CY, S_OK, 9223372036854760000LL},
        {VT_I8, 922337203685478LL, VT_CY, DISP_E_OVERFLOW, 0},
        {VT_UI8, -1, VT_CY, DISP_E_OVERFLOW, 0},
        {VT_I8, std::numeric_limits<long long>::min(), VT_CY, DISP_E_OVERFLOW, 0},
    };
    for (const Case& c : cases) {
        Var source, result;
        SetInteger(source.v, c.from, c.value);
        const HRESULT hr = Change(source.v, c.to, &result.v);
        EXPECT_EQ(hr, c.hr) << TypeName(c.from) << " " << c.value << " to " << TypeName(c.to);
        if (SUCCEEDED(hr) && SUCCEEDED(c.hr)) {
            EXPECT_EQ(result.v.vt, c.to);
            EXPECT_EQ(IntegerOf(result.v), c.expected)
                << TypeName(c.from) << " " << c.value << " to " << TypeName(c.to);
        }
    }
}

TEST(VariantChangeTypeNumbers, CurrencyDecimalsAndReals) {
    Var source, result;
    VariantClear(&source);
    source.v.vt = VT_CY;
    for (long long raw : {25000LL, 35000LL, -25000LL, 15000LL}) {
        source.v.cyVal.int64 = raw;
        ASSERT_EQ(Change(source.v, VT_I4, &result.v), S_OK);
        const long long expected = raw == 25000 ? 2 : raw == 35000 ? 4 : raw == -25000 ? -2 : 2;
        EXPECT_EQ(result.v.lVal, expected) << raw;
        ASSERT_EQ(Change(source.v, VT_R8, &result.v), S_OK);
        EXPECT_EQ(result.v.dblVal, raw / 10000.0);
    }
    SetDecimal(source.v, 1, false, 0, 25);
    ASSERT_EQ(Change(source.v, VT_I4, &result.v), S_OK);
    EXPECT_EQ(result.v.lVal, 2);
    SetDecimal(source.v, 1, false, 0, 35);
    ASSERT_EQ(Change(source.v, VT_I4, &result.v), S_OK);
    EXPECT_EQ(result.v.lVal, 4);
    ASSERT_EQ(Change(source.v, VT_CY, &result.v), S_OK);
    EXPECT_EQ(result.v.cyVal.int64, 35000);
    SetDecimal(source.v, 0, false, 0xFFFFFFFF, ~0ULL);
    ASSERT_EQ(Change(source.v, VT_R8, &result.v), S_OK);
    EXPECT_EQ(result.v.dblVal, 7.9228162514264338e28);
    EXPECT_EQ(Change(source.v, VT_I8, &result.v), DISP_E_OVERFLOW);
    EXPECT_EQ(Change(source.v, VT_CY, &result.v), DISP_E_OVERFLOW);

    // Doubles become decimals through their 15 significant digits; past 2^53
    // with every digit.
    struct Case {
        double value;
        BYTE scale;
        BYTE sign;
        ULONG hi;
        ULONGLONG lo;
    } const cases[] = {
        {2.5, 1, 0, 0, 25},
        {-0.5, 1, DECIMAL_NEG, 0, 5},
        {-1, 0, DECIMAL_NEG, 0, 1},
        {0.00015, 5, 0, 0, 15},
        {922337203685477.62, 0, 0, 0, 922337203685478ULL},
        {1e19, 0, 0, 0, 10000000000000000000ULL},
        {9.2233720368547758e18, 0, 0, 0, 9223372036854775808ULL},
        {1.8446744073709552e19, 0, 0, 1, 0},
    };
    for (const Case& c : cases) {
        SetReal(source.v, VT_R8, c.value);
        ASSERT_EQ(Change(source.v, VT_DECIMAL, &result.v), S_OK) << c.value;
        EXPECT_EQ(result.v.decVal.scale, c.scale) << c.value;
        EXPECT_EQ(result.v.decVal.sign, c.sign) << c.value;
        EXPECT_EQ(result.v.decVal.Hi32, c.hi) << c.value;
        EXPECT_EQ(result.v.decVal.Lo64, c.lo) << c.value;
    }
    SetReal(source.v, VT_R8, 1e30);
    EXPECT_EQ(Change(source.v, VT_DECIMAL, &result.v), DISP_E_OVERFLOW);

    SetReal(source.v, VT_R8, 1e300);
    EXPECT_EQ(Change(source.v, VT_R4, &result.v), DISP_E_OVERFLOW);
    SetReal(source.v, VT_R8, 0.1);
    ASSERT_EQ(Change(source.v, VT_R4, &result.v), S_OK);
    EXPECT_EQ(result.v.fltVal, 0.1f);

    // Dates hold days -657434 to 2958465.
    for (double day : {1e10, -700000.0, 3e6, 2958466.0, -657435.0}) {
        SetReal(source.v, VT_R8, day);
        EXPECT_EQ(Change(source.v, VT_DATE, &result.v), DISP_E_OVERFLOW) << day;
    }
    SetReal(source.v, VT_R8, 2958465.5);
    ASSERT_EQ(Change(source.v, VT_DATE, &result.v), S_OK);
    EXPECT_EQ(result.v.date, 2958465.5);
    SetReal(source.v, VT_DATE, 45351.5);
    ASSERT_EQ(Change(source.v, VT_I4, &result.v), S_OK);
    EXPECT_EQ(result.v.lVal, 45352);
    ASSERT_EQ(Change(source.v, VT_BOOL, &result.v), S_OK);
    EXPECT_EQ(result.v.boolVal, VARIANT_TRUE);
    ASSERT_EQ(Change(source.v, VT_CY, &result.v), S_OK);
    EXPECT_EQ(result.v.cyVal.int64, 453515000);

    SetInteger(source.v, VT_BOOL, VARIANT_TRUE);
    ASSERT_EQ(Change(source.v, VT_R8, &result.v), S_OK);
    EXPECT_EQ(result.v.dblVal, -1);
    ASSERT_EQ(Change(source.v, VT_DATE, &result.v), S_OK);
    EXPECT_EQ(result.v.date, -1);
    if (RunningOnWine()) {
        // Wine makes true the decimal +1; Windows documents true as -1.
    } else {
        ASSERT_EQ(Change(source.v, VT_DECIMAL, &result.v), S_OK);
        EXPECT_EQ(result.v.decVal.sign, DECIMAL_NEG);
        EXPECT_EQ(result.v.decVal.Lo64, 1u);
    }
}

// ------------------------------------------------------- special types

constexpr VARTYPE kScalarTypes[] = {VT_EMPTY, VT_NULL, VT_I1,   VT_UI1,  VT_I2,    VT_UI2,    VT_I4,
                                    VT_UI4,   VT_INT,  VT_UINT, VT_I8,   VT_UI8,   VT_R4,     VT_R8,
                                    VT_CY,    VT_DATE, VT_BSTR, VT_BOOL, VT_ERROR, VT_DECIMAL};

TEST(VariantChangeTypeSpecial, EmptyNullAndError) {
    for (VARTYPE vt : kScalarTypes) {
        Var empty, null, error, result;
        null.v.vt = VT_NULL;
        error.v.vt = VT_ERROR;
        error.v.scode = 5;
        // Empty is zero, "" or false; it is no error.
        const HRESULT fromEmpty = Change(empty.v, vt, &result.v);
        if (vt == VT_ERROR) {
            EXPECT_EQ(fromEmpty, DISP_E_TYPEMISMATCH);
        } else {
            EXPECT_EQ(fromEmpty, S_OK) << TypeName(vt);
            EXPECT_EQ(result.v.vt, vt);
            if (vt == VT_BSTR) {
                EXPECT_EQ(SysStringLen(result.v.bstrVal), 0u);
            } else if (vt == VT_R8 || vt == VT_DATE) {
                EXPECT_EQ(result.v.dblVal, 0.0);
            } else if (vt == VT_DECIMAL) {
                EXPECT_EQ(result.v.decVal.Lo64 | result.v.decVal.Hi32, 0u);
            } else if (vt != VT_R4 && vt != VT_EMPTY && vt != VT_NULL) {
                EXPECT_EQ(IntegerOf(result.v), 0) << TypeName(vt);
            }
        }
        VariantClear(&result.v);
        // Null becomes only null.
        EXPECT_EQ(Change(null.v, vt, &result.v), vt == VT_NULL ? S_OK : DISP_E_TYPEMISMATCH)
            << TypeName(vt);
        VariantClear(&result.v);
        // An error changes only to itself.
        EXPECT_EQ(Change(error.v, vt, &result.v), vt == VT_ERROR ? S_OK : DISP_E_TYPEMISMATCH)
            << TypeName(vt);
        if (vt == VT_ERROR) {
            EXPECT_EQ(result.v.scode, 5);
        }
        VariantClear(&result.v);
        // Every value but an error becomes empty or null.
        Var number;
        SetInteger(number.v, VT_I4, 0);
        EXPECT_EQ(Change(number.v, VT_EMPTY, &result.v), S_OK);
        EXPECT_EQ(result.v.vt, VT_EMPTY);
        EXPECT_EQ(Change(number.v, VT_NULL, &result.v), S_OK);
        EXPECT_EQ(result.v.vt, VT_NULL);
    }
    Var null, result;
    null.v.vt = VT_NULL;
    EXPECT_EQ(Change(null.v, VT_I4, &result.v), DISP_E_TYPEMISMATCH);
    EXPECT_EQ(Change(null.v, VT_EMPTY, &result.v), DISP_E_TYPEMISMATCH);
}

TEST(VariantChangeTypeSpecial, TypeCodes) {
    Var source, result;
    SetInteger(source.v, VT_I4, 0);
    for (VARTYPE vt : {static_cast<VARTYPE>(15), static_cast<VARTYPE>(VT_VOID),
                       static_cast<VARTYPE>(VT_HRESULT), static_cast<VARTYPE>(VT_INT_PTR),
                       static_cast<VARTYPE>(VT_FILETIME), static_cast<VARTYPE>(0x7ff)})
        EXPECT_EQ(Change(source.v, vt, &result.v), DISP_E_BADVARTYPE) << vt;
    for (VARTYPE vt :
         {static_cast<VARTYPE>(VT_VARIANT), static_cast<VARTYPE>(VT_RECORD),
          static_cast<VARTYPE>(VT_I4 | VT_BYREF), static_cast<VARTYPE>(VT_I4 | VT_ARRAY),
          static_cast<VARTYPE>(VT_UNKNOWN), static_cast<VARTYPE>(VT_DISPATCH)})
        EXPECT_EQ(Change(source.v, vt, &result.v), DISP_E_TYPEMISMATCH) << vt;
    Var bad;
    bad.v.vt = 0x7ff;
    EXPECT_EQ(Change(bad.v, VT_I4, &result.v), DISP_E_BADVARTYPE);
    bad.v.vt = VT_EMPTY;
}

TEST(VariantChangeTypeSpecial, ByReferenceSources) {
    LONG number = 42;
    Var reference, result;
    reference.v.vt = VT_I4 | VT_BYREF;
    reference.v.plVal = &number;
    ASSERT_EQ(Change(reference.v, VT_BSTR, &result.v), S_OK);
    EXPECT_EQ(Ascii(result.v.bstrVal), "42");
    ASSERT_EQ(Change(reference.v, VT_I4, &result.v), S_OK);
    EXPECT_EQ(result.v.vt, VT_I4);
    EXPECT_EQ(result.v.lVal, 42);
    EXPECT_EQ(Change(reference.v, VT_I4 | VT_BYREF, &result.v), DISP_E_TYPEMISMATCH);

    BSTR text = Bstr("1,234.5");
    Var textReference;
    textReference.v.vt = VT_BSTR | VT_BYREF;
    textReference.v.pbstrVal = &text;
    ASSERT_EQ(Change(textReference.v, VT_R8, &result.v), S_OK);
    EXPECT_EQ(result.v.dblVal, 1234.5);
    // Changing a string to a string copies it: the reference still owns its own.
    ASSERT_EQ(Change(textReference.v, VT_BSTR, &result.v), S_OK);
    EXPECT_NE(result.v.bstrVal, text);
    EXPECT_EQ(Ascii(result.v.bstrVal), "1,234.5");
    VariantClear(&result.v);
    SysFreeString(text);

    Var inner, variantReference;
    SetInteger(inner.v, VT_I4, 7);
    variantReference.v.vt = VT_VARIANT | VT_BYREF;
    variantReference.v.pvarVal = &inner.v;
    ASSERT_EQ(Change(variantReference.v, VT_BSTR, &result.v), S_OK);
    EXPECT_EQ(Ascii(result.v.bstrVal), "7");

    DOUBLE real = 2.5;
    Var realReference;
    realReference.v.vt = VT_R8 | VT_BYREF;
    realReference.v.pdblVal = &real;
    ASSERT_EQ(Change(realReference.v, VT_I2, &result.v), S_OK);
    EXPECT_EQ(result.v.iVal, 2);
}

TEST(VariantChangeTypeSpecial, InPlaceAndFailureLeaveTheDestination) {
    Var value;
    SetText(value.v, "12");
    ASSERT_EQ(VariantChangeType(&value.v, &value.v, 0, VT_I4), S_OK);
    EXPECT_EQ(value.v.vt, VT_I4);
    EXPECT_EQ(value.v.lVal, 12);
    ASSERT_EQ(VariantChangeType(&value.v, &value.v, 0, VT_BSTR), S_OK);
    EXPECT_EQ(Ascii(value.v.bstrVal), "12");
    ASSERT_EQ(VariantChangeType(&value.v, &value.v, 0, VT_BSTR), S_OK);
    EXPECT_EQ(Ascii(value.v.bstrVal), "12");

    SetText(value.v, "abc");
    EXPECT_EQ(VariantChangeType(&value.v, &value.v, 0, VT_I4), DISP_E_TYPEMISMATCH);
    ASSERT_EQ(value.v.vt, VT_BSTR);
    EXPECT_EQ(Ascii(value.v.bstrVal), "abc");

    // The old string of the destination is freed on success, kept on failure.
    Var destination, source;
    SetText(destination.v, "old");
    SetInteger(source.v, VT_I4, 7);
    ASSERT_EQ(VariantChangeType(&destination.v, &source.v, 0, VT_R8), S_OK);
    EXPECT_EQ(destination.v.vt, VT_R8);
    EXPECT_EQ(destination.v.dblVal, 7);
    SetText(destination.v, "old");
    SetText(source.v, "zzz");
    EXPECT_EQ(VariantChangeType(&destination.v, &source.v, 0, VT_R8), DISP_E_TYPEMISMATCH);
    ASSERT_EQ(destination.v.vt, VT_BSTR);
    EXPECT_EQ(Ascii(destination.v.bstrVal), "old");
    SetInteger(source.v, VT_I4, 100000);
    EXPECT_EQ(VariantChangeType(&destination.v, &source.v, 0, VT_I2), DISP_E_OVERFLOW);
    EXPECT_EQ(Ascii(destination.v.bstrVal), "old");
}

class DispatchingUnknown : public CountingUnknown {
public:
    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** object) override {
        ++queries;
        (void)iid;
        AddRef();
        *object = this;
        return S_OK;
    }
    int queries = 0;
};

TEST(VariantChangeTypeSpecial, InterfacesThroughQueryInterface) {
    CountingUnknown plain;
    Var source, result;
    plain.AddRef();
    source.v.vt = VT_UNKNOWN;
    source.v.punkVal = &plain;
    // The same type: a copy with a reference of its own.
    ASSERT_EQ(Change(source.v, VT_UNKNOWN, &result.v), S_OK);
    EXPECT_EQ(result.v.punkVal, &plain);
    EXPECT_EQ(plain.references, 3u);
    VariantClear(&result.v);
    EXPECT_EQ(plain.references, 2u);
    // An object that is no dispatch object.
    EXPECT_EQ(Change(source.v, VT_DISPATCH, &result.v), E_NOINTERFACE);
    EXPECT_EQ(result.v.vt, VT_EMPTY);
    EXPECT_EQ(Change(source.v, VT_I4, &result.v), DISP_E_TYPEMISMATCH);
    EXPECT_EQ(Change(source.v, VT_BSTR, &result.v), DISP_E_TYPEMISMATCH);
    EXPECT_EQ(plain.references, 2u);

    DispatchingUnknown dispatching;
    VariantClear(&source.v);
    dispatching.AddRef();
    source.v.vt = VT_UNKNOWN;
    source.v.punkVal = &dispatching;
    ASSERT_EQ(Change(source.v, VT_DISPATCH, &result.v), S_OK);
    EXPECT_EQ(result.v.vt, VT_DISPATCH);
    EXPECT_EQ(dispatching.queries, 1);
    EXPECT_EQ(dispatching.references, 3u);
    VariantClear(&result.v);
    EXPECT_EQ(dispatching.references, 2u);
    VariantClear(&source.v);
    EXPECT_EQ(plain.references, 1u);
    EXPECT_EQ(dispatching.references, 1u);

    // Null pointers change between the interface types.
    source.v.vt = VT_UNKNOWN;
    source.v.punkVal = nullptr;
    ASSERT_EQ(Change(source.v, VT_DISPATCH, &result.v), S_OK);
    EXPECT_EQ(result.v.vt, VT_DISPATCH);
    EXPECT_EQ(result.v.pdispVal, nullptr);
    if (kOwnImplementation) {
        // A dispatch object's value needs IDispatch::Invoke, not called here
        // (Wine tries it and, for a null pointer, says DISP_E_BADVARTYPE).
        source.v.vt = VT_DISPATCH;
        EXPECT_EQ(Change(source.v, VT_I4, &result.v), DISP_E_TYPEMISMATCH);
        EXPECT_EQ(Change(source.v, VT_BSTR, &result.v), DISP_E_TYPEMISMATCH);
    }
    source.v.vt = VT_EMPTY;
}

// ----------------------------------------------------------- round trips

// Changes a value to text and back, and checks that the result equals it.
void ExpectRoundTrip(VARIANT& value, USHORT flags = 0) {
    Var text, back;
    ASSERT_EQ(VariantChangeType(&text.v, &value, flags, VT_BSTR), S_OK) << TypeName(value.vt);
    const HRESULT hr = VariantChangeType(&back.v, &text.v, flags, value.vt);
    ASSERT_EQ(hr, S_OK) << TypeName(value.vt) << " \"" << Ascii(text.v.bstrVal) << '"';
    ASSERT_EQ(back.v.vt, value.vt);
    bool same;
    switch (value.vt) {
    case VT_R4:
        same = back.v.fltVal == value.fltVal;
        break;
    case VT_R8:
        same = SameReal(back.v.dblVal, value.dblVal);
        break;
    case VT_DATE:
        same = std::fabs(back.v.date - value.date) < 0.5 / 86400 ||
               std::llround(std::fabs(back.v.date) * 86400) ==
                   std::llround(std::fabs(value.date) * 86400);
        break;
    case VT_DECIMAL:
        same = VarCmp(&back.v, &value, kEnglishUs, 0) == VARCMP_EQ;
        break;
    case VT_BSTR:
        same = Ascii(back.v.bstrVal) == Ascii(value.bstrVal);
        break;
    case VT_EMPTY:
        same = true;
        break;
    default:
        same = IntegerOf(back.v) == IntegerOf(value);
        break;
    }
    EXPECT_TRUE(same) << TypeName(value.vt) << " \"" << Ascii(text.v.bstrVal) << '"';
}

TEST(VariantChangeTypeRoundTrip, EveryScalarTypeThroughText) {
    std::mt19937_64 random(2024);
    Var value;
    // Integers: the edges and random bits.
    for (VARTYPE vt : kIntegerTypes) {
        const int bits = vt == VT_I1 || vt == VT_UI1   ? 8
                         : vt == VT_I2 || vt == VT_UI2 ? 16
                         : vt == VT_I8 || vt == VT_UI8 ? 64
                                                       : 32;
        std::vector<long long> values = {0,
                                         1,
                                         -1,
                                         127,
                                         128,
                                         255,
                                         32767,
                                         32768,
                                         65535,
                                         std::numeric_limits<long long>::min(),
                                         std::numeric_limits<long long>::max()};
        for (int i = 0; i < 500; ++i)
            values.push_back(static_cast<long long>(random()));
        for (long long v : values) {
            // Keep the type's own bits, so that the value prints as itself.
            if (bits < 64) {
                const bool isSigned = vt == VT_I1 || vt == VT_I2 || vt == VT_I4 || vt == VT_INT;
                const unsigned long long mask = (1ULL << bits) - 1;
                unsigned long long b = static_cast<unsigned long long>(v) & mask;
                if (isSigned && (b >> (bits - 1)))
                    b |= ~mask;
                v = static_cast<long long>(b);
            }
            SetInteger(value.v, vt, v);
            ExpectRoundTrip(value.v);
            EXPECT_EQ(IntegerOf(value.v), v) << TypeName(vt);
        }
    }
    // Booleans, as numbers and as words.
    for (VARIANT_BOOL b : {VARIANT_TRUE, VARIANT_FALSE}) {
        SetInteger(value.v, VT_BOOL, b);
        ExpectRoundTrip(value.v);
        ExpectRoundTrip(value.v, VARIANT_ALPHABOOL);
    }
    // Doubles with 15 significant digits and floats with 6 print exactly.
    std::uniform_int_distribution<long long> mantissa15(100000000000000LL, 999999999999999LL);
    std::uniform_int_distribution<long long> mantissa6(100000, 999999);
    std::uniform_int_distribution<int> exponent(-30, 30);
    std::vector<double> doubles = {0,
                                   1,
                                   -1,
                                   0.5,
                                   1e15,
                                   1e-5,
                                   0.0001,
                                   123456789012345.0,
                                   1.79769313486231e308,
                                   -2.2250738585072e-308};
    for (int i = 0; i < 2000; ++i) {
        const double sign = random() & 1 ? -1 : 1;
        doubles.push_back(sign * std::stod(std::to_string(mantissa15(random)) + "e" +
                                           std::to_string(exponent(random) - 14)));
    }
    for (double d : doubles) {
        SetReal(value.v, VT_R8, d);
        ExpectRoundTrip(value.v);
    }
    std::vector<float> floats = {0, 1, -1, 0.5f, 1e7f, 1e-5f, 3.40282e38f};
    for (int i = 0; i < 2000; ++i) {
        const float sign = random() & 1 ? -1.0f : 1.0f;
        floats.push_back(sign * std::stof(std::to_string(mantissa6(random)) + "e" +
                                          std::to_string(exponent(random) - 5)));
    }
    for (float f : floats) {
        SetReal(value.v, VT_R4, f);
        ExpectRoundTrip(value.v);
    }
    // Currency: every raw value prints with all its digits.
    std::vector<long long> currencies = {0,
                                         1,
                                         -1,
                                         10000,
                                         std::numeric_limits<long long>::max(),
                                         std::numeric_limits<long long>::min()};
    for (int i = 0; i < 1000; ++i)
        currencies.push_back(static_cast<long long>(random()) >> (random() % 60));
    for (long long c : currencies) {
        // Wine reads currency text through a double: only 15 digits hold.
        if (RunningOnWine() && (c >= 1000000000000000LL || c <= -1000000000000000LL))
            continue;
        VariantClear(&value.v);
        value.v.vt = VT_CY;
        value.v.cyVal.int64 = c;
        ExpectRoundTrip(value.v);
    }
    // Decimals of every scale.
    for (int i = 0; i < 1000; ++i) {
        const ULONG hi = static_cast<ULONG>(random() >> (32 + random() % 32));
        SetDecimal(value.v, static_cast<BYTE>(random() % 29), random() & 1, i < 5 ? 0xFFFFFFFF : hi,
                   random());
        ExpectRoundTrip(value.v);
    }
    // Dates with whole seconds from 1 January 100 (Wine: from the year 1078,
    // as it reads years of three digits differently) to 31 December 9999.
    std::uniform_int_distribution<long long> day(RunningOnWine() ? -300000 : -657434, 2958465);
    std::uniform_int_distribution<int> second(0, 86399);
    for (int i = 0; i < 1000; ++i) {
        const long long d = day(random);
        const double fraction = second(random) / 86400.0;
        SetReal(value.v, VT_DATE, d >= 0 ? d + fraction : d - fraction);
        ExpectRoundTrip(value.v);
    }
    VariantClear(&value.v);
    ExpectRoundTrip(value.v); // empty: "" back to empty
}

} // namespace

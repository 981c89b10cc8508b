// Numbers of the variant types as decimal digits, and their en-US text: the
// private helpers of VariantChangeType and VarCmp.
#pragma once

#include <vkwin32/oleauto.h>

#include <string>

namespace vkw32::oleaut {

using Int128 = __int128;
using UInt128 = unsigned __int128;

// digits x 10^exponent: the exact value of every number but a double. The
// digits have no leading zeros; none is zero.
struct DecimalDigits {
    bool negative = false;
    std::string digits;
    int exponent = 0;
};

DecimalDigits DigitsOf(bool negative, UInt128 magnitude, int exponent);
DecimalDigits DigitsOf(const DECIMAL& value);
DecimalDigits DigitsOfCurrency(LONGLONG value);

bool IsZero(const DecimalDigits& value);

// value x 10^decimals rounded half to even to a whole magnitude; false when
// that reaches 2^127.
bool RoundDigits(const DecimalDigits& value, int decimals, UInt128* magnitude);

// DISP_E_OVERFLOW when the integer part needs more than 96 bits; more than 28
// decimals, or than 96 bits hold, round half to even.
HRESULT DecimalFromDigits(const DecimalDigits& value, DECIMAL* result);

// Correctly rounded; infinite when out of range.
double DoubleFromDigits(const DecimalDigits& value);
float FloatFromDigits(const DecimalDigits& value);

// -1, 0 or 1.
int CompareDigits(const DecimalDigits& left, const DecimalDigits& right);

// Number text as the system reads it for en-US: blanks, a sign before or
// after (or parentheses), a leading '$', ',' between integer digits, '.',
// an exponent, or &H / &O with their digits (radix true, bits the value).
struct ParsedNumber {
    bool radix = false;
    unsigned long long bits = 0;
    DecimalDigits decimal;
};
HRESULT ParseNumber(const OLECHAR* text, UINT length, ParsedNumber* number);

// Plain notation without trailing fraction zeros: "-123.45".
std::string FormatDigits(const DecimalDigits& value);
// printf's %.<significant>G: "0.333333333333333", "1E+15", "1.5E-05".
std::string FormatReal(double value, int significant);
std::string FormatInteger(Int128 value);

HRESULT TextToBstr(const std::string& text, BSTR* result);

// The scalar, string or interface a by-reference variant points to, as a
// bitwise variant of its base type; DISP_E_BADVARTYPE for any other base.
HRESULT LoadReferenced(const VARIANT& reference, VARIANT* value);

// The locales whose number text this platform knows: those of
// VarBstrFromDate.
bool IsKnownLocale(LCID lcid);

} // namespace vkw32::oleaut

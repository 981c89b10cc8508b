// Decimal digits, number text and the rounding the variant type changes
// share.
#include "oleaut/variant_number.h"

#include <charconv>
#include <cmath>
#include <cstdlib>
#include <cstring>

namespace vkw32::oleaut {

namespace {

constexpr UInt128 kLimit128 = static_cast<UInt128>(1) << 127;

bool IsBlank(OLECHAR c) {
    return c == ' ' || c == '\t' || c == '\n' || c == '\r' || c == '\v' || c == '\f' || c == 0xA0;
}

int DigitValue(OLECHAR c, int radix) {
    int value;
    if (c >= '0' && c <= '9')
        value = c - '0';
    else if (c >= 'a' && c <= 'f')
        value = c - 'a' + 10;
    else if (c >= 'A' && c <= 'F')
        value = c - 'A' + 10;
    else
        return -1;
    return value < radix ? value : -1;
}

void StripLeadingZeros(DecimalDigits& value) {
    std::size_t zeros = 0;
    while (zeros < value.digits.size() && value.digits[zeros] == '0')
        ++zeros;
    value.digits.erase(0, zeros);
}

// The text strtod and strtof read, independent of the C locale's point.
std::string ScientificText(const DecimalDigits& value) {
    std::string text = value.negative ? "-" : "";
    if (value.digits.empty())
        return text + "0";
    // Bounded so that the exponent cannot overflow the reader's int.
    long long exponent = value.exponent;
    if (exponent > 100000)
        exponent = 100000;
    if (exponent < -100000)
        exponent = -100000;
    text += value.digits;
    text += 'e';
    text += std::to_string(exponent);
    return text;
}

} // namespace

DecimalDigits DigitsOf(bool negative, UInt128 magnitude, int exponent) {
    DecimalDigits value;
    value.exponent = exponent;
    char buffer[48];
    int length = 0;
    while (magnitude) {
        buffer[length++] = static_cast<char>('0' + static_cast<int>(magnitude % 10));
        magnitude /= 10;
    }
    value.digits.assign(buffer, length);
    value.digits.assign(value.digits.rbegin(), value.digits.rend());
    value.negative = negative && !value.digits.empty();
    return value;
}

DecimalDigits DigitsOf(const DECIMAL& value) {
    const UInt128 magnitude = (static_cast<UInt128>(value.Hi32) << 64) | value.Lo64;
    return DigitsOf(value.sign != 0, magnitude, -static_cast<int>(value.scale));
}

DecimalDigits DigitsOfCurrency(LONGLONG value) {
    const Int128 wide = value;
    return DigitsOf(wide < 0, static_cast<UInt128>(wide < 0 ? -wide : wide), -4);
}

bool IsZero(const DecimalDigits& value) {
    return value.digits.find_first_not_of('0') == std::string::npos;
}

bool RoundDigits(const DecimalDigits& value, int decimals, UInt128* magnitude) {
    *magnitude = 0;
    if (IsZero(value))
        return true;
    const long long shift = static_cast<long long>(value.exponent) + decimals;
    const long long count = static_cast<long long>(value.digits.size());
    const long long kept = shift >= 0 ? count : count + shift;
    if (kept + (shift > 0 ? shift : 0) > 40)
        return false;
    UInt128 result = 0;
    for (long long i = 0; i < kept; ++i) {
        result = result * 10 + static_cast<unsigned>(value.digits[i] - '0');
        if (result >= kLimit128)
            return false;
    }
    for (long long i = 0; i < shift; ++i) {
        result *= 10;
        if (result >= kLimit128)
            return false;
    }
    if (kept < count && kept >= 0) {
        const int first = value.digits[kept] - '0';
        bool rest = false;
        for (long long i = kept + 1; i < count && !rest; ++i)
            rest = value.digits[i] != '0';
        if (first > 5 || (first == 5 && (rest || (result & 1))))
            ++result;
    }
    if (result >= kLimit128)
        return false;
    *magnitude = result;
    return true;
}

HRESULT DecimalFromDigits(const DecimalDigits& value, DECIMAL* result) {
    constexpr UInt128 kLimit96 = static_cast<UInt128>(1) << 96;
    int scale = value.exponent < 0 ? -value.exponent : 0;
    if (scale > 28)
        scale = 28;
    for (; scale >= 0; --scale) {
        UInt128 magnitude;
        if (!RoundDigits(value, scale, &magnitude))
            return DISP_E_OVERFLOW; // the integer part alone is too large
        if (magnitude < kLimit96) {
            result->Hi32 = static_cast<ULONG>(magnitude >> 64);
            result->Lo64 = static_cast<ULONGLONG>(magnitude);
            result->scale = static_cast<BYTE>(scale);
            result->sign = value.negative && magnitude ? DECIMAL_NEG : 0;
            return S_OK;
        }
    }
    return DISP_E_OVERFLOW;
}

template <typename Real>
Real RealFromDigits(const DecimalDigits& value, Real huge) {
    const std::string text = ScientificText(value);
    Real result = 0;
    const std::from_chars_result read =
        std::from_chars(text.data(), text.data() + text.size(), result);
    if (read.ec == std::errc::result_out_of_range) {
        // Past the largest finite value, or below the smallest: decide by the
        // place of the first digit.
        const bool large = static_cast<long long>(value.digits.size()) + value.exponent > 0;
        result = large ? huge : 0;
        if (value.negative)
            result = -result;
    }
    return result;
}

double DoubleFromDigits(const DecimalDigits& value) {
    return RealFromDigits<double>(value, HUGE_VAL);
}

float FloatFromDigits(const DecimalDigits& value) {
    return RealFromDigits<float>(value, HUGE_VALF);
}

int CompareDigits(const DecimalDigits& left, const DecimalDigits& right) {
    const bool leftZero = IsZero(left), rightZero = IsZero(right);
    const int leftSign = leftZero ? 0 : left.negative ? -1 : 1;
    const int rightSign = rightZero ? 0 : right.negative ? -1 : 1;
    if (leftSign != rightSign)
        return leftSign < rightSign ? -1 : 1;
    if (leftSign == 0)
        return 0;
    DecimalDigits a = left, b = right;
    StripLeadingZeros(a);
    StripLeadingZeros(b);
    // Magnitudes: compare the counts of integer digits, then digit by digit.
    const long long aPlaces = static_cast<long long>(a.digits.size()) + a.exponent;
    const long long bPlaces = static_cast<long long>(b.digits.size()) + b.exponent;
    int magnitude = 0;
    if (aPlaces != bPlaces) {
        magnitude = aPlaces < bPlaces ? -1 : 1;
    } else {
        const std::size_t length =
            a.digits.size() > b.digits.size() ? a.digits.size() : b.digits.size();
        for (std::size_t i = 0; i < length && magnitude == 0; ++i) {
            const char x = i < a.digits.size() ? a.digits[i] : '0';
            const char y = i < b.digits.size() ? b.digits[i] : '0';
            if (x != y)
                magnitude = x < y ? -1 : 1;
        }
    }
    return leftSign * magnitude;
}

HRESULT ParseNumber(const OLECHAR* text, UINT length, ParsedNumber* number) {
    *number = ParsedNumber{};
    UINT at = 0;
    char sign = 0;
    bool parenthesis = false, currency = false;
    for (; at < length; ++at) {
        const OLECHAR c = text[at];
        if (IsBlank(c))
            continue;
        if ((c == '+' || c == '-') && !sign)
            sign = static_cast<char>(c);
        else if (c == '(' && !parenthesis && !sign)
            parenthesis = true;
        else if (c == '$' && !currency)
            currency = true;
        else
            break;
    }
    if (at == length)
        return DISP_E_TYPEMISMATCH;

    if (text[at] == '&') {
        ++at;
        if (at == length)
            return DISP_E_TYPEMISMATCH;
        const OLECHAR kind = text[at++];
        const int radix = kind == 'h' || kind == 'H' ? 16 : kind == 'o' || kind == 'O' ? 8 : 0;
        if (!radix)
            return DISP_E_TYPEMISMATCH;
        int digits = 0;
        bool overflow = false;
        for (int d; at < length && (d = DigitValue(text[at], radix)) >= 0; ++at, ++digits) {
            if (number->bits > (~0ULL - static_cast<unsigned>(d)) / static_cast<unsigned>(radix))
                overflow = true;
            number->bits = number->bits * static_cast<unsigned>(radix) + static_cast<unsigned>(d);
        }
        if (!digits)
            return DISP_E_TYPEMISMATCH;
        if (overflow)
            number->bits = ~0ULL;
        number->radix = true;
        for (; at < length; ++at) {
            if (!IsBlank(text[at]))
                return DISP_E_TYPEMISMATCH;
        }
        return overflow ? DISP_E_OVERFLOW : S_OK;
    }

    DecimalDigits& value = number->decimal;
    long long exponent = 0;
    int digitCount = 0;
    for (; at < length; ++at) {
        const OLECHAR c = text[at];
        if (c >= '0' && c <= '9') {
            ++digitCount;
            if (!value.digits.empty() || c != '0')
                value.digits += static_cast<char>(c);
        } else if (c == ',' && digitCount) {
            continue;
        } else {
            break;
        }
    }
    if (at < length && text[at] == '.') {
        for (++at; at < length && text[at] >= '0' && text[at] <= '9'; ++at) {
            ++digitCount;
            --exponent;
            if (!value.digits.empty() || text[at] != '0')
                value.digits += static_cast<char>(text[at]);
        }
    }
    if (!digitCount)
        return DISP_E_TYPEMISMATCH;
    if (at < length && (text[at] == 'e' || text[at] == 'E')) {
        ++at;
        bool negativeExponent = false;
        if (at < length && (text[at] == '+' || text[at] == '-'))
            negativeExponent = text[at++] == '-';
        long long written = 0;
        int exponentDigits = 0;
        for (; at < length && text[at] >= '0' && text[at] <= '9'; ++at, ++exponentDigits) {
            if (written < 1000000)
                written = written * 10 + (text[at] - '0');
        }
        if (!exponentDigits)
            return DISP_E_TYPEMISMATCH;
        exponent += negativeExponent ? -written : written;
    }
    bool closed = false, trailingSign = false;
    for (; at < length; ++at) {
        const OLECHAR c = text[at];
        if (IsBlank(c))
            continue;
        if ((c == '+' || c == '-') && !sign && !parenthesis && !trailingSign) {
            sign = static_cast<char>(c);
            trailingSign = true;
        } else if (c == ')' && parenthesis && !closed) {
            closed = true;
        } else {
            return DISP_E_TYPEMISMATCH;
        }
    }
    if (parenthesis != closed)
        return DISP_E_TYPEMISMATCH;
    value.exponent = static_cast<int>(exponent);
    // A negative zero stays one for the doubles ("-0" is VT_R8 -0).
    value.negative = sign == '-' || parenthesis;
    return S_OK;
}

std::string FormatDigits(const DecimalDigits& value) {
    DecimalDigits v = value;
    StripLeadingZeros(v);
    if (v.digits.empty())
        return "0";
    std::string integer, fraction;
    if (v.exponent >= 0) {
        integer = v.digits + std::string(static_cast<std::size_t>(v.exponent), '0');
    } else {
        const std::size_t places = static_cast<std::size_t>(-static_cast<long long>(v.exponent));
        if (v.digits.size() > places) {
            integer = v.digits.substr(0, v.digits.size() - places);
            fraction = v.digits.substr(v.digits.size() - places);
        } else {
            integer = "0";
            fraction = std::string(places - v.digits.size(), '0') + v.digits;
        }
    }
    while (!fraction.empty() && fraction.back() == '0')
        fraction.pop_back();
    std::string text = v.negative ? "-" : "";
    text += integer;
    if (!fraction.empty())
        text += '.' + fraction;
    return text;
}

std::string FormatReal(double value, int significant) {
    char buffer[64];
    const std::to_chars_result written = std::to_chars(buffer, buffer + sizeof buffer, value,
                                                       std::chars_format::general, significant);
    std::string text(buffer, written.ptr);
    for (char& c : text) {
        if (c == 'e')
            c = 'E';
    }
    return text;
}

std::string FormatInteger(Int128 value) {
    const bool negative = value < 0;
    UInt128 magnitude = negative ? -static_cast<UInt128>(value) : static_cast<UInt128>(value);
    char buffer[48];
    char* end = buffer + sizeof buffer;
    char* at = end;
    do {
        *--at = static_cast<char>('0' + static_cast<int>(magnitude % 10));
        magnitude /= 10;
    } while (magnitude);
    if (negative)
        *--at = '-';
    return std::string(at, end);
}

HRESULT TextToBstr(const std::string& text, BSTR* result) {
    OLECHAR wide[128];
    OLECHAR* buffer = wide;
    std::basic_string<OLECHAR> large;
    if (text.size() > sizeof wide / sizeof wide[0]) {
        large.resize(text.size());
        buffer = &large[0];
    }
    for (std::size_t i = 0; i < text.size(); ++i)
        buffer[i] = static_cast<unsigned char>(text[i]);
    *result = SysAllocStringLen(buffer, static_cast<UINT>(text.size()));
    return *result ? S_OK : E_OUTOFMEMORY;
}

bool IsKnownLocale(LCID lcid) {
    switch (lcid) {
    case LOCALE_NEUTRAL:
    case LOCALE_USER_DEFAULT:
    case LOCALE_SYSTEM_DEFAULT:
    case LOCALE_INVARIANT:
    case MAKELCID(MAKELANGID(LANG_ENGLISH, SUBLANG_ENGLISH_US), SORT_DEFAULT):
        return true;
    default:
        return false;
    }
}

HRESULT LoadReferenced(const VARIANT& reference, VARIANT* value) {
    const VARTYPE base = reference.vt & VT_TYPEMASK;
    *value = VARIANT{};
    switch (base) {
    case VT_DECIMAL:
        value->decVal = *reference.pdecVal;
        break;
    case VT_I1:
    case VT_UI1:
        value->bVal = *reference.pbVal;
        break;
    case VT_I2:
    case VT_UI2:
    case VT_BOOL:
        value->iVal = *reference.piVal;
        break;
    case VT_I4:
    case VT_UI4:
    case VT_R4:
    case VT_ERROR:
    case VT_INT:
    case VT_UINT:
        value->lVal = *reference.plVal;
        break;
    case VT_BSTR:
        value->bstrVal = *reference.pbstrVal;
        break;
    case VT_UNKNOWN:
    case VT_DISPATCH:
        value->punkVal = *reference.ppunkVal;
        break;
    case VT_I8:
    case VT_UI8:
    case VT_R8:
    case VT_CY:
    case VT_DATE:
        value->llVal = *reference.pllVal;
        break;
    default:
        return DISP_E_BADVARTYPE;
    }
    value->vt = base;
    return S_OK;
}

} // namespace vkw32::oleaut

// Fixed-point conversion. The digits come from std::to_chars, which is exact;
// it breaks an exact decimal tie to even, while the runtime rounds it away
// from zero, so a tie is detected and rounded up by hand.
#include <vkwin32/crt.h>

#include <cerrno>
#include <charconv>
#include <cmath>
#include <cstdint>
#include <cstring>

namespace {

// The most fractional digits any double needs to be exact.
const int maxCount = 1074;

// Whether value (finite, positive) lies exactly halfway between two numbers
// of count fractional digits: value = M * 2^E with M odd and E = -(count + 1).
bool IsDecimalTie(double value, int count) {
    std::uint64_t bits;
    std::memcpy(&bits, &value, sizeof bits);
    int biased = static_cast<int>(bits >> 52);
    std::uint64_t mantissa = bits & ((std::uint64_t(1) << 52) - 1);
    int exponent = biased - 1075; // of the last mantissa bit
    if (biased != 0)
        mantissa |= std::uint64_t(1) << 52;
    else
        exponent = -1074; // subnormal
    return exponent + __builtin_ctzll(mantissa) == -(count + 1);
}

// Adds one in the last place of a digit string, with carry; a carry out of
// the first digit is returned.
bool Increment(char* first, char* last) {
    for (char* p = last; p-- != first;) {
        if (*p == '9') {
            *p = '0';
        } else {
            ++*p;
            return false;
        }
    }
    return true;
}

errno_t Store(char* buffer, size_t size, const char* digits, size_t length) {
    if (length + 1 > size)
        return ERANGE;
    std::memcpy(buffer, digits, length);
    buffer[length] = '\0';
    return 0;
}

} // namespace

extern "C" errno_t _fcvt_s(char* buffer, size_t sizeInBytes, double value, int count,
                           int* decimalPoint, int* sign) {
    if (buffer == nullptr || sizeInBytes == 0 || decimalPoint == nullptr || sign == nullptr)
        return EINVAL;
    buffer[0] = '\0';
    if (count < 0)
        count = 0;
    if (count > maxCount)
        return ERANGE;
    *sign = std::signbit(value) ? 1 : 0;
    double magnitude = std::fabs(value);
    if (!std::isfinite(magnitude)) {
        *decimalPoint = 3;
        return Store(buffer, sizeInBytes, std::isnan(magnitude) ? "nan" : "inf", 3);
    }
    if (magnitude == 0.0) {
        // Zero keeps its fractional digits: count zeros, point at 0.
        if (static_cast<size_t>(count) + 1 > sizeInBytes)
            return ERANGE;
        std::memset(buffer, '0', static_cast<size_t>(count));
        buffer[count] = '\0';
        *decimalPoint = 0;
        return 0;
    }
    bool tie = IsDecimalTie(magnitude, count);
    int precision = tie ? count + 1 : count;
    // Converted in place when the caller's buffer has room (it always does
    // for the conversion buffer size), with one spare byte in front for a
    // carry out of the first digit.
    char local[1 + 310 + 1 + maxCount + 2];
    bool inPlace = sizeInBytes >= 1 + 310 + 1 + static_cast<size_t>(precision) + 1;
    char* text = inPlace ? buffer : local;
    char* limit = inPlace ? buffer + sizeInBytes : local + sizeof local;
    auto converted =
        std::to_chars(text + 1, limit, magnitude, std::chars_format::fixed, precision);
    if (converted.ec != std::errc())
        return ERANGE;
    // "integer.fraction": the point stands precision digits from the end.
    char* first = text + 1;
    char* end = converted.ptr;
    if (precision > 0) {
        char* point = end - precision - 1;
        std::memmove(point, point + 1, static_cast<size_t>(precision));
        --end;
    }
    int integerDigits = static_cast<int>(end - first) - precision;
    if (tie) {
        --end; // the final 5
        if (Increment(first, end)) {
            *--first = '1';
            ++integerDigits;
        }
    }
    if (integerDigits == 1 && *first == '0') {
        // Below one: the zeros after the point move into the decimal position.
        char* significant = first + 1;
        while (significant < end && *significant == '0')
            ++significant;
        *decimalPoint = significant == end ? -count : -static_cast<int>(significant - (first + 1));
        first = significant;
    } else {
        *decimalPoint = integerDigits;
    }
    size_t length = static_cast<size_t>(end - first);
    if (length + 1 > sizeInBytes) {
        buffer[0] = '\0';
        return ERANGE;
    }
    std::memmove(buffer, first, length);
    buffer[length] = '\0';
    return 0;
}

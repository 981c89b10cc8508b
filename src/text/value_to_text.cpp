#include <vaskel/framework/exceptions.h>
#include <vaskel/text.h>

#include <algorithm>
#include <charconv>
#include <cstdint>
#include <cstring>

namespace vaskel {
namespace {

// The most fractional digits the conversion buffer has room for.
const DWORD maxDigits = _CVTBUFSIZE - 1;

template <class Integer>
CString& IntegerText(CString& out, Integer value) {
    char digits[24];
    auto result = std::to_chars(digits, digits + sizeof digits, value);
    out.SetString(digits, static_cast<int>(result.ptr - digits));
    return out;
}

CString& FormattedText(CString& out, double value, const char* format) {
    out.Format(format, value);
    return out;
}

} // namespace

CString AsString(char value) {
    return CString(value, 1);
}

CString& AsString(CString& out, bool value, bool trueFalse) {
    out = value ? (trueFalse ? "True" : "Yes") : (trueFalse ? "False" : "No");
    return out;
}

CString AsString(bool value, bool trueFalse) {
    CString out;
    AsString(out, value, trueFalse);
    return out;
}

CString& AsString(CString& out, int value) {
    return IntegerText(out, value);
}
CString& AsString(CString& out, long value) {
    return IntegerText(out, value);
}
CString& AsString(CString& out, unsigned int value) {
    return IntegerText(out, value);
}
CString& AsString(CString& out, unsigned long value) {
    return IntegerText(out, value);
}
CString& AsString(CString& out, long long value) {
    return IntegerText(out, value);
}
CString& AsString(CString& out, unsigned long long value) {
    return IntegerText(out, value);
}

CString AsString(int value) {
    CString out;
    AsString(out, value);
    return out;
}
CString AsString(long value) {
    CString out;
    AsString(out, value);
    return out;
}
CString AsString(unsigned int value) {
    CString out;
    AsString(out, value);
    return out;
}
CString AsString(unsigned long value) {
    CString out;
    AsString(out, value);
    return out;
}
CString AsString(long long value) {
    CString out;
    AsString(out, value);
    return out;
}
CString AsString(unsigned long long value) {
    CString out;
    AsString(out, value);
    return out;
}

CString& AsString(CString& out, double value, DWORD digits) {
    char converted[_CVTBUFSIZE];
    int point = 0, negative = 0;
    if (_fcvt_s(converted, sizeof converted, value, static_cast<int>(std::min(digits, maxDigits)),
                &point, &negative) != 0) {
        out.Empty(); // more digits than any double has room for
        return out;
    }
    // Trailing zeros go while the value is one or more; integer digits stay.
    int count = static_cast<int>(std::strlen(converted));
    if (point >= 0)
        while (count > point && converted[count - 1] == '0')
            --count;
    int length = std::max(count, point);
    if (point < count)
        ++length; // the point
    if (point <= 0)
        length += 1 + (point < 0 ? -point : 0); // "0" and the zeros after the point
    if (negative)
        ++length;
    char* text = out.GetBuffer(length);
    char* p = text;
    if (negative)
        *p++ = '-';
    if (point <= 0) {
        *p++ = '0';
        if (point < count)
            *p++ = '.';
        p = std::fill_n(p, -point, '0');
        p = std::copy(converted, converted + count, p);
    } else if (point < count) {
        p = std::copy(converted, converted + point, p);
        *p++ = '.';
        p = std::copy(converted + point, converted + count, p);
    } else {
        p = std::copy(converted, converted + count, p);
        p = std::fill_n(p, point - count, '0');
    }
    out.ReleaseBuffer(length);
    return out;
}

CString AsString(double value, DWORD digits) {
    CString out;
    AsString(out, value, digits);
    return out;
}

CString& AsString(CString& out, double value) {
    return AsString(out, value, DWORD(16));
}

CString AsString(double value) {
    CString out;
    AsString(out, value);
    return out;
}

CString& AsString(CString& out, double value, int digits) {
    return AsString(out, value, static_cast<DWORD>(std::max(digits, 0)));
}

CString AsString(double value, int digits) {
    CString out;
    AsString(out, value, digits);
    return out;
}

CString& AsString(CString& out, double value, const char* format) {
    return FormattedText(out, value, format);
}

CString AsString(double value, const char* format) {
    CString out;
    FormattedText(out, value, format);
    return out;
}

CString& AsString(CString& out, float value, DWORD digits) {
    return AsString(out, AsCleanDouble(value), digits);
}

CString AsString(float value, DWORD digits) {
    CString out;
    AsString(out, value, digits);
    return out;
}

CString& AsString(CString& out, float value) {
    return AsString(out, value, DWORD(7));
}

CString AsString(float value) {
    CString out;
    AsString(out, value);
    return out;
}

CString& AsString(CString& out, float value, int digits) {
    return AsString(out, value, static_cast<DWORD>(std::max(digits, 0)));
}

CString AsString(float value, int digits) {
    CString out;
    AsString(out, value, digits);
    return out;
}

CString& AsString(CString& out, float value, const char* format) {
    return FormattedText(out, value, format);
}

CString AsString(float value, const char* format) {
    CString out;
    FormattedText(out, value, format);
    return out;
}

CString& AsString(CString& out, void* value) {
    // Every bit of the address: a 32-bit format would cut 64-bit pointers.
    char digits[2 * sizeof(void*) + 1];
    auto result =
        std::to_chars(digits, digits + sizeof digits, reinterpret_cast<std::uintptr_t>(value), 16);
    out.SetString(digits, static_cast<int>(result.ptr - digits));
    return out;
}

CString AsString(void* value) {
    CString out;
    AsString(out, value);
    return out;
}

} // namespace vaskel

// Text: value conversions, bounded substring search and string-buffer
// helpers.
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/string.h>
#include <vaskel/win32.h>

namespace vaskel {

// The first occurrence of the pattern within the first textLength bytes of
// the text, or null. Bytes are compared as they are, NUL included.
VASKEL_API const char* VKFindString(const char* text, DWORD textLength, const char* pattern,
                                    DWORD patternLength);
// The same, comparing bytes after _mbctolower.
VASKEL_API const char* VKFindStringNoCase(const char* text, DWORD textLength, const char* pattern,
                                          DWORD patternLength);
// Advances the pointer over white space (isspace); stops at NUL or a null pointer.
VASKEL_API void VKSkipWhiteSpaces(const char*& text);
// Copies the string into a buffer of bufferSize bytes, always NUL-terminated
// and cut to bufferSize - 1 bytes when it does not fit; size 0 writes nothing.
VASKEL_API void VKCopyStringToBuffer(char* buffer, DWORD bufferSize, const CString& text);
// Gives the string room for at least length characters, keeping its text.
VASKEL_API void VKReserveStringBuffer(CString& text, DWORD length);

// Values to text. Every conversion has an in-place form that overwrites the
// caller's string and returns it, and a value form. Floating-point values are
// written in fixed point with the given fractional digits, trailing zeros
// trimmed (while the value is one or more), never with an exponent.
VASKEL_API CString AsString(char value);
VASKEL_API CString& AsString(CString& out, bool value, bool trueFalse = true);
VASKEL_API CString AsString(bool value, bool trueFalse = true);
VASKEL_API CString& AsString(CString& out, int value);
VASKEL_API CString AsString(int value);
VASKEL_API CString& AsString(CString& out, long value);
VASKEL_API CString AsString(long value);
VASKEL_API CString& AsString(CString& out, unsigned int value);
VASKEL_API CString AsString(unsigned int value);
VASKEL_API CString& AsString(CString& out, unsigned long value);
VASKEL_API CString AsString(unsigned long value);
VASKEL_API CString& AsString(CString& out, long long value);
VASKEL_API CString AsString(long long value);
VASKEL_API CString& AsString(CString& out, unsigned long long value);
VASKEL_API CString AsString(unsigned long long value);
// 16 fractional digits.
VASKEL_API CString& AsString(CString& out, double value);
VASKEL_API CString AsString(double value);
VASKEL_API CString& AsString(CString& out, double value, DWORD digits);
VASKEL_API CString AsString(double value, DWORD digits);
// A literal digit count such as 0 would otherwise be as close to a format.
VASKEL_API CString& AsString(CString& out, double value, int digits);
VASKEL_API CString AsString(double value, int digits);
// The value through a printf-style format that takes one double.
VASKEL_API CString& AsString(CString& out, double value, const char* format);
VASKEL_API CString AsString(double value, const char* format);
// Cleaned to about seven significant digits first; 7 fractional digits.
VASKEL_API CString& AsString(CString& out, float value);
VASKEL_API CString AsString(float value);
VASKEL_API CString& AsString(CString& out, float value, DWORD digits);
VASKEL_API CString AsString(float value, DWORD digits);
VASKEL_API CString& AsString(CString& out, float value, int digits);
VASKEL_API CString AsString(float value, int digits);
// Widened, not cleaned.
VASKEL_API CString& AsString(CString& out, float value, const char* format);
VASKEL_API CString AsString(float value, const char* format);
// Lower-case hexadecimal, every bit of the pointer, no prefix.
VASKEL_API CString& AsString(CString& out, void* value);
VASKEL_API CString AsString(void* value);

// Text to values. AsInteger and AsULong read at most length characters
// (stopping at a NUL), as the runtime's atoi and atol do, saturating at the
// 32-bit limits; AsULong answers the signed result's bit pattern.
VASKEL_API bool AsBool(const char* text);
VASKEL_API int AsInteger(const char* text, DWORD length);
VASKEL_API DWORD AsULong(const char* text, DWORD length);
// The float rounded to about seven significant digits.
VASKEL_API double AsCleanDouble(float value);
VASKEL_API double AsDouble(float value);

// Rounding with halves away from zero; NaN gives 0.
VASKEL_API double VKRoundFloat(double value);
VASKEL_API double VKRoundFloat(double value, LONG places);

} // namespace vaskel

// Text: bounded substring search and string-buffer helpers.
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

} // namespace vaskel

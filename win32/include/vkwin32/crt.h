// Runtime-library functions of the platform's C runtime that the library
// calls: the floating-point status word, multibyte string helpers, path
// splitting and joining, fixed-point conversion and local time. The ANSI
// (multibyte) code page is UTF-8 here.
#pragma once

#include "types.h"

#include <cstddef>
#include <ctime>

typedef int errno_t;

// The buffer size that holds any fixed-point conversion of a double.
#define _CVTBUFSIZE (309 + 40)

// What the multibyte comparisons answer for a null string.
#define _NLSCMPERROR 0x7FFFFFFF

// Buffer sizes, NUL included, of the parts of a path.
#define _MAX_PATH 260
#define _MAX_DRIVE 3
#define _MAX_DIR 256
#define _MAX_FNAME 256
#define _MAX_EXT 256

#define _SW_INEXACT 0x00000001
#define _SW_UNDERFLOW 0x00000002
#define _SW_OVERFLOW 0x00000004
#define _SW_ZERODIVIDE 0x00000008
#define _SW_INVALID 0x00000010
#define _SW_DENORMAL 0x00080000

extern "C" {

unsigned int _statusfp(void);
unsigned int _clearfp(void);

unsigned int _mbctolower(unsigned int c);

// The digits of the value rounded to count fractional digits (halves away
// from zero), without sign, point or leading zeros; *decimalPoint is the
// number of those digits before the point (negative: zeros after it).
errno_t _fcvt_s(char* buffer, size_t sizeInBytes, double value, int count, int* decimalPoint,
                int* sign);
unsigned int _mbctoupper(unsigned int c);
// Nonzero for the white space of the C locale: space and 0x09 to 0x0D.
int _ismbcspace(unsigned int c);

// Multibyte strings: a search never stops inside a multibyte character, and
// case is ignored for the characters _mbctolower maps. A null string gives
// EINVAL in errno. _mbschr takes a character as its UTF-8 bytes read as one
// big-endian number (0xC3A9 for U+00E9); the terminating NUL is found too.
unsigned char* _mbschr(const unsigned char* text, unsigned int c);
unsigned char* _mbsstr(const unsigned char* text, const unsigned char* pattern);
int _mbsnbcmp(const unsigned char* a, const unsigned char* b, size_t count);
int _mbsnbicmp(const unsigned char* a, const unsigned char* b, size_t count);
errno_t _mbslwr_s(unsigned char* text, size_t sizeInBytes);

// Null buffers with size 0 skip their parts. A part that does not fit its
// buffer empties every part and gives ERANGE; so does a joined path that does
// not fit, leaving the path empty.
errno_t _splitpath_s(const char* path, char* drive, size_t driveSize, char* dir, size_t dirSize,
                     char* fileName, size_t fileNameSize, char* ext, size_t extSize);
errno_t _makepath_s(char* path, size_t sizeInBytes, const char* drive, const char* dir,
                    const char* fileName, const char* ext);

// The local-time breakdown of a calendar time; EINVAL when it has none.
errno_t localtime_s(struct tm* result, const time_t* time);

} // extern "C"

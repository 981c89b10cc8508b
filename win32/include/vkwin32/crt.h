// Runtime-library functions of the platform's C runtime that the library
// calls: the floating-point status word and multibyte character helpers.
// The ANSI code page is UTF-8 here.
#pragma once

#include "types.h"

#include <cstddef>
#include <ctime>

typedef int errno_t;

// The buffer size that holds any fixed-point conversion of a double.
#define _CVTBUFSIZE (309 + 40)

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

// The local-time breakdown of a calendar time; EINVAL when it has none.
errno_t localtime_s(struct tm* result, const time_t* time);

} // extern "C"

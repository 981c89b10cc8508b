// Runtime-library functions of the platform's C runtime that the library
// calls: the floating-point status word and multibyte character helpers.
// The ANSI code page is UTF-8 here.
#pragma once

#include "types.h"

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
unsigned int _mbctoupper(unsigned int c);

} // extern "C"

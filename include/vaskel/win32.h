// The platform vocabulary: the Win32 names the library is written against.
// On Windows these are the system headers; elsewhere vaskel's own subset.
#pragma once

#ifdef _WIN32
#ifndef NOMINMAX
#define NOMINMAX
#endif
#include <float.h>
#include <mbstring.h>
#include <windows.h>
// Connection points (ocidl.h) and their error codes, which live in olectl.h.
#include <olectl.h>
// Shell folder paths; not part of windows.h.
#include <shlobj.h>
// Process-status services; not part of windows.h.
#include <psapi.h>
// The compiler's COM support types: _bstr_t, _variant_t, _com_error.
#include <comdef.h>
// The COM+ administration catalog; not part of windows.h.
#include <comadmin.h>
// Some runtime headers name only the exception masks; the status bits are the same.
#ifndef _SW_INVALID
#define _SW_INVALID _EM_INVALID
#endif
#ifndef _SW_ZERODIVIDE
#define _SW_ZERODIVIDE _EM_ZERODIVIDE
#endif
#ifndef _SW_OVERFLOW
#define _SW_OVERFLOW _EM_OVERFLOW
#endif
#ifndef _SW_UNDERFLOW
#define _SW_UNDERFLOW _EM_UNDERFLOW
#endif
#ifndef _SW_INEXACT
#define _SW_INEXACT _EM_INEXACT
#endif
#else
#include <vkwin32/comdef.h>
#include <vkwin32/windows.h>
#endif

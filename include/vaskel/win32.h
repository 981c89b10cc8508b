// The platform vocabulary: the Win32 names the library is written against.
// On Windows these are the system headers; elsewhere vaskel's own subset.
#pragma once

#ifdef _WIN32
#ifndef NOMINMAX
#define NOMINMAX
#endif
#include <windows.h>
#include <float.h>
#include <mbstring.h>
#else
#include <vkwin32/windows.h>
#endif

// Marks the classes and functions that the library exports.
#pragma once

#if defined(_WIN32)
#if defined(VASKEL_BUILDING)
#define VASKEL_API __declspec(dllexport)
#else
#define VASKEL_API __declspec(dllimport)
#endif
#else
#define VASKEL_API __attribute__((visibility("default")))
#endif

#if defined(__GNUC__) && !defined(_WIN32)
#define VASKEL_PRINTF_FORMAT(fmt, args) __attribute__((format(printf, fmt, args)))
#else
#define VASKEL_PRINTF_FORMAT(fmt, args)
#endif

// What the variant conversion and comparison tests share.
#pragma once

#include <vaskel/win32.h>

namespace vaskel_test {

// Whether the functions under test are this platform's own rather than the
// system's.
#ifdef _WIN32
constexpr bool kOwnImplementation = false;
#else
constexpr bool kOwnImplementation = true;
#endif

constexpr LCID kEnglishUs = 0x409;

// A variant that clears itself.
struct Var {
    VARIANT v;
    Var() { VariantInit(&v); }
    ~Var() { VariantClear(&v); }
    Var(const Var&) = delete;
    Var& operator=(const Var&) = delete;
    VARIANT* operator&() { return &v; }
};

} // namespace vaskel_test

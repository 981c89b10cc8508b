// On Windows the runtime reports bad arguments to its invalid-parameter
// handler before it returns the error code, and the default handler ends the
// process; tests that pass bad arguments on purpose install one that returns
// for their extent. Elsewhere there is no handler to replace.
#pragma once

#include <vaskel/win32.h>

#include <cstdint>
#include <cstdlib>

namespace vaskel_test {

class InvalidParameterGuard {
public:
#ifdef _WIN32
    InvalidParameterGuard() : m_previous(_set_invalid_parameter_handler(Ignore)) {}
    ~InvalidParameterGuard() {
        _set_invalid_parameter_handler(m_previous);
    }
#else
    InvalidParameterGuard() {}
    ~InvalidParameterGuard() {}
#endif
    InvalidParameterGuard(const InvalidParameterGuard&) = delete;
    InvalidParameterGuard& operator=(const InvalidParameterGuard&) = delete;

#ifdef _WIN32
private:
    static void __cdecl Ignore(const wchar_t*, const wchar_t*, const wchar_t*, unsigned int,
                               uintptr_t) {}

    _invalid_parameter_handler m_previous;
#endif
};

} // namespace vaskel_test

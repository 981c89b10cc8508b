// Diagnostics and errors: the library's exception types, the assertion
// marker, numbered debug conditions, the floating-point status word and the
// thread-naming hook.
#pragma once

#include <vaskel/export.h>
#include <vaskel/win32.h>

#include <exception>

namespace vaskel {

// A system resource (an event, for example) could not be created.
class VASKEL_API resource_error : public std::exception {
public:
    resource_error() noexcept = default;
};

// An argument or a state is outside what an operation accepts.
class VASKEL_API unexpected_error : public std::exception {
public:
    unexpected_error() noexcept = default;
};

// Marks the extent of an assertion report. The count is process-wide: while
// any thread reports, IsInsideAssert() is true on every thread.
class VASKEL_API CVKInsideAssert {
public:
    CVKInsideAssert();
    ~CVKInsideAssert();
    CVKInsideAssert(const CVKInsideAssert&) = delete;
    CVKInsideAssert& operator=(const CVKInsideAssert&) = delete;

    static bool IsInsideAssert();

    static volatile DWORD m_nInsideAssert;
};

// A process-wide table of numbered values, 0 where nothing was stored. It
// takes no lock: callers serialise writers.
class VASKEL_API CVKDebugConditions {
public:
    static DWORD GetCondition(DWORD index) { return GetConditionValue(index); }
    static bool IsConditionSet(DWORD index) { return GetConditionValue(index) != 0; }
    static void SetCondition(DWORD index, DWORD value) { SetConditionValue(index, value); }
    static DWORD GetConditionCount() { return GetConditionTableSize(); }

private:
    static DWORD GetConditionValue(DWORD index);
    // Grows the table with zeros to index + 1 entries when it is shorter.
    static void SetConditionValue(DWORD index, DWORD value);
    static DWORD GetConditionTableSize();
};

// Developer switches, read once per process from the user's registry key
// Software\Orvalen\Zephrane\Common\DeveloperMode (values "DeveloperMode"
// and "IgnoreAssert", non-zero for on); a later change takes effect at the
// next start.
VASKEL_API bool IsDeveloperMode();
VASKEL_API bool VKIgnoreAssert();

// The floating-point status word, in the runtime library's _SW_ flags.
VASKEL_API DWORD GetStatus87();
// Clears the floating-point exception flags; returns the status before.
VASKEL_API DWORD ClearStatus87();

// A hook for naming a thread in a debugger; 0xFFFFFFFF names the calling
// thread. It has no effect.
VASKEL_API void VKSetThreadName(const char* name, DWORD threadId);

} // namespace vaskel

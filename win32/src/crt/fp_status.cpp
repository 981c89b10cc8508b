// The floating-point status word in the runtime library's flag layout,
// gathered from both the x87 unit and SSE (fenv reports both on x86).
#include <vkwin32/crt.h>

#include <cfenv>
#if defined(__x86_64__) || defined(__i386__)
#include <xmmintrin.h>
#endif

namespace {

#if defined(__x86_64__) || defined(__i386__)
const unsigned int denormalFlag = 0x0002; // MXCSR DE
#endif

unsigned int ReadStatus() {
    int raised = std::fetestexcept(FE_ALL_EXCEPT);
    unsigned int status = 0;
    if (raised & FE_INEXACT)
        status |= _SW_INEXACT;
    if (raised & FE_UNDERFLOW)
        status |= _SW_UNDERFLOW;
    if (raised & FE_OVERFLOW)
        status |= _SW_OVERFLOW;
    if (raised & FE_DIVBYZERO)
        status |= _SW_ZERODIVIDE;
    if (raised & FE_INVALID)
        status |= _SW_INVALID;
#if defined(__x86_64__) || defined(__i386__)
    if (_mm_getcsr() & denormalFlag)
        status |= _SW_DENORMAL;
#endif
    return status;
}

} // namespace

extern "C" unsigned int _statusfp(void) {
    return ReadStatus();
}

extern "C" unsigned int _clearfp(void) {
    unsigned int previous = ReadStatus();
    std::feclearexcept(FE_ALL_EXCEPT);
#if defined(__x86_64__) || defined(__i386__)
    _mm_setcsr(_mm_getcsr() & ~denormalFlag);
#endif
    return previous;
}

#include <vaskel/timer.h>

namespace vaskel {

namespace {

// Toward zero into 32 bits, saturating: a timer counting in counter ticks
// passes 2^32 of them within minutes, and wrapping would revive it.
DWORD TruncateToDword(double value) {
    if (!(value > 0.0))
        return 0;
    if (value >= 4294967295.0)
        return 0xFFFFFFFF;
    return static_cast<DWORD>(value);
}

} // namespace

DWORD CVKTimer::GetRemainingTime(ETimeUnit unit) const {
    // Whole units of the timer's own unit: the remainder counts down in
    // steps of that unit. An unstarted watch reads 0.
    const DWORD elapsed = TruncateToDword(m_watch.GetReading(m_eUnit));
    if (elapsed >= m_nTimeout)
        return 0;
    // Another unit goes through whole counter ticks; the same unit is unchanged.
    return TruncateToDword(
        CVKStopWatch::ConvertTime(static_cast<double>(m_nTimeout - elapsed), m_eUnit, unit));
}

} // namespace vaskel

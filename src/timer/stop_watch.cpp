#include <vaskel/timer.h>

#include <cmath>
#include <limits>

namespace vaskel {

namespace {

struct CounterSettings {
    bool present;
    LONGLONG frequency; // ticks per second
};

// Taken once, on first use, by a thread-safe static initialisation.
const CounterSettings& Settings() {
    static const CounterSettings settings = [] {
        LARGE_INTEGER frequency;
        if (QueryPerformanceFrequency(&frequency) && frequency.QuadPart > 0)
            return CounterSettings{true, frequency.QuadPart};
        return CounterSettings{false, 1000}; // GetTickCount's milliseconds
    }();
    return settings;
}

// The units' multipliers of seconds; 0 for raw ticks and any unlisted value.
LONGLONG Multiplier(ETimeUnit unit) {
    switch (unit) {
    case tuSeconds:
        return 1;
    case tuMilliseconds:
        return 1000;
    case tuMicroseconds:
        return 1000000;
    case tuNanoseconds:
        return 1000000000;
    default:
        return 0;
    }
}

bool ProductFits(LONGLONG value, LONGLONG multiplier) {
    const LONGLONG limit = std::numeric_limits<LONGLONG>::max() / multiplier;
    return value >= -limit && value <= limit;
}

double Product(LONGLONG value, LONGLONG multiplier) {
    return ProductFits(value, multiplier)
               ? static_cast<double>(value * multiplier)
               : static_cast<double>(value) * static_cast<double>(multiplier);
}

// Toward zero; NaN gives 0 and values beyond the range saturate, where a
// plain conversion would be undefined.
LONGLONG TruncateToTicks(double value) {
    const double limit = 9223372036854775808.0; // 2^63
    if (std::isnan(value))
        return 0;
    if (value >= limit)
        return std::numeric_limits<LONGLONG>::max();
    if (value <= -limit)
        return std::numeric_limits<LONGLONG>::min();
    return static_cast<LONGLONG>(value);
}

} // namespace

CVKStopWatch::CVKStopWatch(bool start) : m_nStart(0), m_nAccumulated(0), m_bRunning(false) {
    InitializeHighResolutionTimer(); // before, not within, the first interval
    if (start)
        Start(true);
}

bool CVKStopWatch::Start(bool reset) {
    if (m_bRunning && !reset)
        return false;
    if (reset) // a running watch gets this far only with reset
        m_nAccumulated = 0;
    m_bRunning = true;
    m_nStart = GetRawReading();
    return true;
}

bool CVKStopWatch::Stop() {
    if (!m_bRunning)
        return false;
    m_bRunning = false;
    m_nAccumulated += GetRawElapsedTime(m_nStart, GetRawReading());
    return true;
}

void CVKStopWatch::Reset() {
    m_nStart = 0;
    m_nAccumulated = 0;
    m_bRunning = false;
}

double CVKStopWatch::GetSampleReading(ETimeUnit unit) const {
    if (!m_bRunning)
        return -1.0;
    return ConvertTime(m_nAccumulated + GetRawElapsedTime(m_nStart, GetRawReading()), unit);
}

double CVKStopWatch::GetFinalReading(ETimeUnit unit) const {
    if (m_bRunning)
        return -1.0;
    return GetElapsedTime(0, m_nAccumulated, unit);
}

double CVKStopWatch::GetReading(ETimeUnit unit) const {
    return m_bRunning ? GetSampleReading(unit) : GetFinalReading(unit);
}

LONGLONG CVKStopWatch::GetRawReading() {
    if (!Settings().present)
        return static_cast<LONGLONG>(GetTickCount());
    LARGE_INTEGER now;
    QueryPerformanceCounter(&now);
    return now.QuadPart;
}

LONGLONG CVKStopWatch::GetRawElapsedTime(LONGLONG start, LONGLONG end) {
    // Unsigned arithmetic: readings far apart wrap instead of overflowing.
    const ULONGLONG from = static_cast<ULONGLONG>(start), to = static_cast<ULONGLONG>(end);
    if (end >= start)
        return static_cast<LONGLONG>(to - from);
    const ULONGLONG wrap = static_cast<ULONGLONG>(std::numeric_limits<LONGLONG>::max());
    return static_cast<LONGLONG>(to + (wrap - from));
}

double CVKStopWatch::GetElapsedTime(LONGLONG start, LONGLONG end, ETimeUnit unit) {
    return ConvertTime(GetRawElapsedTime(start, end), unit);
}

double CVKStopWatch::ConvertTime(LONGLONG ticks, ETimeUnit unit) {
    const LONGLONG multiplier = Multiplier(unit);
    if (multiplier == 0)
        return static_cast<double>(ticks);
    const LONGLONG frequency = Frequency();
    if (ProductFits(ticks, multiplier))
        return static_cast<double>(ticks * multiplier) / static_cast<double>(frequency);
    // Beyond 64 bits (nanoseconds of long intervals) whole seconds and the
    // remainder are scaled apart. Only here: below it the direct quotient is
    // the correctly rounded one.
    return Product(ticks / frequency, multiplier) +
           Product(ticks % frequency, multiplier) / static_cast<double>(frequency);
}

LONGLONG CVKStopWatch::ConvertTimeToTicks(double value, ETimeUnit unit) {
    const LONGLONG multiplier = Multiplier(unit);
    if (multiplier == 0)
        return TruncateToTicks(value);
    return TruncateToTicks(static_cast<double>(Frequency()) * value) / multiplier;
}

double CVKStopWatch::ConvertTime(double value, ETimeUnit from, ETimeUnit to) {
    if (from == to)
        return value;
    return ConvertTime(ConvertTimeToTicks(value, from), to);
}

double CVKStopWatch::ConvertTimeToSeconds(LONGLONG ticks) {
    return static_cast<double>(ticks) / static_cast<double>(Frequency());
}

void CVKStopWatch::InitializeHighResolutionTimer() {
    Settings();
}

LONGLONG CVKStopWatch::Frequency() {
    return Settings().frequency;
}

bool CVKStopWatch::IsHighResolution() {
    return Settings().present;
}

double CVKQuickStopWatch::GetReading(ETimeUnit unit) const {
    return CVKStopWatch::GetElapsedTime(m_nStart, CVKStopWatch::GetRawReading(), unit);
}

double CVKQuickStopWatch::GetReadingInSeconds() const {
    return CVKStopWatch::ConvertTimeToSeconds(
        CVKStopWatch::GetRawElapsedTime(m_nStart, CVKStopWatch::GetRawReading()));
}

} // namespace vaskel

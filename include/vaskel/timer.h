// Timers and measurement: time units, stopwatches, operation statistics and
// the polled time-out.
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/string.h>
#include <vaskel/win32.h>

namespace vaskel {

// The decimal exponent of the unit's fraction of a second. Any value not
// listed means raw counter ticks, like tuTicks.
enum ETimeUnit {
    tuTicks = -1,
    tuSeconds = 0,
    tuMilliseconds = 3,
    tuMicroseconds = 6,
    tuNanoseconds = 9
};

// An accumulating stopwatch on the high-resolution performance counter (the
// millisecond tick count where there is none). Its static members are the
// one place that knows the counter's frequency and converts ticks to units.
class VASKEL_API CVKStopWatch {
public:
    explicit CVKStopWatch(bool start = false);

    // Returns false and changes nothing when running and reset is false.
    // Otherwise starts, from zero when reset is true or the watch was running;
    // Start(false) on a stopped watch resumes and keeps the accumulated time.
    bool Start(bool reset);
    bool ReStart() { return Start(true); }
    // Adds the interval since the start to the accumulated time; false when
    // not running.
    bool Stop();
    void Reset();
    bool IsRunning() const { return m_bRunning; }

    // The accumulated time including the current interval; -1.0 when stopped.
    double GetSampleReading(ETimeUnit unit) const;
    // The accumulated time; -1.0 while running.
    double GetFinalReading(ETimeUnit unit) const;
    double GetReading(ETimeUnit unit) const;

    static LONGLONG GetRawReading();
    // end - start, or across the counter's wrap at the largest LONGLONG when
    // end is below start.
    static LONGLONG GetRawElapsedTime(LONGLONG start, LONGLONG end);
    static double GetElapsedTime(LONGLONG start, LONGLONG end, ETimeUnit unit);
    static double ConvertTime(LONGLONG ticks, ETimeUnit unit);
    // Truncates to whole ticks; values beyond the LONGLONG range saturate.
    static LONGLONG ConvertTimeToTicks(double value, ETimeUnit unit);
    // Through whole counter ticks, so the result is quantised to ticks;
    // unchanged when both units are the same.
    static double ConvertTime(double value, ETimeUnit from, ETimeUnit to);
    static double ConvertTimeToSeconds(LONGLONG ticks);

    // The counter settings are taken once per process, on first use from
    // any entry point.
    static void InitializeHighResolutionTimer();
    static LONGLONG Frequency();
    static bool IsHighResolution();

private:
    LONGLONG m_nStart;       // the raw reading at the last start
    LONGLONG m_nAccumulated; // ticks of the completed intervals since the last reset
    bool m_bRunning;
};

// A stopwatch that only remembers when it was started.
class VASKEL_API CVKQuickStopWatch {
public:
    CVKQuickStopWatch() : m_nStart(CVKStopWatch::GetRawReading()) {}

    void ReStart() { m_nStart = CVKStopWatch::GetRawReading(); }
    double GetReading(ETimeUnit unit) const;
    double GetReadingInSeconds() const;

private:
    LONGLONG m_nStart;
};

// Count, minimum, maximum and running mean of logged durations under a name.
// The fields are read directly; the unit is the caller's and only stored.
class VASKEL_API COperationStatistic {
public:
    COperationStatistic(const CString& name, ETimeUnit unit);

    void LogExecution(double value);

    CString m_strName;
    DWORD m_nCount;
    double m_dMinimum;
    double m_dMaximum;
    double m_dAverage;
    ETimeUnit m_eUnit;
};

// A polled time-out: a duration in a unit together with a stopwatch. It has
// no thread and no callback; the owner asks how much time remains.
class VASKEL_API CVKTimer {
public:
    CVKTimer() : CVKTimer(0, tuMilliseconds) {}
    CVKTimer(DWORD timeout, ETimeUnit unit) : m_nTimeout(timeout), m_eUnit(unit) {}

    // Leaves the stopwatch as it is.
    void SetTimeout(DWORD timeout, ETimeUnit unit) {
        m_nTimeout = timeout;
        m_eUnit = unit;
    }

    bool Start(bool reset) { return m_watch.Start(reset); }
    bool Stop() { return m_watch.Stop(); }
    bool ReStart() { return m_watch.ReStart(); }
    bool IsRunning() const { return m_watch.IsRunning(); }

    // The time-out less the whole units of the timer's own unit that have
    // elapsed, converted to the unit asked for; 0 once the time is up. An
    // unstarted timer has its whole time-out left.
    DWORD GetRemainingTime(ETimeUnit unit) const;
    bool TimeoutExpired() const { return GetRemainingTime(tuMilliseconds) == 0; }

private:
    DWORD m_nTimeout;
    ETimeUnit m_eUnit;
    CVKStopWatch m_watch;
};

} // namespace vaskel

// Timers and measurement: time units, stopwatches, operation statistics, the
// polled time-out and the timer controller.
#pragma once

#include <vaskel/calendar.h>
#include <vaskel/export.h>
#include <vaskel/framework/string.h>
#include <vaskel/queue.h>
#include <vaskel/win32.h>

#include <set>

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

class CTimerController;

// A listener of the timer controller; override either form. Listeners are not
// deleted through this interface.
struct VASKEL_API ITimerEvents {
    // Calls the other form with the event number.
    virtual void OnTimeElapsed(CTimerController* controller, DWORD eventId);
    virtual void OnTimeElapsed(DWORD eventId);

protected:
    ~ITimerEvents() = default;
};

// One logical timer of the controller: a plain value.
class CTimerItem {
public:
    ITimerEvents* GetTarget() const { return m_pTarget; }
    void SetTarget(ITimerEvents* target) { m_pTarget = target; }
    DWORD GetEventID() const { return m_nEventId; }
    void SetEventID(DWORD eventId) { m_nEventId = eventId; }
    bool GetAdviseOnce() const { return m_bAdviseOnce; }
    void SetAdviseOnce(bool adviseOnce) { m_bAdviseOnce = adviseOnce; }
    // 0.0 means the timer is not aligned to a start.
    const CDateTime& GetStartTime() const { return m_startTime; }
    void SetStartTime(const CDateTime& start) { m_startTime = start; }
    // The period in milliseconds.
    DWORD GetResolution() const { return m_nResolution; }
    void SetResolution(DWORD resolution) { m_nResolution = resolution; }
    // The due time in milliseconds after the controller's base tick.
    LONGLONG GetNextUpdate() const { return m_nNextUpdate; }
    void SetNextUpdate(LONGLONG nextUpdate) { m_nNextUpdate = nextUpdate; }

private:
    ITimerEvents* m_pTarget = nullptr;
    DWORD m_nEventId = 0;
    bool m_bAdviseOnce = false;
    CDateTime m_startTime;
    DWORD m_nResolution = 0;
    LONGLONG m_nNextUpdate = 0;
};

// The identity of a timer: its listener, then its event number.
struct cmpTimerItemByTarget {
    bool operator()(const CTimerItem& a, const CTimerItem& b) const {
        const auto targetA = reinterpret_cast<UINT_PTR>(a.GetTarget());
        const auto targetB = reinterpret_cast<UINT_PTR>(b.GetTarget());
        if (targetA != targetB)
            return targetA < targetB;
        return a.GetEventID() < b.GetEventID();
    }
};

// Due order; timers due in the same millisecond stay distinct entries,
// ordered by their addresses.
struct cmpTimerItemByNextUpdate {
    bool operator()(const CTimerItem* a, const CTimerItem* b) const {
        if (a->GetNextUpdate() != b->GetNextUpdate())
            return a->GetNextUpdate() < b->GetNextUpdate();
        return reinterpret_cast<UINT_PTR>(a) < reinterpret_cast<UINT_PTR>(b);
    }
};

// Any number of logical timers on one one-shot multimedia timer, delivered on
// the thread that creates the controller's window, every due timer in due
// order in one dispatch. A timer is its (listener, event number) pair. All
// calls belong on the window's thread; a listener may set and kill timers and
// destroy the controller from inside its call.
//
// A periodic timer with period 0 is due again one millisecond after each
// delivery and is delivered at most once per dispatch, so it fires about as
// often as the system timer allows without keeping the thread from its other
// messages.
class VASKEL_API CTimerController : public CVKMsgWnd {
public:
    // WPARAM: the multimedia timer that expired.
    static const UINT TimerExpiredMessage = WM_APP + 1;

    // Raises the system timer's resolution to its minimum period until
    // destruction. Create() the window before setting timers.
    CTimerController();
    ~CTimerController() override;
    CTimerController(const CTimerController&) = delete;
    CTimerController& operator=(const CTimerController&) = delete;

    // Stops the multimedia timer, destroys the window and forgets every
    // timer, before the object itself goes.
    static void PreDestroy(CTimerController* controller);

    // A timer with the same listener and event number is replaced.
    void SetTimer(ITimerEvents* target, DWORD eventId, DWORD resolution, bool adviseOnce);
    // Aligned to start + k * resolution; a start in the past keeps the grid.
    void SetTimer(ITimerEvents* target, DWORD eventId, const CDateTime& start, DWORD resolution,
                  bool adviseOnce);
    // Starts at that time of day today, or tomorrow when it is not later than now.
    void SetTimer(ITimerEvents* target, DWORD eventId, const CTime& time, DWORD resolution,
                  bool adviseOnce);
    void SetTimerInSeconds(ITimerEvents* target, DWORD eventId, DWORD seconds, bool adviseOnce);
    void SetTimerInSeconds(ITimerEvents* target, DWORD eventId, const CDateTime& start,
                           DWORD seconds, bool adviseOnce);
    void SetTimerInSeconds(ITimerEvents* target, DWORD eventId, const CTime& time, DWORD seconds,
                           bool adviseOnce);

    void KillTimer(ITimerEvents* target, DWORD eventId);
    // True when the listener had at least one timer.
    bool KillTimers(ITimerEvents* target);
    void KillAllTimers();

    // After the wall clock was set: the timers aligned to a start time are
    // scheduled anew.
    void TimeChanged();

    // False when the timer does not exist (remaining untouched) or is overdue
    // (remaining 0); 0xFFFFFFFF when the time left passes 32 bits.
    bool GetRemainingMilliseconds(ITimerEvents* target, DWORD eventId, DWORD& remaining) const;

    bool IsEmpty() const { return m_timers.empty(); }
    DWORD GetSize() const { return static_cast<DWORD>(m_timers.size()); }

protected:
    typedef std::set<CTimerItem, cmpTimerItemByTarget> TimerSet;
    typedef std::set<CTimerItem*, cmpTimerItemByNextUpdate> DueSet;

    void SetTimer(CTimerItem& item, bool restart);
    void KillTimer(const CTimerItem& item, bool restart);
    void SetFirstUpdateTime(CTimerItem& item);
    void SetNextUpdateTime(CTimerItem& item);
    void StartInternalTimer();
    void StopInternalTimer();
    // Arms the multimedia timer for the earliest due time, or stops it when
    // no timer is left; force re-arms even when that time is already armed.
    void DoInternalTimerLogic(bool force);
    // Moves the base tick to now, keeping every due time where it is.
    void RebaseTimerController();
    // Absolute readings of the millisecond counter, 64 bits wide: the armed
    // due time, and the due time of the earliest timer (0 when none).
    LONGLONG GetNextUpdateTime() const;
    LONGLONG GetTimeToNextUpdate() const;
    LONGLONG GetNextItemUpdateTime() const;
    // The armed multimedia timer, 0 when none.
    UINT GetInternalTimerId() const { return m_nTimerId; }
    DWORD GetBaseTick() const { return m_nBaseTick; }
    static void CALLBACK TimerProc(UINT timerId, UINT message, DWORD_PTR user, DWORD_PTR,
                                   DWORD_PTR);
    bool OnWndMsg(UINT message, WPARAM wParam, LPARAM lParam, LRESULT* result) override;

private:
    // Milliseconds since the base tick, modulo 2^32.
    DWORD Elapsed() const;
    // Whether the earliest timer is due in a dispatch that started horizon
    // milliseconds after the base tick.
    bool EarliestIsDue(LONGLONG horizon) const;
    void Dispatch();
    TimerSet::const_iterator Find(ITimerEvents* target, DWORD eventId) const;
    static CTimerItem& Stored(const CTimerItem& item) { return const_cast<CTimerItem&>(item); }

    TimerSet m_timers;
    DueSet m_due;
    UINT m_nTimerId;
    UINT m_nMinPeriod;
    UINT m_nMaxPeriod;
    bool m_bScheduled;
    DWORD m_nBaseTick;
    LONGLONG m_nScheduledUpdate;
    // Shared with a running dispatch, so that it can tell whether a listener
    // destroyed the controller.
    int* m_pLiveness;
};

} // namespace vaskel

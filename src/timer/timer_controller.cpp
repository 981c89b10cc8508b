#include <vaskel/timer.h>

#include <cmath>

namespace vaskel {

namespace {

const LONGLONG counterRange = 0xFFFFFFFFLL;
// An early expiry rebases past half the counter's range, so that the elapsed
// time, kept modulo 2^32, never wraps under a timer due beyond it.
const DWORD rebaseThreshold = 0x80000000u;

// Saturates: a period beyond 32 bits of milliseconds would wrap to a short one.
DWORD SecondsToMilliseconds(DWORD seconds) {
    return seconds > 0xFFFFFFFFu / 1000 ? 0xFFFFFFFFu : seconds * 1000;
}

// A dispatch's share of the liveness counter; the last share frees it.
void ReleaseShare(int* liveness) {
    if (--*liveness == 0)
        delete liveness;
}

} // namespace

void ITimerEvents::OnTimeElapsed(CTimerController*, DWORD eventId) {
    OnTimeElapsed(eventId);
}

void ITimerEvents::OnTimeElapsed(DWORD) {}

CTimerController::CTimerController()
    : m_nTimerId(0), m_nMinPeriod(0), m_nMaxPeriod(0), m_bScheduled(false), m_nBaseTick(0),
      m_nScheduledUpdate(0), m_pLiveness(new int(1)) {
    TIMECAPS caps = {};
    timeGetDevCaps(&caps, sizeof(caps));
    m_nMinPeriod = caps.wPeriodMin;
    m_nMaxPeriod = caps.wPeriodMax;
    timeBeginPeriod(m_nMinPeriod);
}

CTimerController::~CTimerController() {
    if (m_bScheduled) {
        timeKillEvent(m_nTimerId);
        m_nTimerId = 0;
    }
    timeEndPeriod(m_nMinPeriod);
    ReleaseShare(m_pLiveness);
    m_due.clear();
    m_timers.clear();
}

void CTimerController::PreDestroy(CTimerController* controller) {
    if (controller == nullptr)
        return;
    // The multimedia timer goes before the window, so that no expiry is
    // posted to a window handle the system may already have reused.
    if (controller->m_bScheduled) {
        controller->m_bScheduled = false;
        controller->StopInternalTimer();
    }
    controller->Destroy();
    controller->m_due.clear();
    controller->m_timers.clear();
}

void CTimerController::SetTimer(ITimerEvents* target, DWORD eventId, DWORD resolution,
                                bool adviseOnce) {
    CTimerItem item;
    item.SetTarget(target);
    item.SetEventID(eventId);
    item.SetAdviseOnce(adviseOnce);
    item.SetResolution(resolution);
    SetTimer(item, true);
}

void CTimerController::SetTimer(ITimerEvents* target, DWORD eventId, const CDateTime& start,
                                DWORD resolution, bool adviseOnce) {
    CTimerItem item;
    item.SetTarget(target);
    item.SetEventID(eventId);
    item.SetAdviseOnce(adviseOnce);
    item.SetStartTime(start);
    item.SetResolution(resolution);
    SetTimer(item, true);
}

void CTimerController::SetTimer(ITimerEvents* target, DWORD eventId, const CTime& time,
                                DWORD resolution, bool adviseOnce) {
    CDateTime start = CDateTime::NowDateOnly();
    start.SetValue(start.GetValue() + CDateTime(time.GetValue()).GetTimePortion());
    if (!(start.GetValue() > CDateTime::Now().GetValue()))
        start.SetValue(start.GetValue() + 1.0);
    SetTimer(target, eventId, start, resolution, adviseOnce);
}

void CTimerController::SetTimerInSeconds(ITimerEvents* target, DWORD eventId, DWORD seconds,
                                         bool adviseOnce) {
    SetTimer(target, eventId, SecondsToMilliseconds(seconds), adviseOnce);
}

void CTimerController::SetTimerInSeconds(ITimerEvents* target, DWORD eventId,
                                         const CDateTime& start, DWORD seconds,
                                         bool adviseOnce) {
    SetTimer(target, eventId, start, SecondsToMilliseconds(seconds), adviseOnce);
}

void CTimerController::SetTimerInSeconds(ITimerEvents* target, DWORD eventId, const CTime& time,
                                         DWORD seconds, bool adviseOnce) {
    SetTimer(target, eventId, time, SecondsToMilliseconds(seconds), adviseOnce);
}

void CTimerController::KillTimer(ITimerEvents* target, DWORD eventId) {
    CTimerItem key;
    key.SetTarget(target);
    key.SetEventID(eventId);
    KillTimer(key, true);
}

bool CTimerController::KillTimers(ITimerEvents* target) {
    CTimerItem first;
    first.SetTarget(target);
    auto begin = m_timers.lower_bound(first);
    auto end = begin;
    while (end != m_timers.end() && end->GetTarget() == target) {
        m_due.erase(&Stored(*end));
        ++end;
    }
    if (begin == end)
        return false;
    m_timers.erase(begin, end);
    DoInternalTimerLogic(false);
    return true;
}

void CTimerController::KillAllTimers() {
    if (m_timers.empty())
        return;
    m_due.clear();
    m_timers.clear();
    DoInternalTimerLogic(false);
}

void CTimerController::TimeChanged() {
    bool recomputed = false;
    for (const CTimerItem& stored : m_timers) {
        if (stored.GetStartTime().GetValue() == 0.0)
            continue;
        CTimerItem& item = Stored(stored);
        m_due.erase(&item);
        SetFirstUpdateTime(item);
        m_due.insert(&item);
        recomputed = true;
    }
    if (recomputed)
        DoInternalTimerLogic(false);
}

bool CTimerController::GetRemainingMilliseconds(ITimerEvents* target, DWORD eventId,
                                                DWORD& remaining) const {
    auto found = Find(target, eventId);
    if (found == m_timers.end())
        return false;
    const LONGLONG left = found->GetNextUpdate() - static_cast<LONGLONG>(Elapsed());
    if (left < 0) {
        remaining = 0;
        return false;
    }
    remaining = left > counterRange ? 0xFFFFFFFFu : static_cast<DWORD>(left);
    return true;
}

void CTimerController::SetTimer(CTimerItem& item, bool restart) {
    SetFirstUpdateTime(item);
    auto inserted = m_timers.insert(item);
    CTimerItem& stored = Stored(*inserted.first);
    if (!inserted.second) {
        m_due.erase(&stored);
        stored.SetAdviseOnce(item.GetAdviseOnce());
        stored.SetStartTime(item.GetStartTime());
        stored.SetResolution(item.GetResolution());
        stored.SetNextUpdate(item.GetNextUpdate());
    }
    m_due.insert(&stored);
    if (restart)
        DoInternalTimerLogic(false);
}

void CTimerController::KillTimer(const CTimerItem& item, bool restart) {
    // The item may be the stored one itself: nothing of it is read after the erase.
    auto found = Find(item.GetTarget(), item.GetEventID());
    if (found == m_timers.end())
        return;
    m_due.erase(&Stored(*found));
    m_timers.erase(found);
    if (restart || m_timers.empty())
        DoInternalTimerLogic(false);
}

void CTimerController::SetFirstUpdateTime(CTimerItem& item) {
    const DWORD now = timeGetTime();
    LONGLONG delay = item.GetResolution();
    if (item.GetStartTime().GetValue() != 0.0) {
        const CTimeSpan untilStart = item.GetStartTime() - CDateTime::Now();
        // The span is already whole milliseconds; rounding undoes the scaling error.
        delay = static_cast<LONGLONG>(
            std::llround(untilStart.GetSpan() * CTimeSpan::MillisecondsPerDay));
        if (delay < 0) {
            const LONGLONG period = item.GetResolution();
            // In 1 .. period: the next point of the grid start + k * period.
            delay = period == 0 ? 0 : period + delay % period;
        }
    }
    if (m_timers.empty())
        m_nBaseTick = now;
    else if (now < m_nBaseTick ||
             static_cast<LONGLONG>(now - m_nBaseTick) + delay > counterRange)
        RebaseTimerController();
    // A base taken after now counts as now.
    const LONGLONG sinceBase = now < m_nBaseTick ? 0 : static_cast<LONGLONG>(now - m_nBaseTick);
    item.SetNextUpdate(sinceBase + delay);
}

void CTimerController::SetNextUpdateTime(CTimerItem& item) {
    if (item.GetResolution() == 0) {
        // No grid to keep: due again a millisecond after this delivery.
        item.SetNextUpdate(static_cast<LONGLONG>(Elapsed()) + 1);
        return;
    }
    if (item.GetNextUpdate() + item.GetResolution() > counterRange)
        RebaseTimerController();
    item.SetNextUpdate(item.GetNextUpdate() + item.GetResolution());
}

void CTimerController::StartInternalTimer() {
    LONGLONG delay = GetTimeToNextUpdate();
    if (delay < m_nMinPeriod)
        delay = m_nMinPeriod;
    if (delay > m_nMaxPeriod)
        delay = m_nMaxPeriod;
    m_nTimerId = timeSetEvent(static_cast<UINT>(delay), 1000, &CTimerController::TimerProc,
                              reinterpret_cast<DWORD_PTR>(GetWndHandle()),
                              TIME_ONESHOT | TIME_CALLBACK_FUNCTION | TIME_KILL_SYNCHRONOUS);
}

void CTimerController::StopInternalTimer() {
    timeKillEvent(m_nTimerId);
    m_nTimerId = 0;
}

void CTimerController::DoInternalTimerLogic(bool force) {
    if (m_due.empty()) {
        m_bScheduled = false;
        m_nScheduledUpdate = 0;
        StopInternalTimer();
        return;
    }
    const LONGLONG first = (*m_due.begin())->GetNextUpdate();
    if (!m_bScheduled) {
        m_nScheduledUpdate = first;
        m_bScheduled = true;
        StartInternalTimer();
    } else if (m_nScheduledUpdate != first || force) {
        m_nScheduledUpdate = first;
        StopInternalTimer();
        StartInternalTimer();
    }
}

void CTimerController::RebaseTimerController() {
    const DWORD newBase = timeGetTime();
    const LONGLONG delta = static_cast<DWORD>(newBase - m_nBaseTick);
    m_nBaseTick = newBase;
    if (m_bScheduled)
        m_nScheduledUpdate -= delta;
    // Every timer moves by the same amount, so the due order stands.
    for (const CTimerItem& item : m_timers)
        Stored(item).SetNextUpdate(item.GetNextUpdate() - delta);
}

LONGLONG CTimerController::GetNextUpdateTime() const {
    return static_cast<LONGLONG>(m_nBaseTick) + m_nScheduledUpdate;
}

LONGLONG CTimerController::GetTimeToNextUpdate() const {
    const LONGLONG left = m_nScheduledUpdate - static_cast<LONGLONG>(Elapsed());
    return left > 0 ? left : 0;
}

LONGLONG CTimerController::GetNextItemUpdateTime() const {
    if (m_due.empty())
        return 0;
    return static_cast<LONGLONG>(m_nBaseTick) + (*m_due.begin())->GetNextUpdate();
}

void CALLBACK CTimerController::TimerProc(UINT timerId, UINT, DWORD_PTR user, DWORD_PTR,
                                          DWORD_PTR) {
    ::PostMessageA(reinterpret_cast<HWND>(user), TimerExpiredMessage, timerId, 0);
}

bool CTimerController::OnWndMsg(UINT message, WPARAM wParam, LPARAM lParam, LRESULT* result) {
    if (message != TimerExpiredMessage)
        return CVKMsgWnd::OnWndMsg(message, wParam, lParam, result);
    *result = 0;
    if (m_nTimerId == 0 || wParam != m_nTimerId)
        return true; // superseded by a later arming
    if (m_timers.empty()) {
        DoInternalTimerLogic(false);
        return true;
    }
    if (m_nScheduledUpdate > static_cast<LONGLONG>(Elapsed())) {
        // Early, or the delay was cut to the longest period.
        if (Elapsed() >= rebaseThreshold)
            RebaseTimerController();
        DoInternalTimerLogic(true);
        return true;
    }
    // A listener further up this thread's stack runs a message loop; its
    // dispatch re-arms when it returns.
    if (*m_pLiveness > 1)
        return true;
    Dispatch();
    return true;
}

DWORD CTimerController::Elapsed() const {
    return timeGetTime() - m_nBaseTick;
}

bool CTimerController::EarliestIsDue(LONGLONG horizon) const {
    const CTimerItem& first = **m_due.begin();
    if (first.GetNextUpdate() > static_cast<LONGLONG>(Elapsed()))
        return false;
    // A timer without period delivers once per dispatch.
    return first.GetAdviseOnce() || first.GetResolution() != 0 ||
           first.GetNextUpdate() <= horizon;
}

void CTimerController::Dispatch() {
    int* liveness = m_pLiveness;
    ++*liveness;
    const DWORD startTick = timeGetTime();
    do {
        CTimerItem& first = **m_due.begin();
        ITimerEvents* const target = first.GetTarget();
        const DWORD eventId = first.GetEventID();
        if (first.GetAdviseOnce()) {
            KillTimer(first, false);
        } else {
            m_due.erase(m_due.begin());
            SetNextUpdateTime(first);
            m_due.insert(&first);
        }
        target->OnTimeElapsed(this, eventId);
        if (*liveness == 1) {
            // The listener destroyed the controller.
            ReleaseShare(liveness);
            return;
        }
        // Read anew each round: a rebase may have moved the base past startTick.
    } while (!m_timers.empty() &&
             EarliestIsDue(static_cast<LONG>(startTick - m_nBaseTick)));
    DoInternalTimerLogic(false);
    ReleaseShare(liveness);
}

CTimerController::TimerSet::const_iterator CTimerController::Find(ITimerEvents* target,
                                                                  DWORD eventId) const {
    CTimerItem key;
    key.SetTarget(target);
    key.SetEventID(eventId);
    return m_timers.find(key);
}

} // namespace vaskel

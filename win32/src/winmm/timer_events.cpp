// Multimedia timer events and timer periods. One timer thread per process
// serves every event: it sleeps until the earliest deadline and runs the due
// callbacks one at a time with the lock released, so that a callback may set
// and kill events, its own included.
#include <vkwin32/mmsystem.h>
#include <vkwin32/synch.h>

#include <algorithm>
#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <map>
#include <mutex>
#include <system_error>
#include <thread>
#include <unordered_map>
#include <vector>

namespace vkw32 {
namespace {

// The range Windows reports. POSIX sleeps are fine-grained already, so a
// requested period changes nothing.
const UINT minPeriod = 1;
const UINT maxPeriod = 1000000;

const UINT knownFlags =
    TIME_PERIODIC | TIME_CALLBACK_EVENT_SET | TIME_CALLBACK_EVENT_PULSE | TIME_KILL_SYNCHRONOUS;

// Deadlines follow the monotonic clock itself, not the tick count, which
// tests may move.
using Clock = std::chrono::steady_clock;

struct TimerEvent {
    std::chrono::milliseconds period;
    UINT flags;
    LPTIMECALLBACK callback; // an event handle for the set and pulse kinds
    DWORD_PTR user;
    std::uint64_t ticket; // the queue entry that is current; older ones are stale
    bool started;         // a one-shot whose callback has begun can no longer be killed
};

struct QueueEntry {
    Clock::time_point deadline;
    std::uint64_t ticket; // unique, and orders equal deadlines first come first served
    UINT id;
};

// The heap's order: its front is the earliest deadline.
bool Later(const QueueEntry& a, const QueueEntry& b) {
    if (a.deadline != b.deadline)
        return a.deadline > b.deadline;
    return a.ticket > b.ticket;
}

void Fire(UINT id, const TimerEvent& event) {
    HANDLE handle = reinterpret_cast<HANDLE>(event.callback);
    if (event.flags & TIME_CALLBACK_EVENT_SET)
        SetEvent(handle);
    else if (event.flags & TIME_CALLBACK_EVENT_PULSE)
        PulseEvent(handle);
    else
        event.callback(id, 0, event.user, 0, 0);
}

class TimerService {
public:
    UINT Set(UINT delay, LPTIMECALLBACK callback, DWORD_PTR user, UINT flags);
    MMRESULT Kill(UINT id);

private:
    void Run();
    UINT NextId();
    void Schedule(UINT id, TimerEvent& event, Clock::time_point deadline);
    bool IsCurrent(const QueueEntry& entry) const;
    void DropStaleFront();
    void CompactQueue();

    std::mutex m_mutex;
    std::condition_variable m_wake;         // the timer thread: new front or new event
    std::condition_variable m_callbackDone; // killers waiting for a running callback
    std::unordered_map<UINT, TimerEvent> m_events;
    std::vector<QueueEntry> m_queue; // a heap; killed events leave stale entries
    std::uint64_t m_nextTicket = 0;
    UINT m_lastId = 0;
    UINT m_running = 0; // the event whose callback runs now; identifiers are never 0
    bool m_threadStarted = false;
    std::thread::id m_timerThread;
};

// The service is created on first use and never destroyed, and its thread is
// detached. At exit, static destructors run while the thread may be inside a
// callback, and exit may even be called from a callback on the thread
// itself: a destructor that stopped and joined the thread could wait for
// ever or join itself, and one that freed the state would leave the thread
// on freed memory. The end of the process ends the thread instead.
TimerService& Service() {
    static TimerService* service = new TimerService;
    return *service;
}

UINT TimerService::Set(UINT delay, LPTIMECALLBACK callback, DWORD_PTR user, UINT flags) {
    std::lock_guard<std::mutex> lock(m_mutex);
    if (!m_threadStarted) {
        try {
            std::thread thread(&TimerService::Run, this);
            m_timerThread = thread.get_id();
            thread.detach();
        } catch (const std::system_error&) {
            return 0;
        }
        m_threadStarted = true;
    }
    UINT id = NextId();
    TimerEvent& event = m_events[id];
    event = TimerEvent{std::chrono::milliseconds(delay), flags, callback, user, 0, false};
    Schedule(id, event, Clock::now() + event.period);
    if (m_queue.front().ticket == event.ticket)
        m_wake.notify_one();
    return id;
}

MMRESULT TimerService::Kill(UINT id) {
    std::unique_lock<std::mutex> lock(m_mutex);
    MMRESULT result = MMSYSERR_INVALPARAM;
    auto it = m_events.find(id);
    if (it != m_events.end() && !it->second.started) {
        m_events.erase(it);
        CompactQueue();
        result = TIMERR_NOERROR;
    }
    // Whatever the event's flags, the callback is over when the kill returns,
    // unless the callback itself is killing it: it cannot wait for itself.
    if (id != 0 && std::this_thread::get_id() != m_timerThread)
        m_callbackDone.wait(lock, [&] { return m_running != id; });
    return result;
}

void TimerService::Run() {
    std::unique_lock<std::mutex> lock(m_mutex);
    for (;;) {
        DropStaleFront();
        if (m_queue.empty()) {
            m_wake.wait(lock);
            continue;
        }
        const QueueEntry due = m_queue.front();
        const Clock::time_point now = Clock::now();
        if (now < due.deadline) {
            m_wake.wait_until(lock, due.deadline);
            continue;
        }
        std::pop_heap(m_queue.begin(), m_queue.end(), Later);
        m_queue.pop_back();
        TimerEvent& event = m_events.at(due.id);
        const bool periodic = (event.flags & TIME_PERIODIC) != 0;
        if (periodic) {
            // Keep the beat of the first deadline, but after a stall of more
            // than a period start again from now instead of firing the missed
            // beats in a burst.
            Clock::time_point next = due.deadline + event.period;
            if (next < now)
                next = now + event.period;
            Schedule(due.id, event, next);
        } else {
            event.started = true;
        }
        const TimerEvent call = event;
        m_running = due.id;
        lock.unlock();
        Fire(due.id, call);
        lock.lock();
        m_running = 0;
        if (!periodic)
            m_events.erase(due.id);
        m_callbackDone.notify_all();
    }
}

UINT TimerService::NextId() {
    // Increasing, so that an identifier just killed names no new event for a
    // long while; on wrap-around the live ones are skipped.
    do {
        ++m_lastId;
    } while (m_lastId == 0 || m_lastId == m_running || m_events.count(m_lastId) != 0);
    return m_lastId;
}

void TimerService::Schedule(UINT id, TimerEvent& event, Clock::time_point deadline) {
    event.ticket = ++m_nextTicket;
    m_queue.push_back(QueueEntry{deadline, event.ticket, id});
    std::push_heap(m_queue.begin(), m_queue.end(), Later);
}

bool TimerService::IsCurrent(const QueueEntry& entry) const {
    auto it = m_events.find(entry.id);
    return it != m_events.end() && it->second.ticket == entry.ticket;
}

void TimerService::DropStaleFront() {
    while (!m_queue.empty() && !IsCurrent(m_queue.front())) {
        std::pop_heap(m_queue.begin(), m_queue.end(), Later);
        m_queue.pop_back();
    }
}

void TimerService::CompactQueue() {
    // Stale entries otherwise stay until their deadline, up to the longest
    // delay: a program that sets and kills long events would grow the heap.
    if (m_queue.size() <= 2 * m_events.size() + 64)
        return;
    m_queue.erase(std::remove_if(m_queue.begin(), m_queue.end(),
                                 [this](const QueueEntry& entry) { return !IsCurrent(entry); }),
                  m_queue.end());
    std::make_heap(m_queue.begin(), m_queue.end(), Later);
}

// Outstanding timeBeginPeriod calls, per period. Never destroyed, like the
// timer service, so that a callback running during exit may still end one.
struct PeriodRequests {
    std::mutex mutex;
    std::map<UINT, ULONGLONG> counts;
};

PeriodRequests& Periods() {
    static PeriodRequests* periods = new PeriodRequests;
    return *periods;
}

bool IsValidPeriod(UINT period) {
    return period >= minPeriod && period <= maxPeriod;
}

} // namespace
} // namespace vkw32

extern "C" MMRESULT WINAPI timeGetDevCaps(LPTIMECAPS caps, UINT size) {
    if (caps == nullptr || size < sizeof(TIMECAPS))
        return TIMERR_NOCANDO;
    caps->wPeriodMin = vkw32::minPeriod;
    caps->wPeriodMax = vkw32::maxPeriod;
    return MMSYSERR_NOERROR;
}

extern "C" MMRESULT WINAPI timeBeginPeriod(UINT period) {
    if (!vkw32::IsValidPeriod(period))
        return TIMERR_NOCANDO;
    vkw32::PeriodRequests& periods = vkw32::Periods();
    std::lock_guard<std::mutex> lock(periods.mutex);
    ++periods.counts[period];
    return TIMERR_NOERROR;
}

extern "C" MMRESULT WINAPI timeEndPeriod(UINT period) {
    // A period out of range was never begun, so it is refused here too.
    vkw32::PeriodRequests& periods = vkw32::Periods();
    std::lock_guard<std::mutex> lock(periods.mutex);
    auto it = periods.counts.find(period);
    if (it == periods.counts.end())
        return TIMERR_NOCANDO;
    if (--it->second == 0)
        periods.counts.erase(it);
    return TIMERR_NOERROR;
}

// The resolution is only a hint: deadlines are kept to the millisecond anyway.
extern "C" MMRESULT WINAPI timeSetEvent(UINT delay, UINT /*resolution*/, LPTIMECALLBACK callback,
                                        DWORD_PTR user, UINT flags) {
    const UINT eventKinds = TIME_CALLBACK_EVENT_SET | TIME_CALLBACK_EVENT_PULSE;
    if (!vkw32::IsValidPeriod(delay) || callback == nullptr || (flags & ~vkw32::knownFlags) != 0 ||
        (flags & eventKinds) == eventKinds)
        return 0;
    return vkw32::Service().Set(delay, callback, user, flags);
}

extern "C" MMRESULT WINAPI timeKillEvent(UINT timerId) {
    return vkw32::Service().Kill(timerId);
}

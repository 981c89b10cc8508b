// Multimedia timer events and timer periods.
#include "support/wine.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <climits>
#include <mutex>
#include <numeric>
#include <random>
#include <set>
#include <thread>
#include <vector>

namespace {

const MMRESULT noError = TIMERR_NOERROR;
const MMRESULT noCanDo = TIMERR_NOCANDO;
const MMRESULT invalidParameter = MMSYSERR_INVALPARAM;

// Long enough for a loaded machine; a wait that passes returns at once.
const DWORD longWait = 10000;

struct Handle {
    explicit Handle(HANDLE h) : h(h) {}
    ~Handle() { CloseHandle(h); }
    Handle(const Handle&) = delete;
    Handle& operator=(const Handle&) = delete;
    HANDLE h;
};

// What a callback saw. The test's thread reads it after waiting on `called`.
struct Calls {
    Handle called{CreateEventA(nullptr, FALSE, FALSE, nullptr)};
    std::atomic<int> count{0};
    std::atomic<UINT> timerId{0};
    std::atomic<DWORD> threadId{0};
};

DWORD_PTR UserData(void* object) {
    return reinterpret_cast<DWORD_PTR>(object);
}

void CALLBACK Count(UINT timerId, UINT, DWORD_PTR user, DWORD_PTR, DWORD_PTR) {
    Calls* calls = reinterpret_cast<Calls*>(user);
    calls->timerId = timerId;
    calls->threadId = GetCurrentThreadId();
    ++calls->count;
    SetEvent(calls->called.h);
}

bool WaitForCalls(Calls& calls, int count) {
    for (int i = 0; i < count; ++i) {
        if (WaitForSingleObject(calls.called.h, longWait) != WAIT_OBJECT_0)
            return false;
    }
    return true;
}

// Returns once the timer thread has served every event due within `delay`
// milliseconds from now: one thread calls the callbacks in deadline order.
void PassTimerThread(UINT delay) {
    Calls fence;
    ASSERT_NE(timeSetEvent(delay, 0, Count, UserData(&fence), TIME_ONESHOT), 0u);
    ASSERT_TRUE(WaitForCalls(fence, 1));
}

// Windows documents MMSYSERR_INVALPARAM for an event that does not exist;
// Wine 8 returns TIMERR_NOCANDO, so there only the refusal itself is checked.
void ExpectKillRefused(UINT id, const char* what) {
    MMRESULT result = timeKillEvent(id);
    if (vaskel_test::RunningOnWine()) {
        EXPECT_NE(result, noError) << what;
    } else {
        EXPECT_EQ(result, invalidParameter) << what;
    }
}

TIMECAPS DeviceCaps() {
    TIMECAPS caps{};
    EXPECT_EQ(timeGetDevCaps(&caps, sizeof caps), noError);
    return caps;
}

double Milliseconds() {
    LARGE_INTEGER frequency, count;
    QueryPerformanceFrequency(&frequency);
    QueryPerformanceCounter(&count);
    return double(count.QuadPart) * 1000.0 / double(frequency.QuadPart);
}

} // namespace

TEST(MultimediaTimerTest, DeviceCapsGiveThePeriodRangeAndCheckTheStructure) {
    TIMECAPS caps = DeviceCaps();
    EXPECT_EQ(caps.wPeriodMin, 1u);
    EXPECT_GE(caps.wPeriodMax, 65535u); // Windows: 1000000, Wine: 65535
    EXPECT_EQ(timeGetDevCaps(nullptr, sizeof caps), noCanDo);
    EXPECT_EQ(timeGetDevCaps(&caps, sizeof caps - 1), noCanDo);
}

TEST(MultimediaTimerTest, PeriodsAreCheckedAndBalanced) {
    TIMECAPS caps = DeviceCaps();
    EXPECT_EQ(timeBeginPeriod(0), noCanDo);
    EXPECT_EQ(timeEndPeriod(0), noCanDo);
    if (caps.wPeriodMax < UINT_MAX) {
        EXPECT_EQ(timeBeginPeriod(caps.wPeriodMax + 1), noCanDo);
        EXPECT_EQ(timeEndPeriod(caps.wPeriodMax + 1), noCanDo);
    }
    EXPECT_EQ(timeBeginPeriod(caps.wPeriodMax), noError);
    EXPECT_EQ(timeEndPeriod(caps.wPeriodMax), noError);

    const UINT period = caps.wPeriodMin + 6; // one that nothing else in the process asks for
    EXPECT_EQ(timeBeginPeriod(period), noError);
    EXPECT_EQ(timeBeginPeriod(period), noError);
    EXPECT_EQ(timeEndPeriod(period), noError);
    EXPECT_EQ(timeEndPeriod(period), noError);
    if (vaskel_test::RunningOnWine())
        GTEST_SKIP() << "Wine 8 does not count the periods begun: it ends any period in range";
    EXPECT_EQ(timeEndPeriod(period), noCanDo) << "every begin is ended already";
    EXPECT_EQ(timeEndPeriod(period + 1), noCanDo) << "never begun";
}

TEST(MultimediaTimerTest, AOneShotFiresOnceOnTheTimerThreadAfterItsDelay) {
    Calls calls;
    const UINT delay = 100;
    double start = Milliseconds();
    UINT id = timeSetEvent(delay, 0, Count, UserData(&calls), TIME_ONESHOT);
    ASSERT_NE(id, 0u);
    ASSERT_TRUE(WaitForCalls(calls, 1));
    EXPECT_GE(Milliseconds() - start, delay - 20.0) << "not early, within the timer's granularity";
    EXPECT_EQ(calls.timerId.load(), id);
    EXPECT_NE(calls.threadId.load(), GetCurrentThreadId());
    PassTimerThread(4 * delay);
    EXPECT_EQ(calls.count.load(), 1);
}

TEST(MultimediaTimerTest, APeriodicEventRepeatsUntilKilled) {
    Calls calls;
    UINT id = timeSetEvent(10, 0, Count, UserData(&calls), TIME_PERIODIC | TIME_KILL_SYNCHRONOUS);
    ASSERT_NE(id, 0u);
    EXPECT_TRUE(WaitForCalls(calls, 5));
    EXPECT_EQ(timeKillEvent(id), noError);
    int fired = calls.count;
    EXPECT_GE(fired, 5);
    EXPECT_EQ(calls.timerId.load(), id);
    PassTimerThread(100);
    EXPECT_EQ(calls.count.load(), fired) << "no call after the kill";
    ExpectKillRefused(id, "killed already");
}

TEST(MultimediaTimerTest, KillRefusesUnknownKilledAndFiredEvents) {
    ExpectKillRefused(0xFFFFFFF0u, "never set");
    Calls calls;
    UINT pending = timeSetEvent(longWait, 0, Count, UserData(&calls), TIME_ONESHOT);
    ASSERT_NE(pending, 0u);
    EXPECT_EQ(timeKillEvent(pending), noError);
    ExpectKillRefused(pending, "killed already");

    UINT fired = timeSetEvent(10, 0, Count, UserData(&calls), TIME_ONESHOT);
    ASSERT_NE(fired, 0u);
    EXPECT_NE(fired, pending) << "identifiers are not reused at once";
    ASSERT_TRUE(WaitForCalls(calls, 1));
    PassTimerThread(10);
    ExpectKillRefused(fired, "a one-shot that fired");
    EXPECT_EQ(calls.count.load(), 1) << "the killed event never fired";
    EXPECT_EQ(calls.timerId.load(), fired);
}

namespace {

struct SlowCalls : Calls {
    std::atomic<bool> running{false};
};

// Signals on entry, so that the test kills the event while it runs.
void CALLBACK Slow(UINT, UINT, DWORD_PTR user, DWORD_PTR, DWORD_PTR) {
    SlowCalls* calls = reinterpret_cast<SlowCalls*>(user);
    calls->running = true;
    SetEvent(calls->called.h);
    Sleep(30);
    ++calls->count;
    calls->running = false;
}

} // namespace

TEST(MultimediaTimerTest, ASynchronousKillReturnsOnceTheCallbackIsOver) {
    for (int round = 0; round < 5; ++round) {
        SlowCalls calls;
        UINT id =
            timeSetEvent(10, 0, Slow, UserData(&calls), TIME_PERIODIC | TIME_KILL_SYNCHRONOUS);
        ASSERT_NE(id, 0u);
        EXPECT_TRUE(WaitForCalls(calls, 1));
        EXPECT_EQ(timeKillEvent(id), noError);
        EXPECT_FALSE(calls.running.load()) << "round " << round;
        int fired = calls.count;
        PassTimerThread(100);
        EXPECT_EQ(calls.count.load(), fired) << "round " << round;
    }
}

namespace {

struct SelfKill : Calls {
    std::atomic<MMRESULT> killed{0xFFFF};
};

void CALLBACK KillOnThirdCall(UINT timerId, UINT, DWORD_PTR user, DWORD_PTR, DWORD_PTR) {
    SelfKill* calls = reinterpret_cast<SelfKill*>(user);
    if (++calls->count == 3) {
        calls->killed = timeKillEvent(timerId);
        SetEvent(calls->called.h);
    }
}

} // namespace

TEST(MultimediaTimerTest, ACallbackMayKillItsOwnPeriodicEvent) {
    SelfKill calls;
    UINT id = timeSetEvent(10, 0, KillOnThirdCall, UserData(&calls),
                           TIME_PERIODIC | TIME_KILL_SYNCHRONOUS);
    ASSERT_NE(id, 0u);
    ASSERT_TRUE(WaitForCalls(calls, 1)) << "the kill must not wait for its own callback";
    EXPECT_EQ(calls.killed.load(), noError);
    PassTimerThread(100);
    EXPECT_EQ(calls.count.load(), 3);
    ExpectKillRefused(id, "killed by its callback");
}

namespace {

struct Relay {
    UINT victim = 0;
    std::atomic<MMRESULT> killed{0xFFFF};
    std::atomic<UINT> spawned{0};
    Calls spawnedCalls;
};

void CALLBACK KillVictimAndSpawn(UINT, UINT, DWORD_PTR user, DWORD_PTR, DWORD_PTR) {
    Relay* relay = reinterpret_cast<Relay*>(user);
    relay->killed = timeKillEvent(relay->victim);
    relay->spawned = timeSetEvent(10, 0, Count, UserData(&relay->spawnedCalls), TIME_ONESHOT);
}

} // namespace

TEST(MultimediaTimerTest, ACallbackMaySetAndKillOtherEvents) {
    Calls victimCalls;
    Relay relay;
    relay.victim = timeSetEvent(longWait, 0, Count, UserData(&victimCalls),
                                TIME_ONESHOT | TIME_KILL_SYNCHRONOUS);
    ASSERT_NE(relay.victim, 0u);
    ASSERT_NE(timeSetEvent(10, 0, KillVictimAndSpawn, UserData(&relay), TIME_ONESHOT), 0u);
    ASSERT_TRUE(WaitForCalls(relay.spawnedCalls, 1));
    EXPECT_EQ(relay.killed.load(), noError);
    EXPECT_EQ(relay.spawnedCalls.timerId.load(), relay.spawned.load());
    ExpectKillRefused(relay.victim, "killed by another event's callback");
    EXPECT_EQ(victimCalls.count.load(), 0);
}

TEST(MultimediaTimerTest, AnEventHandleIsSetOrPulsed) {
    Handle event(CreateEventA(nullptr, FALSE, FALSE, nullptr));
    LPTIMECALLBACK target = reinterpret_cast<LPTIMECALLBACK>(event.h);
    ASSERT_NE(timeSetEvent(10, 0, target, 0, TIME_ONESHOT | TIME_CALLBACK_EVENT_SET), 0u);
    EXPECT_EQ(WaitForSingleObject(event.h, longWait), WAIT_OBJECT_0);

    UINT pulsing = timeSetEvent(10, 0, target, 0,
                                TIME_PERIODIC | TIME_CALLBACK_EVENT_PULSE | TIME_KILL_SYNCHRONOUS);
    ASSERT_NE(pulsing, 0u);
    EXPECT_EQ(WaitForSingleObject(event.h, longWait), WAIT_OBJECT_0) << "a pulse frees a waiter";
    PassTimerThread(50); // pulses with no one waiting
    EXPECT_EQ(timeKillEvent(pulsing), noError);
    EXPECT_EQ(WaitForSingleObject(event.h, 0), static_cast<DWORD>(WAIT_TIMEOUT))
        << "a pulse leaves the event reset";
}

TEST(MultimediaTimerTest, ADelayOutOfTheRangeIsRefused) {
    TIMECAPS caps = DeviceCaps();
    Calls calls;
    EXPECT_EQ(timeSetEvent(0, 0, Count, UserData(&calls), TIME_ONESHOT), 0u);
    EXPECT_EQ(timeSetEvent(0, 0, Count, UserData(&calls), TIME_PERIODIC), 0u);
    if (caps.wPeriodMax < UINT_MAX) {
        EXPECT_EQ(timeSetEvent(caps.wPeriodMax + 1, 0, Count, UserData(&calls), TIME_ONESHOT), 0u);
    }
    UINT longest = timeSetEvent(caps.wPeriodMax, 0, Count, UserData(&calls), TIME_ONESHOT);
    EXPECT_NE(longest, 0u);
    EXPECT_EQ(timeKillEvent(longest), noError);
}

#ifndef _WIN32
// Windows documents nothing for these (Wine accepts a null callback and
// would call it); here they are refused rather than crash the timer thread.
TEST(MultimediaTimerTest, ANullCallbackOrMixedKindsAreRefused) {
    Calls calls;
    EXPECT_EQ(timeSetEvent(10, 0, nullptr, 0, TIME_ONESHOT), 0u);
    EXPECT_EQ(timeSetEvent(10, 0, nullptr, 0, TIME_ONESHOT | TIME_CALLBACK_EVENT_SET), 0u);
    EXPECT_EQ(timeSetEvent(10, 0, Count, UserData(&calls),
                           TIME_CALLBACK_EVENT_SET | TIME_CALLBACK_EVENT_PULSE),
              0u);
    EXPECT_EQ(timeSetEvent(10, 0, Count, UserData(&calls), 0x8), 0u) << "an unknown flag";
    EXPECT_EQ(timeKillEvent(0), invalidParameter);
}

namespace {

struct Beats : Calls {
    std::mutex mutex;
    std::vector<double> times;
    double stallEnd = 0;
};

// The first call stalls for many periods.
void CALLBACK StallOnce(UINT, UINT, DWORD_PTR user, DWORD_PTR, DWORD_PTR) {
    Beats* beats = reinterpret_cast<Beats*>(user);
    std::lock_guard<std::mutex> lock(beats->mutex);
    beats->times.push_back(Milliseconds());
    if (beats->times.size() == 1) {
        Sleep(100);
        beats->stallEnd = Milliseconds();
    }
    if (beats->times.size() == 3)
        SetEvent(beats->called.h);
}

} // namespace

// How a late periodic event catches up is not documented for Windows: here
// the missed beats are dropped, so a stalled process gets no burst of calls.
TEST(MultimediaTimerTest, APeriodicEventThatFellBehindDoesNotBurst) {
    Beats beats;
    const UINT period = 10;
    UINT id = timeSetEvent(period, 0, StallOnce, UserData(&beats), TIME_PERIODIC);
    ASSERT_NE(id, 0u);
    EXPECT_TRUE(WaitForCalls(beats, 1));
    EXPECT_EQ(timeKillEvent(id), noError);
    std::lock_guard<std::mutex> lock(beats.mutex);
    ASSERT_GE(beats.times.size(), 3u);
    // The second call is late and comes at once; the beat starts again from
    // it, so the third is a period away instead of following immediately.
    EXPECT_GE(beats.times[2], beats.stallEnd + period - 1);
}
#endif

namespace {

#ifdef _WIN32
// Windows has given a process as few as 16 timer events at once, and so does
// Wine; one is left for the fence.
const int eventsAtOnce = 15;
#else
const int eventsAtOnce = 200;
#endif

struct Crowd {
    std::mutex mutex;
    std::vector<int> arrivals; // indices, in the order their callbacks ran
    std::size_t expected = 0;
    Handle allArrived{CreateEventA(nullptr, TRUE, FALSE, nullptr)};
};

struct Ticket {
    Crowd* crowd;
    int index;
};

void CALLBACK Arrive(UINT, UINT, DWORD_PTR user, DWORD_PTR, DWORD_PTR) {
    Ticket* ticket = reinterpret_cast<Ticket*>(user);
    Crowd* crowd = ticket->crowd;
    std::lock_guard<std::mutex> lock(crowd->mutex);
    crowd->arrivals.push_back(ticket->index);
    if (crowd->arrivals.size() == crowd->expected)
        SetEvent(crowd->allArrived.h);
}

// Sets `count` one-shots at random delays, all live at once, and checks that
// each fires once and that they fire in the order of their deadlines.
void FireCrowd(int count, std::mt19937& random, std::set<UINT>& ids) {
    Crowd crowd;
    crowd.expected = count;
    std::vector<Ticket> tickets(count);
    std::vector<UINT> set(count);
    // Each deadline lies between the clock read before and after its set.
    std::vector<double> earliest(count), latest(count);
    std::uniform_int_distribution<UINT> delays(1, 200);
    for (int i = 0; i < count; ++i) {
        tickets[i] = Ticket{&crowd, i};
        UINT delay = delays(random);
        earliest[i] = Milliseconds() + delay;
        set[i] = timeSetEvent(delay, 0, Arrive, UserData(&tickets[i]),
                              TIME_ONESHOT | TIME_KILL_SYNCHRONOUS);
        latest[i] = Milliseconds() + delay;
        EXPECT_NE(set[i], 0u) << "event " << i;
        ids.insert(set[i]);
    }
    EXPECT_EQ(WaitForSingleObject(crowd.allArrived.h, 3 * longWait), WAIT_OBJECT_0);
    // Whatever failed, no callback may outlive the tickets.
    for (UINT id : set)
        timeKillEvent(id);

    std::lock_guard<std::mutex> lock(crowd.mutex);
    std::vector<int> sorted = crowd.arrivals;
    std::sort(sorted.begin(), sorted.end());
    std::vector<int> all(count);
    std::iota(all.begin(), all.end(), 0);
    EXPECT_EQ(sorted, all) << "each event fired exactly once";
    // Windows keeps deadlines to its millisecond tick, hence the tolerance.
    const double tolerance = 16;
    for (std::size_t k = 1; k < crowd.arrivals.size(); ++k) {
        int before = crowd.arrivals[k - 1], after = crowd.arrivals[k];
        EXPECT_GE(latest[after] + tolerance, earliest[before])
            << "event " << after << " fired after event " << before;
    }
}

} // namespace

TEST(MultimediaTimerTest, ManyOneShotsFireOnceEachInDeadlineOrder) {
    const int total = 200;
    std::mt19937 random(20240607);
    std::set<UINT> ids;
    for (int done = 0; done < total; done += eventsAtOnce)
        FireCrowd(std::min(eventsAtOnce, total - done), random, ids);
    EXPECT_EQ(ids.size(), std::size_t(total)) << "identifiers are distinct";
    EXPECT_EQ(ids.count(0), 0u);
}

namespace {

struct Racer : Calls {
    std::atomic<UINT> id{0};
    std::atomic<MMRESULT> killed{0xFFFF};
};

} // namespace

TEST(MultimediaTimerTest, ThreadsMaySetAndKillEventsTogether) {
    const int threads = 3, perThread = eventsAtOnce / threads;
    std::vector<Racer> racers(threads * perThread);
    std::vector<std::thread> workers;
    for (int t = 0; t < threads; ++t) {
        workers.emplace_back([&racers, t] {
            for (int i = t * perThread; i < (t + 1) * perThread; ++i) {
                UINT id = timeSetEvent(1 + i % 20, 0, Count, UserData(&racers[i]),
                                       TIME_ONESHOT | TIME_KILL_SYNCHRONOUS);
                racers[i].id = id;
                if (id != 0 && i % 2 == 0)
                    racers[i].killed = timeKillEvent(id);
            }
        });
    }
    for (std::thread& worker : workers)
        worker.join();
    PassTimerThread(100);
    // Wine hands a fired event's identifier to the next event set, so a kill
    // from one thread may end another thread's event: there only "at most
    // once" holds.
    const bool wine = vaskel_test::RunningOnWine();
    for (std::size_t i = 0; i < racers.size(); ++i) {
        EXPECT_NE(racers[i].id.load(), 0u) << "event " << i;
        EXPECT_LE(racers[i].count.load(), 1) << "event " << i;
        // A kill succeeds exactly when it came before the callback.
        int expected = racers[i].killed == noError ? 0 : 1;
        if (!wine) {
            EXPECT_EQ(racers[i].count.load(), expected) << "event " << i;
        }
    }
}

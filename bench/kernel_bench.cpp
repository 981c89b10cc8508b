// Kernel synchronisation against the standard library, in pairs run in the
// same process so that the ratio reads off directly:
//   PingPong      a round trip between two threads through two auto-reset
//                 events, against std::mutex with std::condition_variable
//   CriticalSection  an uncontended enter and leave, against
//                 std::recursive_mutex lock and unlock
#include <vaskel/win32.h>

#include <benchmark/benchmark.h>

#include <atomic>
#include <condition_variable>
#include <mutex>
#include <thread>

namespace {

void BM_PingPong_Event(benchmark::State& state) {
    HANDLE ping = CreateEventA(nullptr, FALSE, FALSE, nullptr);
    HANDLE pong = CreateEventA(nullptr, FALSE, FALSE, nullptr);
    std::atomic<bool> stop{false};
    std::thread partner([&] {
        for (;;) {
            WaitForSingleObject(ping, INFINITE);
            if (stop)
                break;
            SetEvent(pong);
        }
    });
    for (auto _ : state) {
        SetEvent(ping);
        WaitForSingleObject(pong, INFINITE);
    }
    stop = true;
    SetEvent(ping);
    partner.join();
    CloseHandle(ping);
    CloseHandle(pong);
}

// The same protocol with a flag per direction, as one would write it with
// the standard library.
struct Signal {
    void Set() {
        {
            std::lock_guard<std::mutex> lock(mutex);
            set = true;
        }
        changed.notify_one();
    }
    void Wait() {
        std::unique_lock<std::mutex> lock(mutex);
        changed.wait(lock, [this] { return set; });
        set = false;
    }
    std::mutex mutex;
    std::condition_variable changed;
    bool set = false;
};

void BM_PingPong_ConditionVariable(benchmark::State& state) {
    Signal ping, pong;
    std::atomic<bool> stop{false};
    std::thread partner([&] {
        for (;;) {
            ping.Wait();
            if (stop)
                break;
            pong.Set();
        }
    });
    for (auto _ : state) {
        ping.Set();
        pong.Wait();
    }
    stop = true;
    ping.Set();
    partner.join();
}

BENCHMARK(BM_PingPong_Event)->UseRealTime();
BENCHMARK(BM_PingPong_ConditionVariable)->UseRealTime();

void BM_CriticalSection_Enter(benchmark::State& state) {
    CRITICAL_SECTION section;
    InitializeCriticalSection(&section);
    for (auto _ : state) {
        EnterCriticalSection(&section);
        LeaveCriticalSection(&section);
    }
    DeleteCriticalSection(&section);
}

void BM_CriticalSection_RecursiveMutex(benchmark::State& state) {
    std::recursive_mutex mutex;
    for (auto _ : state) {
        mutex.lock();
        mutex.unlock();
    }
}

BENCHMARK(BM_CriticalSection_Enter);
BENCHMARK(BM_CriticalSection_RecursiveMutex);

} // namespace

BENCHMARK_MAIN();

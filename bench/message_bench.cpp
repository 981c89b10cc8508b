// Messages between threads against standard-library hand-offs, in pairs run
// in the same process so that the ratio reads off directly:
//   Post    one thread posts to a window, its owner takes each message with
//           GetMessageA and dispatches it; against a std::mutex +
//           std::deque + std::condition_variable queue doing the same
//   Send    a cross-thread SendMessageA round trip; against a
//           condition-variable ping-pong
#include "ping_pong.h"

#include <vaskel/win32.h>

#include <benchmark/benchmark.h>

#include <atomic>
#include <condition_variable>
#include <deque>
#include <mutex>
#include <thread>

namespace {

std::atomic<long> handled{0};

LRESULT CALLBACK Counting(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == WM_USER) {
        handled.fetch_add(1, std::memory_order_relaxed);
        return static_cast<LRESULT>(wParam) + 1;
    }
    return DefWindowProcA(window, message, wParam, lParam);
}

// A window on its own thread running a message loop until WM_QUIT.
class WindowThread {
public:
    WindowThread() {
        static ATOM atom = [] {
            WNDCLASSEXA info = {};
            info.cbSize = sizeof info;
            info.lpfnWndProc = Counting;
            info.lpszClassName = "VaskelBenchWindow";
            return RegisterClassExA(&info);
        }();
        (void)atom;
        m_thread = std::thread([this] {
            HWND window = CreateWindowExA(0, "VaskelBenchWindow", nullptr, WS_CHILD, 0, 0, 0, 0,
                                          HWND_MESSAGE, nullptr, nullptr, nullptr);
            m_window.store(window);
            MSG msg;
            while (GetMessageA(&msg, nullptr, 0, 0) > 0)
                DispatchMessageA(&msg);
            DestroyWindow(window);
        });
        while (!m_window.load())
            std::this_thread::yield();
    }
    ~WindowThread() {
        PostThreadMessageA(GetWindowThreadProcessId(m_window, nullptr), WM_QUIT, 0, 0);
        m_thread.join();
    }
    HWND Window() const { return m_window; }

private:
    std::atomic<HWND> m_window{nullptr};
    std::thread m_thread;
};

const long batch = 10000;

void BM_Post_Window(benchmark::State& state) {
    WindowThread target;
    for (auto _ : state) {
        long goal = handled.load() + batch;
        for (long i = 0; i < batch; ++i)
            PostMessageA(target.Window(), WM_USER, 0, i);
        while (handled.load() < goal)
            std::this_thread::yield();
    }
    state.SetItemsProcessed(state.iterations() * batch);
}

void BM_Post_StdQueue(benchmark::State& state) {
    std::mutex mutex;
    std::condition_variable arrived;
    std::deque<long> queue;
    std::atomic<long> taken{0};
    bool stop = false;
    std::thread consumer([&] {
        for (;;) {
            std::unique_lock<std::mutex> lock(mutex);
            arrived.wait(lock, [&] { return stop || !queue.empty(); });
            if (queue.empty())
                return;
            long value = queue.front();
            queue.pop_front();
            lock.unlock();
            benchmark::DoNotOptimize(value);
            taken.fetch_add(1, std::memory_order_relaxed);
        }
    });
    for (auto _ : state) {
        long goal = taken.load() + batch;
        for (long i = 0; i < batch; ++i) {
            {
                std::lock_guard<std::mutex> lock(mutex);
                queue.push_back(i);
            }
            arrived.notify_one();
        }
        while (taken.load() < goal)
            std::this_thread::yield();
    }
    {
        std::lock_guard<std::mutex> lock(mutex);
        stop = true;
    }
    arrived.notify_one();
    consumer.join();
    state.SetItemsProcessed(state.iterations() * batch);
}

BENCHMARK(BM_Post_Window)->UseRealTime();
BENCHMARK(BM_Post_StdQueue)->UseRealTime();

void BM_Send_Window(benchmark::State& state) {
    WindowThread target;
    WPARAM value = 0;
    for (auto _ : state)
        value = static_cast<WPARAM>(SendMessageA(target.Window(), WM_USER, value, 0));
    benchmark::DoNotOptimize(value);
}

void BM_Send_ConditionVariable(benchmark::State& state) {
    ConditionVariablePingPong(state);
}

BENCHMARK(BM_Send_Window)->UseRealTime();
BENCHMARK(BM_Send_ConditionVariable)->UseRealTime();

} // namespace

BENCHMARK_MAIN();

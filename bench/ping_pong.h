// The reference for cross-thread round trips: a request and its reply handed
// over with one mutex and one condition variable.
#pragma once

#include <benchmark/benchmark.h>

#include <condition_variable>
#include <mutex>
#include <thread>

inline void ConditionVariablePingPong(benchmark::State& state) {
    std::mutex mutex;
    std::condition_variable changed;
    bool request = false, reply = false, stop = false;
    long value = 0;
    std::thread partner([&] {
        std::unique_lock<std::mutex> lock(mutex);
        for (;;) {
            changed.wait(lock, [&] { return request || stop; });
            if (stop)
                return;
            request = false;
            ++value;
            reply = true;
            changed.notify_all();
        }
    });
    for (auto _ : state) {
        std::unique_lock<std::mutex> lock(mutex);
        request = true;
        changed.notify_all();
        changed.wait(lock, [&] { return reply; });
        reply = false;
    }
    {
        std::lock_guard<std::mutex> lock(mutex);
        stop = true;
    }
    changed.notify_all();
    partner.join();
}

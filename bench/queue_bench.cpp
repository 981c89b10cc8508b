// Command queues against Boost.Asio and the standard library, in pairs run
// in the same process so that the ratio reads off directly:
//   Queue   one thread queues commands, a queue thread runs them; against
//           io_context::post with run() on another thread
//   Send    a synchronous SendCmd round trip to a queue thread; against a
//           condition-variable ping-pong
#include "ping_pong.h"

#include <vaskel/queue.h>

#include <benchmark/benchmark.h>
#include <boost/asio/executor_work_guard.hpp>
#include <boost/asio/io_context.hpp>
#include <boost/asio/post.hpp>

#include <atomic>
#include <thread>

namespace {

const long batch = 10000;

struct CountingCmd : vaskel::CVKAsyncCmd {
    explicit CountingCmd(std::atomic<long>* done) : done(done) {}
    void Execute() override { done->fetch_add(1, std::memory_order_relaxed); }
    std::atomic<long>* done;
};

void WaitFor(const std::atomic<long>& done, long goal) {
    while (done.load() < goal)
        std::this_thread::yield();
}

void BM_Queue_CmdQueueThread(benchmark::State& state) {
    vaskel::CVKAsyncCmdQueueThread worker;
    worker.Create();
    std::atomic<long> done{0};
    for (auto _ : state) {
        long goal = done.load() + batch;
        for (long i = 0; i < batch; ++i)
            worker.QueueCmd(new CountingCmd(&done), 0);
        WaitFor(done, goal);
    }
    worker.Destroy(true);
    state.SetItemsProcessed(state.iterations() * batch);
}

void BM_Queue_AsioPost(benchmark::State& state) {
    boost::asio::io_context context;
    auto guard = boost::asio::make_work_guard(context);
    std::thread runner([&] { context.run(); });
    std::atomic<long> done{0};
    for (auto _ : state) {
        long goal = done.load() + batch;
        for (long i = 0; i < batch; ++i)
            boost::asio::post(context, [&done] { done.fetch_add(1, std::memory_order_relaxed); });
        WaitFor(done, goal);
    }
    guard.reset();
    runner.join();
    state.SetItemsProcessed(state.iterations() * batch);
}

BENCHMARK(BM_Queue_CmdQueueThread)->UseRealTime();
BENCHMARK(BM_Queue_AsioPost)->UseRealTime();

void BM_Send_CmdQueueThread(benchmark::State& state) {
    vaskel::CVKAsyncCmdQueueThread worker;
    worker.Create();
    std::atomic<long> done{0};
    CountingCmd cmd(&done);
    for (auto _ : state)
        worker.SendCmd(cmd);
    worker.Destroy(true);
}

void BM_Send_ConditionVariable(benchmark::State& state) {
    ConditionVariablePingPong(state);
}

BENCHMARK(BM_Send_CmdQueueThread)->UseRealTime();
BENCHMARK(BM_Send_ConditionVariable)->UseRealTime();

} // namespace

BENCHMARK_MAIN();

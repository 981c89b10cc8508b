// Setting and killing logical timers on one controller against the same
// inserts and erases on the pair of ordered sets the controller keeps.
#include <vaskel/timer.h>

#include <benchmark/benchmark.h>

#include <algorithm>
#include <random>
#include <set>
#include <vector>

namespace {

const int kTimers = 100000;

struct Listener : vaskel::ITimerEvents {};

// Periods in random order, so that the earliest timer changes now and then
// as it would in use; kills in another random order.
struct Workload {
    Workload() : periods(kTimers), killOrder(kTimers) {
        std::mt19937 random(11);
        std::uniform_int_distribution<DWORD> period(600000, 3600000);
        for (int i = 0; i < kTimers; ++i) {
            periods[i] = period(random);
            killOrder[i] = static_cast<DWORD>(i);
        }
        std::shuffle(killOrder.begin(), killOrder.end(), random);
    }
    std::vector<DWORD> periods;
    std::vector<DWORD> killOrder;
};

const Workload& Work() {
    static const Workload work;
    return work;
}

void BM_ControllerSetAndKill(benchmark::State& state) {
    const Workload& work = Work();
    vaskel::CTimerController controller;
    controller.Create();
    Listener listener;
    for (auto _ : state) {
        for (int i = 0; i < kTimers; ++i)
            controller.SetTimer(&listener, static_cast<DWORD>(i), work.periods[i], false);
        for (DWORD id : work.killOrder)
            controller.KillTimer(&listener, id);
        benchmark::DoNotOptimize(controller.GetSize());
    }
    state.SetItemsProcessed(state.iterations() * kTimers);
}
BENCHMARK(BM_ControllerSetAndKill)->Unit(benchmark::kMillisecond);

struct Entry {
    const void* target;
    DWORD id;
    LONGLONG due;
    bool operator<(const Entry& other) const {
        return target != other.target ? target < other.target : id < other.id;
    }
};

struct ByDue {
    bool operator()(const Entry* a, const Entry* b) const { return a->due < b->due; }
};

void BM_SetAndMultisetReference(benchmark::State& state) {
    const Workload& work = Work();
    Listener listener;
    std::set<Entry> byIdentity;
    std::multiset<const Entry*, ByDue> byDue;
    for (auto _ : state) {
        for (int i = 0; i < kTimers; ++i) {
            auto stored = byIdentity.insert(Entry{&listener, static_cast<DWORD>(i), work.periods[i]});
            byDue.insert(&*stored.first);
        }
        for (DWORD id : work.killOrder) {
            auto found = byIdentity.find(Entry{&listener, id, 0});
            auto range = byDue.equal_range(&*found);
            byDue.erase(std::find(range.first, range.second, &*found));
            byIdentity.erase(found);
        }
        benchmark::DoNotOptimize(byIdentity.size());
    }
    state.SetItemsProcessed(state.iterations() * kTimers);
}
BENCHMARK(BM_SetAndMultisetReference)->Unit(benchmark::kMillisecond);

} // namespace

BENCHMARK_MAIN();

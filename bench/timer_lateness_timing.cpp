// How late the timer controller delivers: 1000 one-shot timers at random
// delays up to 2 s, lateness measured on the millisecond counter the
// controller schedules by. A plain program, so that Windows builds run it too.
#include <vaskel/timer.h>

#include <algorithm>
#include <cstdio>
#include <random>
#include <vector>

namespace {

const int kTimers = 1000;

struct Recorder : vaskel::ITimerEvents {
    void OnTimeElapsed(DWORD eventId) override {
        lateness.push_back(static_cast<LONG>(timeGetTime() - due[eventId]));
    }
    std::vector<DWORD> due;
    std::vector<LONG> lateness;
};

} // namespace

int main() {
    vaskel::CTimerController controller;
    if (!controller.Create())
        return 1;
    Recorder recorder;
    recorder.due.resize(kTimers);
    std::mt19937 random(3);
    std::uniform_int_distribution<DWORD> delay(1, 2000);
    for (DWORD i = 0; i < kTimers; ++i) {
        const DWORD ms = delay(random);
        recorder.due[i] = timeGetTime() + ms;
        controller.SetTimer(&recorder, i, ms, true);
    }
    const DWORD start = timeGetTime();
    while (recorder.lateness.size() < kTimers && timeGetTime() - start < 20000) {
        MsgWaitForMultipleObjects(0, nullptr, FALSE, 100, QS_ALLINPUT);
        MSG msg;
        while (PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE))
            DispatchMessageA(&msg);
    }
    std::vector<LONG> lateness = recorder.lateness;
    if (lateness.size() != kTimers) {
        std::printf("only %u of %d timers fired\n", static_cast<unsigned>(lateness.size()), kTimers);
        return 1;
    }
    std::sort(lateness.begin(), lateness.end());
    std::printf("lateness of %d one-shot timers: median %ld ms, 99th percentile %ld ms, "
                "earliest %ld ms, latest %ld ms\n",
                kTimers, static_cast<long>(lateness[kTimers / 2]),
                static_cast<long>(lateness[kTimers * 99 / 100]), static_cast<long>(lateness.front()),
                static_cast<long>(lateness.back()));
    return lateness.front() < 0 ? 1 : 0;
}

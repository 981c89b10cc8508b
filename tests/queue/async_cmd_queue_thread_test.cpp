#include <vaskel/queue.h>
#include <vaskel/sync.h>

#include <gtest/gtest.h>

#include <atomic>
#include <memory>
#include <thread>
#include <vector>

using namespace vaskel;

namespace {

// Counts what happens to it; the counts are read on other threads.
struct CountedCmd : CVKAsyncCmd {
    void Execute() override {
        ++executed;
        ranOnQueueThread = owner && owner->IsInThreadCtx();
    }
    void Canceled() override { ++canceled; }
    std::atomic<int> executed{0}, canceled{0};
    std::atomic<bool> ranOnQueueThread{false};
    CVKAsyncCmdQueueThread* owner = nullptr;
};

// Blocks the queue thread until released.
struct GateCmd : CVKAsyncCmd {
    void Execute() override {
        entered.SetEvent();
        release.Lock(INFINITE);
    }
    CVKEvent entered{false, true}, release{false, true};
};

} // namespace

TEST(CVKAsyncCmdQueueThreadTest, CommandsRunOnTheQueueThreadOnceCreateReturns) {
    CVKAsyncCmdQueueThread thread(2);
    thread.SetQueueName("worker"); // naming has no effect
    ASSERT_TRUE(thread.Create());
    EXPECT_TRUE(thread.Created());
    EXPECT_TRUE(thread.IsAlive());
    EXPECT_FALSE(thread.IsInThreadCtx());
    CountedCmd cmd;
    cmd.owner = &thread;
    thread.SendCmd(cmd);
    EXPECT_EQ(cmd.executed, 1);
    EXPECT_TRUE(cmd.ranOnQueueThread);
    thread.Destroy(false);
    EXPECT_FALSE(thread.Created());
    EXPECT_FALSE(thread.IsAlive());
    EXPECT_FALSE(thread.Create(CREATE_SUSPENDED)) << "a suspended start is refused";
}

TEST(CVKAsyncCmdQueueThreadTest, DestroyRunsWhatWasQueuedOrCancelsItAll) {
    for (bool cancelPending : {false, true}) {
        CVKAsyncCmdQueueThread thread;
        ASSERT_TRUE(thread.Create());
        GateCmd gate;
        thread.QueueStaticCmd(gate, 0);
        gate.entered.Lock(INFINITE);
        std::vector<CountedCmd> cmds(20);
        for (auto& cmd : cmds)
            thread.QueueStaticCmd(cmd, 0);
        std::thread opener([&] {
            Sleep(20);
            gate.release.SetEvent();
        });
        if (cancelPending)
            thread.AddQueueLock(); // keeps them pending until Destroy empties the queue
        thread.Destroy(cancelPending);
        opener.join();
        for (auto& cmd : cmds) {
            EXPECT_EQ(cmd.executed + cmd.canceled, 1) << "told exactly once";
            EXPECT_EQ(cmd.executed, cancelPending ? 0 : 1);
        }
    }
}

TEST(CVKAsyncCmdQueueThreadTest, SendersBlockedOnADestroyedQueueAllReturn) {
    CVKAsyncCmdQueueThread thread;
    ASSERT_TRUE(thread.Create());
    thread.AddQueueLock();
    std::vector<CountedCmd> cmds(3);
    std::vector<std::thread> senders;
    for (auto& cmd : cmds)
        senders.emplace_back([&] { thread.QueueSyncCmd(cmd, 0, false); });
    while (thread.GetQueueSize() < cmds.size())
        Sleep(1);
    thread.Destroy(true);
    for (auto& sender : senders)
        sender.join();
    for (auto& cmd : cmds)
        EXPECT_EQ(cmd.canceled, 1);
}

TEST(CVKAsyncCmdQueueThreadTest, SelfDeletingObjectsAndConcurrentCreation) {
    static std::atomic<int> deletions{0};
    struct Tracked : CVKAsyncCmdQueueThread {
        ~Tracked() override { ++deletions; }
    };
    CVKAsyncCmdQueueThread::DestroyThread(new Tracked, false);
    EXPECT_EQ(deletions, 1) << "never started: deleted at once";

    Tracked* first = new Tracked;
    Tracked* second = new Tracked;
    std::atomic<int> created{0};
    std::thread a([&] { created += first->Create(); });
    std::thread b([&] { created += second->Create(); });
    a.join();
    b.join();
    EXPECT_EQ(created, 2);
    // They delete themselves when their threads end; wait through duplicates.
    HANDLE ends[2];
    DuplicateHandle(GetCurrentProcess(), first->m_hThread, GetCurrentProcess(), &ends[0], 0, FALSE,
                    DUPLICATE_SAME_ACCESS);
    DuplicateHandle(GetCurrentProcess(), second->m_hThread, GetCurrentProcess(), &ends[1], 0, FALSE,
                    DUPLICATE_SAME_ACCESS);
    CVKAsyncCmdQueueThread::DestroyThread(first, false);
    CVKAsyncCmdQueueThread::DestroyThread(second, true);
    EXPECT_EQ(WaitForMultipleObjects(2, ends, TRUE, 30000), WAIT_OBJECT_0);
    CloseHandle(ends[0]);
    CloseHandle(ends[1]);
    for (int i = 0; i < 3000 && deletions < 3; ++i)
        Sleep(1); // the objects go just after their threads' last step
    EXPECT_EQ(deletions, 3);
}

TEST(CVKAsyncCmdQueueThreadTest, ManyProducersEveryCommandToldExactlyOnce) {
#ifdef _WIN32
    const int perProducer = 5000; // one message per command is slow under Wine
#else
    const int perProducer = 250000;
#endif
    const int producers = 4;
    const int total = producers * perProducer;
    std::unique_ptr<std::atomic<unsigned char>[]> executed(new std::atomic<unsigned char>[total]());
    std::unique_ptr<std::atomic<unsigned char>[]> canceled(new std::atomic<unsigned char>[total]());
    struct Marked : CVKAsyncCmd {
        void Execute() override { ++executed[id]; }
        void Canceled() override { ++canceled[id]; }
        std::atomic<unsigned char>* executed;
        std::atomic<unsigned char>* canceled;
        int id = 0;
    };
    std::vector<Marked> statics(total / 4);
    for (int phase = 0; phase < 2; ++phase) { // run it all, then destroy under load
        for (int i = 0; i < total; ++i)
            executed[i] = canceled[i] = 0;
        CVKAsyncCmdQueueThread thread(3);
        ASSERT_TRUE(thread.Create());
        std::vector<std::thread> threads;
        for (int p = 0; p < producers; ++p)
            threads.emplace_back([&, p] {
                for (int i = p * perProducer; i < (p + 1) * perProducer; ++i) {
                    DWORD priority = static_cast<DWORD>(i % 3);
                    if (i % 4 == 0) {
                        Marked& cmd = statics[i / 4];
                        cmd.executed = executed.get();
                        cmd.canceled = canceled.get();
                        cmd.id = i;
                        if (i % 4000 == 0) {
                            thread.QueueSyncCmd(cmd, priority, false);
                        } else {
                            thread.QueueStaticCmd(cmd, priority);
                        }
                    } else {
                        auto* cmd = new Marked;
                        cmd->executed = executed.get();
                        cmd->canceled = canceled.get();
                        cmd->id = i;
                        thread.QueueCmd(cmd, priority);
                    }
                }
            });
        for (auto& t : threads)
            t.join();
        thread.Destroy(phase == 1);
        int wrong = 0, ran = 0;
        for (int i = 0; i < total; ++i) {
            wrong += executed[i] + canceled[i] != 1;
            ran += executed[i];
        }
        EXPECT_EQ(wrong, 0) << "phase " << phase;
        if (phase == 0) {
            EXPECT_EQ(ran, total);
        }
    }
}

#include <vaskel/diag.h>
#include <vaskel/queue.h>
#include <vaskel/sync.h>

#include <gtest/gtest.h>

#include <atomic>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

using namespace vaskel;

namespace {

// Records what happens to it in a shared log.
struct LoggedCmd : CVKAsyncCmd {
    LoggedCmd(std::string* log, char name, int* deaths = nullptr)
        : log(log), name(name), deaths(deaths) {}
    ~LoggedCmd() override {
        if (deaths)
            ++*deaths;
    }
    void Execute() override { *log += name; }
    void Canceled() override { *log += '-', *log += name; }
    std::string* log;
    char name;
    int* deaths;
};

struct FunctionCmd : CVKAsyncCmd {
    explicit FunctionCmd(std::function<void()> run) : run(std::move(run)) {}
    void Execute() override { run(); }
    void Canceled() override { ++cancels; }
    std::function<void()> run;
    std::atomic<int> cancels{0};
};

// Dispatches this thread's waiting messages; returns how many.
int Pump() {
    MSG msg;
    int count = 0;
    while (PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE)) {
        DispatchMessageA(&msg);
        ++count;
    }
    return count;
}

} // namespace

TEST(CVKAsyncCmdQueueTest, PrioritiesAndTheSendLevel) {
    EXPECT_EQ(CVKAsyncCmdQueue(0).GetPriorities(), 1u);
    CVKAsyncCmdQueue queue(3);
    ASSERT_TRUE(queue.Create());
    std::string log;
    int deaths = 0;
    EXPECT_THROW(queue.QueueCmd(new LoggedCmd(&log, 'x', &deaths), 3), unexpected_error);
    EXPECT_EQ(deaths, 1) << "a refused command handed over is deleted";
    EXPECT_THROW(queue.GetQueueSize(3), unexpected_error);
    EXPECT_THROW(queue.EmptyQueue(3), unexpected_error);
    old_auto_ptr<CVKAsyncCmd> kept(new LoggedCmd(&log, 'k'));
    EXPECT_THROW(queue.QueueCmd(kept, 7), unexpected_error);
    EXPECT_TRUE(kept.owns()) << "the caller keeps what was refused";

    for (DWORD priority : {2u, 0u, 1u, 0u})
        queue.QueueCmd(new LoggedCmd(&log, static_cast<char>('0' + priority)), priority);
    queue.QueueCmd(new LoggedCmd(&log, 's'), CVKAsyncCmdQueue::SendLevelPriority);
    EXPECT_EQ(queue.GetQueueSize(0), 2u);
    EXPECT_EQ(queue.GetQueueSize(CVKAsyncCmdQueue::SendLevelPriority), 1u);
    EXPECT_EQ(queue.GetQueueSize(), 5u);
    EXPECT_EQ(queue.CalcQueueSize(), 5u);
    queue.ProcessEntireQueue();
    EXPECT_EQ(log, "s0012");
    EXPECT_TRUE(queue.CalcIsQueueEmpty());
    Pump();
}

TEST(CVKAsyncCmdQueueTest, OneCommandPerProcessingMessage) {
    CVKAsyncCmdQueue queue;
    ASSERT_TRUE(queue.Create());
    std::string log;
    LoggedCmd a(&log, 'a'), b(&log, 'b');
    queue.QueueStaticCmd(a, 0);
    queue.QueueStaticCmd(b, 0);
    MSG msg;
    ASSERT_TRUE(PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE));
    DispatchMessageA(&msg);
    EXPECT_EQ(log, "a");
    EXPECT_EQ(Pump(), 1) << "one message in flight at a time";
    EXPECT_EQ(log, "ab");
}

TEST(CVKAsyncCmdQueueTest, EmptyingCancelsEachCommandOnceAndDeletesOnlyOwnedOnes) {
    CVKAsyncCmdQueue queue(2);
    ASSERT_TRUE(queue.Create());
    std::string log;
    int deaths = 0;
    LoggedCmd still(&log, 's', &deaths);
    queue.QueueStaticCmd(still, 1);
    queue.QueueCmd(new LoggedCmd(&log, 'o', &deaths), 0);
    queue.QueueCmd(new LoggedCmd(&log, 'p', &deaths), 1);
    queue.EmptyQueue(1);
    EXPECT_EQ(log, "-s-p");
    EXPECT_EQ(deaths, 1);
    queue.EmptyQueue();
    EXPECT_EQ(log, "-s-p-o");
    EXPECT_EQ(deaths, 2);
    EXPECT_EQ(queue.GetQueueSize(), 0u);
    EXPECT_EQ(Pump(), 1) << "the message in flight finds nothing";
    EXPECT_EQ(log, "-s-p-o");
}

TEST(CVKAsyncCmdQueueTest, QueueLocksLetOnlyTheSendLevelRun) {
    CVKAsyncCmdQueue queue;
    ASSERT_TRUE(queue.Create());
    std::string log;
    LoggedCmd ordinary(&log, 'o'), sent(&log, 's');
    EXPECT_EQ(queue.ReleaseQueueLock(), 0u);
    EXPECT_EQ(queue.AddQueueLock(), 1u);
    EXPECT_EQ(queue.AddQueueLock(), 2u);
    EXPECT_EQ(queue.ReleaseQueueLock(), 1u);
    EXPECT_TRUE(queue.IsQueueLocked());
    queue.QueueStaticCmd(ordinary, 0);
    std::thread sender([&] { queue.SendCmd(sent); }); // returns while locked
    while (log.empty()) // the sender's command arrives through a message
        Pump();
    sender.join();
    EXPECT_EQ(log, "s");
    EXPECT_EQ(queue.ReleaseQueueLock(), 0u);
    Pump();
    EXPECT_EQ(log, "so") << "the last release restarts processing";
}

TEST(CVKAsyncCmdQueueTest, ACommandMayDestroyItsQueue) {
    auto* queue = new CVKAsyncCmdQueue;
    ASSERT_TRUE(queue->Create());
    std::string log;
    FunctionCmd destroy([&] { delete queue; });
    LoggedCmd after(&log, 'a');
    queue->QueueStaticCmd(destroy, 0);
    queue->QueueStaticCmd(after, 0);
    Pump();
    EXPECT_EQ(log, "-a") << "the rest was cancelled by the destructor, and nothing ran after";
}

TEST(CVKAsyncCmdQueueTest, ANestedMessageLoopDoesNotRunTheNextCommand) {
    CVKAsyncCmdQueue queue;
    ASSERT_TRUE(queue.Create());
    std::string log;
    LoggedCmd next(&log, 'n');
    FunctionCmd modal([&] {
        log += '[';
        queue.QueueStaticCmd(next, 0);
        Pump(); // a modal loop inside the command
        log += ']';
    });
    queue.QueueStaticCmd(modal, 0);
    Pump();
    EXPECT_EQ(log, "[]n");
}

TEST(CVKAsyncCmdQueueTest, WaitingForEmptinessOnItsOwnThreadRunsEverything) {
    CVKAsyncCmdQueue queue;
    ASSERT_TRUE(queue.Create());
    std::string log;
    LoggedCmd a(&log, 'a'), b(&log, 'b');
    queue.QueueStaticCmd(a, 0);
    queue.QueueStaticCmd(b, 0);
    queue.WaitUntilQueueIsEmpty();
    EXPECT_EQ(log, "ab");
    Pump();
}

TEST(CVKAsyncCmdQueueTest, AFailingCommandLeavesTheQueueWorking) {
    CVKAsyncCmdQueue queue;
    ASSERT_TRUE(queue.Create());
    int deaths = 0;
    struct Throwing : LoggedCmd {
        using LoggedCmd::LoggedCmd;
        void Execute() override { throw std::runtime_error("fails"); }
    };
    std::string log;
    queue.QueueCmd(new Throwing(&log, 't', &deaths), 0);
    EXPECT_THROW(queue.ProcessQueue(), std::runtime_error);
    EXPECT_EQ(deaths, 1) << "the owned command was deleted on the way out";
    EXPECT_EQ(queue.GetQueueSize(), 0u);
    LoggedCmd next(&log, 'n');
    queue.QueueStaticCmd(next, 0);
    Pump();
    EXPECT_EQ(log, "n");
}

TEST(CVKAsyncCmdQueueTest, ASenderWhoseWaitIsAbortedWithdrawsItsCommand) {
    CVKAsyncCmdQueue queue;
    ASSERT_TRUE(queue.Create());
    queue.AddQueueLock(); // nothing below the send level runs
    std::string log;
    LoggedCmd cmd(&log, 'c');
    std::thread sender([&] {
        PostAbortWaitingLoopMessage(0); // the sender's own wait will end at once
        queue.QueueSyncCmd(cmd, 0, true);
    });
    sender.join();
    EXPECT_EQ(log, "-c") << "withdrawn and cancelled, once";
    EXPECT_EQ(queue.CalcQueueSize(), 0u) << "no pointer to the sender's stack stays behind";
    queue.ReleaseQueueLock();
    Pump();
    EXPECT_EQ(log, "-c");
}

TEST(CVKAsyncCmdQueueTest, SendingWithAnEventReturnsAtOnce) {
    CVKAsyncCmdQueue queue;
    ASSERT_TRUE(queue.Create());
    std::string log;
    LoggedCmd cmd(&log, 'c');
    CVKEvent done(true, true); // set: SendCmd resets it
    queue.SendCmd(cmd, static_cast<void*>(done));
    EXPECT_FALSE(done.Lock(0));
    Pump();
    EXPECT_TRUE(done.Lock(0));
    EXPECT_EQ(log, "c");
}

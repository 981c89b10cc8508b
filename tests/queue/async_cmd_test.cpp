#include "queue/sync_async_cmd.h"

#include <gtest/gtest.h>

#include <map>
#include <stdexcept>

using vaskel::CVKAsyncCmd;

namespace {

// An event vocabulary that records which handles were set.
struct RecordingEvents {
    static std::map<void*, int>& Sets() {
        static std::map<void*, int> sets;
        return sets;
    }
    static bool SetEvent(void* handle) {
        ++Sets()[handle];
        return handle != nullptr;
    }
};

struct CountingCmd : CVKAsyncCmd {
    void Execute() override { ++executed; }
    void Canceled() override { ++canceled; }
    int executed = 0;
    int canceled = 0;
};

struct WorkOnlyCmd : CVKAsyncCmd {
    void Execute() override {}
};

// Throws, and records whether the event was already set when it did.
struct ThrowingCmd : CVKAsyncCmd {
    explicit ThrowingCmd(void* event) : event(event) {}
    void Execute() override { throw std::runtime_error("execute"); }
    void Canceled() override { throw std::logic_error("cancel"); }
    void* event;
};

class SyncAsyncCmdTest : public ::testing::Test {
protected:
    void SetUp() override { RecordingEvents::Sets().clear(); }
    int SetCount(void* handle) { return RecordingEvents::Sets()[handle]; }
    int event = 0; // its address serves as the handle
    void* handle = &event;
};

} // namespace

TEST(CVKAsyncCmd, CancelingACommandWithoutItsOwnCanceledDoesNothing) {
    WorkOnlyCmd cmd;
    CVKAsyncCmd& base = cmd;
    base.Canceled();
    base.Execute();
}

TEST_F(SyncAsyncCmdTest, ExecuteRunsTheWrappedCommandThenSetsTheEvent) {
    CountingCmd inner;
    vaskel::CVKSyncAsyncCmd<RecordingEvents> wrapper(handle, &inner);
    wrapper.Execute();
    EXPECT_EQ(inner.executed, 1);
    EXPECT_EQ(inner.canceled, 0);
    EXPECT_EQ(SetCount(handle), 1);
}

TEST_F(SyncAsyncCmdTest, CanceledCancelsTheWrappedCommandThenSetsTheEvent) {
    CountingCmd inner;
    vaskel::CVKSyncAsyncCmd<RecordingEvents> wrapper(handle, &inner);
    wrapper.Canceled();
    EXPECT_EQ(inner.executed, 0);
    EXPECT_EQ(inner.canceled, 1);
    EXPECT_EQ(SetCount(handle), 1);
}

TEST_F(SyncAsyncCmdTest, AFailingCommandReleasesTheSenderBeforeTheExceptionArrives) {
    ThrowingCmd inner(handle);
    vaskel::CVKSyncAsyncCmd<RecordingEvents> wrapper(handle, &inner);
    try {
        wrapper.Execute();
        FAIL() << "the exception was swallowed";
    } catch (const std::runtime_error& error) {
        EXPECT_STREQ(error.what(), "execute");
        EXPECT_EQ(SetCount(handle), 1);
    }
    try {
        wrapper.Canceled();
        FAIL() << "the exception was swallowed";
    } catch (const std::logic_error& error) {
        EXPECT_STREQ(error.what(), "cancel");
        EXPECT_EQ(SetCount(handle), 2);
    }
}

TEST_F(SyncAsyncCmdTest, TheEmptyMarkerOnlySetsItsEvent) {
    vaskel::CVKEmptySyncAsyncCmd<RecordingEvents> marker(handle);
    marker.Execute();
    EXPECT_EQ(SetCount(handle), 1);
    marker.Canceled();
    EXPECT_EQ(SetCount(handle), 2);
}

TEST_F(SyncAsyncCmdTest, AWrapperCanBeUsedThroughTheBaseAndDeletedThroughIt) {
    CountingCmd inner;
    CVKAsyncCmd* wrapper = new vaskel::CVKSyncAsyncCmd<RecordingEvents>(handle, &inner);
    wrapper->Execute();
    delete wrapper;
    EXPECT_EQ(inner.executed, 1) << "the wrapped command is not owned";
}

#include <vaskel/diag.h>
#include <vaskel/sync.h>

#include <gtest/gtest.h>

#include <string>
#include <thread>

using namespace vaskel;

TEST(CVKEvent, FlagsGiveInitialStateThenResetMode) {
    const struct {
        bool initial, manual, first, second; // two Lock(0) in a row
    } cases[] = {
        {false, false, false, false}, // the defaults
        {true, false, true, false},
        {false, true, false, false},
        {true, true, true, true},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(testing::Message() << "initial " << c.initial << ", manual " << c.manual);
        CVKEvent event(c.initial, c.manual);
        EXPECT_EQ(event.Lock(0), c.first);
        EXPECT_EQ(event.Lock(0), c.second);
        EXPECT_TRUE(event.ResetEvent());
        EXPECT_FALSE(event.Lock(0));
        EXPECT_TRUE(event.SetEvent());
        EXPECT_TRUE(event.Unlock()) << "releases nothing";
        EXPECT_TRUE(event.Lock(0));
        EXPECT_EQ(event.Lock(0), c.manual) << "a manual-reset event stays signalled";
    }
    CVKEvent defaults;
    EXPECT_FALSE(defaults.Lock(0));
}

TEST(CVKEvent, WakesAWaitingThread) {
    CVKEvent ready, done;
    bool woken = false;
    std::thread waiter([&] {
        woken = ready.Lock(10000);
        done.SetEvent();
    });
    EXPECT_FALSE(done.Lock(20)) << "the waiter is still waiting";
    EXPECT_TRUE(ready.SetEvent());
    EXPECT_TRUE(done.Lock(10000));
    waiter.join();
    EXPECT_TRUE(woken);
}

TEST(CVKEvent, StaticOperationsWorkOnAnyHandle) {
    CVKEvent owner(false, true);
    HANDLE handle = owner;
    EXPECT_TRUE(CVKEvent::SetEvent(handle));
    EXPECT_EQ(WaitForSingleObject(handle, 0), WAIT_OBJECT_0);
    EXPECT_TRUE(CVKEvent::ResetEvent(handle));
    EXPECT_EQ(WaitForSingleObject(handle, 0), WAIT_TIMEOUT);
    EXPECT_TRUE(CVKEvent::SetEvent(handle));
    EXPECT_TRUE(CVKEvent::PulseEvent(handle)) << "with no waiter a pulse leaves it clear";
    EXPECT_EQ(WaitForSingleObject(handle, 0), WAIT_TIMEOUT);

    EXPECT_FALSE(CVKEvent::SetEvent(nullptr));
    EXPECT_FALSE(CVKEvent::ResetEvent(nullptr));
    EXPECT_FALSE(CVKEvent::PulseEvent(nullptr));
}

TEST(CVKEvent, NamedEventsShareOneObjectAndBadNamesThrow) {
    const std::string name = "vaskel-event-test-" + std::to_string(GetCurrentProcessId());
    CVKEvent first(false, true, name.c_str());
    CVKEvent second(true, false, name.c_str()); // opened: its own flags are ignored
    EXPECT_FALSE(second.Lock(0));
    EXPECT_TRUE(first.SetEvent());
    EXPECT_TRUE(second.Lock(0));
    EXPECT_TRUE(second.Lock(0)) << "manual reset, as the creator asked";

    const std::string tooLong(MAX_PATH + 40, 'n'); // object names end at MAX_PATH
    EXPECT_THROW(CVKEvent(false, false, tooLong.c_str()), resource_error);
}

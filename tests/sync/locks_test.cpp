#include <vaskel/sync.h>

#include <gtest/gtest.h>

#include <atomic>
#include <thread>

using namespace vaskel;

namespace {

// Written against a lock type, as the shared Lock/Unlock shape allows.
template <class Lock>
int CountUnder(Lock& lock) {
    int count = 0;
    auto add = [&] {
        for (int i = 0; i < 20000; ++i) {
            lock.Lock(INFINITE);
            ++count;
            lock.Unlock();
        }
    };
    std::thread other(add);
    add();
    other.join();
    return count;
}

// Another thread locks and marks its entry; meanwhile this thread holds the lock.
template <class Lock>
void ExpectOthersToWait(Lock& lock) {
    std::atomic<bool> entered{false};
    ASSERT_TRUE(lock.Lock(0));
    std::thread other([&] {
        EXPECT_TRUE(lock.Lock(0)); // the time-out is ignored: this waits
        entered = true;
        EXPECT_TRUE(lock.Unlock());
    });
    Sleep(20);
    EXPECT_FALSE(entered);
    EXPECT_TRUE(lock.Unlock());
    other.join();
    EXPECT_TRUE(entered);
}

} // namespace

TEST(Locks, KeepConcurrentIncrementsApartAndMakeOthersWait) {
    CVKCriticalSection section;
    CVKSimpleMutex mutex;
    EXPECT_EQ(CountUnder(section), 40000);
    EXPECT_EQ(CountUnder(mutex), 40000);
    ExpectOthersToWait(section);
    ExpectOthersToWait(mutex);
    CVKFakeMutex none; // never blocks, even locked twice
    EXPECT_TRUE(none.Lock(0) && none.Lock(0) && none.Unlock() && none.Unlock());
}

TEST(CVKCriticalSection, IsRecursiveAndKnowsItsOwner) {
    CVKCriticalSection section;
    EXPECT_FALSE(section.IsLocked());
    EXPECT_TRUE(section.Lock(0));
    EXPECT_TRUE(section.Lock(0)) << "the owner enters again";
    EXPECT_TRUE(section.Unlock());
    EXPECT_TRUE(section.IsLockedByCurrentThread()) << "still held once";

    bool lockedThere = false, ownedThere = true, enteredThere = true;
    auto look = [&] {
        lockedThere = section.IsLocked();
        ownedThere = section.IsLockedByCurrentThread();
        enteredThere = TryEnterCriticalSection(section) != FALSE; // the wrapped section itself
        if (enteredThere)
            LeaveCriticalSection(section);
    };
    std::thread(look).join();
    EXPECT_TRUE(lockedThere);
    EXPECT_FALSE(ownedThere);
    EXPECT_FALSE(enteredThere);

    EXPECT_TRUE(section.Unlock());
    EXPECT_FALSE(section.IsLocked());
    EXPECT_FALSE(section.IsLockedByCurrentThread());
    std::thread(look).join();
    EXPECT_TRUE(enteredThere);
}

TEST(CVKSimpleMutex, UnlockTellsWhetherItWasTaken) {
    EXPECT_EQ(CVKSimpleMutex::GetLockedFlag(), 1);
    EXPECT_EQ(CVKSimpleMutex::GetUnlockedFlag(), 0);
    CVKSimpleMutex mutex;
    EXPECT_FALSE(mutex.Unlock()) << "a free mutex";
    EXPECT_TRUE(mutex.Lock(0)) << "the failed Unlock left it free";
    EXPECT_TRUE(mutex.Unlock());
    EXPECT_FALSE(mutex.Unlock());
}

// Global memory as Windows documents it: fixed blocks whose handle is their
// address, movable blocks with a lock count and a handle that survives
// reallocation, and the failures for handles that name no block.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cstring>

namespace {

const DWORD untouched = 0xDEADBEEF; // set before a call whose last error is checked

bool AllBytesAre(const void* data, SIZE_T size, unsigned char value) {
    const unsigned char* bytes = static_cast<const unsigned char*>(data);
    for (SIZE_T i = 0; i < size; ++i) {
        if (bytes[i] != value)
            return false;
    }
    return true;
}

} // namespace

TEST(GlobalMemoryTest, AFixedBlockIsItsOwnAddressAndHasNoLockCount) {
    HGLOBAL block = GlobalAlloc(GPTR, 100);
    ASSERT_NE(block, nullptr);
    EXPECT_EQ(GlobalSize(block), 100u);
    EXPECT_TRUE(AllBytesAre(block, 100, 0));
    EXPECT_EQ(GlobalLock(block), block);
    EXPECT_EQ(GlobalLock(block), block);
    EXPECT_EQ(GlobalHandle(block), block);
    // Unlocking a fixed block always succeeds: there is no count to run out.
    EXPECT_TRUE(GlobalUnlock(block));
    EXPECT_TRUE(GlobalUnlock(block));
    EXPECT_TRUE(GlobalUnlock(block));
    EXPECT_EQ(GlobalFree(block), nullptr);

    // A fixed block needs an address of its own, so no bytes become one.
    HGLOBAL tiny = GlobalAlloc(GMEM_FIXED, 0);
    ASSERT_NE(tiny, nullptr);
    EXPECT_EQ(GlobalSize(tiny), 1u);
    EXPECT_EQ(GlobalFree(tiny), nullptr);
}

TEST(GlobalMemoryTest, UnlockingAMovableBlockTellsTheLastUnlockFromAnError) {
    HGLOBAL block = GlobalAlloc(GHND, 64);
    ASSERT_NE(block, nullptr);
    EXPECT_EQ(GlobalSize(block), 64u);
    void* first = GlobalLock(block);
    ASSERT_NE(first, nullptr);
    EXPECT_NE(first, static_cast<void*>(block));
    EXPECT_TRUE(AllBytesAre(first, 64, 0));
    EXPECT_EQ(GlobalLock(block), first);
    EXPECT_EQ(GlobalHandle(first), block);

    EXPECT_TRUE(GlobalUnlock(block)); // still locked once
    SetLastError(untouched);
    EXPECT_FALSE(GlobalUnlock(block)); // unlocked now: FALSE, but no error
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(NO_ERROR));
    SetLastError(untouched);
    EXPECT_FALSE(GlobalUnlock(block));
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_NOT_LOCKED));
    EXPECT_EQ(GlobalFree(block), nullptr);
}

TEST(GlobalMemoryTest, AMovableBlockKeepsItsHandleAndBytesWhenResized) {
    HGLOBAL block = GlobalAlloc(GMEM_MOVEABLE, 16);
    ASSERT_NE(block, nullptr);
    std::memset(GlobalLock(block), 'a', 16);
    GlobalUnlock(block);

    EXPECT_EQ(GlobalReAlloc(block, 1 << 20, GMEM_ZEROINIT), block);
    EXPECT_EQ(GlobalSize(block), static_cast<SIZE_T>(1 << 20));
    const unsigned char* bytes = static_cast<const unsigned char*>(GlobalLock(block));
    ASSERT_NE(bytes, nullptr);
    EXPECT_TRUE(AllBytesAre(bytes, 16, 'a'));
    EXPECT_TRUE(AllBytesAre(bytes + 16, (1 << 20) - 16, 0));
    GlobalUnlock(block);

    EXPECT_EQ(GlobalReAlloc(block, 8, 0), block);
    EXPECT_EQ(GlobalSize(block), 8u);
    EXPECT_TRUE(AllBytesAre(GlobalLock(block), 8, 'a'));
    GlobalUnlock(block);
    // Only attributes would change: size and handle stay.
    EXPECT_EQ(GlobalReAlloc(block, 1000, GMEM_MODIFY), block);
    EXPECT_EQ(GlobalSize(block), 8u);
    EXPECT_EQ(GlobalFree(block), nullptr);
}

TEST(GlobalMemoryTest, AMovableBlockOfNoBytesIsDiscardedUntilResized) {
    HGLOBAL block = GlobalAlloc(GMEM_MOVEABLE, 0);
    ASSERT_NE(block, nullptr);
    EXPECT_EQ(GlobalLock(block), nullptr);
    EXPECT_EQ(GlobalSize(block), 0u);

    EXPECT_EQ(GlobalReAlloc(block, 4, GMEM_ZEROINIT), block);
    EXPECT_EQ(GlobalSize(block), 4u);
    void* bytes = GlobalLock(block);
    ASSERT_NE(bytes, nullptr);
    EXPECT_TRUE(AllBytesAre(bytes, 4, 0));
    GlobalUnlock(block);
    EXPECT_EQ(GlobalFree(block), nullptr);
}

TEST(GlobalMemoryTest, AFixedBlockMovesOnlyWhenAllowedTo) {
    HGLOBAL block = GlobalAlloc(GMEM_FIXED, 32);
    ASSERT_NE(block, nullptr);
    std::memset(block, 'f', 32);
    EXPECT_EQ(GlobalReAlloc(block, 8, 0), block); // shrinking happens in place
    EXPECT_EQ(GlobalSize(block), 8u);

    // Growing in place may or may not be possible, but the block never moves.
    HGLOBAL grown = GlobalReAlloc(block, 1 << 20, 0);
    if (grown) {
        EXPECT_EQ(grown, block);
        EXPECT_EQ(GlobalSize(block), static_cast<SIZE_T>(1 << 20));
    } else {
        EXPECT_EQ(GlobalSize(block), 8u);
    }
    EXPECT_TRUE(AllBytesAre(block, 8, 'f'));

    HGLOBAL moved = GlobalReAlloc(block, 4 << 20, GMEM_MOVEABLE);
    ASSERT_NE(moved, nullptr);
    EXPECT_EQ(GlobalSize(moved), static_cast<SIZE_T>(4 << 20));
    EXPECT_EQ(GlobalLock(moved), moved); // still a fixed block
    EXPECT_TRUE(AllBytesAre(moved, 8, 'f'));
    EXPECT_EQ(GlobalFree(moved), nullptr);
}

TEST(GlobalMemoryTest, AFreedHandleIsRefused) {
    HGLOBAL block = GlobalAlloc(GMEM_MOVEABLE, 10);
    ASSERT_NE(block, nullptr);
    ASSERT_EQ(GlobalFree(block), nullptr);

    SetLastError(untouched);
    EXPECT_EQ(GlobalLock(block), nullptr);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_HANDLE));
    SetLastError(untouched);
    EXPECT_FALSE(GlobalUnlock(block));
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_HANDLE));
    SetLastError(untouched);
    EXPECT_EQ(GlobalFree(block), block); // failure returns the handle
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_HANDLE));
    EXPECT_EQ(GlobalSize(block), 0u);
    EXPECT_EQ(GlobalReAlloc(block, 20, 0), nullptr);
    EXPECT_EQ(GlobalFree(nullptr), nullptr);
}

TEST(GlobalMemoryTest, AnImpossibleSizeFails) {
    EXPECT_EQ(GlobalAlloc(GMEM_FIXED, ~static_cast<SIZE_T>(0)), nullptr);
    EXPECT_EQ(GlobalAlloc(GMEM_MOVEABLE, ~static_cast<SIZE_T>(0)), nullptr);
    HGLOBAL block = GlobalAlloc(GMEM_MOVEABLE, 10);
    ASSERT_NE(block, nullptr);
    EXPECT_EQ(GlobalReAlloc(block, ~static_cast<SIZE_T>(0), 0), nullptr);
    EXPECT_EQ(GlobalSize(block), 10u); // the block survives a failed reallocation
    EXPECT_EQ(GlobalFree(block), nullptr);
}

#ifndef _WIN32
// Windows leaves this undefined; here every handle is looked up before use.
TEST(GlobalMemoryTest, AStrangersPointerAndAFreedFixedBlockAreRefused) {
    int local = 0;
    HGLOBAL stranger = &local;
    HGLOBAL freed = GlobalAlloc(GMEM_FIXED, 10);
    ASSERT_EQ(GlobalFree(freed), nullptr);
    for (HGLOBAL handle : {stranger, freed}) {
        SetLastError(untouched);
        EXPECT_EQ(GlobalLock(handle), nullptr);
        EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_HANDLE));
        SetLastError(untouched);
        EXPECT_EQ(GlobalSize(handle), 0u);
        EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_HANDLE));
        EXPECT_EQ(GlobalFree(handle), handle);
        EXPECT_EQ(GlobalHandle(handle), nullptr);
    }
}
#endif

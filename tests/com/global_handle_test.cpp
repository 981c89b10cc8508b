// The owner of a global-memory block: who frees the block, and copies.
#include <vaskel/marshal.h>
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cstring>

namespace {

using vaskel::CVKGlobalHandle;

HGLOBAL BlockHolding(const char* text) {
    const SIZE_T size = std::strlen(text) + 1;
    HGLOBAL block = GlobalAlloc(GMEM_MOVEABLE, size);
    std::memcpy(GlobalLock(block), text, size);
    GlobalUnlock(block);
    return block;
}

TEST(GlobalHandle, AllocatesOrStaysNull) {
    CVKGlobalHandle none;
    EXPECT_FALSE(none.good());
    EXPECT_TRUE(!none);
    CVKGlobalHandle block(64, GMEM_FIXED | GMEM_ZEROINIT);
    ASSERT_TRUE(block.good());
    EXPECT_GE(GlobalSize(block.GetHandle()), 64u);
    EXPECT_EQ(static_cast<const char*>(block.GetHandle())[63], 0);
    EXPECT_EQ(static_cast<void*>(block), block.GetHandle());
}

TEST(GlobalHandle, CopyGivesADistinctBlockWithTheSameBytes) {
    HGLOBAL source = BlockHolding("global bytes");
    {
        CVKGlobalHandle copy(source, true);
        ASSERT_TRUE(copy.good());
        EXPECT_NE(copy.GetHandle(), source);
        ASSERT_EQ(GlobalSize(copy.GetHandle()), GlobalSize(source));
        // The copy is fixed memory: the handle is the address.
        EXPECT_STREQ(static_cast<const char*>(copy.GetHandle()), "global bytes");
    }
    const char* data = static_cast<const char*>(GlobalLock(source));
    EXPECT_STREQ(data, "global bytes") << "the source stays with its owner";
    GlobalUnlock(source);
    GlobalFree(source);
}

TEST(GlobalHandle, CopyOrAttachOfTheHeldBlockChangesNothing) {
    CVKGlobalHandle held(BlockHolding("kept"), false);
    HGLOBAL block = held.GetHandle();
    held.Copy(block);
    EXPECT_EQ(held.GetHandle(), block);
    held.Attach(block);
    EXPECT_EQ(held.GetHandle(), block);
    const char* data = static_cast<const char*>(GlobalLock(block));
    ASSERT_NE(data, nullptr) << "the block is still allocated";
    EXPECT_STREQ(data, "kept");
    GlobalUnlock(block);
}

TEST(GlobalHandle, AttachFreesThePreviousBlockAndDetachGivesItUp) {
    CVKGlobalHandle handle(BlockHolding("first"), false);
    HGLOBAL second = BlockHolding("second");
    handle.Attach(second);
    EXPECT_EQ(handle.GetHandle(), second);
    HGLOBAL detached = nullptr;
    {
        CVKGlobalHandle owner(handle.Detach(), false);
        EXPECT_FALSE(handle.good());
        detached = owner.Detach();
    }
    const char* data = static_cast<const char*>(GlobalLock(detached));
    ASSERT_NE(data, nullptr) << "a detached block outlives its owner";
    EXPECT_STREQ(data, "second");
    GlobalUnlock(detached);
    EXPECT_EQ(GlobalFree(detached), nullptr);
}

TEST(GlobalHandle, ReleaseAndCopyOfNullLeaveNoBlock) {
    CVKGlobalHandle handle(16, GMEM_MOVEABLE);
    ASSERT_TRUE(handle.good());
    handle.Release();
    EXPECT_FALSE(handle.good());
    CVKGlobalHandle copy(BlockHolding("x"), false);
    copy.Copy(nullptr);
    EXPECT_FALSE(copy.good());
}

} // namespace

// The conversions allocate nothing beyond their result string. This program
// counts every operator new; CString's own buffer is the only allocation a
// conversion may make, and a string with room needs none.
#include <vaskel/text.h>

#include <gtest/gtest.h>

#include <atomic>
#include <cstdlib>
#include <new>

namespace {
std::atomic<long> allocations{0};
}

void* operator new(std::size_t size) {
    ++allocations;
    if (void* block = std::malloc(size ? size : 1))
        return block;
    throw std::bad_alloc();
}
// The nothrow forms share the counted heap, so that a block from one form
// is never freed by the other.
void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
    ++allocations;
    return std::malloc(size ? size : 1);
}
void operator delete(void* block) noexcept {
    std::free(block);
}
void operator delete(void* block, std::size_t) noexcept {
    std::free(block);
}
void operator delete(void* block, const std::nothrow_t&) noexcept {
    std::free(block);
}

TEST(ConversionAllocation, ConvertingIntoAStringWithRoomAllocatesNothing) {
    vaskel::CString out;
    vaskel::VKReserveStringBuffer(out, 512);
    long before = allocations;
    vaskel::AsString(out, 1.1);
    vaskel::AsString(out, 12345.678, 3);
    vaskel::AsString(out, 1.1f);
    vaskel::AsString(out, -42);
    vaskel::AsString(out, reinterpret_cast<void*>(&out));
    EXPECT_EQ(allocations - before, 0);
    EXPECT_STREQ(out.Left(0), "");
}

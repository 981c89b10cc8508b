// Tests of CMemFile: gaps that read as zeros, sizes that must not wrap, the
// caller's fixed or growable buffers, and the GetBufferPtr protocol.
#include <vaskel/framework/mem_file.h>

#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <limits>
#include <string>

using namespace vaskel;

namespace {

std::string Contents(CMemFile& file) {
    std::string contents(static_cast<size_t>(file.GetLength()) + 1, '\0');
    file.SeekToBegin();
    contents.resize(file.Read(&contents[0], static_cast<UINT>(contents.size())));
    return contents;
}

void Write(CMemFile& file, const std::string& text) {
    file.Write(text.data(), static_cast<UINT>(text.size()));
}

TEST(CMemFile, GapsAndGrownRoomReadAsZeros) {
    const std::string zeros(100, '\0');
    CMemFile file;
    Write(file, std::string(100, 'x'));
    file.SetLength(2); // the old bytes stay in the buffer behind the end
    file.Seek(10, CFile::begin);
    Write(file, "c");
    EXPECT_EQ(Contents(file), "xx" + zeros.substr(0, 8) + "c");
    file.SetLength(2);
    file.SetLength(5);
    EXPECT_EQ(Contents(file), "xx" + zeros.substr(0, 3));
    file.SetLength(2);
    file.Seek(6, CFile::begin);
    void* start = nullptr;
    ASSERT_EQ(file.GetBufferPtr(CFile::bufferWrite, 2, &start), 2u);
    std::memcpy(start, "yz", 2);
    file.GetBufferPtr(CFile::bufferCommit, 2);
    EXPECT_EQ(Contents(file), "xx" + zeros.substr(0, 4) + "yz");
    // Grown room never shows what the heap held, even committed unwritten.
    CMemFile fresh;
    ASSERT_EQ(fresh.GetBufferPtr(CFile::bufferWrite, 100, &start), 100u);
    fresh.GetBufferPtr(CFile::bufferCommit, 100);
    EXPECT_EQ(Contents(fresh), zeros);
}

TEST(CMemFile, BadPositionsAndSizesRaiseInsteadOfWrapping) {
    CMemFile file;
    Write(file, "abcdef");
    file.SetLength(3);
    EXPECT_EQ(file.GetPosition(), 3u) << "the position follows a shorter length";
    EXPECT_THROW(file.Seek(-4, CFile::current), CFileException);
    EXPECT_THROW(file.Seek(std::numeric_limits<LONGLONG>::max(), CFile::end), CFileException);
    EXPECT_THROW(file.Seek(0, 3), CInvalidArgException);
    EXPECT_EQ(file.GetPosition(), 3u) << "a failed seek keeps the position";
    // Rounding a huge size up to the growth step must not wrap to a small one.
    for (ULONGLONG size : {~0ull, ~0ull - 100})
        EXPECT_THROW(file.SetLength(size), CMemoryException);
    EXPECT_EQ(Contents(file), "abc");
}

TEST(CMemFile, CallerBuffersStayTheCallers) {
    BYTE fixed[] = {'A', 'B', 'C', 'D', 'E', 'F', 'G', 'H'};
    {
        CMemFile file(fixed, sizeof fixed); // holds the contents and never grows
        EXPECT_EQ(Contents(file), "ABCDEFGH");
        file.Seek(-2, CFile::end);
        EXPECT_THROW(Write(file, "xyz"), CMemoryException);
        EXPECT_THROW(file.SetLength(9), CMemoryException);
        Write(file, "xy");
    } // the file must not free the caller's buffer
    EXPECT_EQ(std::memcmp(fixed, "ABCDEFxy", 8), 0);

    CMemFile file;
    file.Attach(fixed, sizeof fixed, 16); // may grow: starts empty
    Write(file, "abcd");
    EXPECT_EQ(file.GetLength(), 4u);
    Write(file, "efghijklmnop"); // beyond the caller's buffer: the file takes its own
    EXPECT_EQ(std::memcmp(fixed, "abcdEFxy", 8), 0);
    BYTE* own = file.Detach();
    ASSERT_NE(own, fixed);
    EXPECT_EQ(std::memcmp(own, "abcdefghijklmnop", 16), 0);
    std::free(own);
    EXPECT_EQ(file.GetLength(), 0u) << "Detach leaves an empty file";
}

TEST(CMemFile, GetBufferPtrHandsOutRoomThatACommitPublishes) {
    CMemFile file(16);
    EXPECT_EQ(file.GetBufferPtr(CFile::bufferCheck), static_cast<UINT>(CFile::bufferDirect));
    Write(file, "ab");
    void* start = nullptr;
    ASSERT_EQ(file.GetBufferPtr(CFile::bufferWrite, 14, &start), 14u);
    std::memcpy(start, "0123456789abcd", 14);
    EXPECT_EQ(file.GetLength(), 2u) << "nothing is published before the commit";
    file.GetBufferPtr(CFile::bufferCommit, 14);
    EXPECT_EQ(file.GetPosition(), 16u);
    file.Seek(2, CFile::begin);
    void* max = nullptr;
    ASSERT_EQ(file.GetBufferPtr(CFile::bufferRead, 4, &start, &max), 4u);
    EXPECT_EQ(std::string(static_cast<char*>(start), static_cast<char*>(max)), "0123");
    EXPECT_EQ(file.GetBufferPtr(CFile::bufferRead, 100), 10u) << "up to the end";
    file.Write(start, 14); // from the file's own buffer, which moves as it grows
    EXPECT_EQ(Contents(file), "ab0123456789abcd0123456789abcd");
    // Only room the buffer has can have been written: a commit beyond it
    // neither moves the position nor lengthens the file.
    file.Seek(1 << 20, CFile::begin);
    file.GetBufferPtr(CFile::bufferCommit, 10);
    EXPECT_EQ(file.GetPosition(), 1u << 20);
    EXPECT_EQ(file.GetLength(), 30u);
    EXPECT_THROW(file.GetBufferPtr(99), CInvalidArgException);
}

} // namespace

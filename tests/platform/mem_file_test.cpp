#include <vaskel/framework/mem_file.h>

#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <limits>
#include <string>
#include <vector>

using vaskel::CFile;
using vaskel::CFileException;
using vaskel::CMemFile;
using vaskel::CMemoryException;

namespace {

std::string Contents(CMemFile& file) {
    std::string contents(static_cast<size_t>(file.GetLength()), '\0');
    file.SeekToBegin();
    if (!contents.empty()) {
        EXPECT_EQ(file.Read(&contents[0], static_cast<UINT>(contents.size())), contents.size());
    }
    return contents;
}

void Write(CMemFile& file, const std::string& text) {
    file.Write(text.data(), static_cast<UINT>(text.size()));
}

} // namespace

TEST(CMemFile, GrowsAsItIsWritten) {
    CMemFile file(16);
    std::string expected;
    for (int i = 0; i < 500; ++i) {
        std::string piece(static_cast<size_t>(i % 9), static_cast<char>('a' + i % 26));
        Write(file, piece);
        expected += piece;
    }
    EXPECT_EQ(file.GetLength(), expected.size());
    EXPECT_EQ(file.GetPosition(), expected.size());
    EXPECT_EQ(Contents(file), expected);
}

TEST(CMemFile, ReadStopsAtTheEnd) {
    CMemFile file;
    Write(file, "abcdef");
    file.Seek(4, CFile::begin);
    char buffer[10] = {};
    EXPECT_EQ(file.Read(buffer, 10), 2u);
    EXPECT_STREQ(buffer, "ef");
    EXPECT_EQ(file.Read(buffer, 10), 0u);
    file.Seek(100, CFile::begin);
    EXPECT_EQ(file.Read(buffer, 10), 0u) << "beyond the end";
    EXPECT_EQ(file.GetLength(), 6u) << "seeking alone does not extend";
}

TEST(CMemFile, OverwritesInTheMiddle) {
    CMemFile file;
    Write(file, "0123456789");
    file.Seek(-6, CFile::end);
    Write(file, "ab");
    file.Seek(1, CFile::current);
    Write(file, "c");
    EXPECT_EQ(file.GetPosition(), 8u);
    EXPECT_EQ(Contents(file), "0123ab6c89");
}

TEST(CMemFile, AGapLeftBySeekingPastTheEndReadsAsZeros) {
    CMemFile file;
    Write(file, std::string(100, 'x'));
    file.SetLength(2); // the old bytes stay in the buffer behind the end
    EXPECT_EQ(file.Seek(10, CFile::begin), 10u);
    Write(file, "c");
    EXPECT_EQ(Contents(file), std::string("xx") + std::string(8, '\0') + "c");

    file.SetLength(2);
    file.SetLength(5);
    EXPECT_EQ(Contents(file), std::string("xx") + std::string(3, '\0'));
}

TEST(CMemFile, SetLengthClampsThePosition) {
    CMemFile file;
    Write(file, "abcdef");
    file.SetLength(3);
    EXPECT_EQ(file.GetLength(), 3u);
    EXPECT_EQ(file.GetPosition(), 3u);
    Write(file, "Z");
    EXPECT_EQ(Contents(file), "abcZ");
}

TEST(CMemFile, SeekBeforeTheStartIsBadSeek) {
    CMemFile file;
    Write(file, "abc");
    file.Seek(1, CFile::begin);
    for (auto seek : {std::make_pair(-1LL, CFile::begin), std::make_pair(-2LL, CFile::current),
                      std::make_pair(-4LL, CFile::end)}) {
        try {
            file.Seek(seek.first, seek.second);
            ADD_FAILURE() << "seek by " << seek.first << " was accepted";
        } catch (const CFileException& error) {
            EXPECT_EQ(error.m_cause, CFileException::badSeek);
        }
    }
    EXPECT_EQ(file.GetPosition(), 1u) << "a failed seek keeps the position";
    EXPECT_THROW(file.Seek(0, 3), vaskel::CInvalidArgException);
    EXPECT_EQ(file.Seek(-3, CFile::end), 0u);
}

TEST(CMemFile, OutOfRangeSizesRaiseInsteadOfWrapping) {
    CMemFile file;
    Write(file, "abc");
    EXPECT_THROW(file.SetLength(std::numeric_limits<ULONGLONG>::max()), CMemoryException);
    EXPECT_THROW(file.SetLength(std::numeric_limits<ULONGLONG>::max() - 100), CMemoryException);
    EXPECT_THROW(file.Seek(std::numeric_limits<LONGLONG>::max(), CFile::current), CFileException);
    EXPECT_EQ(Contents(file), "abc");
}

TEST(CMemFile, WritingFromItsOwnBufferSurvivesGrowth) {
    CMemFile file(16);
    Write(file, "0123456789abcdef");
    void* start = nullptr;
    file.SeekToBegin();
    ASSERT_EQ(file.GetBufferPtr(CFile::bufferRead, 16, &start), 16u);
    file.SeekToEnd();
    file.Write(start, 16); // the buffer moves while growing
    EXPECT_EQ(Contents(file), "0123456789abcdef0123456789abcdef");
}

TEST(CMemFile, AFixedCallerBufferHoldsTheContentsAndNeverGrows) {
    std::vector<BYTE> buffer = {'A', 'B', 'C', 'D', 'E', 'F', 'G', 'H'};
    {
        CMemFile file(buffer.data(), static_cast<UINT>(buffer.size()));
        EXPECT_EQ(file.GetLength(), 8u);
        EXPECT_EQ(Contents(file), "ABCDEFGH");
        file.SeekToBegin();
        Write(file, "xy");
        EXPECT_EQ(buffer[0], 'x') << "writes go to the caller's buffer";
        EXPECT_EQ(buffer[1], 'y');

        file.Seek(7, CFile::begin);
        EXPECT_THROW(Write(file, "12"), CMemoryException);
        EXPECT_THROW(file.SetLength(9), CMemoryException);
        EXPECT_EQ(file.GetLength(), 8u);
        EXPECT_EQ(buffer[7], 'H') << "a refused write changes nothing";
        EXPECT_EQ(file.GetBufferPtr(CFile::bufferCheck), static_cast<UINT>(CFile::bufferDirect));
    } // the file must not free the caller's buffer
    EXPECT_EQ(std::string(buffer.begin(), buffer.end()), "xyCDEFGH");
}

TEST(CMemFile, AGrowableCallerBufferStartsEmptyAndIsLeftToTheCaller) {
    std::vector<BYTE> buffer(8, '.');
    CMemFile file;
    file.Attach(buffer.data(), static_cast<UINT>(buffer.size()), 16);
    EXPECT_EQ(file.GetLength(), 0u);
    Write(file, "abcd");
    EXPECT_EQ(std::string(buffer.begin(), buffer.begin() + 4), "abcd");
    Write(file, "efghijklmnop"); // beyond the caller's buffer: the file takes its own
    EXPECT_EQ(Contents(file), "abcdefghijklmnop");
    EXPECT_EQ(std::string(buffer.begin(), buffer.end()), "abcd....");
    BYTE* own = file.Detach();
    ASSERT_NE(own, buffer.data());
    EXPECT_EQ(std::memcmp(own, "abcdefghijklmnop", 16), 0);
    std::free(own);
}

TEST(CMemFile, DetachHandsOverTheBufferAndLeavesAnEmptyFile) {
    CMemFile file;
    Write(file, "hello");
    BYTE* bytes = file.Detach();
    ASSERT_NE(bytes, nullptr);
    EXPECT_EQ(std::memcmp(bytes, "hello", 5), 0);
    std::free(bytes);
    EXPECT_EQ(file.GetLength(), 0u);
    EXPECT_EQ(file.GetPosition(), 0u);
    Write(file, "again");
    EXPECT_EQ(Contents(file), "again");

    std::vector<BYTE> buffer(4, 'q');
    CMemFile attached(buffer.data(), 4);
    EXPECT_EQ(attached.Detach(), buffer.data());
    EXPECT_EQ(attached.GetLength(), 0u);
}

TEST(CMemFile, BufferWriteThenCommitPublishesTheBytes) {
    CMemFile file;
    Write(file, "ab");
    void* start = nullptr;
    void* max = nullptr;
    UINT room = file.GetBufferPtr(CFile::bufferWrite, 10, &start, &max);
    ASSERT_EQ(room, 10u);
    EXPECT_EQ(static_cast<BYTE*>(max) - static_cast<BYTE*>(start), 10);
    std::memcpy(start, "0123456789", 10);
    EXPECT_EQ(file.GetLength(), 2u) << "nothing is published before the commit";
    EXPECT_EQ(file.GetPosition(), 2u);
    file.GetBufferPtr(CFile::bufferCommit, 10);
    EXPECT_EQ(file.GetLength(), 12u);
    EXPECT_EQ(file.GetPosition(), 12u);
    EXPECT_EQ(Contents(file), "ab0123456789");
}

TEST(CMemFile, BufferWritePastTheEndZeroFillsTheGap) {
    CMemFile file;
    Write(file, std::string(50, 'x'));
    file.SetLength(2);
    file.Seek(6, CFile::begin);
    void* start = nullptr;
    ASSERT_EQ(file.GetBufferPtr(CFile::bufferWrite, 2, &start), 2u);
    std::memcpy(start, "yz", 2);
    file.GetBufferPtr(CFile::bufferCommit, 2);
    EXPECT_EQ(Contents(file), std::string("xx") + std::string(4, '\0') + "yz");
}

TEST(CMemFile, BufferReadGivesTheBytesAndAdvances) {
    CMemFile file;
    Write(file, "0123456789");
    file.Seek(3, CFile::begin);
    void* start = nullptr;
    void* max = nullptr;
    EXPECT_EQ(file.GetBufferPtr(CFile::bufferRead, 4, &start, &max), 4u);
    EXPECT_EQ(std::string(static_cast<char*>(start), static_cast<char*>(max)), "3456");
    EXPECT_EQ(file.GetPosition(), 7u);
    EXPECT_EQ(file.GetBufferPtr(CFile::bufferRead, 100, &start, &max), 3u);
    EXPECT_EQ(std::string(static_cast<char*>(start), static_cast<char*>(max)), "789");
    EXPECT_EQ(file.GetPosition(), 10u);
    EXPECT_EQ(file.GetBufferPtr(CFile::bufferRead, 5, &start, &max), 0u);
    EXPECT_EQ(start, max);
    EXPECT_THROW(file.GetBufferPtr(99), vaskel::CInvalidArgException);
}

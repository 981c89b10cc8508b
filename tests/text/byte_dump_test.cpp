#include <vaskel/diag.h>
#include <vaskel/framework/exceptions.h>
#include <vaskel/text.h>

#include <gtest/gtest.h>

#include <cstdio>
#include <string>
#include <vector>

using vaskel::CString;

namespace {

std::vector<unsigned char> Counting(size_t count) {
    std::vector<unsigned char> bytes(count);
    for (size_t i = 0; i < count; ++i)
        bytes[i] = static_cast<unsigned char>(i * 0x11 + 0x0F);
    return bytes;
}

std::string Hex(unsigned char byte) {
    char text[3];
    std::snprintf(text, sizeof text, "%02X", byte);
    return text;
}

// Checks the layout from the text alone: lines of bytesPerLine bytes split by
// CR LF, groups of groupSize bytes split by one space, the bytes in order.
::testing::AssertionResult HasLayout(const std::string& text,
                                     const std::vector<unsigned char>& bytes, size_t groupSize,
                                     size_t groupsPerLine) {
    size_t bytesPerLine = groupsPerLine == 0 ? bytes.size()
                          : groupSize == 0   ? groupsPerLine
                                             : groupSize * groupsPerLine;
    if (bytes.empty())
        return text.empty() ? ::testing::AssertionSuccess()
                            : ::testing::AssertionFailure() << "text without bytes";
    size_t next = 0; // the next byte expected
    size_t start = 0;
    while (start <= text.size()) {
        size_t end = text.find("\r\n", start);
        std::string line = text.substr(start, end == std::string::npos ? end : end - start);
        size_t lineBytes = 0, groupStart = 0;
        while (groupStart <= line.size()) {
            size_t space = line.find(' ', groupStart);
            std::string group =
                line.substr(groupStart, space == std::string::npos ? space : space - groupStart);
            size_t groupBytes = group.size() / 2;
            if (group.size() % 2 != 0 || groupBytes == 0)
                return ::testing::AssertionFailure() << "bad group '" << group << "'";
            if (groupSize != 0 && groupBytes != groupSize && next + groupBytes != bytes.size())
                return ::testing::AssertionFailure() << "short group '" << group << "'";
            if (groupSize == 0 && space != std::string::npos)
                return ::testing::AssertionFailure() << "a space without groups";
            for (size_t i = 0; i < groupBytes; ++i, ++next) {
                if (next >= bytes.size() || group.substr(2 * i, 2) != Hex(bytes[next]))
                    return ::testing::AssertionFailure() << "wrong digits at byte " << next;
            }
            lineBytes += groupBytes;
            if (space == std::string::npos)
                break;
            groupStart = space + 1;
        }
        bool last = end == std::string::npos;
        if (lineBytes > bytesPerLine || (!last && lineBytes != bytesPerLine))
            return ::testing::AssertionFailure() << "a line of " << lineBytes << " bytes";
        if (last)
            break;
        start = end + 2;
    }
    if (next != bytes.size())
        return ::testing::AssertionFailure() << next << " of " << bytes.size() << " bytes";
    return ::testing::AssertionSuccess();
}

} // namespace

TEST(VKByteToString, GivesUpperCaseDigitsHighNibbleFirst) {
    char high = 0, low = 0;
    vaskel::VKByteToString(0x3A, high, low);
    EXPECT_EQ(high, '3');
    EXPECT_EQ(low, 'A');
    for (int value = 0; value < 256; ++value) {
        vaskel::VKByteToString(static_cast<unsigned char>(value), high, low);
        EXPECT_EQ(std::string({high, low}), Hex(static_cast<unsigned char>(value)));
    }
}

TEST(VKCalcBytesToStringBufferSize, CountsDigitsSpacesAndLineBreaks) {
    EXPECT_EQ(vaskel::VKCalcBytesToStringBufferSize(16, 4, 2), 36u);
    EXPECT_EQ(vaskel::VKCalcBytesToStringBufferSize(5, 0, 2), 14u);
    EXPECT_EQ(vaskel::VKCalcBytesToStringBufferSize(5, 2, 0), 12u);
    EXPECT_EQ(vaskel::VKCalcBytesToStringBufferSize(3, 0, 0), 6u);
    EXPECT_EQ(vaskel::VKCalcBytesToStringBufferSize(0, 4, 2), 0u);
    EXPECT_EQ(vaskel::VKCalcBytesToStringBufferSize(0, 0, 0), 0u);
    // A group size times groups a line past 32 bits is still one line.
    EXPECT_EQ(vaskel::VKCalcBytesToStringBufferSize(10, 0x10000, 0x10000), 20u);
    EXPECT_EQ(vaskel::VKCalcBytesToStringBufferSize(10, 0xFFFFFFFF, 0xFFFFFFFF), 20u);
}

TEST(VKCalcBytesToStringBufferSize, ASizePast32BitsIsRefused) {
    EXPECT_EQ(vaskel::VKCalcBytesToStringBufferSize(0x7FFFFFFF, 0, 0), 0xFFFFFFFEu);
    EXPECT_THROW(vaskel::VKCalcBytesToStringBufferSize(0x80000000, 0, 0), vaskel::unexpected_error);
    EXPECT_THROW(vaskel::VKCalcBytesToStringBufferSize(0xFFFFFFFF, 1, 1), vaskel::unexpected_error);
    // 2n + (n - 1) spaces: fits up to n = 0x55555555.
    EXPECT_EQ(vaskel::VKCalcBytesToStringBufferSize(0x55555555, 1, 0), 0xFFFFFFFEu);
    EXPECT_THROW(vaskel::VKCalcBytesToStringBufferSize(0x55555556, 1, 0), vaskel::unexpected_error);
}

TEST(VKBytesToString, GroupsAndBreaksLines) {
    std::vector<unsigned char> bytes(16);
    for (size_t i = 0; i < bytes.size(); ++i)
        bytes[i] = static_cast<unsigned char>(i);
    EXPECT_EQ(vaskel::VKBytesToString(bytes.data(), 16, 4, 2),
              "00010203 04050607\r\n08090A0B 0C0D0E0F");
    const unsigned char five[] = {0x00, 0x11, 0x22, 0x33, 0x44};
    EXPECT_EQ(vaskel::VKBytesToString(five, 5, 0, 2), "0011\r\n2233\r\n44");
    EXPECT_EQ(vaskel::VKBytesToString(five, 5, 2, 0), "0011 2233 44");
    EXPECT_EQ(vaskel::VKBytesToString(five, 5, 0, 0), "0011223344");
    EXPECT_EQ(vaskel::VKBytesToString(five, 5, 2, 1), "0011\r\n2233\r\n44");
    const unsigned char high[] = {0xAB, 0xFF, 0x9C};
    EXPECT_EQ(vaskel::VKBytesToString(high, 3, 0, 0), "ABFF9C");
}

TEST(VKBytesToString, NoBytesGiveNothing) {
    const unsigned char bytes[] = {1, 2};
    EXPECT_EQ(vaskel::VKBytesToString(bytes, 0, 4, 2), "");
    EXPECT_EQ(vaskel::VKBytesToString(nullptr, 2, 4, 2), "");
    char buffer[4] = {'x', 'x', 'x', 'x'};
    vaskel::VKBytesToString(nullptr, 2, buffer, sizeof buffer, 0, 0);
    vaskel::VKBytesToString(bytes, 0, nullptr, 0, 0, 0);
    EXPECT_EQ(std::string(buffer, 4), "xxxx");
}

TEST(VKBytesToString, ABufferTooSmallOrMissingIsRefusedBeforeWriting) {
    const std::vector<unsigned char> bytes = Counting(16);
    const DWORD size = vaskel::VKCalcBytesToStringBufferSize(16, 4, 2);
    std::string buffer(size + 1, '#');
    EXPECT_THROW(vaskel::VKBytesToString(bytes.data(), 16, &buffer[0], size - 1, 4, 2),
                 vaskel::unexpected_error);
    EXPECT_EQ(buffer, std::string(size + 1, '#'));
    EXPECT_THROW(vaskel::VKBytesToString(bytes.data(), 16, nullptr, size, 4, 2),
                 vaskel::unexpected_error);
    // Sizes past 32 bits cannot be met by any buffer.
    EXPECT_THROW(vaskel::VKBytesToString(bytes.data(), 0x80000000, &buffer[0], 0xFFFFFFFF, 0, 0),
                 vaskel::unexpected_error);

    vaskel::VKBytesToString(bytes.data(), 16, &buffer[0], size, 4, 2);
    EXPECT_EQ(buffer.substr(0, size), vaskel::VKBytesToString(bytes.data(), 16, 4, 2).GetString());
    EXPECT_EQ(buffer[size], '#') << "no terminator, nothing past the dump";
}

TEST(VKBytesToString, AStringTooLongIsRefusedBeforeReading) {
    const unsigned char byte = 0;
    // 2 * 0x40000000 characters is one more than a string holds.
    EXPECT_THROW(vaskel::VKBytesToString(&byte, 0x40000000, 0, 0), vaskel::CMemoryException);
}

TEST(VKBytesToString, SizeMatchesTheDumpForEveryLayoutUpTo64) {
    const std::vector<unsigned char> all = Counting(64);
    std::string buffer;
    for (DWORD count = 0; count <= 64; ++count) {
        const std::vector<unsigned char> bytes(all.begin(), all.begin() + count);
        for (DWORD groupSize = 0; groupSize <= 64; ++groupSize) {
            for (DWORD groupsPerLine = 0; groupsPerLine <= 64; ++groupsPerLine) {
                const DWORD size =
                    vaskel::VKCalcBytesToStringBufferSize(count, groupSize, groupsPerLine);
                buffer.assign(size + 1, '#');
                vaskel::VKBytesToString(all.data(), count, &buffer[0], size, groupSize,
                                        groupsPerLine);
                ASSERT_EQ(buffer[size], '#') << count << ' ' << groupSize << ' ' << groupsPerLine;
                buffer.resize(size);
                ASSERT_EQ(buffer.find('#'), std::string::npos)
                    << count << ' ' << groupSize << ' ' << groupsPerLine;
                ASSERT_TRUE(HasLayout(buffer, bytes, groupSize, groupsPerLine))
                    << count << ' ' << groupSize << ' ' << groupsPerLine << ": " << buffer;
                ASSERT_EQ(vaskel::VKBytesToString(all.data(), count, groupSize, groupsPerLine),
                          buffer.c_str());
            }
        }
    }
}

#include <vaskel/diag.h>
#include <vaskel/framework/exceptions.h>
#include <vaskel/text.h>

#include <algorithm>
#include <climits>
#include <cstdint>
#include <cstring>

namespace vaskel {
namespace {

constexpr char hexDigits[] = "0123456789ABCDEF";

// The two digits of every byte, so the dump copies one pair a byte.
struct HexPairs {
    char pairs[256][2];

    constexpr HexPairs() : pairs() {
        for (int i = 0; i < 256; ++i) {
            pairs[i][0] = hexDigits[i >> 4];
            pairs[i][1] = hexDigits[i & 15];
        }
    }
};

constexpr HexPairs hexPairs;

// The dump in 64-bit arithmetic, where no count, group size and line length
// can overflow.
std::uint64_t DumpLength(std::uint64_t count, std::uint64_t groupSize,
                         std::uint64_t groupsPerLine) {
    if (count == 0)
        return 0;
    std::uint64_t length = 2 * count;
    std::uint64_t groups = count;
    if (groupSize != 0) {
        groups = (count + groupSize - 1) / groupSize;
        length += groups - 1; // the spaces
    }
    if (groupsPerLine == 0)
        return length;
    std::uint64_t lines = (groups + groupsPerLine - 1) / groupsPerLine;
    length += 2 * (lines - 1); // the line breaks
    if (groupSize != 0)
        length -= lines - 1; // each in place of a space
    return length;
}

void WriteDump(const unsigned char* bytes, std::uint64_t count, char* out, std::uint64_t groupSize,
               std::uint64_t groupsPerLine) {
    // Without groups each line is one group; without line breaks, one line.
    std::uint64_t lineBytes = groupsPerLine == 0 ? count
                              : groupSize == 0   ? groupsPerLine
                                                 : groupSize * groupsPerLine;
    std::uint64_t groupBytes = groupSize == 0 ? lineBytes : groupSize;
    std::uint64_t position = 0;
    while (position < count) {
        if (position != 0) {
            *out++ = '\r';
            *out++ = '\n';
        }
        std::uint64_t lineEnd = position + std::min(count - position, lineBytes);
        std::uint64_t lineStart = position;
        while (position < lineEnd) {
            if (position != lineStart)
                *out++ = ' ';
            std::uint64_t groupEnd = position + std::min(lineEnd - position, groupBytes);
            for (; position < groupEnd; ++position, out += 2)
                std::memcpy(out, hexPairs.pairs[bytes[position]], 2);
        }
    }
}

} // namespace

void VKByteToString(unsigned char value, char& high, char& low) {
    high = hexDigits[value >> 4];
    low = hexDigits[value & 15];
}

DWORD VKCalcBytesToStringBufferSize(DWORD count, DWORD groupSize, DWORD groupsPerLine) {
    std::uint64_t length = DumpLength(count, groupSize, groupsPerLine);
    if (length > 0xFFFFFFFFu)
        throw unexpected_error();
    return static_cast<DWORD>(length);
}

void VKBytesToString(const unsigned char* bytes, DWORD count, char* buffer, DWORD bufferSize,
                     DWORD groupSize, DWORD groupsPerLine) {
    if (bytes == nullptr || count == 0)
        return;
    if (buffer == nullptr || bufferSize < DumpLength(count, groupSize, groupsPerLine))
        throw unexpected_error();
    WriteDump(bytes, count, buffer, groupSize, groupsPerLine);
}

CString VKBytesToString(const unsigned char* bytes, DWORD count, DWORD groupSize,
                        DWORD groupsPerLine) {
    CString text;
    if (bytes == nullptr || count == 0)
        return text;
    std::uint64_t length = DumpLength(count, groupSize, groupsPerLine);
    if (length > static_cast<std::uint64_t>(INT_MAX))
        AfxThrowMemoryException();
    WriteDump(bytes, count, text.GetBufferSetLength(static_cast<int>(length)), groupSize,
              groupsPerLine);
    text.ReleaseBufferSetLength(static_cast<int>(length));
    return text;
}

} // namespace vaskel

// Reads arbitrary bytes through a loading archive. The first byte picks the
// archive's buffer size; after it each value is preceded by a byte that picks
// its type. Every failure must be a framework exception: anything else that
// escapes, and any crash or sanitizer report, is a finding.
#include <vaskel/framework/archive.h>
#include <vaskel/framework/mem_file.h>

#include <cstdint>
#include <cstdlib>
#include <vector>

using namespace vaskel;

namespace {

template <class T>
void ReadValue(CArchive& ar) {
    T value;
    ar >> value;
}

// One step on the archive; false once the input is used up.
bool Step(CArchive& ar, CMemFile& file) {
    BYTE kind;
    ar >> kind;
    switch (kind % 18) {
    case 0:
        ReadValue<BYTE>(ar);
        break;
    case 1:
        ReadValue<WORD>(ar);
        break;
    case 2:
        ReadValue<short>(ar);
        break;
    case 3:
        ReadValue<char>(ar);
        break;
    case 4:
        ReadValue<WCHAR>(ar);
        break;
    case 5:
        ReadValue<bool>(ar);
        break;
    case 6:
        ReadValue<int>(ar);
        break;
    case 7:
        ReadValue<unsigned int>(ar);
        break;
    case 8:
        ReadValue<long>(ar);
        break;
    case 9:
        ReadValue<unsigned long>(ar);
        break;
    case 10:
        ReadValue<long long>(ar);
        break;
    case 11:
        ReadValue<unsigned long long>(ar);
        break;
    case 12:
        ReadValue<float>(ar);
        break;
    case 13:
        ReadValue<double>(ar);
        break;
    case 14:
    case 15: {
        CString text;
        ar >> text;
        // Each byte of input gives at most three bytes of text (one UTF-16
        // unit of two bytes becomes up to three UTF-8 bytes).
        if (static_cast<ULONGLONG>(text.GetLength()) > 3 * file.GetLength())
            std::abort();
        break;
    }
    case 16: {
        // A raw block, sized by the next byte, up to several buffers' worth.
        BYTE size;
        ar >> size;
        std::vector<BYTE> block(static_cast<size_t>(size) * 64 + 1);
        UINT got = ar.Read(block.data(), static_cast<UINT>(block.size()));
        if (got > block.size())
            std::abort();
        if (got < block.size())
            return false;
        break;
    }
    case 17:
        // Gives the buffered bytes back to the file; reading goes on from there.
        ar.Flush();
        if (file.GetPosition() > file.GetLength())
            std::abort();
        break;
    }
    return true;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    if (size == 0)
        return 0;
    int bufferSize = 128 << (data[0] % 6);
    // A buffer of exactly the input's size, so any read beyond it is reported.
    std::vector<BYTE> input(data + 1, data + size);
    CMemFile file(input.data(), static_cast<UINT>(input.size()));
    try {
        CArchive ar(&file, CArchive::load, bufferSize);
        while (Step(ar, file)) {
        }
        ar.Close();
    } catch (const CException&) {
        // The framework's report of bad input: expected.
    }
    if (file.GetPosition() > file.GetLength())
        std::abort();
    return 0;
}

// Reads arbitrary bytes as a run of blob frames, into a blob and into a
// global-memory medium, from a file that can tell its length and from one
// that cannot, as a pipe. A failed read must leave the blob or the medium as
// it was; a successful one holds no more bytes than the input. No allocation
// may approach what a length field claims: the target sets libFuzzer's
// single-allocation limit low unless the command line sets one.
#include <vaskel/framework/mem_file.h>
#include <vaskel/value.h>

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

using namespace vaskel;

namespace {

// A memory file over the input that, when it is to act as a pipe, cannot
// tell its length or position.
class InputFile : public CMemFile {
public:
    InputFile(std::vector<BYTE>& input, bool canTellLength)
        : CMemFile(input.data(), static_cast<UINT>(input.size())), m_canTellLength(canTellLength) {}
    ULONGLONG GetLength() const override {
        if (!m_canTellLength)
            AfxThrowFileException(CFileException::badSeek);
        return CMemFile::GetLength();
    }
    ULONGLONG GetPosition() const override {
        if (!m_canTellLength)
            AfxThrowFileException(CFileException::badSeek);
        return CMemFile::GetPosition();
    }

private:
    bool m_canTellLength;
};

void ReadBlobs(std::vector<BYTE>& input, bool canTellLength) {
    InputFile file(input, canTellLength);
    CBlob blob("kept", 4);
    for (;;) {
        const CBlob before = blob;
        if (!blob.ReadFromFile(file)) {
            if (blob.GetData() != before.GetData() || !(blob == before))
                std::abort();
            return;
        }
        if (blob.GetSize() > input.size())
            std::abort();
        // What was read writes back as the same frame.
        CMemFile copy;
        blob.WriteToFile(copy);
        copy.SeekToBegin();
        CBlob reread;
        if (!reread.ReadFromFile(copy) || !(reread == blob))
            std::abort();
    }
}

void ReadMedia(std::vector<BYTE>& input, bool canTellLength) {
    InputFile file(input, canTellLength);
    STGMEDIUM medium = CBlob("kept", 4).ToStgMedium();
    for (;;) {
        const STGMEDIUM before = medium;
        const CBlob held(medium);
        if (!CBlob::ReadFromFile(file, medium)) {
            if (std::memcmp(&before, &medium, sizeof medium) != 0 || !(CBlob(medium) == held))
                std::abort();
            break;
        }
        if (medium.tymed != TYMED_HGLOBAL ||
            (medium.hGlobal && GlobalSize(medium.hGlobal) > input.size()))
            std::abort();
    }
    CBlob::FreeStgMedium(medium);
}

} // namespace

extern "C" int LLVMFuzzerInitialize(int* argc, char*** argv) {
    for (int i = 1; i < *argc; ++i) {
        if (std::strncmp((*argv)[i], "-malloc_limit_mb=", 17) == 0)
            return 0;
    }
    // Inputs are small; a chunk of 64 KiB is the most a read may add to them.
    static std::vector<char*> arguments(*argv, *argv + *argc);
    static std::string limit = "-malloc_limit_mb=1";
    arguments.push_back(&limit[0]);
    arguments.push_back(nullptr);
    *argc += 1;
    *argv = arguments.data();
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    // A buffer of exactly the input's size, so any read beyond it is reported.
    std::vector<BYTE> input(data, data + size);
    for (bool canTellLength : {true, false}) {
        ReadBlobs(input, canTellLength);
        ReadMedia(input, canTellLength);
    }
    return 0;
}

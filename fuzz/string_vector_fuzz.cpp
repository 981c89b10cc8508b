// Loads arbitrary bytes as an archived string vector. A failure must be an
// archive exception that leaves the vector as it was; a load must never hold
// more strings than the input has bytes, whatever count the input claims.
#include <vaskel/framework/archive.h>
#include <vaskel/framework/mem_file.h>
#include <vaskel/text.h>

#include <cstdint>
#include <cstdlib>
#include <vector>

using namespace vaskel;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    // A buffer of exactly the input's size, so any read beyond it is reported.
    std::vector<BYTE> input(data, data + size);
    CMemFile file(input.data(), static_cast<UINT>(input.size()));
    CStringVector vector(1, "kept");
    try {
        CArchive ar(&file, CArchive::load);
        vector.Serialize(ar);
        ar.Close();
    } catch (const CArchiveException&) {
        if (vector.size() != 1 || vector[0] != "kept")
            std::abort();
        return 0;
    }
    if (vector.size() - 1 > size || vector[0] != "kept")
        std::abort();
    return 0;
}

// Decodes arbitrary bytes as Base64 text. The text has no terminating NUL, so
// reading past its length shows as an overflow; the terminated form must read
// the same up to the first NUL; the bytes decoded must survive encoding and
// decoding again.
#include <vaskel/value.h>

#include <climits>
#include <cstdint>
#include <cstdlib>
#include <vector>

using vaskel::CBlob;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    if (size > INT_MAX)
        return 0;
    std::vector<char> bounded(data, data + size);
    CBlob blob;
    if (!blob.FromString(bounded.data(), static_cast<int>(size)))
        std::abort();
    if (blob.GetSize() > size / 4 * 3 + 2)
        std::abort();

    std::vector<char> terminated(data, data + size);
    terminated.push_back('\0');
    CBlob fromTerminated;
    if (!fromTerminated.FromString(terminated.data()) || !(fromTerminated == blob))
        std::abort();

    CBlob again;
    if (!again.FromString(blob.ToString()) || !(again == blob))
        std::abort();
    return 0;
}

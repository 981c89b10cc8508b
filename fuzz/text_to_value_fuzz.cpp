// Reads arbitrary bytes as flags and numbers. The length-bounded readers get
// a copy without a terminating NUL, so reading past the given length shows as
// an overflow; the flag reader gets a terminated copy.
#include <vaskel/text.h>

#include <cstdint>
#include <cstring>
#include <vector>

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    std::vector<char> bounded(data, data + size);
    const char* text = bounded.empty() ? "" : bounded.data();
    DWORD length = static_cast<DWORD>(size);
    vaskel::AsInteger(text, length);
    vaskel::AsULong(text, length);
    std::vector<char> terminated(data, data + size);
    terminated.push_back('\0');
    vaskel::AsBool(terminated.data());
    return 0;
}

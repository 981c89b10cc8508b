// The same pseudo-random bytes in every run, so that runs compare.
#pragma once

#include <cstddef>
#include <vector>

inline std::vector<unsigned char> RandomBytes(std::size_t count) {
    std::vector<unsigned char> bytes(count);
    unsigned int state = 12345;
    for (unsigned char& byte : bytes) {
        state = state * 1103515245u + 12345u;
        byte = static_cast<unsigned char>(state >> 16);
    }
    return bytes;
}

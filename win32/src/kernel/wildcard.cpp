#include "wildcard.h"

namespace vkw32 {
namespace {

char Folded(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

} // namespace

bool MatchesWildcard(const char* name, const std::string& pattern) {
    const char* p = pattern == "*.*" ? "*" : pattern.c_str();
    // Greedy matching that, on a mismatch, lets the last '*' take one more
    // character: linear in practice and never worse than name times pattern.
    const char* star = nullptr;
    const char* resume = nullptr;
    while (*name != '\0') {
        if (*p == '*') {
            star = ++p;
            resume = name;
        } else if (*p == '?') {
            // One character: a UTF-8 sequence with its continuation bytes.
            ++p;
            ++name;
            while ((static_cast<unsigned char>(*name) & 0xC0) == 0x80)
                ++name;
        } else if (*p != '\0' && Folded(*p) == Folded(*name)) {
            ++p;
            ++name;
        } else if (star != nullptr) {
            p = star;
            name = ++resume;
        } else {
            return false;
        }
    }
    while (*p == '*')
        ++p;
    return *p == '\0';
}

} // namespace vkw32

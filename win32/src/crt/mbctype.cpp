// Case mapping and classification of multibyte characters. In the UTF-8 code
// page only the single-byte (ASCII) characters have a case mapping or a class
// at this level; any other value is returned unchanged, as for characters
// without case, and is not white space.
#include <vkwin32/crt.h>

extern "C" unsigned int _mbctolower(unsigned int c) {
    return c >= 'A' && c <= 'Z' ? c + ('a' - 'A') : c;
}

extern "C" unsigned int _mbctoupper(unsigned int c) {
    return c >= 'a' && c <= 'z' ? c - ('a' - 'A') : c;
}

extern "C" int _ismbcspace(unsigned int c) {
    return c == ' ' || (c >= '\t' && c <= '\r');
}

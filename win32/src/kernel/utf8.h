// Decoding of UTF-8, the ANSI code page here, shared by the code-page
// conversions and the multibyte string functions.
#pragma once

namespace vkw32 {

inline bool InRange(unsigned char c, unsigned char low, unsigned char high) {
    return c >= low && c <= high;
}

// Decodes one code point at text[i], advancing i. Returns false for an
// ill-formed sequence, of which i then skips the maximal subpart.
inline bool DecodeUtf8(const unsigned char* text, int length, int& i, char32_t& cp) {
    unsigned char lead = text[i++];
    if (lead < 0x80) {
        cp = lead;
        return true;
    }
    int trail;
    unsigned char low = 0x80, high = 0xBF;
    if (InRange(lead, 0xC2, 0xDF)) {
        trail = 1;
        cp = lead & 0x1F;
    } else if (InRange(lead, 0xE0, 0xEF)) {
        trail = 2;
        cp = lead & 0x0F;
        if (lead == 0xE0)
            low = 0xA0;
        else if (lead == 0xED)
            high = 0x9F;
    } else if (InRange(lead, 0xF0, 0xF4)) {
        trail = 3;
        cp = lead & 0x07;
        if (lead == 0xF0)
            low = 0x90;
        else if (lead == 0xF4)
            high = 0x8F;
    } else {
        return false;
    }
    for (int k = 0; k < trail; ++k) {
        if (i >= length || !InRange(text[i], low, high))
            return false;
        cp = (cp << 6) | (text[i++] & 0x3F);
        low = 0x80;
        high = 0xBF;
    }
    return true;
}

} // namespace vkw32

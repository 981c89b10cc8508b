// GUIDs as text: "{XXXXXXXX-XXXX-XXXX-XXXX-XXXXXXXXXXXX}", 38 characters and
// a NUL. Written in upper case; read in either case, and a text that is not
// in the form is tried as a ProgID, as the system does.
#include "guid_text.h"

#include <vkwin32/objbase.h>

#include <cstring>

namespace {

constexpr char kHexDigits[] = "0123456789ABCDEF";

// Where each of the 16 bytes of a GUID, in the order of its fields, sits in
// the text; the fields are numbers, so their bytes read most significant first.
constexpr int kBytePositions[16] = {1, 3, 5, 7, 10, 12, 15, 17, 20, 22, 25, 27, 29, 31, 33, 35};

void GuidBytes(const GUID& guid, unsigned char (&bytes)[16]) {
    bytes[0] = static_cast<unsigned char>(guid.Data1 >> 24);
    bytes[1] = static_cast<unsigned char>(guid.Data1 >> 16);
    bytes[2] = static_cast<unsigned char>(guid.Data1 >> 8);
    bytes[3] = static_cast<unsigned char>(guid.Data1);
    bytes[4] = static_cast<unsigned char>(guid.Data2 >> 8);
    bytes[5] = static_cast<unsigned char>(guid.Data2);
    bytes[6] = static_cast<unsigned char>(guid.Data3 >> 8);
    bytes[7] = static_cast<unsigned char>(guid.Data3);
    std::memcpy(bytes + 8, guid.Data4, 8);
}

int HexValue(OLECHAR c) {
    if (c >= u'0' && c <= u'9')
        return c - u'0';
    if (c >= u'A' && c <= u'F')
        return c - u'A' + 10;
    if (c >= u'a' && c <= u'f')
        return c - u'a' + 10;
    return -1;
}

} // namespace

namespace vkw32 {

void FormatGuid(const GUID& guid, OLECHAR (&text)[kGuidTextSize]) {
    unsigned char bytes[16];
    GuidBytes(guid, bytes);
    const char pattern[] = "{XXXXXXXX-XXXX-XXXX-XXXX-XXXXXXXXXXXX}";
    for (int i = 0; i < kGuidTextSize; ++i)
        text[i] = static_cast<unsigned char>(pattern[i]);
    for (int i = 0; i < 16; ++i) {
        text[kBytePositions[i]] = static_cast<unsigned char>(kHexDigits[bytes[i] >> 4]);
        text[kBytePositions[i] + 1] = static_cast<unsigned char>(kHexDigits[bytes[i] & 0xF]);
    }
}

bool ParseGuid(const OLECHAR* text, GUID& guid) {
    // Checked in order, so the scan stops at the first character out of
    // place and never passes a NUL.
    const char pattern[] = "{XXXXXXXX-XXXX-XXXX-XXXX-XXXXXXXXXXXX}";
    unsigned char bytes[16] = {};
    for (int i = 0; i < kGuidTextSize - 1; ++i) {
        if (pattern[i] != 'X') {
            if (text[i] != static_cast<OLECHAR>(pattern[i]))
                return false;
            continue;
        }
        const int digit = HexValue(text[i]);
        if (digit < 0)
            return false;
        // Positions of the digits, counted over the pattern, give the byte.
        int byteIndex = 0;
        while (kBytePositions[byteIndex] != i && kBytePositions[byteIndex] + 1 != i)
            ++byteIndex;
        bytes[byteIndex] = static_cast<unsigned char>(bytes[byteIndex] << 4 | digit);
    }
    if (text[kGuidTextSize - 1] != u'\0')
        return false;
    guid.Data1 = static_cast<std::uint32_t>(bytes[0]) << 24 |
                 static_cast<std::uint32_t>(bytes[1]) << 16 |
                 static_cast<std::uint32_t>(bytes[2]) << 8 | bytes[3];
    guid.Data2 = static_cast<std::uint16_t>(bytes[4] << 8 | bytes[5]);
    guid.Data3 = static_cast<std::uint16_t>(bytes[6] << 8 | bytes[7]);
    std::memcpy(guid.Data4, bytes + 8, 8);
    return true;
}

} // namespace vkw32

extern "C" INT WINAPI StringFromGUID2(REFGUID guid, LPOLESTR text, INT capacity) {
    if (!text || capacity < vkw32::kGuidTextSize)
        return 0;
    OLECHAR formatted[vkw32::kGuidTextSize];
    vkw32::FormatGuid(guid, formatted);
    std::memcpy(text, formatted, sizeof formatted);
    return vkw32::kGuidTextSize;
}

extern "C" HRESULT WINAPI StringFromCLSID(REFCLSID clsid, LPOLESTR* text) {
    if (!text)
        return E_INVALIDARG;
    *text = static_cast<LPOLESTR>(CoTaskMemAlloc(vkw32::kGuidTextSize * sizeof(OLECHAR)));
    if (!*text)
        return E_OUTOFMEMORY;
    StringFromGUID2(clsid, *text, vkw32::kGuidTextSize);
    return S_OK;
}

extern "C" HRESULT WINAPI CLSIDFromString(LPCOLESTR text, LPCLSID clsid) {
    if (!clsid)
        return E_INVALIDARG;
    if (!text) {
        *clsid = GUID{};
        return S_OK;
    }
    GUID parsed;
    if (text[0] == u'{') {
        if (!vkw32::ParseGuid(text, parsed))
            return CO_E_CLASSSTRING;
        *clsid = parsed;
        return S_OK;
    }
    const HRESULT hr = CLSIDFromProgID(text, &parsed);
    *clsid = SUCCEEDED(hr) ? parsed : GUID{};
    return hr;
}

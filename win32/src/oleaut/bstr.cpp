#include <vkwin32/oleauto.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <limits>

namespace {

typedef std::uint32_t ByteCount;

ByteCount* Header(BSTR text) {
    return reinterpret_cast<ByteCount*>(text) - 1;
}

// The terminator: a NUL OLECHAR, after a NUL byte when the count is odd, so
// that the text reads as terminated both as bytes and as characters.
std::size_t Terminator(std::size_t bytes) {
    return sizeof(OLECHAR) + (bytes & 1);
}

// A string of `bytes` bytes whose content the caller fills in; null when the
// count and the block cannot be counted in 32 bits or memory is short.
BSTR Allocate(std::size_t bytes) {
    if (bytes > std::numeric_limits<ByteCount>::max() - sizeof(ByteCount) - Terminator(1))
        return nullptr;
    auto* block =
        static_cast<ByteCount*>(std::malloc(sizeof(ByteCount) + bytes + Terminator(bytes)));
    if (!block)
        return nullptr;
    *block = static_cast<ByteCount>(bytes);
    std::memset(reinterpret_cast<char*>(block + 1) + bytes, 0, Terminator(bytes));
    return reinterpret_cast<BSTR>(block + 1);
}

// Copies `bytes` bytes from `source`, or zeroes them when it is null.
BSTR AllocateCopy(const void* source, std::size_t bytes) {
    BSTR result = Allocate(bytes);
    if (!result)
        return nullptr;
    if (source)
        std::memcpy(result, source, bytes);
    else
        std::memset(result, 0, bytes);
    return result;
}

std::size_t Characters(const OLECHAR* text) {
    std::size_t length = 0;
    while (text[length])
        ++length;
    return length;
}

} // namespace

extern "C" {

BSTR WINAPI SysAllocStringLen(const OLECHAR* text, UINT length) {
    return AllocateCopy(text, std::size_t{length} * sizeof(OLECHAR));
}

BSTR WINAPI SysAllocStringByteLen(LPCSTR bytes, UINT length) {
    return AllocateCopy(bytes, length);
}

BSTR WINAPI SysAllocString(const OLECHAR* text) {
    if (!text)
        return nullptr;
    return AllocateCopy(text, Characters(text) * sizeof(OLECHAR));
}

INT WINAPI SysReAllocStringLen(BSTR* string, const OLECHAR* text, UINT length) {
    if (!string)
        return FALSE;
    // The new string is built before the old one goes: the text may lie in it.
    const std::size_t bytes = std::size_t{length} * sizeof(OLECHAR);
    BSTR result = Allocate(bytes);
    if (!result)
        return FALSE;
    if (text) {
        std::memcpy(result, text, bytes);
    } else {
        const std::size_t kept = std::min<std::size_t>(bytes, SysStringByteLen(*string));
        if (kept)
            std::memcpy(result, *string, kept);
        std::memset(reinterpret_cast<char*>(result) + kept, 0, bytes - kept);
    }
    SysFreeString(*string);
    *string = result;
    return TRUE;
}

INT WINAPI SysReAllocString(BSTR* string, const OLECHAR* text) {
    if (!string)
        return FALSE;
    if (!text) {
        SysFreeString(*string);
        *string = nullptr;
        return TRUE;
    }
    const std::size_t length = Characters(text);
    if (length > std::numeric_limits<UINT>::max())
        return FALSE;
    return SysReAllocStringLen(string, text, static_cast<UINT>(length));
}

void WINAPI SysFreeString(BSTR text) {
    if (text)
        std::free(Header(text));
}

UINT WINAPI SysStringLen(BSTR text) {
    return text ? *Header(text) / sizeof(OLECHAR) : 0;
}

UINT WINAPI SysStringByteLen(BSTR text) {
    return text ? *Header(text) : 0;
}

} // extern "C"

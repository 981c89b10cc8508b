#include <vkwin32/oleauto.h>

#include <cstdlib>
#include <cstring>
#include <limits>

namespace {

// The byte count sits in the four bytes before the text.
std::uint32_t* Header(BSTR text) {
    return reinterpret_cast<std::uint32_t*>(text) - 1;
}

} // namespace

extern "C" {

BSTR WINAPI SysAllocStringLen(const OLECHAR* text, UINT length) {
    // The byte count and the allocation must both fit 32 bits.
    if (length >
        (std::numeric_limits<std::uint32_t>::max() - sizeof(std::uint32_t) - sizeof(OLECHAR)) /
            sizeof(OLECHAR))
        return nullptr;
    const std::size_t bytes = std::size_t{length} * sizeof(OLECHAR);
    auto* block =
        static_cast<std::uint32_t*>(std::malloc(sizeof(std::uint32_t) + bytes + sizeof(OLECHAR)));
    if (!block)
        return nullptr;
    *block = static_cast<std::uint32_t>(bytes);
    BSTR result = reinterpret_cast<BSTR>(block + 1);
    if (text)
        std::memcpy(result, text, bytes);
    else
        std::memset(result, 0, bytes);
    result[length] = 0;
    return result;
}

BSTR WINAPI SysAllocString(const OLECHAR* text) {
    if (!text)
        return nullptr;
    UINT length = 0;
    while (text[length])
        ++length;
    return SysAllocStringLen(text, length);
}

void WINAPI SysFreeString(BSTR text) {
    if (text)
        std::free(Header(text));
}

UINT WINAPI SysStringLen(BSTR text) {
    return text ? *Header(text) / sizeof(OLECHAR) : 0;
}

} // extern "C"

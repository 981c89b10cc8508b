#include "registry_path.h"

#include <vkwin32/winerror.h>

namespace vkw32 {

std::size_t Utf16Length(std::string_view text) {
    std::size_t length = 0;
    for (const char c : text) {
        const auto byte = static_cast<unsigned char>(c);
        if ((byte & 0xC0) != 0x80)
            ++length;
        if (byte >= 0xF0) // beyond the BMP: a surrogate pair
            ++length;
    }
    return length;
}

LONG SplitKeyPath(const char* path, std::vector<std::string_view>& names) {
    names.clear();
    if (path == nullptr)
        return ERROR_SUCCESS;
    if (*path == '\\')
        return ERROR_BAD_PATHNAME;
    const char* next = path;
    while (*next != '\0') {
        const char* start = next;
        while (*next != '\0' && *next != '\\')
            ++next;
        const std::string_view name(start, static_cast<std::size_t>(next - start));
        if (!name.empty()) {
            if (Utf16Length(name) > maxKeyNameLength)
                return ERROR_INVALID_PARAMETER;
            names.push_back(name);
        }
        while (*next == '\\')
            ++next;
    }
    return ERROR_SUCCESS;
}

} // namespace vkw32

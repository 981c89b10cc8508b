// Key paths and names as the registry functions take them.
#pragma once

#include <vkwin32/types.h>

#include <cstddef>
#include <string_view>
#include <vector>

namespace vkw32 {

// The longest key and value names, in UTF-16 units as the system counts them.
constexpr std::size_t maxKeyNameLength = 255;
constexpr std::size_t maxValueNameLength = 16383;

// The length of UTF-8 text in UTF-16 units; a malformed byte counts as one.
std::size_t Utf16Length(std::string_view text);

// The names along a relative key path (none for a null or empty path).
// Repeated and trailing backslashes separate nothing, as on Windows; a
// leading one gives ERROR_BAD_PATHNAME and a name past the limit
// ERROR_INVALID_PARAMETER.
LONG SplitKeyPath(const char* path, std::vector<std::string_view>& names);

} // namespace vkw32

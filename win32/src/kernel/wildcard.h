// The name patterns of directory searches.
#pragma once

#include <string>

namespace vkw32 {

// Whether name matches pattern, ignoring the case of ASCII letters: '*'
// stands for any run of characters, '?' for exactly one, and "*.*" for every
// name, with or without a dot, as Windows reads it.
bool MatchesWildcard(const char* name, const std::string& pattern);

} // namespace vkw32

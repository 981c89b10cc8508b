// GUID text shared by the functions that write and read class identifiers.
#pragma once

#include <vkwin32/types.h>

namespace vkw32 {

// "{XXXXXXXX-XXXX-XXXX-XXXX-XXXXXXXXXXXX}" and its NUL.
constexpr int kGuidTextSize = 39;

void FormatGuid(const GUID& guid, OLECHAR (&text)[kGuidTextSize]);
// The braced form only, in either case, ending at the closing brace.
bool ParseGuid(const OLECHAR* text, GUID& guid);

} // namespace vkw32

// Module handles of the current process.
#pragma once

#include <vkwin32/types.h>

#include <string>

namespace vkw32 {

// The file that holds a module: the program's for a null module or the
// program's handle, this library's for the system modules it stands in for.
// False (ERROR_INVALID_HANDLE) for a handle that names no module.
bool ModuleFilePath(HMODULE module, std::string& path);

} // namespace vkw32

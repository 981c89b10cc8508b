// The calling user's own directories, by the XDG base-directory rules.
#pragma once

#include <vkwin32/types.h>

#include <string>

namespace vkw32 {

// $HOME, else the home directory of the password database; empty when
// neither names one.
std::string HomeDirectory();

// The directory in the variable (XDG_DATA_HOME, XDG_CONFIG_HOME) when it
// holds an absolute path, else belowHome (".local/share") in the home
// directory; empty without a home directory.
std::string XdgBaseDirectory(const char* variable, const char* belowHome);

// Creates the directory and those missing on its way, 0700 whatever the
// umask; directories that exist stay as they are. A Win32 error code.
DWORD CreatePrivateDirectories(const std::string& path);

} // namespace vkw32

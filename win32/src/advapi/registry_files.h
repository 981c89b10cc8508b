// Where the registry's databases live, and their creation private to the user.
#pragma once

#include <vkwin32/types.h>

#include <string>

namespace vkw32 {

// VASKEL_REGISTRY, else $XDG_DATA_HOME/vaskel/registry, else
// ~/.local/share/vaskel/registry; read once per process. Empty when none of
// them can be found.
const std::string& RegistryDirectory();

// Creates the file, and the directories on its way, when missing: directories
// 0700 and the file 0600 whatever the umask, so the store's write-ahead log
// and shared-memory files, which take the database's mode, are private too.
LONG PrepareDatabaseFile(const std::string& directory, const std::string& file);

} // namespace vkw32

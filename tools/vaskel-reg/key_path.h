// Key paths as people write them: a root key, by its full name or its
// abbreviation, then the names of subkeys separated by backslashes.
#pragma once

#include <vaskel/win32.h>

#include <string>
#include <string_view>

namespace vaskel::regtool {

enum class RootKey { ClassesRoot, CurrentUser, LocalMachine };

// Registry files name roots in full only; the command line takes HKCU too.
enum class RootNames { FullOnly, FullOrShort };

struct KeyPath {
    RootKey root = RootKey::CurrentUser;
    std::string subkey; // empty for the root itself

    // The path with the root's full name, as it is printed and written to files.
    std::string Text() const;
    bool IsRoot() const { return subkey.empty(); }
    // The key's parent; the last name goes to name.
    KeyPath Parent(std::string& name) const;
};

HKEY RootHandle(RootKey root);
const char* RootName(RootKey root);

// Reads a key path; a single trailing backslash is dropped. A path without a
// known root, with an empty name between backslashes or a name over the
// system's 255 characters fails with a message saying so.
bool ParseKeyPath(std::string_view text, RootNames names, KeyPath& path, std::string& error);

} // namespace vaskel::regtool

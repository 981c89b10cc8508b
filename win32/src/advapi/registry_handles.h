// Registry key handles: the predefined roots, and keys opened through the
// process's handle table, each with the access it was opened with.
#pragma once

#include "registry_store.h"

#include <vkwin32/winreg.h>

namespace vkw32 {

// A key as an operation reaches it: its hive and that hive's connection in
// this process.
struct KeyRef {
    Hive hive;
    RegistryStore* store;
    KeyId id;
    REGSAM access;
};

bool IsPredefinedKey(HKEY key);

// What a handle names. Anything but a predefined key or an open registry key
// gives ERROR_INVALID_HANDLE; a store that cannot be opened gives its error.
LONG ResolveKey(HKEY key, KeyRef& ref);

HKEY InsertKeyHandle(const KeyRef& ref);

// ERROR_INVALID_HANDLE unless the handle is a registry key; closing a
// predefined key succeeds and changes nothing.
LONG CloseKeyHandle(HKEY key);

} // namespace vkw32

// The registry through its ANSI functions: keys that close themselves, values
// read whole, walks over a key's tree and the deletion of a whole tree. Every
// operation answers the system's error code.
#pragma once

#include "key_path.h"
#include "reg_value.h"

#include <vaskel/win32.h>

#include <functional>
#include <string>
#include <vector>

namespace vaskel::regtool {

class RegistryKey {
public:
    RegistryKey() = default;
    ~RegistryKey() { Close(); }
    RegistryKey(RegistryKey&& other) noexcept : m_key(other.m_key) { other.m_key = nullptr; }
    RegistryKey& operator=(RegistryKey&& other) noexcept;
    RegistryKey(const RegistryKey&) = delete;
    RegistryKey& operator=(const RegistryKey&) = delete;

    HKEY Handle() const { return m_key; }
    LSTATUS Open(const KeyPath& path, REGSAM access);
    LSTATUS Open(HKEY parent, const std::string& name, REGSAM access);
    // Opens the key, creating it and the keys above it when missing.
    LSTATUS Create(const KeyPath& path, REGSAM access);
    void Close();

private:
    HKEY m_key = nullptr;
};

LSTATUS ReadValue(HKEY key, const std::string& name, RegValue& value);
// The key's values and subkey names in the order the registry lists them.
LSTATUS ReadValues(HKEY key, std::vector<RegValue>& values);
LSTATUS ReadSubkeyNames(HKEY key, std::vector<std::string>& names);
LSTATUS WriteValue(HKEY key, const RegValue& value);

// Calls visit for the key and every key below it, each before its subkeys;
// a result other than ERROR_SUCCESS from visit stops the walk and is answered.
using KeyVisitor = std::function<LSTATUS(const KeyPath& path, HKEY key)>;
LSTATUS VisitTree(const KeyPath& start, const KeyVisitor& visit);

// Deletes the key with everything below it; ERROR_FILE_NOT_FOUND when missing,
// ERROR_ACCESS_DENIED for a root.
LSTATUS DeleteTree(const KeyPath& path);

// The system's message for a registry error code, as one sentence.
std::string ErrorText(LSTATUS status);

} // namespace vaskel::regtool

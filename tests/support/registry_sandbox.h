// Registry tests work below a scratch key of HKEY_CURRENT_USER that is
// removed afterwards. On POSIX the whole test program first points the store
// at a private directory, since the store reads its location once.
#pragma once

#include <vaskel/win32.h>

#include <atomic>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <system_error>

namespace vaskel_test {

#ifndef _WIN32
class PrivateRegistryStore {
public:
    PrivateRegistryStore() {
        const auto stamp = std::chrono::steady_clock::now().time_since_epoch().count();
        m_path =
            std::filesystem::temp_directory_path() / ("vaskel-registry-" + std::to_string(stamp));
        setenv("VASKEL_REGISTRY", m_path.string().c_str(), 1);
    }
    ~PrivateRegistryStore() {
        std::error_code ignored;
        std::filesystem::remove_all(m_path, ignored);
    }

private:
    std::filesystem::path m_path;
};

// Before main, so before anything opens the store.
inline PrivateRegistryStore privateRegistryStore;
#endif

// A fresh key "Software\vaskel-test-<n>" below HKEY_CURRENT_USER.
class ScratchKey {
public:
    ScratchKey() {
        static std::atomic<unsigned> counter{0};
        const auto stamp = std::chrono::steady_clock::now().time_since_epoch().count();
        m_path = "Software\\vaskel-test-" + std::to_string(stamp) + "-" + std::to_string(++counter);
        HKEY key = nullptr;
        if (RegCreateKeyExA(HKEY_CURRENT_USER, m_path.c_str(), 0, nullptr, REG_OPTION_NON_VOLATILE,
                            KEY_ALL_ACCESS, nullptr, &key, nullptr) == ERROR_SUCCESS)
            RegCloseKey(key);
    }
    ~ScratchKey() { Remove(HKEY_CURRENT_USER, m_path.c_str()); }
    ScratchKey(const ScratchKey&) = delete;
    ScratchKey& operator=(const ScratchKey&) = delete;

    const char* Path() const { return m_path.c_str(); }

private:
    static bool Remove(HKEY parent, const char* name) {
        HKEY key = nullptr;
        if (RegOpenKeyExA(parent, name, 0, KEY_ALL_ACCESS, &key) != ERROR_SUCCESS)
            return false;
        char child[256];
        DWORD length = sizeof child;
        bool removed = true;
        while (removed && RegEnumKeyExA(key, 0, child, &length, nullptr, nullptr, nullptr,
                                        nullptr) == ERROR_SUCCESS) {
            removed = Remove(key, child);
            length = sizeof child;
        }
        RegCloseKey(key);
        return RegDeleteKeyA(parent, name) == ERROR_SUCCESS;
    }

    std::string m_path;
};

} // namespace vaskel_test

// A private directory for one test, removed with everything in it afterwards.
#pragma once

#include <algorithm>
#include <atomic>
#include <chrono>
#include <filesystem>
#include <string>
#include <system_error>

namespace vaskel_test {

class TempDir {
public:
    TempDir() {
        static std::atomic<unsigned> counter{0};
        auto stamp = std::chrono::steady_clock::now().time_since_epoch().count();
        m_path = std::filesystem::temp_directory_path() /
                 ("vaskel-test-" + std::to_string(stamp) + "-" + std::to_string(++counter));
        std::filesystem::create_directories(m_path);
    }
    ~TempDir() {
        std::error_code ignored;
        std::filesystem::remove_all(m_path, ignored);
    }
    TempDir(const TempDir&) = delete;
    TempDir& operator=(const TempDir&) = delete;

    // The directory joined with a name by a backslash, as the library builds
    // paths on every platform.
    std::string File(const std::string& name) const { return m_path.string() + "\\" + name; }
    // The directory with backslashes only, as the library writes whole paths.
    std::string Win32Path() const {
        std::string path = m_path.string();
        std::replace(path.begin(), path.end(), '/', '\\');
        return path;
    }
    const std::filesystem::path& Path() const { return m_path; }

private:
    std::filesystem::path m_path;
};

} // namespace vaskel_test

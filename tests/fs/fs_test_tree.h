// A scratch directory for the file-system tests, named the way the library
// writes paths (backslashes only), and its content as the standard library
// sees it.
#pragma once

#include "support/temp_dir.h"

#include <vaskel/framework/string.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

namespace vaskel_test {

class TestTree {
public:
    // The root, or a path below it given with backslashes.
    vaskel::CString Path(const std::string& below = "") const {
        return (below.empty() ? m_dir.Win32Path() : m_dir.Win32Path() + "\\" + below).c_str();
    }
    std::filesystem::path Native(std::string below) const {
        std::replace(below.begin(), below.end(), '\\', '/');
        return m_dir.Path() / below;
    }
    void MakeDirectory(const std::string& below) const {
        std::filesystem::create_directories(Native(below));
    }
    void Put(const std::string& below, const std::string& contents = "") const {
        std::filesystem::create_directories(Native(below).parent_path());
        std::ofstream(Native(below), std::ios::binary) << contents;
    }
    bool Exists(const std::string& below) const { return std::filesystem::exists(Native(below)); }
    // Every entry below the root, '/'-separated, directories with a
    // trailing '/', sorted.
    std::vector<std::string> Entries() const {
        std::vector<std::string> entries;
        for (const auto& entry : std::filesystem::recursive_directory_iterator(m_dir.Path())) {
            std::string name = entry.path().lexically_relative(m_dir.Path()).generic_string();
            if (entry.is_directory())
                name += '/';
            entries.push_back(name);
        }
        std::sort(entries.begin(), entries.end());
        return entries;
    }

private:
    TempDir m_dir;
};

} // namespace vaskel_test

// Directory searches as Windows documents them: wildcard patterns without
// regard to case, "." and "..", the errors of missing paths and of the end,
// and what each entry reports.
#include "support/temp_dir.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;

using Names = std::vector<std::string>;

class FindFileTest : public ::testing::Test {
protected:
    void SetUp() override {
        for (const char* name : {"a.txt", "B.TXT", "noext", "c.log", "[a].txt"})
            Put(m_dir.Path() / name, "12345");
        fs::create_directories(m_dir.Path() / "sub");
        Put(m_dir.Path() / "sub" / "inner.txt", "");
    }
    static void Put(const fs::path& file, const std::string& contents) {
        std::ofstream(file, std::ios::binary) << contents;
    }
    std::string Path(const std::string& name) const { return m_dir.File(name); }

    // Every name the search reports, sorted; the search must end with
    // ERROR_NO_MORE_FILES. A failed start gives its last error alone.
    Names Find(const std::string& pattern, DWORD* startError = nullptr) const {
        WIN32_FIND_DATAA data;
        HANDLE search = FindFirstFileA(Path(pattern).c_str(), &data);
        if (startError)
            *startError = search == INVALID_HANDLE_VALUE ? GetLastError() : 0;
        Names names;
        if (search == INVALID_HANDLE_VALUE)
            return names;
        do
            names.push_back(data.cFileName);
        while (FindNextFileA(search, &data));
        EXPECT_EQ(GetLastError(), DWORD(ERROR_NO_MORE_FILES));
        EXPECT_TRUE(FindClose(search));
        std::sort(names.begin(), names.end());
        return names;
    }
    DWORD StartError(const std::string& pattern) const {
        DWORD error = 0;
        Find(pattern, &error);
        return error;
    }

    vaskel_test::TempDir m_dir;
};

TEST_F(FindFileTest, WildcardsIgnoreCase) {
    const Names all = {".", "..", "B.TXT", "[a].txt", "a.txt", "c.log", "noext", "sub"};
    EXPECT_EQ(Find("*"), all);
    // "*.*" matches names without a dot too.
    EXPECT_EQ(Find("*.*"), all);
    EXPECT_EQ(Find("*.txt"), (Names{"B.TXT", "[a].txt", "a.txt"}));
    // Brackets are characters of names, not sets.
    EXPECT_EQ(Find("[a].*"), (Names{"[a].txt"}));
    EXPECT_EQ(Find("?.TxT"), (Names{"B.TXT", "a.txt"}));
    EXPECT_EQ(Find("*e*t"), (Names{"noext"}));
    EXPECT_EQ(Find("c*.l?g"), (Names{"c.log"}));
    EXPECT_EQ(Find("NOEXT"), (Names{"noext"}));
    EXPECT_EQ(Find("sub"), (Names{"sub"}));
    EXPECT_EQ(Find("sub\\*.txt"), (Names{"inner.txt"}));
    EXPECT_EQ(Find("sub\\*"), (Names{".", "..", "inner.txt"}));
}

TEST_F(FindFileTest, NoMatchAndMissingDirectoriesAreToldApart) {
    EXPECT_EQ(StartError("??.txt"), DWORD(ERROR_FILE_NOT_FOUND));
    EXPECT_EQ(StartError("*.none"), DWORD(ERROR_FILE_NOT_FOUND));
    EXPECT_EQ(StartError("gone"), DWORD(ERROR_FILE_NOT_FOUND));
    EXPECT_EQ(StartError("none\\*"), DWORD(ERROR_PATH_NOT_FOUND));
    EXPECT_EQ(StartError("none\\deeper\\*"), DWORD(ERROR_PATH_NOT_FOUND));
    // A file searched as a directory is no empty result. Windows documents
    // no code for it (Wine says ERROR_INVALID_NAME); here it is the one
    // RemoveDirectory gives for a file.
    const DWORD notDirectory = StartError("a.txt\\*");
    EXPECT_NE(notDirectory, 0u);
    EXPECT_NE(notDirectory, DWORD(ERROR_FILE_NOT_FOUND));
#ifndef _WIN32
    EXPECT_EQ(notDirectory, DWORD(ERROR_DIRECTORY));
#endif
    // A name that ends with a separator names no entry.
    EXPECT_EQ(StartError("sub\\"), DWORD(ERROR_FILE_NOT_FOUND));
}

TEST_F(FindFileTest, EntriesReportSizeAttributesAndTimes) {
    fs::permissions(m_dir.Path() / "c.log",
                    fs::perms::owner_write | fs::perms::group_write | fs::perms::others_write,
                    fs::perm_options::remove);
    WIN32_FIND_DATAA data;
    for (const char* name : {"a.txt", "c.log", "sub"}) {
        SCOPED_TRACE(name);
        HANDLE search = FindFirstFileA(Path(name).c_str(), &data);
        ASSERT_NE(search, INVALID_HANDLE_VALUE);
        EXPECT_FALSE(FindNextFileA(search, &data)); // one entry only, and data kept
        EXPECT_EQ(GetLastError(), DWORD(ERROR_NO_MORE_FILES));
        EXPECT_TRUE(FindClose(search));
        EXPECT_STREQ(data.cFileName, name);
        WIN32_FILE_ATTRIBUTE_DATA status;
        ASSERT_TRUE(GetFileAttributesExA(Path(name).c_str(), GetFileExInfoStandard, &status));
        EXPECT_EQ(data.dwFileAttributes, status.dwFileAttributes);
        EXPECT_EQ(data.nFileSizeLow, status.nFileSizeLow);
        EXPECT_EQ(data.nFileSizeHigh, 0u);
        EXPECT_EQ(data.ftLastWriteTime.dwLowDateTime, status.ftLastWriteTime.dwLowDateTime);
        EXPECT_EQ(data.ftLastWriteTime.dwHighDateTime, status.ftLastWriteTime.dwHighDateTime);
    }
    EXPECT_NE(data.dwFileAttributes & FILE_ATTRIBUTE_DIRECTORY, 0u); // "sub", the last one
    HANDLE search = FindFirstFileA(Path("a.txt").c_str(), &data);
    ASSERT_NE(search, INVALID_HANDLE_VALUE);
    FindClose(search);
    EXPECT_EQ(data.nFileSizeLow, 5u);
    EXPECT_EQ(data.dwFileAttributes & (FILE_ATTRIBUTE_DIRECTORY | FILE_ATTRIBUTE_READONLY), 0u);
    EXPECT_EQ(GetFileAttributesA(Path("c.log").c_str()) & FILE_ATTRIBUTE_READONLY,
              DWORD(FILE_ATTRIBUTE_READONLY));
    // Windows removes the directory only once the attribute is cleared.
    fs::permissions(m_dir.Path() / "c.log", fs::perms::owner_write, fs::perm_options::add);
}

TEST_F(FindFileTest, EndAndBadHandlesFailCleanly) {
    WIN32_FIND_DATAA data;
    HANDLE search = FindFirstFileA(Path("a.txt").c_str(), &data);
    ASSERT_NE(search, INVALID_HANDLE_VALUE);
    for (int call = 0; call < 2; ++call) {
        EXPECT_FALSE(FindNextFileA(search, &data));
        EXPECT_EQ(GetLastError(), DWORD(ERROR_NO_MORE_FILES));
    }
    EXPECT_TRUE(FindClose(search));
    SetLastError(0);
    EXPECT_FALSE(FindNextFileA(INVALID_HANDLE_VALUE, &data));
    EXPECT_EQ(GetLastError(), DWORD(ERROR_INVALID_HANDLE));
    SetLastError(0);
    EXPECT_FALSE(FindClose(INVALID_HANDLE_VALUE));
    EXPECT_EQ(GetLastError(), DWORD(ERROR_INVALID_HANDLE));
#ifndef _WIN32
    // Windows's search handles point at its own records, so other values are
    // undefined there; here every handle is checked.
    HANDLE file = CreateFileA(Path("a.txt").c_str(), GENERIC_READ, 0, nullptr, OPEN_EXISTING,
                              FILE_ATTRIBUTE_NORMAL, nullptr);
    ASSERT_NE(file, INVALID_HANDLE_VALUE);
    for (HANDLE handle : {search, file, HANDLE(nullptr)}) {
        SetLastError(0);
        EXPECT_FALSE(FindNextFileA(handle, &data));
        EXPECT_EQ(GetLastError(), DWORD(ERROR_INVALID_HANDLE));
        SetLastError(0);
        EXPECT_FALSE(FindClose(handle));
        EXPECT_EQ(GetLastError(), DWORD(ERROR_INVALID_HANDLE));
    }
    char byte = 0;
    DWORD read = 0;
    EXPECT_TRUE(ReadFile(file, &byte, 1, &read, nullptr)); // FindClose left the file open
    EXPECT_EQ(byte, '1');
    EXPECT_TRUE(CloseHandle(file));
#endif
}

#ifndef _WIN32
// Windows needs a privilege to make symbolic links.
TEST_F(FindFileTest, LinksAreReparsePointsOfTheirTargetsKind) {
    fs::create_directory_symlink(m_dir.Path() / "sub", m_dir.Path() / "to-dir");
    fs::create_symlink(m_dir.Path() / "a.txt", m_dir.Path() / "to-file");
    fs::create_symlink(m_dir.Path() / "gone", m_dir.Path() / "dangling");
    const std::pair<const char*, DWORD> links[] = {
        {"to-dir", FILE_ATTRIBUTE_DIRECTORY}, {"to-file", 0}, {"dangling", 0}};
    for (const auto& [name, directory] : links) {
        SCOPED_TRACE(name);
        WIN32_FIND_DATAA data;
        HANDLE search = FindFirstFileA(Path(name).c_str(), &data);
        ASSERT_NE(search, INVALID_HANDLE_VALUE);
        FindClose(search);
        EXPECT_NE(data.dwFileAttributes & FILE_ATTRIBUTE_REPARSE_POINT, 0u);
        EXPECT_EQ(data.dwFileAttributes & FILE_ATTRIBUTE_DIRECTORY, directory);
        EXPECT_EQ(data.dwReserved0, IO_REPARSE_TAG_SYMLINK);
    }
    // A directory link goes as a directory does, without what it names.
    EXPECT_TRUE(RemoveDirectoryA(Path("to-dir").c_str()));
    EXPECT_TRUE(fs::exists(m_dir.Path() / "sub" / "inner.txt"));
    EXPECT_FALSE(RemoveDirectoryA(Path("to-file").c_str()));
    EXPECT_EQ(GetLastError(), DWORD(ERROR_DIRECTORY));
}
#endif

} // namespace

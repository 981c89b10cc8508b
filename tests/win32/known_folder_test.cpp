// Shell folder paths: the real folders, their creation on request, and the
// failures Windows documents for virtual and unknown folders.
#include "support/scoped_variable.h"
#include "support/temp_dir.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <filesystem>
#include <string>

namespace {

namespace fs = std::filesystem;

std::string FolderPath(int folder, HRESULT* result = nullptr) {
    char path[MAX_PATH] = "untouched";
    const HRESULT hr = SHGetFolderPathA(nullptr, folder, nullptr, SHGFP_TYPE_CURRENT, path);
    if (result)
        *result = hr;
    return path;
}

bool IsDirectory(const std::string& path) {
    const DWORD attributes = GetFileAttributesA(path.c_str());
    return attributes != INVALID_FILE_ATTRIBUTES && (attributes & FILE_ATTRIBUTE_DIRECTORY);
}

#ifndef _WIN32
using vaskel_test::ScopedVariable;

std::string Backslashed(std::string path) {
    for (char& c : path)
        if (c == '/')
            c = '\\';
    return path;
}
#endif

TEST(KnownFolder, UserFoldersAreDirectoriesWithoutTrailingBackslash) {
#ifndef _WIN32
    // The user's own folders stay untouched: the data folder is a scratch one.
    vaskel_test::TempDir dir;
    ScopedVariable data("XDG_DATA_HOME", dir.Path().string());
#endif
    for (int folder : {CSIDL_LOCAL_APPDATA, CSIDL_PERSONAL, CSIDL_PROFILE}) {
        SCOPED_TRACE(folder);
        HRESULT hr = E_UNEXPECTED;
        const std::string path = FolderPath(folder, &hr);
        EXPECT_EQ(hr, S_OK);
        ASSERT_FALSE(path.empty());
        EXPECT_NE(path.back(), '\\');
        EXPECT_TRUE(IsDirectory(path)) << path;
    }
}

TEST(KnownFolder, VirtualAndUnknownFoldersAreInvalid) {
    for (int folder : {CSIDL_DRIVES, CSIDL_NETWORK, CSIDL_BITBUCKET, 0x3F, 0xFF}) {
        SCOPED_TRACE(folder);
        HRESULT hr = S_OK;
        EXPECT_EQ(FolderPath(folder, &hr), "");
        EXPECT_EQ(hr, E_INVALIDARG);
    }
}

#ifndef _WIN32
TEST(KnownFolder, XdgDirectoriesAndHome) {
    vaskel_test::TempDir dir;
    const std::string home = dir.Path().string();
    ScopedVariable homeVariable("HOME", home);
    ScopedVariable data("XDG_DATA_HOME", home + "/data/");
    ScopedVariable config("XDG_CONFIG_HOME", "relative/is/ignored");
    fs::create_directories(home + "/data");
    fs::create_directories(home + "/.config");
    EXPECT_EQ(FolderPath(CSIDL_LOCAL_APPDATA), Backslashed(home + "/data"));
    EXPECT_EQ(FolderPath(CSIDL_APPDATA), Backslashed(home + "/.config"));
    EXPECT_EQ(FolderPath(CSIDL_PERSONAL), Backslashed(home));
    // Real folders that do not exist here.
    for (int folder : {CSIDL_WINDOWS, CSIDL_SYSTEM, CSIDL_PROGRAM_FILES, CSIDL_FONTS}) {
        HRESULT hr = S_OK;
        EXPECT_EQ(FolderPath(folder, &hr), "");
        EXPECT_EQ(hr, E_FAIL) << folder;
    }
    EXPECT_EQ(SHGetFolderPathA(nullptr, CSIDL_PERSONAL, nullptr, 0, nullptr), E_INVALIDARG);
}

TEST(KnownFolder, MissingFolderIsCreatedOnlyOnRequest) {
    vaskel_test::TempDir dir;
    const std::string missing = dir.Path().string() + "/a/b";
    ScopedVariable data("XDG_DATA_HOME", missing);
    HRESULT hr = S_OK;
    EXPECT_EQ(FolderPath(CSIDL_LOCAL_APPDATA, &hr), "");
    EXPECT_EQ(hr, HRESULT_FROM_WIN32(ERROR_FILE_NOT_FOUND));
    EXPECT_EQ(FolderPath(CSIDL_LOCAL_APPDATA | CSIDL_FLAG_DONT_VERIFY), Backslashed(missing));
    EXPECT_FALSE(fs::exists(missing));
    EXPECT_EQ(FolderPath(CSIDL_LOCAL_APPDATA | CSIDL_FLAG_CREATE, &hr), Backslashed(missing));
    EXPECT_EQ(hr, S_OK);
    ASSERT_TRUE(fs::is_directory(missing));
    // Private to the user, whatever the umask.
    EXPECT_EQ(fs::status(missing).permissions() & fs::perms::all, fs::perms::owner_all);
}
#endif

} // namespace

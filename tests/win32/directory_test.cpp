// Creating and removing directories, and the file functions met with
// directories and missing paths, as Windows documents them.
#include "support/temp_dir.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <string>

namespace {

namespace fs = std::filesystem;

class DirectoryTest : public ::testing::Test {
protected:
    std::string Path(const std::string& name) const { return m_dir.File(name); }
    fs::path Native(const std::string& name) const { return m_dir.Path() / name; }
    void Put(const fs::path& file) const { std::ofstream(file) << "data"; }
    bool IsDirectory(const std::string& name) const {
        const DWORD attributes = GetFileAttributesA(Path(name).c_str());
        return attributes != INVALID_FILE_ATTRIBUTES && (attributes & FILE_ATTRIBUTE_DIRECTORY);
    }
    // The last error of a call that failed; 0 for one that succeeded.
    static DWORD Failure(BOOL result) { return result ? 0 : GetLastError(); }

    vaskel_test::TempDir m_dir;
};

TEST_F(DirectoryTest, CreateDirectoryMakesOneLevel) {
    EXPECT_EQ(Failure(CreateDirectoryA(Path("made").c_str(), nullptr)), 0u);
    EXPECT_TRUE(IsDirectory("made"));
    EXPECT_EQ(Failure(CreateDirectoryA(Path("made").c_str(), nullptr)),
              DWORD(ERROR_ALREADY_EXISTS));
    Put(Native("file"));
    EXPECT_EQ(Failure(CreateDirectoryA(Path("file").c_str(), nullptr)),
              DWORD(ERROR_ALREADY_EXISTS));
    EXPECT_FALSE(IsDirectory("file"));
    // Missing directories on the way are not made.
    EXPECT_EQ(Failure(CreateDirectoryA(Path("none\\deeper").c_str(), nullptr)),
              DWORD(ERROR_PATH_NOT_FOUND));
    EXPECT_FALSE(fs::exists(Native("none")));
    EXPECT_EQ(Failure(CreateDirectoryA(Path("slashed\\").c_str(), nullptr)), 0u);
    EXPECT_TRUE(IsDirectory("slashed"));
}

TEST_F(DirectoryTest, RemoveDirectoryTakesEmptyDirectoriesOnly) {
    fs::create_directories(Native("full"));
    Put(Native("full") / "inside");
    EXPECT_EQ(Failure(RemoveDirectoryA(Path("full").c_str())), DWORD(ERROR_DIR_NOT_EMPTY));
    EXPECT_TRUE(fs::exists(Native("full") / "inside"));
    ASSERT_TRUE(DeleteFileA(Path("full\\inside").c_str()));
    EXPECT_EQ(Failure(RemoveDirectoryA(Path("full").c_str())), 0u);
    EXPECT_FALSE(fs::exists(Native("full")));

    Put(Native("file"));
    EXPECT_EQ(Failure(RemoveDirectoryA(Path("file").c_str())), DWORD(ERROR_DIRECTORY));
    EXPECT_TRUE(fs::exists(Native("file")));
    EXPECT_EQ(Failure(RemoveDirectoryA(Path("gone").c_str())), DWORD(ERROR_FILE_NOT_FOUND));
    EXPECT_EQ(Failure(RemoveDirectoryA(Path("none\\gone").c_str())), DWORD(ERROR_PATH_NOT_FOUND));
}

TEST_F(DirectoryTest, FileFunctionsMeetDirectories) {
    fs::create_directories(Native("dir"));
    Put(Native("dir") / "kept");
    // A directory is no file to delete.
    EXPECT_EQ(Failure(DeleteFileA(Path("dir").c_str())), DWORD(ERROR_ACCESS_DENIED));
    EXPECT_TRUE(IsDirectory("dir"));
    EXPECT_TRUE(IsDirectory("dir\\"));
    // A directory moves with its content, and never onto something that exists.
    EXPECT_EQ(Failure(MoveFileA(Path("dir").c_str(), Path("moved").c_str())), 0u);
    EXPECT_TRUE(fs::exists(Native("moved") / "kept"));
    EXPECT_FALSE(fs::exists(Native("dir")));
    fs::create_directories(Native("taken"));
    Put(Native("file"));
    for (const char* target : {"taken", "file"}) {
        SCOPED_TRACE(target);
        EXPECT_EQ(Failure(MoveFileA(Path("moved").c_str(), Path(target).c_str())),
                  DWORD(ERROR_ALREADY_EXISTS));
    }
    EXPECT_TRUE(fs::exists(Native("moved") / "kept"));
    EXPECT_TRUE(fs::is_empty(Native("taken")));
    // What is missing: the entry itself, or a directory on the way.
    for (const auto& [name, error] : {std::make_pair("gone", ERROR_FILE_NOT_FOUND),
                                      std::make_pair("none\\gone", ERROR_PATH_NOT_FOUND)}) {
        SCOPED_TRACE(name);
        EXPECT_EQ(GetFileAttributesA(Path(name).c_str()), INVALID_FILE_ATTRIBUTES);
        EXPECT_EQ(GetLastError(), DWORD(error));
        EXPECT_EQ(Failure(MoveFileA(Path(name).c_str(), Path("new").c_str())), DWORD(error));
    }
}

} // namespace

// FileSystem: existence tests, creating, emptying, deleting and renaming
// directories, unique names, empty files, known folders and test trees.
#include "fs/fs_test_tree.h"
#include "support/scoped_variable.h"

#include <vaskel/fs.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <cctype>
#include <filesystem>
#include <string>
#include <vector>

using namespace vaskel;

namespace {

namespace fs = std::filesystem;
using Entries = std::vector<std::string>;

class FileSystemTest : public ::testing::Test {
protected:
    vaskel_test::TestTree m_tree;
};

TEST_F(FileSystemTest, FilesAndDirectoriesAreToldApart) {
    m_tree.Put("file");
    m_tree.MakeDirectory("dir");
    EXPECT_TRUE(FileSystem::FileExists(m_tree.Path("file")));
    EXPECT_FALSE(FileSystem::FileExists(m_tree.Path("dir")));
    EXPECT_TRUE(FileSystem::DirectoryExists(m_tree.Path("dir")));
    EXPECT_TRUE(FileSystem::DirectoryExists(m_tree.Path("dir\\")));
    EXPECT_FALSE(FileSystem::DirectoryExists(m_tree.Path("file")));
    const CString gone = m_tree.Path("gone");
    for (const char* path : {gone.GetString(), "", static_cast<const char*>(nullptr)}) {
        EXPECT_FALSE(FileSystem::FileExists(path));
        EXPECT_FALSE(FileSystem::DirectoryExists(path));
    }
}

TEST_F(FileSystemTest, DirectoryHasFiles) {
    m_tree.MakeDirectory("empty");
    m_tree.Put("deep\\only\\dirs\\file");
    m_tree.Put("flat\\file");
    EXPECT_FALSE(FileSystem::DirectoryHasFiles(m_tree.Path("empty"), true));
    EXPECT_FALSE(FileSystem::DirectoryHasFiles(m_tree.Path("deep"), false));
    EXPECT_TRUE(FileSystem::DirectoryHasFiles(m_tree.Path("deep"), true));
    EXPECT_TRUE(FileSystem::DirectoryHasFiles(m_tree.Path("flat"), false));
    EXPECT_FALSE(FileSystem::DirectoryHasFiles(m_tree.Path("gone"), true));
    EXPECT_FALSE(FileSystem::DirectoryHasFiles("", true));
}

TEST_F(FileSystemTest, CreateNewDirectoryAndEnsure) {
    EXPECT_TRUE(FileSystem::CreateNewDirectory(m_tree.Path("a\\b\\c"), true));
    EXPECT_TRUE(m_tree.Exists("a/b/c"));
    // An existing directory is no new one, but it is ensured.
    EXPECT_FALSE(FileSystem::CreateNewDirectory(m_tree.Path("a\\b\\c"), true));
    EXPECT_TRUE(FileSystem::EnsureDirectoryExists(m_tree.Path("a\\b\\c"), false));
    // Without parents, a missing one fails and nothing is made.
    EXPECT_FALSE(FileSystem::CreateNewDirectory(m_tree.Path("x\\y"), false));
    EXPECT_FALSE(FileSystem::EnsureDirectoryExists(m_tree.Path("x\\y"), false));
    EXPECT_FALSE(m_tree.Exists("x"));
    EXPECT_TRUE(FileSystem::EnsureDirectoryExists(m_tree.Path("x\\y"), true));
    // A trailing backslash names the same directory, with the same parents.
    EXPECT_TRUE(FileSystem::CreateNewDirectory(m_tree.Path("t\\u\\"), true));
    EXPECT_TRUE(m_tree.Exists("t/u"));
    m_tree.Put("file");
    EXPECT_FALSE(FileSystem::CreateNewDirectory(m_tree.Path("file\\sub"), true));
    EXPECT_FALSE(FileSystem::CreateNewDirectory("", true));
    EXPECT_FALSE(FileSystem::CreateNewDirectory(nullptr, true));
}

TEST_F(FileSystemTest, DeleteDirectoryOnlyIfEmptyDeletesNothingElse) {
    m_tree.Put("full\\sub\\file", "x");
    m_tree.Put("full\\top");
    EXPECT_FALSE(FileSystem::DeleteDirectory(m_tree.Path("full"), true));
    EXPECT_EQ(m_tree.Entries(), (Entries{"full/", "full/sub/", "full/sub/file", "full/top"}));
    EXPECT_TRUE(FileSystem::DeleteDirectory(m_tree.Path("full"), false));
    EXPECT_EQ(m_tree.Entries(), Entries{});
    m_tree.MakeDirectory("empty");
    EXPECT_TRUE(FileSystem::DeleteDirectory(m_tree.Path("empty"), true));
    EXPECT_FALSE(FileSystem::DeleteDirectory(m_tree.Path("gone"), false));
}

TEST_F(FileSystemTest, DeleteDirectoryContentKeepsTheDirectory) {
    m_tree.Put("dir\\a\\b\\c");
    m_tree.Put("dir\\d");
    m_tree.MakeDirectory("dir\\e");
    m_tree.Put("beside");
    EXPECT_TRUE(FileSystem::DeleteDirectoryContent(m_tree.Path("dir")));
    EXPECT_EQ(m_tree.Entries(), (Entries{"beside", "dir/"}));
    EXPECT_TRUE(FileSystem::DeleteDirectoryContent(m_tree.Path("dir")));
    // What cannot be searched reports failure; an empty text searches nothing.
    EXPECT_FALSE(FileSystem::DeleteDirectoryContent(m_tree.Path("gone")));
    EXPECT_FALSE(FileSystem::DeleteDirectoryContent(m_tree.Path("beside")));
    EXPECT_FALSE(FileSystem::DeleteDirectoryContent(""));
    EXPECT_FALSE(FileSystem::DeleteDirectoryContent(nullptr));
    EXPECT_TRUE(m_tree.Exists("beside"));
}

TEST_F(FileSystemTest, DeleteDirectoryContentStopsAtTheFirstFailure) {
    m_tree.Put("dir\\locked", "keep");
    fs::permissions(m_tree.Native("dir/locked"), fs::perms::owner_read);
    EXPECT_FALSE(FileSystem::DeleteDirectoryContent(m_tree.Path("dir")));
    EXPECT_FALSE(FileSystem::DeleteDirectory(m_tree.Path("dir"), false));
    EXPECT_TRUE(m_tree.Exists("dir/locked"));
    fs::permissions(m_tree.Native("dir/locked"), fs::perms::owner_all);
}

TEST_F(FileSystemTest, DeleteDirectoryFilesByPattern) {
    for (const char* file :
         {"a.log", "b.txt", "sub\\c.log", "sub\\d.txt", "sub\\deeper\\e.LOG", "x.log\\keep.txt"})
        m_tree.Put(file);
    EXPECT_TRUE(FileSystem::DeleteDirectoryFiles(m_tree.Path(), "*.log", false));
    EXPECT_EQ(m_tree.Entries(), (Entries{"b.txt", "sub/", "sub/c.log", "sub/d.txt", "sub/deeper/",
                                         "sub/deeper/e.LOG", "x.log/", "x.log/keep.txt"}));
    // Recursive: the pattern chooses at the top level; a subdirectory it
    // names loses every file below it, the others are not visited, and
    // every directory stays.
    m_tree.Put("x.log\\inner\\f.txt");
    EXPECT_TRUE(FileSystem::DeleteDirectoryFiles(m_tree.Path(), "*.log", true));
    EXPECT_EQ(m_tree.Entries(), (Entries{"b.txt", "sub/", "sub/c.log", "sub/d.txt", "sub/deeper/",
                                         "sub/deeper/e.LOG", "x.log/", "x.log/inner/"}));
    // No match at all is no failure; a directory that is not there is.
    EXPECT_TRUE(FileSystem::DeleteDirectoryFiles(m_tree.Path(), "*.none", true));
    EXPECT_FALSE(FileSystem::DeleteDirectoryFiles(m_tree.Path("gone"), "*", true));
    EXPECT_FALSE(FileSystem::DeleteDirectoryFiles("", "*", true));
    // No pattern is every file; directories stay.
    EXPECT_TRUE(FileSystem::DeleteDirectoryFiles(m_tree.Path(), nullptr, false));
    EXPECT_EQ(m_tree.Entries(), (Entries{"sub/", "sub/c.log", "sub/d.txt", "sub/deeper/",
                                         "sub/deeper/e.LOG", "x.log/", "x.log/inner/"}));
    EXPECT_TRUE(FileSystem::DeleteDirectoryFiles(m_tree.Path(), true));
    EXPECT_EQ(m_tree.Entries(), (Entries{"sub/", "sub/deeper/", "x.log/", "x.log/inner/"}));
}

TEST_F(FileSystemTest, RenameDirectoryStaysInItsParent) {
    m_tree.Put("old\\content");
    m_tree.Put("file");
    m_tree.MakeDirectory("taken");
    EXPECT_FALSE(FileSystem::RenameDirectory(m_tree.Path("old"), "other\\x"));
    EXPECT_FALSE(FileSystem::RenameDirectory(m_tree.Path("old"), "..\\x"));
    EXPECT_FALSE(FileSystem::RenameDirectory(m_tree.Path("file"), "renamed"));
    EXPECT_FALSE(FileSystem::RenameDirectory(m_tree.Path("gone"), "renamed"));
    EXPECT_FALSE(FileSystem::RenameDirectory(m_tree.Path("old"), "taken"));
    EXPECT_EQ(m_tree.Entries(), (Entries{"file", "old/", "old/content", "taken/"}));
    EXPECT_TRUE(FileSystem::RenameDirectory(m_tree.Path("old"), "new"));
    EXPECT_TRUE(FileSystem::RenameDirectory(m_tree.Path("new\\"), "newer"));
    EXPECT_EQ(m_tree.Entries(), (Entries{"file", "newer/", "newer/content", "taken/"}));
}

TEST_F(FileSystemTest, SubDirectoryPathsInPreOrder) {
    ASSERT_TRUE(FileSystem::PopulateDirectoryTree(m_tree.Path(), 2, 2, 1, nullptr, nullptr));
    CStringArray paths;
    paths.Add("before");
    FileSystem::GetSubDirPathsRecurse(paths, m_tree.Path() + "\\");
    ASSERT_EQ(paths.GetSize(), 8);
    EXPECT_EQ(paths[0], "before");
    EXPECT_EQ(paths[1], m_tree.Path());
    // Each directory before its subdirectories, one backslash between names.
    std::vector<std::string> relative;
    for (INT_PTR i = 2; i < paths.GetSize(); ++i)
        relative.push_back(paths[i].Mid(m_tree.Path().GetLength() + 1).GetString());
    for (size_t i = 0; i < relative.size(); ++i) {
        const std::string& path = relative[i];
        const size_t slash = path.rfind('\\');
        if (slash != std::string::npos) {
            const auto parent = std::find(relative.begin(), relative.end(), path.substr(0, slash));
            ASSERT_NE(parent, relative.end()) << path;
            EXPECT_LT(parent - relative.begin(), static_cast<std::ptrdiff_t>(i)) << path;
        }
    }
    std::sort(relative.begin(), relative.end());
    EXPECT_EQ(relative, (Entries{"_dir1", "_dir1\\_dir1", "_dir1\\_dir2", "_dir2", "_dir2\\_dir1",
                                 "_dir2\\_dir2"}));
    CStringArray none;
    FileSystem::GetSubDirPathsRecurse(none, "");
    EXPECT_EQ(none.GetSize(), 0);
}

TEST_F(FileSystemTest, BuildUniqueDirectoryName) {
    const CString parent = m_tree.Path();
    EXPECT_EQ(FileSystem::BuildUniqueDirectoryName(parent, "job"), "job");
    m_tree.Put("job");
    EXPECT_EQ(FileSystem::BuildUniqueDirectoryName(parent, "job"), "job"); // a file takes no name
    fs::remove(m_tree.Native("job"));
    m_tree.MakeDirectory("job");
    m_tree.MakeDirectory("job0");
    EXPECT_EQ(FileSystem::BuildUniqueDirectoryName(parent, "job"), "job1");
    EXPECT_EQ(FileSystem::BuildUniqueDirectoryName(parent, "j*b"), "");
    // The default base name: "temp" and 16 upper-case hexadecimal digits.
    const std::string generated = FileSystem::BuildUniqueDirectoryName(parent, nullptr).GetString();
    ASSERT_EQ(generated.size(), 20u) << generated;
    EXPECT_EQ(generated.substr(0, 4), "temp");
    for (char c : generated.substr(4))
        EXPECT_TRUE(std::isdigit(static_cast<unsigned char>(c)) || (c >= 'A' && c <= 'F'));
}

TEST_F(FileSystemTest, BuildUniqueDirectoryNameGivesTheLastCandidateWhenAllAreTaken) {
    m_tree.MakeDirectory("n");
    for (int i = 0; i < 1000; ++i)
        m_tree.MakeDirectory("n" + std::to_string(i));
    EXPECT_EQ(FileSystem::BuildUniqueDirectoryName(m_tree.Path(), "n"), "n999");
}

TEST_F(FileSystemTest, BuildUniqueDirectoryNameDefaultsToLocalApplicationData) {
#ifndef _WIN32
    // The user's own folder stays untouched.
    vaskel_test::ScopedVariable data("XDG_DATA_HOME", m_tree.Native("appdata").string());
#endif
    const CString folder = FileSystem::GetKnownFolderPath(CSIDL_LOCAL_APPDATA | CSIDL_FLAG_CREATE);
    ASSERT_FALSE(folder.IsEmpty());
    EXPECT_TRUE(FileSystem::DirectoryExists(folder));
    const CString name = FileSystem::BuildUniqueDirectoryName(nullptr, "vaskel-unique");
    EXPECT_EQ(name.Left(13), "vaskel-unique");
    EXPECT_FALSE(FileSystem::DirectoryExists(folder + "\\" + name));
    EXPECT_EQ(FileSystem::GetKnownFolderPath(CSIDL_DRIVES), "");
}

TEST_F(FileSystemTest, CreateEmptyFileCreatesOrTruncates) {
    EXPECT_TRUE(FileSystem::CreateEmptyFile(m_tree.Path("new")));
    m_tree.Put("old", "contents");
    EXPECT_TRUE(FileSystem::CreateEmptyFile(m_tree.Path("old")));
    EXPECT_EQ(fs::file_size(m_tree.Native("new")), 0u);
    EXPECT_EQ(fs::file_size(m_tree.Native("old")), 0u);
    EXPECT_FALSE(FileSystem::CreateEmptyFile(m_tree.Path("gone\\new")));
    EXPECT_FALSE(FileSystem::CreateEmptyFile(nullptr));
}

TEST_F(FileSystemTest, PopulateDirectoryTree) {
    ASSERT_TRUE(FileSystem::PopulateDirectoryTree(m_tree.Path("root"), 2, 2, 1, nullptr, nullptr));
    EXPECT_EQ(
        m_tree.Entries(),
        (Entries{"root/", "root/_dir1/", "root/_dir1/_dir1/", "root/_dir1/_dir1/_file1",
                 "root/_dir1/_dir2/", "root/_dir1/_dir2/_file1", "root/_dir1/_file1", "root/_dir2/",
                 "root/_dir2/_dir1/", "root/_dir2/_dir1/_file1", "root/_dir2/_dir2/",
                 "root/_dir2/_dir2/_file1", "root/_dir2/_file1", "root/_file1"}));
    // At least one directory a level, own prefixes, and an existing root.
    ASSERT_TRUE(FileSystem::PopulateDirectoryTree(m_tree.Path("root"), 1, 0, 2, "d", "f"));
    EXPECT_TRUE(m_tree.Exists("root/d1/f2"));
    EXPECT_FALSE(m_tree.Exists("root/d2"));
    EXPECT_TRUE(m_tree.Exists("root/f2"));
    ASSERT_TRUE(FileSystem::PopulateDirectoryTree(m_tree.Path("flat"), 0, 5, 0, nullptr, nullptr));
    EXPECT_TRUE(fs::is_empty(m_tree.Native("flat")));
    EXPECT_FALSE(
        FileSystem::PopulateDirectoryTree(m_tree.Path("gone\\root"), 1, 1, 1, nullptr, nullptr));
}

} // namespace

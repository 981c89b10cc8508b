// CFileFind: the step protocol of FindNextFile, the current entry's name,
// path and status, and the root of the search.
#include "support/temp_dir.h"

#include <vaskel/framework/file_find.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

using namespace vaskel;

namespace {

class FileFindTest : public ::testing::Test {
protected:
    void SetUp() override {
        std::ofstream(m_dir.Path() / "one.txt") << "12345";
        std::ofstream(m_dir.Path() / "two.txt") << "";
        std::filesystem::create_directories(m_dir.Path() / "sub");
    }
    std::string Root() const { return m_dir.Win32Path(); }

    vaskel_test::TempDir m_dir;
};

TEST_F(FileFindTest, FindNextFileTellsWhetherAnotherEntryFollows) {
    CFileFind find;
    ASSERT_TRUE(find.FindFile(CString(Root().c_str()) + "\\*.txt"));
    // Nothing is current before the first step.
    EXPECT_EQ(find.GetFileName(), "");
    EXPECT_EQ(find.GetFilePath(), "");
    EXPECT_FALSE(find.IsDots());
    FILETIME time;
    EXPECT_FALSE(find.GetLastWriteTime(&time));
    std::vector<std::string> names;
    EXPECT_TRUE(find.FindNextFile()); // the first of two, another follows
    names.push_back(find.GetFileName().GetString());
    EXPECT_FALSE(find.FindNextFile()); // the second, the last one
    names.push_back(find.GetFileName().GetString());
    // A step past the end leaves the last entry current.
    EXPECT_FALSE(find.FindNextFile());
    EXPECT_EQ(find.GetFileName(), names.back().c_str());
    std::sort(names.begin(), names.end());
    EXPECT_EQ(names, (std::vector<std::string>{"one.txt", "two.txt"}));
    find.Close();
    EXPECT_EQ(find.GetFileName(), "");
    EXPECT_FALSE(find.FindNextFile());
}

TEST_F(FileFindTest, CurrentEntryStatus) {
    CFileFind find;
    ASSERT_TRUE(find.FindFile(CString(Root().c_str()) + "\\one.txt"));
    EXPECT_FALSE(find.FindNextFile());
    EXPECT_EQ(find.GetLength(), 5u);
    EXPECT_FALSE(find.IsDirectory());
    EXPECT_FALSE(find.IsDots());
    EXPECT_FALSE(find.MatchesMask(FILE_ATTRIBUTE_DIRECTORY | FILE_ATTRIBUTE_READONLY));
    WIN32_FILE_ATTRIBUTE_DATA status;
    ASSERT_TRUE(GetFileAttributesExA(find.GetFilePath(), GetFileExInfoStandard, &status));
    EXPECT_EQ(find.GetAttributes(), status.dwFileAttributes);
    FILETIME written;
    ASSERT_TRUE(find.GetLastWriteTime(&written));
    EXPECT_EQ(written.dwLowDateTime, status.ftLastWriteTime.dwLowDateTime);
    EXPECT_EQ(written.dwHighDateTime, status.ftLastWriteTime.dwHighDateTime);
    EXPECT_FALSE(find.GetLastWriteTime(nullptr));

    ASSERT_TRUE(find.FindFile(CString(Root().c_str()) + "\\*"));
    int dots = 0, directories = 0;
    for (bool more = true; more;) {
        more = find.FindNextFile();
        dots += find.IsDots();
        directories += find.IsDirectory() && !find.IsDots();
    }
    EXPECT_EQ(dots, 2);
    EXPECT_EQ(directories, 1);
}

TEST_F(FileFindTest, PathIsTheRootJoinedWithTheName) {
    const CString root(Root().c_str());
    // Trailing and doubled separators do not reach the root.
    for (const char* tail : {"\\one.txt", "\\\\one.txt", "/one.txt"}) {
        SCOPED_TRACE(tail);
        CFileFind find;
        ASSERT_TRUE(find.FindFile(root + tail));
        find.FindNextFile();
        EXPECT_EQ(find.GetRoot(), root);
        EXPECT_EQ(find.GetFilePath(), root + "\\one.txt");
    }
    // The root of the file system (of the current drive on Windows) keeps
    // its separator, and lists no "." and "..".
    CFileFind find;
    ASSERT_TRUE(find.FindFile("\\*"));
    EXPECT_EQ(find.GetRoot(), "\\");
    for (bool more = true; more;) {
        more = find.FindNextFile();
        EXPECT_FALSE(find.IsDots());
        EXPECT_EQ(find.GetFilePath(), "\\" + find.GetFileName());
    }
}

TEST_F(FileFindTest, FailedSearchesKeepTheSystemError) {
    CFileFind find;
    EXPECT_FALSE(find.FindFile(CString(Root().c_str()) + "\\none\\*"));
    EXPECT_EQ(GetLastError(), DWORD(ERROR_PATH_NOT_FOUND));
    EXPECT_FALSE(find.FindFile(CString(Root().c_str()) + "\\*.none"));
    EXPECT_EQ(GetLastError(), DWORD(ERROR_FILE_NOT_FOUND));
    EXPECT_FALSE(find.FindNextFile());
    EXPECT_EQ(find.GetRoot(), "");
    // The default pattern searches the current directory.
    EXPECT_TRUE(find.FindFile());
    EXPECT_EQ(find.GetRoot(), "");
}

} // namespace

// Tests of CFile on disk: reading, writing, seeking and resizing, the causes
// that failed opens and misuse report, status, renaming and removal.
#include <vaskel/framework/file.h>

#include "support/temp_dir.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <ctime>
#include <functional>
#include <string>

using namespace vaskel;

namespace {

void WriteFile(const std::string& path, const std::string& contents) {
    CFile file(path.c_str(), CFile::modeCreate | CFile::modeWrite);
    file.Write(contents.data(), static_cast<UINT>(contents.size()));
}

std::string ReadFile(const std::string& path) {
    CFile file(path.c_str(), CFile::modeRead | CFile::shareDenyNone);
    std::string contents(static_cast<size_t>(file.GetLength()) + 1, '\0');
    contents.resize(file.Read(&contents[0], static_cast<UINT>(contents.size())));
    return contents;
}

// The exception an action raises, or one with cause -1 when it raises none.
CFileException FileErrorOf(const std::function<void()>& action) {
    try {
        action();
    } catch (const CFileException& error) {
        return error;
    }
    return CFileException(-1);
}

class CFileTest : public ::testing::Test {
protected:
    vaskel_test::TempDir dir;
};

TEST_F(CFileTest, WritesReadsSeeksAndResizes) {
    std::string path = dir.File("data.bin");
    std::string data(300000, 'd');
    WriteFile(path, data);
    EXPECT_EQ(ReadFile(path), data);
    CFile file(path.c_str(), CFile::modeReadWrite | CFile::shareExclusive);
    EXPECT_EQ(file.Seek(-3, CFile::end), data.size() - 3);
    file.SetLength(2);
    file.SetLength(4);
    EXPECT_EQ(file.Seek(6, CFile::begin), 6u) << "past the end is a legal position";
    file.Write("x", 1);
    file.Close();
    EXPECT_EQ(ReadFile(path), std::string("dd\0\0\0\0x", 7));
}

TEST_F(CFileTest, OpenCreatesTruncatesOrReportsTheCause) {
    std::string path = dir.File("keep.txt");
    WriteFile(path, "original");
    CFile(path.c_str(), CFile::modeCreate | CFile::modeNoTruncate | CFile::modeWrite).Write("O", 1);
    EXPECT_EQ(ReadFile(path), "Original");
    CFile(path.c_str(), CFile::modeCreate | CFile::modeWrite);
    EXPECT_EQ(ReadFile(path), "") << "modeCreate alone truncates";

    std::string missing = dir.File("missing.bin");
    CFile file;
    CFileException error;
    EXPECT_FALSE(file.Open(missing.c_str(), CFile::modeRead, &error));
    EXPECT_EQ(error.m_cause, CFileException::fileNotFound);
    EXPECT_EQ(error.m_lOsError, static_cast<LONG>(ERROR_FILE_NOT_FOUND));
    CFileException thrown = FileErrorOf([&] { CFile(missing.c_str(), CFile::modeRead); });
    EXPECT_EQ(thrown.m_cause, CFileException::fileNotFound);
    std::string bad = dir.File("nowhere\\file.bin");
    EXPECT_FALSE(file.Open(bad.c_str(), CFile::modeCreate | CFile::modeWrite, &error));
    EXPECT_EQ(error.m_cause, CFileException::badPath);
    EXPECT_EQ(error.m_lOsError, static_cast<LONG>(ERROR_PATH_NOT_FOUND));
    CFile(missing.c_str(), CFile::modeCreate | CFile::modeNoTruncate | CFile::modeRead);
    EXPECT_EQ(ReadFile(missing), "") << "modeNoTruncate still creates";
}

TEST_F(CFileTest, MisuseRaisesItsCauseAndChangesNothing) {
    std::string path = dir.File("ro.txt");
    WriteFile(path, "abc");
    CFile file(path.c_str(), CFile::modeRead);
    file.Seek(2, CFile::begin);
    CFileException error = FileErrorOf([&] { file.Seek(-3, CFile::current); });
    EXPECT_EQ(error.m_cause, CFileException::badSeek);
    EXPECT_STREQ(error.m_strFileName, path.c_str());
    EXPECT_EQ(file.GetPosition(), 2u) << "a failed seek keeps the position";
    EXPECT_THROW(file.Seek(0, 7), CInvalidArgException);
    EXPECT_EQ(FileErrorOf([&] { file.Write("x", 1); }).m_cause, CFileException::accessDenied);
    file.Close();
    char buffer[4];
    EXPECT_EQ(FileErrorOf([&] { file.Read(buffer, 1); }).m_cause, CFileException::invalidFile);
    EXPECT_EQ(FileErrorOf([&] { file.SetLength(1); }).m_cause, CFileException::invalidFile);
}

TEST_F(CFileTest, StatusRenameAndRemove) {
    std::string from = dir.File("from.txt");
    std::string to = dir.File("to.txt");
    WriteFile(from, "12345");
    CFileStatus status;
    ASSERT_TRUE(CFile::GetStatus(from.c_str(), status));
    LONGLONG now = static_cast<LONGLONG>(std::time(nullptr));
    EXPECT_LT(std::abs(status.m_mtime - now), 24 * 3600) << "seconds since 1970";
    EXPECT_FALSE(CFile::GetStatus(std::string(MAX_PATH + 10, 'a').c_str(), status));
    CFile::Rename(from.c_str(), to.c_str());
    WriteFile(from, "other");
    CFileException error = FileErrorOf([&] { CFile::Rename(from.c_str(), to.c_str()); });
    EXPECT_EQ(error.m_cause, CFileException::accessDenied) << "a rename never replaces";
    EXPECT_EQ(ReadFile(to), "12345");
    CFile::Remove(from.c_str());
    error = FileErrorOf([&] { CFile::Remove(from.c_str()); });
    EXPECT_EQ(error.m_cause, CFileException::fileNotFound);
    EXPECT_STREQ(error.m_strFileName, from.c_str());
}

} // namespace

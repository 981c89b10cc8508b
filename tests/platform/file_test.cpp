#include <vaskel/framework/file.h>

#include "support/temp_dir.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <ctime>
#include <functional>
#include <string>
#include <vector>

using vaskel::CFile;
using vaskel::CFileException;
using vaskel::CFileStatus;

namespace {

void WriteFile(const std::string& path, const std::string& contents) {
    CFile file(path.c_str(), CFile::modeCreate | CFile::modeWrite);
    file.Write(contents.data(), static_cast<UINT>(contents.size()));
}

std::string ReadFile(const std::string& path) {
    CFile file(path.c_str(), CFile::modeRead | CFile::shareDenyNone);
    std::string contents(static_cast<size_t>(file.GetLength()), '\0');
    if (!contents.empty()) {
        EXPECT_EQ(file.Read(&contents[0], static_cast<UINT>(contents.size())), contents.size());
    }
    return contents;
}

bool Exists(const std::string& path) {
    CFileStatus status;
    return CFile::GetStatus(path.c_str(), status);
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

} // namespace

TEST_F(CFileTest, WritesAndReadsBack) {
    std::string path = dir.File("data.bin");
    CFile out;
    ASSERT_TRUE(
        out.Open(path.c_str(), CFile::modeCreate | CFile::modeWrite | CFile::shareExclusive));
    std::vector<BYTE> data(300000);
    for (size_t i = 0; i < data.size(); ++i)
        data[i] = static_cast<BYTE>(i * 13);
    out.Write(data.data(), static_cast<UINT>(data.size()));
    EXPECT_EQ(out.GetPosition(), data.size());
    out.Close();
    EXPECT_EQ(out.m_hFile, CFile::hFileNull);

    CFile in(path.c_str(), CFile::modeRead);
    EXPECT_EQ(in.GetLength(), data.size());
    std::vector<BYTE> back(data.size() + 10);
    EXPECT_EQ(in.Read(back.data(), static_cast<UINT>(back.size())), data.size());
    back.resize(data.size());
    EXPECT_EQ(back, data);
    EXPECT_EQ(in.Read(back.data(), 10), 0u) << "at the end";
}

TEST_F(CFileTest, OpenOfAMissingFileReportsFileNotFound) {
    std::string path = dir.File("missing.bin");
    CFile file;
    CFileException error;
    EXPECT_FALSE(file.Open(path.c_str(), CFile::modeRead, &error));
    EXPECT_EQ(error.m_cause, CFileException::fileNotFound);
    EXPECT_EQ(error.m_lOsError, static_cast<LONG>(ERROR_FILE_NOT_FOUND));
    EXPECT_STREQ(error.m_strFileName, path.c_str());
    EXPECT_EQ(file.m_hFile, CFile::hFileNull);
    EXPECT_FALSE(file.Open(path.c_str(), CFile::modeRead)) << "the report is optional";
    EXPECT_FALSE(Exists(path)) << "reading does not create";

    CFileException thrown = FileErrorOf([&] { CFile(path.c_str(), CFile::modeRead); });
    EXPECT_EQ(thrown.m_cause, CFileException::fileNotFound);
    EXPECT_EQ(thrown.m_lOsError, static_cast<LONG>(ERROR_FILE_NOT_FOUND));
    EXPECT_STREQ(thrown.m_strFileName, path.c_str());
}

TEST_F(CFileTest, OpenInAMissingDirectoryReportsBadPath) {
    std::string path = dir.File("nowhere\\file.bin");
    CFileException error;
    CFile file;
    EXPECT_FALSE(file.Open(path.c_str(), CFile::modeCreate | CFile::modeWrite, &error));
    EXPECT_EQ(error.m_cause, CFileException::badPath);
    EXPECT_EQ(error.m_lOsError, static_cast<LONG>(ERROR_PATH_NOT_FOUND));
}

#ifndef _WIN32
TEST_F(CFileTest, DriveLetterPathsFailLikeMissingPaths) {
    CFileException error;
    CFile file;
    EXPECT_FALSE(file.Open("Q:\\data\\file.bin", CFile::modeRead, &error));
    EXPECT_EQ(error.m_cause, CFileException::badPath);
    EXPECT_EQ(error.m_lOsError, static_cast<LONG>(ERROR_PATH_NOT_FOUND));
}
#endif

TEST_F(CFileTest, CreateTruncatesUnlessTold) {
    std::string path = dir.File("keep.txt");
    WriteFile(path, "original");
    {
        CFile file(path.c_str(), CFile::modeCreate | CFile::modeNoTruncate | CFile::modeReadWrite);
        EXPECT_EQ(file.GetLength(), 8u);
        EXPECT_EQ(file.GetPosition(), 0u);
        file.SeekToEnd();
        file.Write("+", 1);
    }
    EXPECT_EQ(ReadFile(path), "original+");

    CFile(path.c_str(), CFile::modeCreate | CFile::modeWrite);
    EXPECT_EQ(ReadFile(path), "");

    std::string fresh = dir.File("fresh.txt");
    CFile(fresh.c_str(), CFile::modeCreate | CFile::modeNoTruncate | CFile::modeWrite);
    EXPECT_TRUE(Exists(fresh)) << "modeNoTruncate still creates";
}

TEST_F(CFileTest, SeekPositionsAndSetLengthResizes) {
    std::string path = dir.File("seek.bin");
    WriteFile(path, "0123456789");
    CFile file(path.c_str(), CFile::modeReadWrite);
    EXPECT_EQ(file.Seek(4, CFile::begin), 4u);
    EXPECT_EQ(file.Seek(2, CFile::current), 6u);
    char c;
    ASSERT_EQ(file.Read(&c, 1), 1u);
    EXPECT_EQ(c, '6');
    EXPECT_EQ(file.Seek(-3, CFile::end), 7u);
    ASSERT_EQ(file.Read(&c, 1), 1u);
    EXPECT_EQ(c, '7');
    EXPECT_EQ(file.SeekToEnd(), 10u);
    file.SeekToBegin();
    EXPECT_EQ(file.GetPosition(), 0u);

    file.SetLength(4);
    EXPECT_EQ(file.GetLength(), 4u);
    file.SetLength(6);
    EXPECT_EQ(file.GetLength(), 6u);
    file.SeekToBegin();
    char back[6];
    ASSERT_EQ(file.Read(back, 6), 6u);
    EXPECT_EQ(std::string(back, 4), "0123") << "shrinking keeps the head";

    // Past the end is a legal position; writing there extends the file.
    EXPECT_EQ(file.Seek(20, CFile::begin), 20u);
    EXPECT_EQ(file.Read(&c, 1), 0u);
    file.Write("x", 1);
    EXPECT_EQ(file.GetLength(), 21u);
}

TEST_F(CFileTest, SeekBeforeTheStartIsBadSeek) {
    std::string path = dir.File("seek.bin");
    WriteFile(path, "abc");
    CFile file(path.c_str(), CFile::modeRead);
    file.Seek(2, CFile::begin);
    CFileException error = FileErrorOf([&] { file.Seek(-3, CFile::current); });
    EXPECT_EQ(error.m_cause, CFileException::badSeek);
    EXPECT_STREQ(error.m_strFileName, path.c_str());
    EXPECT_EQ(file.GetPosition(), 2u) << "a failed seek keeps the position";
    EXPECT_THROW(file.Seek(0, 7), vaskel::CInvalidArgException);
}

TEST_F(CFileTest, WritingAFileOpenedForReadingIsDenied) {
    std::string path = dir.File("ro.txt");
    WriteFile(path, "abc");
    CFile file(path.c_str(), CFile::modeRead);
    CFileException error = FileErrorOf([&] { file.Write("x", 1); });
    EXPECT_EQ(error.m_cause, CFileException::accessDenied);
    file.Close();
    EXPECT_EQ(ReadFile(path), "abc");
}

TEST_F(CFileTest, AClosedFileIsAnInvalidFile) {
    std::string path = dir.File("closed.bin");
    WriteFile(path, "abc");
    CFile never;
    CFile closed(path.c_str(), CFile::modeReadWrite);
    closed.Close();
    for (CFile* file : {&never, &closed}) {
        char buffer[4];
        const std::function<void()> actions[] = {
            [&] { file->Read(buffer, 1); },       [&] { file->Write("x", 1); },
            [&] { file->Seek(0, CFile::begin); }, [&] { file->GetLength(); },
            [&] { file->SetLength(1); },          [&] { file->GetPosition(); },
        };
        for (const auto& action : actions) {
            CFileException error = FileErrorOf(action);
            EXPECT_EQ(error.m_cause, CFileException::invalidFile);
        }
    }
    EXPECT_EQ(ReadFile(path), "abc");
}

TEST_F(CFileTest, StatusOfAFileAndADirectory) {
    std::string path = dir.File("status.txt");
    WriteFile(path, "12345");
    CFileStatus status;
    ASSERT_TRUE(CFile::GetStatus(path.c_str(), status));
    EXPECT_EQ(status.m_size, 5u);
    EXPECT_EQ(status.m_attribute & CFile::directory, 0);
#ifndef _WIN32
    EXPECT_EQ(status.m_attribute, CFile::archive);
#endif
    LONGLONG now = static_cast<LONGLONG>(std::time(nullptr));
    EXPECT_LT(std::abs(status.m_mtime - now), 24 * 3600) << "seconds since 1970";
    EXPECT_NE(status.m_szFullName[0], '\0');

    CFile open(path.c_str(), CFile::modeRead);
    CFileStatus viaFile;
    ASSERT_TRUE(open.GetStatus(viaFile));
    EXPECT_EQ(viaFile.m_size, 5u);
    open.Close();
    EXPECT_FALSE(open.GetStatus(viaFile));

    std::filesystem::create_directory(dir.Path() / "sub");
    ASSERT_TRUE(CFile::GetStatus(dir.File("sub").c_str(), status));
    EXPECT_NE(status.m_attribute & CFile::directory, 0);

    EXPECT_FALSE(CFile::GetStatus(dir.File("missing").c_str(), status));
    EXPECT_FALSE(CFile::GetStatus(std::string(MAX_PATH + 10, 'a').c_str(), status));
}

TEST_F(CFileTest, NamesComeFromThePath) {
    std::string path = dir.File("report.final.txt");
    CFile file(path.c_str(), CFile::modeCreate | CFile::modeWrite);
    EXPECT_STREQ(file.GetFilePath(), path.c_str());
    EXPECT_STREQ(file.GetFileName(), "report.final.txt");
    EXPECT_STREQ(file.GetFileTitle(), "report.final");
    file.SetFilePath("a\\b\\.profile");
    EXPECT_STREQ(file.GetFileName(), ".profile");
    EXPECT_STREQ(file.GetFileTitle(), ".profile");
}

TEST_F(CFileTest, RenameMovesButNeverReplaces) {
    std::string from = dir.File("from.txt");
    std::string to = dir.File("to.txt");
    WriteFile(from, "payload");
    CFile::Rename(from.c_str(), to.c_str());
    EXPECT_FALSE(Exists(from));
    EXPECT_EQ(ReadFile(to), "payload");

    WriteFile(from, "other");
    CFileException error = FileErrorOf([&] { CFile::Rename(from.c_str(), to.c_str()); });
    EXPECT_EQ(error.m_cause, CFileException::accessDenied);
    EXPECT_EQ(error.m_lOsError, static_cast<LONG>(ERROR_ALREADY_EXISTS));
    EXPECT_EQ(ReadFile(from), "other");
    EXPECT_EQ(ReadFile(to), "payload");

    error = FileErrorOf([&] { CFile::Rename(dir.File("none").c_str(), dir.File("x").c_str()); });
    EXPECT_EQ(error.m_cause, CFileException::fileNotFound);
}

TEST_F(CFileTest, RemoveDeletesAndReportsAMissingFile) {
    std::string path = dir.File("gone.txt");
    WriteFile(path, "x");
    CFile::Remove(path.c_str());
    EXPECT_FALSE(Exists(path));

    CFileException error = FileErrorOf([&] { CFile::Remove(path.c_str()); });
    EXPECT_EQ(error.m_cause, CFileException::fileNotFound);
    EXPECT_EQ(error.m_lOsError, static_cast<LONG>(ERROR_FILE_NOT_FOUND));
    EXPECT_STREQ(error.m_strFileName, path.c_str());
}

TEST_F(CFileTest, APlainFileOffersNoDirectBuffer) {
    std::string path = dir.File("plain.bin");
    CFile file(path.c_str(), CFile::modeCreate | CFile::modeReadWrite);
    EXPECT_EQ(file.GetBufferPtr(CFile::bufferCheck), 0u);
    int sentinel;
    void* start = &sentinel;
    void* max = &sentinel;
    EXPECT_EQ(file.GetBufferPtr(CFile::bufferWrite, 10, &start, &max), 0u);
    EXPECT_EQ(start, nullptr);
    EXPECT_EQ(max, nullptr);
}

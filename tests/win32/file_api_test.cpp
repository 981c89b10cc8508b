// The Win32 file API as Windows documents it. The same tests run against the
// system on Windows. Files are named through Win32 paths joined with
// backslashes and checked through the standard library's own view of them.
#include "support/temp_dir.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>

namespace {

namespace fs = std::filesystem;

// Owns a handle and closes it when the test ends, also after a failed
// assertion: Windows cannot remove a file that is still open. It keeps the
// last error its creation left, read before an assertion report can change it.
class FileHandle {
public:
    explicit FileHandle(HANDLE handle) : m_handle(handle), m_error(GetLastError()) {}
    ~FileHandle() {
        if (Valid())
            CloseHandle(m_handle);
    }
    FileHandle(const FileHandle&) = delete;
    FileHandle& operator=(const FileHandle&) = delete;

    HANDLE Get() const { return m_handle; }
    bool Valid() const { return m_handle != INVALID_HANDLE_VALUE; }
    DWORD Error() const { return m_error; }
    HANDLE Release() {
        HANDLE handle = m_handle;
        m_handle = INVALID_HANDLE_VALUE;
        return handle;
    }

private:
    HANDLE m_handle;
    DWORD m_error;
};

LARGE_INTEGER Distance(LONGLONG value) {
    LARGE_INTEGER distance;
    distance.QuadPart = value;
    return distance;
}

LONGLONG SizeOf(HANDLE file) {
    LARGE_INTEGER size;
    size.QuadPart = -1;
    return GetFileSizeEx(file, &size) ? size.QuadPart : -1;
}

LONGLONG Seek(HANDLE file, LONGLONG distance, DWORD origin) {
    LARGE_INTEGER position;
    position.QuadPart = -1;
    return SetFilePointerEx(file, Distance(distance), &position, origin) ? position.QuadPart : -1;
}

bool Write(HANDLE file, const std::string& data) {
    DWORD written = 0;
    return WriteFile(file, data.data(), static_cast<DWORD>(data.size()), &written, nullptr) &&
           written == data.size();
}

std::string Read(HANDLE file, DWORD count) {
    std::string data(count, '\0');
    DWORD read = 0;
    if (!ReadFile(file, &data[0], count, &read, nullptr))
        return "<failed>";
    data.resize(read);
    return data;
}

class FileApiTest : public ::testing::Test {
protected:
    std::string Win32Path(const std::string& name) const { return m_dir.File(name); }
    fs::path NativePath(const std::string& name) const { return m_dir.Path() / name; }

    FileHandle Open(const std::string& name, DWORD access, DWORD disposition,
                    DWORD flagsAndAttributes = FILE_ATTRIBUTE_NORMAL) const {
        return FileHandle(CreateFileA(Win32Path(name).c_str(), access,
                                      FILE_SHARE_READ | FILE_SHARE_WRITE, nullptr, disposition,
                                      flagsAndAttributes, nullptr));
    }

    void Put(const std::string& name, const std::string& contents) const {
        std::ofstream(NativePath(name), std::ios::binary) << contents;
    }
    void PutReadOnly(const std::string& name, const std::string& contents) const {
        FileHandle file = Open(name, GENERIC_WRITE, CREATE_NEW, FILE_ATTRIBUTE_READONLY);
        ASSERT_TRUE(file.Valid());
        ASSERT_TRUE(Write(file.Get(), contents)); // the creating handle may still write
    }
    std::string Contents(const std::string& name) const {
        std::ifstream in(NativePath(name), std::ios::binary);
        return std::string(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
    }

    vaskel_test::TempDir m_dir;
};

TEST_F(FileApiTest, CreateNewCreatesOnlyMissingFiles) {
    {
        FileHandle file = Open("new.txt", GENERIC_WRITE, CREATE_NEW);
        ASSERT_TRUE(file.Valid());
        EXPECT_TRUE(Write(file.Get(), "first"));
    }
    EXPECT_EQ(Contents("new.txt"), "first");

    FileHandle again = Open("new.txt", GENERIC_WRITE, CREATE_NEW);
    EXPECT_FALSE(again.Valid());
    EXPECT_EQ(again.Error(), ERROR_FILE_EXISTS);
    EXPECT_EQ(Contents("new.txt"), "first");
}

TEST_F(FileApiTest, CreateAlwaysTruncatesAnExistingFile) {
    SetLastError(ERROR_INVALID_FUNCTION);
    {
        FileHandle file = Open("always.txt", GENERIC_WRITE, CREATE_ALWAYS);
        ASSERT_TRUE(file.Valid());
        EXPECT_EQ(file.Error(), ERROR_SUCCESS);
    }
    EXPECT_TRUE(fs::exists(NativePath("always.txt")));

    Put("always.txt", "old contents");
    {
        FileHandle file = Open("always.txt", GENERIC_WRITE, CREATE_ALWAYS);
        ASSERT_TRUE(file.Valid());
        EXPECT_EQ(file.Error(), ERROR_ALREADY_EXISTS);
        EXPECT_EQ(SizeOf(file.Get()), 0);
    }
    EXPECT_EQ(Contents("always.txt"), "");
}

TEST_F(FileApiTest, OpenAlwaysKeepsAnExistingFile) {
    SetLastError(ERROR_INVALID_FUNCTION);
    {
        FileHandle file = Open("open.txt", GENERIC_READ | GENERIC_WRITE, OPEN_ALWAYS);
        ASSERT_TRUE(file.Valid());
        EXPECT_EQ(file.Error(), ERROR_SUCCESS);
        EXPECT_TRUE(Write(file.Get(), "kept"));
    }
    FileHandle file = Open("open.txt", GENERIC_READ, OPEN_ALWAYS);
    ASSERT_TRUE(file.Valid());
    EXPECT_EQ(file.Error(), ERROR_ALREADY_EXISTS);
    EXPECT_EQ(Read(file.Get(), 16), "kept");
}

TEST_F(FileApiTest, OpenExistingNeedsTheFile) {
    FileHandle missing = Open("missing.txt", GENERIC_READ, OPEN_EXISTING);
    EXPECT_FALSE(missing.Valid());
    EXPECT_EQ(missing.Error(), ERROR_FILE_NOT_FOUND);
    EXPECT_FALSE(fs::exists(NativePath("missing.txt")));

    Put("there.txt", "contents");
    FileHandle file = Open("there.txt", GENERIC_READ, OPEN_EXISTING);
    ASSERT_TRUE(file.Valid());
    EXPECT_EQ(Read(file.Get(), 64), "contents");
    EXPECT_EQ(Read(file.Get(), 64), ""); // at the end a read succeeds with nothing
}

TEST_F(FileApiTest, TruncateExistingEmptiesOnlyExistingFiles) {
    FileHandle missing = Open("missing.txt", GENERIC_WRITE, TRUNCATE_EXISTING);
    EXPECT_FALSE(missing.Valid());
    EXPECT_EQ(missing.Error(), ERROR_FILE_NOT_FOUND);
    EXPECT_FALSE(fs::exists(NativePath("missing.txt")));

    Put("full.txt", "0123456789");
    {
        FileHandle file = Open("full.txt", GENERIC_WRITE, TRUNCATE_EXISTING);
        ASSERT_TRUE(file.Valid());
        EXPECT_EQ(SizeOf(file.Get()), 0);
    }
    EXPECT_EQ(Contents("full.txt"), "");
}

TEST_F(FileApiTest, MissingDirectoryIsPathNotFound) {
    const std::string path = Win32Path("no-such-dir\\file.txt");
    for (DWORD disposition : {CREATE_NEW, CREATE_ALWAYS, OPEN_EXISTING, OPEN_ALWAYS}) {
        SCOPED_TRACE(disposition);
        FileHandle file(CreateFileA(path.c_str(), GENERIC_READ | GENERIC_WRITE, 0, nullptr,
                                    disposition, FILE_ATTRIBUTE_NORMAL, nullptr));
        EXPECT_FALSE(file.Valid());
        EXPECT_EQ(file.Error(), ERROR_PATH_NOT_FOUND);
    }
    EXPECT_EQ(GetFileAttributesA(path.c_str()), INVALID_FILE_ATTRIBUTES);
    EXPECT_EQ(GetLastError(), ERROR_PATH_NOT_FOUND);
    EXPECT_FALSE(DeleteFileA(path.c_str()));
    EXPECT_EQ(GetLastError(), ERROR_PATH_NOT_FOUND);
}

TEST_F(FileApiTest, FilesInSubdirectoriesAreReachedThroughBackslashes) {
    ASSERT_TRUE(fs::create_directories(NativePath("a") / "b"));
    {
        FileHandle file = Open("a\\b\\deep.txt", GENERIC_WRITE, CREATE_NEW);
        ASSERT_TRUE(file.Valid());
        EXPECT_TRUE(Write(file.Get(), "deep"));
    }
    std::ifstream in(NativePath("a") / "b" / "deep.txt", std::ios::binary);
    EXPECT_EQ(std::string(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()),
              "deep");
}

TEST_F(FileApiTest, WrittenDataReadsBack) {
    std::string data;
    for (int i = 0; i < 70000; ++i)
        data += static_cast<char>(i * 7 % 256); // every byte value, NUL included
    FileHandle file = Open("data.bin", GENERIC_READ | GENERIC_WRITE, CREATE_NEW);
    ASSERT_TRUE(file.Valid());
    DWORD written = 0;
    ASSERT_TRUE(
        WriteFile(file.Get(), data.data(), static_cast<DWORD>(data.size()), &written, nullptr));
    EXPECT_EQ(written, data.size());
    EXPECT_TRUE(FlushFileBuffers(file.Get()));
    EXPECT_EQ(SizeOf(file.Get()), 70000);

    ASSERT_EQ(Seek(file.Get(), 0, FILE_BEGIN), 0);
    EXPECT_EQ(Read(file.Get(), 100000), data);

    DWORD none = 1;
    EXPECT_TRUE(WriteFile(file.Get(), data.data(), 0, &none, nullptr));
    EXPECT_EQ(none, 0u);
    EXPECT_EQ(SizeOf(file.Get()), 70000);
}

TEST_F(FileApiTest, AccessModeIsEnforced) {
    Put("file.txt", "contents");
    {
        FileHandle writeOnly = Open("file.txt", GENERIC_WRITE, OPEN_EXISTING);
        ASSERT_TRUE(writeOnly.Valid());
        char buffer[16];
        DWORD read = 123;
        EXPECT_FALSE(ReadFile(writeOnly.Get(), buffer, sizeof buffer, &read, nullptr));
        EXPECT_EQ(GetLastError(), ERROR_ACCESS_DENIED);
        EXPECT_EQ(read, 0u); // set before any other check
    }
    FileHandle readOnly = Open("file.txt", GENERIC_READ, OPEN_EXISTING);
    ASSERT_TRUE(readOnly.Valid());
    DWORD written = 123;
    EXPECT_FALSE(WriteFile(readOnly.Get(), "x", 1, &written, nullptr));
    EXPECT_EQ(GetLastError(), ERROR_ACCESS_DENIED);
    EXPECT_EQ(written, 0u);
    EXPECT_FALSE(FlushFileBuffers(readOnly.Get()));
    EXPECT_EQ(GetLastError(), ERROR_ACCESS_DENIED);
    EXPECT_FALSE(SetEndOfFile(readOnly.Get())); // with an undocumented error
    EXPECT_EQ(Read(readOnly.Get(), 16), "contents");
}

TEST_F(FileApiTest, FilePointerMovesFromEachOrigin) {
    Put("digits.txt", "0123456789");
    FileHandle file = Open("digits.txt", GENERIC_READ, OPEN_EXISTING);
    ASSERT_TRUE(file.Valid());

    EXPECT_EQ(Seek(file.Get(), 3, FILE_BEGIN), 3);
    EXPECT_EQ(Seek(file.Get(), 4, FILE_CURRENT), 7);
    EXPECT_EQ(Seek(file.Get(), -2, FILE_CURRENT), 5);
    EXPECT_EQ(Read(file.Get(), 2), "56");
    EXPECT_EQ(Seek(file.Get(), 0, FILE_CURRENT), 7);
    EXPECT_EQ(Seek(file.Get(), -1, FILE_END), 9);
    EXPECT_EQ(Read(file.Get(), 5), "9");
    EXPECT_EQ(Seek(file.Get(), 0, FILE_END), 10); // the documented way to get the length

    // The new position is optional.
    EXPECT_TRUE(SetFilePointerEx(file.Get(), Distance(1), nullptr, FILE_BEGIN));
    EXPECT_EQ(Read(file.Get(), 1), "1");
}

TEST_F(FileApiTest, SeekingBeforeTheStartFailsAndLeavesThePointer) {
    Put("digits.txt", "0123456789");
    FileHandle file = Open("digits.txt", GENERIC_READ, OPEN_EXISTING);
    ASSERT_TRUE(file.Valid());
    ASSERT_EQ(Seek(file.Get(), 2, FILE_BEGIN), 2);

    LARGE_INTEGER position;
    position.QuadPart = 77;
    EXPECT_FALSE(SetFilePointerEx(file.Get(), Distance(-3), &position, FILE_CURRENT));
    EXPECT_EQ(GetLastError(), ERROR_NEGATIVE_SEEK);
    EXPECT_FALSE(SetFilePointerEx(file.Get(), Distance(-11), &position, FILE_END));
    EXPECT_EQ(GetLastError(), ERROR_NEGATIVE_SEEK);
    EXPECT_EQ(Seek(file.Get(), 0, FILE_CURRENT), 2);

    // Exactly to the start is allowed.
    EXPECT_EQ(Seek(file.Get(), -10, FILE_END), 0);
}

TEST_F(FileApiTest, WritingPastTheEndExtendsTheFile) {
    Put("short.txt", "abcd");
    {
        FileHandle file = Open("short.txt", GENERIC_READ | GENERIC_WRITE, OPEN_EXISTING);
        ASSERT_TRUE(file.Valid());
        EXPECT_EQ(Seek(file.Get(), 100, FILE_BEGIN), 100);
        EXPECT_EQ(SizeOf(file.Get()), 4); // moving the pointer alone does not grow the file
        EXPECT_EQ(Read(file.Get(), 8), "");
        EXPECT_TRUE(Write(file.Get(), "xy"));
        EXPECT_EQ(SizeOf(file.Get()), 102);
        EXPECT_EQ(Seek(file.Get(), 0, FILE_CURRENT), 102);
    }
    std::string contents = Contents("short.txt");
    ASSERT_EQ(contents.size(), 102u);
    EXPECT_EQ(contents.substr(0, 4), "abcd");
    EXPECT_EQ(contents.substr(100), "xy"); // the gap's contents are not defined
}

TEST_F(FileApiTest, SetEndOfFileTruncatesAndExtendsAtThePointer) {
    Put("digits.txt", "0123456789");
    {
        FileHandle file = Open("digits.txt", GENERIC_READ | GENERIC_WRITE, OPEN_EXISTING);
        ASSERT_TRUE(file.Valid());
        ASSERT_EQ(Seek(file.Get(), 4, FILE_BEGIN), 4);
        EXPECT_TRUE(SetEndOfFile(file.Get()));
        EXPECT_EQ(SizeOf(file.Get()), 4);
        EXPECT_EQ(Seek(file.Get(), 0, FILE_CURRENT), 4);
        EXPECT_TRUE(Write(file.Get(), "!"));
        EXPECT_EQ(SizeOf(file.Get()), 5);

        ASSERT_EQ(Seek(file.Get(), 50, FILE_BEGIN), 50);
        EXPECT_TRUE(SetEndOfFile(file.Get()));
        EXPECT_EQ(SizeOf(file.Get()), 50);
    }
    std::string contents = Contents("digits.txt");
    ASSERT_EQ(contents.size(), 50u);
    EXPECT_EQ(contents.substr(0, 5), "0123!");
}

TEST_F(FileApiTest, AttributesOfFilesAndDirectories) {
    Put("five.txt", "12345");
    WIN32_FILE_ATTRIBUTE_DATA data;
    ASSERT_TRUE(GetFileAttributesExA(Win32Path("five.txt").c_str(), GetFileExInfoStandard, &data));
    EXPECT_EQ(data.dwFileAttributes & FILE_ATTRIBUTE_DIRECTORY, 0u);
    EXPECT_EQ(data.nFileSizeHigh, 0u);
    EXPECT_EQ(data.nFileSizeLow, 5u);
    EXPECT_NE(data.ftLastWriteTime.dwHighDateTime, 0u);
    EXPECT_EQ(GetFileAttributesA(Win32Path("five.txt").c_str()), data.dwFileAttributes);
#ifndef _WIN32
    EXPECT_EQ(data.dwFileAttributes, static_cast<DWORD>(FILE_ATTRIBUTE_ARCHIVE));
#endif

    const std::string directory = m_dir.Path().string();
    ASSERT_TRUE(GetFileAttributesExA(directory.c_str(), GetFileExInfoStandard, &data));
    EXPECT_NE(data.dwFileAttributes & FILE_ATTRIBUTE_DIRECTORY, 0u);
    DWORD attributes = GetFileAttributesA(directory.c_str());
    ASSERT_NE(attributes, INVALID_FILE_ATTRIBUTES);
    EXPECT_NE(attributes & FILE_ATTRIBUTE_DIRECTORY, 0u);
}

TEST_F(FileApiTest, AttributesOfMissingFilesFail) {
    const std::string path = Win32Path("missing.txt");
    SetLastError(ERROR_SUCCESS);
    EXPECT_EQ(GetFileAttributesA(path.c_str()), INVALID_FILE_ATTRIBUTES);
    EXPECT_EQ(GetLastError(), ERROR_FILE_NOT_FOUND);
    WIN32_FILE_ATTRIBUTE_DATA data;
    SetLastError(ERROR_SUCCESS);
    EXPECT_FALSE(GetFileAttributesExA(path.c_str(), GetFileExInfoStandard, &data));
    EXPECT_EQ(GetLastError(), ERROR_FILE_NOT_FOUND);
}

TEST_F(FileApiTest, ReadOnlyFilesCanBeReadButNotDeleted) {
    ASSERT_NO_FATAL_FAILURE(PutReadOnly("locked.txt", "keep"));
    DWORD attributes = GetFileAttributesA(Win32Path("locked.txt").c_str());
    ASSERT_NE(attributes, INVALID_FILE_ATTRIBUTES);
    EXPECT_NE(attributes & FILE_ATTRIBUTE_READONLY, 0u);

    EXPECT_FALSE(DeleteFileA(Win32Path("locked.txt").c_str()));
    EXPECT_EQ(GetLastError(), ERROR_ACCESS_DENIED);
    {
        FileHandle reader = Open("locked.txt", GENERIC_READ, OPEN_EXISTING);
        ASSERT_TRUE(reader.Valid());
        EXPECT_EQ(Read(reader.Get(), 16), "keep");
    }

    // Clearing the attribute lets the file go (and the directory be removed on Windows).
    fs::permissions(NativePath("locked.txt"), fs::perms::owner_write, fs::perm_options::add);
    EXPECT_TRUE(DeleteFileA(Win32Path("locked.txt").c_str()));
}

#ifndef _WIN32
// Windows documents this too, but Wine run as root lets the writers through,
// so the check stays with this platform's own implementation.
TEST_F(FileApiTest, ReadOnlyFilesRefuseWriters) {
    ASSERT_NO_FATAL_FAILURE(PutReadOnly("locked.txt", "keep"));
    for (DWORD disposition : {OPEN_EXISTING, OPEN_ALWAYS, CREATE_ALWAYS, TRUNCATE_EXISTING}) {
        SCOPED_TRACE(disposition);
        FileHandle writer = Open("locked.txt", GENERIC_WRITE, disposition);
        EXPECT_FALSE(writer.Valid());
        EXPECT_EQ(writer.Error(), ERROR_ACCESS_DENIED);
    }
    EXPECT_EQ(Contents("locked.txt"), "keep"); // nothing truncated on the way
}
#endif

TEST_F(FileApiTest, DirectoriesOpenOnlyWithBackupSemantics) {
    ASSERT_TRUE(fs::create_directory(NativePath("dir")));
    FileHandle plain = Open("dir", GENERIC_READ, OPEN_EXISTING);
    EXPECT_FALSE(plain.Valid());
    EXPECT_EQ(plain.Error(), ERROR_ACCESS_DENIED);

    FileHandle backup = Open("dir", GENERIC_READ, OPEN_EXISTING, FILE_FLAG_BACKUP_SEMANTICS);
    EXPECT_TRUE(backup.Valid());
}

TEST_F(FileApiTest, DeleteFileRemovesFilesOnly) {
    Put("doomed.txt", "x");
    EXPECT_TRUE(DeleteFileA(Win32Path("doomed.txt").c_str()));
    EXPECT_FALSE(fs::exists(NativePath("doomed.txt")));

    EXPECT_FALSE(DeleteFileA(Win32Path("doomed.txt").c_str()));
    EXPECT_EQ(GetLastError(), ERROR_FILE_NOT_FOUND);

    ASSERT_TRUE(fs::create_directory(NativePath("dir")));
    EXPECT_FALSE(DeleteFileA(Win32Path("dir").c_str()));
    EXPECT_EQ(GetLastError(), ERROR_ACCESS_DENIED);
    EXPECT_TRUE(fs::is_directory(NativePath("dir")));
}

TEST_F(FileApiTest, MoveFileRenamesButNeverReplaces) {
    Put("from.txt", "moved");
    EXPECT_TRUE(MoveFileA(Win32Path("from.txt").c_str(), Win32Path("to.txt").c_str()));
    EXPECT_FALSE(fs::exists(NativePath("from.txt")));
    EXPECT_EQ(Contents("to.txt"), "moved");

    Put("other.txt", "other");
    EXPECT_FALSE(MoveFileA(Win32Path("other.txt").c_str(), Win32Path("to.txt").c_str()));
    EXPECT_EQ(GetLastError(), ERROR_ALREADY_EXISTS);
    EXPECT_EQ(Contents("other.txt"), "other");
    EXPECT_EQ(Contents("to.txt"), "moved");

    EXPECT_FALSE(MoveFileA(Win32Path("missing.txt").c_str(), Win32Path("new.txt").c_str()));
    EXPECT_EQ(GetLastError(), ERROR_FILE_NOT_FOUND);
    EXPECT_FALSE(fs::exists(NativePath("new.txt")));

    EXPECT_FALSE(MoveFileA(Win32Path("to.txt").c_str(), Win32Path("no-such-dir\\to.txt").c_str()));
    EXPECT_EQ(GetLastError(), ERROR_PATH_NOT_FOUND);
    EXPECT_EQ(Contents("to.txt"), "moved");

    ASSERT_TRUE(fs::create_directory(NativePath("dir")));
    Put("dir/inside.txt", "inside");
    EXPECT_TRUE(MoveFileA(Win32Path("dir").c_str(), Win32Path("renamed").c_str()));
    EXPECT_EQ(Contents("renamed/inside.txt"), "inside");
}

TEST_F(FileApiTest, ClosingTwiceFailsTheSecondTime) {
    FileHandle file = Open("file.txt", GENERIC_WRITE, CREATE_NEW);
    ASSERT_TRUE(file.Valid());
    HANDLE handle = file.Release();
    EXPECT_TRUE(CloseHandle(handle));
    // Under a debugger Windows raises an exception here instead.
    SetLastError(ERROR_SUCCESS);
    EXPECT_FALSE(CloseHandle(handle));
    EXPECT_EQ(GetLastError(), ERROR_INVALID_HANDLE);
}

TEST_F(FileApiTest, ClosedAndNullHandlesAreInvalid) {
    FileHandle file = Open("file.txt", GENERIC_READ | GENERIC_WRITE, CREATE_NEW);
    ASSERT_TRUE(file.Valid());
    HANDLE closed = file.Release();
    ASSERT_TRUE(CloseHandle(closed));

    for (HANDLE handle : {closed, HANDLE(nullptr)}) {
        char buffer[4];
        DWORD count = 123;
        LARGE_INTEGER value;
        auto expectInvalid = [](BOOL result) {
            DWORD error = GetLastError(); // before a failed assertion's report can change it
            EXPECT_FALSE(result);
            EXPECT_EQ(error, ERROR_INVALID_HANDLE);
            SetLastError(ERROR_SUCCESS);
        };
        expectInvalid(ReadFile(handle, buffer, sizeof buffer, &count, nullptr));
        EXPECT_EQ(count, 0u);
        expectInvalid(WriteFile(handle, "data", 4, &count, nullptr));
        expectInvalid(SetFilePointerEx(handle, Distance(0), &value, FILE_BEGIN));
        expectInvalid(GetFileSizeEx(handle, &value));
        expectInvalid(SetEndOfFile(handle));
        expectInvalid(FlushFileBuffers(handle));
        expectInvalid(CloseHandle(handle));
    }
}

#ifndef _WIN32
TEST_F(FileApiTest, DriveLetterAndUncPathsAreNotFound) {
    for (const char* path : {"C:\\file.txt", "c:relative.txt", "\\\\server\\share\\file.txt"}) {
        SCOPED_TRACE(path);
        FileHandle file(CreateFileA(path, GENERIC_READ, 0, nullptr, OPEN_ALWAYS,
                                    FILE_ATTRIBUTE_NORMAL, nullptr));
        EXPECT_FALSE(file.Valid());
        EXPECT_EQ(file.Error(), ERROR_PATH_NOT_FOUND);
        EXPECT_EQ(GetFileAttributesA(path), INVALID_FILE_ATTRIBUTES);
        EXPECT_EQ(GetLastError(), ERROR_PATH_NOT_FOUND);
    }
}
#endif

} // namespace

// The Win32 file API as Windows documents it; the same tests run against the
// system on Windows. What the calls leave is read through the standard library.
#include "support/temp_dir.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <memory>
#include <string>
#include <tuple>

namespace {

const DWORD succeeded = 0xFFFFFFFFu; // in place of the last error of a call that succeeded

// Closes the handle also after a failed assertion: Windows cannot remove an open file.
struct Closer {
    void operator()(HANDLE handle) const {
        if (handle != INVALID_HANDLE_VALUE)
            CloseHandle(handle);
    }
};
using File = std::unique_ptr<void, Closer>;

DWORD ErrorOf(BOOL result) {
    DWORD error = result ? succeeded : GetLastError();
    SetLastError(ERROR_SUCCESS); // so that a call failing silently is seen
    return error;
}

LONGLONG Seek(HANDLE file, LONGLONG distance, DWORD origin) {
    LARGE_INTEGER move, position;
    move.QuadPart = distance;
    return SetFilePointerEx(file, move, &position, origin) ? position.QuadPart : -1;
}

LONGLONG Size(HANDLE file) {
    LARGE_INTEGER size;
    return GetFileSizeEx(file, &size) ? size.QuadPart : -1;
}

class FileApiTest : public ::testing::Test {
protected:
    std::string Path(const std::string& name) const { return m_dir.File(name); }
    File Open(const std::string& name, DWORD access, DWORD disposition,
              DWORD flagsAndAttributes = FILE_ATTRIBUTE_NORMAL) const {
        return File(CreateFileA(Path(name).c_str(), access, FILE_SHARE_READ | FILE_SHARE_WRITE,
                                nullptr, disposition, flagsAndAttributes, nullptr));
    }
    DWORD OpenError(const std::string& name, DWORD access, DWORD disposition,
                    DWORD flagsAndAttributes = FILE_ATTRIBUTE_NORMAL) const {
        File file = Open(name, access, disposition, flagsAndAttributes);
        return file.get() == INVALID_HANDLE_VALUE ? GetLastError() : succeeded;
    }
    void Put(const std::string& name, const std::string& contents) const {
        std::ofstream(m_dir.Path() / name, std::ios::binary) << contents;
    }
    std::string Contents(const std::string& name) const {
        std::ifstream in(m_dir.Path() / name, std::ios::binary);
        return in ? std::string(std::istreambuf_iterator<char>(in), {}) : "<none>";
    }

    vaskel_test::TempDir m_dir;
};

TEST_F(FileApiTest, DispositionsAndMissingPaths) {
    const DWORD any = 0xFFFFFFFEu; // no documented last error
    const std::tuple<DWORD, bool, bool, DWORD, const char*> cases[] = {
        {CREATE_NEW, false, true, any, ""},
        {CREATE_NEW, true, false, ERROR_FILE_EXISTS, "old"},
        {CREATE_ALWAYS, false, true, ERROR_SUCCESS, ""},
        {CREATE_ALWAYS, true, true, ERROR_ALREADY_EXISTS, ""},
        {OPEN_EXISTING, false, false, ERROR_FILE_NOT_FOUND, "<none>"},
        {OPEN_EXISTING, true, true, any, "old"},
        {OPEN_ALWAYS, false, true, ERROR_SUCCESS, ""},
        {OPEN_ALWAYS, true, true, ERROR_ALREADY_EXISTS, "old"},
        {TRUNCATE_EXISTING, false, false, ERROR_FILE_NOT_FOUND, "<none>"},
        {TRUNCATE_EXISTING, true, true, any, ""},
    };
    for (const auto& [disposition, exists, opens, error, after] : cases) {
        SCOPED_TRACE(::testing::Message() << disposition << (exists ? " existing" : ""));
        const std::string name = std::to_string(disposition) + (exists ? "old" : "new");
        if (exists)
            Put(name, "old");
        SetLastError(ERROR_INVALID_FUNCTION);
        {
            File file = Open(name, GENERIC_READ | GENERIC_WRITE, disposition);
            const DWORD lastError = GetLastError();
            EXPECT_EQ(file.get() != INVALID_HANDLE_VALUE, opens);
            EXPECT_TRUE(error == any || lastError == error) << lastError;
        }
        EXPECT_EQ(Contents(name), after);
    }
    // A missing directory on the way is told apart from a missing file.
    EXPECT_EQ(OpenError("none\\new", GENERIC_WRITE, CREATE_ALWAYS), ERROR_PATH_NOT_FOUND);
    WIN32_FILE_ATTRIBUTE_DATA data;
    for (const auto& [name, expected] : {std::make_tuple("gone", ERROR_FILE_NOT_FOUND),
                                         std::make_tuple("none\\gone", ERROR_PATH_NOT_FOUND)}) {
        SCOPED_TRACE(name);
        EXPECT_EQ(GetFileAttributesA(Path(name).c_str()), INVALID_FILE_ATTRIBUTES);
        EXPECT_EQ(GetLastError(), expected);
        EXPECT_EQ(ErrorOf(GetFileAttributesExA(Path(name).c_str(), GetFileExInfoStandard, &data)),
                  expected);
        EXPECT_EQ(ErrorOf(DeleteFileA(Path(name).c_str())), expected);
        EXPECT_EQ(ErrorOf(MoveFileA(Path(name).c_str(), Path("new").c_str())), expected);
    }
    // MoveFile never replaces a file.
    Put("from", "moved");
    Put("other", "other");
    EXPECT_TRUE(MoveFileA(Path("from").c_str(), Path("to").c_str()));
    EXPECT_EQ(ErrorOf(MoveFileA(Path("other").c_str(), Path("to").c_str())), ERROR_ALREADY_EXISTS);
    EXPECT_EQ(ErrorOf(MoveFileA(Path("to").c_str(), Path("none\\to").c_str())),
              ERROR_PATH_NOT_FOUND);
    EXPECT_EQ(Contents("from") + Contents("other") + Contents("to"), "<none>othermoved");
}

TEST_F(FileApiTest, AttributesAndAccess) {
    Put("file", "12345");
    WIN32_FILE_ATTRIBUTE_DATA data;
    ASSERT_TRUE(GetFileAttributesExA(Path("file").c_str(), GetFileExInfoStandard, &data));
    EXPECT_EQ(data.dwFileAttributes & (FILE_ATTRIBUTE_DIRECTORY | FILE_ATTRIBUTE_READONLY), 0u);
    EXPECT_EQ(data.nFileSizeHigh * 0x100000000ull + data.nFileSizeLow, 5u);
    char buffer[4];
    DWORD count = 0;
    File writeOnly = Open("file", GENERIC_WRITE, OPEN_EXISTING);
    EXPECT_EQ(ErrorOf(ReadFile(writeOnly.get(), buffer, 4, &count, nullptr)), ERROR_ACCESS_DENIED);
    // Directories open only with backup semantics.
    ASSERT_TRUE(std::filesystem::create_directory(m_dir.Path() / "dir"));
    EXPECT_NE(GetFileAttributesA(Path("dir").c_str()) & FILE_ATTRIBUTE_DIRECTORY, 0u);
    EXPECT_EQ(OpenError("dir", GENERIC_READ, OPEN_EXISTING), ERROR_ACCESS_DENIED);
    EXPECT_EQ(OpenError("dir", GENERIC_READ, OPEN_EXISTING, FILE_FLAG_BACKUP_SEMANTICS), succeeded);
    // A read-only file refuses deletion and, but for its creator, writers.
    {
        File creator = Open("locked", GENERIC_WRITE, CREATE_NEW, FILE_ATTRIBUTE_READONLY);
        ASSERT_TRUE(WriteFile(creator.get(), "keep", 4, &count, nullptr));
    }
    EXPECT_NE(GetFileAttributesA(Path("locked").c_str()) & FILE_ATTRIBUTE_READONLY, 0u);
    EXPECT_EQ(ErrorOf(DeleteFileA(Path("locked").c_str())), ERROR_ACCESS_DENIED);
#ifndef _WIN32 // Windows documents this too, but Wine run as root lets writers through
    for (DWORD disposition : {OPEN_EXISTING, OPEN_ALWAYS, CREATE_ALWAYS, TRUNCATE_EXISTING})
        EXPECT_EQ(OpenError("locked", GENERIC_WRITE, disposition), ERROR_ACCESS_DENIED);
#endif
    EXPECT_EQ(Contents("locked"), "keep"); // nothing truncated on the way
    // Windows removes the directory only once the attribute is cleared.
    std::filesystem::permissions(m_dir.Path() / "locked", std::filesystem::perms::owner_write,
                                 std::filesystem::perm_options::add);
}

TEST_F(FileApiTest, SeekingAndResizing) {
    Put("digits", "0123456789");
    File file = Open("digits", GENERIC_READ | GENERIC_WRITE, OPEN_EXISTING);
    EXPECT_EQ(Seek(file.get(), 3, FILE_BEGIN), 3);
    EXPECT_EQ(Seek(file.get(), -2, FILE_CURRENT), 1);
    EXPECT_EQ(Seek(file.get(), -1, FILE_END), 9);
    EXPECT_EQ(Seek(file.get(), -10, FILE_CURRENT), -1);
    EXPECT_EQ(GetLastError(), ERROR_NEGATIVE_SEEK);
    char digit = 0;
    DWORD count = 0;
    EXPECT_TRUE(ReadFile(file.get(), &digit, 1, &count, nullptr)); // from where the pointer stayed
    EXPECT_EQ(digit, '9');
    // Moving the pointer alone does not grow the file; writing there does.
    EXPECT_EQ(Seek(file.get(), 40, FILE_BEGIN), 40);
    EXPECT_EQ(Size(file.get()), 10);
    EXPECT_TRUE(WriteFile(file.get(), "xy", 2, &count, nullptr));
    EXPECT_EQ(Size(file.get()), 42);
    EXPECT_EQ(Seek(file.get(), 4, FILE_BEGIN), 4);
    EXPECT_TRUE(SetEndOfFile(file.get()));
    EXPECT_EQ(Size(file.get()), 4);
    EXPECT_EQ(Contents("digits"), "0123");
}

TEST_F(FileApiTest, ClosedAndNullHandlesAreInvalid) {
    HANDLE closed = CreateFileA(Path("file").c_str(), GENERIC_WRITE, 0, nullptr, CREATE_NEW,
                                FILE_ATTRIBUTE_NORMAL, nullptr);
    ASSERT_TRUE(CloseHandle(closed));
    // Under a debugger Windows raises an exception for these instead.
    for (HANDLE handle : {closed, HANDLE(nullptr)}) {
        char buffer[4];
        DWORD count = 123;
        EXPECT_EQ(ErrorOf(ReadFile(handle, buffer, 4, &count, nullptr)), ERROR_INVALID_HANDLE);
        EXPECT_EQ(count, 0u);
        EXPECT_EQ(ErrorOf(WriteFile(handle, "data", 4, &count, nullptr)), ERROR_INVALID_HANDLE);
        EXPECT_EQ(ErrorOf(CloseHandle(handle)), ERROR_INVALID_HANDLE);
    }
}

} // namespace

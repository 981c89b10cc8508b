// Splitting paths into drive, directory, file name and extension, and joining
// them, as the runtime's _splitpath_s and _makepath_s do.
#include <vaskel/win32.h>

#include "support/invalid_parameter.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <string>

namespace {

struct Parts {
    char drive[_MAX_DRIVE];
    char dir[_MAX_DIR];
    char fileName[_MAX_FNAME];
    char ext[_MAX_EXT];
};

errno_t Split(const char* path, Parts& parts) {
    return _splitpath_s(path, parts.drive, sizeof parts.drive, parts.dir, sizeof parts.dir,
                        parts.fileName, sizeof parts.fileName, parts.ext, sizeof parts.ext);
}

std::string Make(const char* drive, const char* dir, const char* fileName, const char* ext) {
    char path[_MAX_PATH];
    errno_t result = _makepath_s(path, sizeof path, drive, dir, fileName, ext);
    return result == 0 ? path : "error " + std::to_string(result);
}

} // namespace

TEST(PathPartsTest, SplitFindsDriveDirectoryFileNameAndExtension) {
    const struct {
        const char* path;
        const char* drive;
        const char* dir;
        const char* fileName;
        const char* ext;
    } cases[] = {
        {"C:\\dir\\sub\\name.tar.gz", "C:", "\\dir\\sub\\", "name.tar", ".gz"},
        {"c:/a/b.txt", "c:", "/a/", "b", ".txt"},
        {"dir/sub\\file", "", "dir/sub\\", "file", ""},
        {"dir.d\\file", "", "dir.d\\", "file", ""},
        {"name.txt", "", "", "name", ".txt"},
        {"readme", "", "", "readme", ""},
        {"\\\\server\\share\\f.x", "", "\\\\server\\share\\", "f", ".x"},
        {"C:", "C:", "", "", ""},
        {"C:name", "C:", "", "name", ""},
        {"dir\\", "", "dir\\", "", ""},
        {".profile", "", "", "", ".profile"},
        {"a.b.", "", "", "a.b", "."},
        {"", "", "", "", ""},
    };
    for (const auto& c : cases) {
        Parts parts;
        ASSERT_EQ(Split(c.path, parts), 0) << c.path;
        EXPECT_STREQ(parts.drive, c.drive) << c.path;
        EXPECT_STREQ(parts.dir, c.dir) << c.path;
        EXPECT_STREQ(parts.fileName, c.fileName) << c.path;
        EXPECT_STREQ(parts.ext, c.ext) << c.path;
    }
}

TEST(PathPartsTest, SplitFillsOnlyThePartsThatHaveBuffers) {
    char dir[_MAX_DIR], ext[_MAX_EXT];
    ASSERT_EQ(_splitpath_s("C:\\d\\f.e", nullptr, 0, dir, sizeof dir, nullptr, 0, ext, sizeof ext),
              0);
    EXPECT_STREQ(dir, "\\d\\");
    EXPECT_STREQ(ext, ".e");
}

TEST(PathPartsTest, SplitEmptiesEveryPartWhenOneDoesNotFit) {
    const char* path = "C:\\dir\\name.txt";
    char drive[3], dir[6], fileName[5], ext[5];
    ASSERT_EQ(_splitpath_s(path, drive, sizeof drive, dir, sizeof dir, fileName, sizeof fileName,
                           ext, sizeof ext),
              0)
        << "every part fits with its terminator";
    EXPECT_STREQ(fileName, "name");

    vaskel_test::InvalidParameterGuard guard;
    const struct {
        size_t driveSize, dirSize, fileNameSize, extSize;
    } tooSmall[] = {{2, 6, 5, 5}, {3, 5, 5, 5}, {3, 6, 4, 5}, {3, 6, 5, 4}};
    for (const auto& sizes : tooSmall) {
        std::memset(drive, 'x', sizeof drive);
        std::memset(dir, 'x', sizeof dir);
        std::memset(fileName, 'x', sizeof fileName);
        std::memset(ext, 'x', sizeof ext);
        errno = 0;
        EXPECT_EQ(_splitpath_s(path, drive, sizes.driveSize, dir, sizes.dirSize, fileName,
                               sizes.fileNameSize, ext, sizes.extSize),
                  ERANGE);
        EXPECT_EQ(errno, ERANGE);
        EXPECT_EQ(drive[0], '\0');
        EXPECT_EQ(dir[0], '\0');
        EXPECT_EQ(fileName[0], '\0');
        EXPECT_EQ(ext[0], '\0');
    }
}

TEST(PathPartsTest, SplitRefusesAMissingPathAndBuffersWithoutSizes) {
    vaskel_test::InvalidParameterGuard guard;
    char drive[_MAX_DRIVE], dir[_MAX_DIR];
    errno = 0;
    EXPECT_EQ(_splitpath_s(nullptr, drive, sizeof drive, nullptr, 0, nullptr, 0, nullptr, 0),
              EINVAL);
    EXPECT_EQ(errno, EINVAL);
    EXPECT_EQ(_splitpath_s("a\\b", drive, 0, dir, sizeof dir, nullptr, 0, nullptr, 0), EINVAL);
    EXPECT_EQ(_splitpath_s("a\\b", nullptr, 3, dir, sizeof dir, nullptr, 0, nullptr, 0), EINVAL);
    EXPECT_EQ(_splitpath_s("a\\b", nullptr, 0, nullptr, 0, nullptr, 0, nullptr, 5), EINVAL);
}

TEST(PathPartsTest, MakeJoinsPartsWithDriveColonSeparatorAndDot) {
    EXPECT_EQ(Make("C", "dir", "file", "txt"), "C:dir\\file.txt");
    EXPECT_EQ(Make("c", "\\sample\\crt\\", "crt_makepath_s", "c"),
              "c:\\sample\\crt\\crt_makepath_s.c");
    EXPECT_EQ(Make("D:", "a/", "f", ".e"), "D:a/f.e") << "only the drive letter is taken";
    EXPECT_EQ(Make(nullptr, "a\\b", nullptr, nullptr), "a\\b\\");
    EXPECT_EQ(Make(nullptr, nullptr, "f", nullptr), "f");
    EXPECT_EQ(Make(nullptr, nullptr, nullptr, "txt"), ".txt");
    EXPECT_EQ(Make("", "", "", ""), "");
    EXPECT_EQ(Make(nullptr, nullptr, nullptr, nullptr), "");
    EXPECT_EQ(Make(nullptr, nullptr, "name.tar", "gz"), "name.tar.gz");
}

TEST(PathPartsTest, MakeUndoesSplit) {
    for (const char* path : {"C:\\dir\\sub\\name.tar.gz", "c:/a/b.txt", "dir\\", "name",
                             "\\\\server\\share\\f.x", ".profile", "C:"}) {
        Parts parts;
        ASSERT_EQ(Split(path, parts), 0) << path;
        EXPECT_EQ(Make(parts.drive, parts.dir, parts.fileName, parts.ext), path);
    }
}

TEST(PathPartsTest, MakeReportsAPathThatDoesNotFit) {
    const std::string expected = "C:dir\\file.txt";
    char path[32];
    ASSERT_EQ(_makepath_s(path, expected.size() + 1, "C", "dir", "file", "txt"), 0);
    EXPECT_EQ(path, expected) << "the terminator may be the last byte";

    // Each size short of that fails at some part, the added ':', '\\' or '.'
    // included.
    vaskel_test::InvalidParameterGuard guard;
    for (size_t size = 1; size <= expected.size(); ++size) {
        std::memset(path, 'x', sizeof path);
        errno = 0;
        EXPECT_EQ(_makepath_s(path, size, "C", "dir", "file", "txt"), ERANGE) << size;
        EXPECT_EQ(errno, ERANGE) << size;
        EXPECT_EQ(path[0], '\0') << size;
        EXPECT_EQ(path[size], 'x') << "nothing written past the buffer, size " << size;
    }
}

TEST(PathPartsTest, MakeRefusesAMissingBuffer) {
    vaskel_test::InvalidParameterGuard guard;
    char path[_MAX_PATH] = "unchanged";
    errno = 0;
    EXPECT_EQ(_makepath_s(nullptr, sizeof path, "C", "d", "f", "e"), EINVAL);
    EXPECT_EQ(errno, EINVAL);
    EXPECT_EQ(_makepath_s(path, 0, "C", "d", "f", "e"), EINVAL);
    EXPECT_STREQ(path, "unchanged");
}

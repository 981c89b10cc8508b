#include <vaskel/text.h>

#include <gtest/gtest.h>

#include <string>

using vaskel::CString;

TEST(VKSplitPath, GivesEachPartAskedFor) {
    CString drive("x"), directory("x"), fileName("x"), extension("x");
    vaskel::VKSplitPath("C:\\dir\\sub\\name.tar.gz", &drive, &directory, &fileName, &extension);
    EXPECT_EQ(drive, "C:");
    EXPECT_EQ(directory, "\\dir\\sub\\");
    EXPECT_EQ(fileName, "name.tar");
    EXPECT_EQ(extension, ".gz");

    CString onlyName;
    vaskel::VKSplitPath("d/f.e", nullptr, nullptr, &onlyName, nullptr);
    EXPECT_EQ(onlyName, "f");
}

TEST(VKSplitPath, SinglePartsFollowTheSameRules) {
    EXPECT_EQ(vaskel::VKGetFileExt("readme"), "");
    EXPECT_EQ(vaskel::VKGetFileExt("dir.d\\readme"), "")
        << "a dot in the directory is no extension";
    EXPECT_EQ(vaskel::VKGetDirectory("name.txt"), "");
    EXPECT_EQ(vaskel::VKGetDirectory("a/b\\c"), "a/b\\");
    EXPECT_EQ(vaskel::VKGetDrive("\\\\server\\share\\f"), "");
    EXPECT_EQ(vaskel::VKGetDrive("c:f"), "c:");
    EXPECT_EQ(vaskel::VKGetFileName("C:\\a.b\\.hidden"), "");
    EXPECT_EQ(vaskel::VKGetFileExt("C:\\a.b\\.hidden"), ".hidden");
}

TEST(VKSplitPath, NullPathHasEmptyParts) {
    CString drive("x"), directory("x"), fileName("x"), extension("x");
    vaskel::VKSplitPath(nullptr, &drive, &directory, &fileName, &extension);
    EXPECT_TRUE(drive.IsEmpty() && directory.IsEmpty() && fileName.IsEmpty() &&
                extension.IsEmpty());
    EXPECT_EQ(vaskel::VKGetFileName(nullptr), "");
}

TEST(VKSplitPath, APartTooLongEmptiesThePartsAskedFor) {
    const std::string longest(255, 'n'); // _MAX_FNAME less the NUL
    const std::string fits = "C:\\dir\\" + longest + ".txt";
    EXPECT_EQ(vaskel::VKGetFileName(fits.c_str()), CString(longest.c_str()));

    const std::string tooLong = "C:\\dir\\" + longest + "n.txt";
    CString drive("x"), directory("x"), fileName("x"), extension("x");
    vaskel::VKSplitPath(tooLong.c_str(), &drive, &directory, &fileName, &extension);
    EXPECT_TRUE(drive.IsEmpty() && directory.IsEmpty() && fileName.IsEmpty() &&
                extension.IsEmpty());
    // A part not asked for does not count.
    EXPECT_EQ(vaskel::VKGetDrive(tooLong.c_str()), "C:");
    EXPECT_EQ(vaskel::VKGetFileExt(tooLong.c_str()), ".txt");

    const std::string longDirectory = "\\" + std::string(300, 'd') + "\\f.e";
    EXPECT_EQ(vaskel::VKGetDirectory(longDirectory.c_str()), "");
    EXPECT_EQ(vaskel::VKGetFileName(longDirectory.c_str()), "f");
}

TEST(VKMakePath, JoinsWithDriveColonSeparatorAndDot) {
    EXPECT_EQ(vaskel::VKMakePath("C", "dir", "file", "txt"), "C:dir\\file.txt");
    EXPECT_EQ(vaskel::VKMakePath("C:", "\\dir/", "file", ".txt"), "C:\\dir/file.txt");
    EXPECT_EQ(vaskel::VKMakePath(nullptr, nullptr, "file", nullptr), "file");
    EXPECT_EQ(vaskel::VKMakePath("", "", "", ""), "");
    EXPECT_EQ(vaskel::VKMakePath(nullptr, "dir", nullptr, "txt"), "dir\\.txt");
}

TEST(VKMakePath, UndoesTheSplit) {
    for (const char* path : {"C:\\dir\\sub\\name.tar.gz", "c:/a/b", "dir\\", ".profile", "x.y."}) {
        EXPECT_EQ(vaskel::VKMakePath(vaskel::VKGetDrive(path), vaskel::VKGetDirectory(path),
                                     vaskel::VKGetFileName(path), vaskel::VKGetFileExt(path)),
                  path);
    }
}

TEST(VKMakePath, APathLongerThanMaxPathIsEmpty) {
    const std::string directory(250, 'd'); // "C:" + 250 + "\" + name + ".e"
    const std::string fits(259 - 2 - 250 - 1 - 2, 'f');
    CString path = vaskel::VKMakePath("C", directory.c_str(), fits.c_str(), "e");
    EXPECT_EQ(path.GetLength(), 259);
    EXPECT_EQ(vaskel::VKMakePath("C", directory.c_str(), (fits + "f").c_str(), "e"), "");
    const std::string huge(100000, 'x');
    EXPECT_EQ(vaskel::VKMakePath(huge.c_str(), huge.c_str(), huge.c_str(), huge.c_str()), "");
}

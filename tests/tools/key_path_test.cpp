#include "key_path.h"

#include <gtest/gtest.h>

#include <string>

using namespace vaskel::regtool;

namespace {

std::string Parsed(std::string_view text, RootNames names = RootNames::FullOrShort) {
    KeyPath path;
    std::string error;
    if (!ParseKeyPath(text, names, path, error))
        return "error";
    EXPECT_TRUE(error.empty());
    return path.Text();
}

TEST(KeyPathTest, ReadsRootsByFullNameOrAbbreviation) {
    EXPECT_EQ(Parsed("HKCU\\Software\\X"), "HKEY_CURRENT_USER\\Software\\X");
    EXPECT_EQ(Parsed("hklm\\Software"), "HKEY_LOCAL_MACHINE\\Software");
    EXPECT_EQ(Parsed("HKCR"), "HKEY_CLASSES_ROOT");
    EXPECT_EQ(Parsed("Hkey_Current_User\\a"), "HKEY_CURRENT_USER\\a");
    EXPECT_EQ(Parsed("HKCU\\a", RootNames::FullOnly), "error");
    EXPECT_EQ(Parsed("HKEY_LOCAL_MACHINE", RootNames::FullOnly), "HKEY_LOCAL_MACHINE");
    for (const char* text :
         {"", "HKU\\x", "HKEY_USERS", "HKCUx", "\\HKCU\\x", "\\\\pc\\HKCU\\x", "Software\\x"})
        EXPECT_EQ(Parsed(text), "error") << text;
}

TEST(KeyPathTest, TakesOneTrailingBackslashAndNoEmptyNames) {
    EXPECT_EQ(Parsed("HKCU\\a\\"), "HKEY_CURRENT_USER\\a");
    EXPECT_EQ(Parsed("HKCU\\"), "HKEY_CURRENT_USER");
    EXPECT_EQ(Parsed("HKCU\\a/b c\\d"), "HKEY_CURRENT_USER\\a/b c\\d");
    for (const char* text : {"HKCU\\\\", "HKCU\\a\\\\", "HKCU\\a\\\\b", "HKCU\\\\a"})
        EXPECT_EQ(Parsed(text), "error") << text;
}

TEST(KeyPathTest, LimitsNamesToTheSystemsLength) {
    EXPECT_NE(Parsed("HKCU\\" + std::string(255, 'k')), "error");
    EXPECT_EQ(Parsed("HKCU\\a\\" + std::string(256, 'k')), "error");
    // Counted in UTF-16 units: 255 two-byte characters fit.
    std::string wide;
    for (int i = 0; i < 255; ++i)
        wide += "\xC3\xA9";
    EXPECT_NE(Parsed("HKCU\\" + wide), "error");
}

TEST(KeyPathTest, SplitsOffTheLastName) {
    KeyPath path{RootKey::LocalMachine, "Software\\Classes\\x"};
    std::string name;
    KeyPath parent = path.Parent(name);
    EXPECT_EQ(name, "x");
    EXPECT_EQ(parent.Text(), "HKEY_LOCAL_MACHINE\\Software\\Classes");
    parent = KeyPath{RootKey::CurrentUser, "top"}.Parent(name);
    EXPECT_EQ(name, "top");
    EXPECT_TRUE(parent.IsRoot());
}

} // namespace

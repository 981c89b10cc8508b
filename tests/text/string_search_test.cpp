#include <vaskel/text.h>

#include <gtest/gtest.h>

#include <cstring>

using vaskel::CString;

TEST(VKFindString, SearchesOnlyTheGivenLength) {
    const char* text = "hello";
    EXPECT_EQ(vaskel::VKFindString(text, 4, "lo", 2), nullptr);
    EXPECT_EQ(vaskel::VKFindString(text, 5, "lo", 2), text + 3);
    EXPECT_EQ(vaskel::VKFindString(text, 5, "hello", 5), text);
    EXPECT_EQ(vaskel::VKFindString(text, 5, "hellos", 6), nullptr);
    EXPECT_EQ(vaskel::VKFindString(text, 5, "l", 1), text + 2) << "the first occurrence";
}

TEST(VKFindString, EmptyOrNullArgumentsFindNothing) {
    EXPECT_EQ(vaskel::VKFindString("abc", 0, "a", 1), nullptr);
    EXPECT_EQ(vaskel::VKFindString("abc", 3, "a", 0), nullptr);
    EXPECT_EQ(vaskel::VKFindString(nullptr, 3, "a", 1), nullptr);
    EXPECT_EQ(vaskel::VKFindString("abc", 3, nullptr, 1), nullptr);
}

TEST(VKFindString, ComparesNulBytesLikeAnyOther) {
    const char text[] = {'a', '\0', 'b', 'c', '\0', 'd'};
    const char pattern[] = {'\0', 'd'};
    EXPECT_EQ(vaskel::VKFindString(text, sizeof text, pattern, sizeof pattern), text + 4);
    EXPECT_EQ(vaskel::VKFindString(text, sizeof text, "bc", 2), text + 2);
}

TEST(VKFindStringNoCase, IgnoresCaseOfEitherSide) {
    const char* text = "hello";
    EXPECT_EQ(vaskel::VKFindStringNoCase(text, 5, "LL", 2), text + 2);
    const char* upper = "HeLLo";
    EXPECT_EQ(vaskel::VKFindStringNoCase(upper, 5, "eLlO", 4), upper + 1);
    const char* mixed = "xANDyandz";
    EXPECT_EQ(vaskel::VKFindStringNoCase(mixed, 9, "and", 3), mixed + 1);
    EXPECT_EQ(vaskel::VKFindStringNoCase(mixed, 9, "Q", 1), nullptr);
    EXPECT_EQ(vaskel::VKFindStringNoCase(mixed, 3, "and", 3), nullptr)
        << "bounded like the plain form";
}

TEST(VKSkipWhiteSpaces, StopsAtTheFirstOtherCharacterOrTheEnd) {
    const char* text = " \t\r\n\v\fword ";
    vaskel::VKSkipWhiteSpaces(text);
    EXPECT_STREQ(text, "word ");
    const char* blank = "   ";
    vaskel::VKSkipWhiteSpaces(blank);
    EXPECT_EQ(*blank, '\0');
    const char* none = nullptr;
    vaskel::VKSkipWhiteSpaces(none);
    EXPECT_EQ(none, nullptr);
}

TEST(VKCopyStringToBuffer, CutsToFitAndAlwaysTerminates) {
    char buffer[8];
    std::memset(buffer, 'x', sizeof buffer);
    vaskel::VKCopyStringToBuffer(buffer, 4, CString("abcdef"));
    EXPECT_STREQ(buffer, "abc");
    EXPECT_EQ(buffer[4], 'x') << "nothing is written beyond the given size";

    vaskel::VKCopyStringToBuffer(buffer, sizeof buffer, CString("abc"));
    EXPECT_STREQ(buffer, "abc");

    vaskel::VKCopyStringToBuffer(buffer, 1, CString("abc"));
    EXPECT_STREQ(buffer, "");

    buffer[0] = 'q';
    vaskel::VKCopyStringToBuffer(buffer, 0, CString("abc"));
    EXPECT_EQ(buffer[0], 'q') << "size 0 leaves the buffer untouched";
}

TEST(VKReserveStringBuffer, GrowsRoomAndKeepsTheText) {
    CString text("abc");
    CString shared = text;
    vaskel::VKReserveStringBuffer(text, 1000);
    EXPECT_GE(text.GetAllocLength(), 1000);
    EXPECT_EQ(text.GetLength(), 3);
    EXPECT_STREQ(text, "abc");
    EXPECT_STREQ(shared, "abc");
    text += "def";
    EXPECT_STREQ(text, "abcdef");
    EXPECT_STREQ(shared, "abc");
}

// Multibyte string functions of the runtime. The multibyte code page is UTF-8
// on POSIX but a single-byte ANSI code page on Windows, where a byte of 0x80
// or above is a character of its own (and may have a case); the cases with
// multibyte characters therefore run on POSIX only.
#include <vaskel/win32.h>

#include "support/invalid_parameter.h"
#include "support/wine.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <cstring>

namespace {

const unsigned char* Bytes(const char* text) {
    return reinterpret_cast<const unsigned char*>(text);
}

int Sign(int value) {
    return (value > 0) - (value < 0);
}

} // namespace

TEST(MbstringTest, ChrFindsTheFirstCharacterOrTheTerminator) {
    const unsigned char* text = Bytes("a,b,c");
    EXPECT_EQ(_mbschr(text, ','), text + 1);
    EXPECT_EQ(_mbschr(text, 'c'), text + 4);
    EXPECT_EQ(_mbschr(text, 'z'), nullptr);
    EXPECT_EQ(_mbschr(text, 0), text + 5) << "the terminator is part of the search";
    EXPECT_EQ(_mbschr(Bytes(""), 'a'), nullptr);
}

TEST(MbstringTest, StrFindsTheFirstOccurrence) {
    const unsigned char* text = Bytes("one two two");
    EXPECT_EQ(_mbsstr(text, Bytes("two")), text + 4);
    EXPECT_EQ(_mbsstr(text, Bytes("one two two")), text);
    EXPECT_EQ(_mbsstr(text, Bytes("o t")), text + 6);
    EXPECT_EQ(_mbsstr(text, Bytes("three")), nullptr);
    EXPECT_EQ(_mbsstr(text, Bytes("one two two!")), nullptr);
    EXPECT_EQ(_mbsstr(text, Bytes("")), text) << "an empty pattern is found at the start";
    EXPECT_EQ(_mbsstr(Bytes(""), Bytes("a")), nullptr);
}

TEST(MbstringTest, NbcmpComparesAtMostCountBytesInByteOrder) {
    EXPECT_EQ(_mbsnbcmp(Bytes("abcX"), Bytes("abcY"), 3), 0);
    EXPECT_EQ(Sign(_mbsnbcmp(Bytes("abcX"), Bytes("abcY"), 4)), -1);
    EXPECT_EQ(Sign(_mbsnbcmp(Bytes("abd"), Bytes("abc"), 10)), 1);
    EXPECT_EQ(_mbsnbcmp(Bytes("x"), Bytes("y"), 0), 0);
    EXPECT_EQ(Sign(_mbsnbcmp(Bytes("ab"), Bytes("abc"), 5)), -1) << "the shorter is less";
    EXPECT_EQ(_mbsnbcmp(Bytes("ab\0x"), Bytes("ab\0y"), 4), 0) << "nothing after the terminator";
    EXPECT_EQ(Sign(_mbsnbcmp(Bytes("a"), Bytes("A"), 1)), 1) << "case counts";
    EXPECT_EQ(Sign(_mbsnbcmp(Bytes("\x80"), Bytes("z"), 1)), 1) << "bytes compare unsigned";
}

TEST(MbstringTest, NbicmpComparesLowerCase) {
    EXPECT_EQ(_mbsnbicmp(Bytes("ABCdef"), Bytes("abcDEF"), 6), 0);
    EXPECT_EQ(_mbsnbicmp(Bytes("abcX"), Bytes("ABCY"), 3), 0);
    EXPECT_EQ(Sign(_mbsnbicmp(Bytes("abc"), Bytes("ABD"), 3)), -1);
    EXPECT_EQ(Sign(_mbsnbicmp(Bytes("AB"), Bytes("abc"), 3)), -1) << "the shorter is less";
    // Folded to lower case, 'E' becomes 'e', which sorts after '^'; folded
    // to upper case it would sort before.
    EXPECT_EQ(Sign(_mbsnbicmp(Bytes("ABCDE"), Bytes("ABCD^"), 5)), 1);
    EXPECT_EQ(_mbsnbicmp(Bytes("[a]"), Bytes("[A]"), 3), 0);
    EXPECT_EQ(Sign(_mbsnbicmp(Bytes("@"), Bytes("`"), 1)), -1) << "only letters fold";
}

TEST(MbstringTest, LwrSLowersLettersInPlace) {
    unsigned char text[] = "MiXeD 123 [Z]";
    ASSERT_EQ(_mbslwr_s(text, sizeof text), 0);
    EXPECT_STREQ(reinterpret_cast<char*>(text), "mixed 123 [z]");

    unsigned char exact[] = "AB";
    ASSERT_EQ(_mbslwr_s(exact, 3), 0) << "the terminator may be the last byte";
    EXPECT_STREQ(reinterpret_cast<char*>(exact), "ab");
}

TEST(MbstringTest, IsmbcspaceIsTrueForSpaceAndTheControlRange) {
    for (unsigned int c : {0x20u, 0x09u, 0x0Au, 0x0Bu, 0x0Cu, 0x0Du})
        EXPECT_NE(_ismbcspace(c), 0) << c;
    for (unsigned int c : {0x00u, 0x08u, 0x0Eu, 0x21u, 0x30u, 0x41u, 0x7Fu})
        EXPECT_EQ(_ismbcspace(c), 0) << c;
}

TEST(MbstringTest, NullStringsAreRefused) {
    vaskel_test::InvalidParameterGuard guard;
    const unsigned char* const none = nullptr; // picks the const overloads on Windows
    errno = 0;
    EXPECT_EQ(_mbschr(none, 'a'), nullptr);
    EXPECT_EQ(errno, EINVAL);
    EXPECT_EQ(_mbsnbicmp(none, Bytes("a"), 1), _NLSCMPERROR);
    EXPECT_EQ(_mbsnbicmp(Bytes("a"), none, 1), _NLSCMPERROR);
}

TEST(MbstringTest, StrAndNbcmpRefuseNullStrings) {
    if (vaskel_test::RunningOnWine())
        GTEST_SKIP() << "Wine 8's _mbsstr and _mbsnbcmp hand null strings on to strstr and "
                        "strncmp, which fault";
    vaskel_test::InvalidParameterGuard guard;
    const unsigned char* const none = nullptr;
    errno = 0;
    EXPECT_EQ(_mbsstr(none, Bytes("a")), nullptr);
    EXPECT_EQ(errno, EINVAL);
    EXPECT_EQ(_mbsstr(Bytes("a"), none), nullptr);
    EXPECT_EQ(_mbsnbcmp(none, Bytes("a"), 1), _NLSCMPERROR);
    EXPECT_EQ(_mbsnbcmp(Bytes("a"), none, 1), _NLSCMPERROR);
}

TEST(MbstringTest, LwrSRefusesAStringItsBufferDoesNotEnd) {
    vaskel_test::InvalidParameterGuard guard;
    unsigned char text[] = "ABC";
    EXPECT_EQ(_mbslwr_s(text, 3), EINVAL) << "no terminator within 3 bytes";
    EXPECT_EQ(_mbslwr_s(text, 0), EINVAL);
    EXPECT_EQ(_mbslwr_s(nullptr, 4), EINVAL);
}

#ifndef _WIN32

TEST(MbstringTest, ChrFindsUtf8CharactersWhole) {
    const unsigned char* text = Bytes("na\xC3\xAFve caf\xC3\xA9 \xE2\x82\xAC \xF0\x9F\x98\x80");
    EXPECT_EQ(_mbschr(text, 0xC3AF), text + 2);  // U+00EF
    EXPECT_EQ(_mbschr(text, 0xC3A9), text + 10); // U+00E9
    EXPECT_EQ(_mbschr(text, 0xE282AC), text + 13);
    EXPECT_EQ(_mbschr(text, 0xF09F9880), text + 17);
    EXPECT_EQ(_mbschr(text, 0xC3A0), nullptr);
    // Single bytes of a character are not characters.
    EXPECT_EQ(_mbschr(text, 0xC3), nullptr);
    EXPECT_EQ(_mbschr(text, 0xA9), nullptr);
    EXPECT_EQ(_mbschr(text, 0x82AC), nullptr);
    // Neither are two characters together.
    EXPECT_EQ(_mbschr(Bytes("ab"), 0x6162), nullptr);
}

TEST(MbstringTest, IllFormedBytesAreCharactersOfTheirOwn) {
    const unsigned char* stray = Bytes("x\xA9y");
    EXPECT_EQ(_mbschr(stray, 0xA9), stray + 1);
    EXPECT_EQ(_mbsstr(stray, Bytes("\xA9")), stray + 1);
    const unsigned char* truncated = Bytes("\xC3x\xE2\x82");
    EXPECT_EQ(_mbschr(truncated, 0xC3), truncated);
    EXPECT_EQ(_mbschr(truncated, 'x'), truncated + 1);
    EXPECT_EQ(_mbschr(truncated, 0x82), truncated + 3);
    const unsigned char* overlong = Bytes("\xC0\xAF\xED\xA0\x80"); // '/' and a surrogate
    EXPECT_EQ(_mbschr(overlong, 0xC0AF), nullptr);
    EXPECT_EQ(_mbschr(overlong, 0xAF), overlong + 1);
    EXPECT_EQ(_mbschr(overlong, 0xA0), overlong + 3);
}

TEST(MbstringTest, StrMatchesOnlyWholeUtf8Characters) {
    const unsigned char* text = Bytes("a\xC3\xA9\xE2\x82\xAC");
    EXPECT_EQ(_mbsstr(text, Bytes("\xC3\xA9")), text + 1);
    EXPECT_EQ(_mbsstr(text, Bytes("\xE2\x82\xAC")), text + 3);
    EXPECT_EQ(_mbsstr(text, Bytes("\xA9\xE2")), nullptr) << "starts inside a character";
    EXPECT_EQ(_mbsstr(text, Bytes("a\xC3")), nullptr) << "ends inside a character";
    EXPECT_EQ(_mbsstr(text, Bytes("\x82")), nullptr);
    // A later occurrence on character boundaries is still found.
    const unsigned char* later = Bytes("\xC3\xA9 \xA9");
    EXPECT_EQ(_mbsstr(later, Bytes("\xA9")), later + 3);
}

TEST(MbstringTest, ComparisonsOrderUtf8ByCodePointAndFoldOnlyAscii) {
    // U+00E9 (C3 A9) < U+0151 (C5 91) < U+20AC (E2 82 AC)
    EXPECT_EQ(Sign(_mbsnbcmp(Bytes("\xC3\xA9"), Bytes("\xC5\x91"), 2)), -1);
    EXPECT_EQ(Sign(_mbsnbcmp(Bytes("\xE2\x82\xAC"), Bytes("\xC5\x91"), 3)), 1);
    EXPECT_EQ(Sign(_mbsnbcmp(Bytes("z"), Bytes("\xC3\xA9"), 2)), -1);
    // U+00C9 and U+00E9 differ in case only, which is not folded here.
    EXPECT_NE(_mbsnbicmp(Bytes("\xC3\x89t\xC3\xA9"), Bytes("\xC3\xA9T\xC3\xA9"), 5), 0);
    EXPECT_EQ(_mbsnbicmp(Bytes("\xC3\xA9T\xC3\xA9"), Bytes("\xC3\xA9t\xC3\xA9"), 5), 0);
}

TEST(MbstringTest, LwrSLeavesMultibyteCharactersAlone) {
    unsigned char text[] = "\xC3\x89"
                           "COLE \xC3\x80 NO\xC3\x8B"
                           "L";
    ASSERT_EQ(_mbslwr_s(text, sizeof text), 0);
    EXPECT_STREQ(reinterpret_cast<char*>(text), "\xC3\x89"
                                                "cole \xC3\x80 no\xC3\x8B"
                                                "l");
}

TEST(MbstringTest, IsmbcspaceCountsNoMultibyteCharacter) {
    EXPECT_EQ(_ismbcspace(0xC2A0), 0);   // U+00A0, no-break space
    EXPECT_EQ(_ismbcspace(0xE38080), 0); // U+3000, ideographic space
}

#endif // _WIN32

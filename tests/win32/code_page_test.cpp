// Code-page conversions as Windows documents them; the same tests run against
// the system on Windows.
#include "support/wine.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <climits>
#include <string>
#include <utility>

namespace {

using WString = std::basic_string<WCHAR>; // WCHAR is char16_t outside Windows
using U16 = std::u16string;

int M2W(const char* text, int length, WCHAR* out, int size, DWORD flags = 0) {
    return MultiByteToWideChar(CP_UTF8, flags, text, length, out, size);
}

int W2M(const WCHAR* text, int length, char* out, int size, DWORD flags = 0,
        LPCSTR defaultChar = nullptr, LPBOOL usedDefault = nullptr) {
    return WideCharToMultiByte(CP_UTF8, flags, text, length, out, size, defaultChar, usedDefault);
}

U16 ToUtf16(const std::string& in) {
    WCHAR out[16];
    return U16(out, out + M2W(in.c_str(), static_cast<int>(in.size()), out, 16));
}

std::string ToUtf8(const U16& text) {
    const WString in(text.begin(), text.end());
    char out[32];
    return std::string(out, W2M(in.c_str(), static_cast<int>(in.size()), out, 32));
}

// The last error of a failed call (0xFFFFFFFF after a success), then reset.
DWORD ErrorOf(int result) {
    DWORD error = result == 0 ? GetLastError() : 0xFFFFFFFFu;
    SetLastError(ERROR_SUCCESS);
    return error;
}

// Wine 8 skips some documented checks: it splits a surrogate pair to fill a
// buffer and, with CP_UTF8, ignores other flags and converts in place.
using vaskel_test::RunningOnWine;

TEST(CodePageTest, RoundTripsEveryUtf8Length) {
    // The first and last code point of each length, an embedded NUL and mixed text.
    const std::pair<std::string, U16> samples[] = {
        {std::string("Hi\0~\t\x7F", 6), U16(u"Hi\0~\t\u007F", 6)},
        {"\xC2\x80\xDF\xBF\xE0\xA0\x80\xEF\xBF\xBF", u"\u0080\u07FF\u0800\uFFFF"},
        {"a\xC3\xA9z\xF0\x90\x80\x80\xF4\x8F\xBF\xBF", u"a\u00E9z\U00010000\U0010FFFF"}};
    for (const auto& [utf8, utf16] : samples) {
        EXPECT_EQ(ToUtf16(utf8), utf16) << ::testing::PrintToString(utf8);
        EXPECT_EQ(ToUtf8(utf16), utf8);
    }
}

TEST(CodePageTest, SizeQueriesAndBufferSizes) {
    const char* text = "a\xF0\x9F\x98\x80z"; // a, a surrogate pair, z
    const WCHAR back[] = {'a', 0xD83D, 0xDE00, 'z', 0};
    WCHAR wide[8] = {};
    char bytes[8] = {};
    // A size query writes nothing, even into a buffer given with size zero;
    // -1 counts the NUL, an explicit length adds none.
    EXPECT_EQ(M2W(text, 6, wide, 0), 4);
    EXPECT_EQ(M2W(text, -1, nullptr, 0), 5);
    EXPECT_EQ(W2M(back, 4, bytes, 0), 6);
    EXPECT_EQ(W2M(back, -1, nullptr, 0), 7);
    EXPECT_EQ(wide[0] + bytes[0], 0);
    // An exact fit succeeds; one short fails and writes nothing past the size given.
    wide[5] = 0x5A5A;
    ASSERT_EQ(M2W(text, -1, wide, 5), 5);
    EXPECT_EQ(U16(wide, wide + 6), U16(u"a\U0001F600z\0\u5A5A", 6));
    wide[4] = 0x5A5A;
    EXPECT_EQ(ErrorOf(M2W(text, -1, wide, 4)), ERROR_INSUFFICIENT_BUFFER);
    EXPECT_EQ(wide[4], 0x5A5A);
    bytes[7] = '#';
    ASSERT_EQ(W2M(back, -1, bytes, 7), 7);
    EXPECT_EQ(std::string(bytes, 8), std::string(text, 7) + '#');
    bytes[6] = '#';
    EXPECT_EQ(ErrorOf(W2M(back, 3, bytes, 4)), ERROR_INSUFFICIENT_BUFFER); // no sequence cut
    EXPECT_EQ(ErrorOf(W2M(back, -1, bytes, 6)), ERROR_INSUFFICIENT_BUFFER);
    EXPECT_EQ(bytes[6], '#');
    if (RunningOnWine())
        GTEST_SKIP() << "Wine splits a surrogate pair to fill the buffer";
    EXPECT_EQ(ErrorOf(M2W(text, 5, wide, 2)), ERROR_INSUFFICIENT_BUFFER);
}

TEST(CodePageTest, AnyNegativeLengthCountsUpToTheNul) {
    // Windows takes every negative length as -1, not only -1 itself.
    const WCHAR text[] = {'a', 0xE9, 0};
    WCHAR wide[4] = {0, 0, 0, 0x5A5A};
    char bytes[5] = {0, 0, 0, 0, '#'};
    EXPECT_EQ(M2W("a\xC3\xA9", -2, wide, 4), 3);
    EXPECT_EQ(U16(wide, wide + 4), U16(u"a\u00E9\0\u5A5A", 4));
    EXPECT_EQ(W2M(text, INT_MIN, bytes, 5), 4);
    EXPECT_EQ(std::string(bytes, 5), std::string("a\xC3\xA9\0#", 5));
}

TEST(CodePageTest, InvalidParametersFlagsAndDefaultCharacters) {
    WCHAR wide[8] = {'a', 'b', 'c'};
    char bytes[8] = "abc";
    const DWORD invalid = ERROR_INVALID_PARAMETER;
    EXPECT_EQ(ErrorOf(M2W(nullptr, 3, wide, 8)), invalid);
    EXPECT_EQ(ErrorOf(M2W(bytes, 0, wide, 8)), invalid);
    EXPECT_EQ(ErrorOf(W2M(nullptr, 3, bytes, 8)), invalid);
    EXPECT_EQ(ErrorOf(W2M(wide, 0, bytes, 8)), invalid);
    if (RunningOnWine())
        GTEST_SKIP() << "Wine converts in place and ignores the rest with CP_UTF8";
    EXPECT_EQ(ErrorOf(M2W(bytes, 3, reinterpret_cast<LPWSTR>(bytes), 4)), invalid);
    EXPECT_EQ(ErrorOf(W2M(wide, 3, reinterpret_cast<LPSTR>(wide), 16)), invalid);
    BOOL used = TRUE;
    EXPECT_EQ(ErrorOf(W2M(wide, 3, bytes, 8, 0, "?")), invalid);
    EXPECT_EQ(ErrorOf(W2M(wide, 3, bytes, 8, 0, nullptr, &used)), invalid);
    EXPECT_EQ(ErrorOf(M2W(bytes, 3, wide, 8, 0x0001)), ERROR_INVALID_FLAGS); // MB_PRECOMPOSED
    EXPECT_EQ(ErrorOf(W2M(wide, 3, bytes, 8, 0x0200)), ERROR_INVALID_FLAGS); // WC_COMPOSITECHECK
}

TEST(CodePageTest, IllFormedInputIsReplacedOrRefused) {
    // Stray and overlong bytes, an encoded surrogate, a code point past U+10FFFF and
    // sequences cut short.
    WCHAR wide[8];
    for (const char* in : {"\x80z", "\xC0\xAF", "\xE0\x80\xAF", "\xED\xA0\x80", "\xF4\x90\x80\x80",
                           "a\xC3", "\xF0\x9F\xE2\x82\xAC"}) {
        EXPECT_NE(ToUtf16(in).find(u'\uFFFD'), U16::npos) << ::testing::PrintToString(in);
        EXPECT_EQ(ErrorOf(M2W(in, -1, wide, 8, MB_ERR_INVALID_CHARS)),
                  ERROR_NO_UNICODE_TRANSLATION);
    }
    EXPECT_EQ(ToUtf16("\xF0\x9F\xE2\x82\xAC"), u"\uFFFD\u20AC"); // nothing valid swallowed
    const std::string fffd = "\xEF\xBF\xBD";
    const std::pair<U16, std::string> utf16[] = {
        {{u'a', 0xD800}, "a" + fffd},
        {{0xDC00, u'b'}, fffd + "b"},
        {{0xD83D, 0xD83D, 0xDE00}, fffd + "\xF0\x9F\x98\x80"}};
    char bytes[16];
    for (const auto& [in, replaced] : utf16) {
        EXPECT_EQ(ToUtf8(in), replaced);
        const WString wideIn(in.begin(), in.end());
        EXPECT_EQ(ErrorOf(W2M(wideIn.c_str(), -1, bytes, 16, WC_ERR_INVALID_CHARS)),
                  ERROR_NO_UNICODE_TRANSLATION);
    }
}

} // namespace

// Code-page conversions as Windows documents them for MultiByteToWideChar and
// WideCharToMultiByte. The same tests run against the system on Windows, so
// only documented behaviour is pinned for both; what holds only for this
// library's own implementation (the ANSI code page is UTF-8 there, ill-formed
// input is replaced per maximal subpart) is checked apart.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <iterator>
#include <optional>
#include <string>
#include <vector>

namespace {

// WCHAR is wchar_t on Windows and char16_t elsewhere; tests spell text as
// UTF-16 literals and convert at the call.
using WString = std::basic_string<WCHAR>;

WString Wide(const std::u16string& text) {
    return WString(text.begin(), text.end());
}

std::u16string Utf16(const WCHAR* units, int count) {
    return std::u16string(units, units + count);
}

// Code units no conversion here produces, to see what a call left alone.
const WCHAR wideSentinel = 0x5A5A;
const char byteSentinel = '#';

// Converts the way callers do: a size query, then a buffer of that size.
// Nothing when either call fails.
std::optional<std::u16string> ToUtf16(const std::string& bytes, DWORD flags = 0,
                                      UINT codePage = CP_UTF8) {
    int length = static_cast<int>(bytes.size());
    int needed = MultiByteToWideChar(codePage, flags, bytes.data(), length, nullptr, 0);
    if (needed <= 0)
        return std::nullopt;
    std::vector<WCHAR> out(static_cast<size_t>(needed));
    if (MultiByteToWideChar(codePage, flags, bytes.data(), length, out.data(), needed) != needed)
        return std::nullopt;
    return Utf16(out.data(), needed);
}

std::optional<std::string> ToUtf8(const std::u16string& text, DWORD flags = 0,
                                  UINT codePage = CP_UTF8) {
    WString wide = Wide(text);
    int length = static_cast<int>(wide.size());
    int needed =
        WideCharToMultiByte(codePage, flags, wide.data(), length, nullptr, 0, nullptr, nullptr);
    if (needed <= 0)
        return std::nullopt;
    std::string out(static_cast<size_t>(needed), '\0');
    if (WideCharToMultiByte(codePage, flags, wide.data(), length, &out[0], needed, nullptr,
                            nullptr) != needed)
        return std::nullopt;
    return out;
}

// Whether a conversion failed, returning zero, with the expected last error.
// The error is read first: reporting a failed assertion may change it on
// Windows. It is reset afterwards so that the next check sees a fresh value.
::testing::AssertionResult FailedWith(DWORD expected, int result) {
    DWORD error = GetLastError();
    SetLastError(ERROR_SUCCESS);
    if (result == 0 && error == expected)
        return ::testing::AssertionSuccess();
    return ::testing::AssertionFailure() << "returned " << result << " with last error " << error
                                         << ", expected 0 with " << expected;
}

// Wine 8 leaves out some checks that Windows documents: it splits a surrogate
// pair to fill a buffer and, with CP_UTF8, converts in place and ignores other
// flags and the default-character arguments. Those tests are skipped there.
bool RunningOnWine() {
#ifdef _WIN32
    HMODULE ntdll = GetModuleHandleA("ntdll.dll");
    return ntdll != nullptr && GetProcAddress(ntdll, "wine_get_version") != nullptr;
#else
    return false;
#endif
}

struct Sample {
    const char* utf8;
    std::u16string utf16;
};

// The first and last code point of each UTF-8 length, and everyday characters.
const Sample samples[] = {
    {"\x7F", u"\u007F"},
    {"\xC2\x80", u"\u0080"},
    {"\xC3\xA9", u"\u00E9"},
    {"\xDF\xBF", u"\u07FF"},
    {"\xE0\xA0\x80", u"\u0800"},
    {"\xE2\x82\xAC", u"\u20AC"},
    {"\xEF\xBF\xBF", u"\uFFFF"},
    {"\xF0\x90\x80\x80", u"\U00010000"},
    {"\xF0\x9F\x98\x80", u"\U0001F600"},
    {"\xF4\x8F\xBF\xBF", u"\U0010FFFF"},
};

// Ill-formed UTF-8: stray and impossible bytes, overlong forms, an encoded
// surrogate, a code point past U+10FFFF and sequences cut short.
const char* const illFormed[] = {
    "\x80",
    "\xFF",
    "\xC0\xAF",
    "\xE0\x80\xAF",
    "\xED\xA0\x80",
    "\xF4\x90\x80\x80",
    "\xF8\x88\x80\x80\x80",
    "\xE2\x82",
    "\xF0\x9F\x98",
    "a\xC3",
};

TEST(CodePageTest, AsciiRoundTrips) {
    const std::string ascii = "Hello, world! 0123456789 ~\t\n";
    const std::u16string expected(ascii.begin(), ascii.end());
    EXPECT_EQ(ToUtf16(ascii), expected);
    EXPECT_EQ(ToUtf8(expected), ascii);
}

TEST(CodePageTest, MultiByteSequencesRoundTrip) {
    for (const Sample& sample : samples) {
        SCOPED_TRACE(::testing::PrintToString(std::string(sample.utf8)));
        EXPECT_EQ(ToUtf16(sample.utf8), sample.utf16);
        EXPECT_EQ(ToUtf8(sample.utf16), std::string(sample.utf8));
    }
    const std::string mixed = "a\xC3\xA9z\xE2\x82\xAC!\xF0\x9F\x98\x80.";
    const std::u16string mixedUtf16 = u"a\u00E9z\u20AC!\U0001F600.";
    ASSERT_EQ(mixedUtf16.size(), 8u); // the emoji is a surrogate pair
    EXPECT_EQ(ToUtf16(mixed), mixedUtf16);
    EXPECT_EQ(ToUtf8(mixedUtf16), mixed);
}

TEST(CodePageTest, SizeQueryCountsWithoutWriting) {
    const char* text = "a\xC3\xA9\xE2\x82\xAC\xF0\x9F\x98\x80"; // 1 + 1 + 1 + 2 units
    EXPECT_EQ(MultiByteToWideChar(CP_UTF8, 0, text, 10, nullptr, 0), 5);
    EXPECT_EQ(MultiByteToWideChar(CP_UTF8, 0, text, -1, nullptr, 0), 6);

    // A buffer given with size zero is not written either.
    WCHAR untouched[2] = {wideSentinel, wideSentinel};
    EXPECT_EQ(MultiByteToWideChar(CP_UTF8, 0, text, 10, untouched, 0), 5);
    EXPECT_EQ(untouched[0], wideSentinel);

    const WString wide = Wide(u"a\u00E9\u20AC\U0001F600");
    EXPECT_EQ(WideCharToMultiByte(CP_UTF8, 0, wide.c_str(), 5, nullptr, 0, nullptr, nullptr), 10);
    EXPECT_EQ(WideCharToMultiByte(CP_UTF8, 0, wide.c_str(), -1, nullptr, 0, nullptr, nullptr), 11);
    char bytes[2] = {byteSentinel, byteSentinel};
    EXPECT_EQ(WideCharToMultiByte(CP_UTF8, 0, wide.c_str(), 5, bytes, 0, nullptr, nullptr), 10);
    EXPECT_EQ(bytes[0], byteSentinel);
}

TEST(CodePageTest, MinusOneLengthConvertsTheTerminatingNul) {
    WCHAR wide[8];
    std::fill(std::begin(wide), std::end(wide), wideSentinel);
    ASSERT_EQ(MultiByteToWideChar(CP_UTF8, 0, "ab\xC3\xA9", -1, wide, 8), 4);
    EXPECT_EQ(Utf16(wide, 4), std::u16string(u"ab\u00E9\0", 4));
    EXPECT_EQ(wide[4], wideSentinel);

    // The empty string is just its terminator.
    EXPECT_EQ(MultiByteToWideChar(CP_UTF8, 0, "", -1, wide, 8), 1);
    EXPECT_EQ(wide[0], 0);

    char bytes[8];
    std::fill(std::begin(bytes), std::end(bytes), byteSentinel);
    const WString text = Wide(u"ab\u00E9");
    ASSERT_EQ(WideCharToMultiByte(CP_UTF8, 0, text.c_str(), -1, bytes, 8, nullptr, nullptr), 5);
    EXPECT_EQ(std::string(bytes, 5), std::string("ab\xC3\xA9\0", 5));
    EXPECT_EQ(bytes[5], byteSentinel);
}

TEST(CodePageTest, ExplicitLengthAddsNoTerminatorAndKeepsEmbeddedNuls) {
    WCHAR wide[8];
    std::fill(std::begin(wide), std::end(wide), wideSentinel);
    ASSERT_EQ(MultiByteToWideChar(CP_UTF8, 0, "a\0b", 3, wide, 8), 3);
    EXPECT_EQ(Utf16(wide, 3), std::u16string(u"a\0b", 3));
    EXPECT_EQ(wide[3], wideSentinel);

    char bytes[8];
    std::fill(std::begin(bytes), std::end(bytes), byteSentinel);
    const WString text = Wide(std::u16string(u"a\0b", 3));
    ASSERT_EQ(WideCharToMultiByte(CP_UTF8, 0, text.data(), 3, bytes, 8, nullptr, nullptr), 3);
    EXPECT_EQ(std::string(bytes, 3), std::string("a\0b", 3));
    EXPECT_EQ(bytes[3], byteSentinel);
}

TEST(CodePageTest, ExactFitSucceedsAndOneShortFails) {
    const char* text = "a\xF0\x9F\x98\x80z"; // a, a surrogate pair, z, then the NUL
    std::vector<WCHAR> wide(6, wideSentinel);
    ASSERT_EQ(MultiByteToWideChar(CP_UTF8, 0, text, -1, wide.data(), 5), 5);
    EXPECT_EQ(Utf16(wide.data(), 5), std::u16string(u"a\U0001F600z\0", 5));
    EXPECT_EQ(wide[5], wideSentinel);

    std::fill(wide.begin(), wide.end(), wideSentinel);
    EXPECT_TRUE(FailedWith(ERROR_INSUFFICIENT_BUFFER,
                           MultiByteToWideChar(CP_UTF8, 0, text, -1, wide.data(), 4)));
    EXPECT_EQ(wide[4], wideSentinel); // nothing past the size given

    const WString back = Wide(u"a\U0001F600z");
    std::vector<char> bytes(8, byteSentinel);
    ASSERT_EQ(WideCharToMultiByte(CP_UTF8, 0, back.c_str(), -1, bytes.data(), 7, nullptr, nullptr),
              7);
    EXPECT_EQ(std::string(bytes.data(), 7), std::string(text, 7));
    EXPECT_EQ(bytes[7], byteSentinel);

    std::fill(bytes.begin(), bytes.end(), byteSentinel);
    EXPECT_TRUE(FailedWith(
        ERROR_INSUFFICIENT_BUFFER,
        WideCharToMultiByte(CP_UTF8, 0, back.c_str(), -1, bytes.data(), 6, nullptr, nullptr)));
    EXPECT_EQ(bytes[6], byteSentinel);

    // A multibyte sequence is never cut to fill the last bytes.
    std::fill(bytes.begin(), bytes.end(), byteSentinel);
    EXPECT_TRUE(FailedWith(
        ERROR_INSUFFICIENT_BUFFER,
        WideCharToMultiByte(CP_UTF8, 0, back.c_str(), 3, bytes.data(), 4, nullptr, nullptr)));
    EXPECT_EQ(bytes[4], byteSentinel);
}

TEST(CodePageTest, SurrogatePairIsNeverSplitToFillTheBuffer) {
    if (RunningOnWine())
        GTEST_SKIP() << "Wine splits the pair";
    WCHAR wide[3] = {wideSentinel, wideSentinel, wideSentinel};
    EXPECT_TRUE(FailedWith(ERROR_INSUFFICIENT_BUFFER,
                           MultiByteToWideChar(CP_UTF8, 0, "a\xF0\x9F\x98\x80", 5, wide, 2)));
    EXPECT_EQ(wide[2], wideSentinel);
}

TEST(CodePageTest, InvalidParametersFail) {
    WCHAR wide[8] = {};
    char bytes[16] = {};
    const WString text = Wide(u"abc");
    EXPECT_TRUE(
        FailedWith(ERROR_INVALID_PARAMETER, MultiByteToWideChar(CP_UTF8, 0, nullptr, 3, wide, 8)));
    EXPECT_TRUE(
        FailedWith(ERROR_INVALID_PARAMETER, MultiByteToWideChar(CP_UTF8, 0, "abc", 0, wide, 8)));
    EXPECT_TRUE(
        FailedWith(ERROR_INVALID_PARAMETER,
                   WideCharToMultiByte(CP_UTF8, 0, nullptr, 3, bytes, 16, nullptr, nullptr)));
    EXPECT_TRUE(
        FailedWith(ERROR_INVALID_PARAMETER,
                   WideCharToMultiByte(CP_UTF8, 0, text.c_str(), 0, bytes, 16, nullptr, nullptr)));
}

TEST(CodePageTest, SameBufferForInputAndOutputIsInvalid) {
    if (RunningOnWine())
        GTEST_SKIP() << "Wine converts in place";
    char bytes[16] = "abc";
    EXPECT_TRUE(
        FailedWith(ERROR_INVALID_PARAMETER,
                   MultiByteToWideChar(CP_UTF8, 0, bytes, 3, reinterpret_cast<LPWSTR>(bytes), 8)));
    const WString text = Wide(u"abc");
    WCHAR wide[8] = {};
    std::copy(text.begin(), text.end(), wide);
    EXPECT_TRUE(FailedWith(ERROR_INVALID_PARAMETER,
                           WideCharToMultiByte(CP_UTF8, 0, wide, 3, reinterpret_cast<LPSTR>(wide),
                                               16, nullptr, nullptr)));
}

TEST(CodePageTest, Utf8AcceptsOnlyTheInvalidCharactersFlag) {
    if (RunningOnWine())
        GTEST_SKIP() << "Wine accepts any flags with CP_UTF8";
    const DWORD precomposed = 0x00000001;    // MB_PRECOMPOSED
    const DWORD compositeCheck = 0x00000200; // WC_COMPOSITECHECK
    WCHAR wide[8];
    char bytes[8];
    const WString text = Wide(u"abc");
    EXPECT_TRUE(FailedWith(ERROR_INVALID_FLAGS,
                           MultiByteToWideChar(CP_UTF8, precomposed, "abc", 3, wide, 8)));
    EXPECT_TRUE(
        FailedWith(ERROR_INVALID_FLAGS, WideCharToMultiByte(CP_UTF8, compositeCheck, text.c_str(),
                                                            3, bytes, 8, nullptr, nullptr)));

    EXPECT_EQ(MultiByteToWideChar(CP_UTF8, MB_ERR_INVALID_CHARS, "abc", 3, wide, 8), 3);
    EXPECT_EQ(WideCharToMultiByte(CP_UTF8, WC_ERR_INVALID_CHARS, text.c_str(), 3, bytes, 8, nullptr,
                                  nullptr),
              3);
}

TEST(CodePageTest, Utf8RefusesDefaultCharacterArguments) {
    if (RunningOnWine())
        GTEST_SKIP() << "Wine ignores the default-character arguments with CP_UTF8";
    const WString text = Wide(u"abc");
    char bytes[8];
    BOOL usedDefault = TRUE;
    EXPECT_TRUE(FailedWith(ERROR_INVALID_PARAMETER, WideCharToMultiByte(CP_UTF8, 0, text.c_str(), 3,
                                                                        bytes, 8, "?", nullptr)));
    EXPECT_TRUE(
        FailedWith(ERROR_INVALID_PARAMETER, WideCharToMultiByte(CP_UTF8, 0, text.c_str(), 3, bytes,
                                                                8, nullptr, &usedDefault)));
}

TEST(CodePageTest, IllFormedUtf8BecomesReplacementCharacters) {
    // Bytes that can begin no sequence are each replaced, whatever the policy
    // for longer ill-formed sequences.
    EXPECT_EQ(ToUtf16("A\xFFz"), std::u16string(u"A\uFFFDz"));
    EXPECT_EQ(ToUtf16("\xC0\x41\x42"), std::u16string(u"\uFFFDAB"));
    EXPECT_EQ(ToUtf16("\x80z"), std::u16string(u"\uFFFDz"));
    for (const char* bytes : illFormed) {
        SCOPED_TRACE(::testing::PrintToString(std::string(bytes)));
        std::optional<std::u16string> converted = ToUtf16(bytes);
        ASSERT_TRUE(converted.has_value());
        EXPECT_NE(converted->find(u'\uFFFD'), std::u16string::npos);
    }
}

TEST(CodePageTest, IllFormedUtf8FailsWhenInvalidCharactersAreErrors) {
    for (const char* bytes : illFormed) {
        SCOPED_TRACE(::testing::PrintToString(std::string(bytes)));
        int length = static_cast<int>(std::strlen(bytes));
        WCHAR wide[16];
        EXPECT_TRUE(FailedWith(
            ERROR_NO_UNICODE_TRANSLATION,
            MultiByteToWideChar(CP_UTF8, MB_ERR_INVALID_CHARS, bytes, length, nullptr, 0)));
        EXPECT_TRUE(FailedWith(
            ERROR_NO_UNICODE_TRANSLATION,
            MultiByteToWideChar(CP_UTF8, MB_ERR_INVALID_CHARS, bytes, length, wide, 16)));
    }
}

TEST(CodePageTest, LoneSurrogatesBecomeReplacementCharacters) {
    const std::string replacement = "\xEF\xBF\xBD";
    EXPECT_EQ(ToUtf8({u'a', 0xD800}), "a" + replacement);
    EXPECT_EQ(ToUtf8({0xDC00, u'b'}), replacement + "b");
    EXPECT_EQ(ToUtf8({0xD800, u'b'}), replacement + "b");
    EXPECT_EQ(ToUtf8({0xDC00, 0xD800}), replacement + replacement);
    EXPECT_EQ(ToUtf8({0xD83D, 0xD83D, 0xDE00}), replacement + "\xF0\x9F\x98\x80");
}

TEST(CodePageTest, LoneSurrogatesFailWhenInvalidCharactersAreErrors) {
    const std::u16string cases[] = {{u'a', 0xD800}, {0xDC00, u'b'}, {0xD800, u'b'}};
    for (const std::u16string& text : cases) {
        const WString wide = Wide(text);
        char bytes[16];
        EXPECT_TRUE(FailedWith(ERROR_NO_UNICODE_TRANSLATION,
                               WideCharToMultiByte(CP_UTF8, WC_ERR_INVALID_CHARS, wide.data(), 2,
                                                   nullptr, 0, nullptr, nullptr)));
        EXPECT_TRUE(FailedWith(ERROR_NO_UNICODE_TRANSLATION,
                               WideCharToMultiByte(CP_UTF8, WC_ERR_INVALID_CHARS, wide.data(), 2,
                                                   bytes, 16, nullptr, nullptr)));
    }
}

TEST(CodePageTest, AnsiCodePageCarriesAscii) {
    // Every ANSI code page is a superset of ASCII.
    EXPECT_NE(GetACP(), 0u);
    EXPECT_EQ(ToUtf16("plain text", 0, CP_ACP), std::u16string(u"plain text"));
    const WString text = Wide(u"plain");
    char bytes[8];
    BOOL usedDefault = TRUE;
    EXPECT_EQ(WideCharToMultiByte(CP_ACP, 0, text.c_str(), 5, bytes, 8, nullptr, &usedDefault), 5);
    EXPECT_FALSE(usedDefault);
    EXPECT_EQ(std::string(bytes, 5), "plain");
}

#ifndef _WIN32
TEST(CodePageTest, AnsiCodePagesAreUtf8) {
    EXPECT_EQ(GetACP(), static_cast<UINT>(CP_UTF8));
    for (UINT codePage : {CP_ACP, CP_OEMCP, CP_THREAD_ACP}) {
        SCOPED_TRACE(codePage);
        EXPECT_EQ(ToUtf16("\xE2\x82\xAC\xF0\x9F\x98\x80", 0, codePage),
                  std::u16string(u"\u20AC\U0001F600"));
        EXPECT_EQ(ToUtf8(u"\u20AC\U0001F600", 0, codePage),
                  std::string("\xE2\x82\xAC\xF0\x9F\x98\x80"));
    }
}

TEST(CodePageTest, IllFormedUtf8IsReplacedPerMaximalSubpart) {
    const Sample cases[] = {
        {"\xE2\x82z", u"\uFFFDz"}, // a cut-short prefix is one
        {"\xF0\x9F\x98z", u"\uFFFDz"},
        {"\xC0\xAF", u"\uFFFD\uFFFD"},                     // C0 starts nothing
        {"\xE0\x80\xAF", u"\uFFFD\uFFFD\uFFFD"},           // E0 needs A0..BF next
        {"\xED\xA0\x80", u"\uFFFD\uFFFD\uFFFD"},           // ED needs 80..9F next
        {"\xF4\x90\x80\x80", u"\uFFFD\uFFFD\uFFFD\uFFFD"}, // F4 needs 80..8F next
        {"\xF0\x9F\xE2\x82\xAC", u"\uFFFD\u20AC"},
    };
    for (const Sample& sample : cases) {
        SCOPED_TRACE(::testing::PrintToString(std::string(sample.utf8)));
        EXPECT_EQ(ToUtf16(sample.utf8), sample.utf16);
    }
}
#endif

} // namespace

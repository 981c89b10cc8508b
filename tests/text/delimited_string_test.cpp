#include "text/delimited_string_support.h"

#include <vaskel/text.h>

#include <gtest/gtest.h>

#include <cstdint>
#include <random>
#include <string>
#include <vector>

using vaskel::CDelimitedString;
using vaskel::CString;
using vaskel::CStringArray;
using vaskel::POSITION;

namespace {

using namespace delimited_test;

} // namespace

TEST(DelimitedStringTest, TokensAreTrimmedNonEmptySegments) {
    EXPECT_EQ(Tokens(List("")), Strings{});
    EXPECT_EQ(Tokens(List(" , ")), Strings{});
    EXPECT_EQ(Tokens(List("a,,b")), (Strings{"a", "b"}));
    EXPECT_EQ(Tokens(List("\t a b\r\n,\v,\f c")), (Strings{"a b", "c"}));
    EXPECT_EQ(Tokens(List("a;b,c", ';')), (Strings{"a", "b,c"}));
    EXPECT_EQ(List(" a , b ").GetTokenCount(), 2u);
    EXPECT_STREQ(List(" a ,, b").GetTokenAt(1), "b");
    EXPECT_STREQ(List("a,b").GetTokenAt(5), "");
}

TEST(DelimitedStringTest, WalksByPositionAndNeverLeavesTheText) {
    CDelimitedString list = List("a, b,c");
    POSITION position = list.GetFirstTokenPosition();
    EXPECT_STREQ(list.GetNextToken(position), "a");
    EXPECT_EQ(reinterpret_cast<std::uintptr_t>(position), 2u) << "just behind the delimiter";
    DWORD length = 0;
    const char* token = list.GetNextToken(position, length);
    EXPECT_EQ(std::string(token, length), "b");
    CString last("unchanged");
    EXPECT_STREQ(list.GetNextToken(position, last), "c");
    EXPECT_EQ(position, nullptr);
    EXPECT_EQ(list.GetNextToken(position, length), nullptr);
    EXPECT_STREQ(list.GetNextToken(position, last), "c") << "left as it was";

    EXPECT_EQ(CDelimitedString().GetFirstTokenPosition(), nullptr);
    CDelimitedString blank = List("a, ,");
    position = blank.GetFirstTokenPosition();
    EXPECT_STREQ(blank.GetNextToken(position), "a");
    EXPECT_NE(position, nullptr);
    EXPECT_FALSE(blank.GetNextToken(position, token, length)) << "only blank segments remain";
    EXPECT_EQ(position, nullptr);

    for (std::uintptr_t outside : {std::uintptr_t(4), ~std::uintptr_t(0) - 1}) {
        position = reinterpret_cast<POSITION>(outside);
        EXPECT_FALSE(blank.GetNextToken(position, token, length));
        EXPECT_EQ(position, nullptr);
    }
}

TEST(DelimitedStringTest, ScannerMovesTheCursorBehindEachToken) {
    const char* text = ", a ,, b";
    const char* cursor = text;
    const char* token = nullptr;
    DWORD length = 0;
    ASSERT_TRUE(CDelimitedString::GetNextToken(cursor, token, length, ','));
    EXPECT_EQ(token, text + 2);
    EXPECT_EQ(length, 1u);
    EXPECT_EQ(cursor, text + 5);
    ASSERT_TRUE(CDelimitedString::GetNextToken(cursor, token, length, ','));
    EXPECT_EQ(cursor, text + 8) << "onto the NUL";
    EXPECT_FALSE(CDelimitedString::GetNextToken(cursor, token, length, ','));
    const char* none = nullptr;
    EXPECT_FALSE(CDelimitedString::GetNextToken(none, token, length, ','));
}

TEST(DelimitedStringTest, ValidWhenTheWalkEndsAtTheEnd) {
    for (const char* valid : {"", "a,b", "a,b,", ",a", "a,,b", " a "})
        EXPECT_TRUE(List(valid).IsValid()) << valid;
    for (const char* invalid : {"a, ", "a,,", " ", ",", "a,b, ,"})
        EXPECT_FALSE(List(invalid).IsValid()) << invalid;
}

TEST(DelimitedStringTest, FindTokenComparesWholeTokensWithTheTextAsGiven) {
    CDelimitedString list = List("a, b ,c");
    EXPECT_EQ(list.FindToken(CString("b")), 1u);
    EXPECT_EQ(list.FindToken(CString(" b")), allOnes) << "the search text is not trimmed";
    EXPECT_EQ(list.FindToken(CString("B")), allOnes);
    EXPECT_EQ(list.FindTokenNoCase(CString("B")), 1u);
    EXPECT_EQ(list.FindToken(noCase, CString("C")), 2u);
    EXPECT_EQ(list.FindToken(CString("")), allOnes);
    EXPECT_EQ(list.FindToken("cx", 1), 2u) << "only the given length counts";
    EXPECT_EQ(list.FindToken("c", 100), 2u) << "a length past the NUL stops at it";
    EXPECT_EQ(List("ab,a").FindToken("a", allOnes), 1u) << "not a prefix";
}

TEST(DelimitedStringTest, FindTokenPositionChecksBothEndsOfAHit) {
    EXPECT_TRUE(List("a,b,c").HasToken(CString(" b "))) << "the search text is trimmed";
    EXPECT_FALSE(List("a,bb,c").HasToken(CString("b")));
    EXPECT_TRUE(List("x, a,b").HasToken(CString("a,b")));
    EXPECT_FALSE(List("x,a b").HasToken(CString("b")));
    EXPECT_FALSE(List("a,b").HasToken(CString("")));

    const char* text = " a , bb ,b \t";
    EXPECT_EQ(CDelimitedString::FindTokenPosition(text, allOnes, "b", allOnes, ',', true), 9u);
    EXPECT_EQ(CDelimitedString::FindTokenPosition(text, allOnes, "A", 1, ',', false), 1u);
    EXPECT_EQ(CDelimitedString::FindTokenPosition(text, allOnes, "A", 1, ',', true), allOnes);
    EXPECT_EQ(CDelimitedString::FindTokenPosition(text, 9, "b", 1, ',', true), allOnes)
        << "only within the given length";
    EXPECT_EQ(CDelimitedString::FindTokenPosition(nullptr, 5, "b", 1, ',', true), allOnes);
}

TEST(DelimitedStringTest, FindTokenPositionFindsAnOccurrenceOverlappingAFailedHit) {
    // The hit at 1 fails its start check; the occurrence at 3 begins inside it.
    EXPECT_EQ(CDelimitedString::FindTokenPosition("xa,a,a", allOnes, "a,a", 3, ',', true), 3u);
    EXPECT_EQ(CDelimitedString::FindTokenPosition("xa a a", allOnes, "a a", 3, ' ', true), 3u);
}

TEST(DelimitedStringTest, BoundedTextsAreReadOnlyWithinTheirLength) {
    const char unterminated[] = {'a', ',', 'b'};
    EXPECT_EQ(
        CDelimitedString::FindTokenPosition(unterminated, sizeof unterminated, "b", 1, ',', true),
        2u);
    EXPECT_TRUE(CDelimitedString::Includes("b,a", allOnes, unterminated, sizeof unterminated, ','));
    const char* text = "a,bc";
    EXPECT_FALSE(CDelimitedString::Includes(text, 4, text, 3, ','))
        << "a prefix of the same text is walked, not assumed included";
}

TEST(DelimitedStringTest, IncludesEveryTokenOfTheOther) {
    CDelimitedString list = List("a,b,c");
    EXPECT_TRUE(list.Includes(CString("b,a")));
    EXPECT_TRUE(list.Includes(CString("")));
    EXPECT_TRUE(list.Includes(list));
    EXPECT_FALSE(list.Includes(CString("a,d")));
    EXPECT_TRUE(List("a,b").Includes(CString(" a , a,a,a")))
        << "repeats and white space make a text longer, not different";

    EXPECT_TRUE(list.Includes(CString("B,A"), noCase));
    EXPECT_FALSE(list.Includes(CString("B,A"), withCase));
    EXPECT_FALSE(list.Includes(CString("B"), CDelimitedString::FindTraits{false, true, true}))
        << "both sides declared lower case are compared as they are";
    EXPECT_TRUE(list.Includes(CString("B"), CDelimitedString::FindTraits{false, true, false}));
    EXPECT_TRUE(List("A,B").Includes(CString("b"), noCase));
}

TEST(DelimitedStringTest, FindsDuplicateTokens) {
    EXPECT_TRUE(List("a,b, a").HasDuplicateTokens(withCase));
    EXPECT_FALSE(List("a,b,ab,ba").HasDuplicateTokens(withCase));
    EXPECT_FALSE(List("a,A").HasDuplicateTokens(withCase));
    EXPECT_TRUE(List("a,A").HasDuplicateTokens(noCase));
    EXPECT_FALSE(List("a b,b").HasDuplicateTokens(withCase));
}

TEST(DelimitedStringTest, AddTokenAppendsRawText) {
    CDelimitedString list;
    list.AddToken(CString("x"));
    list.AddToken(CString(""));
    list.AddToken(CString(" y "));
    list += CString("z");
    list.AddToken('\0');
    list.AddToken("vv", 1);
    list.AddToken("u", 50);
    EXPECT_STREQ(list, "x, y ,z,v,u");

    // Appending the delimiter moves the buffer the token lies in.
    CDelimitedString self = List("abcd");
    for (int i = 0; i < 4; ++i)
        self.AddToken(self.GetString() + 1, 2);
    EXPECT_STREQ(self, "abcd,bc,bc,bc,bc");
    self.AddToken(self);
    EXPECT_EQ(self.GetTokenCount(), 10u);
}

TEST(DelimitedStringTest, TrimmedAndTrim) {
    for (const char* trimmed : {"", "a,b", "a,,b", "a b,c"})
        EXPECT_TRUE(List(trimmed).Trimmed()) << trimmed;
    for (const char* untrimmed : {"a ,b", "a, b", "a,", ",a", " a", "a ", "a, ,b", " "})
        EXPECT_FALSE(List(untrimmed).Trimmed()) << untrimmed;

    const char* cases[][2] = {
        {" a , b ,, c ", "a,b,,c"}, {", a", ",a"}, {" \t ", ""}, {" x  y , z\t", "x  y,z"}};
    for (const auto& c : cases) {
        CDelimitedString list = List(c[0]);
        list.Trim();
        EXPECT_STREQ(list, c[1]);
    }
}

TEST(DelimitedStringTest, WhiteSpaceDelimiterStaysADelimiter) {
    CDelimitedString list = List("a  b\tc", ' ');
    EXPECT_EQ(Tokens(list), (Strings{"a", "b\tc"}));
    EXPECT_TRUE(list.HasToken(CString("b\tc")));
    EXPECT_FALSE(list.HasToken(CString("b")));
    EXPECT_TRUE(list.Trimmed()) << "two delimiters in a row";
    CDelimitedString tabs = List("a \t b\t", '\t');
    tabs.Trim();
    EXPECT_STREQ(tabs, "a\tb\t");
}

TEST(DelimitedStringTest, AssigningAPlainStringResetsTheDelimiter) {
    CDelimitedString list = List("a;b", ';');
    CDelimitedString copy(list);
    EXPECT_EQ(copy.GetDelimiter(), ';');
    list = CString("x;y");
    EXPECT_EQ(list.GetDelimiter(), ',');
    list = copy;
    EXPECT_EQ(list.GetTokenCount(), 2u);
}

TEST(DelimitedStringTest, CopiesToAndFromStringArrays) {
    std::vector<CString> strings{CString("old")};
    List("a, ,b").GetStrings(strings);
    EXPECT_EQ(Strings(strings.begin(), strings.end()), (Strings{"old", "a", "b"}));

    CStringArray array;
    array.Add(CString("kept"));
    List("a, ,b").GetStrings(array);
    CDelimitedString built;
    built.AddStrings(array);
    built.AddStrings(std::vector<CString>{CString(""), CString(" c ")});
    EXPECT_STREQ(built, "kept,a,b, c ") << "empty elements add nothing; others go raw";
}

TEST(DelimitedStringTest, ANulInsideTheStringEndsTheList) {
    CDelimitedString list(CString("a , b\0,c", 8));
    EXPECT_EQ(Tokens(list), (Strings{"a", "b"}));
    EXPECT_FALSE(list.HasToken(CString("c")));
    list.Trim();
    EXPECT_EQ(std::string(list.GetString(), static_cast<size_t>(list.GetLength())),
              std::string("a,b\0,c", 6))
        << "what follows the NUL is kept";
}

#ifndef _WIN32
// The multibyte code page is UTF-8 on POSIX only.
TEST(DelimitedStringTest, DelimiterNeverSplitsAMultibyteCharacter) {
    // U+00E9 is C3 A9; the delimiter byte A9 alone is a character of its own.
    EXPECT_EQ(Tokens(List("x\xC3\xA9y\xA9z", '\xA9')), (Strings{"x\xC3\xA9y", "z"}));
}
#endif

TEST(DelimitedStringTest, TokensAddedWalkBackUnchanged) {
    const char delimiters[] = {',', ';', ' ', '|'};
    for (unsigned seed = 1; seed <= 40; ++seed) {
        std::mt19937 random(seed);
        char delimiter = delimiters[seed % sizeof delimiters];
        std::string alphabet = "aZ09 ,;|\t-";
        alphabet.erase(alphabet.find(delimiter), 1);
        Strings added;
        CDelimitedString list(delimiter);
        for (int count = static_cast<int>(random() % 30); count > 0; --count) {
            std::string token;
            for (int n = 1 + static_cast<int>(random() % 6); n > 0; --n)
                token += alphabet[random() % alphabet.size()];
            size_t first = token.find_first_not_of(" \t");
            if (first == std::string::npos)
                continue;
            token = token.substr(first, token.find_last_not_of(" \t") + 1 - first);
            list.AddToken(CString(token.c_str()));
            added.push_back(token);
        }
        EXPECT_EQ(Tokens(list), added) << "seed " << seed;
        EXPECT_TRUE(list.IsValid() && list.Trimmed());
        for (size_t i = 0; i < added.size(); ++i) {
            EXPECT_EQ(std::string(list.GetTokenAt(static_cast<DWORD>(i))), added[i]);
            DWORD first = list.FindToken(CString(added[i].c_str()));
            ASSERT_LE(first, i);
            EXPECT_EQ(added[first], added[i]);
            EXPECT_TRUE(list.HasToken(CString(added[i].c_str())));
        }
    }
}

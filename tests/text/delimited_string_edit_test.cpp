#include "text/delimited_string_support.h"

#include <vaskel/text.h>

#include <gtest/gtest.h>

#include <cctype>
#include <ostream>
#include <random>
#include <string>
#include <vector>

using vaskel::CDelimitedString;
using vaskel::CString;

namespace {

using namespace delimited_test;
const CDelimitedString::SortingTraits ascendingUnique{true, true, false};

// An edit's result and the text it leaves, so a case reads as one line.
struct Outcome {
    bool result;
    std::string text;
    bool operator==(const Outcome& other) const {
        return result == other.result && text == other.text;
    }
};

std::ostream& operator<<(std::ostream& out, const Outcome& outcome) {
    return out << std::boolalpha << outcome.result << " \"" << outcome.text << '"';
}

template <class Edit>
Outcome Apply(const char* text, Edit edit) {
    CDelimitedString list = List(text);
    bool result = edit(list);
    return {result, list.GetString()};
}

// Random lists of short ASCII tokens; untidy ones have white space and empty
// segments around their tokens.
class RandomLists {
public:
    explicit RandomLists(unsigned seed) : m_random(seed) {}

    Strings MakeTokens(size_t most) {
        Strings tokens(m_random() % (most + 1));
        for (std::string& token : tokens) {
            const char letters[] = "abAB1";
            for (int n = 1 + static_cast<int>(m_random() % 3); n > 0; --n)
                token += letters[m_random() % (sizeof letters - 1)];
        }
        return tokens;
    }

    std::string Join(const Strings& tokens, bool untidy) {
        std::string text;
        for (size_t i = 0; i < tokens.size(); ++i) {
            if (i > 0)
                text += ',';
            if (untidy && m_random() % 3 == 0)
                text += m_random() % 2 ? " ," : "\t";
            text += tokens[i];
            if (untidy && m_random() % 3 == 0)
                text += " ";
        }
        return text;
    }

    size_t Below(size_t bound) { return m_random() % bound; }

private:
    std::mt19937 m_random;
};

} // namespace

TEST(DelimitedStringEditTest, RemoveTokenAtPositionTakesOneDelimiterAlong) {
    struct Case {
        const char* text;
        DWORD offset;
        DWORD length;
        Outcome expected;
    } cases[] = {
        {"a, b ,c", 3, 1, {true, "a,c"}},
        {"a,b,c", 4, allOnes, {true, "a,b"}}, // the last token takes the one before
        {"a,b,c", 0, 1, {true, "b,c"}},
        {" a ", 1, allOnes, {true, ""}},
        {"a,b,c,d", 2, 3, {true, "a,d"}}, // a range may span tokens
        {"a,b ,c", 2, 1000, {true, "a"}}, // a long length is cut to the text
        {"ab,c", 1, 1, {false, "ab,c"}},  // the offset is inside a token
        {"ab,c", 0, 1, {false, "ab,c"}},  // the range ends inside one
        {"ab,c", 4, allOnes, {false, "ab,c"}},
        {"ab,c", allOnes, 1, {false, "ab,c"}},
    };
    for (const Case& c : cases)
        EXPECT_EQ(Apply(c.text,
                        [&](CDelimitedString& list) {
                            return list.RemoveTokenAtPosition(c.offset, c.length);
                        }),
                  c.expected)
            << c.text << " at " << c.offset;
}

TEST(DelimitedStringEditTest, RemoveTokenByValueRemovesTheTrimmedText) {
    auto remove = [](const char* search) {
        return [search](CDelimitedString& list) { return list.RemoveToken(search, allOnes); };
    };
    EXPECT_EQ(Apply("a, b ,c", remove("b")), (Outcome{true, "a,c"}));
    EXPECT_EQ(Apply("a,c", remove("b")), (Outcome{false, "a,c"}));
    EXPECT_EQ(Apply("a,c", remove("")), (Outcome{false, "a,c"}));
    EXPECT_EQ(Apply("a,b,c", remove(" b")), (Outcome{true, "a,c"}));
    EXPECT_EQ(Apply("a,b,c", remove("b  ")), (Outcome{true, "a,c"})) << "c stays";
    EXPECT_EQ(Apply("x,a,b,c", remove("a,b")), (Outcome{true, "x,c"}));
    EXPECT_EQ(Apply("a,c", [](CDelimitedString& list) { return list.RemoveToken(CString("A")); }),
              (Outcome{false, "a,c"}));
    EXPECT_EQ(
        Apply("a,c", [](CDelimitedString& list) { return list.RemoveToken(noCase, CString("A")); }),
        (Outcome{true, "c"}));
}

TEST(DelimitedStringEditTest, InsertTokenAtRebuildsNormalised) {
    struct Case {
        const char* text;
        DWORD index;
        const char* token;
        Outcome expected;
    } cases[] = {
        {"a,b", 2, "x", {true, "a,b,x"}},
        {"a,b", 3, "x", {false, "a,b"}},
        {"a,b", 0, " y ", {true, "y,a,b"}}, // the new token is trimmed too
        {"  a ,, b", 1, "x", {true, "a,x,b"}},
        {" a , b", 1, " ", {true, "a,b"}}, // an empty token adds nothing
        {"", 0, "q", {true, "q"}},
        {"", 1, "q", {false, ""}},
        {"a,,", 0, "x", {false, "a,,"}}, // a walk step inside finds no token
        {"a, ", 1, "x", {false, "a, "}},
    };
    for (const Case& c : cases)
        EXPECT_EQ(Apply(c.text,
                        [&](CDelimitedString& list) {
                            return list.InsertTokenAt(c.index, CString(c.token));
                        }),
                  c.expected)
            << c.text << " at " << c.index;

    CDelimitedString list = List("a,b");
    EXPECT_TRUE(list.InsertTokenAt(1, list.GetString() + 2, 1));
    EXPECT_STREQ(list, "a,b,b") << "the token may lie in the list itself";
}

TEST(DelimitedStringEditTest, ReplaceTokenAtIsAllOrNothing) {
    struct Case {
        const char* text;
        DWORD index;
        const char* token;
        Outcome expected;
    } cases[] = {
        {" a , b ,c", 1, "x", {true, "a,x,c"}},
        {"a,b", 2, "x", {false, "a,b"}},
        {"a,b", 0, "", {true, "b"}},
        {"a,b,,", 0, "x", {false, "a,b,,"}}, // the token is kept
        {"a,b, ,c", 2, "x", {true, "a,b,x"}},
    };
    for (const Case& c : cases)
        EXPECT_EQ(Apply(c.text,
                        [&](CDelimitedString& list) {
                            return list.ReplaceTokenAt(c.index, CString(c.token));
                        }),
                  c.expected)
            << c.text << " at " << c.index;
}

TEST(DelimitedStringEditTest, SortedAddingFindsItsPlace) {
    struct Case {
        const char* text;
        const char* token;
        CDelimitedString::SortingTraits traits;
        Outcome expected;
    } cases[] = {
        {"a,c", "b", ascendingUnique, {true, "a,b,c"}},
        {"a,c", "c", ascendingUnique, {false, "a,c"}},
        {"a,c", " 0 ", ascendingUnique, {true, "0,a,c"}}, // compared trimmed
        {"a,c", " ", ascendingUnique, {false, "a,c"}},
        {"abc", "ab", ascendingUnique, {true, "ab,abc"}}, // the shorter is smaller
        {"abc", "ab", {false, true, false}, {true, "abc,ab"}},
        {"a,C", "B", {true, false, false}, {true, "a,B,C"}},
        {"a,B,C", "b", {true, false, false}, {false, "a,B,C"}},
        {"a,B,C", "b", {true, false, true}, {true, "a,b,B,C"}}, // before its equal
        {"a,B,C", "b", {true, true, false}, {true, "a,B,C,b"}}, // capitals come first
        {"a,,", "b", ascendingUnique, {false, "a,,"}},
    };
    for (const Case& c : cases)
        EXPECT_EQ(Apply(c.text,
                        [&](CDelimitedString& list) {
                            return list.AddToken(CString(c.token), c.traits);
                        }),
                  c.expected)
            << c.text << " + " << c.token;
}

TEST(DelimitedStringEditTest, SortTokensKeepsTheFirstOrReversesEqualTokens) {
    struct Case {
        const char* text;
        CDelimitedString::SortingTraits traits;
        const char* expected;
    } cases[] = {
        {" c, a ,b,a", ascendingUnique, "a,b,c"},
        {"b,a,c,a", {false, true, true}, "c,b,a,a"},
        {"a,A,b", {true, false, true}, "A,a,b"}, // each went before its equal
        {"b,A,a", {true, false, false}, "A,b"},  // the first of equals stays
        {" , ", ascendingUnique, ""},
    };
    for (const Case& c : cases) {
        CDelimitedString list = List(c.text);
        list.SortTokens(c.traits);
        EXPECT_STREQ(list, c.expected) << c.text;
    }
}

TEST(DelimitedStringEditTest, MergeAppendsMissingTokens) {
    CDelimitedString list = List("a,b");
    EXPECT_TRUE(list.Merge(CString("b,c,c")));
    EXPECT_FALSE(list.Merge(CString(" a ,c")));
    EXPECT_FALSE(list.Merge(list));
    EXPECT_STREQ(list, "a,b,c");

    EXPECT_TRUE(list.Merge(CString("e,A,d"), ascendingUnique));
    EXPECT_STREQ(list, "A,a,b,c,d,e");
    EXPECT_FALSE(list.Merge(CString("B"), {true, false, false}));

    CDelimitedString empty(';');
    EXPECT_TRUE(empty.Merge(CString("y;x"), ascendingUnique));
    EXPECT_STREQ(empty, "y;x") << "an empty list takes the text unsorted";
    EXPECT_EQ(empty.GetDelimiter(), ';') << "the text was read with this delimiter";
    EXPECT_FALSE(CDelimitedString().Merge(CString("")));
}

TEST(DelimitedStringEditTest, RemoveDuplicateTokensKeepsTheFirst) {
    EXPECT_EQ(Apply("a,b,a", [](CDelimitedString& l) { return l.RemoveDuplicateTokens(withCase); }),
              (Outcome{true, "a,b"}));
    EXPECT_EQ(Apply("a,a,a", [](CDelimitedString& l) { return l.RemoveDuplicateTokens(withCase); }),
              (Outcome{true, "a"}))
        << "every later occurrence goes";
    EXPECT_EQ(Apply("x, a ,b,A, a,b",
                    [](CDelimitedString& l) { return l.RemoveDuplicateTokens(noCase); }),
              (Outcome{true, "x, a ,b"}));
    EXPECT_EQ(
        Apply("ab,b,ba", [](CDelimitedString& l) { return l.RemoveDuplicateTokens(withCase); }),
        (Outcome{false, "ab,b,ba"}));
}

TEST(DelimitedStringEditTest, SortingMatchesAddingEachTokenInTurn) {
    for (unsigned seed = 1; seed <= 30; ++seed) {
        RandomLists random(seed);
        Strings tokens = random.MakeTokens(25);
        CDelimitedString source(CString(random.Join(tokens, true).c_str()));
        for (int bits = 0; bits < 8; ++bits) {
            CDelimitedString::SortingTraits sorting{(bits & 1) != 0, (bits & 2) != 0,
                                                    (bits & 4) != 0};
            CDelimitedString sorted = source;
            sorted.SortTokens(sorting);
            CDelimitedString added;
            for (const std::string& token : tokens)
                added.AddToken(CString(token.c_str()), sorting);
            EXPECT_STREQ(sorted, added) << "seed " << seed << " traits " << bits;

            Strings result = Tokens(sorted);
            for (std::string& token : result)
                for (char& c : token)
                    c = sorting.caseSensitive ? c : static_cast<char>(std::tolower(c));
            for (size_t i = 1; i < result.size(); ++i) {
                const std::string& a = result[i - 1];
                const std::string& b = result[i];
                EXPECT_TRUE(sorting.ascending ? a <= b : a >= b) << sorted.GetString();
                EXPECT_TRUE(sorting.allowDuplicates || a != b) << sorted.GetString();
            }
            EXPECT_TRUE(!sorting.allowDuplicates || result.size() == tokens.size());
        }
    }
}

TEST(DelimitedStringEditTest, RemoveThenInsertRestoresANormalisedList) {
    for (unsigned seed = 1; seed <= 50; ++seed) {
        RandomLists random(seed);
        Strings tokens = random.MakeTokens(12);
        if (tokens.empty())
            continue;
        const std::string text = random.Join(tokens, false);
        CDelimitedString list(CString(text.c_str()));
        DWORD index = static_cast<DWORD>(random.Below(tokens.size()));
        CString token = list.GetTokenAt(index);
        ASSERT_TRUE(list.RemoveTokenAt(index));
        ASSERT_TRUE(list.InsertTokenAt(index, token));
        EXPECT_STREQ(list, text.c_str()) << "seed " << seed;
    }
}

TEST(DelimitedStringEditTest, RemovingFromAnUntidyListRemovesJustThatToken) {
    for (unsigned seed = 1; seed <= 50; ++seed) {
        RandomLists random(seed);
        Strings tokens = random.MakeTokens(12);
        CDelimitedString list(CString(random.Join(tokens, true).c_str()));
        while (!tokens.empty()) {
            size_t index = random.Below(tokens.size());
            ASSERT_TRUE(list.RemoveTokenAt(static_cast<DWORD>(index))) << list.GetString();
            tokens.erase(tokens.begin() + static_cast<std::ptrdiff_t>(index));
            ASSERT_EQ(Tokens(list), tokens) << "seed " << seed;
        }
    }
}

// Tests of the tokenizer: steps with character and string delimiters, empty
// tokens, white space, case, positions and copies.
#include <vaskel/text.h>

#include <gtest/gtest.h>

#include <string>
#include <vector>

using namespace vaskel;

namespace {

// Every step's result and token until the text ends.
std::vector<std::string> Walk(CSimpleTokenizer& tokenizer, const char* delimiter) {
    std::vector<std::string> steps;
    bool more = tokenizer.MoveFirstToken(delimiter);
    for (int guard = 0; guard < 100; ++guard) {
        if (more) {
            steps.push_back(std::string(tokenizer.GetCurToken().GetString()));
        } else if (tokenizer.eof() || !tokenizer.GetCurPosition()) {
            break;
        } else {
            steps.push_back("<empty>");
        }
        more = tokenizer.MoveNextToken(delimiter);
    }
    return steps;
}

TEST(CSimpleTokenizerTest, StepsKeepTrailingSpaceAndStepOverEmptyTokens) {
    CSimpleTokenizer tokenizer(" a ,b,,c");
    EXPECT_EQ(Walk(tokenizer, ","), (std::vector<std::string>{"a ", "b", "<empty>", "c"}));
    EXPECT_TRUE(tokenizer.eof());
    EXPECT_FALSE(tokenizer.MoveNextToken(","));
    EXPECT_TRUE(tokenizer.eof());

    CSimpleTokenizer semicolons("a;;b");
    ASSERT_TRUE(semicolons.MoveFirstToken(';'));
    EXPECT_EQ(semicolons.GetCurToken(), "a");
    EXPECT_FALSE(semicolons.MoveNextToken(';'));
    EXPECT_FALSE(semicolons.eof());
    ASSERT_TRUE(semicolons.MoveNextToken(';'));
    EXPECT_EQ(semicolons.GetCurToken(), "b");
    EXPECT_FALSE(semicolons.MoveNextToken(';'));
    EXPECT_TRUE(semicolons.eof());
}

TEST(CSimpleTokenizerTest, EachStepNamesItsOwnDelimiter) {
    CSimpleTokenizer tokenizer("key=value; next=2");
    const char* token = nullptr;
    DWORD length = 0;
    ASSERT_TRUE(tokenizer.GetFirstToken('=', token, length));
    EXPECT_EQ(std::string(token, length), "key");
    ASSERT_TRUE(tokenizer.GetNextToken(";", token, length));
    EXPECT_EQ(std::string(token, length), "value");
    ASSERT_TRUE(tokenizer.GetNextToken("=", token, length));
    EXPECT_EQ(std::string(token, length), "next");
    ASSERT_TRUE(tokenizer.GetNextToken("=", token, length));
    EXPECT_EQ(std::string(token, length), "2") << "a delimiter not found ends the token at the end";
    EXPECT_TRUE(tokenizer.eof());
}

TEST(CSimpleTokenizerTest, CaseOfStringDelimiters) {
    CSimpleTokenizer tokenizer("xANDyandz");
    EXPECT_EQ(Walk(tokenizer, "and"), (std::vector<std::string>{"xANDy", "z"}));
    tokenizer.SetCaseSensitive(false);
    EXPECT_FALSE(tokenizer.GetCaseSensitive());
    EXPECT_EQ(Walk(tokenizer, "and"), (std::vector<std::string>{"x", "y", "z"}));
}

TEST(CSimpleTokenizerTest, PositionsAndEmptyTexts) {
    CSimpleTokenizer tokenizer("ab,cd");
    EXPECT_EQ(tokenizer.GetCurPosition(), nullptr);
    EXPECT_EQ(tokenizer.GetCurPositionIndex(), 0xFFFFFFFFu);
    EXPECT_FALSE(tokenizer.MoveNextToken(",")) << "no step before the first";
    DWORD length = 7;
    EXPECT_EQ(tokenizer.GetCurToken(length), nullptr);
    EXPECT_EQ(length, 0u);
    ASSERT_TRUE(tokenizer.MoveFirstToken(","));
    EXPECT_EQ(tokenizer.GetCurPositionIndex(), 3u);
    EXPECT_EQ(tokenizer.GetCurPosition(), tokenizer.GetFirstPosition() + 3);

    CSimpleTokenizer empty("");
    EXPECT_FALSE(empty.MoveFirstToken(","));
    EXPECT_EQ(empty.GetCurPosition(), nullptr);
    EXPECT_FALSE(empty.eof());

    // Only white space left: no token, and nothing moves.
    CSimpleTokenizer blank("a,   ");
    ASSERT_TRUE(blank.MoveFirstToken(","));
    EXPECT_FALSE(blank.MoveNextToken(","));
    EXPECT_EQ(blank.GetCurPositionIndex(), 2u);
    EXPECT_EQ(blank.GetCurToken(), "a");

    // A null or empty delimiter takes the rest of the text.
    CSimpleTokenizer whole("a,b");
    ASSERT_TRUE(whole.MoveFirstToken(""));
    EXPECT_EQ(whole.GetCurToken(), "a,b");
    ASSERT_TRUE(whole.MoveFirstToken(static_cast<const char*>(nullptr)));
    EXPECT_TRUE(whole.eof());
}

TEST(CSimpleTokenizerTest, CopiesContinueOnTheirOwnAndNewTextsReset) {
    CSimpleTokenizer tokenizer("1,2,3");
    ASSERT_TRUE(tokenizer.MoveFirstToken(','));
    CSimpleTokenizer copy(tokenizer);
    tokenizer.SetString("x;y");
    EXPECT_EQ(tokenizer.GetCurPosition(), nullptr);
    EXPECT_TRUE(tokenizer.GetCurToken().IsEmpty());
    EXPECT_EQ(copy.GetCurToken(), "1");
    ASSERT_TRUE(copy.MoveNextToken(','));
    EXPECT_EQ(copy.GetCurToken(), "2");
    CSimpleTokenizer assigned("other");
    assigned = copy;
    ASSERT_TRUE(assigned.MoveNextToken(','));
    EXPECT_EQ(assigned.GetCurToken(), "3");
    EXPECT_EQ(copy.GetCurToken(), "2");
}

} // namespace

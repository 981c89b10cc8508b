#include <vaskel/namevalue.h>

#include <gtest/gtest.h>

#include <random>
#include <string>
#include <utility>
#include <vector>

using namespace vaskel;

namespace {

typedef std::vector<std::pair<std::string, std::string>> TextPairs;

// The pairs read, as texts; every value read must be a string value.
TextPairs Texts(const CVKNameValueVector& pairs) {
    TextPairs result;
    for (const CVKNameValue& pair : pairs) {
        EXPECT_TRUE(pair.GetValue().GetType().IsString()) << pair.GetName().GetString();
        result.emplace_back(pair.GetName().GetString(), pair.GetValue().ToString().GetString());
    }
    return result;
}

bool Reads(const CVKNameValueGrammar& grammar, const char* text, TextPairs* pairs = nullptr) {
    CVKNameValueVector read;
    const bool ok = grammar.Read(text, read);
    if (pairs != nullptr)
        *pairs = Texts(read);
    return ok;
}

} // namespace

TEST(CVKNameValueGrammar, WritesItemsJoinedByTheSeparator) {
    CVKNameValueGrammar grammar;
    CVKNameValueVector pairs;
    EXPECT_EQ(grammar.Write(pairs), "");
    pairs.push_back(CVKNameValue("a", CGenericVal(1)));
    pairs.push_back(CVKNameValue("b", CGenericVal("x y")));
    EXPECT_EQ(grammar.Write(pairs), "a=\"1\",b=\"x y\"");
    grammar.SetSeparator(";", true);
    EXPECT_EQ(grammar.Write(pairs), "a=\"1\";b=\"x y\"");
    grammar.SetSeparator("AND", false);
    EXPECT_EQ(grammar.GetSeparator(), "and");
    pairs[1].SetValue(CGenericVal(2));
    EXPECT_EQ(grammar.Write(pairs), "a=\"1\"andb=\"2\"");
    pairs.push_back(CVKNameValue("c", CGenericVal(1.5)));
    pairs.push_back(CVKNameValue("d", CGenericVal(true)));
    EXPECT_EQ(grammar.Write(pairs), "a=\"1\"andb=\"2\"andc=\"1.5\"andd=\"True\"");
}

TEST(CVKNameValueGrammar, ReadsTheTextFormat) {
    const CVKNameValueGrammar grammar;
    TextPairs pairs;
    ASSERT_TRUE(Reads(grammar, "a=\"1\" , b = \" x y \"", &pairs));
    EXPECT_EQ(pairs, (TextPairs{{"a", "1"}, {"b", "x y"}}));
    ASSERT_TRUE(Reads(grammar, " \t\r\na=\"1\"", &pairs)) << "leading white space is skipped";
    ASSERT_TRUE(Reads(grammar, "1a=\"x\"", &pairs)) << "a name may begin with a digit";
    EXPECT_EQ(pairs, (TextPairs{{"1a", "x"}}));
    ASSERT_TRUE(Reads(grammar, "a=\"1\",a=\"2\"", &pairs));
    EXPECT_EQ(pairs, (TextPairs{{"a", "1"}, {"a", "2"}})) << "repeated names stay, in order";
    ASSERT_TRUE(Reads(grammar, "a=\"\"", &pairs));
    EXPECT_EQ(pairs, (TextPairs{{"a", ""}}));
    ASSERT_TRUE(Reads(grammar, "a=\"   \"", &pairs));
    EXPECT_EQ(pairs, (TextPairs{{"a", ""}})) << "a value of white space is empty";
    ASSERT_TRUE(Reads(grammar, "a=\"x  ,= y\"", &pairs));
    EXPECT_EQ(pairs, (TextPairs{{"a", "x  ,= y"}})) << "inner white space and punctuation stay";
}

TEST(CVKNameValueGrammar, RefusesTextOutsideTheFormat) {
    const CVKNameValueGrammar grammar;
    const char* refused[] = {
        "",           "   ",          "a=\"1\" ",    "my_name=\"1\"", "a.b=\"1\"",
        "a \"1\"",    "a=1",          "a=\"1",       "a=1\"",         "a=\"1\"\"\"",
        "a=\"1\"b=\"2\"", "a=\"1\";b=\"2\"", "a=\"1\",", ",a=\"1\"",  "a b=\"1\"",
        "=\"1\"",     "a=\"1\",,b=\"2\"",
    };
    for (const char* text : refused)
        EXPECT_FALSE(Reads(grammar, text)) << "'" << text << "'";
    EXPECT_FALSE(Reads(grammar, nullptr));
}

TEST(CVKNameValueGrammar, MatchesTheSeparatorAsOneUnit) {
    CVKNameValueGrammar grammar;
    TextPairs pairs;
    grammar.SetSeparator("", true);
    ASSERT_TRUE(Reads(grammar, "a=\"1\"b=\"2\"", &pairs));
    EXPECT_EQ(pairs, (TextPairs{{"a", "1"}, {"b", "2"}}));

    grammar.SetSeparator(";", true);
    EXPECT_TRUE(Reads(grammar, "a=\"1\" ; b=\"2\""));
    EXPECT_FALSE(Reads(grammar, "a=\"1\",b=\"2\""));

    grammar.SetSeparator("AND", false);
    EXPECT_TRUE(Reads(grammar, "a=\"1\" AND b=\"2\"", &pairs));
    EXPECT_EQ(pairs.size(), 2u);
    EXPECT_TRUE(Reads(grammar, "a=\"1\"and b=\"2\""));
    EXPECT_TRUE(Reads(grammar, "a=\"1\"aNd b=\"2\""));
    EXPECT_FALSE(Reads(grammar, "a=\"1\"an d b=\"2\""));

    grammar.SetSeparator("and", true);
    EXPECT_FALSE(Reads(grammar, "a=\"1\"AND b=\"2\"")) << "with case the separator is exact";

    grammar.SetSeparator("; ", true);
    EXPECT_TRUE(Reads(grammar, "a=\"1\"; b=\"2\""));
    EXPECT_FALSE(Reads(grammar, "a=\"1\";b=\"2\"")) << "the separator's blank is required";

    grammar.SetSeparator(" ;", true);
    EXPECT_FALSE(Reads(grammar, "a=\"1\" ;b=\"2\"")) << "a leading blank is skipped away";
}

TEST(CVKNameValueGrammar, AReadReplacesThePairsOnlyOnSuccess) {
    const CVKNameValueGrammar grammar;
    CVKNameValueVector pairs;
    pairs.push_back(CVKNameValue("old", CGenericVal(1)));
    EXPECT_FALSE(grammar.Read("a=\"1\",", pairs));
    ASSERT_EQ(pairs.size(), 1u);
    EXPECT_EQ(pairs[0].GetName(), "old");
    EXPECT_TRUE(grammar.Read("a=\"1\"", pairs));
    ASSERT_EQ(pairs.size(), 1u);
    EXPECT_EQ(pairs[0].GetName(), "a");
    EXPECT_FALSE(grammar.Read(grammar.Write(CVKNameValueVector()), pairs))
        << "an empty list writes text that does not read";
}

TEST(CVKNameValueGrammar, PlainPairsReadBackAsWritten) {
    std::mt19937 random(17);
    const std::string nameChars = "abcXYZ019";
    const std::string valueChars = "abc xyz,;=019'\t";
    for (int round = 0; round < 300; ++round) {
        CVKNameValueGrammar grammar;
        grammar.SetSeparator(round % 3 == 0 ? ";" : round % 3 == 1 ? "," : "", true);
        CVKNameValueVector pairs;
        TextPairs expected;
        const int count = 1 + static_cast<int>(random() % 6);
        for (int i = 0; i < count; ++i) {
            std::string name(1 + random() % 5, 'a'), value(random() % 8, 'x');
            for (char& c : name)
                c = nameChars[random() % nameChars.size()];
            for (char& c : value)
                c = valueChars[random() % valueChars.size()];
            // Values keep no white space at their ends.
            const auto first = value.find_first_not_of(" \t");
            value = first == std::string::npos
                        ? std::string()
                        : value.substr(first, value.find_last_not_of(" \t") - first + 1);
            pairs.push_back(CVKNameValue(name.c_str(), CGenericVal(value.c_str())));
            expected.emplace_back(name, value);
        }
        const CString text = grammar.Write(pairs);
        TextPairs read;
        ASSERT_TRUE(Reads(grammar, text.GetString(), &read)) << text.GetString();
        EXPECT_EQ(read, expected) << text.GetString();
    }
}

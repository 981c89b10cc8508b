#include <vaskel/namevalue.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <stdexcept>
#include <string>

using namespace vaskel;

namespace {

CVKNameValueVector Pairs(std::initializer_list<CVKNameValue> pairs) {
    CVKNameValueVector result;
    result.assign(pairs.begin(), pairs.end());
    return result;
}

} // namespace

TEST(CVKNameValue, ComparesNamesWithCaseThenValues) {
    const CVKNameValue a1("a", CGenericVal(1)), a2("a", CGenericVal(2)), b1("b", CGenericVal(1));
    EXPECT_TRUE(a2 < b1) << "the name decides first";
    EXPECT_FALSE(b1 < a2);
    EXPECT_TRUE(a1 < a2) << "equal names: the values decide";
    EXPECT_FALSE(a1 < a1);
    EXPECT_EQ(a1, CVKNameValue("a", CGenericVal(1)));
    EXPECT_NE(CVKNameValue("A", CGenericVal(1)), a1) << "names compare with case";
    EXPECT_NE(CVKNameValue("a", CGenericVal(1UL)), a1) << "a different value type is a different value";

    CVKNameValue copy;
    EXPECT_TRUE(copy.GetName().IsEmpty());
    EXPECT_TRUE(copy.GetValue().IsEmpty());
    copy = a2;
    copy.GetValue().SetLong(5);
    EXPECT_EQ(a2.GetValue().GetLong(), 2) << "a copy owns its value";
    copy.Set("z", CGenericVal("text"));
    EXPECT_EQ(copy.GetName(), "z");
    EXPECT_EQ(copy.GetValue().ToString(), "text");
}

TEST(CVKNameValueVector, LookupsFindTheFirstPairOfTheName) {
    CVKNameValueVector empty;
    EXPECT_EQ(empty.Find("a"), empty.end());
    EXPECT_EQ(empty.Get("a"), nullptr);
    EXPECT_EQ(empty.GetNoCase("a"), nullptr);

    const CVKNameValueVector pairs = Pairs({{"Name", CGenericVal(0)},
                                            {"a", CGenericVal(1)},
                                            {"a", CGenericVal(2)},
                                            {"NAME", CGenericVal(3)}});
    ASSERT_NE(pairs.Get("a"), nullptr);
    EXPECT_EQ(pairs.Get("a")->GetValue().GetLong(), 1);
    EXPECT_EQ(pairs.Find(CString("a")) - pairs.begin(), 1);
    EXPECT_EQ(pairs.Find("name"), pairs.end()) << "with case, 'name' is not 'Name'";
    EXPECT_EQ(pairs.Get("NAME")->GetValue().GetLong(), 3);

    // Without case: the first pair whose name equals, not the first that differs.
    EXPECT_EQ(pairs.FindNoCase("name") - pairs.begin(), 0);
    EXPECT_EQ(pairs.GetNoCase(CString("A"))->GetValue().GetLong(), 1);
    EXPECT_EQ(pairs.FindNoCase("b"), pairs.end());
    EXPECT_EQ(pairs.GetNoCase("nam"), nullptr) << "a prefix is not a match";
    EXPECT_EQ(pairs.Get(nullptr), nullptr);
}

TEST(CVKNameValueVector, ReportsIndexAndGrowthErrorsWithItsOwnTexts) {
    CVKNameValueVector pairs = Pairs({{"a", CGenericVal(1)}});
    EXPECT_EQ(pairs.at(0).GetName(), "a");
    try {
        pairs.at(1);
        FAIL() << "no exception";
    } catch (const std::out_of_range& error) {
        EXPECT_STREQ(error.what(), "invalid vector<T> subscript");
    }
    const CVKNameValueVector& constant = pairs;
    EXPECT_THROW(constant.at(5), std::out_of_range);
    try {
        pairs.reserve(pairs.max_size() + 1);
        FAIL() << "no exception";
    } catch (const std::length_error& error) {
        EXPECT_STREQ(error.what(), "vector<T> too long");
    }
    EXPECT_THROW(pairs.resize(pairs.max_size() + 1), std::length_error);
    EXPECT_EQ(pairs.size(), 1u) << "a refused growth changes nothing";

    pairs.resize(3, CVKNameValue("x", CGenericVal(true)));
    EXPECT_EQ(pairs.back().GetName(), "x");
    CVKNameValueVector copy = pairs;
    copy[0].SetName("changed");
    EXPECT_EQ(pairs[0].GetName(), "a") << "copies are deep";
    std::sort(copy.begin(), copy.end());
    EXPECT_EQ(copy.front().GetName(), "changed");
}

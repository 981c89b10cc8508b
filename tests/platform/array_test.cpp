// Tests of CArray and CStringArray: growth and shifting, arrays combined
// with themselves, elements passed in from the same array, bad indexes.
#include <vaskel/framework/array.h>

#include <gtest/gtest.h>

#include <string>

using namespace vaskel;

namespace {

// The elements joined by '|'.
std::string Items(const CStringArray& a) {
    std::string items;
    for (INT_PTR i = 0; i < a.GetSize(); ++i)
        items += std::string(a.GetAt(i)) + "|";
    return items;
}

TEST(CArrayTest, GrowsShiftsCombinesWithItselfAndChecksIndexes) {
    CStringArray a;
    a.Add("a");
    a.SetAtGrow(3, "d"); // the gap holds empty elements
    a.InsertAt(1, "x", 2);
    a.InsertAt(8, "z"); // past the end: the array grows first
    EXPECT_EQ(Items(a), "a|x|x|||d|||z|");
    a.RemoveAt(1, 6);
    EXPECT_EQ(Items(a), "a||z|");
    EXPECT_EQ(a.Append(a), 3);
    a.InsertAt(1, &a);
    a.Copy(a);
    EXPECT_EQ(Items(a), "a|a||z|a||z||z|a||z|");
    // Bad indexes raise the invalid-argument exception and change nothing.
    EXPECT_THROW(a.GetAt(12), CInvalidArgException);
    EXPECT_THROW(static_cast<const CStringArray&>(a)[-1], CInvalidArgException);
    EXPECT_THROW(a.SetAtGrow(-1, "x"), CInvalidArgException);
    EXPECT_THROW(a.InsertAt(0, "x", -1), CInvalidArgException);
    EXPECT_THROW(a.InsertAt(-1, &a), CInvalidArgException);
    EXPECT_THROW(a.RemoveAt(11, 2), CInvalidArgException);
    EXPECT_THROW(a.RemoveAt(13, 0), CInvalidArgException);
    EXPECT_THROW(a.SetSize(-1), CInvalidArgException);
    EXPECT_EQ(a.GetSize(), 12);
}

TEST(CArrayTest, ElementsPassedFromTheSameArraySurviveGrowth) {
    // Each call may move the storage while its argument still refers into it.
    CStringArray a;
    a.Add("p");
    a.Add("q");
    a.FreeExtra();
    for (int i = 0; i < 50; ++i)
        a.Add(a[0]);
    a.SetAtGrow(200, a[1]);
    a.InsertAt(0, a[1], 100);
    a.InsertAt(400, a[0]);
    EXPECT_STREQ(a[151], "p");
    EXPECT_STREQ(a[300], "q");
    EXPECT_STREQ(a[400], "q");
}

} // namespace

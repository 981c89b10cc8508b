// Tests of CArray and CStringArray: growth, insertion and removal, arrays
// appended to or inserted into themselves, elements passed in from the same
// array, and indexes out of range.
#include <vaskel/framework/array.h>
#include <vaskel/framework/exceptions.h>
#include <vaskel/framework/string.h>

#include <gtest/gtest.h>

#include <initializer_list>
#include <string>
#include <vector>

using vaskel::CArray;
using vaskel::CInvalidArgException;
using vaskel::CString;
using vaskel::CStringArray;

namespace {

std::vector<std::string> Items(const CStringArray& a) {
    std::vector<std::string> items;
    for (INT_PTR i = 0; i < a.GetSize(); ++i)
        items.emplace_back(a.GetAt(i).GetString());
    return items;
}

std::vector<int> Items(const CArray<int, int>& a) {
    return std::vector<int>(a.GetData(), a.GetData() + a.GetSize());
}

CStringArray Make(std::initializer_list<const char*> texts) {
    CStringArray a;
    for (const char* t : texts)
        a.Add(t);
    return a;
}

using V = std::vector<std::string>;

TEST(CArrayTest, EmptyArray) {
    CArray<int, int> a;
    EXPECT_EQ(a.GetSize(), 0);
    EXPECT_EQ(a.GetCount(), 0);
    EXPECT_TRUE(a.IsEmpty());
    EXPECT_EQ(a.GetUpperBound(), -1);
}

TEST(CArrayTest, AddReturnsTheNewIndex) {
    CArray<int, int> a;
    EXPECT_EQ(a.Add(10), 0);
    EXPECT_EQ(a.Add(20), 1);
    EXPECT_EQ(a.Add(30), 2);
    EXPECT_EQ(a.GetSize(), 3);
    EXPECT_EQ(a.GetUpperBound(), 2);
    EXPECT_FALSE(a.IsEmpty());
    EXPECT_EQ(a.GetAt(1), 20);
    EXPECT_EQ(a[2], 30);
    const CArray<int, int>& c = a;
    EXPECT_EQ(c[0], 10);
    EXPECT_EQ(c.GetAt(0), 10);
    EXPECT_EQ(c.ElementAt(1), 20);
}

TEST(CArrayTest, ElementsCanBeChangedInPlace) {
    CArray<int, int> a;
    a.SetSize(3);
    EXPECT_EQ(Items(a), (std::vector<int>{0, 0, 0})); // new elements are zero
    a.SetAt(0, 5);
    a.ElementAt(1) = 6;
    a[2] = 7;
    a.GetAt(2) += 1;
    EXPECT_EQ(Items(a), (std::vector<int>{5, 6, 8}));
    a.GetData()[0] = 9;
    EXPECT_EQ(a[0], 9);
}

TEST(CArrayTest, SetSizeGrowsAndShrinks) {
    CArray<int, int> a;
    for (int i = 0; i < 5; ++i)
        a.Add(i);
    a.SetSize(2);
    EXPECT_EQ(Items(a), (std::vector<int>{0, 1}));
    a.SetSize(4, 16);
    EXPECT_EQ(Items(a), (std::vector<int>{0, 1, 0, 0}));
    a.FreeExtra();
    EXPECT_EQ(Items(a), (std::vector<int>{0, 1, 0, 0}));
    a.SetSize(0);
    EXPECT_TRUE(a.IsEmpty());
    a.Add(1);
    a.RemoveAll();
    EXPECT_TRUE(a.IsEmpty());
}

TEST(CArrayTest, SetAtGrowFillsTheGapWithDefaults) {
    CArray<int, int> a;
    a.SetAtGrow(3, 7);
    EXPECT_EQ(Items(a), (std::vector<int>{0, 0, 0, 7}));
    a.SetAtGrow(1, 5); // inside: no growth
    EXPECT_EQ(Items(a), (std::vector<int>{0, 5, 0, 7}));
    a.SetAtGrow(4, 9); // just past the end
    EXPECT_EQ(Items(a), (std::vector<int>{0, 5, 0, 7, 9}));

    CStringArray s;
    s.SetAtGrow(2, "c");
    EXPECT_EQ(Items(s), (V{"", "", "c"}));
}

TEST(CArrayTest, InsertAtShiftsAndGrows) {
    CArray<int, int> a;
    a.Add(1);
    a.Add(2);
    a.Add(3);
    a.InsertAt(1, 9, 3);
    EXPECT_EQ(Items(a), (std::vector<int>{1, 9, 9, 9, 2, 3}));
    a.InsertAt(0, 0);
    EXPECT_EQ(Items(a), (std::vector<int>{0, 1, 9, 9, 9, 2, 3}));
    a.InsertAt(a.GetSize(), 4); // at the end
    EXPECT_EQ(Items(a), (std::vector<int>{0, 1, 9, 9, 9, 2, 3, 4}));
    a.InsertAt(1, 5, 0); // nothing to insert
    EXPECT_EQ(a.GetSize(), 8);

    CArray<int, int> b;
    b.Add(1);
    b.InsertAt(3, 7, 2); // past the end: the gap holds defaults
    EXPECT_EQ(Items(b), (std::vector<int>{1, 0, 0, 7, 7}));
}

TEST(CArrayTest, InsertAtOfAnotherArray) {
    CStringArray a = Make({"a", "b", "c"});
    CStringArray other = Make({"x", "y"});
    a.InsertAt(1, &other);
    EXPECT_EQ(Items(a), (V{"a", "x", "y", "b", "c"}));
    a.InsertAt(a.GetSize(), &other);
    EXPECT_EQ(Items(a), (V{"a", "x", "y", "b", "c", "x", "y"}));
    CStringArray empty;
    a.InsertAt(0, &empty);
    EXPECT_EQ(a.GetSize(), 7);
    EXPECT_EQ(Items(other), (V{"x", "y"}));

    CStringArray self = Make({"a", "b", "c"});
    self.InsertAt(1, &self);
    EXPECT_EQ(Items(self), (V{"a", "a", "b", "c", "b", "c"}));
}

TEST(CArrayTest, RemoveAtClosesTheGap) {
    CStringArray a = Make({"a", "b", "c", "d", "e"});
    a.RemoveAt(1);
    EXPECT_EQ(Items(a), (V{"a", "c", "d", "e"}));
    a.RemoveAt(1, 2);
    EXPECT_EQ(Items(a), (V{"a", "e"}));
    a.RemoveAt(2, 0); // at the end, nothing
    a.RemoveAt(0, 0);
    EXPECT_EQ(Items(a), (V{"a", "e"}));
    a.RemoveAt(a.GetUpperBound());
    EXPECT_EQ(Items(a), (V{"a"}));
    a.RemoveAt(0, a.GetSize());
    EXPECT_TRUE(a.IsEmpty());
}

TEST(CArrayTest, AppendReturnsTheFirstNewIndex) {
    CStringArray a = Make({"a", "b"});
    CStringArray b = Make({"c", "d", "e"});
    EXPECT_EQ(a.Append(b), 2);
    EXPECT_EQ(Items(a), (V{"a", "b", "c", "d", "e"}));
    EXPECT_EQ(Items(b), (V{"c", "d", "e"}));
    CStringArray empty;
    EXPECT_EQ(a.Append(empty), 5);
    EXPECT_EQ(a.GetSize(), 5);
    EXPECT_EQ(empty.Append(b), 0);
    EXPECT_EQ(Items(empty), (V{"c", "d", "e"}));
}

TEST(CArrayTest, AppendingAnArrayToItselfDoublesIt) {
    CStringArray a = Make({"a", "b", "c"});
    EXPECT_EQ(a.Append(a), 3);
    EXPECT_EQ(Items(a), (V{"a", "b", "c", "a", "b", "c"}));
    // Many doublings, so that the storage moves while being read.
    CArray<int, int> n;
    n.Add(1);
    n.Add(2);
    for (int i = 0; i < 10; ++i)
        n.Append(n);
    ASSERT_EQ(n.GetSize(), 2 << 10);
    for (INT_PTR i = 0; i < n.GetSize(); ++i)
        ASSERT_EQ(n[i], i % 2 == 0 ? 1 : 2) << "at " << i;
    CStringArray empty;
    EXPECT_EQ(empty.Append(empty), 0);
    EXPECT_TRUE(empty.IsEmpty());
}

TEST(CArrayTest, CopyReplacesTheContentsWithIndependentElements) {
    CStringArray a = Make({"a", "b", "c"});
    CStringArray b = Make({"old", "elements", "here", "too"});
    b.Copy(a);
    EXPECT_EQ(Items(b), (V{"a", "b", "c"}));
    b.ElementAt(0).MakeUpper();
    b[1] = "B";
    b.Add("d");
    EXPECT_EQ(Items(a), (V{"a", "b", "c"}));
    EXPECT_EQ(Items(b), (V{"A", "B", "c", "d"}));
    a.Copy(a);
    EXPECT_EQ(Items(a), (V{"a", "b", "c"}));
    CStringArray empty;
    a.Copy(empty);
    EXPECT_TRUE(a.IsEmpty());
}

TEST(CArrayTest, ElementsPassedFromTheSameArraySurviveGrowth) {
    // Each call below may move the storage while its argument still refers
    // into it: the argument must be read first.
    CStringArray a = Make({"first", "second"});
    for (int i = 0; i < 50; ++i)
        a.Add(a[0]);
    EXPECT_EQ(a.GetSize(), 52);
    EXPECT_EQ(Items(a).back(), "first");

    CStringArray b = Make({"x", "y"});
    b.SetAtGrow(200, b[1]);
    EXPECT_EQ(b.GetSize(), 201);
    EXPECT_STREQ(b[200], "y");

    CStringArray c = Make({"p", "q"});
    c.FreeExtra();
    c.InsertAt(0, c[1], 100);
    EXPECT_EQ(c.GetSize(), 102);
    EXPECT_STREQ(c[0], "q");
    EXPECT_STREQ(c[99], "q");
    EXPECT_STREQ(c[100], "p");
    EXPECT_STREQ(c[101], "q");

    CStringArray d = Make({"m"});
    d.FreeExtra();
    d.InsertAt(5, d[0]);
    EXPECT_EQ(Items(d), (V{"m", "", "", "", "", "m"}));

    CStringArray e = Make({"s", "t"});
    e.SetAt(0, e[1]);
    EXPECT_EQ(Items(e), (V{"t", "t"}));
}

TEST(CArrayTest, IndexesOutOfRangeRaiseInvalidArgument) {
    CStringArray a = Make({"a", "b"});
    const CStringArray& c = a;
    EXPECT_THROW(a.GetAt(-1), CInvalidArgException);
    EXPECT_THROW(a.GetAt(2), CInvalidArgException);
    EXPECT_THROW(c.GetAt(2), CInvalidArgException);
    EXPECT_THROW(a[2], CInvalidArgException);
    EXPECT_THROW(c[-1], CInvalidArgException);
    EXPECT_THROW(a.ElementAt(2), CInvalidArgException);
    EXPECT_THROW(c.ElementAt(-1), CInvalidArgException);
    EXPECT_THROW(a.SetAt(2, "x"), CInvalidArgException);
    EXPECT_THROW(a.SetAt(-1, "x"), CInvalidArgException);
    EXPECT_THROW(a.SetAtGrow(-1, "x"), CInvalidArgException);
    EXPECT_THROW(a.InsertAt(-1, "x"), CInvalidArgException);
    EXPECT_THROW(a.InsertAt(0, "x", -1), CInvalidArgException);
    EXPECT_THROW(a.InsertAt(-1, &a), CInvalidArgException);
    EXPECT_THROW(a.InsertAt(0, static_cast<const CArray<CString, const CString&>*>(nullptr)),
                 CInvalidArgException);
    EXPECT_THROW(a.RemoveAt(-1), CInvalidArgException);
    EXPECT_THROW(a.RemoveAt(2), CInvalidArgException);
    EXPECT_THROW(a.RemoveAt(1, 2), CInvalidArgException);
    EXPECT_THROW(a.RemoveAt(0, -1), CInvalidArgException);
    EXPECT_THROW(a.RemoveAt(3, 0), CInvalidArgException);
    EXPECT_THROW(a.SetSize(-1), CInvalidArgException);
    // Nothing was changed by the failed calls.
    EXPECT_EQ(Items(a), (V{"a", "b"}));

    CArray<int, int> empty;
    EXPECT_THROW(empty.GetAt(0), CInvalidArgException);
    EXPECT_THROW(empty.SetAt(0, 1), CInvalidArgException);
    EXPECT_THROW(empty.RemoveAt(0), CInvalidArgException);
}

TEST(CStringArrayTest, ElementsAreCopiedOnWriteStrings) {
    CStringArray a;
    CString text("shared");
    a.Add(text);
    a.Add(text);
    EXPECT_EQ(a[0].GetString(), text.GetString());
    a[0].SetAt(0, 'S');
    EXPECT_EQ(Items(a), (V{"Shared", "shared"}));
    EXPECT_STREQ(text, "shared");
    CStringArray copy;
    copy.Copy(a);
    copy[1] += "!";
    EXPECT_EQ(Items(a), (V{"Shared", "shared"}));
    EXPECT_EQ(Items(copy), (V{"Shared", "shared!"}));
}

} // namespace

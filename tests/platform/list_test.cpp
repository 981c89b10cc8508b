// Tests of CList and CStringList: walks in both directions, insertion and
// removal at every place, positions that stay valid, lists added to
// themselves, deep copies, and the empty list's errors.
#include <vaskel/framework/exceptions.h>
#include <vaskel/framework/list.h>
#include <vaskel/framework/string.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <initializer_list>
#include <stdexcept>
#include <string>
#include <vector>

using vaskel::CInvalidArgException;
using vaskel::CList;
using vaskel::CString;
using vaskel::CStringList;
using vaskel::POSITION;

namespace {

using V = std::vector<std::string>;

// The elements walked from the head with GetNext.
V Forward(const CStringList& list) {
    V items;
    for (POSITION p = list.GetHeadPosition(); p;)
        items.emplace_back(list.GetNext(p).GetString());
    return items;
}

// The elements walked from the tail with GetPrev, put back in head order.
V Backward(const CStringList& list) {
    V items;
    for (POSITION p = list.GetTailPosition(); p;)
        items.emplace_back(list.GetPrev(p).GetString());
    std::reverse(items.begin(), items.end());
    return items;
}

// Both walks, the count and the ends must agree with the expected contents.
::testing::AssertionResult Holds(const CStringList& list, const V& expected) {
    V forward = Forward(list);
    V backward = Backward(list);
    auto join = [](const V& v) {
        std::string s = "[";
        for (const std::string& x : v)
            s += x + ",";
        return s + "]";
    };
    if (forward != expected)
        return ::testing::AssertionFailure()
               << "forward walk " << join(forward) << ", expected " << join(expected);
    if (backward != expected)
        return ::testing::AssertionFailure()
               << "backward walk " << join(backward) << ", expected " << join(expected);
    if (list.GetCount() != static_cast<INT_PTR>(expected.size()))
        return ::testing::AssertionFailure()
               << "count " << list.GetCount() << ", expected " << expected.size();
    if (list.IsEmpty() != expected.empty())
        return ::testing::AssertionFailure() << "IsEmpty disagrees";
    if (!expected.empty() && (expected.front() != list.GetHead().GetString() ||
                              expected.back() != list.GetTail().GetString()))
        return ::testing::AssertionFailure() << "GetHead or GetTail disagrees";
    return ::testing::AssertionSuccess();
}

CStringList Make(std::initializer_list<const char*> texts) {
    CStringList list;
    for (const char* t : texts)
        list.AddTail(t);
    return list;
}

TEST(CListTest, EmptyList) {
    CStringList list;
    EXPECT_TRUE(Holds(list, {}));
    EXPECT_EQ(list.GetHeadPosition(), nullptr);
    EXPECT_EQ(list.GetTailPosition(), nullptr);
    EXPECT_EQ(list.FindIndex(0), nullptr);
    EXPECT_EQ(list.Find("x"), nullptr);
}

TEST(CListTest, EmptyListRaisesInvalidArgument) {
    CStringList list;
    const CStringList& c = list;
    EXPECT_THROW(list.RemoveHead(), CInvalidArgException);
    EXPECT_THROW(list.RemoveTail(), CInvalidArgException);
    EXPECT_THROW(list.GetHead(), CInvalidArgException);
    EXPECT_THROW(list.GetTail(), CInvalidArgException);
    EXPECT_THROW(c.GetHead(), CInvalidArgException);
    EXPECT_THROW(c.GetTail(), CInvalidArgException);
    POSITION none = nullptr;
    EXPECT_THROW(list.GetNext(none), CInvalidArgException);
    EXPECT_THROW(list.GetPrev(none), CInvalidArgException);
    EXPECT_THROW(list.GetAt(none), CInvalidArgException);
    EXPECT_THROW(list.SetAt(none, "x"), CInvalidArgException);
    EXPECT_THROW(list.RemoveAt(none), CInvalidArgException);
    EXPECT_THROW(list.AddTail(static_cast<const CStringList*>(nullptr)), CInvalidArgException);
    EXPECT_THROW(list.AddHead(static_cast<const CStringList*>(nullptr)), CInvalidArgException);
    // Still a usable empty list afterwards.
    EXPECT_TRUE(Holds(list, {}));
    list.AddTail("a");
    EXPECT_TRUE(Holds(list, {"a"}));
    EXPECT_STREQ(list.RemoveTail(), "a");
    EXPECT_THROW(list.RemoveTail(), CInvalidArgException);
    EXPECT_TRUE(Holds(list, {}));
}

TEST(CListTest, AddHeadAndAddTailBuildTheListAtBothEnds) {
    CStringList list;
    POSITION b = list.AddTail("b");
    POSITION a = list.AddHead("a");
    POSITION c = list.AddTail("c");
    POSITION z = list.AddHead("z");
    EXPECT_TRUE(Holds(list, {"z", "a", "b", "c"}));
    EXPECT_STREQ(list.GetAt(a), "a");
    EXPECT_STREQ(list.GetAt(b), "b");
    EXPECT_STREQ(list.GetAt(c), "c");
    EXPECT_EQ(list.GetHeadPosition(), z);
    EXPECT_EQ(list.GetTailPosition(), c);
}

TEST(CListTest, WalksEndWithANullPosition) {
    CStringList list = Make({"a", "b"});
    POSITION p = list.GetHeadPosition();
    EXPECT_STREQ(list.GetNext(p), "a");
    ASSERT_NE(p, nullptr);
    EXPECT_STREQ(list.GetNext(p), "b");
    EXPECT_EQ(p, nullptr);
    p = list.GetTailPosition();
    EXPECT_STREQ(list.GetPrev(p), "b");
    EXPECT_STREQ(list.GetPrev(p), "a");
    EXPECT_EQ(p, nullptr);
}

TEST(CListTest, InsertBeforeAndAfterAtEveryPlace) {
    CStringList list = Make({"b", "d"});
    POSITION head = list.GetHeadPosition();
    POSITION tail = list.GetTailPosition();

    POSITION a = list.InsertBefore(head, "a"); // before the head: the new head
    EXPECT_EQ(list.GetHeadPosition(), a);
    EXPECT_TRUE(Holds(list, {"a", "b", "d"}));

    POSITION e = list.InsertAfter(tail, "e"); // after the tail: the new tail
    EXPECT_EQ(list.GetTailPosition(), e);
    EXPECT_TRUE(Holds(list, {"a", "b", "d", "e"}));

    POSITION c = list.InsertAfter(head, "c"); // in the middle
    EXPECT_TRUE(Holds(list, {"a", "b", "c", "d", "e"}));
    list.InsertBefore(c, "bc");
    EXPECT_TRUE(Holds(list, {"a", "b", "bc", "c", "d", "e"}));

    POSITION first = list.InsertBefore(nullptr, "first"); // null: at the head
    POSITION last = list.InsertAfter(nullptr, "last");    // null: at the tail
    EXPECT_EQ(list.GetHeadPosition(), first);
    EXPECT_EQ(list.GetTailPosition(), last);
    EXPECT_TRUE(Holds(list, {"first", "a", "b", "bc", "c", "d", "e", "last"}));
}

TEST(CListTest, InsertIntoAnEmptyList) {
    CStringList before;
    POSITION p = before.InsertBefore(nullptr, "x");
    EXPECT_EQ(before.GetHeadPosition(), p);
    EXPECT_EQ(before.GetTailPosition(), p);
    EXPECT_TRUE(Holds(before, {"x"}));
    CStringList after;
    after.InsertAfter(nullptr, "y");
    EXPECT_TRUE(Holds(after, {"y"}));
    // One element: before and after it update the right ends.
    after.InsertBefore(after.GetHeadPosition(), "w");
    after.InsertAfter(after.GetTailPosition(), "z");
    EXPECT_TRUE(Holds(after, {"w", "y", "z"}));
}

TEST(CListTest, RemoveAtKeepsTheOtherPositionsValid) {
    CStringList list;
    std::vector<POSITION> at;
    for (const char* t : {"a", "b", "c", "d", "e"})
        at.push_back(list.AddTail(t));

    list.RemoveAt(at[2]); // middle
    EXPECT_TRUE(Holds(list, {"a", "b", "d", "e"}));
    EXPECT_STREQ(list.GetAt(at[1]), "b");
    EXPECT_STREQ(list.GetAt(at[3]), "d");

    list.RemoveAt(at[0]); // head
    EXPECT_EQ(list.GetHeadPosition(), at[1]);
    EXPECT_TRUE(Holds(list, {"b", "d", "e"}));

    list.RemoveAt(at[4]); // tail
    EXPECT_EQ(list.GetTailPosition(), at[3]);
    EXPECT_TRUE(Holds(list, {"b", "d"}));

    // The kept positions still walk to their neighbours.
    POSITION p = at[1];
    list.GetNext(p);
    EXPECT_EQ(p, at[3]);
    p = at[3];
    list.GetPrev(p);
    EXPECT_EQ(p, at[1]);
    list.InsertAfter(at[1], "c");
    EXPECT_TRUE(Holds(list, {"b", "c", "d"}));

    list.RemoveAt(at[1]);
    list.RemoveAt(list.Find("c"));
    list.RemoveAt(at[3]); // the only one
    EXPECT_TRUE(Holds(list, {}));
    EXPECT_EQ(list.GetHeadPosition(), nullptr);
    EXPECT_EQ(list.GetTailPosition(), nullptr);
}

TEST(CListTest, RemovingWhileWalking) {
    // The framework's idiom: step past an element, then remove it.
    CList<int, int> list;
    for (int i = 0; i < 10; ++i)
        list.AddTail(i);
    for (POSITION p = list.GetHeadPosition(); p;) {
        POSITION current = p;
        if (list.GetNext(p) % 3 != 0)
            list.RemoveAt(current);
    }
    std::vector<int> kept;
    for (POSITION p = list.GetHeadPosition(); p;)
        kept.push_back(list.GetNext(p));
    EXPECT_EQ(kept, (std::vector<int>{0, 3, 6, 9}));
    std::vector<int> back;
    for (POSITION p = list.GetTailPosition(); p;)
        back.push_back(list.GetPrev(p));
    EXPECT_EQ(back, (std::vector<int>{9, 6, 3, 0}));
    EXPECT_EQ(list.GetCount(), 4);
}

TEST(CListTest, RemoveHeadAndRemoveTailReturnTheElement) {
    CStringList list = Make({"a", "b", "c", "d"});
    EXPECT_STREQ(list.RemoveHead(), "a");
    EXPECT_STREQ(list.RemoveTail(), "d");
    EXPECT_TRUE(Holds(list, {"b", "c"}));
    EXPECT_STREQ(list.RemoveTail(), "c");
    EXPECT_STREQ(list.RemoveHead(), "b");
    EXPECT_TRUE(Holds(list, {}));
    EXPECT_THROW(list.RemoveHead(), CInvalidArgException);
}

TEST(CListTest, FindAndFindIndex) {
    CStringList list = Make({"a", "b", "a", "c"});
    POSITION first = list.Find("a");
    ASSERT_NE(first, nullptr);
    EXPECT_EQ(first, list.GetHeadPosition());
    POSITION second = list.Find("a", first);
    ASSERT_NE(second, nullptr);
    EXPECT_NE(second, first);
    EXPECT_EQ(second, list.FindIndex(2));
    EXPECT_EQ(list.Find("a", second), nullptr);
    EXPECT_EQ(list.Find("c", list.GetTailPosition()), nullptr);
    EXPECT_EQ(list.Find("c"), list.GetTailPosition());
    EXPECT_EQ(list.Find("z"), nullptr);
    EXPECT_EQ(list.Find("A"), nullptr); // case matters

    for (INT_PTR i = 0; i < list.GetCount(); ++i) {
        POSITION p = list.FindIndex(i);
        ASSERT_NE(p, nullptr);
        EXPECT_EQ(std::string(list.GetAt(p)), Forward(list)[static_cast<size_t>(i)]);
    }
    EXPECT_EQ(list.FindIndex(-1), nullptr);
    EXPECT_EQ(list.FindIndex(4), nullptr);
    EXPECT_EQ(list.FindIndex(1000), nullptr);
}

TEST(CListTest, SetAtAndGetAtChangeOneElement) {
    CStringList list = Make({"a", "b", "c"});
    POSITION p = list.FindIndex(1);
    list.SetAt(p, "B");
    list.GetAt(list.GetHeadPosition()) += "!";
    list.GetTail().MakeUpper();
    EXPECT_TRUE(Holds(list, {"a!", "B", "C"}));
    // An element passed in from the list itself.
    list.SetAt(p, list.GetHead());
    EXPECT_TRUE(Holds(list, {"a!", "a!", "C"}));
}

TEST(CListTest, AddingAListToItselfDoublesIt) {
    CStringList tail = Make({"a", "b", "c"});
    tail.AddTail(&tail);
    EXPECT_TRUE(Holds(tail, {"a", "b", "c", "a", "b", "c"}));
    CStringList head = Make({"a", "b", "c"});
    head.AddHead(&head);
    EXPECT_TRUE(Holds(head, {"a", "b", "c", "a", "b", "c"}));
    CStringList one = Make({"x"});
    one.AddTail(&one);
    one.AddTail(&one);
    EXPECT_TRUE(Holds(one, {"x", "x", "x", "x"}));
    CStringList empty;
    empty.AddTail(&empty);
    empty.AddHead(&empty);
    EXPECT_TRUE(Holds(empty, {}));
}

TEST(CListTest, AddingAnotherListKeepsItsOrder) {
    CStringList list = Make({"m"});
    CStringList other = Make({"x", "y"});
    list.AddHead(&other);
    EXPECT_TRUE(Holds(list, {"x", "y", "m"}));
    list.AddTail(&other);
    EXPECT_TRUE(Holds(list, {"x", "y", "m", "x", "y"}));
    EXPECT_TRUE(Holds(other, {"x", "y"}));
    // The added elements are copies.
    list.GetHead() = "changed";
    EXPECT_TRUE(Holds(other, {"x", "y"}));
}

TEST(CListTest, CopyIsDeep) {
    CStringList original = Make({"a", "b", "c"});
    CStringList copy(original);
    EXPECT_TRUE(Holds(copy, {"a", "b", "c"}));
    EXPECT_NE(copy.GetHeadPosition(), original.GetHeadPosition());
    copy.GetHead().MakeUpper();
    copy.SetAt(copy.FindIndex(1), "B");
    copy.RemoveTail();
    copy.AddTail("d");
    EXPECT_TRUE(Holds(original, {"a", "b", "c"}));
    EXPECT_TRUE(Holds(copy, {"A", "B", "d"}));
    copy.RemoveAll();
    EXPECT_TRUE(Holds(original, {"a", "b", "c"}));
    CStringList emptyCopy{CStringList()};
    EXPECT_TRUE(Holds(emptyCopy, {}));
}

TEST(CListTest, AssignmentIsDeepAndReplacesTheOldElements) {
    CStringList original = Make({"a", "b"});
    CStringList target = Make({"old", "older", "oldest"});
    target = original;
    EXPECT_TRUE(Holds(target, {"a", "b"}));
    target.AddHead("h");
    target.GetTail() = "z";
    EXPECT_TRUE(Holds(original, {"a", "b"}));
    EXPECT_TRUE(Holds(target, {"h", "a", "z"}));
    const CStringList& self = target;
    target = self;
    EXPECT_TRUE(Holds(target, {"h", "a", "z"}));
    target = CStringList();
    EXPECT_TRUE(Holds(target, {}));
    target = original;
    EXPECT_TRUE(Holds(target, {"a", "b"}));
}

// An element type that counts its live instances and can fail to copy.
struct Counted {
    static int live;
    static int copiesUntilFailure; // negative: never fail
    int value;
    explicit Counted(int v) : value(v) { ++live; }
    Counted(const Counted& other) : value(other.value) {
        if (copiesUntilFailure == 0)
            throw std::runtime_error("copy failed");
        if (copiesUntilFailure > 0)
            --copiesUntilFailure;
        ++live;
    }
    Counted(Counted&& other) noexcept : value(other.value) { ++live; }
    Counted& operator=(const Counted&) = default;
    ~Counted() { --live; }
    bool operator==(const Counted& other) const { return value == other.value; }
};
int Counted::live = 0;
int Counted::copiesUntilFailure = -1;

TEST(CListTest, ElementsAreDestroyedExactlyOnce) {
    Counted::live = 0;
    {
        CList<Counted> list;
        for (int i = 0; i < 5; ++i)
            list.AddTail(Counted(i));
        EXPECT_EQ(Counted::live, 5);
        Counted head = list.RemoveHead();
        EXPECT_EQ(head.value, 0);
        list.RemoveAt(list.FindIndex(1));
        EXPECT_EQ(Counted::live, 4); // 3 in the list and head
        CList<Counted> copy(list);
        copy = list;
        EXPECT_EQ(Counted::live, 7);
        list.AddTail(&list);
        EXPECT_EQ(Counted::live, 10);
    }
    EXPECT_EQ(Counted::live, 0);
}

TEST(CListTest, ACopyThatFailsHalfwayLeavesNothingBehind) {
    Counted::live = 0;
    {
        CList<Counted> list;
        for (int i = 0; i < 5; ++i)
            list.AddTail(Counted(i));
        Counted::copiesUntilFailure = 2; // the third copy fails
        EXPECT_THROW(CList<Counted> copy(list), std::runtime_error);
        Counted::copiesUntilFailure = -1;
        EXPECT_EQ(Counted::live, 5); // the two copies made were destroyed

        CList<Counted> target;
        target.AddTail(Counted(42));
        Counted::copiesUntilFailure = 3;
        EXPECT_THROW(target = list, std::runtime_error);
        Counted::copiesUntilFailure = -1;
        EXPECT_EQ(Counted::live, 6);
        ASSERT_EQ(target.GetCount(), 1); // the failed assignment changed nothing
        EXPECT_EQ(target.GetHead().value, 42);
    }
    EXPECT_EQ(Counted::live, 0);
}

TEST(CListTest, ByValueArgumentType) {
    CList<int, int> list;
    list.AddTail(2);
    list.AddHead(1);
    list.InsertAfter(list.GetTailPosition(), 3);
    EXPECT_EQ(list.GetCount(), 3);
    EXPECT_EQ(list.GetHead(), 1);
    EXPECT_EQ(list.GetTail(), 3);
    EXPECT_EQ(list.Find(2), list.FindIndex(1));
    EXPECT_EQ(list.RemoveTail(), 3);
}

TEST(CStringListTest, ElementsShareTextUntilChanged) {
    CString text("shared");
    CStringList list;
    list.AddTail(text);
    list.AddTail(text);
    EXPECT_EQ(list.GetHead().GetString(), text.GetString());
    CStringList copy(list);
    copy.GetHead().SetAt(0, 'S');
    EXPECT_TRUE(Holds(list, {"shared", "shared"}));
    EXPECT_TRUE(Holds(copy, {"Shared", "shared"}));
    EXPECT_STREQ(text, "shared");
}

TEST(CStringListTest, ALongListIsWalkedAndFreed) {
    CStringList list;
    CString item;
    for (int i = 0; i < 2000; ++i) {
        item.Format("%d", i);
        if (i % 2 == 0)
            list.AddTail(item);
        else
            list.AddHead(item);
    }
    EXPECT_EQ(list.GetCount(), 2000);
    EXPECT_STREQ(list.GetHead(), "1999");
    EXPECT_STREQ(list.GetTail(), "1998");
    EXPECT_EQ(Forward(list), Backward(list));
    list.RemoveAll();
    EXPECT_TRUE(Holds(list, {}));
}

} // namespace

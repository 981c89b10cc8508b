// Tests of CList and CStringList: insertion and removal at every place, lists
// added to themselves, and copies that clean up when an element fails to copy.
#include <vaskel/framework/list.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <stdexcept>
#include <string>

using namespace vaskel;

namespace {

// The elements joined by '|', from the head; the walk from the tail and the
// count must agree.
std::string Items(const CStringList& list) {
    std::string forward, backward;
    for (POSITION p = list.GetHeadPosition(); p;)
        forward += std::string(list.GetNext(p)) + "|";
    for (POSITION p = list.GetTailPosition(); p;)
        backward.insert(0, std::string(list.GetPrev(p)) + "|");
    EXPECT_EQ(backward, forward) << "the walk from the tail";
    EXPECT_EQ(list.GetCount(), std::count(forward.begin(), forward.end(), '|'));
    return forward;
}

TEST(CListTest, InsertAndRemoveAtEveryPlace) {
    CStringList list;
    POSITION c = list.AddTail("c");
    POSITION b = list.AddHead("b");
    POSITION a = list.InsertBefore(b, "a"); // before the head: the new head
    POSITION e = list.InsertAfter(c, "e");  // after the tail: the new tail
    POSITION d = list.InsertBefore(e, "d");
    list.InsertBefore(nullptr, "<"); // null: at the head
    list.InsertAfter(nullptr, ">");  // null: at the tail
    EXPECT_EQ(Items(list), "<|a|b|c|d|e|>|");
    EXPECT_EQ(list.Find("d", a), d);
    EXPECT_EQ(list.FindIndex(7), nullptr);
    EXPECT_STREQ(list.RemoveHead() + list.RemoveTail(), "<>");
    list.RemoveAt(c); // middle
    list.RemoveAt(a); // head
    list.RemoveAt(e); // tail
    EXPECT_EQ(Items(list), "b|d|");
    list.AddTail(&list); // stops at the old end
    list.AddHead(&list);
    EXPECT_EQ(Items(list), "b|d|b|d|b|d|b|d|");
    list.RemoveAll();
    EXPECT_THROW(list.RemoveHead(), CInvalidArgException);
    EXPECT_THROW(list.GetTail(), CInvalidArgException);
    EXPECT_THROW(list.RemoveAt(nullptr), CInvalidArgException);
}

// An element type that counts its live instances and can fail to copy.
struct Counted {
    static int live;
    static int copiesUntilFailure; // negative: never fail
    explicit Counted(int) { ++live; }
    Counted(const Counted&) {
        if (copiesUntilFailure == 0)
            throw std::runtime_error("copy failed");
        --copiesUntilFailure;
        ++live;
    }
    ~Counted() { --live; }
};
int Counted::live = 0;
int Counted::copiesUntilFailure = -1;

TEST(CListTest, CopiesAreDeepAndCleanUpWhenAnElementFailsToCopy) {
    {
        CList<Counted> list;
        for (int i = 0; i < 4; ++i)
            list.AddTail(Counted(i));
        CList<Counted> copy(list);
        copy.RemoveHead();
        EXPECT_EQ(Counted::live, 7);
        Counted::copiesUntilFailure = 2; // the third copy fails
        EXPECT_THROW(CList<Counted> failed(list), std::runtime_error);
        EXPECT_EQ(Counted::live, 7) << "the copies made before the failure are gone";
        Counted::copiesUntilFailure = 1;
        EXPECT_THROW(copy = list, std::runtime_error);
        EXPECT_EQ(copy.GetCount(), 3) << "the failed assignment changed nothing";
        Counted::copiesUntilFailure = -1;
    }
    EXPECT_EQ(Counted::live, 0);
}

} // namespace

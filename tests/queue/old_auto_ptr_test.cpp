#include <vaskel/queue.h>

#include <gtest/gtest.h>

#include <deque>

using vaskel::CVKAsyncCmd;
using vaskel::old_auto_ptr;

namespace {

struct Tracked : CVKAsyncCmd {
    explicit Tracked(int* deaths) : deaths(deaths) {}
    ~Tracked() override { ++*deaths; }
    void Execute() override {}
    int* deaths;
};

} // namespace

TEST(old_auto_ptr, OwnsANonNullPointerAndDeletesItThroughTheVirtualDestructor) {
    int deaths = 0;
    {
        old_auto_ptr<CVKAsyncCmd> owner(new Tracked(&deaths));
        EXPECT_TRUE(owner.owns());
    }
    EXPECT_EQ(deaths, 1);

    old_auto_ptr<CVKAsyncCmd> empty;
    EXPECT_FALSE(empty.owns());
    EXPECT_EQ(empty.get(), nullptr);
}

TEST(old_auto_ptr, ReleaseKeepsThePointerAndLeavesTheObjectAlive) {
    int deaths = 0;
    Tracked* object = new Tracked(&deaths);
    {
        old_auto_ptr<CVKAsyncCmd> owner(object);
        EXPECT_EQ(owner.release(), object);
        EXPECT_EQ(owner.get(), object);
        EXPECT_FALSE(owner.owns());
    }
    EXPECT_EQ(deaths, 0);
    delete object;
}

TEST(old_auto_ptr, CopyingTransfersOwnershipAndTheSourceKeepsItsPointer) {
    int deaths = 0;
    Tracked* object = new Tracked(&deaths);
    {
        old_auto_ptr<CVKAsyncCmd> source(object);
        {
            old_auto_ptr<CVKAsyncCmd> target(source);
            EXPECT_TRUE(target.owns());
            EXPECT_FALSE(source.owns());
            EXPECT_EQ(source.get(), object);
        }
        EXPECT_EQ(deaths, 1) << "the new owner deletes";
    }
    EXPECT_EQ(deaths, 1) << "the former owner does not delete again";
}

TEST(old_auto_ptr, AssignmentDeletesTheTargetsOldObjectFirst) {
    int deaths = 0;
    Tracked* first = new Tracked(&deaths);
    Tracked* second = new Tracked(&deaths);
    old_auto_ptr<CVKAsyncCmd> target(first);
    old_auto_ptr<CVKAsyncCmd> source(second);
    target = source;
    EXPECT_EQ(deaths, 1);
    EXPECT_EQ(target.get(), second);
    EXPECT_TRUE(target.owns());
    EXPECT_FALSE(source.owns());
}

TEST(old_auto_ptr, AssigningAnUnownedPointerKeepsTheTargetUnowned) {
    int deaths = 0;
    Tracked object(&deaths);
    old_auto_ptr<CVKAsyncCmd> borrowed(&object);
    borrowed.release();
    old_auto_ptr<CVKAsyncCmd> target;
    target = borrowed;
    EXPECT_EQ(target.get(), &object);
    EXPECT_FALSE(target.owns());
}

TEST(old_auto_ptr, AssigningTheSameObjectEndsOwnedIfEitherOwnedIt) {
    int deaths = 0;
    Tracked* object = new Tracked(&deaths);
    {
        old_auto_ptr<CVKAsyncCmd> owner(object);
        old_auto_ptr<CVKAsyncCmd> viewer(owner); // viewer owns now
        owner = viewer;
        EXPECT_TRUE(owner.owns());
        EXPECT_FALSE(viewer.owns());
        EXPECT_EQ(deaths, 0) << "the shared object must not be deleted on assignment";

        old_auto_ptr<CVKAsyncCmd> other(owner);
        other.release();
        owner = other; // neither owns now
        EXPECT_FALSE(owner.owns());
    }
    EXPECT_EQ(deaths, 0);
    delete object;
}

TEST(old_auto_ptr, SelfAssignmentChangesNothing) {
    int deaths = 0;
    old_auto_ptr<CVKAsyncCmd> owner(new Tracked(&deaths));
    old_auto_ptr<CVKAsyncCmd>& alias = owner;
    owner = alias;
    EXPECT_TRUE(owner.owns());
    EXPECT_EQ(deaths, 0);
}

TEST(old_auto_ptr, AContainerOfPointersDeletesOnlyWhatItOwns) {
    int deaths = 0;
    Tracked stackObject(&deaths);
    {
        std::deque<old_auto_ptr<CVKAsyncCmd>> level;
        level.push_back(old_auto_ptr<CVKAsyncCmd>(new Tracked(&deaths)));
        old_auto_ptr<CVKAsyncCmd> notOwned(&stackObject);
        notOwned.release();
        level.push_back(notOwned);
        level.push_back(old_auto_ptr<CVKAsyncCmd>(new Tracked(&deaths)));

        old_auto_ptr<CVKAsyncCmd> front(level.front()); // take the front out
        level.pop_front();
        EXPECT_TRUE(front.owns());
        EXPECT_EQ(deaths, 0);
    }
    EXPECT_EQ(deaths, 2);
}

#include <vaskel/sync.h>

#include <gtest/gtest.h>

#include <memory>

using vaskel::SimpleDestroyedMarker;

namespace {

// Exposes the raw state word, as the class's inline users see it.
struct RawMarker : SimpleDestroyedMarker {
    using SimpleDestroyedMarker::AsState;
    using SimpleDestroyedMarker::HasState;
};

// A watcher record in its documented form: two words, the second continuing
// the chain.
struct Record {
    INT_PTR first = 0;
    SimpleDestroyedMarker::State next = SimpleDestroyedMarker::Alive;
};

SimpleDestroyedMarker::State AddressOf(Record& record) {
    return static_cast<SimpleDestroyedMarker::State>(reinterpret_cast<INT_PTR>(&record));
}

} // namespace

TEST(SimpleDestroyedMarker, MovesFromAliveToDestroying) {
    SimpleDestroyedMarker marker;
    EXPECT_TRUE(marker.IsAlive());
    EXPECT_FALSE(marker.IsDestroying());
    marker.SetDestroying();
    EXPECT_FALSE(marker.IsAlive());
    EXPECT_TRUE(marker.IsDestroying());
    EXPECT_EQ(marker.GetState(), SimpleDestroyedMarker::Destroying);
}

TEST(SimpleDestroyedMarker, AOneRecordChainAnswersForTheMarker) {
    Record record;
    {
        RawMarker marker;
        EXPECT_TRUE(marker.HasState());
        marker.AsState() = AddressOf(record);
        EXPECT_FALSE(marker.HasState());
        EXPECT_EQ(marker.GetState(), SimpleDestroyedMarker::Alive);

        marker.SetDestroying();
        EXPECT_EQ(record.next, SimpleDestroyedMarker::Destroying);
        EXPECT_EQ(marker.AsState(), AddressOf(record)) << "only the record's word changes";
        EXPECT_TRUE(marker.IsDestroying());
    }
    EXPECT_EQ(record.next, SimpleDestroyedMarker::Destroyed);
}

TEST(SimpleDestroyedMarker, DestroyingTheMarkerDissolvesAChainOfTwo) {
    Record outer, inner;
    {
        RawMarker marker;
        inner.next = SimpleDestroyedMarker::Alive;
        outer.next = AddressOf(inner);
        marker.AsState() = AddressOf(outer);
        EXPECT_TRUE(marker.IsAlive());
        marker.SetDestroying();
        EXPECT_EQ(inner.next, SimpleDestroyedMarker::Destroying);
        EXPECT_EQ(outer.next, AddressOf(inner));
    }
    EXPECT_EQ(outer.next, SimpleDestroyedMarker::Destroyed);
    EXPECT_EQ(inner.next, SimpleDestroyedMarker::Destroyed);
}

TEST(SimpleDestroyedMarkerWatcher, OutlivesTheObjectAndAnswersDestroyed) {
    auto marker = std::make_unique<SimpleDestroyedMarker>();
    SimpleDestroyedMarker::Watcher watcher(*marker);
    EXPECT_TRUE(watcher.IsAlive());
    EXPECT_TRUE(marker->IsAlive());
    marker->SetDestroying();
    EXPECT_TRUE(watcher.IsDestroying());
    marker.reset();
    EXPECT_TRUE(watcher.IsDestroyed());
}

TEST(SimpleDestroyedMarkerWatcher, NestedWatchersUnlinkInAnyOrder) {
    SimpleDestroyedMarker marker;
    {
        auto outer = std::make_unique<SimpleDestroyedMarker::Watcher>(marker);
        SimpleDestroyedMarker::Watcher inner(marker);
        marker.SetDestroying();
        EXPECT_TRUE(outer->IsDestroying());
        EXPECT_TRUE(inner.IsDestroying());
        outer.reset(); // the older watcher leaves first
        EXPECT_TRUE(inner.IsDestroying());
        EXPECT_TRUE(marker.IsDestroying());
    }
    EXPECT_TRUE(marker.IsDestroying()) << "the state survives the chain's dissolution";
}

TEST(SimpleDestroyedMarkerWatcher, EveryWatcherSeesTheDestruction) {
    auto marker = std::make_unique<SimpleDestroyedMarker>();
    SimpleDestroyedMarker::Watcher first(*marker);
    SimpleDestroyedMarker::Watcher second(*marker);
    SimpleDestroyedMarker::Watcher third(*marker);
    marker.reset();
    EXPECT_TRUE(first.IsDestroyed());
    EXPECT_TRUE(second.IsDestroyed());
    EXPECT_TRUE(third.IsDestroyed());
}

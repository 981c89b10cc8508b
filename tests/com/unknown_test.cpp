// The IUnknown bases: IVKUnknown's fixed answers, CVKUnknown's counting in
// both variants, destruction through OnFinalRelease and Delete, and
// balanced counting from several threads.
#include <vaskel/unknown.h>

#include <gtest/gtest.h>

#include <memory>
#include <thread>
#include <vector>

namespace {

using vaskel::CVKUnknown;
using vaskel::IVKUnknown;

const IID IID_Other = {
    0x3D6B7A10, 0x51C2, 0x4E8B, {0x9A, 0x61, 0x0F, 0x2E, 0x77, 0x10, 0x5B, 0x03}};

TEST(IVKUnknown, AnswersOnlyIUnknown) {
    IVKUnknown object;
    void* result = nullptr;
    EXPECT_EQ(object.QueryInterface(IID_IUnknown, &result), S_OK);
    EXPECT_EQ(result, static_cast<IUnknown*>(&object));

    void* untouched = &object + 1;
    EXPECT_EQ(object.QueryInterface(IID_IDispatch, &untouched), E_NOINTERFACE);
    EXPECT_EQ(untouched, &object + 1);
    EXPECT_EQ(object.QueryInterface(IID_Other, &untouched), E_NOINTERFACE);
}

TEST(IVKUnknown, NeverCountsNorDestroys) {
    // A stack object: any attempt to delete it would be caught by the
    // sanitizers.
    IVKUnknown object;
    EXPECT_EQ(object.AddRef(), 1u);
    for (int i = 0; i < 3; ++i)
        EXPECT_EQ(object.Release(), 1u);
    IUnknown* asUnknown = &object;
    EXPECT_EQ(asUnknown->Release(), 1u);
}

// Records its destruction; Delete may be switched off.
template <int N>
class Tracked : public CVKUnknown<N> {
public:
    Tracked(int* finalReleases, int* destructions, bool deletes = true)
        : m_finalReleases(finalReleases), m_destructions(destructions), m_deletes(deletes) {}
    ~Tracked() override { ++*m_destructions; }
    using CVKUnknown<N>::InternalAddRef;
    using CVKUnknown<N>::InternalRelease;

protected:
    void OnFinalRelease() override {
        ++*m_finalReleases;
        CVKUnknown<N>::OnFinalRelease();
    }
    void Delete() override {
        if (m_deletes)
            CVKUnknown<N>::Delete();
    }

private:
    int* m_finalReleases;
    int* m_destructions;
    bool m_deletes;
};

template <class T>
class CVKUnknownCounting : public ::testing::Test {};
using Variants = ::testing::Types<Tracked<0>, Tracked<1>>;
TYPED_TEST_SUITE(CVKUnknownCounting, Variants);

TYPED_TEST(CVKUnknownCounting, CountsFromZeroAndDeletesAtTheLastRelease) {
    int finalReleases = 0;
    int destructions = 0;
    auto* object = new TypeParam(&finalReleases, &destructions);
    EXPECT_EQ(object->GetRefCount(), 0u);
    EXPECT_EQ(object->AddRef(), 1u);
    EXPECT_EQ(object->AddRef(), 2u);
    EXPECT_EQ(object->Release(), 1u);
    EXPECT_EQ(destructions, 0);
    EXPECT_EQ(object->Release(), 0u);
    EXPECT_EQ(finalReleases, 1);
    EXPECT_EQ(destructions, 1);
}

TYPED_TEST(CVKUnknownCounting, QueryInterfaceCountsThroughTheObject) {
    int finalReleases = 0;
    int destructions = 0;
    auto* object = new TypeParam(&finalReleases, &destructions);
    IUnknown* unknown = nullptr;
    ASSERT_EQ(object->QueryInterface(IID_IUnknown, reinterpret_cast<void**>(&unknown)), S_OK);
    EXPECT_EQ(unknown, static_cast<IUnknown*>(object));
    EXPECT_EQ(object->GetRefCount(), 1u);
    void* other = nullptr;
    EXPECT_EQ(object->QueryInterface(IID_IDispatch, &other), E_NOINTERFACE);
    EXPECT_EQ(object->GetRefCount(), 1u);
    EXPECT_EQ(unknown->Release(), 0u);
    EXPECT_EQ(destructions, 1);
}

TYPED_TEST(CVKUnknownCounting, InternalCountingNeverDestroys) {
    int finalReleases = 0;
    int destructions = 0;
    auto object = std::make_unique<TypeParam>(&finalReleases, &destructions);
    EXPECT_EQ(object->InternalAddRef(), 1u);
    EXPECT_EQ(object->InternalAddRef(), 2u);
    EXPECT_EQ(object->InternalRelease(), 1u);
    EXPECT_EQ(object->InternalRelease(), 0u);
    EXPECT_EQ(finalReleases, 0);
    EXPECT_EQ(destructions, 0);
}

TYPED_TEST(CVKUnknownCounting, ADeleteThatKeepsTheObjectSurvivesTheLastRelease) {
    int finalReleases = 0;
    int destructions = 0;
    {
        auto object = std::make_unique<TypeParam>(&finalReleases, &destructions, false);
        object->AddRef();
        EXPECT_EQ(object->Release(), 0u);
        EXPECT_EQ(finalReleases, 1);
        EXPECT_EQ(destructions, 0);
        // Still usable: it counts on from zero.
        EXPECT_EQ(object->AddRef(), 1u);
        EXPECT_EQ(object->Release(), 0u);
        EXPECT_EQ(finalReleases, 2);
    }
    EXPECT_EQ(destructions, 1);
}

TYPED_TEST(CVKUnknownCounting, CopiesTakeTheCountAsItStands) {
    int finalReleases = 0;
    int destructions = 0;
    auto object = std::make_unique<TypeParam>(&finalReleases, &destructions, false);
    object->AddRef();
    object->AddRef();
    auto copy = std::make_unique<TypeParam>(*object);
    EXPECT_EQ(copy->GetRefCount(), 2u);
    auto assigned = std::make_unique<TypeParam>(&finalReleases, &destructions, false);
    *assigned = *object;
    EXPECT_EQ(assigned->GetRefCount(), 2u);
    copy->Release();
    EXPECT_EQ(copy->GetRefCount(), 1u);
    EXPECT_EQ(object->GetRefCount(), 2u);
}

TEST(CVKUnknownThreadSafe, CountsStayBalancedAcrossThreads) {
    int finalReleases = 0;
    int destructions = 0;
    auto* object = new Tracked<1>(&finalReleases, &destructions);
    object->AddRef(); // the test's own reference
    constexpr int threads = 4;
    constexpr int rounds = 20000;
    std::vector<std::thread> workers;
    for (int t = 0; t < threads; ++t) {
        workers.emplace_back([object] {
            for (int i = 0; i < rounds; ++i) {
                object->AddRef();
                object->Release();
            }
        });
    }
    for (std::thread& worker : workers)
        worker.join();
    EXPECT_EQ(object->GetRefCount(), 1u);
    EXPECT_EQ(destructions, 0);
    EXPECT_EQ(object->Release(), 0u);
    EXPECT_EQ(destructions, 1);
}

TEST(CVKUnknownThreadSafe, TheLastReleaseOnAnyThreadDestroysOnce) {
    int finalReleases = 0;
    int destructions = 0;
    auto* object = new Tracked<1>(&finalReleases, &destructions);
    constexpr int threads = 4;
    for (int t = 0; t < threads; ++t)
        object->AddRef();
    std::vector<std::thread> workers;
    for (int t = 0; t < threads; ++t)
        workers.emplace_back([object] { object->Release(); });
    for (std::thread& worker : workers)
        worker.join();
    EXPECT_EQ(finalReleases, 1);
    EXPECT_EQ(destructions, 1);
}

} // namespace

// Class objects registered by the process: lookups by class and server kind,
// creating instances through them, and revoking them.
#include "support/counting_unknown.h"
#include "support/wine.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cstring>
#include <thread>

namespace {

using vaskel_test::CountingUnknown;

// Each test registers its own class, so that a failed test leaves nothing
// registered that another one finds.
CLSID TestClass(unsigned char n) {
    return {0x5D1C0A11, 0x7E2B, 0x4C3D, {0x9A, 0x1B, 0x2C, 0x3D, 0x4E, 0x5F, 0x60, n}};
}

// An instance that frees itself on its last release, counting the live ones.
class Instance final : public IUnknown {
public:
    explicit Instance(int& live) : live(live) { ++live; }
    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID riid, void** object) override {
        if (std::memcmp(&riid, &IID_IUnknown, sizeof(IID)) != 0) {
            *object = nullptr;
            return E_NOINTERFACE;
        }
        AddRef();
        *object = static_cast<IUnknown*>(this);
        return S_OK;
    }
    ULONG STDMETHODCALLTYPE AddRef() override { return ++references; }
    ULONG STDMETHODCALLTYPE Release() override {
        ULONG left = --references;
        if (left == 0) {
            --live;
            delete this;
        }
        return left;
    }

private:
    int& live;
    ULONG references = 1;
};

// A class factory that counts its references and never frees itself, and
// refuses aggregation.
class TestFactory : public IClassFactory {
public:
    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID riid, void** object) override {
        if (std::memcmp(&riid, &IID_IUnknown, sizeof(IID)) == 0 ||
            std::memcmp(&riid, &IID_IClassFactory, sizeof(IID)) == 0) {
            AddRef();
            *object = static_cast<IClassFactory*>(this);
            return S_OK;
        }
        *object = nullptr;
        return E_NOINTERFACE;
    }
    ULONG STDMETHODCALLTYPE AddRef() override { return ++references; }
    ULONG STDMETHODCALLTYPE Release() override {
        ULONG left = --references;
        if (left == 1 && onLastRegistryRelease)
            onLastRegistryRelease(this);
        return left;
    }
    HRESULT STDMETHODCALLTYPE CreateInstance(IUnknown* outer, REFIID riid, void** object) override {
        *object = nullptr;
        if (outer != nullptr)
            return CLASS_E_NOAGGREGATION;
        auto instance = new Instance(live);
        HRESULT hr = instance->QueryInterface(riid, object);
        instance->Release();
        return hr;
    }
    HRESULT STDMETHODCALLTYPE LockServer(BOOL) override { return S_OK; }

    ULONG references = 1;
    int live = 0;
    // Called when the references fall back to the test's own one.
    void (*onLastRegistryRelease)(TestFactory*) = nullptr;
    HRESULT reentrantResult = S_OK;
};

// A cookie that names no registration. Wine answers E_INVALIDARG, so there
// only the failure is checked.
void ExpectNotRegistered(HRESULT hr) {
    if (vaskel_test::RunningOnWine()) {
        EXPECT_TRUE(FAILED(hr)) << "Wine gives E_INVALIDARG rather than CO_E_OBJNOTREG";
        return;
    }
    EXPECT_EQ(hr, CO_E_OBJNOTREG);
}

// The tests' thread is in a single-threaded apartment, so that no
// multithreaded apartment exists for other threads to join implicitly.
class ClassObjectsTest : public ::testing::Test {
protected:
    void SetUp() override { ASSERT_TRUE(SUCCEEDED(CoInitialize(nullptr))); }
    void TearDown() override { CoUninitialize(); }
};

TEST_F(ClassObjectsTest, RegisteredClassCreatesInstancesUntilRevoked) {
    const CLSID clsid = TestClass(1);
    TestFactory factory;
    DWORD cookie = 0;
    ASSERT_EQ(
        CoRegisterClassObject(clsid, &factory, CLSCTX_INPROC_SERVER, REGCLS_MULTIPLEUSE, &cookie),
        S_OK);
    EXPECT_NE(cookie, 0u);
    EXPECT_GT(factory.references, 1u) << "the registration holds the object";

    void* object = nullptr;
    ASSERT_EQ(CoGetClassObject(clsid, CLSCTX_INPROC_SERVER, nullptr, IID_IClassFactory, &object),
              S_OK);
    EXPECT_EQ(object, static_cast<IClassFactory*>(&factory));
    static_cast<IUnknown*>(object)->Release();
    object = &factory;
    EXPECT_EQ(CoGetClassObject(clsid, CLSCTX_INPROC_SERVER, nullptr, IID_IDispatch, &object),
              E_NOINTERFACE);
    EXPECT_EQ(object, nullptr);

    IUnknown* first = nullptr;
    IUnknown* second = nullptr;
    ASSERT_EQ(CoCreateInstance(clsid, nullptr, CLSCTX_ALL, IID_IUnknown,
                               reinterpret_cast<void**>(&first)),
              S_OK);
    ASSERT_EQ(CoCreateInstance(clsid, nullptr, CLSCTX_INPROC_SERVER, IID_IUnknown,
                               reinterpret_cast<void**>(&second)),
              S_OK);
    EXPECT_NE(first, second);
    EXPECT_EQ(factory.live, 2);
    first->Release();
    second->Release();
    EXPECT_EQ(factory.live, 0);

    object = &factory;
    EXPECT_EQ(CoCreateInstance(clsid, nullptr, CLSCTX_INPROC_SERVER, IID_IDispatch, &object),
              E_NOINTERFACE)
        << "the factory's answer passes through";
    EXPECT_EQ(object, nullptr);
    EXPECT_EQ(factory.live, 0);

    EXPECT_EQ(CoRevokeClassObject(cookie), S_OK);
    EXPECT_EQ(factory.references, 1u) << "every reference COM took is released";
    ExpectNotRegistered(CoRevokeClassObject(cookie));
    object = &factory;
    EXPECT_EQ(CoGetClassObject(clsid, CLSCTX_INPROC_SERVER, nullptr, IID_IClassFactory, &object),
              REGDB_E_CLASSNOTREG);
    EXPECT_EQ(object, nullptr);
    EXPECT_EQ(factory.references, 1u);
}

TEST_F(ClassObjectsTest, UnknownClassAndCookieAreErrors) {
    void* object = &object;
    EXPECT_EQ(
        CoGetClassObject(TestClass(2), CLSCTX_INPROC_SERVER, nullptr, IID_IClassFactory, &object),
        REGDB_E_CLASSNOTREG);
    EXPECT_EQ(object, nullptr);
    object = &object;
    EXPECT_EQ(CoCreateInstance(TestClass(2), nullptr, CLSCTX_INPROC_SERVER, IID_IUnknown, &object),
              REGDB_E_CLASSNOTREG);
    EXPECT_EQ(object, nullptr);
    ExpectNotRegistered(CoRevokeClassObject(0));
    ExpectNotRegistered(CoRevokeClassObject(0xFFFFFFFFu));
}

TEST_F(ClassObjectsTest, MissingOutputsAreRefused) {
    TestFactory factory;
    EXPECT_EQ(CoRegisterClassObject(TestClass(3), &factory, CLSCTX_INPROC_SERVER,
                                    REGCLS_MULTIPLEUSE, nullptr),
              E_INVALIDARG);
    EXPECT_EQ(factory.references, 1u);
    DWORD cookie = 0;
    ASSERT_EQ(CoRegisterClassObject(TestClass(3), &factory, CLSCTX_INPROC_SERVER,
                                    REGCLS_MULTIPLEUSE, &cookie),
              S_OK);
    EXPECT_EQ(
        CoGetClassObject(TestClass(3), CLSCTX_INPROC_SERVER, nullptr, IID_IClassFactory, nullptr),
        E_INVALIDARG);
    EXPECT_EQ(CoCreateInstance(TestClass(3), nullptr, CLSCTX_INPROC_SERVER, IID_IUnknown, nullptr),
              E_POINTER);
    EXPECT_EQ(factory.live, 0);
    EXPECT_EQ(CoRevokeClassObject(cookie), S_OK);
    EXPECT_EQ(factory.references, 1u);
}

TEST_F(ClassObjectsTest, RefusedAggregationPassesThrough) {
    TestFactory factory;
    DWORD cookie = 0;
    ASSERT_EQ(CoRegisterClassObject(TestClass(4), &factory, CLSCTX_INPROC_SERVER,
                                    REGCLS_MULTIPLEUSE, &cookie),
              S_OK);
    CountingUnknown outer;
    void* object = &object;
    EXPECT_EQ(CoCreateInstance(TestClass(4), &outer, CLSCTX_INPROC_SERVER, IID_IUnknown, &object),
              CLASS_E_NOAGGREGATION);
    EXPECT_EQ(object, nullptr);
    EXPECT_EQ(outer.references, 1u);
    EXPECT_EQ(factory.live, 0);
    EXPECT_EQ(CoRevokeClassObject(cookie), S_OK);
    EXPECT_EQ(factory.references, 1u);
}

TEST_F(ClassObjectsTest, RegistrationsOfOneClassAreIndependent) {
    const CLSID clsid = TestClass(5);
    TestFactory older;
    TestFactory newer;
    DWORD first = 0;
    DWORD second = 0;
    ASSERT_EQ(
        CoRegisterClassObject(clsid, &older, CLSCTX_INPROC_SERVER, REGCLS_MULTIPLEUSE, &first),
        S_OK);
    ASSERT_EQ(
        CoRegisterClassObject(clsid, &newer, CLSCTX_INPROC_SERVER, REGCLS_MULTIPLEUSE, &second),
        S_OK);
    if (vaskel_test::RunningOnWine() && second == 0) {
        CoRevokeClassObject(first);
        GTEST_SKIP() << "Wine folds a second multiple-use registration of a class into the first "
                        "and gives no cookie; Windows documents them as independent";
    }
    EXPECT_NE(first, second);

    EXPECT_EQ(CoRevokeClassObject(first), S_OK);
    EXPECT_EQ(older.references, 1u);
    void* object = nullptr;
    ASSERT_EQ(CoGetClassObject(clsid, CLSCTX_INPROC_SERVER, nullptr, IID_IClassFactory, &object),
              S_OK);
    EXPECT_EQ(object, static_cast<IClassFactory*>(&newer)) << "the remaining registration serves";
    static_cast<IUnknown*>(object)->Release();

    EXPECT_EQ(CoRevokeClassObject(second), S_OK);
    EXPECT_EQ(newer.references, 1u);
    EXPECT_EQ(CoGetClassObject(clsid, CLSCTX_INPROC_SERVER, nullptr, IID_IClassFactory, &object),
              REGDB_E_CLASSNOTREG);
}

TEST_F(ClassObjectsTest, ServerKindsFollowTheRegistrationFlags) {
    TestFactory factory;
    void* object = nullptr;

    // Multiple use as a local server serves the process itself too.
    DWORD cookie = 0;
    ASSERT_EQ(CoRegisterClassObject(TestClass(6), &factory, CLSCTX_LOCAL_SERVER, REGCLS_MULTIPLEUSE,
                                    &cookie),
              S_OK);
    ASSERT_EQ(
        CoGetClassObject(TestClass(6), CLSCTX_INPROC_SERVER, nullptr, IID_IClassFactory, &object),
        S_OK);
    static_cast<IUnknown*>(object)->Release();
    EXPECT_EQ(CoRevokeClassObject(cookie), S_OK);

    // Separate multiple use serves only the kinds named.
    ASSERT_EQ(CoRegisterClassObject(TestClass(7), &factory, CLSCTX_LOCAL_SERVER,
                                    REGCLS_MULTI_SEPARATE, &cookie),
              S_OK);
    EXPECT_EQ(
        CoGetClassObject(TestClass(7), CLSCTX_INPROC_SERVER, nullptr, IID_IClassFactory, &object),
        REGDB_E_CLASSNOTREG);
    EXPECT_EQ(CoRevokeClassObject(cookie), S_OK);

    ASSERT_EQ(CoRegisterClassObject(TestClass(8), &factory, CLSCTX_INPROC_SERVER,
                                    REGCLS_MULTI_SEPARATE, &cookie),
              S_OK);
    ASSERT_EQ(
        CoGetClassObject(TestClass(8), CLSCTX_INPROC_SERVER, nullptr, IID_IClassFactory, &object),
        S_OK);
    static_cast<IUnknown*>(object)->Release();
    EXPECT_EQ(CoRevokeClassObject(cookie), S_OK);
    EXPECT_EQ(factory.references, 1u);
}

TEST_F(ClassObjectsTest, SingleUseIsForLocalServersOnly) {
    TestFactory factory;
    DWORD cookie = 0;
    HRESULT inproc = CoRegisterClassObject(TestClass(9), &factory, CLSCTX_INPROC_SERVER,
                                           REGCLS_SINGLEUSE, &cookie);
    if (vaskel_test::RunningOnWine() && inproc == S_OK) {
        CoRevokeClassObject(cookie);
        GTEST_SKIP() << "Wine accepts single use in process, which Windows documents as an error";
    }
    EXPECT_EQ(inproc, E_INVALIDARG);
    EXPECT_EQ(CoRegisterClassObject(TestClass(9), &factory,
                                    CLSCTX_INPROC_SERVER | CLSCTX_LOCAL_SERVER, REGCLS_SINGLEUSE,
                                    &cookie),
              E_INVALIDARG);
    EXPECT_EQ(factory.references, 1u);
}

TEST_F(ClassObjectsTest, SingleUseServesOneConnection) {
    const CLSID clsid = TestClass(13);
    TestFactory factory;
    DWORD cookie = 0;
    ASSERT_EQ(
        CoRegisterClassObject(clsid, &factory, CLSCTX_LOCAL_SERVER, REGCLS_SINGLEUSE, &cookie),
        S_OK);
    void* object = nullptr;
    EXPECT_EQ(CoGetClassObject(clsid, CLSCTX_INPROC_SERVER, nullptr, IID_IClassFactory, &object),
              REGDB_E_CLASSNOTREG)
        << "single use does not serve the process itself";
    ASSERT_EQ(CoGetClassObject(clsid, CLSCTX_LOCAL_SERVER, nullptr, IID_IClassFactory, &object),
              S_OK);
    static_cast<IUnknown*>(object)->Release();
    object = nullptr;
    HRESULT again =
        CoGetClassObject(clsid, CLSCTX_LOCAL_SERVER, nullptr, IID_IClassFactory, &object);
    if (object != nullptr)
        static_cast<IUnknown*>(object)->Release();
    if (vaskel_test::RunningOnWine() && again == S_OK) {
        EXPECT_EQ(CoRevokeClassObject(cookie), S_OK);
        GTEST_SKIP() << "Wine serves a single-use class object again after its first connection";
    }
    EXPECT_TRUE(FAILED(again)) << "hidden after its first connection";
    EXPECT_EQ(object, nullptr);
    EXPECT_EQ(CoRevokeClassObject(cookie), S_OK) << "hidden, but still registered";
    EXPECT_EQ(factory.references, 1u);
}

TEST_F(ClassObjectsTest, RevokingReleasesOutsideTheTable) {
    // The factory's last release by COM looks its class up again: the lookup
    // must neither deadlock nor find the revoked registration.
    TestFactory factory;
    factory.onLastRegistryRelease = [](TestFactory* self) {
        void* object = nullptr;
        self->reentrantResult = CoGetClassObject(TestClass(10), CLSCTX_INPROC_SERVER, nullptr,
                                                 IID_IClassFactory, &object);
        if (object != nullptr)
            static_cast<IUnknown*>(object)->Release();
    };
    DWORD cookie = 0;
    ASSERT_EQ(CoRegisterClassObject(TestClass(10), &factory, CLSCTX_INPROC_SERVER,
                                    REGCLS_MULTIPLEUSE, &cookie),
              S_OK);
    EXPECT_EQ(CoRevokeClassObject(cookie), S_OK);
    factory.onLastRegistryRelease = nullptr;
    EXPECT_EQ(factory.reentrantResult, REGDB_E_CLASSNOTREG);
    EXPECT_EQ(factory.references, 1u);
}

TEST_F(ClassObjectsTest, ThreadsWithoutAnApartmentAreRefused) {
    TestFactory factory;
    DWORD cookie = 0;
    ASSERT_EQ(CoRegisterClassObject(TestClass(11), &factory, CLSCTX_INPROC_SERVER,
                                    REGCLS_MULTIPLEUSE, &cookie),
              S_OK);
    std::thread worker([&] {
        DWORD other = 0;
        EXPECT_EQ(CoRegisterClassObject(TestClass(12), &factory, CLSCTX_INPROC_SERVER,
                                        REGCLS_MULTIPLEUSE, &other),
                  CO_E_NOTINITIALIZED);
        void* object = &object;
        EXPECT_EQ(CoGetClassObject(TestClass(11), CLSCTX_INPROC_SERVER, nullptr, IID_IClassFactory,
                                   &object),
                  CO_E_NOTINITIALIZED);
        EXPECT_EQ(object, nullptr);
        object = &object;
        EXPECT_EQ(
            CoCreateInstance(TestClass(11), nullptr, CLSCTX_INPROC_SERVER, IID_IUnknown, &object),
            CO_E_NOTINITIALIZED);
        EXPECT_EQ(object, nullptr);
        EXPECT_EQ(CoRevokeClassObject(cookie), CO_E_NOTINITIALIZED);

        // Having left the apartment counts as never having entered it.
        ASSERT_TRUE(SUCCEEDED(CoInitialize(nullptr)));
        CoUninitialize();
        EXPECT_EQ(CoRegisterClassObject(TestClass(12), &factory, CLSCTX_INPROC_SERVER,
                                        REGCLS_MULTIPLEUSE, &other),
                  CO_E_NOTINITIALIZED);
    });
    worker.join();
    EXPECT_EQ(factory.live, 0);
    EXPECT_EQ(CoRevokeClassObject(cookie), S_OK) << "still registered";
    EXPECT_EQ(factory.references, 1u);
}

} // namespace

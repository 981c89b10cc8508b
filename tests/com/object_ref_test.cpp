// Object references as text: a name made for a live object binds back to
// that object, text that is no such name fails as the platform parses it, and
// no reference is leaked on either path.
#include "support/wine.h"

#include <vaskel/object_ref.h>
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>

namespace {

using vaskel::COMObjRef;
using vaskel::CString;

// An object that counts its references and never frees itself.
class Referenced : public IUnknown {
public:
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
    ULONG STDMETHODCALLTYPE Release() override { return --references; }

    ULONG references = 1;
};

IUnknown* const kUntouched = reinterpret_cast<IUnknown*>(static_cast<std::uintptr_t>(0x1234));

class ObjectRefTest : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(SUCCEEDED(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED)));
    }
    void TearDown() override {
        CoUninitialize();
        EXPECT_EQ(1u, object.references) << "a reference to the object was leaked";
    }

    // The object's display name; skips where the platform cannot give one.
    CString NameOf(IUnknown* target) {
        CString name("unchanged");
        const HRESULT hr = COMObjRef::MakeDisplayName(target, name);
        if (FAILED(hr)) {
            EXPECT_STREQ("unchanged", name) << "a failure leaves the name as it was";
            if (vaskel_test::RunningOnWine())
                return CString();
            ADD_FAILURE() << "MakeDisplayName failed: 0x" << std::hex << hr;
        }
        EXPECT_EQ(S_OK, hr);
        return name;
    }

    Referenced object;
};

TEST_F(ObjectRefTest, NameBindsBackToTheSameObject) {
    const CString name = NameOf(&object);
    if (name.IsEmpty() && vaskel_test::RunningOnWine())
        GTEST_SKIP() << "Wine's object-reference monikers give no display name";
    ASSERT_FALSE(name.IsEmpty());

    IUnknown* bound = nullptr;
    ASSERT_EQ(S_OK, COMObjRef::ParseDisplayName(name, IID_IUnknown, &bound));
    ASSERT_NE(nullptr, bound);
    // Identity: the IUnknown of each is the same pointer.
    IUnknown* identity = nullptr;
    ASSERT_EQ(S_OK, bound->QueryInterface(IID_IUnknown, reinterpret_cast<void**>(&identity)));
    EXPECT_EQ(static_cast<IUnknown*>(&object), identity);
    identity->Release();
    bound->Release();
}

TEST_F(ObjectRefTest, BindingToAnInterfaceTheObjectLacksFailsWithoutOutput) {
    const CString name = NameOf(&object);
    if (name.IsEmpty() && vaskel_test::RunningOnWine())
        GTEST_SKIP() << "Wine's object-reference monikers give no display name";
    IUnknown* bound = kUntouched;
    EXPECT_EQ(E_NOINTERFACE, COMObjRef::ParseDisplayName(name, IID_IDispatch, &bound));
    EXPECT_EQ(kUntouched, bound);
}

TEST_F(ObjectRefTest, TextThatIsNoNameGivesThePlatformsParseFailure) {
    // What the platform itself answers for the text.
    IBindCtx* context = nullptr;
    ASSERT_EQ(S_OK, CreateBindCtx(0, &context));
    const OLECHAR wide[] = {'n', 'o', ' ', 'm', 'o', 'n', 'i', 'k', 'e', 'r', 0};
    ULONG eaten = 0;
    IMoniker* moniker = nullptr;
    const HRESULT expected = MkParseDisplayName(context, wide, &eaten, &moniker);
    if (moniker)
        moniker->Release();
    context->Release();
    ASSERT_TRUE(FAILED(expected));

    IUnknown* bound = kUntouched;
    EXPECT_EQ(expected, COMObjRef::ParseDisplayName("no moniker", IID_IUnknown, &bound));
    EXPECT_EQ(kUntouched, bound);
}

TEST_F(ObjectRefTest, NoOutputIsEPointer) {
    EXPECT_EQ(E_POINTER, COMObjRef::ParseDisplayName("no moniker", IID_IUnknown, nullptr));
}

} // namespace

// Bind contexts and object-reference monikers: what a bind context holds, and
// display names that name an object and bind back to it.
#include "support/ole_text.h"
#include "support/persist_object.h"
#include "support/wine.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

namespace {

using vaskel_test::Ole;
using vaskel_test::OleString;
using vaskel_test::PersistObject;

const CLSID clsidObjrefMoniker = {0x00000327, 0x0000, 0x0000, {0xC0, 0, 0, 0, 0, 0, 0, 0x46}};

// Parses a name and binds the moniker to IPersist; the failure of either.
HRESULT ParseAndBind(IBindCtx* context, const OleString& name, IPersist** bound) {
    *bound = nullptr;
    ULONG eaten = 0;
    IMoniker* moniker = nullptr;
    HRESULT hr = MkParseDisplayName(context, name.c_str(), &eaten, &moniker);
    if (FAILED(hr))
        return hr;
    EXPECT_EQ(eaten, name.size());
    hr = moniker->BindToObject(context, nullptr, IID_IPersist, reinterpret_cast<void**>(bound));
    moniker->Release();
    return hr;
}

// Each test binds every display name it makes once, so that no packet is left
// holding an object after the test.
class MonikerTest : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(SUCCEEDED(CoInitialize(nullptr)));
        ASSERT_EQ(CreateBindCtx(0, &context), S_OK);
    }
    void TearDown() override {
        if (context)
            context->Release();
        CoUninitialize();
    }

    // The display name of an objref moniker of object; empty where the
    // platform makes none.
    OleString DisplayName(IUnknown* object) {
        IMoniker* moniker = nullptr;
        EXPECT_EQ(CreateObjrefMoniker(object, &moniker), S_OK);
        if (!moniker)
            return {};
        LPOLESTR name = nullptr;
        HRESULT hr = moniker->GetDisplayName(context, nullptr, &name);
        moniker->Release();
        if (FAILED(hr) || !name)
            return {};
        OleString text(name);
        CoTaskMemFree(name);
        return text;
    }

    IBindCtx* context = nullptr;
};

#define SKIP_WITHOUT_NAME(name)                                                                    \
    if ((name).empty() && vaskel_test::RunningOnWine())                                            \
    GTEST_SKIP() << "Wine gives objref monikers no display name"

TEST_F(MonikerTest, BindContextNeedsReservedZero) {
    IBindCtx* other = context;
    EXPECT_EQ(CreateBindCtx(1, &other), E_INVALIDARG);
    EXPECT_EQ(other, nullptr);
}

TEST_F(MonikerTest, BindContextKeepsOptions) {
    BIND_OPTS options{};
    options.cbStruct = sizeof options;
    ASSERT_EQ(context->GetBindOptions(&options), S_OK);
    EXPECT_EQ(options.grfFlags, 0u);
    EXPECT_EQ(options.grfMode, 2u) << "read-write";
    EXPECT_EQ(options.dwTickCountDeadline, 0u);

    options.grfFlags = BIND_MAYBOTHERUSER;
    options.dwTickCountDeadline = 1234;
    ASSERT_EQ(context->SetBindOptions(&options), S_OK);
    BIND_OPTS read{};
    read.cbStruct = sizeof read;
    ASSERT_EQ(context->GetBindOptions(&read), S_OK);
    EXPECT_EQ(read.grfFlags, static_cast<DWORD>(BIND_MAYBOTHERUSER));
    EXPECT_EQ(read.dwTickCountDeadline, 1234u);
}

TEST_F(MonikerTest, BindContextHoldsBoundAndRegisteredObjects) {
    PersistObject bound;
    PersistObject param;
    ASSERT_EQ(context->RegisterObjectBound(&bound), S_OK);
    EXPECT_EQ(bound.references.load(), 2u);
    ASSERT_EQ(context->ReleaseBoundObjects(), S_OK);
    EXPECT_EQ(bound.references.load(), 1u);

    OleString key = Ole("vaskel.param");
    ASSERT_EQ(context->RegisterObjectParam(&key[0], &param), S_OK);
    IUnknown* found = nullptr;
    ASSERT_EQ(context->GetObjectParam(&key[0], &found), S_OK);
    EXPECT_EQ(found, static_cast<IUnknown*>(&param));
    found->Release();
    OleString missing = Ole("vaskel.missing");
    EXPECT_EQ(context->GetObjectParam(&missing[0], &found), E_FAIL);
    EXPECT_EQ(found, nullptr);
    if (vaskel_test::RunningOnWine()) {
        EXPECT_TRUE(FAILED(context->RevokeObjectParam(&missing[0])))
            << "Wine gives E_FAIL rather than S_FALSE for a key not registered";
    } else {
        EXPECT_EQ(context->RevokeObjectParam(&missing[0]), S_FALSE);
    }
    EXPECT_EQ(param.references.load(), 2u);

    ASSERT_EQ(context->RegisterObjectBound(&bound), S_OK);
    context->Release();
    context = nullptr;
    EXPECT_EQ(bound.references.load(), 1u) << "released with the context";
    EXPECT_EQ(param.references.load(), 1u);
}

TEST_F(MonikerTest, ObjrefMonikerBindsToItsObject) {
    PersistObject object;
    IMoniker* moniker = nullptr;
    ASSERT_EQ(CreateObjrefMoniker(&object, &moniker), S_OK);
    DWORD kind = 0;
    EXPECT_EQ(moniker->IsSystemMoniker(&kind), S_OK);
    EXPECT_EQ(kind, static_cast<DWORD>(MKSYS_OBJREFMONIKER));
    CLSID clsid{};
    EXPECT_EQ(moniker->GetClassID(&clsid), S_OK);
    EXPECT_EQ(clsid, clsidObjrefMoniker);

    IMoniker* same = nullptr;
    ASSERT_EQ(CreateObjrefMoniker(&object, &same), S_OK);
    DWORD first = 0;
    DWORD second = 0;
    EXPECT_EQ(moniker->Hash(&first), S_OK);
    EXPECT_EQ(same->Hash(&second), S_OK);
    EXPECT_EQ(first, second);
    PersistObject other;
    IMoniker* different = nullptr;
    ASSERT_EQ(CreateObjrefMoniker(&other, &different), S_OK);
    HRESULT equal = moniker->IsEqual(same);
    if (equal == E_NOTIMPL && vaskel_test::RunningOnWine()) {
        // Wine does not compare objref monikers.
    } else {
        EXPECT_EQ(equal, S_OK);
        EXPECT_EQ(moniker->IsEqual(different), S_FALSE);
    }

    different->Release();
    same->Release();
    EXPECT_EQ(other.references.load(), 1u);

    IPersist* bound = nullptr;
    HRESULT hr =
        moniker->BindToObject(context, nullptr, IID_IPersist, reinterpret_cast<void**>(&bound));
    if (hr == E_NOTIMPL && vaskel_test::RunningOnWine()) {
        moniker->Release();
        GTEST_SKIP() << "Wine cannot bind objref monikers";
    }
    ASSERT_EQ(hr, S_OK);
    EXPECT_EQ(bound, static_cast<IPersist*>(&object));
    bound->Release();
    moniker->Release();
    EXPECT_EQ(object.references.load(), 1u);
}

TEST_F(MonikerTest, DisplayNameParsesBackAndBindsOnce) {
    PersistObject object;
    OleString name = DisplayName(&object);
    SKIP_WITHOUT_NAME(name);
    ASSERT_GT(name.size(), 8u);
    EXPECT_EQ(name.substr(0, 7), Ole("objref:"));
    EXPECT_EQ(name.back(), u':');

    IPersist* bound = nullptr;
    ASSERT_EQ(ParseAndBind(context, name, &bound), S_OK);
    EXPECT_EQ(bound, static_cast<IPersist*>(&object));
    bound->Release();
    EXPECT_EQ(object.references.load(), 1u);

    EXPECT_TRUE(FAILED(ParseAndBind(context, name, &bound))) << "a name binds once";
    EXPECT_EQ(bound, nullptr);
    EXPECT_EQ(object.references.load(), 1u);
}

TEST_F(MonikerTest, TextThatIsNoNameIsASyntaxError) {
    const char* texts[] = {"::no such name::", "objref"};
    for (const char* text : texts) {
        OleString name = Ole(text);
        ULONG eaten = 99;
        IMoniker* moniker = reinterpret_cast<IMoniker*>(context);
        HRESULT hr = MkParseDisplayName(context, name.c_str(), &eaten, &moniker);
        EXPECT_EQ(moniker, nullptr) << text;
        EXPECT_EQ(eaten, 0u) << text;
        if (vaskel_test::RunningOnWine()) {
            // Wine takes any unknown text for a missing file.
            EXPECT_TRUE(FAILED(hr)) << text << ": Wine gives MK_E_CANTOPENFILE, not MK_E_SYNTAX";
            continue;
        }
        EXPECT_EQ(hr, MK_E_SYNTAX) << text;
    }
}

#ifndef _WIN32
// Windows trusts a name's packet; here a name that was altered, badly encoded
// or followed by more text is refused, and an altered one fails only when
// bound.
TEST_F(MonikerTest, ForgedAndMalformedNamesFailCleanly) {
    PersistObject object;
    OleString name = DisplayName(&object);
    ASSERT_FALSE(name.empty());

    OleString forged = name;
    OLECHAR& c = forged[30];
    c = c == u'A' ? u'B' : u'A';
    IPersist* bound = nullptr;
    EXPECT_EQ(ParseAndBind(context, forged, &bound), RPC_E_INVALID_OBJREF);
    EXPECT_EQ(bound, nullptr);

    const char* malformed[] = {"objref:",     "objref::",     "objref:QUJD",
                               "objref:QUJ:", "objref:QU=D:", "objref:Q===:"};
    for (const char* text : malformed) {
        ULONG eaten = 99;
        IMoniker* moniker = nullptr;
        EXPECT_EQ(MkParseDisplayName(context, Ole(text).c_str(), &eaten, &moniker), MK_E_SYNTAX)
            << text;
        EXPECT_EQ(eaten, 0u) << text;
        EXPECT_EQ(moniker, nullptr) << text;
    }
    ULONG eaten = 0;
    IMoniker* moniker = nullptr;
    OleString followed = name + Ole("!item");
    EXPECT_EQ(MkParseDisplayName(context, followed.c_str(), &eaten, &moniker), MK_E_SYNTAX);
    EXPECT_EQ(eaten, name.size()) << "the name itself was parsed";
    EXPECT_EQ(moniker, nullptr);

    // A short packet decodes but does not bind.
    EXPECT_EQ(ParseAndBind(context, Ole("OBJREF:QUJD:"), &bound), STG_E_READFAULT);

    ASSERT_EQ(ParseAndBind(context, name, &bound), S_OK) << "the real name is untouched";
    bound->Release();
    EXPECT_EQ(object.references.load(), 1u);
}
#endif

} // namespace

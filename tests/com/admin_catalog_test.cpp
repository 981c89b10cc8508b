// The COM+ catalog helpers, against an in-memory catalog registered as the
// catalog's class object: what they store, when they save, and that every
// interface they take is released.
#include "com/catalog_ids.h"
#include "support/counting_unknown.h"
#include "support/wine.h"

#include <vaskel/admin_catalog.h>
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cstring>
#include <map>
#include <string>
#include <vector>

namespace {

using vaskel::CInterfacePtr;
using vaskel::COMPlusAdminCatalog;
using vaskel::CString;
using vaskel_test::CountingUnknown;
using Text = std::basic_string<OLECHAR>;

using namespace vaskel::catalog_ids;

bool Same(const GUID& a, const GUID& b) {
    return std::memcmp(&a, &b, sizeof(GUID)) == 0;
}

Text Wide(const char* ascii) {
    return Text(ascii, ascii + std::strlen(ascii));
}

Text TextOf(BSTR text) {
    return text ? Text(text, SysStringLen(text)) : Text();
}

// What the test catalog holds and how it behaves, shared by every catalog
// instance the class object makes.
struct CatalogState {
    int liveObjects = 0;
    // The saved objects of each collection, one reference each.
    std::map<Text, std::vector<class TestObject*>> saved;
    int saves = 0;
    bool reportOneChangeMore = false;
    bool refusePutValue = false;
    bool nullCollection = false;
    bool keyListWellFormed = false;
    std::vector<Text> installed;
    std::vector<bool> installedNull;
    unsigned lastGeneratedKey = 0;

    void Clear();
};

// IUnknown and IDispatch for the catalog's interfaces; late binding is not
// what the helpers use.
template <class Interface>
class TestDispatch : public Interface {
public:
    TestDispatch(CatalogState& state, const IID& iid) : state(state), iid(iid) {
        ++state.liveObjects;
    }
    virtual ~TestDispatch() { --state.liveObjects; }
    TestDispatch(const TestDispatch&) = delete;
    TestDispatch& operator=(const TestDispatch&) = delete;

    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID riid, void** object) override {
        if (Same(riid, IID_IUnknown) || Same(riid, IID_IDispatch) || Same(riid, iid)) {
            AddRef();
            *object = static_cast<Interface*>(this);
            return S_OK;
        }
        *object = nullptr;
        return E_NOINTERFACE;
    }
    ULONG STDMETHODCALLTYPE AddRef() override { return ++references; }
    ULONG STDMETHODCALLTYPE Release() override {
        const ULONG left = --references;
        if (left == 0)
            delete this;
        return left;
    }
    HRESULT STDMETHODCALLTYPE GetTypeInfoCount(UINT*) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE GetTypeInfo(UINT, LCID, ITypeInfo**) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE GetIDsOfNames(REFIID, LPOLESTR*, UINT, LCID, DISPID*) override {
        return E_NOTIMPL;
    }
    HRESULT STDMETHODCALLTYPE Invoke(DISPID, REFIID, LCID, WORD, DISPPARAMS*, VARIANT*, EXCEPINFO*,
                                     UINT*) override {
        return E_NOTIMPL;
    }

protected:
    CatalogState& state;

private:
    const IID& iid;
    ULONG references = 1;
};

// A catalog object: property values by name, keyed by its "ID" property or,
// without one, by a generated identifier.
class TestObject : public TestDispatch<ICatalogObject> {
public:
    TestObject(CatalogState& state, bool generatedKey) : TestDispatch(state, kObjectInterface) {
        if (generatedKey) {
            GUID guid = {++state.lastGeneratedKey, 0x1234, 0x5678, {1, 2, 3, 4, 5, 6, 7, 8}};
            OLECHAR text[39];
            StringFromGUID2(guid, text, 39);
            key = text;
        }
    }
    ~TestObject() override {
        for (auto& value : values)
            VariantClear(&value.second);
    }

    // The stored value, or null when the property was never set.
    const VARIANT* Value(const char* property) const {
        const auto found = values.find(Wide(property));
        return found == values.end() ? nullptr : &found->second;
    }
    Text Key() const {
        const VARIANT* id = Value("ID");
        return key.empty() && id && id->vt == VT_BSTR ? TextOf(id->bstrVal) : key;
    }

    HRESULT STDMETHODCALLTYPE put_Value(BSTR name, VARIANT value) override {
        if (state.refusePutValue)
            return S_FALSE;
        VARIANT& stored = values[TextOf(name)];
        VariantClear(&stored);
        // A null text stays null, as the catalog keeps it.
        stored = value;
        if (value.vt == VT_BSTR && value.bstrVal)
            stored.bstrVal = SysAllocStringLen(value.bstrVal, SysStringLen(value.bstrVal));
        else if (value.vt == VT_UNKNOWN && value.punkVal)
            value.punkVal->AddRef();
        return S_OK;
    }
    HRESULT STDMETHODCALLTYPE get_Key(VARIANT* result) override {
        const Text text = Key();
        VariantInit(result);
        result->vt = VT_BSTR;
        result->bstrVal = SysAllocStringLen(text.data(), static_cast<UINT>(text.size()));
        return S_OK;
    }
    HRESULT STDMETHODCALLTYPE get_Value(BSTR, VARIANT*) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE get_Name(VARIANT*) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE IsPropertyReadOnly(BSTR, VARIANT_BOOL*) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE get_Valid(VARIANT_BOOL*) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE IsPropertyWriteOnly(BSTR, VARIANT_BOOL*) override {
        return E_NOTIMPL;
    }

private:
    std::map<Text, VARIANT> values;
    Text key;
};

void CatalogState::Clear() {
    for (auto& collection : saved) {
        for (TestObject* object : collection.second)
            object->Release();
    }
    saved.clear();
}

void ReleaseAll(std::vector<TestObject*>& objects) {
    for (TestObject* object : objects)
        object->Release();
    objects.clear();
}

// A collection: new and populated objects, with additions and removals
// pending until saved.
class TestCollection : public TestDispatch<ICatalogCollection> {
public:
    TestCollection(CatalogState& state, Text name)
        : TestDispatch(state, kCollectionInterface), name(std::move(name)) {}
    ~TestCollection() override {
        ReleaseAll(items);
        ReleaseAll(added);
        ReleaseAll(removed);
    }

    HRESULT STDMETHODCALLTYPE get_Count(LONG* count) override {
        *count = static_cast<LONG>(items.size());
        return S_OK;
    }
    HRESULT STDMETHODCALLTYPE Add(IDispatch** object) override {
        auto created = new TestObject(state, name == Wide("TransientSubscriptions"));
        created->AddRef();
        items.push_back(created);
        created->AddRef();
        added.push_back(created);
        *object = created;
        return S_OK;
    }
    HRESULT STDMETHODCALLTYPE Remove(LONG index) override {
        if (index < 0 || static_cast<std::size_t>(index) >= items.size())
            return E_INVALIDARG;
        removed.push_back(items[index]);
        items.erase(items.begin() + index);
        return S_OK;
    }
    // Takes one VT_VARIANT element holding a VT_BSTR key, as the helpers send.
    HRESULT STDMETHODCALLTYPE PopulateByKey(SAFEARRAY* keys) override {
        VARTYPE type = VT_EMPTY;
        LONG lower = 1, upper = 0, index = 0;
        VARIANT key;
        VariantInit(&key);
        state.keyListWellFormed =
            keys && SafeArrayGetDim(keys) == 1 && SUCCEEDED(SafeArrayGetVartype(keys, &type)) &&
            type == VT_VARIANT && SUCCEEDED(SafeArrayGetLBound(keys, 1, &lower)) &&
            SUCCEEDED(SafeArrayGetUBound(keys, 1, &upper)) && lower == 0 && upper == 0 &&
            SUCCEEDED(SafeArrayGetElement(keys, &index, &key)) && key.vt == VT_BSTR;
        if (!state.keyListWellFormed) {
            VariantClear(&key);
            return E_INVALIDARG;
        }
        ReleaseAll(items);
        for (TestObject* object : state.saved[name]) {
            if (object->Key() == TextOf(key.bstrVal)) {
                object->AddRef();
                items.push_back(object);
            }
        }
        VariantClear(&key);
        return S_OK;
    }
    HRESULT STDMETHODCALLTYPE SaveChanges(LONG* changes) override {
        if (!changes)
            return E_POINTER;
        *changes =
            static_cast<LONG>(added.size() + removed.size()) + (state.reportOneChangeMore ? 1 : 0);
        std::vector<TestObject*>& objects = state.saved[name];
        objects.insert(objects.end(), added.begin(), added.end());
        added.clear();
        for (TestObject* gone : removed) {
            for (auto it = objects.begin(); it != objects.end(); ++it) {
                if (*it == gone) {
                    gone->Release();
                    objects.erase(it);
                    break;
                }
            }
        }
        ReleaseAll(removed);
        ++state.saves;
        return S_OK;
    }
    HRESULT STDMETHODCALLTYPE get__NewEnum(IUnknown**) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE get_Item(LONG, IDispatch**) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE Populate() override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE GetCollection(BSTR, VARIANT, IDispatch**) override {
        return E_NOTIMPL;
    }
    HRESULT STDMETHODCALLTYPE get_Name(VARIANT*) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE get_AddEnabled(VARIANT_BOOL*) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE get_RemoveEnabled(VARIANT_BOOL*) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE GetUtilInterface(IDispatch**) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE get_DataStoreMajorVersion(LONG*) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE get_DataStoreMinorVersion(LONG*) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE PopulateByQuery(BSTR, LONG) override { return E_NOTIMPL; }

private:
    Text name;
    std::vector<TestObject*> items;
    std::vector<TestObject*> added;
    std::vector<TestObject*> removed;
};

class TestCatalog : public TestDispatch<ICOMAdminCatalog> {
public:
    explicit TestCatalog(CatalogState& state) : TestDispatch(state, kCatalogInterface) {}

    HRESULT STDMETHODCALLTYPE GetCollection(BSTR name, IDispatch** collection) override {
        *collection = nullptr;
        if (state.nullCollection)
            return S_OK;
        const Text text = TextOf(name);
        if (text != Wide("Applications") && text != Wide("TransientSubscriptions"))
            return E_INVALIDARG;
        *collection = new TestCollection(state, text);
        return S_OK;
    }
    HRESULT STDMETHODCALLTYPE InstallEventClass(BSTR application, BSTR dll, BSTR typeLibrary,
                                                BSTR proxyStub) override {
        for (BSTR text : {application, dll, typeLibrary, proxyStub}) {
            state.installed.push_back(TextOf(text));
            state.installedNull.push_back(text == nullptr);
        }
        return S_OK;
    }
    HRESULT STDMETHODCALLTYPE Connect(BSTR, IDispatch**) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE get_MajorVersion(LONG*) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE get_MinorVersion(LONG*) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE GetCollectionByQuery(BSTR, SAFEARRAY**, IDispatch**) override {
        return E_NOTIMPL;
    }
    HRESULT STDMETHODCALLTYPE ImportComponent(BSTR, BSTR) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE InstallComponent(BSTR, BSTR, BSTR, BSTR) override {
        return E_NOTIMPL;
    }
    HRESULT STDMETHODCALLTYPE ShutdownApplication(BSTR) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE ExportApplication(BSTR, BSTR, LONG) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE InstallApplication(BSTR, BSTR, LONG, BSTR, BSTR, BSTR) override {
        return E_NOTIMPL;
    }
    HRESULT STDMETHODCALLTYPE StopRouter() override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE RefreshRouter() override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE StartRouter() override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE Reserved1() override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE Reserved2() override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE InstallMultipleComponents(BSTR, SAFEARRAY**, SAFEARRAY**) override {
        return E_NOTIMPL;
    }
    HRESULT STDMETHODCALLTYPE GetMultipleComponentsInfo(BSTR, SAFEARRAY**, SAFEARRAY**, SAFEARRAY**,
                                                        SAFEARRAY**, SAFEARRAY**) override {
        return E_NOTIMPL;
    }
    HRESULT STDMETHODCALLTYPE RefreshComponents() override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE BackupREGDB(BSTR) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE RestoreREGDB(BSTR) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE QueryApplicationFile(BSTR, BSTR*, BSTR*, VARIANT_BOOL*, VARIANT_BOOL*,
                                                   SAFEARRAY**) override {
        return E_NOTIMPL;
    }
    HRESULT STDMETHODCALLTYPE StartApplication(BSTR) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE ServiceCheck(LONG, LONG*) override { return E_NOTIMPL; }
    HRESULT STDMETHODCALLTYPE InstallMultipleEventClasses(BSTR, SAFEARRAY**, SAFEARRAY**) override {
        return E_NOTIMPL;
    }
    HRESULT STDMETHODCALLTYPE GetEventClassesForIID(BSTR, SAFEARRAY**, SAFEARRAY**,
                                                    SAFEARRAY**) override {
        return E_NOTIMPL;
    }
};

// The class object; counts its references and never frees itself.
class CatalogFactory : public IClassFactory {
public:
    explicit CatalogFactory(CatalogState& state) : state(state) {}
    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID riid, void** object) override {
        if (Same(riid, IID_IUnknown) || Same(riid, IID_IClassFactory)) {
            AddRef();
            *object = static_cast<IClassFactory*>(this);
            return S_OK;
        }
        *object = nullptr;
        return E_NOINTERFACE;
    }
    ULONG STDMETHODCALLTYPE AddRef() override { return ++references; }
    ULONG STDMETHODCALLTYPE Release() override { return --references; }
    HRESULT STDMETHODCALLTYPE CreateInstance(IUnknown* outer, REFIID riid, void** object) override {
        *object = nullptr;
        if (outer)
            return CLASS_E_NOAGGREGATION;
        auto catalog = new TestCatalog(state);
        const HRESULT hr = catalog->QueryInterface(riid, object);
        catalog->Release();
        return hr;
    }
    HRESULT STDMETHODCALLTYPE LockServer(BOOL) override { return S_OK; }

    ULONG references = 1;

private:
    CatalogState& state;
};

class ComApartment : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(SUCCEEDED(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED)));
    }
    void TearDown() override { CoUninitialize(); }
};

#ifndef _WIN32
TEST(CatalogIdentifiers, ThePlatformLayerDefinesWindowsValues) {
    EXPECT_TRUE(Same(CLSID_COMAdminCatalog, kCatalogClass));
    EXPECT_TRUE(Same(IID_ICOMAdminCatalog, kCatalogInterface));
    EXPECT_TRUE(Same(IID_ICatalogCollection, kCollectionInterface));
    EXPECT_TRUE(Same(IID_ICatalogObject, kObjectInterface));
}
#endif

TEST_F(ComApartment, WithoutACatalogNothingIsCreatedOrChanged) {
    HRESULT hr = S_OK;
    const CInterfacePtr<ICOMAdminCatalog> catalog = COMPlusAdminCatalog::GetAdminCatalog(&hr);
#ifdef _WIN32
    if (catalog)
        GTEST_SKIP() << "this system has a COM+ catalog";
#endif
    EXPECT_FALSE(catalog);
    EXPECT_TRUE(FAILED(hr));
#ifndef _WIN32
    EXPECT_EQ(REGDB_E_CLASSNOTREG, hr);
#endif
    HRESULT collectionHr = S_OK;
    EXPECT_FALSE(COMPlusAdminCatalog::GetCatalogCollection("Applications", &collectionHr));
    EXPECT_EQ(hr, collectionHr);
    EXPECT_EQ(hr, COMPlusAdminCatalog::CreateApplication("{A}", "name", "description"));
    EXPECT_EQ(hr, COMPlusAdminCatalog::RemoveApplication("{A}"));
    EXPECT_EQ(hr, COMPlusAdminCatalog::InstallEventClass("app", "a.dll", "a.tlb", "ps.dll"));
    CountingUnknown subscriber;
    CString id("unchanged");
    EXPECT_EQ(hr, COMPlusAdminCatalog::CreateTransientSubscription(&subscriber, "{E}", id));
    EXPECT_STREQ("unchanged", id);
    EXPECT_EQ(1u, subscriber.references);
    // No result pointer is fine.
    EXPECT_FALSE(COMPlusAdminCatalog::GetAdminCatalog());
}

class AdminCatalogTest : public ComApartment {
protected:
    void SetUp() override {
        ComApartment::SetUp();
        ASSERT_EQ(S_OK, CoRegisterClassObject(kCatalogClass, &factory,
                                              CLSCTX_INPROC_SERVER | CLSCTX_LOCAL_SERVER,
                                              REGCLS_MULTIPLEUSE, &cookie));
    }
    void TearDown() override {
        EXPECT_EQ(S_OK, CoRevokeClassObject(cookie));
        state.Clear();
        EXPECT_EQ(0, state.liveObjects) << "a catalog interface was not released";
        ComApartment::TearDown();
        EXPECT_EQ(1u, factory.references);
    }

    std::vector<TestObject*>& Saved(const char* collection) {
        return state.saved[Wide(collection)];
    }

    CatalogState state;
    CatalogFactory factory{state};
    DWORD cookie = 0;
};

void ExpectText(const char* expected, const VARIANT* value) {
    ASSERT_NE(nullptr, value);
    ASSERT_EQ(VT_BSTR, value->vt);
    ASSERT_NE(nullptr, value->bstrVal);
    EXPECT_TRUE(Wide(expected) == TextOf(value->bstrVal)) << expected;
}

TEST_F(AdminCatalogTest, GivesTheStartedCatalogAndItsCollections) {
    HRESULT hr = E_FAIL;
    CInterfacePtr<ICOMAdminCatalog> catalog = COMPlusAdminCatalog::GetAdminCatalog(&hr);
    ASSERT_TRUE(catalog);
    EXPECT_EQ(S_OK, hr);
    hr = E_FAIL;
    EXPECT_TRUE(COMPlusAdminCatalog::GetCatalogCollection("Applications", catalog.get(), &hr));
    EXPECT_EQ(S_OK, hr);
    // The catalog's own failure for a collection it does not have.
    EXPECT_FALSE(COMPlusAdminCatalog::GetCatalogCollection("Nothing", catalog.get(), &hr));
    EXPECT_EQ(E_INVALIDARG, hr);
    EXPECT_FALSE(COMPlusAdminCatalog::GetCatalogCollection(nullptr, &hr));
    EXPECT_EQ(E_INVALIDARG, hr);
    // Copies share the interface; the last one releases it.
    CInterfacePtr<ICOMAdminCatalog> copy = catalog;
    catalog.Release();
    EXPECT_FALSE(catalog);
    EXPECT_EQ(1, state.liveObjects);
    copy = CInterfacePtr<ICOMAdminCatalog>();
    EXPECT_EQ(0, state.liveObjects);
}

TEST_F(AdminCatalogTest, NullInterfacesAreEPointer) {
    HRESULT hr = S_OK;
    EXPECT_FALSE(COMPlusAdminCatalog::GetCatalogCollection("Applications", nullptr, &hr));
    EXPECT_EQ(E_POINTER, hr);
    hr = S_OK;
    EXPECT_FALSE(COMPlusAdminCatalog::AddCatalogObject(nullptr, &hr));
    EXPECT_EQ(E_POINTER, hr);
    hr = S_OK;
    VARIANT value;
    VariantInit(&value);
    EXPECT_FALSE(COMPlusAdminCatalog::SetCatalogObjectValue(nullptr, "Name", value, &hr));
    EXPECT_EQ(E_POINTER, hr);
    // A catalog that answers S_OK without a collection.
    state.nullCollection = true;
    EXPECT_EQ(E_POINTER, COMPlusAdminCatalog::CreateApplication("{A}", "name", nullptr));
    EXPECT_EQ(E_POINTER, COMPlusAdminCatalog::RemoveApplication("{A}"));
    EXPECT_EQ(0, state.saves);
}

TEST_F(AdminCatalogTest, SetValueIsTrueOnlyForSOk) {
    HRESULT hr = E_FAIL;
    CInterfacePtr<ICatalogCollection> applications =
        COMPlusAdminCatalog::GetCatalogCollection("Applications", &hr);
    ASSERT_TRUE(applications);
    CInterfacePtr<ICatalogObject> object =
        COMPlusAdminCatalog::AddCatalogObject(applications.get(), &hr);
    ASSERT_TRUE(object);
    EXPECT_EQ(S_OK, hr);
    auto* stored = static_cast<TestObject*>(object.get());

    EXPECT_TRUE(COMPlusAdminCatalog::SetCatalogObjectValue(object.get(), "Name",
                                                           vaskel::orvariant_t("text"), &hr));
    EXPECT_EQ(S_OK, hr);
    ExpectText("text", stored->Value("Name"));

    state.refusePutValue = true;
    VARIANT number;
    VariantInit(&number);
    number.vt = VT_I4;
    number.lVal = 7;
    EXPECT_FALSE(COMPlusAdminCatalog::SetCatalogObjectValue(object.get(), "Number", number, &hr));
    EXPECT_EQ(S_FALSE, hr);
    hr = E_FAIL;
    EXPECT_FALSE(COMPlusAdminCatalog::SetCatalogObjectValue(object.get(), "Number",
                                                            vaskel::orvariant_t(7L), &hr));
    EXPECT_EQ(S_FALSE, hr);
    EXPECT_EQ(nullptr, stored->Value("Number"));
    // Without a result pointer the answer is the same.
    EXPECT_FALSE(COMPlusAdminCatalog::SetCatalogObjectValue(object.get(), "Number", number));
}

TEST_F(AdminCatalogTest, CreateApplicationStoresALibraryApplicationAndSavesOnce) {
    EXPECT_EQ(S_OK, COMPlusAdminCatalog::CreateApplication("{11111111-2222-3333-4444-555555555555}",
                                                           "Sample", "A sample application"));
    EXPECT_EQ(1, state.saves);
    ASSERT_EQ(1u, Saved("Applications").size());
    const TestObject* application = Saved("Applications")[0];
    ExpectText("{11111111-2222-3333-4444-555555555555}", application->Value("ID"));
    ExpectText("Sample", application->Value("Name"));
    ExpectText("A sample application", application->Value("Description"));
    const VARIANT* activation = application->Value("Activation");
    ASSERT_NE(nullptr, activation);
    EXPECT_EQ(VT_INT, activation->vt);
    EXPECT_EQ(0, activation->intVal);
}

TEST_F(AdminCatalogTest, CreateApplicationStoresANullDescriptionAsANullString) {
    EXPECT_EQ(S_OK, COMPlusAdminCatalog::CreateApplication("{A}", "Sample", nullptr));
    ASSERT_EQ(1u, Saved("Applications").size());
    const VARIANT* description = Saved("Applications")[0]->Value("Description");
    ASSERT_NE(nullptr, description);
    EXPECT_EQ(VT_BSTR, description->vt);
    EXPECT_EQ(nullptr, description->bstrVal);
    EXPECT_EQ(1, state.saves);
}

TEST_F(AdminCatalogTest, CreateApplicationSavesNothingWhenAValueIsRefused) {
    state.refusePutValue = true;
    EXPECT_EQ(S_FALSE, COMPlusAdminCatalog::CreateApplication("{A}", "Sample", "text"));
    EXPECT_EQ(0, state.saves);
    EXPECT_TRUE(Saved("Applications").empty());
}

TEST_F(AdminCatalogTest, RemoveApplicationFindsByKey) {
    ASSERT_EQ(S_OK, COMPlusAdminCatalog::CreateApplication("{A}", "First", ""));
    ASSERT_EQ(S_OK, COMPlusAdminCatalog::CreateApplication("{B}", "Second", ""));
    ASSERT_EQ(2, state.saves);

    EXPECT_EQ(S_FALSE, COMPlusAdminCatalog::RemoveApplication("{C}"));
    EXPECT_TRUE(state.keyListWellFormed);
    EXPECT_EQ(2, state.saves) << "nothing to remove, nothing saved";
    EXPECT_EQ(2u, Saved("Applications").size());

    EXPECT_EQ(S_OK, COMPlusAdminCatalog::RemoveApplication("{A}"));
    EXPECT_TRUE(state.keyListWellFormed);
    EXPECT_EQ(3, state.saves);
    ASSERT_EQ(1u, Saved("Applications").size());
    ExpectText("Second", Saved("Applications")[0]->Value("Name"));
    // Removed once: the key is gone.
    EXPECT_EQ(S_FALSE, COMPlusAdminCatalog::RemoveApplication("{A}"));
}

TEST_F(AdminCatalogTest, RemovalSavingOtherThanOneChangeIsUnexpected) {
    ASSERT_EQ(S_OK, COMPlusAdminCatalog::CreateApplication("{A}", "First", ""));
    state.reportOneChangeMore = true;
    EXPECT_EQ(E_UNEXPECTED, COMPlusAdminCatalog::RemoveCatalogObject("Applications", "{A}"));
    // A collection the catalog does not have is its own failure.
    EXPECT_EQ(E_INVALIDARG, COMPlusAdminCatalog::RemoveCatalogObject("Nothing", "{A}"));
}

TEST_F(AdminCatalogTest, TransientSubscriptionHoldsTheSubscriberUntilRemoved) {
    CountingUnknown subscriber;
    CString id;
    ASSERT_EQ(S_OK, COMPlusAdminCatalog::CreateTransientSubscription(
                        &subscriber, "{0E9A6C1D-0000-0000-0000-000000000001}", id));
    EXPECT_EQ(1, state.saves);
    ASSERT_EQ(1u, Saved("TransientSubscriptions").size());
    const TestObject* subscription = Saved("TransientSubscriptions")[0];
    EXPECT_FALSE(id.IsEmpty());
    EXPECT_TRUE(Wide(id) == subscription->Key());
    const VARIANT* held = subscription->Value("SubscriberInterface");
    ASSERT_NE(nullptr, held);
    EXPECT_EQ(VT_UNKNOWN, held->vt);
    EXPECT_EQ(static_cast<IUnknown*>(&subscriber), held->punkVal);
    EXPECT_EQ(2u, subscriber.references) << "the property holds its own reference";
    ExpectText("{0E9A6C1D-0000-0000-0000-000000000001}", subscription->Value("EventCLSID"));

    EXPECT_EQ(S_OK, COMPlusAdminCatalog::RemoveTransientSubscription(id));
    EXPECT_TRUE(Saved("TransientSubscriptions").empty());
    EXPECT_EQ(1u, subscriber.references);
}

TEST_F(AdminCatalogTest, TransientSubscriptionSavingTwoChangesIsUnexpected) {
    CountingUnknown subscriber;
    CString id("unchanged");
    state.reportOneChangeMore = true;
    EXPECT_EQ(E_UNEXPECTED,
              COMPlusAdminCatalog::CreateTransientSubscription(&subscriber, "{E}", id));
    EXPECT_STREQ("unchanged", id);
    state.Clear();
    EXPECT_EQ(1u, subscriber.references);
}

TEST_F(AdminCatalogTest, TransientSubscriptionStopsAtARefusedValue) {
    CountingUnknown subscriber;
    CString id("unchanged");
    state.refusePutValue = true;
    EXPECT_EQ(S_FALSE, COMPlusAdminCatalog::CreateTransientSubscription(&subscriber, "{E}", id));
    EXPECT_EQ(0, state.saves);
    EXPECT_STREQ("unchanged", id);
    EXPECT_EQ(1u, subscriber.references);
}

TEST_F(AdminCatalogTest, InstallEventClassPassesItsFourTexts) {
    EXPECT_EQ(S_OK, COMPlusAdminCatalog::InstallEventClass("Sample", "events.dll", nullptr,
                                                           "events_ps.dll"));
    ASSERT_EQ(4u, state.installed.size());
    EXPECT_TRUE(Wide("Sample") == state.installed[0]);
    EXPECT_TRUE(Wide("events.dll") == state.installed[1]);
    EXPECT_TRUE(state.installedNull[2]);
    EXPECT_TRUE(Wide("events_ps.dll") == state.installed[3]);
    EXPECT_FALSE(state.installedNull[3]);
}

} // namespace

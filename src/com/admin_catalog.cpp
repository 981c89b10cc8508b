#include "com/catalog_ids.h"
#include "text/wide_string.h"

#include <vaskel/admin_catalog.h>
#include <vaskel/framework/exceptions.h>
#include <vaskel/framework/ole_safe_array.h>
#include <vaskel/text.h>

namespace vaskel {

namespace {

using namespace catalog_ids;

const char kApplications[] = "Applications";
const char kTransientSubscriptions[] = "TransientSubscriptions";

HRESULT Report(HRESULT* hr, HRESULT result) {
    if (hr)
        *hr = result;
    return result;
}

// The interface asked for on an object the catalog handed back; a null
// object is E_POINTER. Takes over the caller's reference to the object.
template <class Interface, class Source>
CInterfacePtr<Interface> Query(CInterfacePtr<Source> source, const IID& iid, HRESULT* hr) {
    if (!source) {
        Report(hr, E_POINTER);
        return CInterfacePtr<Interface>();
    }
    Interface* result = nullptr;
    HRESULT queried = source->QueryInterface(iid, reinterpret_cast<void**>(&result));
    if (SUCCEEDED(queried) && !result)
        queried = E_POINTER;
    Report(hr, queried);
    return CInterfacePtr<Interface>(SUCCEEDED(queried) ? result : nullptr, false);
}

// A text property value in the system's code page, owned until the call ends.
class TextValue {
public:
    explicit TextValue(const char* text) : m_text(text, CP_ACP) {
        VariantInit(&m_value);
        m_value.vt = VT_BSTR;
        m_value.bstrVal = m_text.get();
    }
    HRESULT Status() const { return m_text.Status(); }
    const VARIANT& get() const { return m_value; }

private:
    WideString m_text;
    VARIANT m_value; // borrows m_text's string
};

// Sets a text property; the first failure of a sequence ends it.
HRESULT SetText(ICatalogObject* object, const char* property, const char* text) {
    const TextValue value(text);
    if (FAILED(value.Status()))
        return value.Status();
    HRESULT hr = S_OK;
    COMPlusAdminCatalog::SetCatalogObjectValue(object, property, value.get(), &hr);
    return hr;
}

// Saves the collection: exactly one change is expected.
HRESULT SaveOneChange(ICatalogCollection* collection) {
    LONG changes = 0;
    const HRESULT hr = collection->SaveChanges(&changes);
    if (FAILED(hr))
        return hr;
    return changes == 1 ? S_OK : E_UNEXPECTED;
}

} // namespace

CInterfacePtr<ICOMAdminCatalog> COMPlusAdminCatalog::GetAdminCatalog(HRESULT* hr) {
    IUnknown* created = nullptr;
    HRESULT result = CoCreateInstance(kCatalogClass, nullptr, CLSCTX_ALL, IID_IUnknown,
                                      reinterpret_cast<void**>(&created));
    CInterfacePtr<IUnknown> unknown(SUCCEEDED(result) ? created : nullptr, false);
    if (FAILED(result)) {
        Report(hr, result);
        return CInterfacePtr<ICOMAdminCatalog>();
    }
    if (!unknown) {
        Report(hr, E_POINTER);
        return CInterfacePtr<ICOMAdminCatalog>();
    }
    result = OleRun(unknown.get());
    if (FAILED(result)) {
        Report(hr, result);
        return CInterfacePtr<ICOMAdminCatalog>();
    }
    return Query<ICOMAdminCatalog>(std::move(unknown), kCatalogInterface, hr);
}

CInterfacePtr<ICatalogCollection>
COMPlusAdminCatalog::GetCatalogCollection(const char* name, ICOMAdminCatalog* catalog,
                                          HRESULT* hr) {
    if (!catalog) {
        Report(hr, E_POINTER);
        return CInterfacePtr<ICatalogCollection>();
    }
    const WideString collectionName(name, CP_THREAD_ACP);
    if (FAILED(Report(hr, collectionName.Status())))
        return CInterfacePtr<ICatalogCollection>();
    IDispatch* collection = nullptr;
    const HRESULT result = catalog->GetCollection(collectionName.get(), &collection);
    if (FAILED(result)) {
        Report(hr, result);
        return CInterfacePtr<ICatalogCollection>();
    }
    return Query<ICatalogCollection>(CInterfacePtr<IDispatch>(collection, false), kCollectionInterface,
                                     hr);
}

CInterfacePtr<ICatalogCollection> COMPlusAdminCatalog::GetCatalogCollection(const char* name,
                                                                            HRESULT* hr) {
    const CInterfacePtr<ICOMAdminCatalog> catalog = GetAdminCatalog(hr);
    if (!catalog)
        return CInterfacePtr<ICatalogCollection>();
    return GetCatalogCollection(name, catalog.get(), hr);
}

CInterfacePtr<ICatalogObject> COMPlusAdminCatalog::AddCatalogObject(ICatalogCollection* collection,
                                                                    HRESULT* hr) {
    if (!collection) {
        Report(hr, E_POINTER);
        return CInterfacePtr<ICatalogObject>();
    }
    IDispatch* object = nullptr;
    const HRESULT result = collection->Add(&object);
    if (FAILED(result)) {
        Report(hr, result);
        return CInterfacePtr<ICatalogObject>();
    }
    return Query<ICatalogObject>(CInterfacePtr<IDispatch>(object, false), kObjectInterface, hr);
}

bool COMPlusAdminCatalog::SetCatalogObjectValue(ICatalogObject* object, const char* property,
                                                const VARIANT& value, HRESULT* hr) {
    if (!object) {
        Report(hr, E_POINTER);
        return false;
    }
    const WideString propertyName(property, CP_THREAD_ACP);
    if (FAILED(Report(hr, propertyName.Status())))
        return false;
    // The catalog copies what it keeps; the value stays the caller's.
    return Report(hr, object->put_Value(propertyName.get(), value)) == S_OK;
}

bool COMPlusAdminCatalog::SetCatalogObjectValue(ICatalogObject* object, const char* property,
                                                const orvariant_t& value, HRESULT* hr) {
    return SetCatalogObjectValue(object, property, static_cast<const VARIANT&>(value), hr);
}

HRESULT COMPlusAdminCatalog::CreateApplication(const char* id, const char* name,
                                               const char* description) {
    HRESULT hr = S_OK;
    const CInterfacePtr<ICatalogCollection> applications = GetCatalogCollection(kApplications, &hr);
    if (!applications)
        return hr;
    const CInterfacePtr<ICatalogObject> application = AddCatalogObject(applications.get(), &hr);
    if (!application)
        return hr;
    const struct {
        const char* property;
        const char* text;
    } texts[] = {{"ID", id}, {"Name", name}, {"Description", description}};
    for (const auto& text : texts) {
        hr = SetText(application.get(), text.property, text.text);
        if (hr != S_OK)
            return hr;
    }
    // Activation 0: the application runs in its caller's process.
    VARIANT activation;
    VariantInit(&activation);
    activation.vt = VT_INT;
    activation.intVal = 0;
    if (!SetCatalogObjectValue(application.get(), "Activation", activation, &hr))
        return hr;
    LONG changes = 0;
    return applications->SaveChanges(&changes);
}

HRESULT COMPlusAdminCatalog::InstallEventClass(const char* application, const char* dll,
                                               const char* typeLibrary, const char* proxyStubDll) {
    HRESULT hr = S_OK;
    const CInterfacePtr<ICOMAdminCatalog> catalog = GetAdminCatalog(&hr);
    if (!catalog)
        return hr;
    const WideString texts[] = {{application, CP_THREAD_ACP},
                                {dll, CP_THREAD_ACP},
                                {typeLibrary, CP_THREAD_ACP},
                                {proxyStubDll, CP_THREAD_ACP}};
    for (const WideString& text : texts) {
        if (FAILED(text.Status()))
            return text.Status();
    }
    return catalog->InstallEventClass(texts[0].get(), texts[1].get(), texts[2].get(),
                                      texts[3].get());
}

HRESULT COMPlusAdminCatalog::CreateTransientSubscription(IUnknown* subscriber,
                                                         const char* eventClassId,
                                                         CString& subscriptionId) {
    HRESULT hr = S_OK;
    const CInterfacePtr<ICatalogCollection> subscriptions =
        GetCatalogCollection(kTransientSubscriptions, &hr);
    if (!subscriptions)
        return hr;
    const CInterfacePtr<ICatalogObject> subscription = AddCatalogObject(subscriptions.get(), &hr);
    if (!subscription)
        return hr;
    // Borrowed: the catalog takes its own reference to what it keeps.
    VARIANT subscriberValue;
    VariantInit(&subscriberValue);
    subscriberValue.vt = VT_UNKNOWN;
    subscriberValue.punkVal = subscriber;
    if (!SetCatalogObjectValue(subscription.get(), "SubscriberInterface", subscriberValue, &hr))
        return hr;
    hr = SetText(subscription.get(), "EventCLSID", eventClassId);
    if (hr != S_OK)
        return hr;
    hr = SaveOneChange(subscriptions.get());
    if (hr != S_OK)
        return hr;
    VARIANT key;
    VariantInit(&key);
    if (SUCCEEDED(subscription->get_Key(&key))) {
        // The subscription exists now: a key that cannot be copied only
        // leaves the identifier unchanged.
        try {
            subscriptionId = AsString(key);
        } catch (...) {
        }
    }
    VariantClear(&key);
    return S_OK;
}

HRESULT COMPlusAdminCatalog::RemoveCatalogObject(const char* collection, const char* key) {
    HRESULT hr = S_OK;
    const CInterfacePtr<ICatalogCollection> objects = GetCatalogCollection(collection, &hr);
    if (!objects)
        return hr;
    const TextValue keyValue(key);
    if (FAILED(keyValue.Status()))
        return keyValue.Status();
    try {
        COleSafeArray keys;
        keys.CreateOneDim(VT_VARIANT, 1);
        long index = 0;
        keys.PutElement(&index, const_cast<VARIANT*>(&keyValue.get()));
        hr = objects->PopulateByKey(keys.parray);
    } catch (const COleException& error) {
        return error.m_sc;
    } catch (const CMemoryException&) {
        return E_OUTOFMEMORY;
    }
    if (FAILED(hr))
        return hr;
    LONG count = 0;
    hr = objects->get_Count(&count);
    if (FAILED(hr))
        return hr;
    if (count != 1)
        return S_FALSE;
    hr = objects->Remove(0);
    if (FAILED(hr))
        return hr;
    return SaveOneChange(objects.get());
}

HRESULT COMPlusAdminCatalog::RemoveApplication(const char* key) {
    return RemoveCatalogObject(kApplications, key);
}

HRESULT COMPlusAdminCatalog::RemoveTransientSubscription(const char* key) {
    return RemoveCatalogObject(kTransientSubscriptions, key);
}

} // namespace vaskel

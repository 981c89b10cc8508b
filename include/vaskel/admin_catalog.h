// Helpers over the COM+ administration catalog: create a library
// application, install an event class, create a transient subscription for
// a live subscriber, and remove applications or transient subscriptions by
// key. Each hides the catalog's collection protocol (get a collection, add or
// find an object, set its properties, save) behind one call and reports the
// outcome as an HRESULT; nothing is thrown. Changes are saved only at the end,
// so a failure before the save leaves the catalog as it was.
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/string.h>
#include <vaskel/interface_ptr.h>
#include <vaskel/value.h>
#include <vaskel/win32.h>

namespace vaskel {

// Catalog texts passed in are 8-bit: collection and property names and the
// texts of InstallEventClass in the calling thread's ANSI code page, text
// values and keys in the system's; a null text is a null string. The
// functions that return a pointer give null on failure and report the HRESULT
// through hr when it is not null. A null interface from the catalog where one
// is needed is E_POINTER.
class VASKEL_API COMPlusAdminCatalog {
public:
    // The catalog, created in any server context and started.
    static CInterfacePtr<ICOMAdminCatalog> GetAdminCatalog(HRESULT* hr = nullptr);
    // A named top-level collection of the catalog given, or of a catalog
    // obtained for the call.
    static CInterfacePtr<ICatalogCollection>
    GetCatalogCollection(const char* name, ICOMAdminCatalog* catalog, HRESULT* hr = nullptr);
    static CInterfacePtr<ICatalogCollection> GetCatalogCollection(const char* name,
                                                                  HRESULT* hr = nullptr);
    // A new object in the collection (pending until the collection is saved).
    static CInterfacePtr<ICatalogObject> AddCatalogObject(ICatalogCollection* collection,
                                                          HRESULT* hr = nullptr);
    // Sets a property; true only when the catalog answers S_OK exactly.
    static bool SetCatalogObjectValue(ICatalogObject* object, const char* property,
                                      const VARIANT& value, HRESULT* hr = nullptr);
    static bool SetCatalogObjectValue(ICatalogObject* object, const char* property,
                                      const orvariant_t& value, HRESULT* hr = nullptr);

    // A library application (runs in its caller's process) with the given
    // identifier, name and description.
    static HRESULT CreateApplication(const char* id, const char* name, const char* description);
    // Installs an event class from its component, type library and
    // proxy/stub files into an application (identifier or name).
    static HRESULT InstallEventClass(const char* application, const char* dll,
                                     const char* typeLibrary, const char* proxyStubDll);
    // Subscribes the live object to the event class (its CLSID as text);
    // subscriptionId receives the new subscription's key when it can be read.
    // A save that reports other than one change is E_UNEXPECTED.
    static HRESULT CreateTransientSubscription(IUnknown* subscriber, const char* eventClassId,
                                               CString& subscriptionId);
    // Removes the one object of the collection with the key: S_FALSE when
    // there is none, E_UNEXPECTED when the save reports other than one change.
    static HRESULT RemoveCatalogObject(const char* collection, const char* key);
    static HRESULT RemoveApplication(const char* key);
    static HRESULT RemoveTransientSubscription(const char* key);
};

} // namespace vaskel

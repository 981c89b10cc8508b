// The COM+ administration catalog's interfaces, laid out as on Windows. This
// platform has no catalog: creating CLSID_COMAdminCatalog fails with
// REGDB_E_CLASSNOTREG unless the process registers a class object for it.
#pragma once

#include "oaidl.h"
#include "types.h"
#include "unknwn.h"

// The catalog: named top-level collections and the installation services.
struct ICOMAdminCatalog : IDispatch {
    virtual HRESULT STDMETHODCALLTYPE GetCollection(BSTR bstrCollName,
                                                    IDispatch** ppCatalogCollection) = 0;
    virtual HRESULT STDMETHODCALLTYPE Connect(BSTR bstrCatalogServerName,
                                              IDispatch** ppCatalogCollection) = 0;
    virtual HRESULT STDMETHODCALLTYPE get_MajorVersion(LONG* plMajorVersion) = 0;
    virtual HRESULT STDMETHODCALLTYPE get_MinorVersion(LONG* plMinorVersion) = 0;
    virtual HRESULT STDMETHODCALLTYPE GetCollectionByQuery(BSTR bstrCollName,
                                                           SAFEARRAY** ppsaVarQuery,
                                                           IDispatch** ppCatalogCollection) = 0;
    virtual HRESULT STDMETHODCALLTYPE ImportComponent(BSTR bstrApplIDOrName,
                                                      BSTR bstrCLSIDOrProgID) = 0;
    virtual HRESULT STDMETHODCALLTYPE InstallComponent(BSTR bstrApplIDOrName, BSTR bstrDLL,
                                                       BSTR bstrTLB, BSTR bstrPSDLL) = 0;
    virtual HRESULT STDMETHODCALLTYPE ShutdownApplication(BSTR bstrApplIDOrName) = 0;
    virtual HRESULT STDMETHODCALLTYPE ExportApplication(BSTR bstrApplIDOrName,
                                                        BSTR bstrApplicationFile,
                                                        LONG lOptions) = 0;
    virtual HRESULT STDMETHODCALLTYPE InstallApplication(BSTR bstrApplicationFile,
                                                         BSTR bstrDestinationDirectory,
                                                         LONG lOptions, BSTR bstrUserId,
                                                         BSTR bstrPassword, BSTR bstrRSN) = 0;
    virtual HRESULT STDMETHODCALLTYPE StopRouter() = 0;
    virtual HRESULT STDMETHODCALLTYPE RefreshRouter() = 0;
    virtual HRESULT STDMETHODCALLTYPE StartRouter() = 0;
    virtual HRESULT STDMETHODCALLTYPE Reserved1() = 0;
    virtual HRESULT STDMETHODCALLTYPE Reserved2() = 0;
    virtual HRESULT STDMETHODCALLTYPE InstallMultipleComponents(BSTR bstrApplIDOrName,
                                                                SAFEARRAY** ppsaVarFileNames,
                                                                SAFEARRAY** ppsaVarCLSIDs) = 0;
    virtual HRESULT STDMETHODCALLTYPE
    GetMultipleComponentsInfo(BSTR bstrApplIdOrName, SAFEARRAY** ppsaVarFileNames,
                              SAFEARRAY** ppsaVarCLSIDs, SAFEARRAY** ppsaVarClassNames,
                              SAFEARRAY** ppsaVarFileFlags, SAFEARRAY** ppsaVarComponentFlags) = 0;
    virtual HRESULT STDMETHODCALLTYPE RefreshComponents() = 0;
    virtual HRESULT STDMETHODCALLTYPE BackupREGDB(BSTR bstrBackupFilePath) = 0;
    virtual HRESULT STDMETHODCALLTYPE RestoreREGDB(BSTR bstrBackupFilePath) = 0;
    virtual HRESULT STDMETHODCALLTYPE QueryApplicationFile(
        BSTR bstrApplicationFile, BSTR* pbstrApplicationName, BSTR* pbstrApplicationDescription,
        VARIANT_BOOL* pbHasUsers, VARIANT_BOOL* pbIsProxy, SAFEARRAY** ppsaVarFileNames) = 0;
    virtual HRESULT STDMETHODCALLTYPE StartApplication(BSTR bstrApplIdOrName) = 0;
    virtual HRESULT STDMETHODCALLTYPE ServiceCheck(LONG lService, LONG* plStatus) = 0;
    virtual HRESULT STDMETHODCALLTYPE InstallMultipleEventClasses(BSTR bstrApplIdOrName,
                                                                  SAFEARRAY** ppsaVarFileNames,
                                                                  SAFEARRAY** ppsaVarCLSIDS) = 0;
    virtual HRESULT STDMETHODCALLTYPE InstallEventClass(BSTR bstrApplIdOrName, BSTR bstrDLL,
                                                        BSTR bstrTLB, BSTR bstrPSDLL) = 0;
    virtual HRESULT STDMETHODCALLTYPE GetEventClassesForIID(BSTR bstrIID, SAFEARRAY** ppsaVarCLSIDs,
                                                            SAFEARRAY** ppsaVarProgIDs,
                                                            SAFEARRAY** ppsaVarDescriptions) = 0;
};

// One object of a collection: named property values and its key.
struct ICatalogObject : IDispatch {
    virtual HRESULT STDMETHODCALLTYPE get_Value(BSTR bstrPropName, VARIANT* pvarRetVal) = 0;
    virtual HRESULT STDMETHODCALLTYPE put_Value(BSTR bstrPropName, VARIANT val) = 0;
    virtual HRESULT STDMETHODCALLTYPE get_Key(VARIANT* pvarRetVal) = 0;
    virtual HRESULT STDMETHODCALLTYPE get_Name(VARIANT* pvarRetVal) = 0;
    virtual HRESULT STDMETHODCALLTYPE IsPropertyReadOnly(BSTR bstrPropName,
                                                         VARIANT_BOOL* pbRetVal) = 0;
    virtual HRESULT STDMETHODCALLTYPE get_Valid(VARIANT_BOOL* pbRetVal) = 0;
    virtual HRESULT STDMETHODCALLTYPE IsPropertyWriteOnly(BSTR bstrPropName,
                                                          VARIANT_BOOL* pbRetVal) = 0;
};

// A collection of catalog objects. Changes (Add, Remove, property values) are
// pending until SaveChanges, which reports how many it saved.
struct ICatalogCollection : IDispatch {
    virtual HRESULT STDMETHODCALLTYPE get__NewEnum(IUnknown** ppEnumVariant) = 0;
    virtual HRESULT STDMETHODCALLTYPE get_Item(LONG lIndex, IDispatch** ppCatalogObject) = 0;
    virtual HRESULT STDMETHODCALLTYPE get_Count(LONG* plObjectCount) = 0;
    virtual HRESULT STDMETHODCALLTYPE Remove(LONG lIndex) = 0;
    virtual HRESULT STDMETHODCALLTYPE Add(IDispatch** ppCatalogObject) = 0;
    virtual HRESULT STDMETHODCALLTYPE Populate() = 0;
    virtual HRESULT STDMETHODCALLTYPE SaveChanges(LONG* pcChanges) = 0;
    virtual HRESULT STDMETHODCALLTYPE GetCollection(BSTR bstrCollName, VARIANT varObjectKey,
                                                    IDispatch** ppCatalogCollection) = 0;
    virtual HRESULT STDMETHODCALLTYPE get_Name(VARIANT* pVarNamel) = 0;
    virtual HRESULT STDMETHODCALLTYPE get_AddEnabled(VARIANT_BOOL* pVarBool) = 0;
    virtual HRESULT STDMETHODCALLTYPE get_RemoveEnabled(VARIANT_BOOL* pVarBool) = 0;
    virtual HRESULT STDMETHODCALLTYPE GetUtilInterface(IDispatch** ppIDispatch) = 0;
    virtual HRESULT STDMETHODCALLTYPE get_DataStoreMajorVersion(LONG* plMajorVersion) = 0;
    virtual HRESULT STDMETHODCALLTYPE get_DataStoreMinorVersion(LONG* plMinorVersionl) = 0;
    virtual HRESULT STDMETHODCALLTYPE PopulateByKey(SAFEARRAY* psaKeys) = 0;
    virtual HRESULT STDMETHODCALLTYPE PopulateByQuery(BSTR bstrQueryString, LONG lQueryType) = 0;
};

extern "C" const CLSID CLSID_COMAdminCatalog;
extern "C" const IID IID_ICOMAdminCatalog;
extern "C" const IID IID_ICatalogCollection;
extern "C" const IID IID_ICatalogObject;

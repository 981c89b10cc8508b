// CCmdTarget: the framework's base for objects that answer automation, with
// run-time class information (CRuntimeClass) and the connection helpers
// AfxConnectionAdvise and AfxConnectionUnadvise.
//
// Reference counting: a command target's COM reference count starts at 1,
// the creator's reference. When ExternalRelease (or Release through its
// IDispatch) takes it to 0, OnFinalRelease runs, which by default deletes
// the object. Objects that are never made COM-visible may also be deleted
// directly by their creator.
//
// Automation: after EnableAutomation the object answers IDispatch, whose
// IUnknown is the same pointer. Names and calls go to the protected hooks
// OnGetIDsOfNames and OnInvoke, which derived classes override; a derived
// class may also name a table of members through GetDispatchNames.
#pragma once

#include <vaskel/export.h>
#include <vaskel/win32.h>

namespace vaskel {

class CCmdTarget;

// The run-time description of a class. Classes declared with
// DECLARE_DYNAMIC (or DECLARE_DYNCREATE) and defined with the matching
// IMPLEMENT_ macro are registered during static initialisation, so FromName
// finds them by name; a module that is unloaded takes its classes with it.
struct VASKEL_API CRuntimeClass {
    const char* m_lpszClassName;
    int m_nObjectSize;
    // The base class's description; null for the root.
    CRuntimeClass* (*m_pfnGetBaseClass)();
    // Makes a new object with new; null for a class that is not creatable.
    CCmdTarget* (*m_pfnCreateObject)();
    CRuntimeClass* m_pNextClass;

    CRuntimeClass* GetBaseClass() const {
        return m_pfnGetBaseClass ? m_pfnGetBaseClass() : nullptr;
    }
    // A new object of the class; null when the class is not creatable or
    // the object cannot be made.
    CCmdTarget* CreateObject() const;
    // Whether the class is base or derives from it.
    BOOL IsDerivedFrom(const CRuntimeClass* base) const;
    // The registered class of that name (compared exactly), else null.
    static CRuntimeClass* FromName(const char* className);
};

// Puts a class into the registry for the life of its module.
class VASKEL_API CRuntimeClassRegistration {
public:
    explicit CRuntimeClassRegistration(CRuntimeClass* runtimeClass);
    ~CRuntimeClassRegistration();
    CRuntimeClassRegistration(const CRuntimeClassRegistration&) = delete;
    CRuntimeClassRegistration& operator=(const CRuntimeClassRegistration&) = delete;

private:
    CRuntimeClass* m_class;
};

class VASKEL_API CCmdTarget {
public:
    CCmdTarget();
    virtual ~CCmdTarget();
    CCmdTarget(const CCmdTarget&) = delete;
    CCmdTarget& operator=(const CCmdTarget&) = delete;

    static CRuntimeClass classCCmdTarget;
    static CRuntimeClass* GetThisClass();
    virtual CRuntimeClass* GetRuntimeClass() const;
    BOOL IsKindOf(const CRuntimeClass* runtimeClass) const;

    // Runs when the last COM reference goes; deletes the object.
    virtual void OnFinalRelease();

    // From now on the object answers IDispatch.
    void EnableAutomation();
    BOOL IsAutomationEnabled() const { return m_automation; }
    // The object's IDispatch, with a reference added when addRef is TRUE;
    // null before EnableAutomation.
    LPDISPATCH GetIDispatch(BOOL addRef);

    // The COM reference count and identity, as IUnknown gives them.
    DWORD ExternalAddRef();
    DWORD ExternalRelease();
    // IUnknown and IDispatch (and the dispatch interface named by
    // SetDispatchIID) once automation is enabled; else E_NOINTERFACE with a
    // null result.
    HRESULT ExternalQueryInterface(REFIID iid, void** object);

protected:
    // Member names are ASCII, so that one table serves both platforms'
    // kinds of wide characters.
    struct DispatchName {
        const char* name;
        DISPID id;
    };
    // The members that the default OnGetIDsOfNames knows: count entries.
    virtual const DispatchName* GetDispatchNames(UINT* count) const;
    // One member name to its DISPID; DISP_E_UNKNOWNNAME when unknown. The
    // default looks the name up in GetDispatchNames without regard to the
    // case of ASCII letters, as automation names compare.
    virtual HRESULT OnGetIDsOfNames(LPOLESTR name, DISPID* id);
    // A call through IDispatch::Invoke. result may be null. The default is
    // DISP_E_MEMBERNOTFOUND.
    virtual HRESULT OnInvoke(DISPID id, WORD flags, DISPPARAMS* params, VARIANT* result);
    // An interface identifier that the object's IDispatch also answers to,
    // such as the dispinterface of the events that an event sink receives.
    void SetDispatchIID(REFIID iid);

private:
    class XDispatch : public IDispatch {
    public:
        explicit XDispatch(CCmdTarget* owner) : m_owner(owner) {}
        HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** object) override;
        ULONG STDMETHODCALLTYPE AddRef() override;
        ULONG STDMETHODCALLTYPE Release() override;
        HRESULT STDMETHODCALLTYPE GetTypeInfoCount(UINT* count) override;
        HRESULT STDMETHODCALLTYPE GetTypeInfo(UINT index, LCID lcid, ITypeInfo** info) override;
        HRESULT STDMETHODCALLTYPE GetIDsOfNames(REFIID iid, LPOLESTR* names, UINT count, LCID lcid,
                                                DISPID* ids) override;
        HRESULT STDMETHODCALLTYPE Invoke(DISPID id, REFIID iid, LCID lcid, WORD flags,
                                         DISPPARAMS* params, VARIANT* result, EXCEPINFO* exception,
                                         UINT* argumentError) override;

    private:
        CCmdTarget* m_owner;
    };

    XDispatch m_xDispatch;
    LONG m_dwRef = 1;
    bool m_automation = false;
    bool m_hasDispatchIID = false;
    IID m_dispatchIID = {};
};

// Connects sink to the source's connection point for iid: the source's
// IConnectionPointContainer finds the point and the point advises the sink.
// With refCount FALSE the reference that the connection took on the sink is
// given back, so that the connection alone does not keep the sink alive.
// TRUE on success with *cookie set, else FALSE.
VASKEL_API BOOL AfxConnectionAdvise(LPUNKNOWN source, REFIID iid, LPUNKNOWN sink, BOOL refCount,
                                    DWORD* cookie);
// Ends the connection of that cookie. With refCount FALSE the sink gets a
// reference first, which the unadvise releases. TRUE on success.
VASKEL_API BOOL AfxConnectionUnadvise(LPUNKNOWN source, REFIID iid, LPUNKNOWN sink, BOOL refCount,
                                      DWORD cookie);

} // namespace vaskel

#define RUNTIME_CLASS(class_name) (class_name::GetThisClass())

#define DECLARE_DYNAMIC(class_name)                                                                \
public:                                                                                            \
    static ::vaskel::CRuntimeClass class##class_name;                                              \
    static ::vaskel::CRuntimeClass* GetThisClass();                                                \
    ::vaskel::CRuntimeClass* GetRuntimeClass() const override;

#define DECLARE_DYNCREATE(class_name)                                                              \
    DECLARE_DYNAMIC(class_name)                                                                    \
    static ::vaskel::CCmdTarget* CreateObject();

#define VASKEL_IMPLEMENT_RUNTIMECLASS(class_name, base_class_name, create)                         \
    ::vaskel::CRuntimeClass class_name::class##class_name = {                                      \
        #class_name, static_cast<int>(sizeof(class_name)), &base_class_name::GetThisClass, create, \
        nullptr};                                                                                  \
    ::vaskel::CRuntimeClass* class_name::GetThisClass() {                                          \
        return &class_name::class##class_name;                                                     \
    }                                                                                              \
    ::vaskel::CRuntimeClass* class_name::GetRuntimeClass() const {                                 \
        return &class_name::class##class_name;                                                     \
    }                                                                                              \
    static const ::vaskel::CRuntimeClassRegistration vaskelRegistration##class_name(               \
        &class_name::class##class_name);

#define IMPLEMENT_DYNAMIC(class_name, base_class_name)                                             \
    VASKEL_IMPLEMENT_RUNTIMECLASS(class_name, base_class_name, nullptr)

#define IMPLEMENT_DYNCREATE(class_name, base_class_name)                                           \
    ::vaskel::CCmdTarget* class_name::CreateObject() {                                             \
        return new class_name;                                                                     \
    }                                                                                              \
    VASKEL_IMPLEMENT_RUNTIMECLASS(class_name, base_class_name, &class_name::CreateObject)

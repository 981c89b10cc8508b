#include <vaskel/framework/cmd_target.h>

#include <vaskel/framework/exceptions.h>

#include <cstring>
#include <mutex>
#include <new>

namespace vaskel {
namespace {

// Registration runs during static initialisation of every module, so the
// list and its lock are made on first use.
std::mutex& RegistryLock() {
    static std::mutex lock;
    return lock;
}

CRuntimeClass*& FirstClass() {
    static CRuntimeClass* first = nullptr;
    return first;
}

unsigned FoldAscii(unsigned c) {
    return c >= 'a' && c <= 'z' ? c - ('a' - 'A') : c;
}

bool SameName(const char* ascii, const OLECHAR* name) {
    for (; *ascii && *name; ++ascii, ++name) {
        if (FoldAscii(static_cast<unsigned char>(*ascii)) !=
            FoldAscii(static_cast<unsigned>(*name)))
            return false;
    }
    return *ascii == 0 && *name == 0;
}

} // namespace

CCmdTarget* CRuntimeClass::CreateObject() const {
    if (!m_pfnCreateObject)
        return nullptr;
    try {
        return m_pfnCreateObject();
    } catch (const std::bad_alloc&) {
        return nullptr;
    } catch (const CException&) {
        return nullptr;
    }
}

BOOL CRuntimeClass::IsDerivedFrom(const CRuntimeClass* base) const {
    for (const CRuntimeClass* c = this; c; c = c->GetBaseClass()) {
        if (c == base)
            return TRUE;
    }
    return FALSE;
}

CRuntimeClass* CRuntimeClass::FromName(const char* className) {
    if (!className)
        return nullptr;
    std::lock_guard<std::mutex> hold(RegistryLock());
    for (CRuntimeClass* c = FirstClass(); c; c = c->m_pNextClass) {
        if (std::strcmp(c->m_lpszClassName, className) == 0)
            return c;
    }
    return nullptr;
}

CRuntimeClassRegistration::CRuntimeClassRegistration(CRuntimeClass* runtimeClass)
    : m_class(runtimeClass) {
    std::lock_guard<std::mutex> hold(RegistryLock());
    m_class->m_pNextClass = FirstClass();
    FirstClass() = m_class;
}

CRuntimeClassRegistration::~CRuntimeClassRegistration() {
    std::lock_guard<std::mutex> hold(RegistryLock());
    for (CRuntimeClass** link = &FirstClass(); *link; link = &(*link)->m_pNextClass) {
        if (*link == m_class) {
            *link = m_class->m_pNextClass;
            break;
        }
    }
}

CRuntimeClass CCmdTarget::classCCmdTarget = {"CCmdTarget", static_cast<int>(sizeof(CCmdTarget)),
                                             nullptr, nullptr, nullptr};
static const CRuntimeClassRegistration cmdTargetRegistration(&CCmdTarget::classCCmdTarget);

CRuntimeClass* CCmdTarget::GetThisClass() {
    return &classCCmdTarget;
}

CRuntimeClass* CCmdTarget::GetRuntimeClass() const {
    return &classCCmdTarget;
}

CCmdTarget::CCmdTarget() : m_xDispatch(this) {}

CCmdTarget::~CCmdTarget() = default;

BOOL CCmdTarget::IsKindOf(const CRuntimeClass* runtimeClass) const {
    return GetRuntimeClass()->IsDerivedFrom(runtimeClass);
}

void CCmdTarget::OnFinalRelease() {
    delete this;
}

void CCmdTarget::EnableAutomation() {
    m_automation = true;
}

LPDISPATCH CCmdTarget::GetIDispatch(BOOL addRef) {
    if (!m_automation)
        return nullptr;
    if (addRef)
        ExternalAddRef();
    return &m_xDispatch;
}

DWORD CCmdTarget::ExternalAddRef() {
    return static_cast<DWORD>(InterlockedIncrement(&m_dwRef));
}

DWORD CCmdTarget::ExternalRelease() {
    const LONG count = InterlockedDecrement(&m_dwRef);
    if (count == 0) {
        OnFinalRelease();
        return 0;
    }
    return static_cast<DWORD>(count);
}

HRESULT CCmdTarget::ExternalQueryInterface(REFIID iid, void** object) {
    if (!object)
        return E_POINTER;
    if (m_automation && (iid == IID_IUnknown || iid == IID_IDispatch ||
                         (m_hasDispatchIID && iid == m_dispatchIID))) {
        ExternalAddRef();
        *object = static_cast<IDispatch*>(&m_xDispatch);
        return S_OK;
    }
    *object = nullptr;
    return E_NOINTERFACE;
}

void CCmdTarget::SetDispatchIID(REFIID iid) {
    m_dispatchIID = iid;
    m_hasDispatchIID = true;
}

const CCmdTarget::DispatchName* CCmdTarget::GetDispatchNames(UINT* count) const {
    *count = 0;
    return nullptr;
}

HRESULT CCmdTarget::OnGetIDsOfNames(LPOLESTR name, DISPID* id) {
    UINT count = 0;
    const DispatchName* names = GetDispatchNames(&count);
    for (UINT i = 0; i < count; ++i) {
        if (SameName(names[i].name, name)) {
            *id = names[i].id;
            return S_OK;
        }
    }
    *id = DISPID_UNKNOWN;
    return DISP_E_UNKNOWNNAME;
}

HRESULT CCmdTarget::OnInvoke(DISPID, WORD, DISPPARAMS*, VARIANT*) {
    return DISP_E_MEMBERNOTFOUND;
}

HRESULT STDMETHODCALLTYPE CCmdTarget::XDispatch::QueryInterface(REFIID iid, void** object) {
    return m_owner->ExternalQueryInterface(iid, object);
}

ULONG STDMETHODCALLTYPE CCmdTarget::XDispatch::AddRef() {
    return m_owner->ExternalAddRef();
}

ULONG STDMETHODCALLTYPE CCmdTarget::XDispatch::Release() {
    return m_owner->ExternalRelease();
}

HRESULT STDMETHODCALLTYPE CCmdTarget::XDispatch::GetTypeInfoCount(UINT* count) {
    if (!count)
        return E_INVALIDARG;
    *count = 0;
    return S_OK;
}

// With no type information, every index is out of range.
HRESULT STDMETHODCALLTYPE CCmdTarget::XDispatch::GetTypeInfo(UINT, LCID, ITypeInfo** info) {
    if (!info)
        return E_INVALIDARG;
    *info = nullptr;
    return TYPE_E_ELEMENTNOTFOUND;
}

HRESULT STDMETHODCALLTYPE CCmdTarget::XDispatch::GetIDsOfNames(REFIID iid, LPOLESTR* names,
                                                               UINT count, LCID, DISPID* ids) {
    if (iid != IID_NULL)
        return DISP_E_UNKNOWNINTERFACE;
    if (!names || !ids)
        return E_INVALIDARG;
    if (count == 0)
        return S_OK;
    if (!names[0]) {
        for (UINT i = 0; i < count; ++i)
            ids[i] = DISPID_UNKNOWN;
        return DISP_E_UNKNOWNNAME;
    }
    HRESULT hr;
    try {
        hr = m_owner->OnGetIDsOfNames(names[0], &ids[0]);
    } catch (const std::bad_alloc&) {
        hr = E_OUTOFMEMORY;
    }
    if (FAILED(hr))
        ids[0] = DISPID_UNKNOWN;
    // Named arguments are not supported: their names are all unknown.
    for (UINT i = 1; i < count; ++i)
        ids[i] = DISPID_UNKNOWN;
    if (SUCCEEDED(hr) && count > 1)
        hr = DISP_E_UNKNOWNNAME;
    return hr;
}

HRESULT STDMETHODCALLTYPE CCmdTarget::XDispatch::Invoke(DISPID id, REFIID iid, LCID, WORD flags,
                                                        DISPPARAMS* params, VARIANT* result,
                                                        EXCEPINFO* exception, UINT*) {
    if (iid != IID_NULL)
        return DISP_E_UNKNOWNINTERFACE;
    if (!params)
        return E_INVALIDARG;
    // Exceptions do not cross the interface: an OLE exception becomes a
    // dispatch exception with its code, anything else a plain failure.
    try {
        return m_owner->OnInvoke(id, flags, params, result);
    } catch (const COleException& e) {
        if (exception) {
            std::memset(exception, 0, sizeof(*exception));
            exception->scode = e.m_sc;
        }
        return DISP_E_EXCEPTION;
    } catch (const std::bad_alloc&) {
        return E_OUTOFMEMORY;
    } catch (const CException&) {
        return E_FAIL;
    }
}

} // namespace vaskel

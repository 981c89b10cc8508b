// A bind context: the objects bound during an operation, held until
// ReleaseBoundObjects or the context's release; objects registered under a
// text key; and the bind options (BIND_OPTS only, starting as no flags,
// read-write mode and no deadline). There is no running object table and no
// enumeration of the keys (E_NOTIMPL).
#include "ref_counted.h"

#include <vkwin32/objbase.h>

#include <algorithm>
#include <map>
#include <mutex>
#include <new>
#include <string>
#include <vector>

namespace {

const DWORD readWriteMode = 2; // STGM_READWRITE

class BindContext final : public vkw32::RefCounted<IBindCtx> {
public:
    BindContext() {
        options_.cbStruct = sizeof(BIND_OPTS);
        options_.grfFlags = 0;
        options_.grfMode = readWriteMode;
        options_.dwTickCountDeadline = 0;
    }

    ~BindContext() {
        for (IUnknown* object : bound_)
            object->Release();
        for (auto& param : params_)
            param.second->Release();
    }

    BindContext(const BindContext&) = delete;
    BindContext& operator=(const BindContext&) = delete;

    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID riid, void** object) override {
        if (!object)
            return E_POINTER;
        if (riid == IID_IUnknown || riid == IID_IBindCtx) {
            *object = static_cast<IBindCtx*>(this);
            AddRef();
            return S_OK;
        }
        *object = nullptr;
        return E_NOINTERFACE;
    }

    HRESULT STDMETHODCALLTYPE RegisterObjectBound(IUnknown* punk) override {
        if (!punk)
            return E_INVALIDARG;
        std::lock_guard<std::mutex> hold(lock_);
        try {
            bound_.push_back(punk);
        } catch (const std::bad_alloc&) {
            return E_OUTOFMEMORY;
        }
        punk->AddRef();
        return S_OK;
    }

    HRESULT STDMETHODCALLTYPE RevokeObjectBound(IUnknown* punk) override {
        if (!punk)
            return E_INVALIDARG;
        {
            std::lock_guard<std::mutex> hold(lock_);
            auto found = std::find(bound_.begin(), bound_.end(), punk);
            if (found == bound_.end())
                return MK_E_NOTBOUND;
            bound_.erase(found);
        }
        punk->Release();
        return S_OK;
    }

    HRESULT STDMETHODCALLTYPE ReleaseBoundObjects() override {
        std::vector<IUnknown*> released;
        {
            std::lock_guard<std::mutex> hold(lock_);
            released.swap(bound_);
        }
        for (IUnknown* object : released)
            object->Release();
        return S_OK;
    }

    // Only the BIND_OPTS members are kept; a larger structure's others are
    // left as they are.
    HRESULT STDMETHODCALLTYPE SetBindOptions(BIND_OPTS* pbindopts) override {
        if (!pbindopts || pbindopts->cbStruct < sizeof(BIND_OPTS))
            return E_INVALIDARG;
        std::lock_guard<std::mutex> hold(lock_);
        options_.grfFlags = pbindopts->grfFlags;
        options_.grfMode = pbindopts->grfMode;
        options_.dwTickCountDeadline = pbindopts->dwTickCountDeadline;
        return S_OK;
    }

    HRESULT STDMETHODCALLTYPE GetBindOptions(BIND_OPTS* pbindopts) override {
        if (!pbindopts || pbindopts->cbStruct < sizeof(BIND_OPTS))
            return E_INVALIDARG;
        std::lock_guard<std::mutex> hold(lock_);
        pbindopts->grfFlags = options_.grfFlags;
        pbindopts->grfMode = options_.grfMode;
        pbindopts->dwTickCountDeadline = options_.dwTickCountDeadline;
        return S_OK;
    }

    HRESULT STDMETHODCALLTYPE GetRunningObjectTable(IRunningObjectTable** pprot) override {
        if (pprot)
            *pprot = nullptr;
        return E_NOTIMPL;
    }

    HRESULT STDMETHODCALLTYPE RegisterObjectParam(LPOLESTR pszKey, IUnknown* punk) override {
        if (!pszKey || !punk)
            return E_INVALIDARG;
        IUnknown* replaced = nullptr;
        {
            std::lock_guard<std::mutex> hold(lock_);
            try {
                IUnknown*& slot = params_[std::u16string(pszKey)];
                replaced = slot;
                slot = punk;
            } catch (const std::bad_alloc&) {
                return E_OUTOFMEMORY;
            }
            punk->AddRef();
        }
        if (replaced)
            replaced->Release();
        return S_OK;
    }

    HRESULT STDMETHODCALLTYPE GetObjectParam(LPOLESTR pszKey, IUnknown** ppunk) override {
        if (!ppunk)
            return E_INVALIDARG;
        *ppunk = nullptr;
        if (!pszKey)
            return E_INVALIDARG;
        std::lock_guard<std::mutex> hold(lock_);
        auto found = params_.find(pszKey);
        if (found == params_.end())
            return E_FAIL;
        *ppunk = found->second;
        (*ppunk)->AddRef();
        return S_OK;
    }

    HRESULT STDMETHODCALLTYPE EnumObjectParam(IEnumString** ppenum) override {
        if (ppenum)
            *ppenum = nullptr;
        return E_NOTIMPL;
    }

    HRESULT STDMETHODCALLTYPE RevokeObjectParam(LPOLESTR pszKey) override {
        if (!pszKey)
            return E_INVALIDARG;
        IUnknown* revoked = nullptr;
        {
            std::lock_guard<std::mutex> hold(lock_);
            auto found = params_.find(pszKey);
            if (found == params_.end())
                return S_FALSE;
            revoked = found->second;
            params_.erase(found);
        }
        revoked->Release();
        return S_OK;
    }

private:
    std::mutex lock_;
    std::vector<IUnknown*> bound_;               // one reference each
    std::map<std::u16string, IUnknown*> params_; // one reference each
    BIND_OPTS options_;
};

} // namespace

extern "C" HRESULT WINAPI CreateBindCtx(DWORD reserved, LPBC* bindContext) {
    if (!bindContext)
        return E_INVALIDARG;
    *bindContext = nullptr;
    if (reserved != 0)
        return E_INVALIDARG;
    *bindContext = new (std::nothrow) BindContext;
    return *bindContext ? S_OK : E_OUTOFMEMORY;
}

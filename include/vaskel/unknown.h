// Bases that implement IUnknown for COM objects written with the library.
//
// IVKUnknown answers only IUnknown and counts nothing: AddRef and Release
// return 1, for objects whose lifetime is managed elsewhere (static or
// member objects). CVKUnknown<1> counts references atomically, so it may be
// referenced and released from any thread, and CVKUnknown<0> with plain
// arithmetic for objects of one thread; both start at 0 and, when Release
// takes the count to 0, call OnFinalRelease, which by default calls Delete,
// which by default deletes the object.
#pragma once

#include <vaskel/win32.h>

namespace vaskel {

class IVKUnknown : public IUnknown {
public:
    IVKUnknown() = default;
    IVKUnknown(const IVKUnknown&) {}
    IVKUnknown& operator=(const IVKUnknown&) { return *this; }

    // IID_IUnknown: AddRef and this; anything else E_NOINTERFACE with
    // *object left as it was.
    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** object) override {
        if (!object)
            return E_POINTER;
        if (iid != IID_IUnknown)
            return E_NOINTERFACE;
        AddRef();
        *object = static_cast<IUnknown*>(this);
        return S_OK;
    }
    ULONG STDMETHODCALLTYPE AddRef() override { return 1; }
    ULONG STDMETHODCALLTYPE Release() override { return 1; }
};

template <int N>
class CVKUnknown : public IVKUnknown {
public:
    CVKUnknown() = default;
    // Copies take the count as it stands.
    CVKUnknown(const CVKUnknown& other) : IVKUnknown(other), m_refCount(other.GetRefCount()) {}
    CVKUnknown& operator=(const CVKUnknown& other) {
        m_refCount = other.GetRefCount();
        return *this;
    }

    ULONG STDMETHODCALLTYPE AddRef() override { return InternalAddRef(); }
    ULONG STDMETHODCALLTYPE Release() override {
        const ULONG count = InternalRelease();
        if (count == 0) {
            OnFinalRelease();
            return 0;
        }
        return count;
    }
    virtual ~CVKUnknown() = default;

    ULONG GetRefCount() const {
        if (N)
            return static_cast<ULONG>(InterlockedCompareExchange(Count(), 0, 0));
        return m_refCount;
    }

protected:
    virtual void OnFinalRelease() { Delete(); }
    virtual void Delete() { delete this; }

    // The count changes without ever destroying the object.
    ULONG InternalAddRef() const {
        if (N)
            return static_cast<ULONG>(InterlockedIncrement(Count()));
        return ++m_refCount;
    }
    ULONG InternalRelease() const {
        if (N)
            return static_cast<ULONG>(InterlockedDecrement(Count()));
        return --m_refCount;
    }

private:
    // The Interlocked functions take a LONG; the count has its bits.
    LONG volatile* Count() const { return reinterpret_cast<LONG volatile*>(&m_refCount); }

    mutable ULONG m_refCount = 0;
};

} // namespace vaskel

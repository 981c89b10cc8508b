// An owned reference to a COM interface, released when the pointer goes.
// Built from a plain pointer it adds a reference of its own, as the
// compiler's COM smart pointers do; pass addRef false to take over a
// reference the caller already holds. Copies add a reference; a moved-from
// pointer is null.
#pragma once

#include <utility>

namespace vaskel {

template <class Interface>
class CInterfacePtr {
public:
    CInterfacePtr() noexcept = default;
    CInterfacePtr(Interface* object) noexcept : CInterfacePtr(object, true) {}
    CInterfacePtr(Interface* object, bool addRef) noexcept : m_interface(object) {
        if (m_interface && addRef)
            m_interface->AddRef();
    }
    CInterfacePtr(const CInterfacePtr& other) noexcept : CInterfacePtr(other.m_interface, true) {}
    CInterfacePtr(CInterfacePtr&& other) noexcept : m_interface(other.Detach()) {}
    ~CInterfacePtr() { Release(); }

    CInterfacePtr& operator=(CInterfacePtr other) noexcept {
        std::swap(m_interface, other.m_interface);
        return *this;
    }

    Interface* get() const noexcept { return m_interface; }
    Interface* operator->() const noexcept { return m_interface; }
    explicit operator bool() const noexcept { return m_interface != nullptr; }
    bool operator==(const CInterfacePtr& other) const noexcept {
        return m_interface == other.m_interface;
    }
    bool operator!=(const CInterfacePtr& other) const noexcept { return !(*this == other); }

    // Releases the reference held, if any, and leaves the pointer null.
    void Release() noexcept {
        if (Interface* held = Detach())
            held->Release();
    }
    // Gives the caller the reference held.
    Interface* Detach() noexcept { return std::exchange(m_interface, nullptr); }
    // For an output parameter: releases what is held first.
    Interface** GetAddress() noexcept {
        Release();
        return &m_interface;
    }

private:
    Interface* m_interface = nullptr;
};

} // namespace vaskel

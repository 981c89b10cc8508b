// IUnknown's reference counting for the objects this layer makes: atomic,
// starting at the creator's reference, and the object deletes itself when the
// last one goes.
#pragma once

#include <vkwin32/unknwn.h>

#include <atomic>

namespace vkw32 {

template <class Interface>
class RefCounted : public Interface {
public:
    ULONG STDMETHODCALLTYPE AddRef() override {
        return references_.fetch_add(1, std::memory_order_relaxed) + 1;
    }

    ULONG STDMETHODCALLTYPE Release() override {
        ULONG left = references_.fetch_sub(1, std::memory_order_acq_rel) - 1;
        if (left == 0)
            delete this;
        return left;
    }

protected:
    virtual ~RefCounted() = default;

private:
    std::atomic<ULONG> references_{1};
};

} // namespace vkw32

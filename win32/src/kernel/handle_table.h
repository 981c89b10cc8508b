// The process-wide table behind HANDLE values. A handle names a reference to a
// kernel object; objects are shared so that one closed while another thread
// still uses it stays valid until that use ends.
#pragma once

#include <vkwin32/types.h>

#include <memory>

namespace vkw32 {

class KernelObject {
public:
    KernelObject() = default;
    KernelObject(const KernelObject&) = delete;
    KernelObject& operator=(const KernelObject&) = delete;
    virtual ~KernelObject() = default;
};

HANDLE InsertHandle(std::shared_ptr<KernelObject> object);
std::shared_ptr<KernelObject> LookupHandle(HANDLE handle);
std::shared_ptr<KernelObject> RemoveHandle(HANDLE handle);

// The object behind a handle when it is of type T; null (and the last error
// ERROR_INVALID_HANDLE) otherwise.
template <class T>
std::shared_ptr<T> LookupHandleAs(HANDLE handle);

void SetInvalidHandleError();

template <class T>
std::shared_ptr<T> LookupHandleAs(HANDLE handle) {
    std::shared_ptr<T> object = std::dynamic_pointer_cast<T>(LookupHandle(handle));
    if (!object)
        SetInvalidHandleError();
    return object;
}

} // namespace vkw32

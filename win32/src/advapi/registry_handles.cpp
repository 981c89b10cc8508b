#include "registry_handles.h"

#include "kernel/handle_table.h"

namespace vkw32 {
namespace {

// Registry handles share the table of kernel handles, as on Windows: values
// are never reused, so a closed handle never names another key. A handle
// names a hive rather than a connection, so that it still works in a child
// made by fork, which has connections of its own.
class RegistryKey : public KernelObject {
public:
    RegistryKey(Hive hive, KeyId id, REGSAM access) : hive(hive), id(id), access(access) {}
    const Hive hive;
    const KeyId id;
    const REGSAM access;
};

LONG Reach(Hive hive, KeyId id, REGSAM access, KeyRef& ref) {
    LONG error = ERROR_SUCCESS;
    RegistryStore* store = RegistryStore::Open(hive, error);
    if (store == nullptr)
        return error;
    ref = {hive, store, id, access};
    return ERROR_SUCCESS;
}

std::shared_ptr<RegistryKey> LookupKey(HKEY key) {
    return std::dynamic_pointer_cast<RegistryKey>(LookupHandle(reinterpret_cast<HANDLE>(key)));
}

} // namespace

bool IsPredefinedKey(HKEY key) {
    return key == HKEY_CURRENT_USER || key == HKEY_LOCAL_MACHINE || key == HKEY_CLASSES_ROOT;
}

LONG ResolveKey(HKEY key, KeyRef& ref) {
    if (IsPredefinedKey(key)) {
        const Hive hive = key == HKEY_CURRENT_USER ? Hive::User : Hive::Machine;
        if (const LONG error = Reach(hive, 0, KEY_ALL_ACCESS, ref))
            return error;
        ref.id = key == HKEY_CLASSES_ROOT ? ref.store->Classes() : ref.store->Root();
        return ERROR_SUCCESS;
    }
    const std::shared_ptr<RegistryKey> object = LookupKey(key);
    if (!object)
        return ERROR_INVALID_HANDLE;
    return Reach(object->hive, object->id, object->access, ref);
}

HKEY InsertKeyHandle(const KeyRef& ref) {
    return reinterpret_cast<HKEY>(
        InsertHandle(std::make_shared<RegistryKey>(ref.hive, ref.id, ref.access)));
}

LONG CloseKeyHandle(HKEY key) {
    if (IsPredefinedKey(key))
        return ERROR_SUCCESS;
    if (!LookupKey(key) || !RemoveHandle(reinterpret_cast<HANDLE>(key)))
        return ERROR_INVALID_HANDLE;
    return ERROR_SUCCESS;
}

} // namespace vkw32

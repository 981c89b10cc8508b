// The registry functions: parameter checks, access rights and the callers'
// buffers, over the store and the key handles.
#include "registry_handles.h"
#include "registry_path.h"

#include <vkwin32/kernel.h>
#include <vkwin32/winreg.h>

#include <cstring>
#include <string>
#include <vector>

namespace {

using vkw32::KeyRef;

bool IsString(DWORD type) {
    return type == REG_SZ || type == REG_EXPAND_SZ || type == REG_MULTI_SZ;
}

// The generic rights and MAXIMUM_ALLOWED in the key-specific terms they stand for.
REGSAM KeyAccess(REGSAM desired) {
    REGSAM access = desired & KEY_ALL_ACCESS;
    if (desired & (GENERIC_READ | GENERIC_EXECUTE))
        access |= KEY_READ;
    if (desired & GENERIC_WRITE)
        access |= KEY_WRITE;
    if (desired & (GENERIC_ALL | MAXIMUM_ALLOWED))
        access |= KEY_ALL_ACCESS;
    return access;
}

// Opening below HKEY_CLASSES_ROOT, and only that, takes a leading backslash.
LPCSTR PathToOpen(HKEY key, LPCSTR subKey) {
    return key == HKEY_CLASSES_ROOT && subKey != nullptr && *subKey == '\\' ? subKey + 1 : subKey;
}

LONG ResolveWithAccess(HKEY key, REGSAM needed, KeyRef& ref) {
    if (const LONG error = vkw32::ResolveKey(key, ref))
        return error;
    return (ref.access & needed) == needed ? ERROR_SUCCESS : ERROR_ACCESS_DENIED;
}

// Copies data out as the query and enumeration functions do: string data
// stored without its NUL gets one when the buffer has room, uncounted.
void CopyData(const vkw32::StoredValue& value, BYTE* data, DWORD capacity) {
    std::memcpy(data, value.data, value.size);
    if (IsString(value.type) && value.size > 0 && value.data[value.size - 1] != 0 &&
        capacity > value.size)
        data[value.size] = 0;
}

LONG OpenOrCreate(HKEY key, LPCSTR subKey, REGSAM desired, bool create, PHKEY result,
                  LPDWORD disposition) {
    KeyRef ref;
    if (const LONG error = vkw32::ResolveKey(key, ref))
        return error;
    *result = nullptr;
    if (!create && (subKey == nullptr || *subKey == '\0') && vkw32::IsPredefinedKey(key)) {
        *result = key;
        return ERROR_SUCCESS;
    }
    std::vector<std::string_view> path;
    if (const LONG error = vkw32::SplitKeyPath(create ? subKey : PathToOpen(key, subKey), path))
        return error;
    bool created = false;
    const LONG error = create ? ref.store->CreateKey(ref.id, path, ref.id, created)
                              : ref.store->OpenKey(ref.id, path, ref.id);
    if (error != ERROR_SUCCESS)
        return error;
    ref.access = KeyAccess(desired);
    *result = vkw32::InsertKeyHandle(ref);
    if (disposition != nullptr)
        *disposition = created ? REG_CREATED_NEW_KEY : REG_OPENED_EXISTING_KEY;
    return ERROR_SUCCESS;
}

} // namespace

extern "C" {

LSTATUS WINAPI RegOpenKeyA(HKEY key, LPCSTR subKey, PHKEY result) {
    if (result == nullptr)
        return ERROR_INVALID_PARAMETER;
    if (subKey == nullptr || *subKey == '\0') {
        *result = key;
        return ERROR_SUCCESS;
    }
    return RegOpenKeyExA(key, subKey, 0, MAXIMUM_ALLOWED, result);
}

LSTATUS WINAPI RegOpenKeyExA(HKEY key, LPCSTR subKey, DWORD /*options*/, REGSAM desired,
                             PHKEY result) {
    if (result == nullptr)
        return ERROR_INVALID_PARAMETER;
    return OpenOrCreate(key, subKey, desired, false, result, nullptr);
}

LSTATUS WINAPI RegCreateKeyExA(HKEY key, LPCSTR subKey, DWORD reserved, LPSTR /*keyClass*/,
                               DWORD options, REGSAM desired,
                               LPSECURITY_ATTRIBUTES /*securityAttributes*/, PHKEY result,
                               LPDWORD disposition) {
    if (result == nullptr)
        return ERROR_BADKEY;
    if (reserved != 0)
        return ERROR_INVALID_PARAMETER;
    // The store keeps every key; one that should vanish at the next start
    // cannot be promised.
    if (options & REG_OPTION_VOLATILE)
        return ERROR_NOT_SUPPORTED;
    return OpenOrCreate(key, subKey, desired, true, result, disposition);
}

LSTATUS WINAPI RegCloseKey(HKEY key) {
    return vkw32::CloseKeyHandle(key);
}

LSTATUS WINAPI RegQueryValueExA(HKEY key, LPCSTR valueName, LPDWORD reserved, LPDWORD type,
                                LPBYTE data, LPDWORD dataSize) {
    if (reserved != nullptr || (data != nullptr && dataSize == nullptr))
        return ERROR_INVALID_PARAMETER;
    KeyRef ref;
    if (const LONG error = ResolveWithAccess(key, KEY_QUERY_VALUE, ref))
        return error;

    class Reader : public vkw32::ValueVisitor {
    public:
        Reader(LPDWORD type, LPBYTE data, LPDWORD size)
            // Read before anything is written: callers pass one variable for both.
            : m_type(type), m_data(data), m_size(size), m_capacity(data ? *size : 0) {}
        void Visit(std::string_view, const vkw32::StoredValue& value) override {
            if (m_type != nullptr)
                *m_type = value.type;
            if (m_data != nullptr && value.size > m_capacity)
                result = ERROR_MORE_DATA;
            else if (m_data != nullptr)
                CopyData(value, m_data, m_capacity);
            if (m_size != nullptr)
                *m_size = value.size;
        }
        LONG result = ERROR_SUCCESS;

    private:
        LPDWORD m_type;
        LPBYTE m_data;
        LPDWORD m_size;
        DWORD m_capacity;
    } reader(type, data, dataSize);

    const LONG error = ref.store->QueryValue(ref.id, valueName ? valueName : "", reader);
    // A size query of a missing value answers 0, as the system does.
    if (error == ERROR_FILE_NOT_FOUND && data == nullptr && dataSize != nullptr)
        *dataSize = 0;
    return error != ERROR_SUCCESS ? error : reader.result;
}

LSTATUS WINAPI RegSetValueExA(HKEY key, LPCSTR valueName, DWORD /*reserved*/, DWORD type,
                              const BYTE* data, DWORD dataSize) {
    if (data == nullptr && dataSize != 0)
        return ERROR_NOACCESS;
    KeyRef ref;
    if (const LONG error = ResolveWithAccess(key, KEY_SET_VALUE, ref))
        return error;
    const std::string_view name = valueName ? valueName : "";
    if (vkw32::Utf16Length(name) > vkw32::maxValueNameLength)
        return ERROR_INVALID_PARAMETER;
    return ref.store->SetValue(ref.id, name, type, data, dataSize);
}

LSTATUS WINAPI RegEnumKeyExA(HKEY key, DWORD index, LPSTR name, LPDWORD nameLength,
                             LPDWORD reserved, LPSTR keyClass, LPDWORD classLength,
                             PFILETIME lastWriteTime) {
    if (name == nullptr || nameLength == nullptr || reserved != nullptr ||
        (keyClass != nullptr && classLength == nullptr))
        return ERROR_INVALID_PARAMETER;
    KeyRef ref;
    if (const LONG error = ResolveWithAccess(key, KEY_ENUMERATE_SUB_KEYS, ref))
        return error;
    std::string found;
    if (const LONG error = ref.store->EnumKey(ref.id, index, found))
        return error;
    // Each name needs room for its NUL; keys have no class, an empty one.
    if (found.size() >= *nameLength || (keyClass != nullptr && *classLength == 0))
        return ERROR_MORE_DATA;
    std::memcpy(name, found.c_str(), found.size() + 1);
    *nameLength = static_cast<DWORD>(found.size());
    if (keyClass != nullptr) {
        *keyClass = '\0';
        *classLength = 0;
    }
    if (lastWriteTime != nullptr)
        *lastWriteTime = FILETIME{0, 0};
    return ERROR_SUCCESS;
}

LSTATUS WINAPI RegEnumValueA(HKEY key, DWORD index, LPSTR valueName, LPDWORD valueNameLength,
                             LPDWORD reserved, LPDWORD type, LPBYTE data, LPDWORD dataSize) {
    if (valueName == nullptr || valueNameLength == nullptr || reserved != nullptr ||
        (data != nullptr && dataSize == nullptr))
        return ERROR_INVALID_PARAMETER;
    KeyRef ref;
    if (const LONG error = ResolveWithAccess(key, KEY_QUERY_VALUE, ref))
        return error;

    // When the name or the data does not fit, neither is written: the caller
    // learns the data's size and type and tries again.
    class Reader : public vkw32::ValueVisitor {
    public:
        Reader(LPSTR name, LPDWORD nameLength, LPDWORD type, LPBYTE data, LPDWORD size)
            : m_name(name), m_nameLength(nameLength), m_nameCapacity(*nameLength), m_type(type),
              m_data(data), m_size(size), m_capacity(data ? *size : 0) {}
        void Visit(std::string_view name, const vkw32::StoredValue& value) override {
            if (m_type != nullptr)
                *m_type = value.type;
            if (name.size() >= m_nameCapacity || (m_data != nullptr && value.size > m_capacity)) {
                result = ERROR_MORE_DATA;
            } else {
                std::memcpy(m_name, name.data(), name.size());
                m_name[name.size()] = '\0';
                *m_nameLength = static_cast<DWORD>(name.size());
                if (m_data != nullptr)
                    CopyData(value, m_data, m_capacity);
            }
            if (m_size != nullptr)
                *m_size = value.size;
        }
        LONG result = ERROR_SUCCESS;

    private:
        LPSTR m_name;
        LPDWORD m_nameLength;
        DWORD m_nameCapacity;
        LPDWORD m_type;
        LPBYTE m_data;
        LPDWORD m_size;
        DWORD m_capacity;
    } reader(valueName, valueNameLength, type, data, dataSize);

    const LONG error = ref.store->EnumValue(ref.id, index, reader);
    return error != ERROR_SUCCESS ? error : reader.result;
}

LSTATUS WINAPI RegDeleteValueA(HKEY key, LPCSTR valueName) {
    KeyRef ref;
    if (const LONG error = ResolveWithAccess(key, KEY_SET_VALUE, ref))
        return error;
    return ref.store->DeleteValue(ref.id, valueName ? valueName : "");
}

// The rights of the handle do not matter here: the system checks the key
// being deleted.
LSTATUS WINAPI RegDeleteKeyA(HKEY key, LPCSTR subKey) {
    if (subKey == nullptr)
        return ERROR_INVALID_PARAMETER;
    KeyRef ref;
    if (const LONG error = vkw32::ResolveKey(key, ref))
        return error;
    std::vector<std::string_view> path;
    if (const LONG error = vkw32::SplitKeyPath(subKey, path))
        return error;
    return ref.store->DeleteKey(ref.id, path);
}

// One registry view here: the WOW64 flags choose nothing.
LSTATUS WINAPI RegDeleteKeyExA(HKEY key, LPCSTR subKey, REGSAM /*desired*/, DWORD /*reserved*/) {
    return RegDeleteKeyA(key, subKey);
}

} // extern "C"

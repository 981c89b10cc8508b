#include <vaskel/registry.h>

namespace vaskel {
namespace {

// Read and write access, as the framework's recursive delete asks for it.
const REGSAM readWriteAccess = 0x2001F;
const DWORD maxKeyName = 260;

typedef LONG(WINAPI* DeleteKeyExFunction)(HKEY, LPCSTR, REGSAM, DWORD);

// Systems that lack the function fall back to RegDeleteKeyA. Looked up once;
// a race only repeats the lookup.
DeleteKeyExFunction DeleteKeyEx() {
    static const DeleteKeyExFunction function =
        reinterpret_cast<DeleteKeyExFunction>(reinterpret_cast<void (*)()>(
            GetProcAddress(GetModuleHandleA("Advapi32.dll"), "RegDeleteKeyExA")));
    return function;
}

bool Enumerate(HKEY key, DWORD index, CString& name, bool values) {
    char buffer[maxKeyName + 1];
    DWORD length = sizeof buffer;
    const LONG result =
        values ? RegEnumValueA(key, index, buffer, &length, nullptr, nullptr, nullptr, nullptr)
               : RegEnumKeyExA(key, index, buffer, &length, nullptr, nullptr, nullptr, nullptr);
    if (result != ERROR_SUCCESS)
        return false;
    name = CString(buffer, static_cast<int>(length));
    return true;
}

} // namespace

CRegistry::CRegistry(HKEY base, bool ownBase)
    : m_base(base), m_subKey(nullptr), m_ownBase(ownBase) {}

CRegistry::CRegistry(const char* path, bool create)
    : CRegistry(HKEY_CURRENT_USER, path, true, create) {}

CRegistry::CRegistry(HKEY base, const char* path, bool ownBase, bool create)
    : m_base(base), m_subKey(nullptr), m_ownBase(ownBase) {
    // A path that did not open stays recorded without a subkey, so that
    // IsValid() reports the failure.
    if (!SetSubKey(path, create))
        m_path = path;
}

CRegistry::CRegistry(const CRegistry& other)
    : m_base(nullptr), m_subKey(nullptr), m_ownBase(false) {
    *this = other;
}

CRegistry& CRegistry::operator=(const CRegistry& other) {
    if (this == &other)
        return *this;
    Release();
    // A handle of its own: opening the empty path with RegOpenKeyA would hand
    // back the very same handle, which both objects would then close.
    HKEY base = nullptr;
    if (other.m_base &&
        RegOpenKeyExA(other.m_base, nullptr, 0, KEY_ALL_ACCESS, &base) == ERROR_SUCCESS) {
        m_base = base;
        m_ownBase = true;
        if (!other.m_path.IsEmpty() && !SetSubKey(other.m_path, false))
            m_path = other.m_path;
    }
    return *this;
}

CRegistry::~CRegistry() {
    Release();
}

void CRegistry::CloseSubKey() {
    if (m_subKey)
        RegCloseKey(m_subKey);
    m_subKey = nullptr;
    m_path.Empty();
}

void CRegistry::Release() {
    CloseSubKey();
    if (m_base && m_ownBase)
        RegCloseKey(m_base);
    m_base = nullptr;
    m_ownBase = false;
}

bool CRegistry::Attach(HKEY base, bool ownBase) {
    Release();
    m_base = base;
    m_ownBase = ownBase;
    return true;
}

HKEY CRegistry::Detach() {
    CloseSubKey();
    HKEY base = m_base;
    m_base = nullptr;
    m_ownBase = false;
    return base;
}

bool CRegistry::Open(const char* path, bool create) {
    HKEY key = nullptr;
    const LONG result = create ? RegCreateKeyExA(m_base, path, 0, nullptr, REG_OPTION_NON_VOLATILE,
                                                 KEY_ALL_ACCESS, nullptr, &key, nullptr)
                               : RegOpenKeyExA(m_base, path, 0, KEY_ALL_ACCESS, &key);
    if (result != ERROR_SUCCESS)
        return false;
    m_subKey = key;
    m_path = path;
    return true;
}

bool CRegistry::SetSubKey(const char* path, bool create) {
    // Copied first: the path may be this object's own.
    const CString target(path ? path : "");
    CloseSubKey();
    return !path || Open(target, create);
}

bool CRegistry::SetSubKey(HKEY base, const char* path, bool ownBase, bool create) {
    const CString target(path ? path : "");
    Release();
    m_base = base;
    m_ownBase = ownBase;
    if (SetSubKey(path ? static_cast<const char*>(target) : nullptr, create))
        return true;
    Release();
    return false;
}

bool CRegistry::IsValid() const {
    return m_base && (m_path.IsEmpty() || m_subKey);
}

CRegistry* CRegistry::Up() {
    const int last = m_path.ReverseFind('\\');
    if (last < 0)
        return nullptr;
    const CString parent = m_path.Left(last);
    return SetSubKey(parent, false) ? this : nullptr;
}

CRegistry* CRegistry::Down(const char* name, bool create) {
    // Below the base key the path is the name alone: a path may not begin
    // with a backslash when a key is created.
    const CString path = m_path.IsEmpty() ? CString(name) : m_path + "\\" + name;
    return SetSubKey(path, create) ? this : nullptr;
}

void CRegistry::Root() {
    CloseSubKey();
}

bool CRegistry::KeyExist(const char* path) const {
    HKEY key = nullptr;
    if (RegOpenKeyExA(*this, path, 0, KEY_READ, &key) != ERROR_SUCCESS)
        return false;
    RegCloseKey(key);
    return true;
}

bool CRegistry::EnumKey(DWORD index, CString& name) const {
    return Enumerate(*this, index, name, false);
}

bool CRegistry::EnumValue(DWORD index, CString& name) const {
    return Enumerate(*this, index, name, true);
}

bool CRegistry::DeleteValue(const char* name) {
    return RegDeleteValueA(*this, name) == ERROR_SUCCESS;
}

bool CRegistry::DeleteKey(const char* name, bool recursive) {
    const LONG result =
        recursive ? RegDeleteKeyAndSubKeyes(*this, name) : RegDeleteKeyA(*this, name);
    return result == ERROR_SUCCESS;
}

LONG CRegistry::RegDeleteKeyAndSubKeyes(HKEY parent, const char* name) {
    HKEY key = nullptr;
    LONG result = RegOpenKeyExA(parent, name, 0, readWriteAccess, &key);
    if (result != ERROR_SUCCESS)
        return result;
    for (;;) {
        char subKey[256];
        DWORD length = sizeof subKey;
        result = RegEnumKeyExA(key, 0, subKey, &length, nullptr, nullptr, nullptr, nullptr);
        if (result == ERROR_NO_MORE_ITEMS)
            break;
        // Any other failure would enumerate the same subkey for ever.
        if (result == ERROR_SUCCESS)
            result = RegDeleteKeyAndSubKeyes(key, subKey);
        if (result != ERROR_SUCCESS) {
            RegCloseKey(key);
            return result;
        }
    }
    RegCloseKey(key);
    if (const DeleteKeyExFunction deleteKeyEx = DeleteKeyEx())
        return deleteKeyEx(parent, name, 0, 0);
    return RegDeleteKeyA(parent, name);
}

} // namespace vaskel

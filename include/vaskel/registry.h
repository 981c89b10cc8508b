// Registry keys: one location (a base key and an optional path below it)
// with typed values, enumeration and deletion. Every registry failure is a
// false result or the caller's default, never an exception.
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/array.h>
#include <vaskel/framework/list.h>
#include <vaskel/framework/string.h>
#include <vaskel/win32.h>

namespace vaskel {

class CFile;

class VASKEL_API CRegistry {
public:
    // Works on the base key itself.
    CRegistry(HKEY base = HKEY_CURRENT_USER, bool ownBase = true);
    // The path below HKEY_CURRENT_USER, opened or created.
    CRegistry(const char* path, bool create);
    CRegistry(HKEY base, const char* path, bool ownBase, bool create);
    // Opens the other's base key again and its path below it (never creates).
    CRegistry(const CRegistry& other);
    CRegistry& operator=(const CRegistry& other);
    ~CRegistry();

    bool Attach(HKEY base, bool ownBase);
    // Gives up the base key without closing it.
    HKEY Detach();
    // A null path works on the base key. On failure no subkey is open.
    bool SetSubKey(const char* path, bool create);
    bool SetSubKey(HKEY base, const char* path, bool ownBase, bool create);
    bool IsValid() const;
    // The current key: the open subkey, else the base key; null while a
    // path that failed to open is recorded, so that nothing lands on the
    // base key by mistake.
    operator HKEY() const { return m_subKey ? m_subKey : m_path.IsEmpty() ? m_base : nullptr; }

    // Null at the top of the path (nothing changes) or on failure (then no
    // subkey is open).
    CRegistry* Up();
    CRegistry* Down(const char* name, bool create);
    void Root();
    bool KeyExist(const char* path) const;

    bool EnumKey(DWORD index, CString& name) const;
    bool EnumValue(DWORD index, CString& name) const;
    bool DeleteValue(const char* name);
    // Without recursion a key with subkeys is not deleted.
    bool DeleteKey(const char* name, bool recursive);
    // Deletes the key and its whole subtree; the system error code, 0 on success.
    static LONG RegDeleteKeyAndSubKeyes(HKEY parent, const char* name);

    // A null name is the key's default value. Numbers read 4 bytes whatever
    // the stored type; longer data fails.
    bool GetValue(const char* name, unsigned long& value) const;
    bool GetValue(const char* name, long& value) const;
    bool GetValue(const char* name, int& value) const;
    bool GetValue(const char* name, unsigned int& value) const;
    bool GetValue(const char* name, bool& value) const;
    bool GetValue(const char* name, float& value) const;
    bool GetValue(const char* name, double& value) const;
    // Reads at most size bytes; size becomes the stored size.
    bool GetValue(const char* name, void* data, DWORD& size) const;
    // True only when the stored size is exactly size.
    bool GetStructure(const char* name, void* data, DWORD size) const;
    // Text values only.
    bool GetValue(const char* name, CString& value) const;
    // Multi-string values only; the strings are appended.
    bool GetValue(const char* name, CStringArray& values) const;
    bool GetValue(const char* name, CStringList& values) const;
    bool GetValue(const char* name, CArray<CString, const CString&>& values) const;
    bool GetValue(const char* name, CList<CString, const CString&>& values) const;
    // Binary values only, into the file's own buffer (a memory file).
    bool GetValue(const char* name, CFile& file) const;

    long GetLong(const char* name, long defaultValue) const;
    int GetInteger(const char* name, int defaultValue) const;
    unsigned int GetUInteger(const char* name, unsigned int defaultValue) const;
    unsigned long GetULong(const char* name, unsigned long defaultValue) const;
    bool GetBool(const char* name, bool defaultValue) const;
    float GetFloat(const char* name, float defaultValue) const;
    double GetDouble(const char* name, double defaultValue) const;
    CString GetString(const char* name, const char* defaultValue) const;
    // The stored strings, or the default string when there are none to read.
    void GetStringList(const char* name, CStringList& values, const char* defaultValue) const;
    void GetStringList(const char* name, CList<CString, const CString&>& values,
                       const char* defaultValue) const;
    void GetStringArray(const char* name, CStringArray& values, const char* defaultValue) const;
    void GetStringArray(const char* name, CArray<CString, const CString&>& values,
                        const char* defaultValue) const;

    // Numbers as 4-byte values; a long outside 32 bits is refused.
    bool SetValue(const char* name, unsigned long value);
    bool SetValue(const char* name, long value);
    bool SetValue(const char* name, int value);
    bool SetValue(const char* name, unsigned int value);
    bool SetValue(const char* name, bool value);
    bool SetValue(const char* name, const char* value);
    bool SetValue(const char* name, float value);
    bool SetValue(const char* name, double value);
    bool SetValue(const char* name, const void* data, DWORD size);
    bool SetValue(const char* name, const CStringArray& values);
    bool SetValue(const char* name, const CStringList& values);
    bool SetValue(const char* name, const CArray<CString, const CString&>& values);
    bool SetValue(const char* name, const CList<CString, const CString&>& values);
    // The file's own buffer (a memory file) as a binary value.
    bool SetValue(const char* name, CFile& file);

private:
    void CloseSubKey();
    void Release();
    bool Open(const char* path, bool create);

    HKEY m_base;
    HKEY m_subKey;
    bool m_ownBase;
    CString m_path;
};

// COM server registration.
class VASKEL_API COMRegistry {
public:
    // The default value of HKEY_CLASSES_ROOT\CLSID\<clsid>\LocalServer32, or
    // empty text.
    static CString GetLocalServer32Value(const char* clsid);
};

} // namespace vaskel

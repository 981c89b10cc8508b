#include <vaskel/diag.h>
#include <vaskel/framework/file.h>
#include <vaskel/registry.h>

#include <climits>
#include <cstdint>
#include <cstring>
#include <vector>

namespace vaskel {
namespace {

const DWORD firstReadSize = 255;

bool QueryFixed(HKEY key, const char* name, void* data, DWORD size) {
    DWORD stored = size;
    return RegQueryValueExA(key, name, nullptr, nullptr, static_cast<BYTE*>(data), &stored) ==
           ERROR_SUCCESS;
}

// A text or multi-string value of the expected type: a first read into a
// small buffer, a second one at the size the system reports. The last byte
// becomes the terminator.
bool QueryText(HKEY key, const char* name, DWORD expectedType, std::vector<char>& data) {
    data.assign(firstReadSize, '\0');
    DWORD type = expectedType;
    DWORD size = firstReadSize;
    LONG result =
        RegQueryValueExA(key, name, nullptr, &type, reinterpret_cast<BYTE*>(data.data()), &size);
    if (type != expectedType)
        return false;
    if (result == ERROR_MORE_DATA) {
        data.assign(size, '\0');
        result = RegQueryValueExA(key, name, nullptr, &type, reinterpret_cast<BYTE*>(data.data()),
                                  &size);
        if (type != expectedType)
            return false;
    }
    if (result != ERROR_SUCCESS)
        return false;
    data.resize(size);
    if (!data.empty())
        data.back() = '\0';
    return true;
}

template <class Container>
bool ReadStrings(HKEY key, const char* name, Container& values) {
    std::vector<char> data;
    if (!QueryText(key, name, REG_MULTI_SZ, data))
        return false;
    for (std::size_t at = 0; at < data.size();) {
        const std::size_t length = strnlen(data.data() + at, data.size() - at);
        if (length == 0)
            break;
        values.Add(CString(data.data() + at, static_cast<int>(length)));
        at += length + 1;
    }
    return true;
}

// The framework's list and array add differently; this gives them one name.
template <class List>
struct ListAdder {
    List& list;
    void Add(const CString& value) { list.AddTail(value); }
};

template <class Container>
bool ReadStringList(HKEY key, const char* name, Container& values) {
    ListAdder<Container> adder{values};
    return ReadStrings(key, name, adder);
}

template <class Visit>
bool WriteStrings(HKEY key, const char* name, Visit visit) {
    std::vector<char> data;
    visit([&data](const CString& value) {
        data.insert(data.end(), value.GetString(), value.GetString() + value.GetLength());
        data.push_back('\0');
    });
    data.push_back('\0');
    if (data.size() > ULONG_MAX)
        return false;
    return RegSetValueExA(key, name, 0, REG_MULTI_SZ, reinterpret_cast<const BYTE*>(data.data()),
                          static_cast<DWORD>(data.size())) == ERROR_SUCCESS;
}

template <class Array>
bool WriteArray(HKEY key, const char* name, const Array& values) {
    return WriteStrings(key, name, [&values](auto add) {
        for (INT_PTR i = 0; i < values.GetSize(); ++i)
            add(values.GetAt(i));
    });
}

template <class List>
bool WriteList(HKEY key, const char* name, const List& values) {
    return WriteStrings(key, name, [&values](auto add) {
        for (POSITION position = values.GetHeadPosition(); position;)
            add(values.GetNext(position));
    });
}

bool SetDword(HKEY key, const char* name, DWORD value) {
    return RegSetValueExA(key, name, 0, REG_DWORD, reinterpret_cast<const BYTE*>(&value),
                          sizeof value) == ERROR_SUCCESS;
}

bool SetBinary(HKEY key, const char* name, const void* data, DWORD size) {
    return RegSetValueExA(key, name, 0, REG_BINARY, static_cast<const BYTE*>(data), size) ==
           ERROR_SUCCESS;
}

} // namespace

bool CRegistry::GetValue(const char* name, unsigned long& value) const {
    DWORD stored = 0;
    if (!QueryFixed(*this, name, &stored, sizeof stored))
        return false;
    value = stored;
    return true;
}

bool CRegistry::GetValue(const char* name, long& value) const {
    LONG stored = 0;
    if (!QueryFixed(*this, name, &stored, sizeof stored))
        return false;
    value = stored;
    return true;
}

bool CRegistry::GetValue(const char* name, int& value) const {
    LONG stored = 0;
    if (!QueryFixed(*this, name, &stored, sizeof stored))
        return false;
    value = stored;
    return true;
}

bool CRegistry::GetValue(const char* name, unsigned int& value) const {
    DWORD stored = 0;
    if (!QueryFixed(*this, name, &stored, sizeof stored))
        return false;
    value = stored;
    return true;
}

bool CRegistry::GetValue(const char* name, bool& value) const {
    DWORD stored = 0;
    if (!QueryFixed(*this, name, &stored, sizeof stored))
        return false;
    value = stored != 0;
    return true;
}

bool CRegistry::GetValue(const char* name, float& value) const {
    return QueryFixed(*this, name, &value, sizeof value);
}

bool CRegistry::GetValue(const char* name, double& value) const {
    return QueryFixed(*this, name, &value, sizeof value);
}

bool CRegistry::GetValue(const char* name, void* data, DWORD& size) const {
    return RegQueryValueExA(*this, name, nullptr, nullptr, static_cast<BYTE*>(data), &size) ==
           ERROR_SUCCESS;
}

bool CRegistry::GetStructure(const char* name, void* data, DWORD size) const {
    DWORD stored = size;
    return GetValue(name, data, stored) && stored == size;
}

bool CRegistry::GetValue(const char* name, CString& value) const {
    std::vector<char> data;
    if (!QueryText(*this, name, REG_SZ, data))
        return false;
    value = data.empty() ? CString() : CString(data.data());
    return true;
}

bool CRegistry::GetValue(const char* name, CStringArray& values) const {
    return ReadStrings(*this, name, values);
}

bool CRegistry::GetValue(const char* name, CStringList& values) const {
    return ReadStringList(*this, name, values);
}

bool CRegistry::GetValue(const char* name, CArray<CString, const CString&>& values) const {
    return ReadStrings(*this, name, values);
}

bool CRegistry::GetValue(const char* name, CList<CString, const CString&>& values) const {
    return ReadStringList(*this, name, values);
}

bool CRegistry::GetValue(const char* name, CFile& file) const {
    DWORD type = REG_NONE;
    DWORD size = 0;
    if (RegQueryValueExA(*this, name, nullptr, &type, nullptr, &size) != ERROR_SUCCESS ||
        type != REG_BINARY)
        return false;
    void* start = nullptr;
    if (file.GetBufferPtr(CFile::bufferWrite, size, &start) != size)
        return false;
    if (RegQueryValueExA(*this, name, nullptr, nullptr, static_cast<BYTE*>(start), &size) !=
        ERROR_SUCCESS)
        return false;
    file.GetBufferPtr(CFile::bufferCommit, size);
    return true;
}

long CRegistry::GetLong(const char* name, long defaultValue) const {
    GetValue(name, defaultValue);
    return defaultValue;
}

int CRegistry::GetInteger(const char* name, int defaultValue) const {
    GetValue(name, defaultValue);
    return defaultValue;
}

unsigned int CRegistry::GetUInteger(const char* name, unsigned int defaultValue) const {
    GetValue(name, defaultValue);
    return defaultValue;
}

unsigned long CRegistry::GetULong(const char* name, unsigned long defaultValue) const {
    GetValue(name, defaultValue);
    return defaultValue;
}

bool CRegistry::GetBool(const char* name, bool defaultValue) const {
    GetValue(name, defaultValue);
    return defaultValue;
}

float CRegistry::GetFloat(const char* name, float defaultValue) const {
    float value = 0.0f;
    return GetValue(name, value) ? value : defaultValue;
}

double CRegistry::GetDouble(const char* name, double defaultValue) const {
    double value = 0.0;
    return GetValue(name, value) ? value : defaultValue;
}

CString CRegistry::GetString(const char* name, const char* defaultValue) const {
    CString value;
    return GetValue(name, value) ? value : CString(defaultValue);
}

void CRegistry::GetStringList(const char* name, CStringList& values,
                              const char* defaultValue) const {
    if (!GetValue(name, values))
        values.AddTail(CString(defaultValue));
}

void CRegistry::GetStringList(const char* name, CList<CString, const CString&>& values,
                              const char* defaultValue) const {
    if (!GetValue(name, values))
        values.AddTail(CString(defaultValue));
}

void CRegistry::GetStringArray(const char* name, CStringArray& values,
                               const char* defaultValue) const {
    if (!GetValue(name, values))
        values.Add(CString(defaultValue));
}

void CRegistry::GetStringArray(const char* name, CArray<CString, const CString&>& values,
                               const char* defaultValue) const {
    if (!GetValue(name, values))
        values.Add(CString(defaultValue));
}

bool CRegistry::SetValue(const char* name, unsigned long value) {
    // A 64-bit long that does not fit the 4-byte value is refused, not cut.
    if (value > 0xFFFFFFFFul)
        return false;
    return SetDword(*this, name, static_cast<DWORD>(value));
}

bool CRegistry::SetValue(const char* name, long value) {
    if (value < static_cast<long>(INT32_MIN) || value > static_cast<long>(INT32_MAX))
        return false;
    return SetDword(*this, name, static_cast<DWORD>(value));
}

bool CRegistry::SetValue(const char* name, int value) {
    return SetDword(*this, name, static_cast<DWORD>(value));
}

bool CRegistry::SetValue(const char* name, unsigned int value) {
    return SetDword(*this, name, value);
}

bool CRegistry::SetValue(const char* name, bool value) {
    return SetDword(*this, name, value ? 1 : 0);
}

bool CRegistry::SetValue(const char* name, const char* value) {
    if (!value)
        return false;
    const std::size_t size = std::strlen(value) + 1;
    if (size > ULONG_MAX)
        return false;
    return RegSetValueExA(*this, name, 0, REG_SZ, reinterpret_cast<const BYTE*>(value),
                          static_cast<DWORD>(size)) == ERROR_SUCCESS;
}

bool CRegistry::SetValue(const char* name, float value) {
    return SetBinary(*this, name, &value, sizeof value);
}

bool CRegistry::SetValue(const char* name, double value) {
    return SetBinary(*this, name, &value, sizeof value);
}

bool CRegistry::SetValue(const char* name, const void* data, DWORD size) {
    return SetBinary(*this, name, data, size);
}

bool CRegistry::SetValue(const char* name, const CStringArray& values) {
    return WriteArray(*this, name, values);
}

bool CRegistry::SetValue(const char* name, const CStringList& values) {
    return WriteList(*this, name, values);
}

bool CRegistry::SetValue(const char* name, const CArray<CString, const CString&>& values) {
    return WriteArray(*this, name, values);
}

bool CRegistry::SetValue(const char* name, const CList<CString, const CString&>& values) {
    return WriteList(*this, name, values);
}

bool CRegistry::SetValue(const char* name, CFile& file) {
    const ULONGLONG length = file.GetLength();
    if (length >= 0xFFFFFFFFull)
        return false;
    void* start = nullptr;
    const UINT count = file.GetBufferPtr(CFile::bufferRead, static_cast<UINT>(length), &start);
    return SetBinary(*this, name, start, count);
}

} // namespace vaskel

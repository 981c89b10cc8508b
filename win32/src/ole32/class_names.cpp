// Class names in the registry: HKEY_CLASSES_ROOT\<ProgID>\CLSID holds a
// ProgID's class, HKEY_CLASSES_ROOT\CLSID\{...}\ProgID a class's ProgID,
// each as the key's default value.
#include "guid_text.h"

#include <vkwin32/kernel.h>
#include <vkwin32/objbase.h>
#include <vkwin32/winreg.h>

#include <cstring>
#include <string>

namespace {

// The registry speaks UTF-8 here; a name that is not valid UTF-16 names no key.
bool ToUtf8(LPCOLESTR text, std::string& utf8) {
    const int bytes =
        WideCharToMultiByte(CP_UTF8, WC_ERR_INVALID_CHARS, text, -1, nullptr, 0, nullptr, nullptr);
    if (bytes <= 0)
        return false;
    utf8.resize(static_cast<std::size_t>(bytes));
    WideCharToMultiByte(CP_UTF8, WC_ERR_INVALID_CHARS, text, -1, &utf8[0], bytes, nullptr, nullptr);
    utf8.resize(static_cast<std::size_t>(bytes - 1));
    return true;
}

// The default value of HKEY_CLASSES_ROOT\path as text. A key without one
// reads as empty, as the system's plain value query gives it.
LSTATUS ReadDefaultValue(const std::string& path, std::string& value) {
    HKEY key = nullptr;
    LSTATUS status = RegOpenKeyExA(HKEY_CLASSES_ROOT, path.c_str(), 0, KEY_QUERY_VALUE, &key);
    if (status != ERROR_SUCCESS)
        return status;
    DWORD type = REG_NONE;
    DWORD size = 0;
    status = RegQueryValueExA(key, nullptr, nullptr, &type, nullptr, &size);
    if (status == ERROR_FILE_NOT_FOUND) {
        RegCloseKey(key);
        value.clear();
        return ERROR_SUCCESS;
    }
    if (status == ERROR_SUCCESS && type != REG_SZ && type != REG_EXPAND_SZ)
        status = ERROR_INVALID_DATA;
    if (status == ERROR_SUCCESS) {
        // Room for a NUL the store may add to text kept without one.
        value.assign(static_cast<std::size_t>(size) + 1, '\0');
        DWORD read = size + 1;
        status = RegQueryValueExA(key, nullptr, nullptr, &type, reinterpret_cast<LPBYTE>(&value[0]),
                                  &read);
        if (status == ERROR_SUCCESS)
            value.resize(std::strlen(value.c_str()));
    }
    RegCloseKey(key);
    return status;
}

} // namespace

extern "C" HRESULT WINAPI CLSIDFromProgID(LPCOLESTR progId, LPCLSID clsid) {
    if (!progId || !clsid)
        return E_INVALIDARG;
    *clsid = GUID{};
    std::string path;
    if (!ToUtf8(progId, path) || path.empty())
        return CO_E_CLASSSTRING;
    path += "\\CLSID";
    std::string value;
    if (ReadDefaultValue(path, value) != ERROR_SUCCESS)
        return CO_E_CLASSSTRING;
    // The value is UTF-8; a GUID's text is ASCII, so anything else fails to parse.
    if (value.size() != vkw32::kGuidTextSize - 1)
        return CO_E_CLASSSTRING;
    OLECHAR text[vkw32::kGuidTextSize];
    for (int i = 0; i < vkw32::kGuidTextSize; ++i)
        text[i] = static_cast<unsigned char>(value.c_str()[i]);
    GUID parsed;
    if (!vkw32::ParseGuid(text, parsed))
        return CO_E_CLASSSTRING;
    *clsid = parsed;
    return S_OK;
}

extern "C" HRESULT WINAPI ProgIDFromCLSID(REFCLSID clsid, LPOLESTR* progId) {
    if (!progId)
        return E_INVALIDARG;
    *progId = nullptr;
    OLECHAR guidText[vkw32::kGuidTextSize];
    vkw32::FormatGuid(clsid, guidText);
    std::string path = "CLSID\\";
    for (int i = 0; i < vkw32::kGuidTextSize - 1; ++i)
        path += static_cast<char>(guidText[i]);
    path += "\\ProgID";
    std::string value;
    const LSTATUS status = ReadDefaultValue(path, value);
    if (status == ERROR_FILE_NOT_FOUND || status == ERROR_PATH_NOT_FOUND)
        return REGDB_E_CLASSNOTREG;
    if (status != ERROR_SUCCESS)
        return REGDB_E_READREGDB;
    const int units = value.empty()
                          ? 0
                          : MultiByteToWideChar(CP_UTF8, MB_ERR_INVALID_CHARS, value.data(),
                                                static_cast<int>(value.size()), nullptr, 0);
    if (!value.empty() && units <= 0)
        return REGDB_E_READREGDB;
    auto* text =
        static_cast<LPOLESTR>(CoTaskMemAlloc((static_cast<SIZE_T>(units) + 1) * sizeof(OLECHAR)));
    if (!text)
        return E_OUTOFMEMORY;
    if (units > 0)
        MultiByteToWideChar(CP_UTF8, MB_ERR_INVALID_CHARS, value.data(),
                            static_cast<int>(value.size()), text, units);
    text[units] = u'\0';
    *progId = text;
    return S_OK;
}

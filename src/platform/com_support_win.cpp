// The text conversions that comutil.h declares. The other Windows toolchain
// ships them in its COM support library; mingw-w64 declares them without
// one, so the library provides them to itself and to its users.
#include <vaskel/win32.h>

#if defined(__MINGW32__)

#include <new>

namespace _com_util {

__declspec(dllexport) BSTR WINAPI ConvertStringToBSTR(const char* text) {
    if (!text)
        return nullptr;
    const int length = MultiByteToWideChar(CP_ACP, 0, text, -1, nullptr, 0);
    if (length <= 0)
        _com_issue_error(HRESULT_FROM_WIN32(GetLastError()));
    BSTR result = SysAllocStringLen(nullptr, static_cast<UINT>(length - 1));
    if (!result)
        _com_issue_error(E_OUTOFMEMORY);
    MultiByteToWideChar(CP_ACP, 0, text, -1, result, length);
    return result;
}

__declspec(dllexport) char* WINAPI ConvertBSTRToString(BSTR text) {
    if (!text)
        return nullptr;
    const int units = static_cast<int>(SysStringLen(text)) + 1;
    const int length = WideCharToMultiByte(CP_ACP, 0, text, units, nullptr, 0, nullptr, nullptr);
    if (length <= 0)
        _com_issue_error(HRESULT_FROM_WIN32(GetLastError()));
    char* result = new (std::nothrow) char[static_cast<size_t>(length)];
    if (!result)
        _com_issue_error(E_OUTOFMEMORY);
    WideCharToMultiByte(CP_ACP, 0, text, units, result, length, nullptr, nullptr);
    return result;
}

} // namespace _com_util

#endif

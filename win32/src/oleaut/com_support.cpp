// The error path and the text conversions of the compiler's COM support.
#include <vkwin32/comdef.h>
#include <vkwin32/kernel.h>
#include <vkwin32/winnls.h>

#include <cstdio>
#include <cstring>
#include <new>

void WINAPI _com_issue_error(HRESULT hr) {
    throw _com_error(hr);
}

namespace _com_util {

BSTR WINAPI ConvertStringToBSTR(const char* text) {
    if (!text)
        return nullptr;
    const int length = MultiByteToWideChar(CP_ACP, 0, text, -1, nullptr, 0);
    if (length <= 0)
        _com_issue_error(HRESULT_FROM_WIN32(GetLastError()));
    BSTR result = SysAllocStringLen(nullptr, static_cast<UINT>(length - 1));
    if (!result)
        _com_issue_error(E_OUTOFMEMORY);
    if (MultiByteToWideChar(CP_ACP, 0, text, -1, result, length) != length) {
        const DWORD error = GetLastError();
        SysFreeString(result);
        _com_issue_error(HRESULT_FROM_WIN32(error));
    }
    return result;
}

char* WINAPI ConvertBSTRToString(BSTR text) {
    if (!text)
        return nullptr;
    // The whole length, so text after an embedded NUL is converted as well.
    const int units = static_cast<int>(SysStringLen(text)) + 1;
    const int length = WideCharToMultiByte(CP_ACP, 0, text, units, nullptr, 0, nullptr, nullptr);
    if (length <= 0)
        _com_issue_error(HRESULT_FROM_WIN32(GetLastError()));
    char* result = new (std::nothrow) char[static_cast<std::size_t>(length)];
    if (!result)
        _com_issue_error(E_OUTOFMEMORY);
    WideCharToMultiByte(CP_ACP, 0, text, units, result, length, nullptr, nullptr);
    return result;
}

} // namespace _com_util

_com_error& _com_error::operator=(const _com_error& other) noexcept {
    if (this != &other) {
        delete[] m_message;
        m_message = nullptr;
        m_hresult = other.m_hresult;
    }
    return *this;
}

const char* _com_error::ErrorMessage() const noexcept {
    if (m_message)
        return m_message;
    char* text = nullptr;
    const DWORD length = FormatMessageA(
        FORMAT_MESSAGE_ALLOCATE_BUFFER | FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS,
        nullptr, static_cast<DWORD>(m_hresult), MAKELANGID(LANG_NEUTRAL, SUBLANG_DEFAULT),
        reinterpret_cast<LPSTR>(&text), 0, nullptr);
    std::size_t size = 0;
    char fallback[32];
    const char* source = fallback;
    if (length > 0 && text) {
        source = text;
        size = length;
        // The system's texts end in a line break, which a message shown alone does not need.
        if (size > 0 && text[size - 1] == '\n')
            --size;
        if (size > 0 && text[size - 1] == '\r')
            --size;
    } else if (const WORD code = WCode()) {
        size = static_cast<std::size_t>(std::snprintf(fallback, sizeof fallback, "IDispatch error #%d", code));
    } else {
        size = static_cast<std::size_t>(std::snprintf(fallback, sizeof fallback, "Unknown error 0x%0lX",
                                                      static_cast<unsigned long>(static_cast<DWORD>(m_hresult))));
    }
    m_message = new (std::nothrow) char[size + 1];
    if (m_message) {
        std::memcpy(m_message, source, size);
        m_message[size] = '\0';
    }
    if (text)
        LocalFree(text);
    return m_message;
}

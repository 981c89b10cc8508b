#include <vaskel/framework/exceptions.h>
#include <vaskel/text.h>

#include <cstring>
#include <string>

namespace vaskel {

namespace {

// 8-bit text as wide text for the system calls. The wide copy lives on the
// heap: a text of any length must not exhaust the stack. A null, overlong or
// unconvertible text becomes a null pointer, for the system to refuse.
class WideText {
public:
    explicit WideText(const char* text) {
        if (!text)
            return;
        const std::size_t length = std::strlen(text);
        if (length > 0x3FFFFFFE)
            return;
        m_text.resize(length + 1);
        const int units = MultiByteToWideChar(CP_THREAD_ACP, 0, text, static_cast<int>(length + 1),
                                              &m_text[0], static_cast<int>(length + 1));
        m_valid = units > 0;
    }
    const OLECHAR* get() const { return m_valid ? m_text.c_str() : nullptr; }

private:
    std::basic_string<OLECHAR> m_text;
    bool m_valid = false;
};

// Takes the system's string and frees it.
CString FromTaskMemory(LPOLESTR text) {
    CString result = text ? CString(text) : CString();
    CoTaskMemFree(text);
    return result;
}

template <typename Result>
Result OrThrow(HRESULT hr, const Result& result) {
    if (FAILED(hr))
        AfxThrowOleException(hr);
    return result;
}

} // namespace

CString& AsString(CString& out, const GUID& value) {
    LPOLESTR text = nullptr;
    out = SUCCEEDED(StringFromCLSID(value, &text)) ? FromTaskMemory(text) : CString();
    return out;
}

CString AsString(const GUID& value) {
    CString out;
    return AsString(out, value);
}

HRESULT AsGUIDFromGuidString(const OLECHAR* text, GUID& out) {
    return CLSIDFromString(const_cast<LPOLESTR>(text), &out);
}

HRESULT AsGUIDFromGuidString(const char* text, GUID& out) {
    return AsGUIDFromGuidString(WideText(text).get(), out);
}

GUID AsGUIDFromGuidString(const OLECHAR* text) {
    GUID result{};
    return OrThrow(AsGUIDFromGuidString(text, result), result);
}

GUID AsGUIDFromGuidString(const char* text) {
    return AsGUIDFromGuidString(WideText(text).get());
}

HRESULT AsGUIDFromProgID(const OLECHAR* progId, GUID& out) {
    return CLSIDFromProgID(progId, &out);
}

HRESULT AsGUIDFromProgID(const char* progId, GUID& out) {
    return AsGUIDFromProgID(WideText(progId).get(), out);
}

GUID AsGUIDFromProgID(const OLECHAR* progId) {
    GUID result{};
    return OrThrow(AsGUIDFromProgID(progId, result), result);
}

GUID AsGUIDFromProgID(const char* progId) {
    return AsGUIDFromProgID(WideText(progId).get());
}

HRESULT AsGUID(const OLECHAR* text, GUID& out) {
    if (SUCCEEDED(AsGUIDFromGuidString(text, out)))
        return S_OK;
    return AsGUIDFromProgID(text, out);
}

HRESULT AsGUID(const char* text, GUID& out) {
    return AsGUID(WideText(text).get(), out);
}

GUID AsGUID(const OLECHAR* text) {
    GUID result{};
    return OrThrow(AsGUID(text, result), result);
}

GUID AsGUID(const char* text) {
    return AsGUID(WideText(text).get());
}

HRESULT AsProgID(const GUID& clsid, CString& out) {
    LPOLESTR text = nullptr;
    const HRESULT hr = ProgIDFromCLSID(clsid, &text);
    if (SUCCEEDED(hr))
        out = FromTaskMemory(text);
    return hr;
}

CString AsProgID(const GUID& clsid) {
    CString result;
    return OrThrow(AsProgID(clsid, result), result);
}

HRESULT AsProgIDFromGuidString(const OLECHAR* text, CString& out) {
    GUID clsid{};
    const HRESULT hr = AsGUIDFromGuidString(text, clsid);
    return FAILED(hr) ? hr : AsProgID(clsid, out);
}

HRESULT AsProgIDFromGuidString(const char* text, CString& out) {
    return AsProgIDFromGuidString(WideText(text).get(), out);
}

CString AsProgIDFromGuidString(const OLECHAR* text) {
    CString result;
    return OrThrow(AsProgIDFromGuidString(text, result), result);
}

CString AsProgIDFromGuidString(const char* text) {
    return AsProgIDFromGuidString(WideText(text).get());
}

HRESULT AsProgID(const OLECHAR* text, CString& out) {
    GUID clsid{};
    if (SUCCEEDED(AsGUIDFromGuidString(text, clsid))) {
        const HRESULT hr = AsProgID(clsid, out);
        if (SUCCEEDED(hr))
            return hr;
    }
    out = text ? CString(text) : CString();
    return S_OK;
}

HRESULT AsProgID(const char* text, CString& out) {
    GUID clsid{};
    if (SUCCEEDED(AsGUIDFromGuidString(text, clsid))) {
        const HRESULT hr = AsProgID(clsid, out);
        if (SUCCEEDED(hr))
            return hr;
    }
    // The caller's own text, byte for byte.
    out = text ? CString(text) : CString();
    return S_OK;
}

CString AsProgID(const OLECHAR* text) {
    CString result;
    AsProgID(text, result);
    return result;
}

CString AsProgID(const char* text) {
    CString result;
    AsProgID(text, result);
    return result;
}

HRESULT AsGUIDStringFromProgID(const OLECHAR* progId, CString& out) {
    GUID clsid{};
    const HRESULT hr = AsGUIDFromProgID(progId, clsid);
    if (FAILED(hr))
        return hr;
    CString text = AsString(clsid);
    if (text.IsEmpty())
        return E_UNEXPECTED;
    out = text;
    return hr;
}

HRESULT AsGUIDStringFromProgID(const char* progId, CString& out) {
    return AsGUIDStringFromProgID(WideText(progId).get(), out);
}

CString AsGUIDStringFromProgID(const OLECHAR* progId) {
    CString result;
    return OrThrow(AsGUIDStringFromProgID(progId, result), result);
}

CString AsGUIDStringFromProgID(const char* progId) {
    return AsGUIDStringFromProgID(WideText(progId).get());
}

} // namespace vaskel

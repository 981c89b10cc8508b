// _bstr_t: one shared string with a count of its holders; a change made
// through one holder gives that holder a string of its own.
#include <vkwin32/comdef.h>

#include <algorithm>
#include <new>

namespace {

BSTR CopyOrThrow(BSTR text) {
    if (!text)
        return nullptr;
    BSTR copy = SysAllocStringByteLen(reinterpret_cast<LPCSTR>(text), SysStringByteLen(text));
    if (!copy)
        _com_issue_error(E_OUTOFMEMORY);
    return copy;
}

BSTR AllocOrThrow(const OLECHAR* text) {
    if (!text)
        return nullptr;
    BSTR copy = SysAllocString(text);
    if (!copy)
        _com_issue_error(E_OUTOFMEMORY);
    return copy;
}

} // namespace

_bstr_t::Data* _bstr_t::NewData(BSTR owned) {
    Data* data = new (std::nothrow) Data{owned, nullptr, 1};
    if (!data) {
        SysFreeString(owned);
        _com_issue_error(E_OUTOFMEMORY);
    }
    return data;
}

void _bstr_t::Release() noexcept {
    if (m_Data && --m_Data->refs == 0) {
        SysFreeString(m_Data->wide);
        delete[] m_Data->ansi;
        delete m_Data;
    }
    m_Data = nullptr;
}

_bstr_t::Data& _bstr_t::Own() {
    if (m_Data && m_Data->refs == 1) {
        delete[] m_Data->ansi;
        m_Data->ansi = nullptr;
        return *m_Data;
    }
    Data* fresh = NewData(m_Data ? CopyOrThrow(m_Data->wide) : nullptr);
    Release();
    m_Data = fresh;
    return *m_Data;
}

_bstr_t::_bstr_t(const _bstr_t& other) noexcept : m_Data(other.m_Data) {
    if (m_Data)
        ++m_Data->refs;
}

_bstr_t::_bstr_t(const char* text) : m_Data(NewData(_com_util::ConvertStringToBSTR(text))) {}

_bstr_t::_bstr_t(const OLECHAR* text) : m_Data(NewData(AllocOrThrow(text))) {}

_bstr_t::_bstr_t(const _variant_t& value) : m_Data(nullptr) {
    *this = value;
}

_bstr_t::_bstr_t(BSTR text, bool copy) : m_Data(NewData(copy ? CopyOrThrow(text) : text)) {}

_bstr_t& _bstr_t::operator=(const _bstr_t& other) noexcept {
    if (m_Data != other.m_Data) {
        Release();
        m_Data = other.m_Data;
        if (m_Data)
            ++m_Data->refs;
    }
    return *this;
}

_bstr_t& _bstr_t::operator=(const char* text) {
    return *this = _bstr_t(text);
}

_bstr_t& _bstr_t::operator=(const OLECHAR* text) {
    return *this = _bstr_t(text);
}

_bstr_t& _bstr_t::operator=(const _variant_t& value) {
    if (value.vt == VT_BSTR)
        return *this = _bstr_t(value.bstrVal, true);
    _variant_t text;
    _com_util::CheckError(VariantChangeType(&text, &value, 0, VT_BSTR));
    return *this = _bstr_t(text.bstrVal, true);
}

_bstr_t& _bstr_t::operator+=(const _bstr_t& other) {
    return *this = *this + other;
}

_bstr_t _bstr_t::operator+(const _bstr_t& other) const {
    const UINT left = length();
    const UINT right = other.length();
    if (left > 0x7FFFFFFFu - right)
        _com_issue_error(E_OUTOFMEMORY);
    BSTR joined = SysAllocStringLen(nullptr, left + right);
    if (!joined)
        _com_issue_error(E_OUTOFMEMORY);
    std::copy_n(static_cast<const OLECHAR*>(*this), left, joined);
    std::copy_n(static_cast<const OLECHAR*>(other), right, joined + left);
    return _bstr_t(joined, false);
}

_bstr_t operator+(const char* left, const _bstr_t& right) {
    return _bstr_t(left) + right;
}

_bstr_t operator+(const OLECHAR* left, const _bstr_t& right) {
    return _bstr_t(left) + right;
}

_bstr_t::operator const char*() const {
    if (!m_Data)
        return nullptr;
    if (!m_Data->ansi && m_Data->wide)
        m_Data->ansi = _com_util::ConvertBSTRToString(m_Data->wide);
    return m_Data->ansi;
}

_bstr_t::operator char*() const {
    return const_cast<char*>(static_cast<const char*>(*this));
}

int _bstr_t::Compare(const _bstr_t& other) const noexcept {
    const UINT left = length();
    const UINT right = other.length();
    const OLECHAR* a = *this;
    const OLECHAR* b = other;
    for (UINT i = 0; i < std::min(left, right); ++i) {
        if (a[i] != b[i])
            return a[i] < b[i] ? -1 : 1;
    }
    return left < right ? -1 : left > right ? 1 : 0;
}

BSTR _bstr_t::copy(bool copy) const {
    if (!m_Data)
        return nullptr;
    return copy ? CopyOrThrow(m_Data->wide) : m_Data->wide;
}

void _bstr_t::Assign(BSTR text) {
    BSTR copy = CopyOrThrow(text);
    Data& data = Own();
    SysFreeString(data.wide);
    data.wide = copy;
}

BSTR& _bstr_t::GetBSTR() {
    return Own().wide;
}

BSTR* _bstr_t::GetAddress() {
    Attach(nullptr);
    return &m_Data->wide;
}

void _bstr_t::Attach(BSTR text) {
    Data* fresh = NewData(text);
    Release();
    m_Data = fresh;
}

BSTR _bstr_t::Detach() noexcept {
    if (!m_Data)
        return nullptr;
    BSTR text = m_Data->wide;
    if (m_Data->refs == 1)
        m_Data->wide = nullptr;
    else if (text)
        // Other holders keep the shared string; the caller gets a copy (null when out of memory).
        text = SysAllocStringByteLen(reinterpret_cast<LPCSTR>(text), SysStringByteLen(text));
    Release();
    return text;
}

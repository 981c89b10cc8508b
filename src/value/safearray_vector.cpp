#include <vaskel/value.h>

#include <cstring>

namespace vaskel {

namespace {

const EVariantOwnershipOptions kNothingHeld = static_cast<EVariantOwnershipOptions>(0);

[[noreturn]] void Throw(HRESULT hr) {
    throw _com_error(hr);
}

bool Owns(EVariantOwnershipOptions ownership) {
    return ownership == OwnershipCopy || ownership == OwnershipTake ||
           ownership == OwnershipTakeConst;
}

} // namespace

DWORD safearrayvector::GetDataSize(VARTYPE type) {
    switch (type) {
    case VT_I1:
    case VT_UI1:
        return 1;
    case VT_I2:
    case VT_BOOL:
    case VT_UI2:
        return 2;
    case VT_I4:
    case VT_R4:
    case VT_UI4:
    case VT_INT:
    case VT_UINT:
        return 4;
    case VT_BSTR:
    case VT_DISPATCH:
    case VT_UNKNOWN:
        return sizeof(void*);
    case VT_R8:
    case VT_DATE:
    case VT_I8:
    case VT_UI8:
        return 8;
    case VT_DECIMAL:
        return sizeof(DECIMAL);
    case VT_VARIANT:
        return sizeof(VARIANT);
    default:
        return 0;
    }
}

bool safearrayvector::MoveDataPointer(VARTYPE type, void*& element, LONG n) {
    const DWORD size = GetDataSize(type);
    if (size == 0)
        return false;
    element = static_cast<BYTE*>(element) + static_cast<std::ptrdiff_t>(n) * size;
    return true;
}

HRESULT safearrayvector::ResetDataValue(VARTYPE type, void* element) {
    if (type == VT_DECIMAL)
        return E_NOTIMPL;
    if (type == VT_VARIANT) {
        VariantInit(static_cast<VARIANT*>(element));
        return S_OK;
    }
    const DWORD size = GetDataSize(type);
    if (size == 0)
        return E_NOTIMPL;
    // All-zero bytes are 0, 0.0, false and the null pointer alike.
    std::memset(element, 0, size);
    return S_OK;
}

HRESULT safearrayvector::SetVariantValue(VARIANT& out, VARTYPE type, void* element, bool copy) {
    const DWORD size = GetDataSize(type);
    if (size == 0)
        return E_NOTIMPL;
    VARIANT built;
    VariantInit(&built);
    if (type == VT_VARIANT) {
        std::memcpy(&built, element, sizeof(VARIANT));
    } else if (type == VT_DECIMAL) {
        std::memcpy(&built.decVal, element, sizeof(DECIMAL));
        built.vt = VT_DECIMAL;
    } else {
        built.vt = type;
        std::memcpy(&built.llVal, element, size);
    }
    if (copy)
        return VariantCopy(&out, &built);
    std::memcpy(&out, &built, sizeof(VARIANT));
    return S_OK;
}

HRESULT safearrayvector::GetVariantValue(void* element, VARIANT& in, bool copy) {
    VARIANT value;
    VariantInit(&value);
    if (copy) {
        const HRESULT hr = VariantCopy(&value, &in);
        if (FAILED(hr))
            return hr;
    } else {
        std::memcpy(&value, &in, sizeof(VARIANT));
    }
    // Arrays and references have no element form.
    const DWORD size = (value.vt & (VT_ARRAY | VT_BYREF)) ? 0 : GetDataSize(value.vt);
    if (size == 0) {
        if (copy)
            VariantClear(&value);
        return E_NOTIMPL;
    }
    if (value.vt == VT_DECIMAL)
        std::memcpy(element, &value.decVal, sizeof(DECIMAL));
    else
        std::memcpy(element, &value.llVal, size);
    if (!copy)
        VariantInit(&in);
    return S_OK;
}

HRESULT safearrayvector::GetVariantValue(void* element, const VARIANT& in) {
    return GetVariantValue(element, const_cast<VARIANT&>(in), true);
}

safearrayvector::safearrayvector() noexcept : m_ownership(kNothingHeld), m_size(0), m_data(nullptr) {
    VariantInit(&m_variant);
}

safearrayvector::safearrayvector(VARIANT& value, EVariantOwnershipOptions ownership)
    : safearrayvector() {
    Set(value, ownership);
}

safearrayvector::safearrayvector(const VARIANT& value, EVariantOwnershipOptions ownership)
    : safearrayvector() {
    Set(value, ownership);
}

safearrayvector::safearrayvector(const safearrayvector& other) : safearrayvector() {
    *this = other;
}

safearrayvector& safearrayvector::operator=(const safearrayvector& other) {
    if (this == &other)
        return *this;
    if (other.m_ownership == kNothingHeld) {
        Reset();
    } else {
        const HRESULT hr =
            Set(other.m_variant, Owns(other.m_ownership) ? OwnershipCopy : OwnershipBorrow);
        if (FAILED(hr))
            Throw(hr);
    }
    return *this;
}

void safearrayvector::Reset() {
    if (m_data)
        SafeArrayUnaccessData(m_variant.parray);
    m_data = nullptr;
    m_size = 0;
    if (Owns(m_ownership))
        VariantClear(&m_variant);
    else
        VariantInit(&m_variant);
    m_ownership = kNothingHeld;
}

HRESULT safearrayvector::Set(const VARIANT& value, EVariantOwnershipOptions ownership) {
    if (ownership == OwnershipTake)
        return E_INVALIDARG;
    return Set(const_cast<VARIANT&>(value), ownership);
}

HRESULT safearrayvector::Set(VARIANT& value, EVariantOwnershipOptions ownership) {
    if (value.vt == VT_EMPTY || ownership < OwnershipBorrow || ownership > OwnershipTakeConst)
        return E_INVALIDARG;
    // An array held by reference is not followed: its owner is elsewhere.
    if ((value.vt & VT_ARRAY) && (value.vt & VT_BYREF))
        return E_INVALIDARG;
    VARIANT candidate;
    VariantInit(&candidate);
    if (ownership == OwnershipCopy) {
        const HRESULT hr = VariantCopy(&candidate, &value);
        if (FAILED(hr))
            return hr;
    } else {
        std::memcpy(&candidate, &value, sizeof(VARIANT));
    }
    DWORD size = 1;
    void* data = nullptr;
    if (candidate.vt & VT_ARRAY) {
        SAFEARRAY* array = candidate.parray;
        const VARTYPE type = static_cast<VARTYPE>(candidate.vt & ~VT_ARRAY);
        LONG lower = 0;
        LONG upper = -1;
        HRESULT hr = array ? S_OK : E_INVALIDARG;
        // Elements are read by the variant's type: a different stride would
        // walk past the array.
        if (SUCCEEDED(hr) && GetDataSize(type) != 0 && SafeArrayGetElemsize(array) != GetDataSize(type))
            hr = E_INVALIDARG;
        if (SUCCEEDED(hr))
            hr = SafeArrayGetLBound(array, 1, &lower);
        if (SUCCEEDED(hr))
            hr = SafeArrayGetUBound(array, 1, &upper);
        if (SUCCEEDED(hr))
            hr = SafeArrayAccessData(array, &data);
        if (FAILED(hr)) {
            if (ownership == OwnershipCopy)
                VariantClear(&candidate);
            return hr;
        }
        size = static_cast<DWORD>(static_cast<LONGLONG>(upper) - lower + 1);
    }
    Reset();
    if (ownership == OwnershipTake || ownership == OwnershipTakeConst)
        VariantInit(&value);
    m_ownership = ownership;
    std::memcpy(&m_variant, &candidate, sizeof(VARIANT));
    m_size = size;
    m_data = data;
    return S_OK;
}

void* safearrayvector::ElementAt(DWORD index) const {
    const DWORD size = GetDataSize(GetArrayType());
    if (size == 0)
        Throw(E_INVALIDARG);
    return static_cast<BYTE*>(m_data) + static_cast<std::size_t>(index) * size;
}

tmpvariant_t safearrayvector::at(DWORD index) const {
    const_safearrayiterator iterator(this);
    iterator.Move(index);
    return *iterator;
}

const_safearrayiterator safearrayvector::end() const {
    const_safearrayiterator iterator(this);
    iterator.Move(m_size);
    return iterator;
}

bool safearrayvector::CanTransferElementOwnership() const {
    return Owns(m_ownership);
}

void safearrayvector::TransferElementOwnership(DWORD index, VARIANT& out) {
    if (index >= m_size || !Owns(m_ownership))
        Throw(E_UNEXPECTED);
    if (!(m_variant.vt & VT_ARRAY)) {
        // A single value moves out whole; the vector then shows it empty.
        const HRESULT hr = VariantClear(&out);
        if (FAILED(hr))
            Throw(hr);
        std::memcpy(&out, &m_variant, sizeof(VARIANT));
        VariantInit(&m_variant);
        return;
    }
    const VARTYPE type = GetArrayType();
    void* element = ElementAt(index);
    HRESULT hr = VariantClear(&out);
    if (SUCCEEDED(hr))
        hr = SetVariantValue(out, type, element, false);
    if (FAILED(hr))
        Throw(hr);
    // A decimal owns nothing, so its slot, which cannot be zeroed, may stay.
    if (type != VT_DECIMAL)
        ResetDataValue(type, element);
}

const_safearrayiterator::const_safearrayiterator(const safearrayvector* vector)
    : m_vector(vector), m_index(0) {
    Refresh();
}

const_safearrayiterator const_safearrayiterator::operator++(int) {
    const_safearrayiterator before(*this);
    Move(1);
    return before;
}

const_safearrayiterator const_safearrayiterator::operator--(int) {
    const_safearrayiterator before(*this);
    Move(-1);
    return before;
}

const_safearrayiterator& const_safearrayiterator::Move(long long n) {
    const long long size = m_vector ? m_vector->m_size : 0;
    long long index = static_cast<long long>(m_index) + n;
    if (index < 0)
        index = 0;
    if (index > size)
        index = size;
    m_index = static_cast<DWORD>(index);
    Refresh();
    return *this;
}

void const_safearrayiterator::Refresh() {
    VariantInit(&m_current);
    if (!m_vector || m_index >= m_vector->m_size)
        return;
    if (!(m_vector->m_variant.vt & VT_ARRAY)) {
        std::memcpy(static_cast<VARIANT*>(&m_current), &m_vector->m_variant, sizeof(VARIANT));
        return;
    }
    const HRESULT hr = safearrayvector::SetVariantValue(m_current, m_vector->GetArrayType(),
                                                        m_vector->ElementAt(m_index), false);
    if (FAILED(hr))
        Throw(hr);
}

} // namespace vaskel

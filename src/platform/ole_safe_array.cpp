#include <vaskel/framework/ole_safe_array.h>

#include <cstring>
#include <limits>
#include <vector>

namespace vaskel {
namespace {

void Check(HRESULT hr) {
    if (FAILED(hr))
        AfxThrowOleException(hr);
}

constexpr LONG longMax = std::numeric_limits<LONG>::max();

// long is 64 bits on POSIX; the array's bounds and indices are 32.
LONG ToLong(long value) {
    if (value < std::numeric_limits<LONG>::min() || value > longMax)
        AfxThrowOleException(E_INVALIDARG);
    return static_cast<LONG>(value);
}

bool HoldsArray(const VARIANT& value) {
    return (value.vt & VT_ARRAY) != 0 && (value.vt & VT_BYREF) == 0 && value.parray != nullptr;
}

// The address of an element of vtSrc in a caller's buffer, as
// SafeArrayPutElement wants it: strings and interfaces by value.
void* SourceElement(VARTYPE vtSrc, const void* source, DWORD index, UINT elementSize) {
    switch (vtSrc) {
    case VT_BSTR:
        return static_cast<const BSTR*>(source)[index];
    case VT_UNKNOWN:
    case VT_DISPATCH:
        return static_cast<IUnknown* const*>(source)[index];
    default:
        return const_cast<BYTE*>(static_cast<const BYTE*>(source) +
                                 static_cast<SIZE_T>(index) * elementSize);
    }
}

// Frees the value. A locked array is refused here rather than left to
// VariantClear, as systems differ in what they leave behind then.
HRESULT ClearValue(VARIANT& value) {
    if (HoldsArray(value) && value.parray->cLocks != 0)
        return DISP_E_ARRAYISLOCKED;
    return VariantClear(&value);
}

} // namespace

COleSafeArray::COleSafeArray() {
    VariantInit(this);
}

COleSafeArray::COleSafeArray(const VARIANT& source) {
    VariantInit(this);
    *this = source;
}

COleSafeArray::COleSafeArray(const COleSafeArray& other) {
    VariantInit(this);
    // Some system headers declare the source without const.
    Check(VariantCopy(this, const_cast<COleSafeArray*>(&other)));
}

COleSafeArray& COleSafeArray::operator=(const COleSafeArray& other) {
    if (this != &other)
        *this = static_cast<const VARIANT&>(other);
    return *this;
}

COleSafeArray& COleSafeArray::operator=(const VARIANT& source) {
    if (&source == static_cast<const VARIANT*>(this))
        return *this;
    if ((source.vt & VT_ARRAY) == 0)
        AfxThrowOleException(DISP_E_TYPEMISMATCH);
    // Copy first so that a failed copy leaves this value as it was.
    VARIANT copy;
    VariantInit(&copy);
    Check(VariantCopy(&copy, const_cast<VARIANT*>(&source)));
    const HRESULT hr = ClearValue(*this);
    if (FAILED(hr)) {
        VariantClear(&copy);
        AfxThrowOleException(hr);
    }
    std::memcpy(static_cast<VARIANT*>(this), &copy, sizeof(VARIANT));
    return *this;
}

COleSafeArray::~COleSafeArray() {
    VariantClear(this);
}

SAFEARRAY* COleSafeArray::Array() const {
    if (!HoldsArray(*this))
        AfxThrowOleException(E_INVALIDARG);
    return parray;
}

void COleSafeArray::TakeArray(VARTYPE vtSrc, SAFEARRAY* array) {
    const HRESULT hr = ClearValue(*this);
    if (FAILED(hr)) {
        SafeArrayDestroy(array);
        AfxThrowOleException(hr);
    }
    vt = static_cast<VARTYPE>(VT_ARRAY | vtSrc);
    parray = array;
}

void COleSafeArray::Create(VARTYPE vtSrc, DWORD dims, SAFEARRAYBOUND* bounds) {
    if (dims == 0 || bounds == nullptr)
        AfxThrowOleException(E_INVALIDARG);
    SAFEARRAY* array = SafeArrayCreate(vtSrc, dims, bounds);
    if (!array)
        AfxThrowOleException(E_OUTOFMEMORY);
    TakeArray(vtSrc, array);
}

void COleSafeArray::CreateOneDim(VARTYPE vtSrc, DWORD elements, const void* source,
                                 long lowerBound) {
    const LONG lower = ToLong(lowerBound);
    // The upper bound must be a LONG too.
    if (elements > 0 && static_cast<long long>(lower) + elements - 1 > longMax)
        AfxThrowOleException(E_INVALIDARG);
    SAFEARRAYBOUND bound = {elements, lower};
    SAFEARRAY* array = SafeArrayCreate(vtSrc, 1, &bound);
    if (!array)
        AfxThrowOleException(E_OUTOFMEMORY);
    if (source) {
        const UINT size = SafeArrayGetElemsize(array);
        for (DWORD i = 0; i < elements; ++i) {
            LONG index = static_cast<LONG>(lower + static_cast<long long>(i));
            const HRESULT hr =
                SafeArrayPutElement(array, &index, SourceElement(vtSrc, source, i, size));
            if (FAILED(hr)) {
                SafeArrayDestroy(array);
                AfxThrowOleException(hr);
            }
        }
    }
    TakeArray(vtSrc, array);
}

DWORD COleSafeArray::GetOneDimSize() {
    if (GetDim() != 1)
        AfxThrowOleException(E_INVALIDARG);
    long lower = 0;
    long upper = 0;
    GetLBound(1, &lower);
    GetUBound(1, &upper);
    return static_cast<DWORD>(upper - lower + 1);
}

void COleSafeArray::ResizeOneDim(DWORD elements) {
    if (GetDim() != 1)
        AfxThrowOleException(E_INVALIDARG);
    SAFEARRAY* old = parray;
    if (old->cLocks != 0)
        AfxThrowOleException(DISP_E_ARRAYISLOCKED);
    VARTYPE elementType = VT_EMPTY;
    Check(SafeArrayGetVartype(old, &elementType));
    long lower = 0;
    GetLBound(1, &lower);
    const DWORD oldElements = GetOneDimSize();
    if (elements > 0 && lower + static_cast<long long>(elements) - 1 > longMax)
        AfxThrowOleException(E_INVALIDARG);

    SAFEARRAYBOUND bound = {elements, static_cast<LONG>(lower)};
    SAFEARRAY* resized = SafeArrayCreate(elementType, 1, &bound);
    if (!resized)
        AfxThrowOleException(E_OUTOFMEMORY);
    // The kept elements move bit for bit: the old array's slots are zeroed so
    // that destroying it frees only the elements that were cut.
    const SIZE_T bytes = static_cast<SIZE_T>(elements < oldElements ? elements : oldElements) *
                         SafeArrayGetElemsize(old);
    void* from = nullptr;
    void* to = nullptr;
    HRESULT hr = SafeArrayAccessData(old, &from);
    if (SUCCEEDED(hr)) {
        hr = SafeArrayAccessData(resized, &to);
        if (SUCCEEDED(hr)) {
            if (bytes > 0) {
                std::memcpy(to, from, bytes);
                std::memset(from, 0, bytes);
            }
            SafeArrayUnaccessData(resized);
        }
        SafeArrayUnaccessData(old);
    }
    if (FAILED(hr)) {
        SafeArrayDestroy(resized);
        AfxThrowOleException(hr);
    }
    SafeArrayDestroy(old);
    parray = resized;
}

DWORD COleSafeArray::GetDim() {
    return HoldsArray(*this) ? SafeArrayGetDim(parray) : 0;
}

DWORD COleSafeArray::GetElemSize() {
    return SafeArrayGetElemsize(Array());
}

void COleSafeArray::GetLBound(DWORD dim, long* bound) {
    if (!bound)
        AfxThrowOleException(E_POINTER);
    LONG value = 0;
    Check(SafeArrayGetLBound(Array(), dim, &value));
    *bound = value;
}

void COleSafeArray::GetUBound(DWORD dim, long* bound) {
    if (!bound)
        AfxThrowOleException(E_POINTER);
    LONG value = 0;
    Check(SafeArrayGetUBound(Array(), dim, &value));
    *bound = value;
}

namespace {

std::vector<LONG> ToIndices(SAFEARRAY* array, const long* indices) {
    if (!indices)
        AfxThrowOleException(E_INVALIDARG);
    const UINT dims = SafeArrayGetDim(array);
    std::vector<LONG> result(dims);
    for (UINT i = 0; i < dims; ++i)
        result[i] = ToLong(indices[i]);
    return result;
}

} // namespace

void COleSafeArray::PutElement(long* indices, void* value) {
    SAFEARRAY* array = Array();
    std::vector<LONG> checked = ToIndices(array, indices);
    Check(SafeArrayPutElement(array, checked.data(), value));
}

void COleSafeArray::GetElement(long* indices, void* value) {
    SAFEARRAY* array = Array();
    std::vector<LONG> checked = ToIndices(array, indices);
    Check(SafeArrayGetElement(array, checked.data(), value));
}

void COleSafeArray::AccessData(void** data) {
    Check(SafeArrayAccessData(Array(), data));
}

void COleSafeArray::UnaccessData() {
    Check(SafeArrayUnaccessData(Array()));
}

void COleSafeArray::Clear() {
    Check(ClearValue(*this));
}

VARIANT COleSafeArray::Detach() {
    VARIANT result;
    std::memcpy(&result, static_cast<VARIANT*>(this), sizeof(VARIANT));
    vt = VT_EMPTY;
    return result;
}

void COleSafeArray::Attach(VARIANT& source) {
    if (!HoldsArray(source))
        AfxThrowOleException(E_INVALIDARG);
    Check(ClearValue(*this));
    std::memcpy(static_cast<VARIANT*>(this), &source, sizeof(VARIANT));
    source.vt = VT_EMPTY;
}

} // namespace vaskel

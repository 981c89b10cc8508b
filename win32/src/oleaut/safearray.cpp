#include <vkwin32/oleauto.h>

#include <cstdlib>
#include <cstring>
#include <limits>

namespace {

// The descriptor is preceded by a block that keeps it aligned for any type;
// its last four bytes hold the element type, where the system keeps it.
const std::size_t kPrefix = 16;
const ULONG kMaxCount = std::numeric_limits<ULONG>::max();
const USHORT kCallerMemory = FADF_AUTO | FADF_STATIC | FADF_EMBEDDED;
const USHORT kOwnedElements = FADF_BSTR | FADF_VARIANT | FADF_UNKNOWN | FADF_DISPATCH;

DWORD* StoredType(SAFEARRAY* array) {
    return reinterpret_cast<DWORD*>(array) - 1;
}

ULONG ElementSize(VARTYPE vt) {
    switch (vt) {
    case VT_I1:
    case VT_UI1:
        return 1;
    case VT_I2:
    case VT_UI2:
    case VT_BOOL:
        return 2;
    case VT_I4:
    case VT_UI4:
    case VT_R4:
    case VT_ERROR:
    case VT_INT:
    case VT_UINT:
        return 4;
    case VT_I8:
    case VT_UI8:
    case VT_R8:
    case VT_CY:
    case VT_DATE:
        return 8;
    case VT_BSTR:
    case VT_UNKNOWN:
    case VT_DISPATCH:
        return sizeof(void*);
    case VT_VARIANT:
        return sizeof(VARIANT);
    case VT_DECIMAL:
        return sizeof(DECIMAL);
    default:
        return 0;
    }
}

USHORT Features(VARTYPE vt) {
    switch (vt) {
    case VT_BSTR:
        return FADF_HAVEVARTYPE | FADF_BSTR;
    case VT_VARIANT:
        return FADF_HAVEVARTYPE | FADF_VARIANT;
    case VT_UNKNOWN:
        return FADF_HAVEIID | FADF_UNKNOWN;
    case VT_DISPATCH:
        return FADF_HAVEIID | FADF_DISPATCH;
    default:
        return FADF_HAVEVARTYPE;
    }
}

SAFEARRAY* AllocateDescriptor(USHORT dims) {
    auto* block = static_cast<char*>(
        std::calloc(1, kPrefix + sizeof(SAFEARRAY) + (dims - 1) * sizeof(SAFEARRAYBOUND)));
    if (!block)
        return nullptr;
    auto* array = reinterpret_cast<SAFEARRAY*>(block + kPrefix);
    array->cDims = dims;
    return array;
}

void FreeDescriptor(SAFEARRAY* array) {
    std::free(reinterpret_cast<char*>(array) - kPrefix);
}

// Element counts are checked against 32 bits when an array is made, so a
// made array's count and byte size always fit.
bool CountElements(const SAFEARRAY* array, ULONG& count) {
    unsigned long long total = 1;
    for (USHORT d = 0; d < array->cDims; ++d) {
        total *= array->rgsabound[d].cElements;
        if (total > kMaxCount)
            return false;
    }
    count = static_cast<ULONG>(total);
    return true;
}

// Allocates zeroed data for the descriptor's bounds; E_INVALIDARG when the
// bounds cannot be counted.
HRESULT AllocateData(SAFEARRAY* array) {
    ULONG count = 0;
    if (!CountElements(array, count) ||
        static_cast<unsigned long long>(count) * array->cbElements > kMaxCount)
        return E_INVALIDARG;
    // One byte at least, so that an empty array still has data to lock.
    array->pvData = std::calloc(std::size_t{count} * array->cbElements + 1, 1);
    return array->pvData ? S_OK : E_OUTOFMEMORY;
}

char* Element(SAFEARRAY* array, std::size_t index) {
    return static_cast<char*>(array->pvData) + index * array->cbElements;
}

// Frees the string, clears the variant or releases the interface an element holds.
void ClearElement(const SAFEARRAY* array, char* element) {
    if (array->fFeatures & FADF_BSTR) {
        SysFreeString(*reinterpret_cast<BSTR*>(element));
    } else if (array->fFeatures & FADF_VARIANT) {
        VariantClear(reinterpret_cast<VARIANT*>(element));
    } else if (IUnknown* item = *reinterpret_cast<IUnknown**>(element)) {
        item->Release();
    }
}

void ClearElements(SAFEARRAY* array) {
    ULONG count = 0;
    if (!(array->fFeatures & kOwnedElements) || !array->pvData || !CountElements(array, count))
        return;
    for (ULONG i = 0; i < count; ++i)
        ClearElement(array, Element(array, i));
}

void DestroyData(SAFEARRAY* array) {
    ClearElements(array);
    if (!(array->fFeatures & kCallerMemory))
        std::free(array->pvData);
    array->pvData = nullptr;
}

BSTR CopyString(BSTR text) {
    return SysAllocStringByteLen(reinterpret_cast<LPCSTR>(text), SysStringByteLen(text));
}

// Copies one element into uninitialised storage, duplicating what it owns.
HRESULT CopyElement(const SAFEARRAY* array, const void* from, void* to) {
    if (array->fFeatures & FADF_BSTR) {
        const BSTR text = *static_cast<const BSTR*>(from);
        BSTR copy = text ? CopyString(text) : nullptr;
        if (text && !copy)
            return E_OUTOFMEMORY;
        *static_cast<BSTR*>(to) = copy;
    } else if (array->fFeatures & FADF_VARIANT) {
        auto* variant = static_cast<VARIANT*>(to);
        VariantInit(variant);
        return VariantCopy(variant, static_cast<const VARIANT*>(from));
    } else if (array->fFeatures & (FADF_UNKNOWN | FADF_DISPATCH)) {
        IUnknown* item = *static_cast<IUnknown* const*>(from);
        if (item)
            item->AddRef();
        *static_cast<IUnknown**>(to) = item;
    } else {
        std::memcpy(to, from, array->cbElements);
    }
    return S_OK;
}

// The element the indices name, first dimension first and fastest; the
// descriptor keeps the first dimension's bounds last.
HRESULT Locate(SAFEARRAY* array, const LONG* indices, char*& element) {
    // A descriptor made by the caller may have no data yet.
    if (!array->pvData)
        return E_INVALIDARG;
    unsigned long long offset = 0, stride = 1;
    for (USHORT d = 0; d < array->cDims; ++d) {
        const SAFEARRAYBOUND& bound = array->rgsabound[array->cDims - 1 - d];
        const long long index = static_cast<long long>(indices[d]) - bound.lLbound;
        if (index < 0 || index >= static_cast<long long>(bound.cElements))
            return DISP_E_BADINDEX;
        offset += static_cast<unsigned long long>(index) * stride;
        stride *= bound.cElements;
    }
    element = Element(array, offset);
    return S_OK;
}

} // namespace

extern "C" {

SAFEARRAY* WINAPI SafeArrayCreate(VARTYPE vt, UINT dims, SAFEARRAYBOUND* bounds) {
    const ULONG size = ElementSize(vt);
    if (!size || !bounds || dims == 0 || dims > std::numeric_limits<USHORT>::max())
        return nullptr;
    for (UINT d = 0; d < dims; ++d) {
        // The upper bound must be a LONG too.
        if (bounds[d].cElements &&
            bounds[d].lLbound + (bounds[d].cElements - 1LL) > std::numeric_limits<LONG>::max())
            return nullptr;
    }
    SAFEARRAY* array = AllocateDescriptor(static_cast<USHORT>(dims));
    if (!array)
        return nullptr;
    array->fFeatures = Features(vt);
    array->cbElements = size;
    *StoredType(array) = vt;
    for (UINT d = 0; d < dims; ++d)
        array->rgsabound[dims - 1 - d] = bounds[d];
    if (FAILED(AllocateData(array))) {
        FreeDescriptor(array);
        return nullptr;
    }
    return array;
}

SAFEARRAY* WINAPI SafeArrayCreateVector(VARTYPE vt, LONG lowerBound, ULONG elements) {
    SAFEARRAYBOUND bound = {elements, lowerBound};
    return SafeArrayCreate(vt, 1, &bound);
}

HRESULT WINAPI SafeArrayDestroy(SAFEARRAY* array) {
    if (!array)
        return S_OK;
    if (array->cLocks)
        return DISP_E_ARRAYISLOCKED;
    DestroyData(array);
    FreeDescriptor(array);
    return S_OK;
}

HRESULT WINAPI SafeArrayCopy(SAFEARRAY* array, SAFEARRAY** copy) {
    if (!copy)
        return E_INVALIDARG;
    *copy = nullptr;
    if (!array)
        return S_OK;
    ULONG count = 0;
    if (array->cDims == 0 || !CountElements(array, count) || (count && !array->pvData))
        return E_INVALIDARG;
    SAFEARRAY* result = AllocateDescriptor(array->cDims);
    if (!result)
        return E_OUTOFMEMORY;
    result->fFeatures = array->fFeatures & ~kCallerMemory;
    result->cbElements = array->cbElements;
    // Only a descriptor that says so has a type stored before it.
    if (array->fFeatures & FADF_HAVEVARTYPE)
        *StoredType(result) = *StoredType(array);
    std::memcpy(result->rgsabound, array->rgsabound, array->cDims * sizeof(SAFEARRAYBOUND));
    HRESULT hr = AllocateData(result);
    if (FAILED(hr)) {
        FreeDescriptor(result);
        return hr;
    }
    if (result->fFeatures & kOwnedElements) {
        for (ULONG i = 0; i < count && SUCCEEDED(hr); ++i)
            hr = CopyElement(array, Element(array, i), Element(result, i));
    } else {
        std::memcpy(result->pvData, array->pvData, std::size_t{count} * array->cbElements);
    }
    if (FAILED(hr)) {
        // The elements not reached are still zero, which clears as nothing.
        SafeArrayDestroy(result);
        return hr;
    }
    *copy = result;
    return S_OK;
}

UINT WINAPI SafeArrayGetDim(SAFEARRAY* array) {
    return array ? array->cDims : 0;
}

UINT WINAPI SafeArrayGetElemsize(SAFEARRAY* array) {
    return array ? array->cbElements : 0;
}

HRESULT WINAPI SafeArrayGetLBound(SAFEARRAY* array, UINT dim, LONG* lowerBound) {
    if (!array || !lowerBound)
        return E_INVALIDARG;
    if (dim < 1 || dim > array->cDims)
        return DISP_E_BADINDEX;
    *lowerBound = array->rgsabound[array->cDims - dim].lLbound;
    return S_OK;
}

HRESULT WINAPI SafeArrayGetUBound(SAFEARRAY* array, UINT dim, LONG* upperBound) {
    if (!array || !upperBound)
        return E_INVALIDARG;
    if (dim < 1 || dim > array->cDims)
        return DISP_E_BADINDEX;
    const SAFEARRAYBOUND& bound = array->rgsabound[array->cDims - dim];
    *upperBound = static_cast<LONG>(bound.lLbound + (bound.cElements - 1LL));
    return S_OK;
}

HRESULT WINAPI SafeArrayGetVartype(SAFEARRAY* array, VARTYPE* vt) {
    if (!array || !vt)
        return E_INVALIDARG;
    if (array->fFeatures & FADF_HAVEVARTYPE)
        *vt = static_cast<VARTYPE>(*StoredType(array));
    else if (array->fFeatures & FADF_BSTR)
        *vt = VT_BSTR;
    else if (array->fFeatures & FADF_UNKNOWN)
        *vt = VT_UNKNOWN;
    else if (array->fFeatures & FADF_DISPATCH)
        *vt = VT_DISPATCH;
    else if (array->fFeatures & FADF_VARIANT)
        *vt = VT_VARIANT;
    else if (array->fFeatures & FADF_RECORD)
        *vt = VT_RECORD;
    else
        return E_INVALIDARG;
    return S_OK;
}

HRESULT WINAPI SafeArrayLock(SAFEARRAY* array) {
    if (!array)
        return E_INVALIDARG;
    if (array->cLocks == kMaxCount)
        return E_UNEXPECTED;
    ++array->cLocks;
    return S_OK;
}

HRESULT WINAPI SafeArrayUnlock(SAFEARRAY* array) {
    if (!array)
        return E_INVALIDARG;
    if (array->cLocks == 0)
        return E_UNEXPECTED;
    --array->cLocks;
    return S_OK;
}

HRESULT WINAPI SafeArrayAccessData(SAFEARRAY* array, void** data) {
    if (!array || !data)
        return E_INVALIDARG;
    const HRESULT hr = SafeArrayLock(array);
    if (SUCCEEDED(hr))
        *data = array->pvData;
    return hr;
}

HRESULT WINAPI SafeArrayUnaccessData(SAFEARRAY* array) {
    return SafeArrayUnlock(array);
}

HRESULT WINAPI SafeArrayPutElement(SAFEARRAY* array, LONG* indices, void* value) {
    if (!array || !indices)
        return E_INVALIDARG;
    // A null string or interface is a value; nothing else may be null.
    if (!value && !(array->fFeatures & (FADF_BSTR | FADF_UNKNOWN | FADF_DISPATCH)))
        return E_INVALIDARG;
    char* element = nullptr;
    HRESULT hr = Locate(array, indices, element);
    if (FAILED(hr))
        return hr;
    // Locked while the old element goes, so that code it runs cannot free the array.
    hr = SafeArrayLock(array);
    if (FAILED(hr))
        return hr;
    if (array->fFeatures & kOwnedElements) {
        // Strings and interfaces come by value, variants by address. The copy
        // is made first, so that a failure leaves the old element in place.
        const bool byValue = (array->fFeatures & FADF_VARIANT) == 0;
        alignas(VARIANT) char fresh[sizeof(VARIANT)];
        hr = CopyElement(array, byValue ? static_cast<const void*>(&value) : value, fresh);
        if (SUCCEEDED(hr)) {
            ClearElement(array, element);
            std::memcpy(element, fresh, byValue ? sizeof(void*) : sizeof(VARIANT));
        }
    } else {
        std::memcpy(element, value, array->cbElements);
    }
    SafeArrayUnlock(array);
    return hr;
}

HRESULT WINAPI SafeArrayGetElement(SAFEARRAY* array, LONG* indices, void* value) {
    if (!array || !indices || !value)
        return E_INVALIDARG;
    char* element = nullptr;
    HRESULT hr = Locate(array, indices, element);
    if (FAILED(hr))
        return hr;
    hr = SafeArrayLock(array);
    if (FAILED(hr))
        return hr;
    hr = CopyElement(array, element, value);
    SafeArrayUnlock(array);
    return hr;
}

} // extern "C"

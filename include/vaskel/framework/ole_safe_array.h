// COleSafeArray: a VARIANT that owns a safe array, with the array services
// as members that throw COleException with the failing HRESULT instead of
// returning it. Bounds and indices are taken as long and must fit the
// 32-bit LONG of the array: one that does not is E_INVALIDARG, never cut.
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/exceptions.h>
#include <vaskel/win32.h>

// Neither platform names the read-only variant pointer; the framework does.
typedef const VARIANT* LPCVARIANT;

namespace vaskel {

class VASKEL_API COleSafeArray : public tagVARIANT {
public:
    // VT_EMPTY.
    COleSafeArray();
    // A deep copy of the source's array (VariantCopy); a source that holds
    // no array is DISP_E_TYPEMISMATCH.
    explicit COleSafeArray(const VARIANT& source);
    COleSafeArray(const COleSafeArray& other);
    COleSafeArray& operator=(const COleSafeArray& other);
    COleSafeArray& operator=(const VARIANT& source);
    ~COleSafeArray();

    // Replaces the value with a new array of the given bounds (first
    // dimension first), all elements zero, empty text or VT_EMPTY.
    void Create(VARTYPE vtSrc, DWORD dims, SAFEARRAYBOUND* bounds);
    // Replaces the value with a vector of elements, copied from source when
    // given: an array of elements of vtSrc (BSTRs, interface pointers and
    // VARIANTs are copied deeply, as SafeArrayPutElement copies them).
    void CreateOneDim(VARTYPE vtSrc, DWORD elements, const void* source = nullptr,
                      long lowerBound = 0);
    // The element count of a one-dimensional array.
    DWORD GetOneDimSize();
    // Grows or shrinks a one-dimensional array at its end, keeping the lower
    // bound and the elements that remain; new elements are zero, cut ones
    // are freed. A locked array is DISP_E_ARRAYISLOCKED.
    void ResizeOneDim(DWORD elements);

    // The dimension count; 0 for a value that holds no array.
    DWORD GetDim();
    DWORD GetElemSize();
    // Dimensions count from 1.
    void GetLBound(DWORD dim, long* bound);
    void GetUBound(DWORD dim, long* bound);
    // indices holds one index per dimension, first dimension first. value is
    // as SafeArrayPutElement and SafeArrayGetElement take it: a BSTR or an
    // interface pointer itself, anything else (a VARIANT too) by address.
    // GetElement writes a copy that the caller owns.
    void PutElement(long* indices, void* value);
    void GetElement(long* indices, void* value);
    void AccessData(void** data);
    void UnaccessData();

    // Frees the array; the value becomes VT_EMPTY.
    void Clear();
    // Hands the value to the caller, who then owns it; this becomes VT_EMPTY.
    VARIANT Detach();
    // Takes over an array variant, which becomes VT_EMPTY; anything else is
    // E_INVALIDARG and leaves both as they were.
    void Attach(VARIANT& source);

    operator LPVARIANT() { return this; }
    operator LPCVARIANT() const { return this; }

private:
    SAFEARRAY* Array() const;
    // Replaces the value with an array that this object now owns.
    void TakeArray(VARTYPE vtSrc, SAFEARRAY* array);
};

} // namespace vaskel

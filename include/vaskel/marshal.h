// Automation values marshalled by value through a stream, and the owner of a
// global-memory block.
#pragma once

#include <vaskel/export.h>
#include <vaskel/win32.h>

namespace vaskel {

// Size, write, read back and release a VARIANT or a BSTR in a stream. Nothing
// is kept between calls: a reader calls Read... (or Release..., to discard)
// once for each Write..., in the same order.
//
// The stream form, little-endian and unaligned: a 2-byte VARTYPE, then the
// value. Strings are a 4-byte byte length (0 for a null string) and their
// UTF-16 bytes; VT_DISPATCH and VT_UNKNOWN are the packet CoMarshalInterface
// writes, so the reader gets a proxy in its own apartment; VT_I1 takes 1
// byte, VT_UI1 4 (the byte, then three zero bytes), 2-, 4- and 8-byte types
// their size, VT_DECIMAL the 16 bytes of the VARIANT. An array (VT_ARRAY with
// one of those element types or VT_VARIANT) is its dimension count (2 bytes),
// per dimension in the descriptor's order the element count and lower bound
// (4 bytes each), and every element in memory order as a marshalled VARIANT
// of the element type (a VT_VARIANT element as the VARIANT it holds).
//
// Every other type has no stream form: VT_NULL, VT_CY, VT_ERROR, records,
// by-reference values and arrays held by reference. Its size counts the
// 2-byte type field only, and a write writes that field and gives E_NOTIMPL.
// A null interface pointer cannot be marshalled either: CoMarshalInterface's
// failure is returned.
//
// Failures are returned, never thrown: stream errors as they came,
// E_UNEXPECTED for a stream that ends early or holds what no writer makes (a
// length or an element count beyond the bytes left, an element of another
// type than its array, arrays nested more than 64 deep), E_NOTIMPL for a type
// without a stream form, E_OUTOFMEMORY when an array or string cannot be made.
// After a failed write the stream holds a partial record; after a failed read
// the position is wherever the failure left it, and the VARIANT is empty.
class VASKEL_API CMarshalHelper {
public:
    // Adds to size the bytes the write will need (for interfaces the bound
    // CoGetMarshalSizeMax gives, whose failure is returned). A total beyond
    // 32 bits gives E_OUTOFMEMORY and leaves size as it was.
    static HRESULT GetVariantSizeForMarshalling(const VARIANT& v, ULONG& size, DWORD destContext,
                                                void* pvDestContext, DWORD marshalFlags);
    // The destination arguments go unchanged to CoMarshalInterface.
    static HRESULT WriteVariantForMarshalling(const VARIANT& v, IStream* stream, DWORD destContext,
                                              void* pvDestContext, DWORD marshalFlags);
    // Clears v first; on failure v is left empty and nothing leaks.
    static HRESULT ReadVariantFromMarshalling(VARIANT& v, IStream* stream);
    // Steps over a marshalled VARIANT, releasing the interface packets in it.
    static HRESULT ReleaseVariantFromMarshalling(IStream* stream);

    // Adds 4 plus the string's byte length (0 for null).
    static HRESULT GetBSTRSizeForMarshalling(BSTR s, ULONG& size);
    static HRESULT WriteBSTRForMarshalling(BSTR s, IStream* stream);
    // Frees *s if set, then reads; a length of 0 gives a null string, so an
    // empty string comes back null.
    static HRESULT ReadBSTRFromMarshalling(BSTR* s, IStream* stream);
    static HRESULT ReleaseBSTRFromMarshalling(IStream* stream);
};

// Owns one block of global memory and frees it when destroyed. Allocation
// failure shows only as a null handle.
class VASKEL_API CVKGlobalHandle {
public:
    CVKGlobalHandle() noexcept : m_handle(nullptr) {}
    // GlobalAlloc(flags, size).
    CVKGlobalHandle(DWORD size, UINT flags);
    // With copy as Copy(handle); without, takes handle over.
    CVKGlobalHandle(void* handle, bool copy);
    ~CVKGlobalHandle() { Release(); }
    CVKGlobalHandle(const CVKGlobalHandle&) = delete;
    CVKGlobalHandle& operator=(const CVKGlobalHandle&) = delete;

    // Frees the block, if any.
    void Release();
    // Frees the block held (unless it is handle) and takes handle over.
    void Attach(void* handle);
    // Gives the block up without freeing it.
    void* Detach();
    // Frees the block held, then holds a new fixed block with a copy of the
    // bytes of handle; null if that cannot be made or handle is null. Copying
    // the block already held changes nothing.
    void Copy(void* handle);

    bool good() const { return m_handle != nullptr; }
    bool operator!() const { return m_handle == nullptr; }
    void* GetHandle() const { return m_handle; }
    operator void*() const { return m_handle; }

private:
    HGLOBAL m_handle;
};

} // namespace vaskel

// VARIANTs and BSTRs marshalled by value. Every length and count read from the
// stream is checked against the bytes the stream still holds before anything
// is allocated for it, so a hostile stream cannot make us allocate without
// bound; nesting is capped so that it cannot exhaust the stack either.
#include <vaskel/marshal.h>
#include <vaskel/value.h>

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <limits>
#include <vector>

namespace vaskel {

namespace {

const int kMaxDepth = 64;
const ULONGLONG kTypeBytes = 2;
const ULONGLONG kBoundBytes = 8;
// Arrays of fixed-size values go through the stream in chunks of about this
// many bytes rather than two calls per element; small enough to stay in cache
// between encoding and copying.
const size_t kChunkBytes = 16 * 1024;

bool IsInterface(VARTYPE type) {
    return type == VT_DISPATCH || type == VT_UNKNOWN;
}

const IID& InterfaceId(VARTYPE type) {
    return type == VT_DISPATCH ? IID_IDispatch : IID_IUnknown;
}

// The value bytes of a fixed-size scalar in the stream; 0 for every other type.
ULONG ValueBytes(VARTYPE type) {
    switch (type) {
    case VT_I1:
        return 1;
    case VT_I2:
    case VT_BOOL:
    case VT_UI2:
        return 2;
    case VT_UI1: // the byte and three unused bytes
    case VT_I4:
    case VT_R4:
    case VT_UI4:
    case VT_INT:
    case VT_UINT:
        return 4;
    case VT_R8:
    case VT_DATE:
    case VT_I8:
    case VT_UI8:
        return 8;
    case VT_DECIMAL:
        return 16;
    default:
        return 0;
    }
}

bool IsArrayElementType(VARTYPE type) {
    return ValueBytes(type) != 0 || type == VT_BSTR || IsInterface(type) || type == VT_VARIANT;
}

// Whether type is one of the array types with a stream form.
bool IsMarshalledArray(VARTYPE type) {
    // No other flag: an unknown one would make the array one VariantClear
    // cannot free.
    return (type & ~VT_TYPEMASK) == VT_ARRAY &&
           IsArrayElementType(static_cast<VARTYPE>(type & VT_TYPEMASK));
}

// A scalar's value bytes, from a VARIANT's value (or a decimal element) to the
// stream form and back. The form is the little-endian memory image.
void EncodeValue(VARTYPE type, const void* value, unsigned char* out) {
    if (type == VT_UI1) {
        out[0] = *static_cast<const unsigned char*>(value);
        out[1] = out[2] = out[3] = 0;
    } else if (type == VT_DECIMAL) {
        // The reserved word of a decimal in a VARIANT is its type.
        out[0] = VT_DECIMAL;
        out[1] = 0;
        std::memcpy(out + 2, static_cast<const unsigned char*>(value) + 2, 14);
    } else {
        std::memcpy(out, value, ValueBytes(type));
    }
}

void DecodeValue(VARTYPE type, const unsigned char* in, void* value) {
    if (type == VT_UI1) {
        *static_cast<unsigned char*>(value) = in[0];
    } else if (type == VT_DECIMAL) {
        std::memcpy(value, in, 16);
        const USHORT reserved = VT_DECIMAL;
        std::memcpy(value, &reserved, sizeof(reserved));
    } else {
        std::memcpy(value, in, ValueBytes(type));
    }
}

// Where a VARIANT keeps the value of a scalar type.
const void* ValueOf(const VARIANT& v) {
    return v.vt == VT_DECIMAL ? static_cast<const void*>(&v.decVal)
                              : static_cast<const void*>(&v.llVal);
}

void PutType(VARTYPE type, unsigned char* out) {
    out[0] = static_cast<unsigned char>(type & 0xFF);
    out[1] = static_cast<unsigned char>(type >> 8);
}

VARTYPE GetType(const unsigned char* in) {
    return static_cast<VARTYPE>(in[0] | in[1] << 8);
}

// Records of fixed-size elements, the value size known at compile time so
// that each copy is a plain load and store.
template <size_t N>
void EncodeRecordsOf(VARTYPE type, const unsigned char* element, ULONG step, size_t n,
                     unsigned char* out) {
    for (size_t i = 0; i < n; ++i, element += step, out += kTypeBytes + N) {
        PutType(type, out);
        std::memcpy(out + kTypeBytes, element, N);
    }
}

void EncodeRecords(VARTYPE type, const unsigned char* element, ULONG step, size_t n,
                   unsigned char* out) {
    switch (ValueBytes(type)) {
    case 2:
        return EncodeRecordsOf<2>(type, element, step, n, out);
    case 8:
        return EncodeRecordsOf<8>(type, element, step, n, out);
    case 4:
        if (type != VT_UI1)
            return EncodeRecordsOf<4>(type, element, step, n, out);
        break;
    }
    const size_t record = kTypeBytes + ValueBytes(type);
    for (size_t i = 0; i < n; ++i, element += step, out += record) {
        PutType(type, out);
        EncodeValue(type, element, out + kTypeBytes);
    }
}

// False at the first record of another type. A null element only checks.
template <size_t N>
bool DecodeRecordsOf(VARTYPE type, const unsigned char* in, size_t n, unsigned char* element,
                     ULONG step) {
    for (size_t i = 0; i < n; ++i, in += kTypeBytes + N) {
        if (GetType(in) != type)
            return false;
        if (element) {
            std::memcpy(element, in + kTypeBytes, N);
            element += step;
        }
    }
    return true;
}

bool DecodeRecords(VARTYPE type, const unsigned char* in, size_t n, unsigned char* element,
                   ULONG step) {
    switch (ValueBytes(type)) {
    case 2:
        return DecodeRecordsOf<2>(type, in, n, element, step);
    case 8:
        return DecodeRecordsOf<8>(type, in, n, element, step);
    case 4:
        if (type != VT_UI1)
            return DecodeRecordsOf<4>(type, in, n, element, step);
        break;
    }
    const size_t record = kTypeBytes + ValueBytes(type);
    for (size_t i = 0; i < n; ++i, in += record) {
        if (GetType(in) != type)
            return false;
        if (element) {
            DecodeValue(type, in + kTypeBytes, element);
            element += step;
        }
    }
    return true;
}

HRESULT WriteBytes(IStream* stream, const void* data, ULONG count) {
    if (count == 0)
        return S_OK;
    ULONG written = 0;
    const HRESULT hr = stream->Write(data, count, &written);
    if (FAILED(hr))
        return hr;
    return written == count ? S_OK : STG_E_MEDIUMFULL;
}

HRESULT ReadBytes(IStream* stream, void* data, ULONG count) {
    if (count == 0)
        return S_OK;
    ULONG read = 0;
    const HRESULT hr = stream->Read(data, count, &read);
    if (FAILED(hr))
        return hr;
    return read == count ? S_OK : E_UNEXPECTED;
}

HRESULT WriteType(IStream* stream, VARTYPE type) {
    unsigned char bytes[2];
    PutType(type, bytes);
    return WriteBytes(stream, bytes, 2);
}

HRESULT ReadType(IStream* stream, VARTYPE& type) {
    unsigned char bytes[2];
    const HRESULT hr = ReadBytes(stream, bytes, 2);
    if (SUCCEEDED(hr))
        type = GetType(bytes);
    return hr;
}

HRESULT ReadULong(IStream* stream, ULONG& value) {
    unsigned char bytes[4];
    const HRESULT hr = ReadBytes(stream, bytes, 4);
    if (SUCCEEDED(hr))
        value = static_cast<ULONG>(bytes[0]) | static_cast<ULONG>(bytes[1]) << 8 |
                static_cast<ULONG>(bytes[2]) << 16 | static_cast<ULONG>(bytes[3]) << 24;
    return hr;
}

// The bytes between the stream's position and its end.
HRESULT RemainingBytes(IStream* stream, ULONGLONG& remaining) {
    LARGE_INTEGER zero;
    zero.QuadPart = 0;
    ULARGE_INTEGER position;
    HRESULT hr = stream->Seek(zero, STREAM_SEEK_CUR, &position);
    if (FAILED(hr))
        return hr;
    ULONGLONG size = 0;
    STATSTG stat;
    if (SUCCEEDED(stream->Stat(&stat, STATFLAG_NONAME))) {
        size = stat.cbSize.QuadPart;
    } else {
        // Not every stream keeps statistics; every seekable one has an end.
        ULARGE_INTEGER end;
        hr = stream->Seek(zero, STREAM_SEEK_END, &end);
        if (FAILED(hr))
            return hr;
        LARGE_INTEGER back;
        back.QuadPart = static_cast<LONGLONG>(position.QuadPart);
        hr = stream->Seek(back, STREAM_SEEK_SET, nullptr);
        if (FAILED(hr))
            return hr;
        size = end.QuadPart;
    }
    remaining = size > position.QuadPart ? size - position.QuadPart : 0;
    return S_OK;
}

// Seeking past the end succeeds on a stream, so the bytes are checked first.
HRESULT Skip(IStream* stream, ULONG count) {
    ULONGLONG remaining = 0;
    HRESULT hr = RemainingBytes(stream, remaining);
    if (FAILED(hr))
        return hr;
    if (count > remaining)
        return E_UNEXPECTED;
    LARGE_INTEGER move;
    move.QuadPart = count;
    return stream->Seek(move, STREAM_SEEK_CUR, nullptr);
}

// An array's data, locked while this lives.
class ArrayAccess {
public:
    explicit ArrayAccess(SAFEARRAY* array) : m_array(array), m_data(nullptr) {
        m_hr = array ? SafeArrayAccessData(array, &m_data) : E_INVALIDARG;
    }
    ~ArrayAccess() {
        if (SUCCEEDED(m_hr))
            SafeArrayUnaccessData(m_array);
    }
    ArrayAccess(const ArrayAccess&) = delete;
    ArrayAccess& operator=(const ArrayAccess&) = delete;

    HRESULT Result() const { return m_hr; }
    unsigned char* Data() const { return static_cast<unsigned char*>(m_data); }

private:
    SAFEARRAY* m_array;
    void* m_data;
    HRESULT m_hr;
};

ULONGLONG ElementCount(const SAFEARRAY* array) {
    ULONGLONG count = 1;
    for (USHORT d = 0; d < array->cDims; ++d)
        count *= array->rgsabound[d].cElements;
    return count;
}

// An array that can be walked as elemType: its elements are at least that big.
HRESULT CheckArray(const VARIANT& v, VARTYPE elemType) {
    if (v.parray == nullptr || v.parray->cDims == 0)
        return E_INVALIDARG;
    if (SafeArrayGetElemsize(v.parray) < safearrayvector::GetDataSize(elemType))
        return E_INVALIDARG;
    return S_OK;
}

HRESULT VariantSize(const VARIANT& v, ULONGLONG& size, DWORD destContext, void* pvDestContext,
                    DWORD marshalFlags, int depth);

HRESULT ArraySize(const VARIANT& v, ULONGLONG& size, DWORD destContext, void* pvDestContext,
                  DWORD marshalFlags, int depth) {
    const VARTYPE elemType = static_cast<VARTYPE>(v.vt & VT_TYPEMASK);
    HRESULT hr = CheckArray(v, elemType);
    if (FAILED(hr))
        return hr;
    SAFEARRAY* array = v.parray;
    size += 2 + kBoundBytes * array->cDims;
    const ULONGLONG count = ElementCount(array);
    if (ValueBytes(elemType) != 0) {
        size += count * (kTypeBytes + ValueBytes(elemType));
        return S_OK;
    }
    ArrayAccess access(array);
    if (FAILED(access.Result()))
        return access.Result();
    const ULONG step = SafeArrayGetElemsize(array);
    unsigned char* element = access.Data();
    for (ULONGLONG i = 0; i < count && SUCCEEDED(hr); ++i, element += step) {
        if (elemType == VT_VARIANT) {
            hr = VariantSize(*reinterpret_cast<VARIANT*>(element), size, destContext, pvDestContext,
                             marshalFlags, depth + 1);
        } else {
            VARIANT view; // borrows the element
            hr = safearrayvector::SetVariantValue(view, elemType, element, false);
            if (SUCCEEDED(hr))
                hr = VariantSize(view, size, destContext, pvDestContext, marshalFlags, depth + 1);
        }
    }
    return hr;
}

HRESULT VariantSize(const VARIANT& v, ULONGLONG& size, DWORD destContext, void* pvDestContext,
                    DWORD marshalFlags, int depth) {
    size += kTypeBytes;
    if (v.vt == VT_BSTR) {
        size += 4 + static_cast<ULONGLONG>(SysStringByteLen(v.bstrVal));
    } else if (IsInterface(v.vt)) {
        ULONG packet = 0;
        const HRESULT hr = CoGetMarshalSizeMax(&packet, InterfaceId(v.vt), v.punkVal, destContext,
                                               pvDestContext, marshalFlags);
        if (FAILED(hr))
            return hr;
        size += packet;
    } else if (IsMarshalledArray(v.vt)) {
        // Deeper than a reader takes (and arrays that hold themselves).
        if (depth >= kMaxDepth)
            return E_INVALIDARG;
        return ArraySize(v, size, destContext, pvDestContext, marshalFlags, depth);
    } else {
        size += ValueBytes(v.vt); // 0 for VT_EMPTY and the types without a stream form
    }
    return S_OK;
}

HRESULT WriteVariant(const VARIANT& v, IStream* stream, DWORD destContext, void* pvDestContext,
                     DWORD marshalFlags, int depth);

// Fixed-size elements: whole chunks of records per stream call, the same
// bytes as one record per element.
HRESULT WriteFixedElements(VARTYPE elemType, const unsigned char* element, ULONG step,
                           ULONGLONG count, IStream* stream) {
    const size_t record = kTypeBytes + ValueBytes(elemType);
    const size_t perChunk = kChunkBytes / record;
    std::vector<unsigned char> buffer(static_cast<size_t>(std::min<ULONGLONG>(count, perChunk)) *
                                      record);
    while (count > 0) {
        const size_t n = static_cast<size_t>(std::min<ULONGLONG>(count, perChunk));
        EncodeRecords(elemType, element, step, n, buffer.data());
        element += n * step;
        const HRESULT hr = WriteBytes(stream, buffer.data(), static_cast<ULONG>(n * record));
        if (FAILED(hr))
            return hr;
        count -= n;
    }
    return S_OK;
}

HRESULT WriteArray(const VARIANT& v, IStream* stream, DWORD destContext, void* pvDestContext,
                   DWORD marshalFlags, int depth) {
    const VARTYPE elemType = static_cast<VARTYPE>(v.vt & VT_TYPEMASK);
    HRESULT hr = CheckArray(v, elemType);
    if (FAILED(hr))
        return hr;
    SAFEARRAY* array = v.parray;
    std::vector<unsigned char> header(2 + kBoundBytes * array->cDims);
    header[0] = static_cast<unsigned char>(array->cDims & 0xFF);
    header[1] = static_cast<unsigned char>(array->cDims >> 8);
    for (USHORT d = 0; d < array->cDims; ++d) {
        const ULONG bound[2] = {array->rgsabound[d].cElements,
                                static_cast<ULONG>(array->rgsabound[d].lLbound)};
        for (int half = 0; half < 2; ++half)
            for (int b = 0; b < 4; ++b)
                header[2 + kBoundBytes * d + 4 * half + b] =
                    static_cast<unsigned char>(bound[half] >> (8 * b));
    }
    hr = WriteBytes(stream, header.data(), static_cast<ULONG>(header.size()));
    if (FAILED(hr))
        return hr;
    ArrayAccess access(array);
    if (FAILED(access.Result()))
        return access.Result();
    const ULONG step = SafeArrayGetElemsize(array);
    const ULONGLONG count = ElementCount(array);
    unsigned char* element = access.Data();
    if (ValueBytes(elemType) != 0)
        return WriteFixedElements(elemType, element, step, count, stream);
    for (ULONGLONG i = 0; i < count && SUCCEEDED(hr); ++i, element += step) {
        if (elemType == VT_VARIANT) {
            hr = WriteVariant(*reinterpret_cast<VARIANT*>(element), stream, destContext,
                              pvDestContext, marshalFlags, depth + 1);
        } else {
            VARIANT view; // borrows the element
            hr = safearrayvector::SetVariantValue(view, elemType, element, false);
            if (SUCCEEDED(hr))
                hr =
                    WriteVariant(view, stream, destContext, pvDestContext, marshalFlags, depth + 1);
        }
    }
    return hr;
}

HRESULT WriteVariant(const VARIANT& v, IStream* stream, DWORD destContext, void* pvDestContext,
                     DWORD marshalFlags, int depth) {
    HRESULT hr = WriteType(stream, v.vt);
    if (FAILED(hr) || v.vt == VT_EMPTY)
        return hr;
    if (v.vt == VT_BSTR)
        return CMarshalHelper::WriteBSTRForMarshalling(v.bstrVal, stream);
    if (IsInterface(v.vt))
        return CoMarshalInterface(stream, InterfaceId(v.vt), v.punkVal, destContext, pvDestContext,
                                  marshalFlags);
    if (IsMarshalledArray(v.vt))
        return depth >= kMaxDepth
                   ? E_INVALIDARG
                   : WriteArray(v, stream, destContext, pvDestContext, marshalFlags, depth);
    const ULONG bytes = ValueBytes(v.vt);
    if (bytes == 0)
        return E_NOTIMPL;
    unsigned char value[16];
    EncodeValue(v.vt, ValueOf(v), value);
    return WriteBytes(stream, value, bytes);
}

// The dimension count and bounds of an array record, checked so that the
// array they describe could be filled from the rest of the stream.
HRESULT ReadArrayHeader(IStream* stream, VARTYPE elemType, std::vector<SAFEARRAYBOUND>& bounds,
                        ULONG& count) {
    unsigned char dimBytes[2];
    HRESULT hr = ReadBytes(stream, dimBytes, 2);
    if (FAILED(hr))
        return hr;
    const USHORT dims = static_cast<USHORT>(dimBytes[0] | dimBytes[1] << 8);
    if (dims == 0)
        return E_UNEXPECTED;
    ULONGLONG remaining = 0;
    hr = RemainingBytes(stream, remaining);
    if (FAILED(hr))
        return hr;
    if (kBoundBytes * dims > remaining)
        return E_UNEXPECTED;
    std::vector<unsigned char> raw(kBoundBytes * dims);
    hr = ReadBytes(stream, raw.data(), static_cast<ULONG>(raw.size()));
    if (FAILED(hr))
        return hr;
    remaining -= raw.size();
    bounds.resize(dims);
    ULONGLONG product = 1;
    for (USHORT d = 0; d < dims; ++d) {
        const unsigned char* p = &raw[kBoundBytes * d];
        ULONG field[2];
        for (int half = 0; half < 2; ++half)
            field[half] = static_cast<ULONG>(p[4 * half]) |
                          static_cast<ULONG>(p[4 * half + 1]) << 8 |
                          static_cast<ULONG>(p[4 * half + 2]) << 16 |
                          static_cast<ULONG>(p[4 * half + 3]) << 24;
        bounds[d].cElements = field[0];
        bounds[d].lLbound = static_cast<LONG>(field[1]);
        product *= field[0];
        if (product > std::numeric_limits<ULONG>::max())
            return E_UNEXPECTED;
    }
    // Every element needs at least its type field; fixed-size ones need all
    // their bytes.
    const ULONGLONG record = kTypeBytes + ValueBytes(elemType);
    if (product * record > remaining)
        return E_UNEXPECTED;
    count = static_cast<ULONG>(product);
    return S_OK;
}

HRESULT ReadVariant(VARIANT& v, IStream* stream, int depth);

// With a null element the records are checked and stepped over.
HRESULT ReadFixedElements(VARTYPE elemType, unsigned char* element, ULONG step, ULONG count,
                          IStream* stream) {
    const size_t record = kTypeBytes + ValueBytes(elemType);
    const size_t perChunk = kChunkBytes / record;
    std::vector<unsigned char> buffer(std::min<size_t>(count, perChunk) * record);
    while (count > 0) {
        const size_t n = std::min<size_t>(count, perChunk);
        const HRESULT hr = ReadBytes(stream, buffer.data(), static_cast<ULONG>(n * record));
        if (FAILED(hr))
            return hr;
        if (!DecodeRecords(elemType, buffer.data(), n, element, step))
            return E_UNEXPECTED;
        if (element)
            element += n * step;
        count -= static_cast<ULONG>(n);
    }
    return S_OK;
}

HRESULT ReadArrayElements(VARTYPE elemType, SAFEARRAY* array, ULONG count, IStream* stream,
                          int depth) {
    ArrayAccess access(array);
    if (FAILED(access.Result()))
        return access.Result();
    const ULONG step = SafeArrayGetElemsize(array);
    unsigned char* element = access.Data();
    if (ValueBytes(elemType) != 0)
        return ReadFixedElements(elemType, element, step, count, stream);
    for (ULONG i = 0; i < count; ++i, element += step) {
        VARIANT item;
        VariantInit(&item);
        HRESULT hr = ReadVariant(item, stream, depth + 1);
        if (FAILED(hr))
            return hr;
        if (elemType == VT_VARIANT) {
            std::memcpy(element, &item, sizeof(VARIANT));
            continue;
        }
        // A string or interface array holds only its own type.
        hr = item.vt == elemType ? safearrayvector::GetVariantValue(element, item, false)
                                 : E_UNEXPECTED;
        VariantClear(&item);
        if (FAILED(hr))
            return hr;
    }
    return S_OK;
}

HRESULT ReadArray(VARIANT& v, VARTYPE type, IStream* stream, int depth) {
    const VARTYPE elemType = static_cast<VARTYPE>(type & VT_TYPEMASK);
    std::vector<SAFEARRAYBOUND> bounds;
    ULONG count = 0;
    HRESULT hr = ReadArrayHeader(stream, elemType, bounds, count);
    if (FAILED(hr))
        return hr;
    // SafeArrayCreate takes the dimensions in the reverse of the order the
    // descriptor keeps them.
    std::reverse(bounds.begin(), bounds.end());
    SAFEARRAY* array = SafeArrayCreate(elemType, static_cast<UINT>(bounds.size()), bounds.data());
    if (array == nullptr)
        return E_OUTOFMEMORY;
    hr = ReadArrayElements(elemType, array, count, stream, depth);
    if (FAILED(hr)) {
        SafeArrayDestroy(array);
        return hr;
    }
    v.vt = type;
    v.parray = array;
    return S_OK;
}

HRESULT ReadVariant(VARIANT& v, IStream* stream, int depth) {
    VARTYPE type = VT_EMPTY;
    HRESULT hr = ReadType(stream, type);
    if (FAILED(hr))
        return hr;
    if (type == VT_EMPTY)
        return S_OK;
    if (type == VT_BSTR) {
        BSTR text = nullptr;
        hr = CMarshalHelper::ReadBSTRFromMarshalling(&text, stream);
        if (SUCCEEDED(hr)) {
            v.vt = VT_BSTR;
            v.bstrVal = text;
        }
        return hr;
    }
    if (IsInterface(type)) {
        void* object = nullptr;
        hr = CoUnmarshalInterface(stream, InterfaceId(type), &object);
        if (SUCCEEDED(hr)) {
            v.vt = type;
            v.punkVal = static_cast<IUnknown*>(object);
        }
        return hr;
    }
    if (IsMarshalledArray(type)) {
        if (depth >= kMaxDepth)
            return E_UNEXPECTED;
        return ReadArray(v, type, stream, depth);
    }
    const ULONG bytes = ValueBytes(type);
    if (bytes == 0)
        return E_NOTIMPL;
    unsigned char value[16];
    hr = ReadBytes(stream, value, bytes);
    if (FAILED(hr))
        return hr;
    VARIANT built;
    std::memset(&built, 0, sizeof(built));
    DecodeValue(type, value,
                type == VT_DECIMAL ? static_cast<void*>(&built.decVal)
                                   : static_cast<void*>(&built.llVal));
    built.vt = type;
    v = built;
    return S_OK;
}

HRESULT ReleaseVariant(IStream* stream, VARTYPE expected, int depth);

HRESULT ReleaseArray(VARTYPE type, IStream* stream, int depth) {
    if (depth >= kMaxDepth)
        return E_UNEXPECTED;
    const VARTYPE elemType = static_cast<VARTYPE>(type & VT_TYPEMASK);
    std::vector<SAFEARRAYBOUND> bounds;
    ULONG count = 0;
    HRESULT hr = ReadArrayHeader(stream, elemType, bounds, count);
    if (FAILED(hr))
        return hr;
    if (ValueBytes(elemType) != 0)
        return ReadFixedElements(elemType, nullptr, 0, count, stream);
    const VARTYPE expected = elemType == VT_VARIANT ? VARTYPE{VT_EMPTY} : elemType;
    for (ULONG i = 0; i < count && SUCCEEDED(hr); ++i)
        hr = ReleaseVariant(stream, expected, depth + 1);
    return hr;
}

// expected: the type an array element must have, or VT_EMPTY for any.
HRESULT ReleaseVariant(IStream* stream, VARTYPE expected, int depth) {
    VARTYPE type = VT_EMPTY;
    HRESULT hr = ReadType(stream, type);
    if (FAILED(hr))
        return hr;
    if (expected != VT_EMPTY && type != expected)
        return E_UNEXPECTED;
    if (type == VT_EMPTY)
        return S_OK;
    if (type == VT_BSTR)
        return CMarshalHelper::ReleaseBSTRFromMarshalling(stream);
    if (IsInterface(type))
        return CoReleaseMarshalData(stream);
    if (IsMarshalledArray(type))
        return ReleaseArray(type, stream, depth);
    const ULONG bytes = ValueBytes(type);
    return bytes == 0 ? E_NOTIMPL : Skip(stream, bytes);
}

} // namespace

HRESULT CMarshalHelper::GetVariantSizeForMarshalling(const VARIANT& v, ULONG& size,
                                                     DWORD destContext, void* pvDestContext,
                                                     DWORD marshalFlags) {
    ULONGLONG total = size;
    const HRESULT hr = VariantSize(v, total, destContext, pvDestContext, marshalFlags, 0);
    if (FAILED(hr))
        return hr;
    if (total > std::numeric_limits<ULONG>::max())
        return E_OUTOFMEMORY;
    size = static_cast<ULONG>(total);
    return S_OK;
}

HRESULT CMarshalHelper::WriteVariantForMarshalling(const VARIANT& v, IStream* stream,
                                                   DWORD destContext, void* pvDestContext,
                                                   DWORD marshalFlags) {
    if (stream == nullptr)
        return E_INVALIDARG;
    return WriteVariant(v, stream, destContext, pvDestContext, marshalFlags, 0);
}

HRESULT CMarshalHelper::ReadVariantFromMarshalling(VARIANT& v, IStream* stream) {
    VariantClear(&v);
    if (stream == nullptr)
        return E_INVALIDARG;
    VARIANT result;
    VariantInit(&result);
    const HRESULT hr = ReadVariant(result, stream, 0);
    if (SUCCEEDED(hr))
        v = result;
    return hr;
}

HRESULT CMarshalHelper::ReleaseVariantFromMarshalling(IStream* stream) {
    if (stream == nullptr)
        return E_INVALIDARG;
    return ReleaseVariant(stream, VT_EMPTY, 0);
}

HRESULT CMarshalHelper::GetBSTRSizeForMarshalling(BSTR s, ULONG& size) {
    size += 4 + SysStringByteLen(s);
    return S_OK;
}

HRESULT CMarshalHelper::WriteBSTRForMarshalling(BSTR s, IStream* stream) {
    if (stream == nullptr)
        return E_INVALIDARG;
    const ULONG length = SysStringByteLen(s);
    const unsigned char bytes[4] = {
        static_cast<unsigned char>(length), static_cast<unsigned char>(length >> 8),
        static_cast<unsigned char>(length >> 16), static_cast<unsigned char>(length >> 24)};
    const HRESULT hr = WriteBytes(stream, bytes, 4);
    if (FAILED(hr))
        return hr;
    return WriteBytes(stream, s, length);
}

HRESULT CMarshalHelper::ReadBSTRFromMarshalling(BSTR* s, IStream* stream) {
    if (s == nullptr || stream == nullptr)
        return E_INVALIDARG;
    if (*s) {
        SysFreeString(*s);
        *s = nullptr;
    }
    ULONG length = 0;
    HRESULT hr = ReadULong(stream, length);
    if (FAILED(hr) || length == 0)
        return hr;
    ULONGLONG remaining = 0;
    hr = RemainingBytes(stream, remaining);
    if (FAILED(hr))
        return hr;
    if (length > remaining)
        return E_UNEXPECTED;
    BSTR text = SysAllocStringByteLen(nullptr, length);
    if (text == nullptr)
        return E_OUTOFMEMORY;
    hr = ReadBytes(stream, text, length);
    if (FAILED(hr)) {
        SysFreeString(text);
        return hr;
    }
    *s = text;
    return S_OK;
}

HRESULT CMarshalHelper::ReleaseBSTRFromMarshalling(IStream* stream) {
    if (stream == nullptr)
        return E_INVALIDARG;
    ULONG length = 0;
    const HRESULT hr = ReadULong(stream, length);
    if (FAILED(hr))
        return hr;
    return Skip(stream, length);
}

} // namespace vaskel

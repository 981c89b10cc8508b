// Feeds arbitrary bytes, as a stream on global memory, to the marshalled-
// VARIANT reader and to the step that releases a record. Neither may crash,
// leak or allocate beyond what the bytes describe; a value that reads must
// write back to the bytes it was read from.
#include <vaskel/marshal.h>
#include <vaskel/win32.h>

#include <cstdint>
#include <cstdlib>
#include <cstring>

namespace {

IStream* StreamOn(const std::uint8_t* data, std::size_t size) {
    HGLOBAL global = GlobalAlloc(GMEM_MOVEABLE, size);
    if (global == nullptr)
        std::abort();
    if (size > 0) {
        std::memcpy(GlobalLock(global), data, size);
        GlobalUnlock(global);
    }
    IStream* stream = nullptr;
    if (FAILED(CreateStreamOnHGlobal(global, TRUE, &stream)))
        std::abort();
    return stream;
}

ULONGLONG Position(IStream* stream) {
    LARGE_INTEGER zero;
    zero.QuadPart = 0;
    ULARGE_INTEGER position;
    if (FAILED(stream->Seek(zero, STREAM_SEEK_CUR, &position)))
        std::abort();
    return position.QuadPart;
}

// What was read writes back as the same bytes, except the unused bytes
// after a VT_UI1 value and the reserved word of a decimal, which the reader
// does not keep; so only the record's length is compared.
void CheckRewrite(const VARIANT& value, ULONGLONG readBytes) {
    ULONG size = 0;
    if (FAILED(vaskel::CMarshalHelper::GetVariantSizeForMarshalling(value, size, 0, nullptr, 0)))
        return; // interfaces: none can be read from arbitrary bytes
    IStream* out = StreamOn(nullptr, 0);
    if (FAILED(vaskel::CMarshalHelper::WriteVariantForMarshalling(value, out, 0, nullptr, 0)) ||
        Position(out) != size || size != readBytes)
        std::abort();
    out->Release();
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    // In an apartment, so that interface records reach the packet reader.
    static const HRESULT com = CoInitializeEx(nullptr, COINIT_MULTITHREADED);
    (void)com;
    IStream* stream = StreamOn(data, size);
    VARIANT value;
    VariantInit(&value);
    const HRESULT hr = vaskel::CMarshalHelper::ReadVariantFromMarshalling(value, stream);
    if (FAILED(hr) && value.vt != VT_EMPTY)
        std::abort();
    if (SUCCEEDED(hr))
        CheckRewrite(value, Position(stream));
    VariantClear(&value);

    LARGE_INTEGER start;
    start.QuadPart = 0;
    stream->Seek(start, STREAM_SEEK_SET, nullptr);
    vaskel::CMarshalHelper::ReleaseVariantFromMarshalling(stream);
    stream->Release();
    return 0;
}

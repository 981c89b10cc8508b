// A VT_ARRAY|VT_I4 of 100 000 elements written and read back, in pairs whose
// ratio reads off directly (bytes/s counts the 4-byte values):
//   RoundTrip_VK   CMarshalHelper into a stream on global memory and back
//                  into a new array
//   RoundTrip_Copy the dimension, bounds and values copied into a byte
//                  buffer and from it into a new array with memcpy
#include <vaskel/marshal.h>
#include <vaskel/win32.h>

#include <benchmark/benchmark.h>

#include <cstring>
#include <vector>

namespace {

const ULONG kElements = 100000;

SAFEARRAY* Values() {
    SAFEARRAY* array = SafeArrayCreateVector(VT_I4, 0, kElements);
    LONG* data = static_cast<LONG*>(array->pvData);
    for (ULONG i = 0; i < kElements; ++i)
        data[i] = static_cast<LONG>(i * 2654435761u);
    return array;
}

bool SameValues(SAFEARRAY* a, SAFEARRAY* b) {
    return a && b && b->cDims == 1 && b->rgsabound[0].cElements == kElements &&
           std::memcmp(a->pvData, b->pvData, kElements * sizeof(LONG)) == 0;
}

void Rewind(IStream* stream) {
    LARGE_INTEGER start;
    start.QuadPart = 0;
    stream->Seek(start, STREAM_SEEK_SET, nullptr);
}

void BM_RoundTrip_VK(benchmark::State& state) {
    VARIANT source;
    VariantInit(&source);
    source.vt = VT_ARRAY | VT_I4;
    source.parray = Values();
    IStream* stream = nullptr;
    CreateStreamOnHGlobal(nullptr, TRUE, &stream);
    bool ok = true;
    for (auto _ : state) {
        Rewind(stream);
        ok &= SUCCEEDED(vaskel::CMarshalHelper::WriteVariantForMarshalling(
            source, stream, MSHCTX_INPROC, nullptr, MSHLFLAGS_NORMAL));
        Rewind(stream);
        VARIANT back;
        VariantInit(&back);
        ok &= SUCCEEDED(vaskel::CMarshalHelper::ReadVariantFromMarshalling(back, stream));
        benchmark::DoNotOptimize(back.parray);
        ok &= SameValues(source.parray, back.parray);
        VariantClear(&back);
    }
    if (!ok)
        state.SkipWithError("the values did not come back");
    stream->Release();
    VariantClear(&source);
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * kElements * sizeof(LONG));
}

void BM_RoundTrip_Copy(benchmark::State& state) {
    SAFEARRAY* source = Values();
    std::vector<unsigned char> buffer;
    bool ok = true;
    for (auto _ : state) {
        buffer.clear();
        const USHORT dims = source->cDims;
        const size_t header = sizeof(dims) + dims * sizeof(SAFEARRAYBOUND);
        const size_t values = kElements * sizeof(LONG);
        buffer.resize(header + values);
        std::memcpy(buffer.data(), &dims, sizeof(dims));
        std::memcpy(buffer.data() + sizeof(dims), source->rgsabound, dims * sizeof(SAFEARRAYBOUND));
        std::memcpy(buffer.data() + header, source->pvData, values);

        SAFEARRAYBOUND bound;
        std::memcpy(&bound, buffer.data() + sizeof(dims), sizeof(bound));
        SAFEARRAY* back = SafeArrayCreate(VT_I4, 1, &bound);
        std::memcpy(back->pvData, buffer.data() + header, values);
        benchmark::DoNotOptimize(back);
        ok &= SameValues(source, back);
        SafeArrayDestroy(back);
    }
    if (!ok)
        state.SkipWithError("the values did not come back");
    SafeArrayDestroy(source);
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * kElements * sizeof(LONG));
}

BENCHMARK(BM_RoundTrip_VK)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_RoundTrip_Copy)->Unit(benchmark::kMicrosecond);

} // namespace

BENCHMARK_MAIN();

// CBlob's Base64 against Boost.Beast's, on the same 1 MiB of bytes, in pairs
// whose ratio reads off directly (bytes/s counts the binary side):
//   Encode  ToString, which also allocates its text and breaks it into lines
//           of 76 characters, against beast encode into a buffer with room
//   Decode  FromString of that text into a blob with room, against beast
//           decode of its own unbroken text into a buffer with room
#include <vaskel/value.h>

#include "random_bytes.h"

#include <benchmark/benchmark.h>
#include <boost/beast/core/detail/base64.hpp>

#include <algorithm>
#include <string>
#include <vector>

namespace {

namespace beast64 = boost::beast::detail::base64;

const DWORD inputBytes = 1 << 20;

void BM_Encode_VK(benchmark::State& state) {
    const std::vector<unsigned char> bytes = RandomBytes(inputBytes);
    const vaskel::CBlob blob(bytes.data(), inputBytes);
    for (auto _ : state) {
        vaskel::CString text = blob.ToString();
        benchmark::DoNotOptimize(text.GetString());
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * inputBytes);
}

void BM_Encode_Beast(benchmark::State& state) {
    const std::vector<unsigned char> bytes = RandomBytes(inputBytes);
    std::vector<char> text(beast64::encoded_size(inputBytes));
    for (auto _ : state) {
        beast64::encode(text.data(), bytes.data(), inputBytes);
        benchmark::DoNotOptimize(text.data());
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * inputBytes);
}

void BM_Decode_VK(benchmark::State& state) {
    const std::vector<unsigned char> bytes = RandomBytes(inputBytes);
    const vaskel::CString text = vaskel::CBlob(bytes.data(), inputBytes).ToString();
    vaskel::CBlob blob;
    for (auto _ : state) {
        blob.FromString(text);
        benchmark::DoNotOptimize(blob.GetData());
        benchmark::ClobberMemory();
    }
    if (blob.GetSize() != inputBytes || !std::equal(bytes.begin(), bytes.end(), blob.GetData()))
        state.SkipWithError("the decoded bytes differ");
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * inputBytes);
}

void BM_Decode_Beast(benchmark::State& state) {
    const std::vector<unsigned char> bytes = RandomBytes(inputBytes);
    std::string text(beast64::encoded_size(inputBytes), '\0');
    beast64::encode(&text[0], bytes.data(), inputBytes);
    std::vector<unsigned char> decoded(beast64::decoded_size(text.size()));
    for (auto _ : state) {
        beast64::decode(decoded.data(), text.data(), text.size());
        benchmark::DoNotOptimize(decoded.data());
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * inputBytes);
}

BENCHMARK(BM_Encode_VK)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_Encode_Beast)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_Decode_VK)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_Decode_Beast)->Unit(benchmark::kMicrosecond);

} // namespace

BENCHMARK_MAIN();

// Text helpers against plain reference code, in pairs run on the same input
// so the ratio of BM_X_VK to BM_X_Reference reads off directly:
//   BytesToString  a 1 MiB byte dump into a caller's buffer, in groups of 4
//                  bytes and 8 groups a line, against a loop that writes two
//                  hexadecimal digits a byte with no separators
#include <vaskel/text.h>

#include "random_bytes.h"

#include <benchmark/benchmark.h>

#include <cstddef>
#include <vector>

namespace {

// ---------------------------------------------------------------------------
// BytesToString

const DWORD dumpBytes = 1 << 20;

void BM_BytesToString_VK(benchmark::State& state) {
    const std::vector<unsigned char> bytes = RandomBytes(dumpBytes);
    const DWORD size = vaskel::VKCalcBytesToStringBufferSize(dumpBytes, 4, 8);
    std::vector<char> out(size);
    for (auto _ : state) {
        vaskel::VKBytesToString(bytes.data(), dumpBytes, out.data(), size, 4, 8);
        benchmark::DoNotOptimize(out.data());
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * dumpBytes);
}

void BM_BytesToString_Reference(benchmark::State& state) {
    static const char digits[] = "0123456789ABCDEF";
    const std::vector<unsigned char> bytes = RandomBytes(dumpBytes);
    std::vector<char> out(2 * static_cast<size_t>(dumpBytes));
    for (auto _ : state) {
        char* p = out.data();
        for (unsigned char byte : bytes) {
            *p++ = digits[byte >> 4];
            *p++ = digits[byte & 15];
        }
        benchmark::DoNotOptimize(out.data());
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * dumpBytes);
}

BENCHMARK(BM_BytesToString_VK)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_BytesToString_Reference)->Unit(benchmark::kMicrosecond);

} // namespace

BENCHMARK_MAIN();

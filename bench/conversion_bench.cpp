// Value conversions against the standard library, in pairs run in the same
// process so that the ratio reads off directly:
//   Double    AsString(double) against std::to_chars in fixed notation with 16
//             digits followed by the same trimming of trailing zeros
//   TimeSpan  CTimeSpan::ToString against snprintf of the same five numbers
#include <vaskel/calendar.h>
#include <vaskel/text.h>

#include <benchmark/benchmark.h>

#include <charconv>
#include <cstdio>
#include <random>
#include <string>
#include <vector>

namespace {

std::vector<double> Values() {
    std::mt19937_64 random(3);
    std::vector<double> values(1024);
    for (double& value : values)
        value = static_cast<double>(random() % 100000000) / 1000.0 - 50000.0;
    return values;
}

void BM_Double_AsString(benchmark::State& state) {
    const std::vector<double> values = Values();
    size_t i = 0;
    for (auto _ : state) {
        vaskel::CString text = vaskel::AsString(values[i++ & 1023]);
        benchmark::DoNotOptimize(text.GetString());
    }
}

void BM_Double_ToChars(benchmark::State& state) {
    const std::vector<double> values = Values();
    size_t i = 0;
    for (auto _ : state) {
        char digits[64];
        double value = values[i++ & 1023];
        char* end =
            std::to_chars(digits, digits + sizeof digits, value, std::chars_format::fixed, 16).ptr;
        // The same rule: trailing zeros go unless the value is below 0.1.
        if (!(value > -0.1 && value < 0.1)) {
            while (end[-1] == '0')
                --end;
            if (end[-1] == '.')
                --end;
        }
        std::string text(digits, end);
        benchmark::DoNotOptimize(text.data());
    }
}

BENCHMARK(BM_Double_AsString);
BENCHMARK(BM_Double_ToChars);

void BM_TimeSpan_ToString(benchmark::State& state) {
    vaskel::CTimeSpan span(1, 2, 3, 4, 5);
    for (auto _ : state) {
        vaskel::CString text = span.ToString();
        benchmark::DoNotOptimize(text.GetString());
    }
}

void BM_TimeSpan_Snprintf(benchmark::State& state) {
    int days = 1, hours = 2, minutes = 3, seconds = 4, milliseconds = 5;
    benchmark::DoNotOptimize(days);
    for (auto _ : state) {
        char text[64];
        int length = std::snprintf(text, sizeof text, "%d.%2d.%2d.%2d.%3d", days, hours, minutes,
                                   seconds, milliseconds);
        std::string result(text, static_cast<size_t>(length));
        benchmark::DoNotOptimize(result.data());
    }
}

BENCHMARK(BM_TimeSpan_ToString);
BENCHMARK(BM_TimeSpan_Snprintf);

} // namespace

BENCHMARK_MAIN();

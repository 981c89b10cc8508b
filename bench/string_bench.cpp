// CString against std::string, in pairs run with the same arguments so the
// ratio of BM_X_CString to BM_X_StdString reads off directly:
//   Copy         copy-construct a short (8) or long (1024 character) string
//   Append       build a string of N characters, one character at a time
//   Compare      compare two equal strings of N characters in separate buffers
//   CompareNoCase  the same strings in different case, ASCII case folded
//   Format       printf-style formatting: CString::Format against snprintf
//                measured then written into a std::string
#include <vaskel/framework/string.h>

#include <benchmark/benchmark.h>

#include <cstdio>
#include <string>

using vaskel::CString;

namespace {

std::string Sample(int64_t length) {
    std::string text;
    text.reserve(static_cast<size_t>(length));
    for (int64_t i = 0; i < length; ++i)
        text += static_cast<char>('a' + i % 26);
    return text;
}

std::string Upper(std::string text) {
    for (char& c : text)
        if (c >= 'a' && c <= 'z')
            c = static_cast<char>(c - 'a' + 'A');
    return text;
}

// A case-insensitive compare of std::strings as it is usually written:
// fold each ASCII letter to lower case and compare the bytes unsigned.
int CompareNoCase(const std::string& a, const std::string& b) {
    size_t n = a.size() < b.size() ? a.size() : b.size();
    for (size_t i = 0; i < n; ++i) {
        unsigned char x = static_cast<unsigned char>(a[i]);
        unsigned char y = static_cast<unsigned char>(b[i]);
        if (x >= 'A' && x <= 'Z')
            x = static_cast<unsigned char>(x + ('a' - 'A'));
        if (y >= 'A' && y <= 'Z')
            y = static_cast<unsigned char>(y + ('a' - 'A'));
        if (x != y)
            return x < y ? -1 : 1;
    }
    return a.size() < b.size() ? -1 : (a.size() > b.size() ? 1 : 0);
}

// ---------------------------------------------------------------------------
// Copy

void BM_Copy_CString(benchmark::State& state) {
    const CString source(Sample(state.range(0)).c_str());
    for (auto _ : state) {
        CString copy(source);
        benchmark::DoNotOptimize(copy.GetString());
    }
}
void BM_Copy_StdString(benchmark::State& state) {
    const std::string source = Sample(state.range(0));
    for (auto _ : state) {
        std::string copy(source);
        benchmark::DoNotOptimize(copy.data());
    }
}
BENCHMARK(BM_Copy_CString)->Arg(8)->Arg(1024);
BENCHMARK(BM_Copy_StdString)->Arg(8)->Arg(1024);

// ---------------------------------------------------------------------------
// Append

void BM_Append_CString(benchmark::State& state) {
    const int64_t n = state.range(0);
    for (auto _ : state) {
        CString text;
        for (int64_t i = 0; i < n; ++i)
            text += static_cast<char>('a' + i % 26);
        benchmark::DoNotOptimize(text.GetString());
    }
    state.SetItemsProcessed(state.iterations() * n);
}
void BM_Append_StdString(benchmark::State& state) {
    const int64_t n = state.range(0);
    for (auto _ : state) {
        std::string text;
        for (int64_t i = 0; i < n; ++i)
            text += static_cast<char>('a' + i % 26);
        benchmark::DoNotOptimize(text.data());
    }
    state.SetItemsProcessed(state.iterations() * n);
}
BENCHMARK(BM_Append_CString)->Arg(64)->Arg(4096)->Arg(65536);
BENCHMARK(BM_Append_StdString)->Arg(64)->Arg(4096)->Arg(65536);

// ---------------------------------------------------------------------------
// Compare

void BM_Compare_CString(benchmark::State& state) {
    const std::string text = Sample(state.range(0));
    const CString a(text.c_str());
    const CString b(text.c_str()); // equal, but not sharing a's buffer
    for (auto _ : state) {
        int result = a.Compare(b);
        benchmark::DoNotOptimize(result);
    }
}
void BM_Compare_StdString(benchmark::State& state) {
    const std::string a = Sample(state.range(0));
    const std::string b = a;
    for (auto _ : state) {
        int result = a.compare(b);
        benchmark::DoNotOptimize(result);
    }
}
BENCHMARK(BM_Compare_CString)->Arg(64)->Arg(4096);
BENCHMARK(BM_Compare_StdString)->Arg(64)->Arg(4096);

void BM_CompareNoCase_CString(benchmark::State& state) {
    const std::string text = Sample(state.range(0));
    const CString a(text.c_str());
    const CString b(Upper(text).c_str());
    for (auto _ : state) {
        int result = a.CompareNoCase(b);
        benchmark::DoNotOptimize(result);
    }
}
void BM_CompareNoCase_StdString(benchmark::State& state) {
    const std::string a = Sample(state.range(0));
    const std::string b = Upper(a);
    for (auto _ : state) {
        int result = CompareNoCase(a, b);
        benchmark::DoNotOptimize(result);
    }
}
BENCHMARK(BM_CompareNoCase_CString)->Arg(64)->Arg(4096);
BENCHMARK(BM_CompareNoCase_StdString)->Arg(64)->Arg(4096);

// ---------------------------------------------------------------------------
// Format

void BM_Format_CString(benchmark::State& state) {
    CString text;
    int i = 0;
    for (auto _ : state) {
        text.Format("item %d: %s = %.3f", ++i, "name", 3.14159);
        benchmark::DoNotOptimize(text.GetString());
    }
}
void BM_Format_Snprintf(benchmark::State& state) {
    std::string text;
    int i = 0;
    for (auto _ : state) {
        ++i;
        int needed = std::snprintf(nullptr, 0, "item %d: %s = %.3f", i, "name", 3.14159);
        text.resize(static_cast<size_t>(needed));
        std::snprintf(&text[0], static_cast<size_t>(needed) + 1, "item %d: %s = %.3f", i, "name",
                      3.14159);
        benchmark::DoNotOptimize(text.data());
    }
}
BENCHMARK(BM_Format_CString);
BENCHMARK(BM_Format_Snprintf);

} // namespace

BENCHMARK_MAIN();

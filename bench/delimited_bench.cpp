// CDelimitedString against a std::string_view split of the same text, in
// pairs run on the same 10 000-token list "item0, item1, ...", so the ratio
// of BM_X_Delimited to BM_X_StringView reads off directly:
//   Count   count the tokens
//   Find    the index of the last token, found by a walk from the first
// The reference reads tokens as the list does: split at the delimiter, trim
// white space, skip empty pieces.
#include <vaskel/text.h>

#include <benchmark/benchmark.h>

#include <string>
#include <string_view>

using vaskel::CDelimitedString;
using vaskel::CString;

namespace {

const int tokenCount = 10000;

std::string Sample() {
    std::string text;
    for (int i = 0; i < tokenCount; ++i) {
        if (i > 0)
            text += ", ";
        text += "item" + std::to_string(i);
    }
    return text;
}

bool IsSpace(char c) {
    return c == ' ' || (c >= '\t' && c <= '\r');
}

std::string_view Trimmed(std::string_view piece) {
    while (!piece.empty() && IsSpace(piece.front()))
        piece.remove_prefix(1);
    while (!piece.empty() && IsSpace(piece.back()))
        piece.remove_suffix(1);
    return piece;
}

// Calls visit with each token and its index until visit returns true;
// answers that index, or -1.
template <class Visit>
long WalkTokens(std::string_view text, char delimiter, Visit visit) {
    long index = 0;
    while (!text.empty()) {
        size_t end = text.find(delimiter);
        std::string_view token = Trimmed(text.substr(0, end));
        text = end == std::string_view::npos ? std::string_view() : text.substr(end + 1);
        if (token.empty())
            continue;
        if (visit(token))
            return index;
        ++index;
    }
    return -index - 1;
}

void BM_Count_Delimited(benchmark::State& state) {
    const CDelimitedString list(CString(Sample().c_str()));
    for (auto _ : state)
        benchmark::DoNotOptimize(list.GetTokenCount());
}
void BM_Count_StringView(benchmark::State& state) {
    const std::string text = Sample();
    for (auto _ : state) {
        long walked = WalkTokens(text, ',', [](std::string_view) { return false; });
        benchmark::DoNotOptimize(-walked - 1);
    }
}
BENCHMARK(BM_Count_Delimited);
BENCHMARK(BM_Count_StringView);

void BM_Find_Delimited(benchmark::State& state) {
    const CDelimitedString list(CString(Sample().c_str()));
    const CString last(("item" + std::to_string(tokenCount - 1)).c_str());
    for (auto _ : state)
        benchmark::DoNotOptimize(list.FindToken(last));
}
void BM_Find_StringView(benchmark::State& state) {
    const std::string text = Sample();
    const std::string last = "item" + std::to_string(tokenCount - 1);
    for (auto _ : state) {
        long index = WalkTokens(text, ',', [&](std::string_view token) { return token == last; });
        benchmark::DoNotOptimize(index);
    }
}
BENCHMARK(BM_Find_Delimited);
BENCHMARK(BM_Find_StringView);

} // namespace

BENCHMARK_MAIN();

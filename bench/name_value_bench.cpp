// Reading a 1 MiB name-value list, beside a plain hand-written scan of the
// same text into string pairs.
#include <vaskel/namevalue.h>

#include <benchmark/benchmark.h>

#include <cctype>
#include <string>
#include <utility>
#include <vector>

namespace {

const std::string& ListText() {
    static const std::string text = [] {
        vaskel::CVKNameValueVector pairs;
        vaskel::CVKNameValueGrammar grammar;
        std::string result;
        for (int i = 0; result.size() < (1u << 20); ++i) {
            pairs.push_back(vaskel::CVKNameValue(
                ("name" + std::to_string(i)).c_str(),
                vaskel::CGenericVal(("value " + std::to_string(i * 7919)).c_str())));
            if (pairs.size() == 1000) {
                if (!result.empty())
                    result += ", ";
                result += grammar.Write(pairs).GetString();
                pairs.clear();
            }
        }
        return result;
    }();
    return text;
}

// The same format, scanned by hand: names, '=', quoted values, ',' between.
bool ScanByHand(const char* p, std::vector<std::pair<std::string, std::string>>& pairs) {
    auto skip = [&p] {
        while (std::isspace(static_cast<unsigned char>(*p)))
            ++p;
    };
    for (;;) {
        skip();
        const char* name = p;
        while (std::isalnum(static_cast<unsigned char>(*p)))
            ++p;
        if (p == name)
            return false;
        std::string key(name, p);
        skip();
        if (*p++ != '=')
            return false;
        skip();
        if (*p++ != '"')
            return false;
        skip();
        const char* value = p;
        const char* end = p;
        while (*p != '"') {
            if (*p == '\0')
                return false;
            if (!std::isspace(static_cast<unsigned char>(*p)))
                end = p + 1;
            ++p;
        }
        ++p;
        pairs.emplace_back(std::move(key), std::string(value, end));
        if (*p == '\0')
            return true;
        skip();
        if (*p++ != ',')
            return false;
    }
}

void BM_GrammarRead(benchmark::State& state) {
    const std::string& text = ListText();
    vaskel::CVKNameValueGrammar grammar;
    for (auto _ : state) {
        vaskel::CVKNameValueVector pairs;
        if (!grammar.Read(text.c_str(), pairs))
            state.SkipWithError("the list did not read");
        benchmark::DoNotOptimize(pairs.data());
    }
    state.SetBytesProcessed(state.iterations() * static_cast<int64_t>(text.size()));
}
BENCHMARK(BM_GrammarRead)->Unit(benchmark::kMillisecond);

void BM_HandWrittenScan(benchmark::State& state) {
    const std::string& text = ListText();
    for (auto _ : state) {
        std::vector<std::pair<std::string, std::string>> pairs;
        if (!ScanByHand(text.c_str(), pairs))
            state.SkipWithError("the list did not scan");
        benchmark::DoNotOptimize(pairs.data());
    }
    state.SetBytesProcessed(state.iterations() * static_cast<int64_t>(text.size()));
}
BENCHMARK(BM_HandWrittenScan)->Unit(benchmark::kMillisecond);

} // namespace

BENCHMARK_MAIN();

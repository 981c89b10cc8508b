// VariantChangeType from numbers to text, and the owning variant's
// construction and ordering, timed without a benchmark framework so that the
// same program runs on Windows builds, where the system's oleaut32 does the
// work.
#include <vaskel/value.h>
#include <vaskel/win32.h>

#include <chrono>
#include <cmath>
#include <cstdio>
#include <random>
#include <vector>

namespace {

constexpr int kConversions = 1000000;

struct Timing {
    const char* name;
    double perSecond;
    bool ok;
};

// Changes each value to VT_BSTR and clears the text, kConversions times.
Timing TimeToText(const char* name, std::vector<VARIANT>& values) {
    bool ok = true;
    VARIANT text;
    VariantInit(&text);
    const auto start = std::chrono::steady_clock::now();
    for (int i = 0; i < kConversions; ++i) {
        ok &= SUCCEEDED(VariantChangeType(&text, &values[i & 1023], 0, VT_BSTR));
        VariantClear(&text);
    }
    const std::chrono::duration<double> elapsed = std::chrono::steady_clock::now() - start;
    return {name, kConversions / elapsed.count(), ok};
}

Timing I4ToText() {
    std::mt19937 random(7);
    std::uniform_int_distribution<LONG> value(-2000000000, 2000000000);
    std::vector<VARIANT> values(1024);
    for (VARIANT& v : values) {
        VariantInit(&v);
        v.vt = VT_I4;
        v.lVal = value(random);
    }
    return TimeToText("VariantChangeType VT_I4 -> VT_BSTR", values);
}

Timing R8ToText() {
    std::mt19937 random(11);
    std::uniform_real_distribution<double> mantissa(-1.0, 1.0);
    std::uniform_int_distribution<int> exponent(-20, 20);
    std::vector<VARIANT> values(1024);
    for (VARIANT& v : values) {
        VariantInit(&v);
        v.vt = VT_R8;
        v.dblVal = mantissa(random) * std::pow(10.0, exponent(random));
    }
    return TimeToText("VariantChangeType VT_R8 -> VT_BSTR", values);
}

// Builds two wrappers and orders them, kConversions times: numbers of
// mixed types, then strings.
Timing WrapperNumbers() {
    bool ok = true;
    const auto start = std::chrono::steady_clock::now();
    for (int i = 0; i < kConversions; ++i) {
        const vaskel::orvariant_t whole(static_cast<long>(i));
        const vaskel::orvariant_t fraction(i + 0.5);
        ok &= whole < fraction;
    }
    const std::chrono::duration<double> elapsed = std::chrono::steady_clock::now() - start;
    return {"orvariant_t long and double built and compared", kConversions / elapsed.count(), ok};
}

Timing WrapperStrings() {
    bool ok = true;
    const auto start = std::chrono::steady_clock::now();
    for (int i = 0; i < kConversions; ++i) {
        const vaskel::orvariant_t first("automation");
        const vaskel::orvariant_t second("automaton");
        ok &= first < second;
    }
    const std::chrono::duration<double> elapsed = std::chrono::steady_clock::now() - start;
    return {"orvariant_t strings built and compared", kConversions / elapsed.count(), ok};
}

// The timed cases, in the order they print.
using Case = Timing (*)();
const Case kCases[] = {
    I4ToText,
    R8ToText,
    WrapperNumbers,
    WrapperStrings,
};

} // namespace

int main() {
    bool ok = true;
    for (const Case run : kCases) {
        const Timing timing = run();
        std::printf("%s: %.0f per second%s\n", timing.name, timing.perSecond,
                    timing.ok ? "" : " (some failed)");
        ok &= timing.ok;
    }
    return ok ? 0 : 1;
}

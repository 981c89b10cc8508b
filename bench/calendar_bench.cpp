// Calendar conversions against the standard library, in pairs run in the
// same process so that the ratio reads off directly:
//   VariantTime  VariantTimeToSystemTime + SystemTimeToVariantTime against
//                std::chrono::sys_days / year_month_day and the time split
//   DateText     CDateTime::ToString + FromString (no reference: the figure is
//                compared with the same round trip under Wine by
//                date_text_timing)
#include <vaskel/calendar.h>

#include <benchmark/benchmark.h>

#include <chrono>
#include <cmath>
#include <random>
#include <vector>

namespace {

std::vector<double> Values() {
    std::mt19937_64 random(5);
    std::uniform_int_distribution<long long> day(-657434, 2958465);
    std::uniform_int_distribution<int> second(0, 86399);
    std::vector<double> values(1024);
    for (double& value : values) {
        const long long d = day(random);
        const double fraction = second(random) / 86400.0;
        value = d >= 0 ? d + fraction : d - fraction;
    }
    return values;
}

void BM_VariantTime_Platform(benchmark::State& state) {
    const std::vector<double> values = Values();
    size_t i = 0;
    for (auto _ : state) {
        SYSTEMTIME record;
        VariantTimeToSystemTime(values[i++ & 1023], &record);
        double back;
        SystemTimeToVariantTime(&record, &back);
        benchmark::DoNotOptimize(back);
    }
}

void BM_VariantTime_Chrono(benchmark::State& state) {
    using namespace std::chrono;
    const std::vector<double> values = Values();
    constexpr sys_days epoch = sys_days{year{1899} / December / 30};
    size_t i = 0;
    for (auto _ : state) {
        const double value = values[i++ & 1023];
        // The same work: split into date and rounded time of day, break the
        // date down, and build the value again.
        const double datePart = std::trunc(value);
        const long long seconds =
            static_cast<long long>(std::floor(std::fabs(value - datePart) * 86400.0 + 0.5));
        const sys_days day = epoch + days{static_cast<long long>(datePart)};
        const year_month_day civil{day};
        const hh_mm_ss<std::chrono::seconds> time{std::chrono::seconds{seconds}};
        benchmark::DoNotOptimize(weekday{day}.c_encoding());
        const long long dayBack = (sys_days{civil} - epoch).count();
        const double fraction =
            (time.hours().count() * 3600 + time.minutes().count() * 60 + time.seconds().count()) /
            86400.0;
        double back = dayBack >= 0 ? dayBack + fraction : dayBack - fraction;
        benchmark::DoNotOptimize(back);
    }
}

void BM_DateText_ToStringFromString(benchmark::State& state) {
    const std::vector<double> values = Values();
    size_t i = 0;
    for (auto _ : state) {
        vaskel::CDateTime value(values[i++ & 1023]);
        vaskel::CDateTime parsed;
        parsed.FromString(value.ToString());
        benchmark::DoNotOptimize(parsed.GetValue());
    }
}

} // namespace

BENCHMARK(BM_VariantTime_Platform);
BENCHMARK(BM_VariantTime_Chrono);
BENCHMARK(BM_DateText_ToStringFromString);
BENCHMARK_MAIN();

// CDateTime::ToString + FromString per round trip, timed without a benchmark
// framework so that the same program runs on Windows builds, where the
// platform's own date text services do the work.
#include <vaskel/calendar.h>

#include <chrono>
#include <cstdio>
#include <random>
#include <vector>

int main() {
    std::mt19937_64 random(5);
    std::uniform_int_distribution<long long> day(-657434, 2958465);
    std::uniform_int_distribution<int> second(0, 86399);
    std::vector<vaskel::CDateTime> values(1024);
    for (vaskel::CDateTime& value : values) {
        const long long d = day(random);
        const double fraction = second(random) / 86400.0;
        value = d >= 0 ? d + fraction : d - fraction;
    }

    const int rounds = 200000;
    int parsed = 0;
    const auto start = std::chrono::steady_clock::now();
    for (int i = 0; i < rounds; ++i) {
        vaskel::CDateTime back;
        parsed += back.FromString(values[i & 1023].ToString()) ? 1 : 0;
    }
    const std::chrono::duration<double, std::nano> elapsed =
        std::chrono::steady_clock::now() - start;
    std::printf("ToString + FromString: %.0f ns per round trip (%d of %d parsed)\n",
                elapsed.count() / rounds, parsed, rounds);
    return parsed == rounds ? 0 : 1;
}

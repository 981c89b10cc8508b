#include "support/civil_oracle.h"

#include <chrono>

namespace vaskel_test {
namespace {

using namespace std::chrono;

constexpr sys_days variantEpoch = sys_days{year{1899} / December / 30};

} // namespace

long long OracleVariantDay(int y, unsigned m, unsigned d) {
    return (sys_days{year{y} / month{m} / day{d}} - variantEpoch).count();
}

OracleDate OracleDateOfVariantDay(long long variantDay) {
    const sys_days date = variantEpoch + days{variantDay};
    const year_month_day civil{date};
    return OracleDate{static_cast<int>(civil.year()), static_cast<unsigned>(civil.month()),
                      static_cast<unsigned>(civil.day()), weekday{date}.c_encoding()};
}

} // namespace vaskel_test

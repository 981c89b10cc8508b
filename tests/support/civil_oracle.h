// An independent calendar to check day counting against: the standard
// library's civil calendar, built in its own translation unit.
#pragma once

namespace vaskel_test {

struct OracleDate {
    int year;
    unsigned month;
    unsigned day;
    unsigned weekday; // 0 = Sunday
};

// Days since 30 December 1899 of a valid proleptic Gregorian date.
long long OracleVariantDay(int year, unsigned month, unsigned day);
OracleDate OracleDateOfVariantDay(long long variantDay);

} // namespace vaskel_test

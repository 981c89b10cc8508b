// Calendar steps on variant times that dates and date-times share.
#pragma once

#include <vaskel/win32.h>

namespace vaskel {

// The broken-down form of a variant time; unexpected_error when it has none.
SYSTEMTIME BrokenDown(double variantTime);

// Month and year shifts through the broken-down form: the day is kept,
// except that February takes its last day when the day is beyond it. The
// value stays as it was when the shifted record does not convert back.
void ShiftMonths(double& variantTime, int months);
void ShiftYears(double& variantTime, int years);

} // namespace vaskel

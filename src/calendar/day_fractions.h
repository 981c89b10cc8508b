// The units of a day as fractions of it: the nearest doubles to their
// reciprocals, multiplied rather than divided by, so that values built from
// the same parts are equal bit for bit.
#pragma once

namespace vaskel {

constexpr double dayPerHour = 0.041666666666666664;
constexpr double dayPerMinute = 0.0006944444444444445;
constexpr double dayPerSecond = 1.1574074074074073e-05;
constexpr double dayPerMillisecond = 1.1574074074074074e-08;

} // namespace vaskel

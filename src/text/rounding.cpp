#include <vaskel/text.h>

#include <cmath>

namespace vaskel {

double VKRoundFloat(double value) {
    double whole;
    double fraction = std::modf(value, &whole);
    if (fraction > -0.5 && fraction < 0.5)
        return whole;
    if (fraction >= 0.5)
        return whole + 1.0;
    if (fraction <= -0.5)
        return whole - 1.0;
    return 0.0; // not a number
}

double VKRoundFloat(double value, LONG places) {
    // Binary exponentiation: exact for every power of ten a double holds.
    unsigned long exponent =
        places < 0 ? 0ul - static_cast<unsigned long>(places) : static_cast<unsigned long>(places);
    double factor = 1.0, base = 10.0;
    for (; exponent != 0; exponent >>= 1) {
        if (exponent & 1)
            factor *= base;
        base *= base;
    }
    if (places < 0)
        factor = 1.0 / factor;
    return VKRoundFloat(value * factor) / factor;
}

double AsCleanDouble(float value) {
    double widened = value;
    if (widened == 0.0)
        return 0.0;
    if (!std::isfinite(widened))
        return widened; // no digits to keep

    int exponent = static_cast<int>(VKRoundFloat(std::log10(std::fabs(widened))));
    int places = 6 - exponent;
    return places > 0 ? VKRoundFloat(widened, places) : VKRoundFloat(widened);
}

double AsDouble(float value) {
    return AsCleanDouble(value);
}

} // namespace vaskel

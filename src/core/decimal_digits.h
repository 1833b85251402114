#pragma once
// A number as its decimal significant digits and exponent: the common ground of every text form.

#include <string>

namespace zp {

struct DecimalDigits {
    bool negative = false;
    std::string digits = "0";  // significant digits without trailing zeros; "0" for zero
    int exponent = 0;          // value = d.ddd x 10^exponent

    // Rounded to `count` significant digits (to nearest, as the C library does).
    static DecimalDigits significant(double v, int count);
    static DecimalDigits significant(float v, int count);
    // The fewest digits that read back as the same double.
    static DecimalDigits shortest(double v);

    bool isZero() const { return digits == "0"; }
    // "0.00000944", "12340", "-2.5": never an exponent.
    std::string plainText() const;
    // "1.5E-06", "1E+15": mantissa without trailing zeros, at least two exponent digits.
    std::string exponentText() const;
};

// Adds one to a whole number written in decimal digits ("199" -> "200", "99" -> "100").
void incrementDecimal(std::string& digits);

}  // namespace zp

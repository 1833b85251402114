#pragma once
// Numeric helpers and the text forms of numbers shared by every window, file and instrument.

#include <cstdint>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>

namespace zp {

// Raised when a value does not fit the whole-number type it is converted to.
class RangeError : public std::range_error {
  public:
    using std::range_error::range_error;
};

// ln x / ln 10 in double precision, as the timing rules expect (FLog10(1000)
// == 2.9999999999999996).
double FLog10(double x);

// Rounds to the nearest whole number, ties to even.
double roundHalfEven(double v);
// Rounds to the given number of decimals, ties to even (on the decimal text, so 0.125 -> 0.12).
double roundHalfEven(double v, int decimals);

// Whole-number conversions with round-half-even; throw RangeError instead of overflowing.
std::int16_t toInt16(double v);
std::int32_t toInt32(double v);

// The general number-to-text form: up to 15 significant digits, "." as decimal point, no trailing
// zeros; exponent form ("1.5E-06", "1E+15") exactly when the decimal exponent is below -4 or at
// least 15.
std::string generalText(double v);

// The same value written in plain decimals, never in exponent form (up to 15 significant digits).
std::string plainDecimalText(double v);

// Single-precision text form: 7 significant digits, otherwise as generalText.
std::string singleText(float v);

// Export form "1.234560e+003": six decimals and at least three exponent digits.
std::string exportText(double v);

// Strict text-to-number: accepts fixed and exponent forms with optional sign and surrounding
// blanks; rejects empty text, junk and partial parses.
std::optional<double> parseNumber(std::string_view text);

// The significant-digit normalisation applied to widths and delays. `fromStep` is true only when
// the value was reached by a step of the field's spin or knob; only then does a last digit 1
// step the value up by one unit of the third significant digit.
double SNormalizeValue(double v, bool fromStep);

}  // namespace zp

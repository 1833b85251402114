#include <gtest/gtest.h>

#include <cmath>
#include <limits>

#include "core/numeric.h"

namespace zp {
namespace {

TEST(FLog10, QuotientOfNaturalLogarithmsFallsShortAtPowersOfTen) {
    EXPECT_EQ(FLog10(1000), 2.9999999999999996);
    EXPECT_EQ(FLog10(1000000), 5.999999999999999);
    EXPECT_EQ(FLog10(0.001), -2.9999999999999996);
    EXPECT_EQ(std::floor(FLog10(1000)), 2.0);
    EXPECT_EQ(std::floor(FLog10(999)), 2.0);
    EXPECT_EQ(std::floor(FLog10(10000)), 4.0);
    EXPECT_EQ(std::floor(FLog10(0.001)), -3.0);
    EXPECT_EQ(std::floor(FLog10(5000)) - 3, 0.0);
    EXPECT_EQ(std::floor(FLog10(500)) - 3, -1.0);
}

TEST(RoundHalfEven, WholeNumberTiesGoToEven) {
    EXPECT_EQ(roundHalfEven(2.5), 2.0);
    EXPECT_EQ(roundHalfEven(3.5), 4.0);
    EXPECT_EQ(roundHalfEven(-2.5), -2.0);
    EXPECT_EQ(roundHalfEven(-3.5), -4.0);
    EXPECT_EQ(roundHalfEven(0.5), 0.0);
    EXPECT_EQ(roundHalfEven(2.4999999), 2.0);
    EXPECT_EQ(roundHalfEven(2.5000001), 3.0);
    EXPECT_EQ(roundHalfEven(1e300), 1e300);
    EXPECT_TRUE(std::isnan(roundHalfEven(std::nan(""))));
}

TEST(RoundHalfEven, DecimalsRoundOnTheDecimalText) {
    EXPECT_EQ(roundHalfEven(0.125, 2), 0.12);
    EXPECT_EQ(roundHalfEven(0.135, 2), 0.14);
    EXPECT_EQ(roundHalfEven(12.34565, 4), 12.3456);
    EXPECT_EQ(roundHalfEven(12.34575, 4), 12.3458);
    EXPECT_EQ(roundHalfEven(12.345651, 4), 12.3457);
    EXPECT_EQ(roundHalfEven(-0.125, 2), -0.12);
    EXPECT_EQ(roundHalfEven(0.99995, 4), 1.0);  // carry into a new digit
    EXPECT_EQ(roundHalfEven(12.5, 4), 12.5);    // nothing to cut
    EXPECT_EQ(roundHalfEven(0.00004, 4), 0.0);
    EXPECT_EQ(roundHalfEven(0.00005, 4), 0.0);  // tie with an even (zero) neighbour
    EXPECT_EQ(roundHalfEven(0.00015, 4), 0.0002);
    EXPECT_EQ(roundHalfEven(1250.0, -2), 1200.0);
}

TEST(WholeNumberConversion, RoundsAndRefusesOutOfRange) {
    EXPECT_EQ(toInt16(32767.4), 32767);
    EXPECT_THROW(toInt16(32767.5), RangeError);  // ties to even: 32768
    EXPECT_EQ(toInt16(-32768.5), -32768);
    EXPECT_THROW(toInt16(-32769), RangeError);
    EXPECT_EQ(toInt16(11.5), 12);
    EXPECT_EQ(toInt16(12.5), 12);
    EXPECT_THROW(toInt16(std::nan("")), RangeError);
    EXPECT_THROW(toInt32(std::numeric_limits<double>::infinity()), RangeError);
    EXPECT_EQ(toInt32(2147483647.0), 2147483647);
    EXPECT_THROW(toInt32(2147483647.5), RangeError);
    try {
        toInt16(40000);
        FAIL() << "no RangeError";
    } catch (const RangeError& e) {
        EXPECT_STREQ(e.what(), "value 40000 is outside the 16-bit range -32768 to 32767");
    }
}

TEST(GeneralText, PlainAndExponentForms) {
    EXPECT_EQ(generalText(0), "0");
    EXPECT_EQ(generalText(-0.0), "0");
    EXPECT_EQ(generalText(12.5), "12.5");
    EXPECT_EQ(generalText(-2.5), "-2.5");
    EXPECT_EQ(generalText(5000), "5000");
    EXPECT_EQ(generalText(0.1), "0.1");
    EXPECT_EQ(generalText(1e-4), "0.0001");
    EXPECT_EQ(generalText(9.99e-5), "9.99E-05");
    EXPECT_EQ(generalText(1.5e-6), "1.5E-06");
    EXPECT_EQ(generalText(-2.5e-7), "-2.5E-07");
    EXPECT_EQ(generalText(1e14), "100000000000000");
    EXPECT_EQ(generalText(1e15), "1E+15");
    EXPECT_EQ(generalText(1e-300), "1E-300");
    EXPECT_EQ(generalText(123456789012345678.0), "1.23456789012346E+17");
    EXPECT_EQ(generalText(0.1 + 0.2), "0.3");
    EXPECT_EQ(generalText(1.0 / 3.0), "0.333333333333333");
    // Rounding to 15 digits can carry into the next decade and change the form.
    EXPECT_EQ(generalText(999999999999999.9), "1E+15");
    EXPECT_EQ(generalText(9.999999999999999e-5), "0.0001");
}

TEST(GeneralText, RoundTripsThroughParseNumber) {
    for (double v : {0.0, 1.0, -1.0, 12.5, 1e-4, 9.99e-5, 1.5e-6, 165e6, 0.001, 3.4e-9, 1e18,
                     123.456789012345}) {
        const auto back = parseNumber(generalText(v));
        ASSERT_TRUE(back.has_value()) << generalText(v);
        EXPECT_EQ(*back, v) << generalText(v);
    }
}

TEST(PlainDecimalText, NeverUsesExponents) {
    EXPECT_EQ(plainDecimalText(9.444444444444445e-6), "0.00000944444444444444");
    EXPECT_EQ(plainDecimalText(1.5e-6), "0.0000015");
    EXPECT_EQ(plainDecimalText(1e15), "1000000000000000");
    EXPECT_EQ(plainDecimalText(-0.00125), "-0.00125");
    EXPECT_EQ(plainDecimalText(0), "0");
}

TEST(SingleText, SevenSignificantDigits) {
    EXPECT_EQ(singleText(5.0f), "5");
    EXPECT_EQ(singleText(0.1f), "0.1");
    EXPECT_EQ(singleText(2.5f), "2.5");
    EXPECT_EQ(singleText(1.0f / 3.0f), "0.3333333");
    EXPECT_EQ(singleText(1.5e-6f), "1.5E-06");
    EXPECT_EQ(singleText(-0.0f), "0");
}

TEST(ExportText, SixDecimalsAndThreeExponentDigits) {
    EXPECT_EQ(exportText(1234.56), "1.234560e+003");
    EXPECT_EQ(exportText(-0.5), "-5.000000e-001");
    EXPECT_EQ(exportText(0), "0.000000e+000");
    EXPECT_EQ(exportText(1e-300), "1.000000e-300");
    EXPECT_EQ(exportText(9.9999999e9), "1.000000e+010");
}

TEST(ParseNumber, AcceptsFixedAndExponentForms) {
    EXPECT_EQ(parseNumber("12.5"), 12.5);
    EXPECT_EQ(parseNumber(" -2.5E-07 "), -2.5e-7);
    EXPECT_EQ(parseNumber("+3"), 3.0);
    EXPECT_EQ(parseNumber("1."), 1.0);
    EXPECT_EQ(parseNumber("1.e-3"), 1e-3);
    EXPECT_EQ(parseNumber("1.e0"), 1.0);
    EXPECT_EQ(parseNumber(".5"), 0.5);
    EXPECT_EQ(parseNumber("\t7\r\n"), 7.0);
    EXPECT_EQ(parseNumber("1e+3"), 1000.0);
}

TEST(ParseNumber, RejectsJunkAndPartialParses) {
    for (const char* bad :
         {"",    "   ", "1.2.3", "12abc", "nan", "NaN", "inf", "-inf",  "Infinity", "0x10", "1e",
          "1e+", "e5",  ".",     "-",     "+-1", "1 2", "1,5", "1e400", "--1",      "5 V"}) {
        EXPECT_FALSE(parseNumber(bad).has_value()) << bad;
    }
}

}  // namespace
}  // namespace zp

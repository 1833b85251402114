#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <string>
#include <utility>

#include "core/numeric.h"

namespace zp {
namespace {

TEST(FLog10, QuotientOfNaturalLogarithmsFallsShortAtPowersOfTen) {
    EXPECT_EQ(FLog10(1000), 2.9999999999999996);
    EXPECT_EQ(std::floor(FLog10(1000)), 2.0);
    EXPECT_EQ(std::floor(FLog10(10000)), 4.0);
    EXPECT_EQ(std::floor(FLog10(0.001)), -3.0);
}

TEST(RoundHalfEven, TiesGoToEvenOnTheDecimalText) {
    struct Case {
        double in;
        int decimals;
        double out;
    };
    const Case cases[] = {
        {2.5, 0, 2.0},     {3.5, 0, 4.0},     {-2.5, 0, -2.0},        {2.5000001, 0, 3.0},
        {0.125, 2, 0.12},  {0.135, 2, 0.14},  {12.34565, 4, 12.3456}, {12.34575, 4, 12.3458},
        {0.99995, 4, 1.0}, {0.00005, 4, 0.0}, {1250.0, -2, 1200.0},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(testing::Message() << c.in << " to " << c.decimals);
        EXPECT_EQ(c.decimals == 0 ? roundHalfEven(c.in) : roundHalfEven(c.in, c.decimals), c.out);
    }
    EXPECT_TRUE(std::isnan(roundHalfEven(std::nan(""))));
}

TEST(WholeNumberConversion, RoundsAndRefusesOutOfRange) {
    EXPECT_EQ(toInt16(32767.4), 32767);
    EXPECT_THROW(toInt16(32767.5), RangeError);  // ties to even: 32768
    EXPECT_EQ(toInt16(-32768.5), -32768);
    EXPECT_THROW(toInt16(-32769), RangeError);
    EXPECT_EQ(toInt16(11.5), 12);
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

TEST(GeneralText, ExponentFormBelowOneTenThousandthAndFromFifteenDigits) {
    const std::pair<double, const char*> cases[] = {
        {0, "0"},
        {-0.0, "0"},
        {-2.5, "-2.5"},
        {1e-4, "0.0001"},
        {9.99e-5, "9.99E-05"},
        {-2.5e-7, "-2.5E-07"},
        {1e14, "100000000000000"},
        {1e15, "1E+15"},
        {1e-300, "1E-300"},
        {123456789012345678.0, "1.23456789012346E+17"},
        {0.1 + 0.2, "0.3"},
        // Rounding to 15 digits can carry into the next decade and change the form.
        {999999999999999.9, "1E+15"},
        {9.999999999999999e-5, "0.0001"},
    };
    for (const auto& [value, text] : cases) EXPECT_EQ(generalText(value), text);
    for (double v : {1.0, 12.5, 9.99e-5, 1.5e-6, 165e6, 3.4e-9, 1e18, 123.456789012345}) {
        EXPECT_EQ(parseNumber(generalText(v)), v) << generalText(v);
    }
}

TEST(OtherTexts, PlainSingleAndExportForms) {
    EXPECT_EQ(plainDecimalText(9.444444444444445e-6), "0.00000944444444444444");
    EXPECT_EQ(plainDecimalText(1e15), "1000000000000000");
    EXPECT_EQ(plainDecimalText(-0.00125), "-0.00125");
    EXPECT_EQ(singleText(0.1f), "0.1");
    EXPECT_EQ(singleText(1.0f / 3.0f), "0.3333333");
    EXPECT_EQ(singleText(1.5e-6f), "1.5E-06");
    EXPECT_EQ(exportText(1234.56), "1.234560e+003");
    EXPECT_EQ(exportText(-0.5), "-5.000000e-001");
    EXPECT_EQ(exportText(9.9999999e9), "1.000000e+010");
}

TEST(ParseNumber, WholeTextOnly) {
    EXPECT_EQ(parseNumber(" -2.5E-07 "), -2.5e-7);
    EXPECT_EQ(parseNumber("+3"), 3.0);
    EXPECT_EQ(parseNumber("1.e-3"), 1e-3);
    EXPECT_EQ(parseNumber(".5"), 0.5);
    EXPECT_EQ(parseNumber("\t7\r\n"), 7.0);
    for (const char* bad : {"", "   ", "1.2.3", "12abc", "nan", "inf", "0x10", "1e", "e5", ".",
                            "+-1", "1 2", "1,5", "1e400", "5 V"}) {
        EXPECT_FALSE(parseNumber(bad).has_value()) << bad;
    }
}

}  // namespace
}  // namespace zp

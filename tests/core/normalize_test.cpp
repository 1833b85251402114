#include <gtest/gtest.h>

#include "core/numeric.h"

namespace zp {
namespace {

TEST(SNormalizeValue, KeepsFourSignificantDigitsBelowOne) {
    EXPECT_EQ(SNormalizeValue(0.00123456, false), 0.001234);
    EXPECT_EQ(SNormalizeValue(0.00123456, true), 0.001234);
    EXPECT_EQ(SNormalizeValue(9.444444444444445e-6, false), 9.444e-6);
    EXPECT_EQ(SNormalizeValue(0.123456, false), 0.1234);
    EXPECT_EQ(SNormalizeValue(2.3456789e-9, false), 2.345e-9);
}

TEST(SNormalizeValue, ShortValuesStayUnchanged) {
    EXPECT_EQ(SNormalizeValue(0.0, true), 0.0);
    EXPECT_EQ(SNormalizeValue(1.5e-6, true), 1.5e-6);
    EXPECT_EQ(SNormalizeValue(1e-6, true), 1e-6);
    EXPECT_EQ(SNormalizeValue(1e-7, true), 1e-7);
    EXPECT_EQ(SNormalizeValue(0.001, true), 0.001);
    EXPECT_EQ(SNormalizeValue(1000, true), 1000.0);
    EXPECT_EQ(SNormalizeValue(10000, true), 10000.0);
    EXPECT_EQ(SNormalizeValue(1.0, true), 1.0);
    EXPECT_EQ(SNormalizeValue(3.4e-9, true), 3.4e-9);
}

TEST(SNormalizeValue, CutsDigitsAboveOne) {
    EXPECT_EQ(SNormalizeValue(12.345, false), 12.3);
    EXPECT_EQ(SNormalizeValue(1234.5, false), 1234.0);
    EXPECT_EQ(SNormalizeValue(2.345, false), 2.3);
    // Large values keep four significant digits instead of losing integer digits.
    EXPECT_EQ(SNormalizeValue(12345.6, false), 12340.0);
    EXPECT_EQ(SNormalizeValue(987654321.0, false), 987600000.0);
}

TEST(SNormalizeValue, StepUpOnlyAfterAStep) {
    EXPECT_EQ(SNormalizeValue(0.0012341, true), 0.001244);
    EXPECT_EQ(SNormalizeValue(0.0012341, false), 0.001234);
    EXPECT_EQ(SNormalizeValue(0.99991, false), 0.9999);
    EXPECT_EQ(SNormalizeValue(0.99991, true), 1.0009);
    EXPECT_EQ(SNormalizeValue(0.0010001, false), 0.001);
    EXPECT_EQ(SNormalizeValue(12.31, true), 12.4);
    EXPECT_EQ(SNormalizeValue(12345.61, true), 12440.0);
    // A last digit other than 1 never steps up.
    EXPECT_EQ(SNormalizeValue(0.0012342, true), 0.001234);
}

TEST(SNormalizeValue, NegativeValuesUseThreeCharacters) {
    EXPECT_EQ(SNormalizeValue(-2.5, false), -2.0);
    EXPECT_EQ(SNormalizeValue(-0.5, false), 0.0);  // "-0." reads as zero
    EXPECT_EQ(SNormalizeValue(-25.0, false), -25.0);
}

}  // namespace
}  // namespace zp

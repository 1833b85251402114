#include <gtest/gtest.h>

#include "core/numeric.h"

namespace zp {
namespace {

TEST(SNormalizeValue, SignificantDigitsAndTheStepUp) {
    struct Case {
        double in;
        bool stepped;
        double out;
    };
    const Case cases[] = {
        {0.0, true, 0.0},
        {0.00123456, false, 0.001234},
        {0.00123456, true, 0.001234},
        {9.444444444444445e-6, false, 9.444e-6},
        {1.5e-6, true, 1.5e-6},
        {1e-7, true, 1e-7},
        {1000, true, 1000.0},
        {12.345, false, 12.3},
        {1234.5, false, 1234.0},
        // Large values keep four significant digits instead of losing integer digits.
        {987654321.0, false, 987600000.0},
        {12345.6, false, 12340.0},
        // A last digit 1 after a step moves up by one in the fourth digit; typed values do not.
        {0.0012341, true, 0.001244},
        {0.0012341, false, 0.001234},
        {0.99991, true, 1.0009},
        {12.31, true, 12.4},
        {0.0012342, true, 0.001234},
        // Negative values keep three characters; "-0." reads as zero.
        {-2.5, false, -2.0},
        {-0.5, false, 0.0},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(testing::Message() << c.in << (c.stepped ? " stepped" : " typed"));
        EXPECT_EQ(SNormalizeValue(c.in, c.stepped), c.out);
    }
}

}  // namespace
}  // namespace zp

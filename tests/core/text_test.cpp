#include <gtest/gtest.h>

#include "core/text.h"

namespace zp {
namespace {

TEST(Text, TrimsCasesAndComparesAsciiOnly) {
    struct Case {
        std::string_view text;
        std::string_view other;
        std::string_view trimmed;
        std::string_view upperText;
        std::string_view lowerText;
        bool equal;
        bool contains;
    };
    const Case cases[] = {
        {" \tkt622A\r\n", "KT622", "kt622A", " \tKT622A\r\n", " \tkt622a\r\n", false, true},
        {"mHz", "MHZ", "mHz", "MHZ", "mhz", true, true},
        {"", "", "", "", "", true, true},
        {"  ", "x", "", "  ", "  ", false, false},
        {"K71 M81", "m8", "K71 M81", "K71 M81", "k71 m81", false, true},
        {"KT6", "KT611", "KT6", "KT6", "kt6", false, false},
        // Bytes beyond ASCII (a micro sign) keep their value whatever the locale.
        {"\xC2\xB5s", "\xC2\xB5S", "\xC2\xB5s", "\xC2\xB5S", "\xC2\xB5s", true, true},
        // Vertical tabs and form feeds are not blanks unless asked for.
        {"\v1\f", "1", "\v1\f", "\v1\f", "\v1\f", false, true},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(trim(c.text), c.trimmed) << c.text;
        EXPECT_EQ(upper(c.text), c.upperText) << c.text;
        EXPECT_EQ(lower(c.text), c.lowerText) << c.text;
        EXPECT_EQ(equalsIgnoringCase(c.text, c.other), c.equal) << c.text;
        EXPECT_EQ(containsIgnoringCase(c.text, c.other), c.contains) << c.text;
    }
    EXPECT_EQ(trim("\v1\f", kWhitespace), "1");
}

}  // namespace
}  // namespace zp

// One line of text for the I/O trace and for JSON: which characters are escaped, and how.

#include <gtest/gtest.h>

#include <string>

#include "core/text.h"

namespace zp {
namespace {

std::string escaped(std::string_view text, EscapeStyle style) {
    std::string out = "<";
    appendEscaped(out, text, style);
    return out;
}

TEST(AppendEscaped, NamedEscapesHexForTheTraceUnicodeForJson) {
    struct Case {
        std::string text;
        const char* hex;
        const char* json;
    };
    const Case cases[] = {
        {"plain text", "<plain text", "<plain text"},
        {"\"q\" \\", "<\\\"q\\\" \\\\", "<\\\"q\\\" \\\\"},
        {"a\nb\rc\td", "<a\\nb\\rc\\td", "<a\\nb\\rc\\td"},
        {"\b\f", "<\\x08\\x0C", "<\\b\\f"},
        {std::string("\x01\x1f\x7f", 3), "<\\x01\\x1F\\x7F", "<\\u0001\\u001f\x7f"},
        {std::string("\0x", 2), "<\\x00x", "<\\u0000x"},
        {" \xc2\xb5s", "< \xc2\xb5s", "< \xc2\xb5s"},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(escaped(c.text, EscapeStyle::Hex), c.hex) << c.text;
        EXPECT_EQ(escaped(c.text, EscapeStyle::Json), c.json) << c.text;
    }
}

}  // namespace
}  // namespace zp

#include "core/text.h"

#include <algorithm>
#include <cstdio>

namespace zp {

std::string_view trim(std::string_view text, std::string_view blanks) {
    const std::size_t first = text.find_first_not_of(blanks);
    if (first == std::string_view::npos) return {};
    return text.substr(first, text.find_last_not_of(blanks) - first + 1);
}

char upper(char c) {
    return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c;
}

char lower(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

std::string upper(std::string_view text) {
    std::string out(text);
    for (char& c : out) c = upper(c);
    return out;
}

std::string lower(std::string_view text) {
    std::string out(text);
    for (char& c : out) c = lower(c);
    return out;
}

bool equalsIgnoringCase(std::string_view a, std::string_view b) {
    return a.size() == b.size() && std::equal(a.begin(), a.end(), b.begin(),
                                              [](char x, char y) { return lower(x) == lower(y); });
}

bool containsIgnoringCase(std::string_view text, std::string_view part) {
    const auto it = std::search(text.begin(), text.end(), part.begin(), part.end(),
                                [](char x, char y) { return lower(x) == lower(y); });
    return it != text.end() || part.empty();
}

void appendEscaped(std::string& out, std::string_view text, EscapeStyle style) {
    const bool json = style == EscapeStyle::Json;
    for (const char c : text) {
        const auto code = static_cast<unsigned char>(c);
        switch (c) {
            case '"':
                out += "\\\"";
                continue;
            case '\\':
                out += "\\\\";
                continue;
            case '\n':
                out += "\\n";
                continue;
            case '\r':
                out += "\\r";
                continue;
            case '\t':
                out += "\\t";
                continue;
            case '\b':
                if (json) {
                    out += "\\b";
                    continue;
                }
                break;
            case '\f':
                if (json) {
                    out += "\\f";
                    continue;
                }
                break;
            default:
                break;
        }
        if (code < 0x20 || (!json && code == 0x7f)) {
            char buf[8];
            std::snprintf(buf, sizeof buf, json ? "\\u%04x" : "\\x%02X",
                          static_cast<unsigned>(code));
            out += buf;
        } else {
            out += c;
        }
    }
}

}  // namespace zp

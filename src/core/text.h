#pragma once
// Text helpers shared by the parsers. ASCII only: a command, a unit or a model code means the same
// whatever locale the program runs in.

#include <string>
#include <string_view>

namespace zp {

// What the parsers skip around a value.
inline constexpr std::string_view kBlanks = " \t\r\n";
// Every C whitespace character, for texts that also allow vertical tabs and form feeds.
inline constexpr std::string_view kWhitespace = " \t\n\v\f\r";

std::string_view trim(std::string_view text, std::string_view blanks = kBlanks);

char upper(char c);
char lower(char c);
std::string upper(std::string_view text);
std::string lower(std::string_view text);

bool equalsIgnoringCase(std::string_view a, std::string_view b);
bool containsIgnoringCase(std::string_view text, std::string_view part);

// How appendEscaped writes a control character that has no name of its own.
enum class EscapeStyle {
    Hex,   // \xHH, and DEL escaped too (the I/O trace)
    Json,  // \b and \f by name, the rest as \u00hh
};
// Appends `text` with quotes and backslashes escaped and line feed, carriage return and tab as
// \n, \r and \t, so that the result stays on one line; no surrounding quotes.
void appendEscaped(std::string& out, std::string_view text, EscapeStyle style);

}  // namespace zp

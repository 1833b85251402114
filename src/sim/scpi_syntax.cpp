#include "sim/scpi_syntax.h"

#include <cctype>
#include <charconv>
#include <cmath>
#include <utility>

namespace zp::sim {

namespace {

bool isAlpha(char c) {
    return std::isalpha(static_cast<unsigned char>(c)) != 0;
}
bool isDigit(char c) {
    return std::isdigit(static_cast<unsigned char>(c)) != 0;
}
bool isBlank(char c) {
    return c == ' ' || c == '\t' || c == '\r' || c == '\n';
}

struct SuffixScale {
    const char* suffix;
    double scale;
};

// In SCPI "M" means milli, except in MHZ and MOHM where it means mega.
constexpr SuffixScale kSecondSuffixes[] = {
    {"S", 1.0}, {"MS", 1e-3}, {"US", 1e-6}, {"NS", 1e-9}, {"PS", 1e-12}};
constexpr SuffixScale kHertzSuffixes[] = {{"HZ", 1.0}, {"KHZ", 1e3}, {"MHZ", 1e6}, {"GHZ", 1e9}};
constexpr SuffixScale kVoltSuffixes[] = {{"V", 1.0}, {"MV", 1e-3}};
constexpr SuffixScale kOhmSuffixes[] = {{"OHM", 1.0}, {"KOHM", 1e3}, {"MOHM", 1e6}};

template <std::size_t N>
std::optional<double> scaleFor(const SuffixScale (&table)[N], const std::string& suffix) {
    for (const auto& entry : table) {
        if (suffix == entry.suffix) return entry.scale;
    }
    return std::nullopt;
}

std::optional<double> suffixScale(ScpiUnit unit, const std::string& suffix) {
    switch (unit) {
        case ScpiUnit::second:
            return scaleFor(kSecondSuffixes, suffix);
        case ScpiUnit::hertz:
            return scaleFor(kHertzSuffixes, suffix);
        case ScpiUnit::volt:
            return scaleFor(kVoltSuffixes, suffix);
        case ScpiUnit::ohm:
            return scaleFor(kOhmSuffixes, suffix);
        case ScpiUnit::none:
            break;
    }
    return std::nullopt;
}

}  // namespace

std::string errorEntry(ScpiErrorCode error) {
    return std::to_string(error.code) + ",\"" + error.text + "\"";
}

bool matchesKeyword(std::string_view word, std::string_view keyword) {
    std::size_t shortLength = 0;
    while (shortLength < keyword.size() &&
           std::isupper(static_cast<unsigned char>(keyword[shortLength])) != 0) {
        ++shortLength;
    }
    const std::string w = upper(word);
    return w == upper(keyword.substr(0, shortLength)) || w == upper(keyword);
}

ProgramHeader parseHeader(std::string_view header) {
    ProgramHeader result;
    if (!header.empty() && header.back() == '?') {
        result.query = true;
        header.remove_suffix(1);
    }
    if (!header.empty() && header.front() == ':') header.remove_prefix(1);
    if (header.empty()) throw ScpiFailure{kSyntaxError};

    std::size_t pos = 0;
    while (true) {
        const std::size_t colon = header.find(':', pos);
        const std::string_view node = header.substr(
            pos, colon == std::string_view::npos ? std::string_view::npos : colon - pos);
        std::size_t letters = 0;
        while (letters < node.size() && (isAlpha(node[letters]) || node[letters] == '_')) {
            ++letters;
        }
        if (letters == 0) throw ScpiFailure{kSyntaxError};
        HeaderNode parsed{upper(node.substr(0, letters)), std::nullopt};
        const std::string_view digits = node.substr(letters);
        if (!digits.empty()) {
            int value = 0;
            const auto [end, ec] =
                std::from_chars(digits.data(), digits.data() + digits.size(), value);
            if (ec != std::errc{} || end != digits.data() + digits.size()) {
                throw ScpiFailure{ec == std::errc::result_out_of_range ? kHeaderSuffixOutOfRange
                                                                       : kSyntaxError};
            }
            parsed.suffix = value;
        }
        result.nodes.push_back(std::move(parsed));
        if (colon == std::string_view::npos) break;
        pos = colon + 1;
    }
    return result;
}

bool matchesPattern(std::span<const char* const> pattern, std::span<const HeaderNode> nodes,
                    std::optional<int>& suffix) {
    if (pattern.empty()) return nodes.empty();
    std::string_view keyword = pattern.front();
    const bool optional = keyword.front() == '[';
    if (optional) keyword = keyword.substr(1, keyword.size() - 2);
    const bool takesSuffix = keyword.back() == '#';
    if (takesSuffix) keyword.remove_suffix(1);

    if (optional && matchesPattern(pattern.subspan(1), nodes, suffix)) return true;
    if (nodes.empty()) return false;
    const HeaderNode& node = nodes.front();
    if (!matchesKeyword(node.mnemonic, keyword)) return false;
    if (node.suffix && !takesSuffix) return false;
    const auto saved = suffix;
    if (takesSuffix) suffix = node.suffix;
    if (matchesPattern(pattern.subspan(1), nodes.subspan(1), suffix)) return true;
    suffix = saved;
    return false;
}

double parseNumber(std::string_view text, ScpiUnit unit) {
    const std::string_view t = trim(text);
    if (t.empty()) throw ScpiFailure{kMissingParameter};

    // Mantissa and exponent are scanned here so that "1.5.3" or "E5" are syntax errors rather
    // than whatever a library parser would make of them.
    std::size_t i = 0;
    if (t[i] == '+' || t[i] == '-') ++i;
    std::size_t digits = 0;
    while (i < t.size() && isDigit(t[i])) ++i, ++digits;
    if (i < t.size() && t[i] == '.') {
        ++i;
        while (i < t.size() && isDigit(t[i])) ++i, ++digits;
    }
    if (digits == 0) throw ScpiFailure{kSyntaxError};
    if (i < t.size() && (t[i] == 'e' || t[i] == 'E')) {
        std::size_t j = i + 1;
        if (j < t.size() && (t[j] == '+' || t[j] == '-')) ++j;
        std::size_t expDigits = 0;
        while (j < t.size() && isDigit(t[j])) ++j, ++expDigits;
        // "1E" followed by letters is no exponent; leave it to the suffix check below.
        if (expDigits > 0) i = j;
    }
    const std::size_t numberEnd = i;
    const char* first = t.data() + (t[0] == '+' ? 1 : 0);
    double value = 0.0;
    const auto [end, ec] = std::from_chars(first, t.data() + numberEnd, value);
    if (ec != std::errc{} || end != t.data() + numberEnd || !std::isfinite(value)) {
        throw ScpiFailure{ec == std::errc::result_out_of_range ? kDataOutOfRange : kSyntaxError};
    }

    while (i < t.size() && isBlank(t[i])) ++i;
    if (i == t.size()) return value;
    const std::string suffix = upper(t.substr(i));
    for (char c : suffix) {
        if (!isAlpha(c)) throw ScpiFailure{kSyntaxError};
    }
    const auto scale = suffixScale(unit, suffix);
    if (!scale) throw ScpiFailure{kInvalidSuffix};
    return value * *scale;
}

bool parseBoolean(std::string_view text) {
    const std::string t = upper(trim(text));
    if (t.empty()) throw ScpiFailure{kMissingParameter};
    if (t == "ON" || t == "1") return true;
    if (t == "OFF" || t == "0") return false;
    throw ScpiFailure{kIllegalParameterValue};
}

}  // namespace zp::sim

#include "core/numeric.h"

#include <charconv>
#include <cmath>
#include <limits>
#include <string>
#include <system_error>

#include "core/decimal_digits.h"
#include "core/text.h"

namespace zp {

double FLog10(double x) {
    return std::log(x) / std::log(10.0);
}

double roundHalfEven(double v) {
    if (!std::isfinite(v)) return v;
    const double r = std::round(v);
    // std::round breaks ties away from zero; a tie goes to the even neighbour instead.
    if (std::fabs(v - std::trunc(v)) == 0.5) return 2.0 * std::round(v / 2.0);
    return r;
}

double roundHalfEven(double v, int decimals) {
    if (!std::isfinite(v) || v == 0.0) return v;
    // Work on the shortest decimal text so that 0.125 is a tie although its binary value is not.
    const DecimalDigits d = DecimalDigits::shortest(v);
    const long keep = static_cast<long>(d.exponent) + 1 + decimals;
    if (keep >= static_cast<long>(d.digits.size())) return v;
    if (keep < 0) return 0.0;

    std::string kept = d.digits.substr(0, static_cast<std::size_t>(keep));
    const std::string rest = d.digits.substr(static_cast<std::size_t>(keep));
    bool up = false;
    if (rest[0] > '5') {
        up = true;
    } else if (rest[0] == '5') {
        const bool exactTie = rest.find_first_not_of('0', 1) == std::string::npos;
        const bool lastOdd = !kept.empty() && ((kept.back() - '0') % 2 == 1);
        up = !exactTie || lastOdd;
    }
    if (kept.empty()) kept.push_back('0');
    if (up) incrementDecimal(kept);
    // The kept digits are a whole number of units of 10^-decimals.
    std::string text = (d.negative ? "-" : "") + kept + "e" + std::to_string(-decimals);
    const auto parsed = parseNumber(text);
    if (!parsed || *parsed == 0.0) return 0.0;
    return *parsed;
}

namespace {

template <typename Int>
Int toInt(double v, const char* typeName) {
    const double r = roundHalfEven(v);
    constexpr double lo = static_cast<double>(std::numeric_limits<Int>::min());
    constexpr double hi = static_cast<double>(std::numeric_limits<Int>::max());
    if (std::isnan(r) || r < lo || r > hi) {
        throw RangeError("value " + generalText(v) + " is outside the " + typeName + " range " +
                         generalText(lo) + " to " + generalText(hi));
    }
    return static_cast<Int>(r);
}

std::string nonFiniteText(double v) {
    if (std::isnan(v)) return "NaN";
    return v < 0 ? "-Infinity" : "Infinity";
}

// Shared by generalText and singleText: plain decimals unless the exponent is below -4 or at
// least 15.
std::string generalForm(const DecimalDigits& d) {
    if (d.isZero()) return "0";
    if (d.exponent < -4 || d.exponent >= 15) return d.exponentText();
    return d.plainText();
}

}  // namespace

std::int16_t toInt16(double v) {
    return toInt<std::int16_t>(v, "16-bit");
}
std::int32_t toInt32(double v) {
    return toInt<std::int32_t>(v, "32-bit");
}

std::string generalText(double v) {
    if (!std::isfinite(v)) return nonFiniteText(v);
    return generalForm(DecimalDigits::significant(v, 15));
}

std::string plainDecimalText(double v) {
    if (!std::isfinite(v)) return nonFiniteText(v);
    const DecimalDigits d = DecimalDigits::significant(v, 15);
    return d.isZero() ? "0" : d.plainText();
}

std::string singleText(float v) {
    if (!std::isfinite(v)) return nonFiniteText(v);
    return generalForm(DecimalDigits::significant(v, 7));
}

std::string exportText(double v) {
    if (!std::isfinite(v)) return nonFiniteText(v);
    char buf[64];
    const auto res = std::to_chars(buf, buf + sizeof buf, v, std::chars_format::scientific, 6);
    std::string text(buf, res.ptr);
    const auto e = text.find('e');
    const std::string expDigits = text.substr(e + 2);
    std::string out = text.substr(0, e + 2);
    if (expDigits.size() < 3) out.append(3 - expDigits.size(), '0');
    return out + expDigits;
}

std::optional<double> parseNumber(std::string_view text) {
    text = trim(text);
    if (text.empty()) return std::nullopt;

    // Check the shape ourselves: from_chars would also take "inf", "nan" and hex digits.
    std::size_t i = 0;
    bool negative = false;
    if (text[i] == '+' || text[i] == '-') negative = text[i++] == '-';
    std::size_t digits = 0;
    bool point = false;
    for (; i < text.size(); ++i) {
        const char c = text[i];
        if (c >= '0' && c <= '9') {
            ++digits;
        } else if (c == '.' && !point) {
            point = true;
        } else {
            break;
        }
    }
    if (digits == 0) return std::nullopt;
    if (i < text.size() && (text[i] == 'e' || text[i] == 'E')) {
        ++i;
        if (i < text.size() && (text[i] == '+' || text[i] == '-')) ++i;
        std::size_t expDigits = 0;
        while (i < text.size() && text[i] >= '0' && text[i] <= '9') {
            ++i;
            ++expDigits;
        }
        if (expDigits == 0) return std::nullopt;
    }
    if (i != text.size()) return std::nullopt;

    const std::size_t start = (text[0] == '+' || text[0] == '-') ? 1 : 0;
    double value = 0.0;
    const char* begin = text.data() + start;
    const char* end = text.data() + text.size();
    const auto res = std::from_chars(begin, end, value, std::chars_format::general);
    if (res.ec != std::errc{} || res.ptr != end) return std::nullopt;
    return negative ? -value : value;
}

double SNormalizeValue(double v, bool fromStep) {
    if (!std::isfinite(v)) return v;
    int e = 0;
    if (v > 0) e = static_cast<int>(std::floor(FLog10(v)));
    const int d = e - 2;
    // Plain decimals, so that small values keep four significant digits like any other.
    const std::string text = plainDecimalText(v);

    std::string head;
    const auto point = text.find('.');
    const std::size_t intLen = point == std::string::npos ? text.size() : point;
    if (v > 0 && intLen > 4) {
        // Keep four significant digits of a large whole part instead of cutting integer digits.
        // Decided on the text, not on e, since FLog10 can fall just short at a power of ten.
        head = text.substr(0, 4) + std::string(intLen - 4, '0');
    } else {
        const std::size_t n = e >= 1 ? 4 : (e == 0 ? 3 : static_cast<std::size_t>(5 - e));
        head = text.substr(0, n);
    }
    const auto parsed = parseNumber(head);
    double t = parsed ? *parsed : v;

    const bool longer = text.size() > head.size();
    if (fromStep && longer && text.back() == '1') {
        // Re-read through the decimal text so the step adds no binary noise.
        const double stepped = t + std::pow(10.0, d);
        t = parseNumber(generalText(stepped)).value_or(stepped);
    }
    return t == 0.0 ? 0.0 : t;
}

}  // namespace zp

#include "core/decimal_digits.h"

#include <charconv>
#include <cmath>
#include <cstdlib>

namespace zp {

namespace {

// Reads the "d.ddde+XX" text of std::to_chars' scientific form.
DecimalDigits fromScientific(const char* begin, const char* end, bool negative) {
    DecimalDigits d;
    d.negative = negative;
    std::string mantissa;
    const char* p = begin;
    for (; p != end && *p != 'e'; ++p) {
        if (*p != '.') mantissa.push_back(*p);
    }
    int exponent = 0;
    if (p != end) {
        ++p;
        if (p != end && *p == '+') ++p;
        std::from_chars(p, end, exponent);
    }
    const auto last = mantissa.find_last_not_of('0');
    if (last == std::string::npos) return DecimalDigits{};
    d.digits = mantissa.substr(0, last + 1);
    d.exponent = exponent;
    return d;
}

template <typename F>
DecimalDigits scientificDigits(F v, int precision, bool shortestForm) {
    if (v == 0) return DecimalDigits{};
    const bool negative = std::signbit(v);
    const F magnitude = std::fabs(v);
    char buf[64];
    const auto res = shortestForm ? std::to_chars(buf, buf + sizeof buf, magnitude,
                                                  std::chars_format::scientific)
                                  : std::to_chars(buf, buf + sizeof buf, magnitude,
                                                  std::chars_format::scientific, precision);
    return fromScientific(buf, res.ptr, negative);
}

}  // namespace

DecimalDigits DecimalDigits::significant(double v, int count) {
    return scientificDigits(v, count - 1, false);
}

DecimalDigits DecimalDigits::significant(float v, int count) {
    return scientificDigits(v, count - 1, false);
}

DecimalDigits DecimalDigits::shortest(double v) {
    return scientificDigits(v, 0, true);
}

std::string DecimalDigits::plainText() const {
    if (isZero()) return "0";
    std::string out = negative ? "-" : "";
    const auto count = static_cast<long>(digits.size());
    if (exponent < 0) {
        out += "0.";
        out.append(static_cast<std::size_t>(-exponent - 1), '0');
        out += digits;
    } else if (exponent + 1 >= count) {
        out += digits;
        out.append(static_cast<std::size_t>(exponent + 1 - count), '0');
    } else {
        out += digits.substr(0, static_cast<std::size_t>(exponent + 1));
        out += '.';
        out += digits.substr(static_cast<std::size_t>(exponent + 1));
    }
    return out;
}

std::string DecimalDigits::exponentText() const {
    std::string out = negative ? "-" : "";
    out += digits[0];
    if (digits.size() > 1) {
        out += '.';
        out += digits.substr(1);
    }
    out += exponent < 0 ? "E-" : "E+";
    const std::string e = std::to_string(std::abs(exponent));
    if (e.size() < 2) out += '0';
    return out + e;
}

void incrementDecimal(std::string& digits) {
    for (auto it = digits.rbegin(); it != digits.rend(); ++it) {
        if (*it != '9') {
            ++*it;
            return;
        }
        *it = '0';
    }
    digits.insert(digits.begin(), '1');
}

}  // namespace zp

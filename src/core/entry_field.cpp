#include "core/entry_field.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <stdexcept>
#include <system_error>

#include "core/decimal_digits.h"
#include "core/numeric.h"
#include "core/text.h"

namespace zp {

namespace {

// Both micro signs become 'u' so that "µs" and "μsec" read as "us".
std::string asciiMicro(std::string_view s) {
    std::string out;
    for (std::size_t i = 0; i < s.size(); ++i) {
        const auto pair = s.substr(i, 2);
        if (pair == "\xC2\xB5" || pair == "\xCE\xBC") {
            out.push_back('u');
            ++i;
        } else {
            out.push_back(s[i]);
        }
    }
    return out;
}

std::string quoted(std::string_view t) {
    std::string s;
    s.push_back('\'');
    s.append(t);
    s.push_back('\'');
    return s;
}

// The length of the leading number: sign, digits with one point, and an exponent only when
// digits follow the 'e'.
std::size_t numberPrefixLength(std::string_view s) {
    std::size_t i = 0;
    if (i < s.size() && (s[i] == '+' || s[i] == '-')) ++i;
    bool point = false;
    while (i < s.size() && ((s[i] >= '0' && s[i] <= '9') || (s[i] == '.' && !point))) {
        if (s[i] == '.') point = true;
        ++i;
    }
    if (i < s.size() && (s[i] == 'e' || s[i] == 'E')) {
        std::size_t j = i + 1;
        if (j < s.size() && (s[j] == '+' || s[j] == '-')) ++j;
        if (j < s.size() && s[j] >= '0' && s[j] <= '9') {
            while (j < s.size() && s[j] >= '0' && s[j] <= '9') ++j;
            i = j;
        }
    }
    return i;
}

// SI prefix letters, read with their case: "m" milli, "M" mega.
std::optional<double> siPrefix(char c) {
    switch (c) {
        case 'p':
            return 1e-12;
        case 'n':
            return 1e-9;
        case 'u':
            return 1e-6;
        case 'm':
            return 1e-3;
        case 'k':
            return 1e3;
        case 'M':
            return 1e6;
        case 'G':
            return 1e9;
        default:
            return std::nullopt;
    }
}

// SCPI prefix letters ignore case, so "M" is milli there too, except in MHZ and MOHM.
std::optional<double> scpiPrefix(char c, std::string_view base) {
    if (lower(c) == 'm') {
        return equalsIgnoringCase(base, "hz") || equalsIgnoringCase(base, "ohm") ? 1e6 : 1e-3;
    }
    if (lower(c) == 'g') return 1e9;
    return siPrefix(lower(c));  // p, n, u, k
}

// "sec" is also written "s", "msec" "ms" and so on.
std::optional<std::string> shortForm(const std::string& name) {
    if (name.size() >= 3 && name.compare(name.size() - 3, 3, "sec") == 0) {
        return name.substr(0, name.size() - 2);
    }
    return std::nullopt;
}

bool same(std::string_view a, std::string_view b, bool ignoreCase) {
    return ignoreCase ? equalsIgnoringCase(a, b) : a == b;
}

// "." stands for "no unit" and is never typed.
bool namesUnit(const Unit& u, std::string_view text, bool ignoreCase) {
    if (u.name == ".") return false;
    const auto s = shortForm(u.name);
    return same(u.name, text, ignoreCase) || (s && same(*s, text, ignoreCase));
}

// The base unit is the one whose multiplier is 1: "sec" (or "s"), "Hz", "V", "ohm".
bool namesBaseUnit(const std::vector<Unit>& units, std::string_view text, bool ignoreCase) {
    return std::any_of(units.begin(), units.end(), [&](const Unit& u) {
        return u.multiplier == 1.0 && namesUnit(u, text, ignoreCase);
    });
}

// Exact SI spelling: a listed unit, a prefix letter alone or a prefix letter on the base unit.
std::optional<double> exactFactor(const std::vector<Unit>& units, std::string_view text) {
    for (const auto& u : units) {
        if (namesUnit(u, text, false)) return u.multiplier;
    }
    const std::string_view tail = text.substr(1);
    if (tail.empty() || namesBaseUnit(units, tail, false)) return siPrefix(text[0]);
    return std::nullopt;
}

// The SCPI reading, for spellings no unit matches exactly: "MS", "KHZ", "mhz", "MOHM".
std::optional<double> scpiFactor(const std::vector<Unit>& units, std::string_view text) {
    for (const auto& u : units) {
        if (namesUnit(u, text, true)) return u.multiplier;
    }
    const std::string_view tail = text.substr(1);
    if (tail.empty() || namesBaseUnit(units, tail, true)) return scpiPrefix(text[0], tail);
    return std::nullopt;
}

// The exponent k when m is exactly 10^k.
std::optional<int> powerOfTen(double m) {
    const double k = std::round(std::log10(m));
    if (std::fabs(k) > 300) return std::nullopt;
    const auto exact = parseNumber("1e" + std::to_string(static_cast<int>(k)));
    if (!exact || *exact != m) return std::nullopt;
    return static_cast<int>(k);
}

// number x 10^k computed on the decimal text, so "2.5 us" is exactly the double nearest 2.5e-6.
std::optional<double> scaledDecimal(std::string_view number, int k) {
    const auto e = number.find_first_of("eE");
    long exponent = k;
    if (e != std::string_view::npos) {
        long own = 0;
        const char* first = number.data() + e + 1;
        if (first != number.data() + number.size() && *first == '+') ++first;
        const auto res = std::from_chars(first, number.data() + number.size(), own);
        if (res.ec != std::errc{} || own > 100000 || own < -100000) return std::nullopt;
        exponent += own;
    }
    return parseNumber(std::string(number.substr(0, e)) + "e" + std::to_string(exponent));
}

bool isPlainList(const std::vector<Unit>& units) {
    return units.empty() || (units.size() == 1 && units[0].name == ".");
}

std::string sixDigits(double v) {
    const auto d = DecimalDigits::significant(v, 6);
    return generalText(parseNumber(d.exponentText()).value_or(v));
}

}  // namespace

std::vector<Unit> parseUnitList(std::string_view list) {
    std::vector<std::string_view> words;
    for (std::size_t i = list.find_first_not_of(kBlanks); i != std::string_view::npos;) {
        const auto end = list.find_first_of(kBlanks, i);
        words.push_back(list.substr(i, end == std::string_view::npos ? end : end - i));
        i = end == std::string_view::npos ? end : list.find_first_not_of(kBlanks, end);
    }
    if (words.size() % 2 != 0) {
        throw std::invalid_argument("unit list '" + std::string(list) +
                                    "' has a name without a multiplier");
    }
    std::vector<Unit> units;
    for (std::size_t i = 0; i < words.size(); i += 2) {
        const auto m = parseNumber(words[i + 1]);
        if (!m || *m <= 0) {
            throw std::invalid_argument("unit list '" + std::string(list) + "': '" +
                                        std::string(words[i + 1]) +
                                        "' is not a positive multiplier");
        }
        units.push_back(Unit{std::string(words[i]), *m});
    }
    return units;
}

EntryField::EntryField(std::string name, double value, double lower, double upper, int decimals,
                       std::string unitList)
    : name_(std::move(name)),
      lower_(lower),
      upper_(upper),
      decimals_(decimals),
      unitListText_(std::move(unitList)),
      units_(parseUnitList(unitListText_)) {
    if (!std::isfinite(lower) || !std::isfinite(upper) || lower > upper) {
        throw std::invalid_argument("field " + name_ + " has an empty range");
    }
    value_ = std::isnan(value) ? lower_ : std::clamp(value, lower_, upper_);
}

void EntryField::setValue(double v) {
    if (std::isnan(v)) return;
    value_ = std::clamp(v, lower_, upper_);
    lastSource_ = ChangeSource::Program;
}

std::optional<std::string> EntryField::enter(double v, ChangeSource source) {
    if (!enabled_) return name_ + " is disabled";
    if (!std::isfinite(v)) return std::string("the value is not a finite number");
    if (v < lower_ || v > upper_) {
        return textWithUnit(v) + " is outside " + textWithUnit(lower_) + " to " +
               textWithUnit(upper_);
    }
    value_ = v;
    lastSource_ = source;
    // A copy, so a listener that replaces itself does not pull the rug from under the call.
    if (listener_) {
        const Listener l = listener_;
        l();
    }
    return std::nullopt;
}

std::optional<std::string> EntryField::enterText(std::string_view text) {
    const Parsed p = parse(text);
    if (!p.value) return p.error;
    return enter(*p.value, ChangeSource::Typed);
}

std::optional<std::string> EntryField::step(int direction) {
    if (direction == 0) return std::string("a step needs a direction");
    double unit = 0.0;
    if (value_ == 0.0) {
        // From zero the smallest unit of the list is the natural first step.
        unit = 1.0;
        for (const auto& u : units_) unit = std::min(unit, u.multiplier);
    } else {
        unit = std::pow(10.0, DecimalDigits::significant(value_, 15).exponent - 2);
    }
    const double raw = value_ + (direction > 0 ? unit : -unit);
    // Through the decimal text, so 1e-6 + 1e-8 is exactly the double nearest 1.01e-6.
    const double next = parseNumber(generalText(raw)).value_or(raw);
    return enter(std::clamp(next, lower_, upper_), ChangeSource::Step);
}

EntryField::Parsed EntryField::parse(std::string_view text) const {
    const std::string_view t = trim(text);
    const std::size_t numberLength = numberPrefixLength(t);
    const auto number = parseNumber(t.substr(0, numberLength));
    if (!number) return {std::nullopt, quoted(t) + " is not a number"};

    const std::string rest = asciiMicro(trim(t.substr(numberLength)));
    const auto accept = [&](double multiplier) -> Parsed {
        std::optional<double> exact;
        if (const auto k = powerOfTen(multiplier))
            exact = scaledDecimal(t.substr(0, numberLength), *k);
        const double v = exact ? *exact : *number * multiplier;
        if (!std::isfinite(v)) return {std::nullopt, quoted(t) + " is too large"};
        return {v, {}};
    };
    if (rest.empty()) return accept(1.0);

    // Exact first, so that "mHz" is millihertz while "MHZ" and "mhz" are megahertz as in SCPI.
    if (const auto m = exactFactor(units_, rest)) return accept(*m);
    if (const auto m = scpiFactor(units_, rest)) return accept(*m);

    std::string hint;
    if (isPlainList(units_)) {
        hint = "enter a plain number";
    } else {
        hint = "use ";
        for (std::size_t i = 0; i < units_.size(); ++i) {
            hint += (i ? ", " : "") + units_[i].name;
        }
    }
    return {std::nullopt, "unknown unit " + quoted(rest) + " (" + hint + ")"};
}

std::string EntryField::textWithUnit(double v) const {
    if (!std::isfinite(v)) return generalText(v);
    if (isPlainList(units_)) return sixDigits(v);
    const Unit* chosen = &units_.front();
    if (v != 0.0) {
        const Unit* smallest = nullptr;
        const Unit* best = nullptr;
        for (const auto& u : units_) {
            if (!smallest || u.multiplier < smallest->multiplier) smallest = &u;
            if (u.multiplier <= std::fabs(v) && (!best || u.multiplier > best->multiplier)) {
                best = &u;
            }
        }
        chosen = best ? best : smallest;
    }
    return sixDigits(v / chosen->multiplier) + " " + chosen->name;
}

std::string EntryField::displayText() const {
    return textWithUnit(value_);
}

}  // namespace zp

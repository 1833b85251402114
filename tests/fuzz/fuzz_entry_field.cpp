// Typed entry-field text on every unit list. The first byte picks the field (the main window's
// ranges plus a level, a load and a plain address field); the rest is what the user typed.

#include <cmath>
#include <string>

#include "core/entry_field.h"
#include "fuzz_check.h"

namespace {

struct FieldKind {
    double value;
    double lower;
    double upper;
    int decimals;
    const char* units;
};

constexpr FieldKind kFields[] = {
    {5000, 0.001, 165e6, 3, zp::units::kHertz},    // PRF
    {500, 1, 10000, 0, zp::units::kHertz},         // IF bandwidth
    {2e-4, 3.4e-9, 1e18, 3, zp::units::kSeconds},  // PRI, widths
    {0, 0, 1, 3, zp::units::kSeconds},             // delays
    {5, -10, 10, 3, zp::units::kVolts},
    {50, 0.3, 1e6, 1, zp::units::kOhms},
    {11, 0, 30, 0, zp::units::kPlain},
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    using zp::fuzz::require;
    if (size == 0) return 0;
    const FieldKind& kind = kFields[data[0] % std::size(kFields)];
    const std::string_view typed = zp::fuzz::text(data + 1, size - 1);

    zp::EntryField field("f", kind.value, kind.lower, kind.upper, kind.decimals, kind.units);
    int notified = 0;
    field.onValueChanged([&] { ++notified; });

    const auto parsed = field.parse(typed);
    require(parsed.value.has_value() != !parsed.error.empty(), "a value or a reason, not both",
            typed);
    if (parsed.value) require(std::isfinite(*parsed.value), "a finite value", typed);

    const double before = field.value();
    if (const auto refused = field.enterText(typed)) {
        require(!refused->empty(), "a refusal with its reason", typed);
        require(field.value() == before && notified == 0, "a refusal that changes nothing", typed);
        require(!parsed.value || *parsed.value < kind.lower || *parsed.value > kind.upper,
                "a value in range is taken", typed);
    } else {
        require(parsed.value && field.value() == *parsed.value && notified == 1,
                "the parsed value stored with one notification", typed);
        require(field.value() >= kind.lower && field.value() <= kind.upper, "a value in range",
                typed);
    }

    // The field's own display text reads back as its value, to the six digits it shows.
    const std::string shown = field.displayText();
    const auto again = field.parse(shown);
    require(again.value.has_value(), "the display text parses", shown);
    const double v = field.value();
    require(std::fabs(*again.value - v) <= 1e-5 * std::fabs(v), "the display text reads back",
            shown);

    for (const int direction : {+1, -1}) {
        field.step(direction);
        require(field.value() >= kind.lower && field.value() <= kind.upper, "a step stays in range",
                typed);
    }
    return 0;
}

#pragma once
// The numeric entry field model shared by the Qt widget and the command-line front end: a value in
// base units with a range, decimals, a unit list and a value-changed notification that fires for
// the user's entries only.

#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace zp {

struct Unit {
    std::string name;
    double multiplier = 1.0;
};

// Parses "sec 1.e0 msec 1.e-3 ..." into its pairs; throws std::invalid_argument on a malformed
// list.
std::vector<Unit> parseUnitList(std::string_view list);

namespace units {
inline constexpr const char* kSeconds = "sec 1.e0 msec 1.e-3 usec 1.e-6 nsec 1.e-9 psec 1.e-12";
inline constexpr const char* kHertz = "Hz 1.e0 kHz 1.e+3 MHz 1.e+6 GHz 1.e+9";
inline constexpr const char* kVolts = "V 1.e0 mV 1.e-3";
inline constexpr const char* kOhms = "ohm 1.e0 k 1.e3 M 1.e6";
inline constexpr const char* kPlain = ". 1.e0";
}  // namespace units

// How a value reached the field; the normalisation and PRF rules step up only after a Step.
enum class ChangeSource { Program, Typed, Step };

class EntryField {
  public:
    EntryField() = default;
    EntryField(std::string name, double value, double lower, double upper, int decimals,
               std::string unitList);

    const std::string& name() const { return name_; }
    double value() const { return value_; }
    double lower() const { return lower_; }
    double upper() const { return upper_; }
    int decimals() const { return decimals_; }
    const std::string& unitList() const { return unitListText_; }
    const std::vector<Unit>& units() const { return units_; }
    bool enabled() const { return enabled_; }
    void setEnabled(bool on) { enabled_ = on; }

    // The program's own write: no notification. Values outside the range are clamped.
    void setValue(double v);

    // A user's entry. Refuses (returns the reason, value unchanged) a value outside the range or a
    // disabled field; otherwise stores it, records the source and notifies.
    std::optional<std::string> enter(double v, ChangeSource source = ChangeSource::Typed);
    // Typed text with an optional unit or multiplier letter: "10k", "10 kHz", "2.5u", "100 nsec".
    std::optional<std::string> enterText(std::string_view text);
    // One step up (+1) or down (-1) of the value's third significant digit, entered as a Step.
    std::optional<std::string> step(int direction);

    // Parses typed text against this field's unit list; the reason on failure.
    struct Parsed {
        std::optional<double> value;
        std::string error;
    };
    Parsed parse(std::string_view text) const;

    // The step property read by the PRF rule: 1 unless the last entry came from a step.
    int stepProperty() const { return lastSource_ == ChangeSource::Step ? 0 : 1; }
    ChangeSource lastSource() const { return lastSource_; }

    // The value in the most readable unit of the list, e.g. "100 usec".
    std::string displayText() const;
    // Any value written the same way (used in the field's messages).
    std::string textWithUnit(double v) const;

    using Listener = std::function<void()>;
    void onValueChanged(Listener l) { listener_ = std::move(l); }

  private:
    std::string name_;
    double value_ = 0.0;
    double lower_ = 0.0;
    double upper_ = 0.0;
    int decimals_ = 0;
    std::string unitListText_;
    std::vector<Unit> units_;
    bool enabled_ = true;
    ChangeSource lastSource_ = ChangeSource::Program;
    Listener listener_;
};

}  // namespace zp

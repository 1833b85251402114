#include <gtest/gtest.h>

#include <cmath>
#include <stdexcept>

#include "core/entry_field.h"

namespace zp {
namespace {

EntryField prfField() {
    return {"VexoEdit_prf", 5000, 0.001, 165e6, 3, units::kHertz};
}
EntryField ifbwField() {
    return {"VexoEdit_IFBW", 500, 1, 10000, 0, units::kHertz};
}
EntryField widthField() {
    return {"VexoEdit_width", 1e-6, 3.4e-9, 1e18, 3, units::kSeconds};
}

TEST(UnitList, ParsesPairsAndRefusesMalformedLists) {
    const auto u = parseUnitList(units::kSeconds);
    ASSERT_EQ(u.size(), 5u);
    EXPECT_EQ(u[2].name, "usec");
    EXPECT_EQ(u[2].multiplier, 1e-6);
    EXPECT_THROW(parseUnitList("sec 1.e0 msec"), std::invalid_argument);
    EXPECT_THROW(parseUnitList("sec one"), std::invalid_argument);
    EXPECT_THROW(parseUnitList("sec -1"), std::invalid_argument);
    EXPECT_THROW(EntryField("f", 0, 2, 1, 0, units::kPlain), std::invalid_argument);
}

TEST(EntryFieldParse, NumbersWithUnitsAndMultiplierLetters) {
    const auto f = ifbwField();
    EXPECT_EQ(f.parse("10k").value, 10000.0);
    EXPECT_EQ(f.parse("10 kHz").value, 10000.0);
    EXPECT_EQ(f.parse("10 khz").value, 10000.0);
    EXPECT_EQ(f.parse("10kHz").value, 10000.0);
    EXPECT_EQ(f.parse(" 5 ").value, 5.0);
    EXPECT_EQ(f.parse("2 MHz").value, 2e6);
    EXPECT_EQ(f.parse("2M").value, 2e6);
    EXPECT_EQ(f.parse("1.5e3 Hz").value, 1500.0);
    EXPECT_EQ(f.parse("1.5e3").value, 1500.0);

    const auto w = widthField();
    EXPECT_EQ(w.parse("2.5 us").value, 2.5e-6);
    EXPECT_EQ(w.parse("2.5us").value, 2.5e-6);
    EXPECT_EQ(w.parse("2.5 usec").value, 2.5e-6);
    EXPECT_EQ(w.parse("100n").value, 100e-9);
    EXPECT_EQ(w.parse("100 nsec").value, 100e-9);
    EXPECT_EQ(w.parse("1e-6").value, 1e-6);
    EXPECT_EQ(w.parse("3 m").value, 3e-3);  // milli, not mega
    EXPECT_EQ(w.parse("3 ms").value, 3e-3);
    EXPECT_EQ(w.parse("3 MSEC").value, 3e-3);
    EXPECT_EQ(w.parse("2 s").value, 2.0);
    EXPECT_EQ(w.parse("4 ps").value, 4e-12);
    EXPECT_EQ(w.parse("7 \xC2\xB5s").value, 7e-6);

    const EntryField ohms("r", 50, 1, 1e6, 0, units::kOhms);
    EXPECT_EQ(ohms.parse("10 k").value, 1e4);
    EXPECT_EQ(ohms.parse("1 M").value, 1e6);
    EXPECT_EQ(ohms.parse("50 ohm").value, 50.0);
}

TEST(EntryFieldParse, JunkGivesAReason) {
    const auto w = widthField();
    auto p = w.parse("abc");
    EXPECT_FALSE(p.value);
    EXPECT_EQ(p.error, "'abc' is not a number");
    p = w.parse("");
    EXPECT_FALSE(p.value);
    EXPECT_EQ(p.error, "'' is not a number");
    p = w.parse("5 xyz");
    EXPECT_FALSE(p.value);
    EXPECT_EQ(p.error, "unknown unit 'xyz' (use sec, msec, usec, nsec, psec)");
    EXPECT_FALSE(w.parse("1.2.3").value);
    EXPECT_FALSE(w.parse("nan").value);
    EXPECT_FALSE(w.parse("5 Hz").value);  // a frequency unit in a time field
    EXPECT_FALSE(w.parse("5 kk").value);
    EXPECT_FALSE(w.parse("1e999").value);
    EXPECT_EQ(ifbwField().parse("3 apples").error, "unknown unit 'apples' (use Hz, kHz, MHz, GHz)");
    const EntryField plain("addr", 11, 0, 30, 0, units::kPlain);
    EXPECT_EQ(plain.parse("11").value, 11.0);
    EXPECT_EQ(plain.parse("11 x").error, "unknown unit 'x' (enter a plain number)");
}

TEST(EntryFieldEnter, RefusesOutOfRangeAndKeepsTheOldValue) {
    auto f = ifbwField();
    int notified = 0;
    f.onValueChanged([&] { ++notified; });
    const auto reason = f.enterText("20 kHz");
    ASSERT_TRUE(reason);
    EXPECT_EQ(*reason, "20 kHz is outside 1 Hz to 10 kHz");
    EXPECT_EQ(f.value(), 500.0);
    EXPECT_EQ(notified, 0);
    EXPECT_EQ(f.enterText("junk"), std::optional<std::string>("'junk' is not a number"));
    EXPECT_TRUE(f.enter(std::nan("")));
    EXPECT_EQ(f.value(), 500.0);
    // The limits themselves are inside.
    EXPECT_FALSE(f.enterText("10 kHz"));
    EXPECT_EQ(f.value(), 10000.0);
    EXPECT_FALSE(f.enter(1.0));
    EXPECT_EQ(notified, 2);
}

TEST(EntryFieldEnter, DisabledFieldsRefuse) {
    auto f = widthField();
    f.setEnabled(false);
    int notified = 0;
    f.onValueChanged([&] { ++notified; });
    EXPECT_TRUE(f.enterText("2 us"));
    EXPECT_TRUE(f.step(+1));
    EXPECT_EQ(f.value(), 1e-6);
    EXPECT_EQ(notified, 0);
}

TEST(EntryFieldEnter, NotifiesUserEntriesOnlyAndRecordsTheSource) {
    auto f = prfField();
    int notified = 0;
    ChangeSource seen = ChangeSource::Program;
    f.onValueChanged([&] {
        ++notified;
        seen = f.lastSource();
    });
    f.setValue(7000);
    EXPECT_EQ(notified, 0);
    EXPECT_EQ(f.value(), 7000.0);
    f.setValue(1e12);  // program writes clamp
    EXPECT_EQ(f.value(), 165e6);
    f.setValue(-5);
    EXPECT_EQ(f.value(), 0.001);
    f.setValue(std::nan(""));
    EXPECT_EQ(f.value(), 0.001);
    EXPECT_EQ(notified, 0);

    EXPECT_FALSE(f.enterText("10k"));
    EXPECT_EQ(notified, 1);
    EXPECT_EQ(seen, ChangeSource::Typed);
    EXPECT_EQ(f.stepProperty(), 1);
    EXPECT_FALSE(f.step(+1));
    EXPECT_EQ(notified, 2);
    EXPECT_EQ(seen, ChangeSource::Step);
    EXPECT_EQ(f.stepProperty(), 0);
    f.setValue(5000);
    EXPECT_EQ(f.stepProperty(), 1);
}

TEST(EntryFieldStep, MovesTheThirdSignificantDigitAndClamps) {
    auto f = prfField();
    f.setValue(10000);
    EXPECT_FALSE(f.step(+1));
    EXPECT_EQ(f.value(), 10100.0);
    EXPECT_FALSE(f.step(-1));
    EXPECT_FALSE(f.step(-1));
    EXPECT_EQ(f.value(), 9900.0);

    auto w = widthField();
    EXPECT_FALSE(w.step(+1));
    EXPECT_EQ(w.value(), 1.01e-6);

    f.setValue(165e6);
    EXPECT_FALSE(f.step(+1));
    EXPECT_EQ(f.value(), 165e6);
    EXPECT_TRUE(f.step(0));

    EntryField d("VexoEdit_delay", 0, 0, 1, 3, units::kSeconds);
    EXPECT_FALSE(d.step(+1));
    EXPECT_EQ(d.value(), 1e-12);
    d.setValue(0);
    EXPECT_FALSE(d.step(-1));
    EXPECT_EQ(d.value(), 0.0);
}

TEST(EntryFieldDisplay, PicksTheReadableUnit) {
    auto w = widthField();
    EXPECT_EQ(w.displayText(), "1 usec");
    w.setValue(100e-6);
    EXPECT_EQ(w.displayText(), "100 usec");
    w.setValue(2.5e-3);
    EXPECT_EQ(w.displayText(), "2.5 msec");
    w.setValue(3.4e-9);
    EXPECT_EQ(w.displayText(), "3.4 nsec");
    w.setValue(12);
    EXPECT_EQ(w.displayText(), "12 sec");
    EntryField d("VexoEdit_delay", 0, 0, 1, 3, units::kSeconds);
    EXPECT_EQ(d.displayText(), "0 sec");
    auto f = prfField();
    EXPECT_EQ(f.displayText(), "5 kHz");
    f.setValue(0.001);
    EXPECT_EQ(f.displayText(), "0.001 Hz");
    f.setValue(1234567);
    EXPECT_EQ(f.displayText(), "1.23457 MHz");
    const EntryField plain("addr", 11, 0, 30, 0, units::kPlain);
    EXPECT_EQ(plain.displayText(), "11");
}

}  // namespace
}  // namespace zp

#include <gtest/gtest.h>

#include <cmath>
#include <stdexcept>
#include <tuple>

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
    EXPECT_THROW(parseUnitList("sec -1"), std::invalid_argument);
    EXPECT_THROW(EntryField("f", 0, 2, 1, 0, units::kPlain), std::invalid_argument);
}

TEST(EntryFieldParse, NumbersWithUnitsAndMultiplierLetters) {
    const auto f = ifbwField();
    const auto w = widthField();
    const EntryField ohms("r", 50, 1, 1e6, 0, units::kOhms);
    const std::tuple<const EntryField&, const char*, double> cases[] = {
        {f, "10k", 1e4},       {f, "10 kHz", 1e4},     {f, "10 khz", 1e4},
        {f, " 5 ", 5},         {f, "2M", 2e6},         {f, "1.5e3 Hz", 1500},
        {w, "2.5 us", 2.5e-6}, {w, "2.5usec", 2.5e-6}, {w, "100n", 100e-9},
        {w, "3 m", 3e-3},  // milli, not mega
        {w, "3 MSEC", 3e-3},   {w, "4 ps", 4e-12},     {w, "7 \xC2\xB5s", 7e-6},
        {ohms, "1 M", 1e6},    {ohms, "50 ohm", 50.0},
    };
    for (const auto& [field, text, value] : cases)
        EXPECT_EQ(field.parse(text).value, value) << text;
}

TEST(EntryFieldParse, JunkGivesAReason) {
    const auto w = widthField();
    EXPECT_EQ(w.parse("abc").error, "'abc' is not a number");
    EXPECT_EQ(w.parse("").error, "'' is not a number");
    EXPECT_EQ(w.parse("5 xyz").error, "unknown unit 'xyz' (use sec, msec, usec, nsec, psec)");
    for (const char* bad : {"abc", "1.2.3", "nan", "5 Hz", "5 kk", "1e999"}) {
        EXPECT_FALSE(w.parse(bad).value) << bad;
    }
    const EntryField plain("addr", 11, 0, 30, 0, units::kPlain);
    EXPECT_EQ(plain.parse("11 x").error, "unknown unit 'x' (enter a plain number)");
}

TEST(EntryFieldEnter, RefusesOutOfRangeAndKeepsTheOldValue) {
    auto f = ifbwField();
    int notified = 0;
    f.onValueChanged([&] { ++notified; });
    EXPECT_EQ(f.enterText("20 kHz"),
              std::optional<std::string>("20 kHz is outside 1 Hz to 10 kHz"));
    EXPECT_EQ(f.enterText("junk"), std::optional<std::string>("'junk' is not a number"));
    EXPECT_TRUE(f.enter(std::nan("")));
    EXPECT_EQ(f.value(), 500.0);
    EXPECT_EQ(notified, 0);
    // The limits themselves are inside.
    EXPECT_FALSE(f.enterText("10 kHz"));
    EXPECT_EQ(f.value(), 10000.0);
    EXPECT_FALSE(f.enter(1.0));
    EXPECT_EQ(notified, 2);

    f.setEnabled(false);
    EXPECT_TRUE(f.enterText("2 kHz"));
    EXPECT_TRUE(f.step(+1));
    EXPECT_EQ(f.value(), 1.0);
    EXPECT_EQ(notified, 2);
}

TEST(EntryFieldEnter, NotifiesUserEntriesOnlyAndRecordsTheSource) {
    auto f = prfField();
    int notified = 0;
    ChangeSource seen = ChangeSource::Program;
    f.onValueChanged([&] {
        ++notified;
        seen = f.lastSource();
    });
    f.setValue(1e12);  // program writes clamp
    EXPECT_EQ(f.value(), 165e6);
    f.setValue(-5);
    f.setValue(std::nan(""));  // ignored
    EXPECT_EQ(f.value(), 0.001);
    EXPECT_EQ(notified, 0);

    EXPECT_FALSE(f.enterText("10k"));
    EXPECT_EQ(seen, ChangeSource::Typed);
    EXPECT_EQ(f.stepProperty(), 1);
    EXPECT_FALSE(f.step(+1));
    EXPECT_EQ(notified, 2);
    EXPECT_EQ(seen, ChangeSource::Step);
    EXPECT_EQ(f.stepProperty(), 0);
}

TEST(EntryFieldStep, MovesTheThirdSignificantDigitAndClamps) {
    auto f = prfField();
    f.setValue(10000);
    EXPECT_FALSE(f.step(+1));
    EXPECT_EQ(f.value(), 10100.0);
    EXPECT_FALSE(f.step(-1));
    EXPECT_FALSE(f.step(-1));
    EXPECT_EQ(f.value(), 9900.0);
    f.setValue(165e6);
    EXPECT_FALSE(f.step(+1));
    EXPECT_EQ(f.value(), 165e6);

    EntryField d("VexoEdit_delay", 0, 0, 1, 3, units::kSeconds);
    EXPECT_FALSE(d.step(+1));
    EXPECT_EQ(d.value(), 1e-12);
}

TEST(EntryFieldDisplay, PicksTheReadableUnit) {
    const auto shown = [](EntryField field, double value) {
        field.setValue(value);
        return field.displayText();
    };
    EXPECT_EQ(shown(widthField(), 1e-6), "1 usec");
    EXPECT_EQ(shown(widthField(), 2.5e-3), "2.5 msec");
    EXPECT_EQ(shown(widthField(), 12), "12 sec");
    EXPECT_EQ(shown(prfField(), 0.001), "0.001 Hz");
    EXPECT_EQ(shown(prfField(), 1234567), "1.23457 MHz");
    EXPECT_EQ(shown(EntryField("d", 1, 0, 1, 3, units::kSeconds), 0), "0 sec");
    EXPECT_EQ(shown(EntryField("addr", 0, 0, 30, 0, units::kPlain), 11), "11");
}

}  // namespace
}  // namespace zp

#include <gtest/gtest.h>

#include <cmath>
#include <stdexcept>
#include <tuple>
#include <vector>

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

// Every spelling of every unit list: exact SI names first (letters keep their case), then the
// SCPI reading ignoring case, where "M" is milli except in MHZ and MOHM. 0 = unknown unit.
TEST(EntryFieldParse, UnitSpellingTable) {
    struct Case {
        const char* list;
        double factor;
        std::vector<const char*> spellings;
    };
    const Case cases[] = {
        // Seconds.
        {units::kSeconds, 1, {"", "sec", "s", "S", "SEC"}},
        {units::kSeconds, 1e-3, {"msec", "ms", "m", "MS", "MSEC", "mSec"}},
        {units::kSeconds, 1e-6, {"usec", "us", "\xC2\xB5s", "\xCE\xBCsec", "u", "US", "U"}},
        {units::kSeconds, 1e-9, {"nsec", "ns", "n", "NS"}},
        {units::kSeconds, 1e-12, {"psec", "ps", "p", "PS"}},
        {units::kSeconds, 1e3, {"k", "ks", "K", "KS"}},
        {units::kSeconds, 1e6, {"M", "Ms", "Msec"}},
        {units::kSeconds, 1e9, {"G", "Gsec", "g"}},
        {units::kSeconds, 0, {"Hz", "mm", "secs", "m s", ".", "x"}},
        // Hertz.
        {units::kHertz, 1, {"Hz", "HZ", "hz"}},
        {units::kHertz, 1e3, {"kHz", "k", "KHZ", "khz", "K"}},
        {units::kHertz, 1e6, {"MHz", "M", "MHZ", "mhz", "mHZ"}},
        {units::kHertz, 1e9, {"GHz", "GHZ"}},
        {units::kHertz, 1e-3, {"mHz", "m"}},
        {units::kHertz, 1e-6, {"uHz", "UHZ"}},
        {units::kHertz, 0, {"s", "ms", "Hzz", "kk"}},
        // Volts.
        {units::kVolts, 1, {"V", "v"}},
        {units::kVolts, 1e-3, {"mV", "m", "mv", "Mv"}},
        {units::kVolts, 1e3, {"kV", "KV"}},
        {units::kVolts, 1e6, {"MV"}},
        {units::kVolts, 1e-6, {"uV"}},
        {units::kVolts, 0, {"Vm", "Hz"}},
        // Ohms: "k" and "M" are listed names.
        {units::kOhms, 1, {"ohm", "OHM"}},
        {units::kOhms, 1e3, {"k", "kohm", "K", "KOHM"}},
        {units::kOhms, 1e6, {"M", "Mohm", "MOHM", "mOHM"}},
        {units::kOhms, 1e-3, {"m", "mohm"}},
        {units::kOhms, 0, {"s"}},
        // Plain numbers: prefix letters only.
        {units::kPlain, 1, {""}},
        {units::kPlain, 1e3, {"k", "K"}},
        {units::kPlain, 1e-3, {"m"}},
        {units::kPlain, 1e6, {"M"}},
        {units::kPlain, 0, {".", "Hz"}},
    };
    for (const auto& c : cases) {
        for (const char* spelling : c.spellings) {
            const EntryField f("f", 0, 0, 1e300, 0, c.list);
            const auto p = f.parse(std::string("2.5 ") + spelling);
            if (c.factor == 0) {
                EXPECT_EQ(p.error.rfind("unknown unit '" + std::string(spelling) + "'", 0), 0u)
                    << c.list << " / " << spelling << ": " << p.error;
            } else {
                // Exactly the double nearest 2.5 x factor, as if typed in the base unit.
                EXPECT_EQ(p.value,
                          std::stod("2.5e" + std::to_string(std::lround(std::log10(c.factor)))))
                    << c.list << " / " << spelling;
            }
        }
    }
}

TEST(EntryFieldParse, NumbersAndSpellingsWithoutBlanks) {
    const auto f = ifbwField();
    const auto w = widthField();
    const std::tuple<const EntryField&, const char*, double> cases[] = {
        {f, "10k", 1e4},        {f, " 5 ", 5},       {f, "1.5e3 Hz", 1500}, {f, "1.5e3kHz", 1.5e6},
        {w, "2.5usec", 2.5e-6}, {w, "100n", 100e-9}, {w, "-3ms", -3e-3},
    };
    for (const auto& [field, text, value] : cases)
        EXPECT_EQ(field.parse(text).value, value) << text;
}

TEST(EntryFieldEnter, MillihertzIsMilliAndTheRangeStillRules) {
    auto prf = prfField();
    EXPECT_FALSE(prf.enterText("1 mHz"));  // the lower limit itself
    EXPECT_EQ(prf.value(), 0.001);
    EXPECT_EQ(prf.enterText("0.5 mHz"),
              std::optional<std::string>("0.0005 Hz is outside 0.001 Hz to 165 MHz"));
    EXPECT_FALSE(prf.enterText("1 MHZ"));
    EXPECT_EQ(prf.value(), 1e6);
    EXPECT_EQ(prf.enterText("200 mhz"),
              std::optional<std::string>("200 MHz is outside 0.001 Hz to 165 MHz"));
    EXPECT_EQ(ifbwField().parse("1 mHz").value, 0.001);
    EXPECT_EQ(ifbwField().enterText("1 mHz"),
              std::optional<std::string>("0.001 Hz is outside 1 Hz to 10 kHz"));
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

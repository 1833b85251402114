// The main window's entry rules, driven through the fields as a person would.

#include <cmath>

#include "form_fixture.h"

namespace zp::test {
namespace {

using EntryRules = FormTest;

TEST_F(EntryRules, PrfAndPriFollowEachOther) {
    typePrf(10000);
    EXPECT_DOUBLE_EQ(form.VexoEdit_pri.value(), 100e-6);
    type(form.VexoEdit_pri, 200e-6);
    EXPECT_DOUBLE_EQ(form.VexoEdit_prf.value(), 5000);
    EXPECT_DOUBLE_EQ(form.VexoEdit_pri.value(), 200e-6);
    // A PRF beyond the field's range is clamped before the rule reads it back.
    type(form.VexoEdit_pri, 1e18);
    EXPECT_EQ(form.VexoEdit_prf.value(), 0.001);
    EXPECT_DOUBLE_EQ(form.VexoEdit_pri.value(), 1000);
    type(form.VexoEdit_pri, 3.4e-9);
    EXPECT_EQ(form.VexoEdit_prf.value(), 165e6);
}

TEST_F(EntryRules, PrfKeepsFourOrFiveCharactersAndStepsUpOnlyAfterAStep) {
    struct Case {
        double entered;
        ChangeSource how;
        double kept;
    };
    constexpr auto T = ChangeSource::Typed;
    constexpr auto S = ChangeSource::Step;
    const Case cases[] = {
        {12345, T, 12340},
        {123.456, T, 123.4},
        {1000, T, 1000},
        {165e6, T, 165e6},
        {0.0012345, T, 0.001},
        {9999.999, T, 9999},  // the exponent is exact just below a power of ten
        {99999999.9, T, 99990000},
        // Its text rounds up to "10000": the kept characters follow the text.
        {std::nextafter(10000.0, 0.0), T, 10000},
        {10001, T, 10000},
        {10001, S, 10010},
        {123.41, S, 123.5},
        {0.56781, S, 0.5671},  // below 1 Hz the step is a ten-thousandth
        {1001, S, 1001},       // a four-character text is never stepped up
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(testing::Message() << c.entered << (c.how == S ? " stepped" : " typed"));
        type(form.VexoEdit_prf, c.entered, c.how);
        EXPECT_EQ(form.VexoEdit_prf.value(), c.kept);
    }
    // The program's own run of the rule never steps up, whatever the field saw last.
    form.VexoEdit_prf.setValue(20001);
    form.prfRule();
    EXPECT_EQ(form.VexoEdit_prf.value(), 20000);
}

TEST_F(EntryRules, ProgramWritesDoNotRunTheRulesAndRefusedEntriesChangeNothing) {
    form.VexoEdit_prf.setValue(12345);
    form.VexoEdit_width[1].setValue(1.23456e-6);
    EXPECT_DOUBLE_EQ(form.VexoEdit_pri.value(), 200e-6);
    EXPECT_EQ(form.VexoEdit_width[1].value(), 1.23456e-6);

    EXPECT_NE(form.VexoEdit_prf.enter(200e6), std::nullopt);
    EXPECT_EQ(form.VexoEdit_prf.value(), 12345);
    EXPECT_DOUBLE_EQ(form.VexoEdit_pri.value(), 200e-6);
}

TEST_F(EntryRules, EveryTimingChangeInvalidates) {
    const std::function<void()> changes[] = {[&] { typePrf(2000); },
                                             [&] { type(form.VexoEdit_IFBW, 1000); }};
    for (const auto& change : changes) {
        form.b_calculate_Click();
        ASSERT_TRUE(form.b_apply.enabled);
        change();
        EXPECT_TRUE(isTrue(state.NeedsCalculation));
        EXPECT_FALSE(form.b_apply.enabled);
        EXPECT_FALSE(form.m_PulseProfile.enabled);
        EXPECT_FALSE(form.b_PulseProfile.enabled);
    }
}

TEST_F(EntryRules, DelaysArePulledBackTo340Degrees) {
    typePrf(100000);
    type(form.VexoEdit_delay[1], 9.5e-6);
    EXPECT_DOUBLE_EQ(form.VexoEdit_delay[1].value(), 9.444e-6);
    type(form.VexoEdit_delay[1], 9.4e-6);
    EXPECT_DOUBLE_EQ(form.VexoEdit_delay[1].value(), 9.4e-6);

    // A PRF change pulls back the enabled delays only: 372 degrees -> 340 / (110 kHz x 360).
    for (int r : {0, 2, 4}) {
        form.VexoEdit_delay[r].setValue(9.4e-6);
        form.VexoEdit_delay[r].setEnabled(r != 2);
    }
    typePrf(110000);
    for (int r : {0, 1, 4}) EXPECT_DOUBLE_EQ(form.VexoEdit_delay[r].value(), 8.585e-6) << r;
    EXPECT_DOUBLE_EQ(form.VexoEdit_delay[2].value(), 9.4e-6);
}

TEST_F(EntryRules, WidthIsNormalisedAndStepsUpOnlyFromAStep) {
    type(form.VexoEdit_width[1], 0.0012341);
    EXPECT_DOUBLE_EQ(form.VexoEdit_width[1].value(), 0.001234);
    type(form.VexoEdit_width[1], 0.0012341, ChangeSource::Step);
    EXPECT_DOUBLE_EQ(form.VexoEdit_width[1].value(), 0.001244);
}

TEST_F(EntryRules, RowsOnTheSameExternalOutputFollowEachOther) {
    state.SWriteRow(4, state.SReadRow(0));
    EXPECT_EQ(form.sharedRows(0), std::vector<int>{4});
    EXPECT_EQ(form.sharedRows(4), std::vector<int>{0});
    // A table row beyond the window's rows shares with nobody.
    state.Table.resize(6);
    state.SWriteRow(5, state.SReadRow(0));
    EXPECT_EQ(form.sharedRows(0), std::vector<int>{4});
    state.Table.resize(5);
    state.SWriteRow(3, state.SReadRow(1));
    EXPECT_EQ(form.sharedRows(1), std::vector<int>{3});
    EXPECT_EQ(form.sharedRows(3), std::vector<int>{1});
    EXPECT_TRUE(form.sharedRows(2).empty());

    type(form.VexoEdit_width[1], 2e-6);
    EXPECT_EQ(form.VexoEdit_width[3].value(), 2e-6);
    type(form.VexoEdit_delay[3], 3e-6);
    EXPECT_EQ(form.VexoEdit_delay[1].value(), 3e-6);
    EXPECT_EQ(form.VexoEdit_width[2].value(), 1e-6);
    EXPECT_EQ(form.VexoEdit_delay[2].value(), 0);

    // The same address on another output, or an unreadable address, shares with nobody.
    PGRow other = state.SReadRow(1);
    other.gateOutput = static_cast<std::int16_t>(other.gateOutput == 1 ? 2 : 1);
    state.SWriteRow(3, other);
    EXPECT_TRUE(form.sharedRows(1).empty());
    state.SWriteRow(3, state.SReadRow(1));
    state.Table.cell(3, GpibAddress) = std::string("abc");
    EXPECT_TRUE(form.sharedRows(1).empty());
    EXPECT_TRUE(form.sharedRows(3).empty());
    EXPECT_EQ(form.VexoEdit_width[3].enter(2e-6), std::nullopt);
}

TEST_F(EntryRules, InternalGeneratorsShareByInternalOutputOnly) {
    load(kTwoPortInternal);
    ASSERT_EQ(state.UseInternalPG, kChecked);
    // Row 0 drives output 1, every gate row output 2, whatever their GPIB settings.
    EXPECT_EQ(form.sharedRows(2), (std::vector<int>{1, 3, 4}));
    type(form.VexoEdit_width[3], 4e-6);
    for (int row = 1; row <= 4; ++row) EXPECT_EQ(form.VexoEdit_width[row].value(), 4e-6) << row;
    EXPECT_EQ(form.VexoEdit_width[0].value(), 1e-6);
    type(form.VexoEdit_delay[1], 5e-6);
    EXPECT_EQ(form.VexoEdit_delay[4].value(), 5e-6);
    EXPECT_EQ(form.VexoEdit_delay[0].value(), 0);
}

TEST_F(EntryRules, NoSwGatingKeepsApplyOnAWidthChange) {
    form.m_NoSWGating_Click();
    form.b_calculate_Click();
    ASSERT_TRUE(form.b_apply.enabled);
    form.m_PulseProfile.enabled = form.b_PulseProfile.enabled = true;
    type(form.VexoEdit_width[2], 3e-6);
    EXPECT_TRUE(form.b_apply.enabled);
    EXPECT_FALSE(isTrue(state.NeedsCalculation));
    EXPECT_FALSE(form.b_PulseProfile.enabled);
    EXPECT_FALSE(form.m_PulseProfile.enabled);

    form.m_NoSWGating_Click();  // unchecked again: the next change invalidates
    form.b_calculate_Click();
    type(form.VexoEdit_width[2], 4e-6);
    EXPECT_FALSE(form.b_apply.enabled);
}

TEST_F(EntryRules, RowsOutsideTheWindowAreRefused) {
    try {
        form.widthRule(5);
        ADD_FAILURE() << "row 5 taken";
    } catch (const std::out_of_range& e) {
        EXPECT_STREQ(e.what(), "row 5 is outside the rows 0 to 4");
    }
    EXPECT_THROW(form.delayRule(-1), std::out_of_range);
    EXPECT_TRUE(form.sharedRows(7).empty());
}

}  // namespace
}  // namespace zp::test

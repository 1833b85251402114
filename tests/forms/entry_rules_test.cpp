// The main window's entry rules, driven through the fields as a person would.

#include <cmath>

#include "form_fixture.h"

namespace zp::test {
namespace {

using EntryRules = FormTest;

double prfAfterTyping(MainForm& form, double v, ChangeSource how = ChangeSource::Typed) {
    EXPECT_EQ(form.VexoEdit_prf.enter(v, how), std::nullopt);
    return form.VexoEdit_prf.value();
}

// ---- PRF and PRI.

TEST_F(EntryRules, PrfAndPriFollowEachOther) {
    prfAfterTyping(form, 10000);
    EXPECT_DOUBLE_EQ(form.VexoEdit_pri.value(), 100e-6);
    ASSERT_EQ(form.VexoEdit_pri.enter(200e-6), std::nullopt);
    EXPECT_DOUBLE_EQ(form.VexoEdit_prf.value(), 5000);
    EXPECT_DOUBLE_EQ(form.VexoEdit_pri.value(), 200e-6);
}

TEST_F(EntryRules, PrfKeepsFourOrFiveCharacters) {
    EXPECT_EQ(prfAfterTyping(form, 12345), 12340);
    EXPECT_EQ(prfAfterTyping(form, 123.456), 123.4);
    EXPECT_EQ(prfAfterTyping(form, 1000), 1000);
    EXPECT_EQ(prfAfterTyping(form, 165e6), 165e6);
    EXPECT_EQ(prfAfterTyping(form, 0.0012345), 0.001);
}

TEST_F(EntryRules, PrfExponentIsExactJustBelowAPowerOfTen) {
    EXPECT_EQ(prfAfterTyping(form, 9999.999), 9999);
    EXPECT_EQ(prfAfterTyping(form, 99999999.9), 99990000);
    // Its text rounds up to "10000": the kept characters follow the text, not a tenth of it.
    EXPECT_EQ(prfAfterTyping(form, std::nextafter(10000.0, 0.0)), 10000);
}

TEST_F(EntryRules, PrfStepsUpOnlyAfterAStep) {
    EXPECT_EQ(prfAfterTyping(form, 10001), 10000);
    EXPECT_EQ(prfAfterTyping(form, 10001, ChangeSource::Step), 10010);
    EXPECT_EQ(prfAfterTyping(form, 123.41, ChangeSource::Step), 123.5);
    // A four-character text is never stepped up.
    EXPECT_EQ(prfAfterTyping(form, 1001, ChangeSource::Step), 1001);
    // The program's own run of the rule never steps up, whatever the field saw last.
    form.VexoEdit_prf.setValue(20001);
    form.prfRule();
    EXPECT_EQ(form.VexoEdit_prf.value(), 20000);
}

TEST_F(EntryRules, ComputedPrfIsClampedToItsRangeFirst) {
    ASSERT_EQ(form.VexoEdit_pri.enter(1e18), std::nullopt);
    EXPECT_EQ(form.VexoEdit_prf.value(), 0.001);
    EXPECT_DOUBLE_EQ(form.VexoEdit_pri.value(), 1000);
    ASSERT_EQ(form.VexoEdit_pri.enter(3.4e-9), std::nullopt);
    EXPECT_EQ(form.VexoEdit_prf.value(), 165e6);
}

TEST_F(EntryRules, ProgramWritesDoNotRunTheRules) {
    form.VexoEdit_prf.setValue(12345);
    form.VexoEdit_width[1].setValue(1.23456e-6);
    EXPECT_DOUBLE_EQ(form.VexoEdit_pri.value(), 200e-6);
    EXPECT_EQ(form.VexoEdit_width[1].value(), 1.23456e-6);
}

TEST_F(EntryRules, EveryTimingChangeInvalidates) {
    solver.prf.reset();
    form.b_calculate_Click();
    ASSERT_TRUE(form.b_apply.enabled);
    prfAfterTyping(form, 2000);
    EXPECT_TRUE(isTrue(state.NeedsCalculation));
    EXPECT_FALSE(form.b_apply.enabled);

    form.b_calculate_Click();
    ASSERT_TRUE(form.b_apply.enabled);
    ASSERT_EQ(form.VexoEdit_IFBW.enter(1000), std::nullopt);
    EXPECT_TRUE(isTrue(state.NeedsCalculation));
    EXPECT_FALSE(form.b_apply.enabled);
    EXPECT_FALSE(form.m_PulseProfile.enabled);
    EXPECT_FALSE(form.b_PulseProfile.enabled);
}

TEST_F(EntryRules, RefusedEntryChangesNothing) {
    EXPECT_NE(form.VexoEdit_prf.enter(200e6), std::nullopt);
    EXPECT_EQ(form.VexoEdit_prf.value(), 5000);
    EXPECT_DOUBLE_EQ(form.VexoEdit_pri.value(), 200e-6);
}

// ---- Delays: the 340-degree limit.

TEST_F(EntryRules, DelayIsPulledBackTo340Degrees) {
    prfAfterTyping(form, 100000);
    ASSERT_EQ(form.VexoEdit_delay[1].enter(9.5e-6), std::nullopt);
    EXPECT_DOUBLE_EQ(form.VexoEdit_delay[1].value(), 9.444e-6);
    ASSERT_EQ(form.VexoEdit_delay[2].enter(9.4e-6), std::nullopt);
    EXPECT_DOUBLE_EQ(form.VexoEdit_delay[2].value(), 9.4e-6);
}

TEST_F(EntryRules, PrfChangePullsBackEnabledDelaysOnly) {
    prfAfterTyping(form, 100000);
    ASSERT_EQ(form.VexoEdit_delay[1].enter(9.4e-6), std::nullopt);
    form.VexoEdit_delay[2].setValue(9.4e-6);
    form.VexoEdit_delay[2].setEnabled(false);
    prfAfterTyping(form, 110000);
    // 372 degrees -> 340 / (110 kHz x 360) = 8.5858... us, four significant digits.
    EXPECT_DOUBLE_EQ(form.VexoEdit_delay[1].value(), 8.585e-6);
    EXPECT_DOUBLE_EQ(form.VexoEdit_delay[2].value(), 9.4e-6);
}

// ---- Widths and shared generator outputs.

TEST_F(EntryRules, WidthIsNormalisedAndStepsUpOnlyFromAStep) {
    ASSERT_EQ(form.VexoEdit_width[1].enter(0.0012341), std::nullopt);
    EXPECT_DOUBLE_EQ(form.VexoEdit_width[1].value(), 0.001234);
    ASSERT_EQ(form.VexoEdit_width[1].enter(0.0012341, ChangeSource::Step), std::nullopt);
    EXPECT_DOUBLE_EQ(form.VexoEdit_width[1].value(), 0.001244);
}

TEST_F(EntryRules, RowsOnTheSameExternalOutputFollowEachOther) {
    PGRow shared = state.SReadRow(1);
    state.SWriteRow(3, shared);
    EXPECT_EQ(form.sharedRows(1), std::vector<int>{3});
    EXPECT_EQ(form.sharedRows(3), std::vector<int>{1});
    EXPECT_TRUE(form.sharedRows(2).empty());

    ASSERT_EQ(form.VexoEdit_width[1].enter(2e-6), std::nullopt);
    EXPECT_EQ(form.VexoEdit_width[3].value(), 2e-6);
    ASSERT_EQ(form.VexoEdit_delay[3].enter(3e-6), std::nullopt);
    EXPECT_EQ(form.VexoEdit_delay[1].value(), 3e-6);
    EXPECT_EQ(form.VexoEdit_width[2].value(), 1e-6);
    EXPECT_EQ(form.VexoEdit_delay[2].value(), 0);
}

TEST_F(EntryRules, SameAddressOtherOutputIsNotShared) {
    PGRow row = state.SReadRow(1);
    row.gateOutput = static_cast<std::int16_t>(row.gateOutput == 1 ? 2 : 1);
    state.SWriteRow(3, row);
    EXPECT_TRUE(form.sharedRows(1).empty());
}

TEST_F(EntryRules, InternalGeneratorsShareByInternalOutputOnly) {
    load(twoPortInternal());
    ASSERT_EQ(state.UseInternalPG, kChecked);
    // Row 0 drives output 1, every gate row output 2, whatever their GPIB settings.
    EXPECT_EQ(form.sharedRows(2), (std::vector<int>{1, 3, 4}));
    ASSERT_EQ(form.VexoEdit_width[3].enter(4e-6), std::nullopt);
    for (int row = 1; row <= 4; ++row) EXPECT_EQ(form.VexoEdit_width[row].value(), 4e-6) << row;
    EXPECT_EQ(form.VexoEdit_width[0].value(), 1e-6);
    ASSERT_EQ(form.VexoEdit_delay[1].enter(5e-6), std::nullopt);
    EXPECT_EQ(form.VexoEdit_delay[4].value(), 5e-6);
    EXPECT_EQ(form.VexoEdit_delay[0].value(), 0);
}

TEST_F(EntryRules, UnreadableTableRowSharesWithNobody) {
    state.SWriteRow(3, state.SReadRow(1));
    state.Table.cell(3, GpibAddress) = std::string("abc");
    EXPECT_TRUE(form.sharedRows(1).empty());
    EXPECT_TRUE(form.sharedRows(3).empty());
    EXPECT_EQ(form.VexoEdit_width[3].enter(2e-6), std::nullopt);
}

TEST_F(EntryRules, NoSwGatingKeepsApplyOnAWidthChange) {
    form.m_NoSWGating_Click();
    form.b_calculate_Click();
    ASSERT_TRUE(form.b_apply.enabled);
    form.m_PulseProfile.enabled = form.b_PulseProfile.enabled = true;
    ASSERT_EQ(form.VexoEdit_width[2].enter(3e-6), std::nullopt);
    EXPECT_TRUE(form.b_apply.enabled);
    EXPECT_FALSE(isTrue(state.NeedsCalculation));
    EXPECT_FALSE(form.b_PulseProfile.enabled);
    EXPECT_FALSE(form.m_PulseProfile.enabled);

    form.m_NoSWGating_Click();  // unchecked again: the next change invalidates
    form.b_calculate_Click();
    ASSERT_EQ(form.VexoEdit_width[2].enter(4e-6), std::nullopt);
    EXPECT_FALSE(form.b_apply.enabled);
}

TEST_F(EntryRules, RowsOutsideTheWindowAreRefused) {
    EXPECT_THROW(form.widthRule(5), std::out_of_range);
    EXPECT_THROW(form.delayRule(-1), std::out_of_range);
    EXPECT_TRUE(form.sharedRows(7).empty());
}

// ---- Fixed PRF.

TEST_F(EntryRules, FixedPrfBoxSetsTheFlagOnly) {
    ASSERT_TRUE(isTrue(state.FixedPRF));
    form.setFixedPRF(false);
    EXPECT_EQ(form.chk_FixedPRF.value, kUnchecked);
    EXPECT_EQ(state.FixedPRF, kFalse);
    EXPECT_TRUE(isTrue(state.NeedsCalculation));
    form.chk_FixedPRF.value = kChecked;
    form.chk_FixedPRF_Click();
    EXPECT_EQ(state.FixedPRF, kTrue);
}

}  // namespace
}  // namespace zp::test

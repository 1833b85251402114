// Measurement-mode menus, the pulsed-mode box and the help entry.

#include "form_fixture.h"

namespace zp::test {
namespace {

class Menus : public FormTest {
  protected:
    void SetUp() override {
        FormTest::SetUp();
        form.b_calculate_Click();
        ASSERT_TRUE(form.b_apply.enabled);
        form.b_PulseProfile.enabled = form.m_PulseProfile.enabled = true;  // as after Apply
    }
};

TEST_F(Menus, MeasurementModesToggleAndInvalidate) {
    struct Case {
        MenuEntry MainForm::*entry;
        void (MainForm::*click)();
        bool applyAfter;
        bool profileAfter;
    };
    const Case cases[] = {
        {&MainForm::m_NoSWGating, &MainForm::m_NoSWGating_Click, false, false},
        {&MainForm::m_ConverterMeas, &MainForm::m_ConverterMeas_Click, false, true},
        {&MainForm::m_NoPG, &MainForm::m_NoPG_Click, true, false},
    };
    for (const Case& c : cases) {
        SetUp();
        SCOPED_TRACE((form.*c.entry).name);
        (form.*c.click)();
        EXPECT_TRUE((form.*c.entry).checked);
        EXPECT_TRUE(isTrue(state.NeedsCalculation));
        EXPECT_EQ(form.b_apply.enabled, c.applyAfter);
        EXPECT_EQ(form.b_PulseProfile.enabled, c.profileAfter);
        EXPECT_EQ(form.m_PulseProfile.enabled, c.profileAfter);
        (form.*c.click)();
        EXPECT_FALSE((form.*c.entry).checked);
    }
}

TEST_F(Menus, NoPulseGeneratorsLocksTheGatesUntilCleared) {
    form.m_NoPG_Click();
    EXPECT_FALSE(form.m_ConfigPG.enabled);
    EXPECT_FALSE(form.frm_gates.enabled);
    form.m_NoPG_Click();
    EXPECT_TRUE(form.m_ConfigPG.enabled);
    EXPECT_TRUE(form.frm_gates.enabled);
    EXPECT_FALSE(form.b_PulseProfile.enabled);  // the next Apply decides
    EXPECT_TRUE(form.b_apply.enabled);
}

TEST_F(Menus, PulsedBoxOnlyStoresItsValue) {
    form.chk_pulsed.value = kUnchecked;
    form.chk_pulsed_Click();
    EXPECT_EQ(form.chk_pulsed.value, kUnchecked);
    EXPECT_FALSE(isTrue(state.NeedsCalculation));
    EXPECT_TRUE(form.b_apply.enabled);
}

using Help = FormTest;

// The view shows our own manual when the analyzer names none; the request says why.
TEST_F(Help, FailingQueryAsksForOurManualWithTheAnalyzersError) {
    form.m_contents_Click();
    bench.sim().faults().add("analyzer:CommandParser.parse=-113 Undefined header");
    EXPECT_NO_THROW(form.m_contents_Click());
    ASSERT_EQ(ui.helpCalls.size(), 2u);
    EXPECT_TRUE(ui.helpCalls[0].file.ends_with("/zentra-pulse.html")) << ui.helpCalls[0].file;
    EXPECT_EQ(ui.helpCalls[0].analyzerError, std::nullopt);
    EXPECT_EQ(ui.helpCalls[1].file, "");
    EXPECT_EQ(ui.helpCalls[1].analyzerError, "-113 Undefined header");
    for (const HelpRequest& call : ui.helpCalls) EXPECT_EQ(call.topic, 1114);
    EXPECT_TRUE(ui.messages.empty());
}

}  // namespace
}  // namespace zp::test

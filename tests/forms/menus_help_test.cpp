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

TEST_F(Menus, NoSwGatingTogglesAndInvalidates) {
    form.m_NoSWGating_Click();
    EXPECT_TRUE(form.m_NoSWGating.checked);
    EXPECT_TRUE(isTrue(state.NeedsCalculation));
    EXPECT_FALSE(form.b_apply.enabled);
    EXPECT_FALSE(form.m_PulseProfile.enabled);
    EXPECT_FALSE(form.b_PulseProfile.enabled);
    form.m_NoSWGating_Click();
    EXPECT_FALSE(form.m_NoSWGating.checked);
}

TEST_F(Menus, ConverterMeasurementsDisablesApplyOnly) {
    form.m_ConverterMeas_Click();
    EXPECT_TRUE(form.m_ConverterMeas.checked);
    EXPECT_TRUE(isTrue(state.NeedsCalculation));
    EXPECT_FALSE(form.b_apply.enabled);
    EXPECT_TRUE(form.b_PulseProfile.enabled);
    form.m_ConverterMeas_Click();
    EXPECT_FALSE(form.m_ConverterMeas.checked);
}

TEST_F(Menus, NoPulseGeneratorsLocksTheGatesButKeepsApply) {
    form.m_NoPG_Click();
    EXPECT_TRUE(form.m_NoPG.checked);
    EXPECT_FALSE(form.b_PulseProfile.enabled);
    EXPECT_FALSE(form.m_PulseProfile.enabled);
    EXPECT_FALSE(form.m_ConfigPG.enabled);
    EXPECT_FALSE(form.frm_gates.enabled);
    EXPECT_TRUE(isTrue(state.NeedsCalculation));
    EXPECT_TRUE(form.b_apply.enabled);

    form.m_NoPG_Click();
    EXPECT_FALSE(form.m_NoPG.checked);
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

TEST_F(Help, OpensTheReportedFileWithoutQuotesOrLineEnds) {
    const int connectsBefore = bench.log.connects;
    bench.setup.helpReply = "\"/opt/zentra/help/zentra-pulse.html\"\r\n";
    form.m_contents_Click();
    EXPECT_EQ(bench.log.connects, connectsBefore + 1);  // a connection of its own
    EXPECT_EQ(bench.log.commands, std::vector<std::string>{"DIAG:HELP:FILE?"});
    ASSERT_EQ(ui.helpCalls.size(), 1u);
    EXPECT_EQ(ui.helpCalls[0].file, "/opt/zentra/help/zentra-pulse.html");
    EXPECT_EQ(ui.helpCalls[0].topic, 1114);
    EXPECT_TRUE(ui.messages.empty());
}

TEST_F(Help, QuotesInsideThePathAreRemovedToo) {
    bench.setup.helpReply = "\"C:\\Help\\\"zentra\".html\"\n";
    form.m_contents_Click();
    ASSERT_EQ(ui.helpCalls.size(), 1u);
    EXPECT_EQ(ui.helpCalls[0].file, "C:\\Help\\zentra.html");
}

TEST_F(Help, FailingQueryIsReportedNotThrown) {
    bench.setup.helpError = "-113 Undefined header";
    EXPECT_NO_THROW(form.m_contents_Click());
    EXPECT_EQ(ui.messages, std::vector<std::string>{"-113 Undefined header"});
    EXPECT_TRUE(ui.helpCalls.empty());

    bench.setup.unreachable = true;
    EXPECT_NO_THROW(form.m_contents_Click());
    EXPECT_EQ(ui.messages.size(), 2u);
}

}  // namespace
}  // namespace zp::test

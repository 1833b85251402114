// The table of controls, driven as a person would: the enabling rule, the rules it runs, one
// notification per change, "not available yet" and plugged handlers, names.

#include <functional>
#include <stdexcept>

#include "form_fixture.h"

namespace zp::test {
namespace {

class Registry : public FormTest {
  protected:
    void SetUp() override {
        FormTest::SetUp();
        form.onChanged([this] { ++changes; });
    }
    ControlRegistry& controls() { return form.controls(); }
    int changes = 0;
};

TEST_F(Registry, RefusesWhatThePersonCouldNotReachAndChangesNothing) {
    struct Case {
        std::function<void(MainForm&)> setUp;
        std::function<std::optional<std::string>(ControlRegistry&)> act;
        std::string reason;
    };
    const Case cases[] = {
        {[](MainForm& f) { f.chk_FixedPRF.enabled = false; },
         [](ControlRegistry& c) { return c.setChecked("chk_FixedPRF", false); },
         "Fixed PRF is disabled"},
        {[](MainForm& f) { f.m_PulseConfig.visible = false; },
         [](ControlRegistry& c) { return c.click("m_PulseConfig"); },
         "Pulse Configuration is not shown"},
        {[](MainForm& f) { f.frm_gates.enabled = false; },
         [](ControlRegistry& c) { return c.enterText("VexoEdit_width(0)", "2us"); },
         "VexoEdit_width(0) is disabled (Modulation/Gates is disabled)"},
        {[](MainForm& f) { f.m_Config.enabled = false; },
         [](ControlRegistry& c) { return c.setChecked("m_NoPG", true); },
         "No Pulse Generators is disabled (Configure is disabled)"},
        {[](MainForm& f) { f.frm_pulsed.visible = false; },
         [](ControlRegistry& c) { return c.click("b_calculate"); },
         "Calculate is not shown (frm_pulsed is hidden)"},
        {[](MainForm& f) { f.VexoEdit_delay[1].setEnabled(false); },
         [](ControlRegistry& c) { return c.step("VexoEdit_delay(1)", 1); },
         "VexoEdit_delay(1) is disabled"},
        {[](MainForm&) {}, [](ControlRegistry& c) { return c.click("lbl_prf"); },
         "Pulse Repetition Frequency : cannot be clicked"},
        {[](MainForm&) {}, [](ControlRegistry& c) { return c.setChecked("b_calculate", true); },
         "Calculate has no check mark"},
        {[](MainForm&) {}, [](ControlRegistry& c) { return c.setChecked("m_ConfigPG", true); },
         "Pulse Generators/Modulators has no check mark"},
        {[](MainForm&) {}, [](ControlRegistry& c) { return c.enterText("chk_pulsed", "1"); },
         "Pulsed Mode On takes no value"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.reason);
        load(kTwoPortExternal);
        changes = 0;
        c.setUp(form);
        EXPECT_EQ(c.act(controls()), c.reason);
        EXPECT_EQ(changes, 0);
        EXPECT_TRUE(isTrue(state.FixedPRF));
        EXPECT_FALSE(form.m_NoPG.checked);
        EXPECT_EQ(form.VexoEdit_width[0].value(), 1e-6);
        EXPECT_EQ(solver.created, 0);
    }
}

TEST_F(Registry, OperationsRunTheControlsRuleAndNotifyOnce) {
    ASSERT_EQ(controls().enterText("VexoEdit_prf", "10k"), std::nullopt);
    EXPECT_DOUBLE_EQ(form.VexoEdit_pri.value(), 1e-4);
    ASSERT_EQ(controls().step("VexoEdit_width(1)", -1), std::nullopt);
    EXPECT_LT(form.VexoEdit_width[1].value(), 1e-6);
    ASSERT_EQ(controls().enterText("VexoEdit_width(0)", "1.23456us"), std::nullopt);
    EXPECT_DOUBLE_EQ(form.VexoEdit_width[0].value(), 1.234e-6);  // the first row's rule ran
    ASSERT_EQ(controls().click("chk_FixedPRF"), std::nullopt);
    EXPECT_FALSE(isTrue(state.FixedPRF));
    ASSERT_EQ(controls().setChecked("m_NoSWGating", true), std::nullopt);
    EXPECT_TRUE(form.m_NoSWGating.checked);
    ASSERT_EQ(controls().click("b_calculate"), std::nullopt);
    EXPECT_TRUE(form.b_apply.enabled);
    EXPECT_EQ(changes, 6);
    // A control that already shows the asked state is left alone.
    EXPECT_EQ(controls().setChecked("m_NoSWGating", true), std::nullopt);
    EXPECT_EQ(controls().setChecked("chk_FixedPRF", false), std::nullopt);
    EXPECT_TRUE(form.m_NoSWGating.checked);
    EXPECT_EQ(changes, 6);
    // A refused entry is the field's own reason.
    EXPECT_EQ(controls().enterText("VexoEdit_prf", "1G"), "1 GHz is outside 0.001 Hz to 165 MHz");
    EXPECT_EQ(changes, 6);
}

TEST_F(Registry, UnbuiltActionsSayNotAvailableUntilAHandlerIsPlugged) {
    ASSERT_EQ(controls().click("b_save"), std::nullopt);
    EXPECT_EQ(ui.messages, std::vector<std::string>{"Save is not available in this version yet."});
    EXPECT_EQ(ui.kinds, std::vector<MessageKind>{MessageKind::Information});

    int saved = 0;
    controls().setHandler("b_save", [&] { ++saved; });
    load(kTwoPortExternal);  // a new start-up declares the table again; the plug stays
    ASSERT_EQ(controls().click("b_save"), std::nullopt);
    EXPECT_EQ(saved, 1);
    EXPECT_EQ(ui.messages.size(), 1u);
    EXPECT_THROW(controls().setHandler("lbl_prf", [] {}), std::invalid_argument);
}

TEST_F(Registry, NamesAreCheckedAndRowsFollowTheAnalyzer) {
    for (const char* bad : {"nothing", "VexoEdit_width", "VexoEdit_width(5)", "VexoEdit_prf(0)",
                            "VexoEdit_width(x)", "VexoEdit_width(-1)", "VexoEdit_width(1"}) {
        EXPECT_THROW(controls().field(bad), std::invalid_argument) << bad;
    }
    EXPECT_EQ(controls().item("VexoEdit_width").rowCount(), 5);
    EXPECT_FALSE(controls().checked("b_calculate"));  // a button has no check mark to show
    load(kFourPortThreeSources);
    EXPECT_EQ(controls().item("VexoEdit_width").rowCount(), 6);
    EXPECT_EQ(controls().describe("lbl_gate(5)"), "R IF Gate :");
    // The sixth row's field runs its rule through the table as the others do.
    changes = 0;
    ASSERT_EQ(controls().enterText("VexoEdit_delay(5)", "1us"), std::nullopt);
    EXPECT_EQ(changes, 1);
    EXPECT_TRUE(isTrue(state.NeedsCalculation));
}

TEST(RegistryDeclarations, ContainersComeFirstAndNamesOnce) {
    ScriptedInteraction ui;
    ControlRegistry table(ui);
    Control frame, label;
    EXPECT_THROW(table.label(label, {"lbl", "Label"}, "frm"), std::logic_error);
    table.frame(frame, {"frm", "Frame"});
    table.label(label, {"lbl", "Label"}, "frm");
    EXPECT_THROW(table.label(label, {"lbl", "Again"}, "frm"), std::logic_error);
    EXPECT_THROW(table.label(label, {"lbl2", "In a label"}, "lbl"), std::logic_error);
}

TEST(PlainCaption, DropsAccessKeysAndTheEllipsis) {
    const std::pair<const char*, const char*> cases[] = {{"&Pulse Profile...", "Pulse Profile"},
                                                         {"No &SW Gating", "No SW Gating"},
                                                         {"R&&D", "R&D"},
                                                         {" Fixed PRF ", "Fixed PRF"},
                                                         {"", ""},
                                                         {"...", ""}};
    for (const auto& [caption, plain] : cases) EXPECT_EQ(plainCaption(caption), plain) << caption;
}

}  // namespace
}  // namespace zp::test

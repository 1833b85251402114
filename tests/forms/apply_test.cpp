// Apply from the main window on the simulated bench: the enabling it leaves, its one message,
// the pointer, and what it takes back from the procedure.

#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "core/pulsed_module.h"
#include "fake_analyzer.h"
#include "forms/main_form.h"
#include "sim/sim_bench.h"

namespace zp::test {
namespace {

// The window on a simulated model, started and calculated.
struct Window {
    PulsedModule state;
    sim::SimBench bench;
    ScriptedInteraction ui;
    MainForm form{state, bench, ui};

    explicit Window(const char* model, sim::SimFaults faults = {})
        : bench(model, std::move(faults)) {
        form.Form_Load();
        form.b_calculate_Click();
        EXPECT_TRUE(form.b_apply.enabled) << model;
        ui.pointers.clear();
    }
    bool traced(const std::string& line) {
        for (const std::string& l : bench.trace()->lines()) {
            if (l == line) return true;
        }
        return false;
    }
};

TEST(ApplyFromTheWindow, EnablingMessageAndPointerOnEveryPath) {
    const struct {
        const char* what;
        const char* model;
        bool pulsed;
        bool noPG;
        const char* fault;
        ApplyProcedure procedure;
        int generatorRows;
        bool profile;
        const char* message;
    } cases[] = {
        {"external", "kt611", true, false, "", ApplyProcedure::PulsedModeOn, 5, true, nullptr},
        {"no generators", "kt611", true, true, "", ApplyProcedure::PulsedModeOn, 0, false, nullptr},
        {"external off", "kt611", false, false, "", ApplyProcedure::PulsedModeOff, 5, false,
         nullptr},
        {"internal", "kt622", true, false, "", ApplyProcedure::PulsedModeOn2, 0, true, nullptr},
        {"internal, no generators", "kt622", true, true, "", ApplyProcedure::PulsedModeOn2, 0,
         false, nullptr},
        {"internal off", "kt622", false, false, "", ApplyProcedure::PulsedModeOff2, 0, false,
         nullptr},
        // Rows 0 and 1 are on the generator at 11; the one at 12 does not identify itself.
        {"failed identification", "kt611", true, false, "noidn:12", ApplyProcedure::PulsedModeOn, 2,
         true, "Error reading from signal generator at address 12"},
        {"failed identification, off", "kt611", false, false, "noidn:11",
         ApplyProcedure::PulsedModeOff, 0, false,
         "Error reading from signal generator at address 11"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        sim::SimFaults faults;
        if (*c.fault != '\0') faults.add(c.fault);
        Window w(c.model, std::move(faults));
        MainForm& form = w.form;
        ASSERT_EQ(form.controls().setChecked("chk_pulsed", c.pulsed), std::nullopt);
        ASSERT_EQ(form.controls().setChecked("m_NoPG", c.noPG), std::nullopt);
        // Apply must set both ways what it leaves; it also redraws the duty cycle.
        form.b_PulseProfile.enabled = form.m_PulseProfile.enabled = !c.profile;
        form.lbl_DutyCycle.caption.clear();

        ASSERT_EQ(form.controls().click("b_apply"), std::nullopt);
        const std::vector<std::string> expected =
            c.message ? std::vector<std::string>{c.message} : std::vector<std::string>{};
        EXPECT_EQ(w.ui.messages, expected);
        EXPECT_EQ(w.ui.kinds, std::vector<MessageKind>(expected.size(), MessageKind::Warning));
        EXPECT_EQ(w.ui.pointers, (std::vector<Pointer>{Pointer::Busy, Pointer::Normal}));
        ASSERT_TRUE(form.lastApply());
        EXPECT_EQ(form.lastApply()->procedure, c.procedure);
        EXPECT_EQ(form.lastApply()->generatorRows, c.generatorRows);
        EXPECT_EQ(form.lastApply()->failure.has_value(), c.message != nullptr);
        EXPECT_EQ(form.b_PulseProfile.enabled, c.profile);
        EXPECT_EQ(form.m_PulseProfile.enabled, c.profile);
        EXPECT_NE(form.lbl_DutyCycle.caption, "");
        // The display is switched back on also after a failure.
        EXPECT_TRUE(w.traced("ANA Application.setUpdateSwitch(true)"));
    }
}

// The internal generators keep widths on whole clock ticks; the window shows what they took as
// its own write, so no width rule runs (it would ask for a new Calculate).
TEST(ApplyFromTheWindow, AcceptedWidthsComeBackWithoutTheEntryRules) {
    Window w("kt622");  // 100 MHz pulse clock
    MainForm& form = w.form;
    ASSERT_EQ(form.VexoEdit_width[0].enter(1.2345e-6), std::nullopt);
    ASSERT_EQ(form.VexoEdit_width[1].enter(60e-6), std::nullopt);  // gates, 30 % duty cycle
    form.b_calculate_Click();
    ASSERT_FALSE(isTrue(w.state.NeedsCalculation));
    const std::vector<std::int16_t> zeros(w.state.RxSolveValues.size(), 0);
    ASSERT_EQ(w.state.RxSolveValues, zeros);

    form.b_Apply_Click();
    ASSERT_EQ(w.ui.messages, std::vector<std::string>{});
    EXPECT_DOUBLE_EQ(form.VexoEdit_width[0].value(), 1.23e-6);
    EXPECT_EQ(form.VexoEdit_width[0].lastSource(), ChangeSource::Program);
    EXPECT_FALSE(isTrue(w.state.NeedsCalculation));
    EXPECT_TRUE(form.b_apply.enabled);
    // Receivers on "Auto" took the solver's attenuation for a 30 % duty cycle.
    EXPECT_EQ(w.state.RxSolveValues, std::vector<std::int16_t>(zeros.size(), 15));
}

// Run by the profile window after a change, Apply sends the fields as they stand with the last
// calculation's solution, whether or not a Calculate is due.
TEST(ApplyFromTheWindow, SendsTheFieldsWithoutLookingAtNeedsCalculation) {
    Window w("kt611");
    MainForm& form = w.form;
    ASSERT_EQ(form.VexoEdit_width[0].enter(2.5e-6), std::nullopt);
    ASSERT_TRUE(isTrue(w.state.NeedsCalculation));
    ASSERT_FALSE(form.b_apply.enabled);

    form.b_Apply_Click();
    EXPECT_EQ(w.ui.messages, std::vector<std::string>{});
    EXPECT_TRUE(w.traced("BUS 11 W \":SOUR:PULS:WIDT1 2.5E-06\\n\""));
    EXPECT_TRUE(isTrue(w.state.NeedsCalculation));
    EXPECT_FALSE(form.b_apply.enabled);
    EXPECT_TRUE(form.b_PulseProfile.enabled);
}

}  // namespace
}  // namespace zp::test

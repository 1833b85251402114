// Start-up of the main window: layout by model, enabling, and a failing analyzer.

#include <algorithm>

#include "form_fixture.h"
#include "instruments/instrument_error.h"

namespace zp::test {
namespace {

using Startup = FormTest;

TEST_F(Startup, RowsAndMenusFollowTheModel) {
    struct Case {
        const char* name;
        const char* model;
        int rows;
        const char* row4;
        const char* lastRow;
        int height;
        bool listed;  // "No SW Gating" enabled, "Pulse Configuration..." shown
    };
    const Case cases[] = {
        {"two-port", kTwoPortExternal, 5, "R2 IF Gate :", "R2 IF Gate :", 7240, true},
        {"four-port three-source", kFourPortThreeSources, 6, "D IF Gate :", "R IF Gate :", 7600,
         true},
        {"unlisted", kUnlisted, 5, "R2 IF Gate :", "R2 IF Gate :", 7240, false},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        load(c.model);
        ASSERT_EQ(form.rowCount(), c.rows);
        EXPECT_EQ(form.VexoEdit_delay.size(), static_cast<std::size_t>(c.rows));
        EXPECT_EQ(state.NumOutputs, c.rows);
        EXPECT_EQ(form.lbl_gate[0].caption, "Source Modulation :");
        EXPECT_EQ(form.lbl_gate[1].caption, "A IF Gate :");
        EXPECT_EQ(form.lbl_gate[4].caption, c.row4);
        EXPECT_EQ(form.lbl_gate.back().caption, c.lastRow);
        EXPECT_EQ(form.f_PulsedZentra.geometry.height, c.height);
        EXPECT_EQ(form.m_NoSWGating.enabled, c.listed);
        EXPECT_EQ(form.m_PulseConfig.visible, c.listed);
        EXPECT_EQ(form.m_PulseConfig.enabled, c.listed);
        // Port and source counts are read for listed models only.
        const std::vector<std::string> lines = bench.lines();
        EXPECT_EQ(
            std::ranges::any_of(
                lines, [](const std::string& l) { return l.starts_with("ANA Caps.portCount()"); }),
            c.listed);
    }
}

TEST_F(Startup, SixthRowIsAFullRow) {
    load(kFourPortThreeSources);
    EXPECT_EQ(form.controls().fieldGeometry("VexoEdit_width(5)").top, 2280);
    EXPECT_EQ(form.b_close.geometry.top, 6240);
    // The bottom buttons in their slots, first and last.
    const std::pair<const Control&, int> lefts[] = {
        {form.b_PulseProfile, 120}, {form.b_min, 3180}, {form.b_close, 4200}};
    for (const auto& [button, left] : lefts) EXPECT_EQ(button.geometry.left, left) << button.name;
    type(form.VexoEdit_width[5], 2e-6);
    EXPECT_EQ(form.VexoEdit_width[5].value(), 2e-6);
}

TEST_F(Startup, ApplyAndProfileStartDisabledWithFixedPrfInForce) {
    EXPECT_FALSE(form.b_apply.enabled);
    EXPECT_FALSE(form.m_PulseProfile.enabled);
    EXPECT_FALSE(form.b_PulseProfile.enabled);
    EXPECT_TRUE(isTrue(state.NeedsCalculation));
    EXPECT_TRUE(isTrue(state.FixedPRF));
    EXPECT_EQ(form.chk_FixedPRF.value, kChecked);
    EXPECT_EQ(state.ReceiverGains, std::vector<std::int16_t>(state.ReceiverNames.size(), 3));
    // The PRF rule has run once: the interval follows the designed PRF.
    EXPECT_DOUBLE_EQ(form.VexoEdit_pri.value(), 1.0 / 5000);
}

TEST_F(Startup, SecondLoadStartsFromTheDesignedWindow) {
    typePrf(12345);
    form.m_NoPG_Click();
    load(kFourPortThreeSources);
    load(kTwoPortExternal);
    EXPECT_EQ(form.rowCount(), 5);
    EXPECT_EQ(form.f_PulsedZentra.geometry.height, 7240);
    EXPECT_EQ(form.VexoEdit_prf.value(), 5000);
    EXPECT_FALSE(form.m_NoPG.checked);
    EXPECT_EQ(form.lbl_gate[2].caption, "B IF Gate :");
}

TEST(FailingStartup, AnalyzerErrorPropagatesAndLeavesTheStateAlone) {
    for (const char* fault : {"analyzer:Application.modelText=-999 Analyzer not responding",
                              "analyzer:Caps.portCount=-999 Analyzer not responding"}) {
        SCOPED_TRACE(fault);
        PulsedModule state;
        state.PRF = 777.0;
        state.NumOutputs = 3;
        sim::SimFaults faults;
        faults.add(fault);
        ModelBench bench(kFourPortThreeSources, faults);
        ScriptedInteraction ui;
        MainForm form{state, bench, ui, makePassThroughSolver};
        try {
            form.Form_Load();
            ADD_FAILURE() << "start-up went on without an analyzer";
        } catch (const InstrumentError& e) {
            EXPECT_EQ(e.description(), "-999 Analyzer not responding");
        }
        EXPECT_EQ(state.PRF, 777.0);
        EXPECT_EQ(state.NumOutputs, 3);
        EXPECT_TRUE(state.ReceiverNames.empty());
        EXPECT_FALSE(isTrue(state.NeedsCalculation));
        EXPECT_EQ(form.rowCount(), 5);
        EXPECT_TRUE(form.b_apply.enabled);
    }
}

}  // namespace
}  // namespace zp::test

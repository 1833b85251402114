// Start-up of the main window: layout by model, enabling, and a failing analyzer.

#include "form_fixture.h"
#include "instruments/instrument_error.h"

namespace zp::test {
namespace {

using Startup = FormTest;

TEST_F(Startup, RowsAndMenusFollowTheModel) {
    struct Case {
        const char* name;
        FakeAnalyzerSetup setup;
        int rows;
        const char* row4;
        const char* lastRow;
        int height;
        bool listed;  // "No SW Gating" enabled, "Pulse Configuration..." shown
    };
    const Case cases[] = {
        {"two-port", twoPortExternal(), 5, "R2 IF Gate :", "R2 IF Gate :", 7240, true},
        {"four-port three-source", fourPortThreeSources(), 6, "D IF Gate :", "R IF Gate :", 7600,
         true},
        {"unlisted", unlisted(), 5, "R2 IF Gate :", "R2 IF Gate :", 7240, false},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        bench.log = {};
        load(c.setup);
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
        EXPECT_EQ(bench.log.capsReads > 0, c.listed);
    }
}

TEST_F(Startup, SixthRowIsAFullRow) {
    load(fourPortThreeSources());
    EXPECT_EQ(form.controls().fieldGeometry("VexoEdit_width(5)").top, 2280);
    EXPECT_EQ(form.b_close.geometry.top, 6240);
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
    load(fourPortThreeSources());
    load(twoPortExternal());
    EXPECT_EQ(form.rowCount(), 5);
    EXPECT_EQ(form.f_PulsedZentra.geometry.height, 7240);
    EXPECT_EQ(form.VexoEdit_prf.value(), 5000);
    EXPECT_FALSE(form.m_NoPG.checked);
    EXPECT_EQ(form.lbl_gate[2].caption, "B IF Gate :");
}

TEST(FailingStartup, AnalyzerErrorPropagatesAndLeavesTheStateAlone) {
    FakeAnalyzerSetup modelError = fourPortThreeSources();
    modelError.modelError = "-999 Analyzer not responding";
    FakeAnalyzerSetup unreachable;
    unreachable.unreachable = true;
    for (const FakeAnalyzerSetup& setup : {modelError, unreachable}) {
        SCOPED_TRACE(setup.unreachable ? "unreachable" : "model query fails");
        PulsedModule state;
        state.PRF = 777.0;
        state.NumOutputs = 3;
        FakeBench bench;
        bench.setup = setup;
        ScriptedInteraction ui;
        MainForm form{state, bench, ui, makePassThroughSolver};
        try {
            form.Form_Load();
            ADD_FAILURE() << "start-up went on without an analyzer";
        } catch (const InstrumentError& e) {
            if (!setup.unreachable) {
                EXPECT_EQ(e.description(), "-999 Analyzer not responding");
            }
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

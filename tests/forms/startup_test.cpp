// Start-up of the main window: layout by model, enabling, and a failing analyzer.

#include "form_fixture.h"
#include "instruments/instrument_error.h"

namespace zp::test {
namespace {

using Startup = FormTest;

TEST_F(Startup, DesignedWindowHasItsCaptionsAndRanges) {
    EXPECT_EQ(form.f_PulsedZentra.caption, "Veltrix Zentra Pulse Application");
    EXPECT_EQ(form.frm_gates.caption, "Modulation/Gates");
    EXPECT_EQ(form.frm_PulsedParams.caption, "Desired PRF and IFBW");
    EXPECT_EQ(form.lbl_prf.caption, "Pulse Repetition Frequency :");
    EXPECT_EQ(form.chk_FixedPRF.caption, "Fixed PRF");
    EXPECT_EQ(form.chk_pulsed.caption, "Pulsed Mode On");
    EXPECT_EQ(form.m_ConfigPG.caption, "&Pulse Generators/Modulators...");
    EXPECT_EQ(form.m_NoSWGating.caption, "No &SW Gating");
    EXPECT_EQ(form.m_PulseConfig.caption, "Pulse &Configuration...");
    EXPECT_EQ(form.VexoEdit_width[2].name(), "VexoEdit_width(2)");
    EXPECT_EQ(form.lbl_gate[2].name, "lbl_gate(2)");
    EXPECT_EQ(form.VexoEdit_prf.lower(), 0.001);
    EXPECT_EQ(form.VexoEdit_prf.upper(), 165e6);
    EXPECT_EQ(form.VexoEdit_pri.lower(), 3.4e-9);
    EXPECT_EQ(form.VexoEdit_IFBW.value(), 500);
    EXPECT_EQ(form.VexoEdit_IFBW.upper(), 10000);
    EXPECT_EQ(form.VexoEdit_delay[0].upper(), 1);
    EXPECT_EQ(form.VexoEdit_width[0].unitList(),
              "sec 1.e0 msec 1.e-3 usec 1.e-6 nsec 1.e-9 psec 1.e-12");
}

TEST_F(Startup, TwoPortKeepsTheDesignedFiveRows) {
    EXPECT_EQ(form.rowCount(), 5);
    EXPECT_EQ(state.NumOutputs, 5);
    EXPECT_EQ(form.lbl_gate[0].caption, "Source Modulation :");
    EXPECT_EQ(form.lbl_gate[4].caption, "R2 IF Gate :");
    EXPECT_EQ(form.f_PulsedZentra.geometry.height, 7240);
    EXPECT_EQ(form.frm_gates.geometry.height, 2535);
    EXPECT_EQ(form.frm_DutyCycle.geometry.top, 4200);
    EXPECT_EQ(form.b_close.geometry.top, 5880);
    EXPECT_TRUE(form.m_NoSWGating.enabled);
    EXPECT_TRUE(form.m_PulseConfig.visible);
    EXPECT_TRUE(form.m_PulseConfig.enabled);
}

TEST_F(Startup, FourPortThreeSourcesGrowsASixthRow) {
    load(fourPortThreeSources());
    ASSERT_EQ(form.rowCount(), 6);
    ASSERT_EQ(form.VexoEdit_delay.size(), 6u);
    EXPECT_EQ(state.NumOutputs, 6);
    EXPECT_EQ(form.lbl_gate[1].caption, "A IF Gate :");
    EXPECT_EQ(form.lbl_gate[4].caption, "D IF Gate :");
    EXPECT_EQ(form.lbl_gate[5].caption, "R IF Gate :");
    const Geometry label = form.lbl_gate[5].geometry;
    EXPECT_EQ(label.left, 840);
    EXPECT_EQ(label.width, 855);
    EXPECT_EQ(label.top, 2340);
    EXPECT_EQ(form.fieldGeometry.at("VexoEdit_width(5)").left, 1800);
    EXPECT_EQ(form.fieldGeometry.at("VexoEdit_width(5)").top, 2280);
    EXPECT_EQ(form.fieldGeometry.at("VexoEdit_delay(5)").left, 3360);
    EXPECT_EQ(form.fieldGeometry.at("VexoEdit_delay(5)").top, 2280);
    EXPECT_EQ(form.frm_gates.geometry.height, 2895);
    EXPECT_EQ(form.frm_DutyCycle.geometry.top, 4560);
    EXPECT_EQ(form.frm_pulsed.geometry.top, 4560);
    for (const Control* b :
         {&form.b_PulseProfile, &form.b_min, &form.b_save, &form.b_recall, &form.b_close})
        EXPECT_EQ(b->geometry.top, 6240) << b->name;
    EXPECT_EQ(form.f_PulsedZentra.geometry.height, 7600);
    EXPECT_TRUE(form.m_PulseConfig.visible);

    // The sixth row is a full row: its entries run the rules.
    ASSERT_EQ(form.VexoEdit_width[5].enter(2e-6), std::nullopt);
    EXPECT_EQ(form.VexoEdit_width[5].value(), 2e-6);
    EXPECT_TRUE(form.m_PulseConfig.enabled);
}

TEST_F(Startup, UnlistedModelHasNoSwGatingDisabledAndNoPulseConfiguration) {
    bench.log = {};
    load(unlisted());
    EXPECT_EQ(form.rowCount(), 5);
    EXPECT_EQ(form.lbl_gate[1].caption, "A IF Gate :");
    EXPECT_EQ(form.lbl_gate[3].caption, "R1 IF Gate :");
    EXPECT_FALSE(form.m_NoSWGating.enabled);
    EXPECT_FALSE(form.m_PulseConfig.visible);
    EXPECT_FALSE(form.m_PulseConfig.enabled);
    EXPECT_EQ(bench.log.capsReads, 0);  // counts are read for listed models only
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
    ASSERT_EQ(form.VexoEdit_prf.enter(12345), std::nullopt);
    form.m_NoPG_Click();
    load(fourPortThreeSources());
    load(twoPortExternal());
    EXPECT_EQ(form.rowCount(), 5);
    EXPECT_EQ(form.f_PulsedZentra.geometry.height, 7240);
    EXPECT_EQ(form.VexoEdit_prf.value(), 5000);
    EXPECT_FALSE(form.m_NoPG.checked);
    EXPECT_EQ(form.lbl_gate[2].caption, "B IF Gate :");
}

TEST_F(Startup, ViewsAreToldOnceLoaded) {
    int refreshes = 0;
    form.onChanged([&] { ++refreshes; });
    load(twoPortInternal());
    EXPECT_GE(refreshes, 1);
    const int before = refreshes;
    ASSERT_EQ(form.VexoEdit_width[1].enter(2e-6), std::nullopt);
    EXPECT_GT(refreshes, before);
}

class FailingStartup : public ::testing::Test {
  protected:
    PulsedModule state;
    FakeBench bench;
    ScriptedInteraction ui;
    MainForm form{state, bench, ui, makePassThroughSolver};

    void expectUntouched() {
        EXPECT_EQ(state.PRF, 777.0);
        EXPECT_EQ(state.NumOutputs, 3);
        EXPECT_TRUE(state.ReceiverNames.empty());
        EXPECT_FALSE(isTrue(state.NeedsCalculation));
        EXPECT_EQ(form.rowCount(), 5);
        EXPECT_TRUE(form.b_apply.enabled);
    }
    void SetUp() override {
        state.PRF = 777.0;
        state.NumOutputs = 3;
    }
};

TEST_F(FailingStartup, AnalyzerErrorPropagatesAndLeavesTheStateAlone) {
    bench.setup = fourPortThreeSources();
    bench.setup.modelError = "-999 Analyzer not responding";
    try {
        form.Form_Load();
        FAIL() << "start-up went on without an analyzer";
    } catch (const InstrumentError& e) {
        EXPECT_EQ(e.description(), "-999 Analyzer not responding");
    }
    expectUntouched();
}

TEST_F(FailingStartup, UnreachableAnalyzerPropagates) {
    bench.setup.unreachable = true;
    EXPECT_THROW(form.Form_Load(), InstrumentError);
    expectUntouched();
}

}  // namespace
}  // namespace zp::test

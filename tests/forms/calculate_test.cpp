// Timing rules, the duty-cycle text and Calculate on both solver paths.

#include <cmath>

#include "form_fixture.h"

namespace zp::test {
namespace {

constexpr const char* kWidthLimit =
    "The pulse width must be less than 90% of the pulse period (1/PRF)";
constexpr const char* kNoSolution =
    "No solution found.\nFor more information, see \"Pulsed Application\" in Veltrix Zentra "
    "online help.";

class Calculate : public FormTest {
  protected:
    // Sets the width (and delay) of a row from code; a negative delay leaves it alone.
    void row(int r, double width, double delay = -1, bool enabled = true) {
        form.VexoEdit_width[r].setValue(width);
        form.VexoEdit_width[r].setEnabled(enabled);
        if (delay < 0) return;
        form.VexoEdit_delay[r].setValue(delay);
        form.VexoEdit_delay[r].setEnabled(enabled);
    }
    // Calculate must have failed and left the state unsolved.
    void expectUnsolved(const std::vector<std::string>& messages) {
        EXPECT_EQ(ui.messages, messages);
        EXPECT_EQ(ui.kinds, std::vector<MessageKind>(messages.size(), MessageKind::Warning));
        EXPECT_TRUE(isTrue(state.NeedsCalculation));
        EXPECT_FALSE(form.b_apply.enabled);
    }
};

TEST_F(Calculate, WidthLimitIsStrict) {
    typePrf(100000);
    row(0, 8e-6);
    EXPECT_TRUE(form.FPulseWidthOK(100000));
    row(2, 20e-6, -1, false);  // a disabled gate does not count...
    EXPECT_TRUE(form.FPulseWidthOK(100000));
    EXPECT_TRUE(ui.messages.empty());
    row(0, 9e-6, -1, false);  // ...but row 0 always does
    EXPECT_FALSE(form.FPulseWidthOK(100000));
    EXPECT_EQ(ui.messages, std::vector<std::string>{kWidthLimit});
}

TEST_F(Calculate, FailedWidthTestSolvesNothing) {
    typePrf(100000);
    row(1, 9e-6);
    form.b_calculate_Click();
    EXPECT_EQ(solver.created, 0);
    expectUnsolved({kWidthLimit});
    EXPECT_EQ(state.PRF, 0.0);
    EXPECT_EQ(ui.pointers, (std::vector<Pointer>{Pointer::Busy, Pointer::Normal}));
}

TEST_F(Calculate, ScansLookAtEnabledRowsAfterTheFirst) {
    row(0, 7e-6, 9e-6, false);
    row(1, 0.5e-6);
    form.VexoEdit_delay[1].setValue(1e-6);
    form.VexoEdit_delay[1].setEnabled(false);  // the first row of a scan counts anyway
    row(3, 3e-6);
    row(4, 0.1e-6, -1, false);
    EXPECT_EQ(form.FMaxPulseWidth(), 7e-6);
    EXPECT_EQ(form.FMaxGateWidth(), 3e-6);
    EXPECT_EQ(form.FMinPulseWidth(), 0.5e-6);
    EXPECT_EQ(form.FHighestGateDelay(), 1e-6);
    form.VexoEdit_delay[3].setValue(2e-6);
    EXPECT_EQ(form.FHighestGateDelay(), 2e-6);
    // The last row counts too.
    row(4, 0.1e-6, 5e-6);
    EXPECT_EQ(form.FMinPulseWidth(), 0.1e-6);
    EXPECT_EQ(form.FHighestGateDelay(), 5e-6);
    row(4, 8e-6);
    EXPECT_EQ(form.FMaxPulseWidth(), 8e-6);
    EXPECT_EQ(form.FMaxGateWidth(), 8e-6);
}

TEST_F(Calculate, AutoGainAtThe50kHzAnd100nsBoundaries) {
    const struct {
        double prf, narrowest;
        int gain;
    } cases[] = {{50000, 0.999e-6, 1},
                 {50000, 1e-6, 0},
                 {50001, 0.999e-6, 0},
                 {50001, 1e-7, 0},
                 {50001, 99e-9, 1}};
    for (const auto& c : cases) {
        SCOPED_TRACE(testing::Message() << c.prf << " Hz, " << c.narrowest << " s");
        state.PRF = c.prf;
        for (int r = 0; r < 5; ++r) row(r, r == 4 ? c.narrowest : 2e-6);
        EXPECT_EQ(form.FAutoGain(), c.gain);
    }
}

TEST_F(Calculate, SecondPressWithoutChangeDoesNotSolveAgain) {
    form.b_calculate_Click();
    form.b_calculate_Click();
    EXPECT_EQ(solver.created, 1);
    EXPECT_EQ(solver.calls, std::vector<std::string>{"SolveExternal"});
    EXPECT_TRUE(ui.messages.empty());
    EXPECT_FALSE(isTrue(state.NeedsCalculation));
    EXPECT_TRUE(form.b_apply.enabled);
    EXPECT_EQ(state.PRF, 5000);
}

TEST_F(Calculate, NoSolutionKeepsEntriesAndApplyDisabled) {
    typePrf(12345);
    solver.prf = 0.0;
    form.b_calculate_Click();
    expectUnsolved({kNoSolution});
    EXPECT_EQ(form.VexoEdit_prf.value(), 12340);
    EXPECT_EQ(state.PRF, 0.0);
    EXPECT_EQ(form.lbl_DutyCycle.caption, "");
}

TEST_F(Calculate, ResultsGoIntoTheFieldsWithoutRunningRules) {
    form.VexoEdit_pri.setValue(123e-6);
    form.b_calculate_Click();
    EXPECT_EQ(form.VexoEdit_pri.value(), 123e-6) << "an unmoved PRF leaves the interval alone";

    typePrf(5000);
    solver.prf = 6000.5;  // would be cut to 6000 by the PRF rule
    solver.ifbw = 3001;
    form.b_calculate_Click();
    EXPECT_EQ(form.VexoEdit_prf.value(), 6000.5);
    EXPECT_EQ(form.VexoEdit_IFBW.value(), 3001);
    EXPECT_DOUBLE_EQ(form.VexoEdit_pri.value(), 1 / 6000.5);
    EXPECT_FALSE(isTrue(state.NeedsCalculation));
    EXPECT_TRUE(form.b_apply.enabled);
    EXPECT_EQ(state.SolvedIFCount, 7);
}

TEST_F(Calculate, ExternalDecadeFromTheDesiredPrf) {
    const std::pair<double, int> cases[] = {{999, -1}, {1000, -1}, {5000, 0}, {10000, 1},
                                            {1e6, 2},  {500, -1},  {0.5, -4}};
    for (auto& width : form.VexoEdit_width) width.setValue(100e-9);  // fits 1 MHz
    for (const auto& [prf, decade] : cases) {
        SCOPED_TRACE(prf);
        typePrf(prf);
        form.b_calculate_Click();
        EXPECT_EQ(solver.decade, decade);
        EXPECT_EQ(solver.desiredPrf, prf);
    }
    EXPECT_EQ(solver.flag, kTrue);
    EXPECT_EQ(solver.fixedPrf, kTrue);
}

TEST_F(Calculate, ExternalPathPassesRoundedIfbwAndConverterDelay) {
    type(form.VexoEdit_IFBW, 2500.5);
    form.b_calculate_Click();
    EXPECT_EQ(solver.ifbwHzIn, 2500);  // ties to even
    EXPECT_EQ(solver.converterDelay, 0.0);

    form.m_ConverterMeas_Click();
    ASSERT_EQ(form.controls().setChecked("chk_FixedPRF", false), std::nullopt);
    form.b_calculate_Click();
    EXPECT_EQ(solver.converterDelay, 6.2e-6);
    EXPECT_EQ(state.ConverterDelay, 6.2e-6);
    EXPECT_EQ(solver.fixedPrf, kFalse);
}

TEST_F(Calculate, InternalGatedGetsGateRowsOnly) {
    load(kTwoPortInternal);
    row(0, 8e-6, 9e-6);
    row(1, 1e-6);
    row(2, 1e-6, 2e-6);
    row(3, 3e-6);
    row(4, 5e-6, 4e-6, false);
    solver.ifbw = 2500.5;
    form.b_calculate_Click();
    ASSERT_EQ(solver.calls, std::vector<std::string>{"SolveInternalGated"});
    EXPECT_EQ(solver.highestGateDelay, 2e-6);
    EXPECT_EQ(solver.widestGateWidth, 3e-6);
    EXPECT_EQ(solver.pulseClockHz, 100e6);
    EXPECT_EQ(solver.ifbwIn, 500);
    EXPECT_EQ(state.IFBWHz, 2500);
    EXPECT_EQ(form.VexoEdit_IFBW.value(), 2500);
    EXPECT_EQ(state.GatedSolveTicks, 42);
}

TEST_F(Calculate, InternalWithoutSwGatingUsesThePlainSolveAndSlowClock) {
    load(kTwoPortSlowClock);
    form.m_NoSWGating_Click();
    form.b_calculate_Click();
    EXPECT_EQ(solver.calls, std::vector<std::string>{"SolveInternal"});
    EXPECT_EQ(solver.pulseClockHz, 60e6);
    EXPECT_EQ(state.IntSolveList1, (std::vector<std::int32_t>{1, 2, 3}));
}

TEST_F(Calculate, ThrowingSolverIsReportedAndChangesNothing) {
    form.b_calculate_Click();  // a first solution to fall back on
    type(form.VexoEdit_width[1], 2e-6);
    const double lastPrf = state.PRF;
    state.SolvedIFCount = 3;
    solver.prf = 1234.0;
    solver.error = "solver exploded";
    ui.pointers.clear();
    form.b_calculate_Click();
    expectUnsolved({"solver exploded"});
    EXPECT_EQ(state.PRF, lastPrf);
    EXPECT_EQ(state.SolvedIFCount, 3);
    EXPECT_EQ(state.SolvedFreqOffset, 123.0);  // from the first solve, not the failed one
    EXPECT_EQ(form.VexoEdit_prf.value(), 5000);
    EXPECT_EQ(ui.pointers, (std::vector<Pointer>{Pointer::Busy, Pointer::Normal}));
}

TEST_F(Calculate, NonFinitePrfFromTheSolverIsAnErrorOnBothPaths) {
    for (const char* model : {kTwoPortExternal, kTwoPortInternal}) {
        SCOPED_TRACE(model);
        load(model);
        ui.messages.clear();
        ui.kinds.clear();
        solver.prf = std::nan("");
        form.b_calculate_Click();
        expectUnsolved({"The timing solver gave an invalid PRF (NaN Hz)."});
        EXPECT_EQ(state.PRF, 0.0);
    }
}

TEST(CalculateWithoutSolver, MissingSolverIsReported) {
    // No factory, and a factory that gives no solver.
    for (const MainForm::SolverFactory& factory :
         {MainForm::SolverFactory{},
          MainForm::SolverFactory{[] { return std::unique_ptr<TimingSolver>(); }}}) {
        PulsedModule state;
        ModelBench bench;
        ScriptedInteraction ui;
        MainForm form(state, bench, ui, factory);
        form.Form_Load();
        form.b_calculate_Click();
        EXPECT_EQ(ui.messages, std::vector<std::string>{"The timing solver is not available."});
        EXPECT_TRUE(isTrue(state.NeedsCalculation));
    }
}

TEST_F(Calculate, DutyCycleListsEnabledRows) {
    typePrf(100000);
    for (int r : {0, 2, 3}) form.VexoEdit_width[r].setEnabled(false);
    row(1, 1.25e-6);
    row(4, 2.5e-6);
    form.b_calculate_Click();
    EXPECT_EQ(form.lbl_DutyCycle.caption, "A IF Gate :12.5%\nR2 IF Gate :25%\n");

    row(0, 1.234567e-6);
    form.SUpdateDutyCycle();
    EXPECT_EQ(form.lbl_DutyCycle.caption,
              "Source Modulation :12.3457%\nA IF Gate :12.5%\nR2 IF Gate :25%\n");
}

}  // namespace
}  // namespace zp::test

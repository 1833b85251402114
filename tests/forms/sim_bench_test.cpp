// The main window model on the simulated bench with the default timing solver.

#include <gtest/gtest.h>

#include "core/pulsed_module.h"
#include "fake_analyzer.h"
#include "forms/main_form.h"
#include "sim/sim_bench.h"

namespace zp::test {
namespace {

struct OnSim {
    explicit OnSim(const char* model) : bench(model) { form.Form_Load(); }
    PulsedModule state;
    sim::SimBench bench;
    ScriptedInteraction ui;
    MainForm form{state, bench, ui};
};

TEST(OnSimBench, FourPortThreeSourceModelShowsSixRows) {
    OnSim sim("kt655");
    EXPECT_EQ(sim.form.rowCount(), 6);
    EXPECT_EQ(sim.form.lbl_gate[5].caption, "R IF Gate :");
    EXPECT_EQ(sim.form.f_PulsedZentra.geometry.height, 7600);
    EXPECT_TRUE(isTrue(sim.state.HasClock100MHz));
}

TEST(OnSimBench, DefaultSolverKeepsOrMovesThePrf) {
    OnSim sim("kt611");  // listed, no internal generators: the external path
    ASSERT_EQ(sim.form.VexoEdit_IFBW.enter(3000), std::nullopt);
    sim.form.b_calculate_Click();
    EXPECT_TRUE(sim.ui.messages.empty());
    EXPECT_EQ(sim.form.VexoEdit_prf.value(), 5000);
    EXPECT_EQ(sim.form.VexoEdit_IFBW.value(), 2500);
    EXPECT_EQ(sim.state.SolvedIFCount, 2);
    EXPECT_TRUE(sim.form.b_apply.enabled);

    sim.form.setFixedPRF(false);
    ASSERT_EQ(sim.form.VexoEdit_IFBW.enter(3000), std::nullopt);
    sim.form.b_calculate_Click();
    EXPECT_EQ(sim.form.VexoEdit_prf.value(), 6000);
    EXPECT_DOUBLE_EQ(sim.form.VexoEdit_pri.value(), 1.0 / 6000);
}

TEST(OnSimBench, HelpOpensTheManualAtTheMainWindowTopic) {
    OnSim sim("kt622");
    sim.form.m_contents_Click();
    ASSERT_EQ(sim.ui.helpCalls.size(), 1u);
    const std::string& file = sim.ui.helpCalls[0].file;
    EXPECT_NE(file.find("zentra-pulse.html"), std::string::npos);
    EXPECT_EQ(file.find_first_of("\"\r\n"), std::string::npos);
    EXPECT_EQ(sim.ui.helpCalls[0].topic, 1114);
}

}  // namespace
}  // namespace zp::test

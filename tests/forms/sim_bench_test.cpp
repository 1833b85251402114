// The main window model on the simulated bench with the default timing solver.

#include <gtest/gtest.h>

#include "core/pulsed_module.h"
#include "fake_analyzer.h"
#include "forms/main_form.h"
#include "sim/sim_bench.h"

namespace zp::test {
namespace {

TEST(OnSimBench, DefaultSolverKeepsOrMovesThePrf) {
    PulsedModule state;
    sim::SimBench bench("kt611");  // listed, no internal generators: the external path
    ScriptedInteraction ui;
    MainForm form{state, bench, ui};
    form.Form_Load();
    ASSERT_EQ(form.VexoEdit_IFBW.enter(3000), std::nullopt);
    form.b_calculate_Click();
    EXPECT_TRUE(ui.messages.empty());
    EXPECT_EQ(form.VexoEdit_prf.value(), 5000);
    EXPECT_EQ(form.VexoEdit_IFBW.value(), 2500);
    EXPECT_EQ(state.SolvedIFCount, 2);
    EXPECT_TRUE(form.b_apply.enabled);

    form.setFixedPRF(false);
    ASSERT_EQ(form.VexoEdit_IFBW.enter(3000), std::nullopt);
    form.b_calculate_Click();
    EXPECT_EQ(form.VexoEdit_prf.value(), 6000);
    EXPECT_DOUBLE_EQ(form.VexoEdit_pri.value(), 1.0 / 6000);
}

}  // namespace
}  // namespace zp::test

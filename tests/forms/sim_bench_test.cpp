// The main window model on the simulated bench with the default timing solver.

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

    ASSERT_EQ(form.controls().setChecked("chk_FixedPRF", false), std::nullopt);
    ASSERT_EQ(form.VexoEdit_IFBW.enter(3000), std::nullopt);
    form.b_calculate_Click();
    EXPECT_EQ(form.VexoEdit_prf.value(), 6000);
    EXPECT_DOUBLE_EQ(form.VexoEdit_pri.value(), 1.0 / 6000);
}

// Start-up and help write exactly these analyzer calls; scripts compare them.
TEST(OnSimBench, StartupAndHelpTraces) {
    const std::vector<std::string> listedStartup = {
        "ANA Application.modelText() -> \"KT655A\"",
        "ANA Application.optionText() -> \"K71 M83 M84\"",
        "ANA Application.hardwareInfo()",
        "ANA Caps.sourceCount() -> 3",
        "ANA Caps.portCount() -> 4",
        "ANA Caps.hardwareValue() -> \"5.0\"",
    };
    const std::vector<std::string> unlistedStartup = {
        "ANA Application.modelText() -> \"ZX20\"",
        "ANA Application.optionText() -> \"J55\"",
        "ANA Application.hardwareInfo()",
    };
    for (const auto& [model, startup] :
         {std::pair{"kt655", listedStartup}, std::pair{"zx20-j55", unlistedStartup}}) {
        SCOPED_TRACE(model);
        PulsedModule state;
        sim::SimBench bench(model);
        ScriptedInteraction ui;
        MainForm form{state, bench, ui};
        form.Form_Load();
        EXPECT_EQ(bench.trace()->lines(), startup);

        bench.trace()->clear();
        form.m_contents_Click();
        const std::vector<std::string> lines = bench.trace()->lines();
        ASSERT_EQ(lines.size(), 2u);
        EXPECT_EQ(lines[0], "ANA Application.commandParser()");
        EXPECT_EQ(lines[1].rfind("ANA CommandParser.parse(\"DIAG:HELP:FILE?\") -> \"\\\"", 0), 0u)
            << lines[1];
        ASSERT_EQ(ui.helpCalls.size(), 1u);
        EXPECT_EQ(ui.helpCalls[0].file.find_first_of("\"\n"), std::string::npos);
    }
}

}  // namespace
}  // namespace zp::test

#include <gtest/gtest.h>

#include <sstream>

#include "core/pulsed_module.h"
#include "lib/cli_actions.h"
#include "lib/console_interaction.h"
#include "sim/sim_bench.h"

namespace zp::app {
namespace {

class CliActions : public ::testing::Test {
  protected:
    void start(const std::string& model) {
        bench_ = std::make_unique<sim::SimBench>(model);
        form_ = std::make_unique<MainForm>(pulsedModule(), *bench_, ui_);
        form_->Form_Load();
    }
    int run(const std::vector<std::string>& words) {
        if (!form_) start("kt622");
        out_.str("");
        err_.str("");
        std::vector<Action> actions = parseActions(words);
        ActionContext ctx{*form_, ui_, out_};
        return runActions(actions, ctx, err_);
    }
    std::string parseError(const std::vector<std::string>& words) {
        try {
            parseActions(words);
        } catch (const ActionError& e) {
            return e.what();
        }
        return "(parsed)";
    }

    std::ostringstream out_;
    std::ostringstream err_;
    ConsoleInteraction ui_{out_, false};
    std::unique_ptr<sim::SimBench> bench_;
    std::unique_ptr<MainForm> form_;
};

TEST_F(CliActions, SetEchoesTheValueTheRulesLeftInBaseUnits) {
    ASSERT_EQ(run({"set", "prf", "12345", "set", "ifbw", "1k", "set", "width", "0", "2.5us"}), 0)
        << err_.str();
    EXPECT_EQ(out_.str(),
              "set prf 12345 -> 12340 Hz\n"
              "set ifbw 1k -> 1000 Hz\n"
              "set width 0 2.5us -> 2.5E-06 sec\n");
    EXPECT_DOUBLE_EQ(form_->VexoEdit_pri.value(), 1.0 / 12340.0);
    EXPECT_DOUBLE_EQ(form_->VexoEdit_width[0].value(), 2.5e-6);
}

TEST_F(CliActions, PriEntryRunsThePrfRule) {
    ASSERT_EQ(run({"set", "pri", "200us"}), 0) << err_.str();
    EXPECT_DOUBLE_EQ(form_->VexoEdit_prf.value(), 5000.0);
}

TEST_F(CliActions, ARefusedValueFailsWithTheFieldsReasonAndChangesNothing) {
    ASSERT_EQ(run({"set", "prf", "10k"}), 0);
    EXPECT_EQ(run({"set", "prf", "0", "set", "ifbw", "2k"}), 1);
    EXPECT_DOUBLE_EQ(form_->VexoEdit_prf.value(), 10000.0);
    EXPECT_DOUBLE_EQ(form_->VexoEdit_IFBW.value(), 500.0) << "actions after a failure must not run";
    EXPECT_EQ(err_.str().rfind("zentra-pulse-cli: set prf 0: ", 0), 0u) << err_.str();
    EXPECT_GT(err_.str().size(), std::string("zentra-pulse-cli: set prf 0: \n").size());

    EXPECT_EQ(run({"set", "ifbw", "lots"}), 1);
    EXPECT_NE(err_.str().find("set ifbw lots: "), std::string::npos);
}

TEST_F(CliActions, RowsBeyondTheAnalyzersLayoutAreRefused) {
    EXPECT_EQ(run({"set", "width", "5", "1us"}), 1);
    EXPECT_NE(err_.str().find("row 5 does not exist (rows 0 to 4"), std::string::npos)
        << err_.str();
}

TEST_F(CliActions, FourPortAnalyzerHasSixRows) {
    start("kt655");
    EXPECT_EQ(run({"set", "delay", "5", "1us"}), 0) << err_.str();
    EXPECT_EQ(out_.str(), "set delay 5 1us -> 1E-06 sec\n");
}

TEST_F(CliActions, TogglesFollowTheModelAndReportTheState) {
    ASSERT_EQ(run({"set", "fixedprf", "off", "set", "converter", "on", "set", "converter", "on"}),
              0)
        << err_.str();
    EXPECT_FALSE(form_->chk_FixedPRF.checked());
    EXPECT_TRUE(form_->m_ConverterMeas.checked) << "setting it on twice must not toggle it off";
    EXPECT_EQ(out_.str(),
              "set fixedprf off -> off\nset converter on -> on\nset converter on -> on\n");
}

TEST_F(CliActions, ToggleOfADisabledMenuEntryFails) {
    start("kt622");
    form_->m_NoSWGating.enabled = false;  // as on an analyzer without a known layout
    EXPECT_EQ(run({"set", "noswgating", "on"}), 1);
    EXPECT_NE(err_.str().find("No SW Gating is not available on this analyzer"), std::string::npos)
        << err_.str();
    EXPECT_FALSE(form_->m_NoSWGating.checked);
}

TEST_F(CliActions, CalculateSolvesAndAMessageDuringAnActionIsAFailure) {
    ASSERT_EQ(run({"set", "prf", "12345", "calculate"}), 0) << err_.str();
    EXPECT_NE(out_.str().find("calculate -> PRF 12340 Hz, IF bandwidth "), std::string::npos)
        << out_.str();
    EXPECT_FALSE(isTrue(form_->state().NeedsCalculation));

    // 9 us at 100 kHz is not below 90 % of the period.
    EXPECT_EQ(run({"set", "prf", "100k", "set", "width", "0", "9us", "calculate"}), 1);
    EXPECT_NE(out_.str().find("message: The pulse width must be less than 90% of the pulse "
                              "period (1/PRF)"),
              std::string::npos)
        << out_.str();
    EXPECT_NE(err_.str().find("zentra-pulse-cli: calculate: The pulse width must be less"),
              std::string::npos)
        << err_.str();
}

TEST_F(CliActions, StepMovesTheValueAsTheArrowKeysDo) {
    const double before = [&] {
        start("kt622");
        return form_->VexoEdit_IFBW.value();
    }();
    ASSERT_EQ(run({"step", "ifbw", "up"}), 0) << err_.str();
    EXPECT_GT(form_->VexoEdit_IFBW.value(), before);
    ASSERT_EQ(run({"step", "ifbw", "down", "step", "width", "1", "down"}), 0) << err_.str();
    EXPECT_DOUBLE_EQ(form_->VexoEdit_IFBW.value(), before);
    EXPECT_LT(form_->VexoEdit_width[1].value(), 1e-6);
}

TEST_F(CliActions, HelpPrintsTheFileTheAnalyzerNames) {
    ASSERT_EQ(run({"help"}), 0) << err_.str();
    EXPECT_NE(out_.str().find("zentra-pulse.html (topic 1114)\n"), std::string::npos) << out_.str();
    EXPECT_EQ(out_.str().find('"'), std::string::npos) << "quotes must be removed";
}

TEST_F(CliActions, ShowPrintsTheJsonOnly) {
    ASSERT_EQ(run({"show"}), 0);
    EXPECT_EQ(out_.str().front(), '{');
    EXPECT_NE(out_.str().find("\"VexoEdit_prf\""), std::string::npos);
}

TEST_F(CliActions, ParseErrorsNameTheWordAndWhatWasExpected) {
    EXPECT_NE(parseError({"frobnicate"}).find("unknown action 'frobnicate'"), std::string::npos);
    EXPECT_EQ(parseError({"set", "prf"}), "set prf: missing value");
    EXPECT_EQ(parseError({"set"}), "set: missing FIELD");
    EXPECT_NE(parseError({"set", "colour", "red"}).find("unknown field 'colour'"),
              std::string::npos);
    EXPECT_EQ(parseError({"set", "width", "x", "1us"}),
              "set width: row must be a whole number from 0, not 'x'");
    EXPECT_EQ(parseError({"set", "width", "-1", "1us"}),
              "set width: row must be a whole number from 0, not '-1'");
    EXPECT_EQ(parseError({"set", "pulsed", "yes"}), "set pulsed: expected on or off, not 'yes'");
    EXPECT_EQ(parseError({"step", "prf", "sideways"}),
              "step prf: expected up or down, not 'sideways'");
    EXPECT_EQ(parseError({"step", "delay", "2"}), "step delay: missing up|down");
    EXPECT_EQ(parseError({"set", "prf", "1k", "calculate", "show"}), "(parsed)");
}

TEST(ConsoleInteraction, PrintsMessagesOnOneLineAndAnswersAsTold) {
    std::ostringstream out;
    ConsoleInteraction no(out, false);
    no.message("No solution found.\r\nFor more information, see the help.");
    EXPECT_FALSE(no.ask("Overwrite?"));
    EXPECT_EQ(out.str(),
              "message: No solution found. For more information, see the help.\n"
              "question: Overwrite? -> no\n");
    EXPECT_EQ(no.takeMessages().size(), 1u);
    EXPECT_TRUE(no.takeMessages().empty());

    ConsoleInteraction yes(out, true);
    EXPECT_TRUE(yes.ask("Overwrite?"));
    EXPECT_FALSE(yes.chooseOpenFile("*.zpc"));
    yes.setNextFile("a.zpc");
    EXPECT_EQ(yes.chooseSaveFile("*.zpc"), "a.zpc");
    EXPECT_FALSE(yes.chooseSaveFile("*.zpc")) << "a file choice is used once";
}

}  // namespace
}  // namespace zp::app

#include <gtest/gtest.h>

#include <sstream>

#include "common/cli_actions.h"
#include "common/console_interaction.h"
#include "core/pulsed_module.h"
#include "instruments/instrument_error.h"
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
    int run(const std::vector<std::string>& words, bool keepGoing = false) {
        if (!form_) start("kt622");
        out_.str("");
        err_.str("");
        std::vector<Action> actions = parseActions(words);
        ActionContext ctx{*form_, ui_, out_, nullptr, keepGoing};
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

TEST_F(CliActions, EachActionEchoesWhatTheModelLeft) {
    struct Case {
        const char* model;
        std::vector<std::string> words;
        std::string echo;
    };
    const Case cases[] = {
        {"kt622",
         {"set", "prf", "12345", "set", "ifbw", "1k", "set", "width", "0", "2.5us"},
         "set prf 12345 -> 12340 Hz\nset ifbw 1k -> 1000 Hz\nset width 0 2.5us -> 2.5E-06 sec\n"},
        {"kt622", {"set", "pri", "200us"}, "set pri 200us -> 0.0002 sec\n"},
        {"kt655", {"set", "delay", "5", "1us"}, "set delay 5 1us -> 1E-06 sec\n"},
        // Setting a toggle on twice must not toggle it off.
        {"kt622",
         {"set", "fixedprf", "off", "set", "converter", "on", "set", "converter", "on"},
         "set fixedprf off -> off\nset converter on -> on\nset converter on -> on\n"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.echo);
        start(c.model);
        ASSERT_EQ(run(c.words), 0) << err_.str();
        EXPECT_EQ(out_.str(), c.echo);
    }
    EXPECT_FALSE(form_->chk_FixedPRF.checked());
    EXPECT_TRUE(form_->m_ConverterMeas.checked);
}

TEST_F(CliActions, TheFirstFailureEndsTheRunWithItsReason) {
    ASSERT_EQ(run({"set", "prf", "10k"}), 0);
    EXPECT_EQ(run({"set", "prf", "0", "set", "ifbw", "2k"}), 1);
    EXPECT_DOUBLE_EQ(form_->VexoEdit_prf.value(), 10000.0);
    EXPECT_DOUBLE_EQ(form_->VexoEdit_IFBW.value(), 500.0) << "actions after a failure must not run";
    EXPECT_EQ(err_.str().rfind("zentra-pulse-cli: set prf 0: ", 0), 0u) << err_.str();
    EXPECT_GT(err_.str().size(), std::string("zentra-pulse-cli: set prf 0: \n").size());

    EXPECT_EQ(run({"set", "width", "5", "1us"}), 1);
    EXPECT_NE(err_.str().find("row 5 does not exist (rows 0 to 4"), std::string::npos)
        << err_.str();

    form_->m_NoSWGating.enabled = false;  // as on an analyzer without a known layout
    EXPECT_EQ(run({"set", "noswgating", "on"}), 1);
    EXPECT_EQ(err_.str(), "zentra-pulse-cli: set noswgating on: No SW Gating is disabled\n");
    EXPECT_FALSE(form_->m_NoSWGating.checked);

    // Without pulse generators the gate lines cannot be typed into, as in the window.
    EXPECT_EQ(run({"set", "nopg", "on", "set", "width", "1", "2us"}), 1);
    EXPECT_EQ(err_.str(),
              "zentra-pulse-cli: set width 1 2us: VexoEdit_width(1) is disabled "
              "(Modulation/Gates is disabled)\n");
    EXPECT_EQ(form_->VexoEdit_width[1].value(), 1e-6);
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

TEST_F(CliActions, ApplyEchoesTheProcedureAndTheGeneratorRows) {
    const struct {
        const char* model;
        std::vector<std::string> words;
        std::string echo;
    } cases[] = {
        {"kt611", {"apply"}, "apply -> SPulsedModeOn, generator rows programmed: 5\n"},
        {"kt611",
         {"set", "nopg", "on", "apply"},
         "set nopg on -> on\napply -> SPulsedModeOn, generator rows programmed: 0\n"},
        {"kt611",
         {"set", "pulsed", "off", "apply"},
         "set pulsed off -> off\napply -> SPulsedModeOff, generator rows switched off: 5\n"},
        {"kt622", {"apply"}, "apply -> SPulsedModeOn2\n"},
        {"kt622",
         {"set", "pulsed", "off", "apply"},
         "set pulsed off -> off\napply -> SPulsedModeOff2\n"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.echo);
        start(c.model);
        ASSERT_EQ(run({"calculate"}), 0) << err_.str();
        ASSERT_EQ(run(c.words), 0) << err_.str();
        EXPECT_EQ(out_.str(), c.echo);
    }
}

TEST_F(CliActions, ApplyFailsWhenRefusedOrWhenItShowsAMessage) {
    start("kt611");
    EXPECT_EQ(run({"apply"}), 1);
    EXPECT_EQ(err_.str(), "zentra-pulse-cli: apply: Apply is disabled\n");

    bench_->faults().add("noidn:12");
    EXPECT_EQ(run({"calculate", "apply", "show"}), 1);
    EXPECT_EQ(out_.str().find("apply ->"), std::string::npos) << out_.str();
    EXPECT_NE(out_.str().find("message: Error reading from signal generator at address 12\n"),
              std::string::npos)
        << out_.str();
    EXPECT_EQ(err_.str(),
              "zentra-pulse-cli: apply: Error reading from signal generator at address 12\n");
}

TEST_F(CliActions, KeepGoingRunsTheRestAfterAFailureButNotAfterLostOutput) {
    start("kt622");
    EXPECT_EQ(run({"set", "prf", "0", "set", "ifbw", "2k", "apply", "calculate"}, true), 1);
    EXPECT_EQ(err_.str(),
              "zentra-pulse-cli: set prf 0: 0 Hz is outside 0.001 Hz to 165 MHz\n"
              "zentra-pulse-cli: apply: Apply is disabled\n");
    EXPECT_EQ(out_.str().rfind("set ifbw 2k -> 2000 Hz\ncalculate -> PRF 5000 Hz", 0), 0u)
        << out_.str();

    out_.setstate(std::ios::badbit);
    EXPECT_EQ(run({"set", "ifbw", "1k", "set", "ifbw", "3k"}, true), 1);
    EXPECT_EQ(err_.str(), "zentra-pulse-cli: set ifbw 1k: cannot write the output\n");
    EXPECT_EQ(form_->VexoEdit_IFBW.value(), 1000.0);
    out_.clear();
}

TEST_F(CliActions, StepHelpAndShow) {
    start("kt622");
    const double before = form_->VexoEdit_IFBW.value();
    ASSERT_EQ(run({"step", "ifbw", "up"}), 0) << err_.str();
    EXPECT_GT(form_->VexoEdit_IFBW.value(), before);
    ASSERT_EQ(run({"step", "ifbw", "down", "step", "width", "1", "down"}), 0) << err_.str();
    EXPECT_DOUBLE_EQ(form_->VexoEdit_IFBW.value(), before);
    EXPECT_LT(form_->VexoEdit_width[1].value(), 1e-6);

    ASSERT_EQ(run({"help"}), 0) << err_.str();
    EXPECT_NE(out_.str().find("zentra-pulse.html (topic 1114)\n"), std::string::npos) << out_.str();
    EXPECT_EQ(out_.str().find('"'), std::string::npos) << "quotes must be removed";

    ASSERT_EQ(run({"show"}), 0);
    EXPECT_EQ(out_.str().rfind("{\n \"f_PulsedZentra\": ", 0), 0u) << "the JSON only";
    EXPECT_NE(out_.str().find("\n \"status\": {\"model\": \"KT622A\", \"options\": \"K71 M81\", "
                              "\"simulated\": true, "),
              std::string::npos);
}

TEST_F(CliActions, AFailureIsOneLineWhateverTheAnalyzerSaid) {
    start("kt622");
    const Action failing{"boom", [](ActionContext&) -> std::string {
                             throw InstrumentError(-200, "-200 Execution\r\nerror\n");
                         }};
    ActionContext ctx{*form_, ui_, out_};
    EXPECT_EQ(runActions({failing}, ctx, err_), 1);
    EXPECT_EQ(err_.str(), "zentra-pulse-cli: boom: analyzer error: -200 Execution error\n");
}

TEST_F(CliActions, ParseErrorsNameTheWordAndWhatWasExpected) {
    const std::pair<std::vector<std::string>, std::string> cases[] = {
        {{"frobnicate"},
         "unknown action 'frobnicate' (actions: set, step, calculate, apply, show, help)"},
        {{"set", "prf"}, "set prf: missing value"},
        {{"set"}, "set: missing FIELD"},
        {{"set", "width", "x", "1us"}, "set width: row must be a whole number from 0, not 'x'"},
        {{"set", "width", "-1", "1us"}, "set width: row must be a whole number from 0, not '-1'"},
        {{"set", "pulsed", "yes"}, "set pulsed: expected on or off, not 'yes'"},
        {{"step", "prf", "sideways"}, "step prf: expected up or down, not 'sideways'"},
        {{"step", "delay", "2"}, "step delay: missing up|down"},
        {{"set", "prf", "1k", "calculate", "show"}, "(parsed)"}};
    for (const auto& [words, error] : cases) EXPECT_EQ(parseError(words), error);
    EXPECT_NE(parseError({"set", "colour", "red"}).find("unknown field 'colour'"),
              std::string::npos);
}

TEST(ConsoleInteraction, PrintsMessagesOnOneLineAndAnswersAsTold) {
    std::ostringstream out;
    ConsoleInteraction no(out, false);
    no.message("No solution found.\r\nFor more information, see the help.", MessageKind::Warning);
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

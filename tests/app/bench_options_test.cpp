#include <gtest/gtest.h>

#include <optional>
#include <sstream>

#include "common/bench_options.h"
#include "common/bench_wiring.h"
#include "common/cli_actions.h"

namespace zp::app {
namespace {

ParsedCommandLine cli(std::vector<std::string> args) {
    return parseCommandLine(args, Program::Cli);
}
ParsedCommandLine gui(std::vector<std::string> args) {
    return parseCommandLine(args, Program::Gui);
}

TEST(BenchOptions, DefaultsToTheSimulatedKt622WithSimulatedGenerators) {
    ParsedCommandLine p = cli({"show"});
    ASSERT_EQ(p.error, "");
    EXPECT_EQ(p.options.model, "kt622");
    EXPECT_FALSE(p.options.bus);
    EXPECT_FALSE(p.options.traceFile);
    EXPECT_EQ(p.rest, std::vector<std::string>{"show"});
}

TEST(BenchOptions, ReadsEveryOptionInBothSpellings) {
    ParsedCommandLine p = cli({"--analyzer=sim:kt655", "--trace-io", "t.log", "--fault", "baddata",
                               "--fault=timeout:12", "--bus", "11=TCPIP0::127.0.0.1::5025::SOCKET",
                               "-y", "--keep-going", "set", "prf", "10k"});
    ASSERT_EQ(p.error, "");
    EXPECT_EQ(p.options.model, "kt655");
    EXPECT_EQ(p.options.traceFile, "t.log");
    EXPECT_EQ(p.options.faults, (std::vector<std::string>{"baddata", "timeout:12"}));
    EXPECT_EQ(p.options.bus, "11=TCPIP0::127.0.0.1::5025::SOCKET");
    EXPECT_TRUE(p.options.yes);
    EXPECT_TRUE(p.options.keepGoing);
    EXPECT_FALSE(cli({"show"}).options.keepGoing);
    EXPECT_EQ(p.rest, (std::vector<std::string>{"set", "prf", "10k"}));
    EXPECT_FALSE(cli({"--bus", "sim"}).options.bus);
}

TEST(BenchOptions, OptionsEndAtTheFirstActionSoActionWordsAreNeverTakenForOptions) {
    ParsedCommandLine p = cli({"set", "delay", "0", "--fault", "x"});
    ASSERT_EQ(p.error, "");
    EXPECT_EQ(p.rest.size(), 5u);
    // A negative number starts the actions too, and "--" ends the options.
    EXPECT_EQ(cli({"-5"}).rest, std::vector<std::string>{"-5"});
    EXPECT_EQ(cli({"--", "--help"}).rest, std::vector<std::string>{"--help"});
    EXPECT_FALSE(cli({"--", "--help"}).options.help);
}

TEST(BenchOptions, RefusesBadOptionsWithAReasonThatNamesThem) {
    struct Case {
        std::vector<std::string> args;
        std::string expected;
    };
    const Case cases[] = {
        {{"--frobnicate"}, "unknown option '--frobnicate'"},
        {{"--analyzer"}, "option --analyzer needs a value"},
        {{"--analyzer="}, "option --analyzer needs a value"},
        {{"--analyzer", "sim:kt999"}, "unknown analyzer model 'kt999'"},
        {{"--analyzer", "TCPIP0::host::INSTR"}, "unsupported analyzer"},
        {{"--fault", "bogus"}, "bad --fault value"},
        {{"--bus", "garbage"}, "bad --bus value"},
        {{"--screenshot", "x.png"}, "unknown option '--screenshot'"},
    };
    for (const Case& c : cases) {
        ParsedCommandLine p = cli(c.args);
        EXPECT_NE(p.error.find(c.expected), std::string::npos)
            << c.args.front() << " gave: " << p.error;
    }
}

TEST(BenchOptions, TheWindowProgramTakesNoActionsButAScreenshotFile) {
    EXPECT_NE(gui({"show"}).error.find("unexpected argument 'show'"), std::string::npos);
    EXPECT_NE(gui({"--yes"}).error.find("unknown option"), std::string::npos);
    ParsedCommandLine p = gui({"--screenshot", "w.png", "--analyzer", "sim:kt644"});
    ASSERT_EQ(p.error, "");
    EXPECT_EQ(p.options.screenshot, "w.png");
    EXPECT_EQ(p.options.model, "kt644");
}

TEST(BenchOptions, MakesTheBenchItDescribes) {
    BenchOptions o;
    o.model = "kt655";
    EXPECT_EQ(makeBench(o)->describe(),
              "simulated KT655A (kt655), simulated generators at 11, 12, 13");

    o.traceFile = "/nonexistent-dir/trace.log";
    EXPECT_THROW(makeBench(o), std::exception);
    std::ostringstream err;
    EXPECT_EQ(makeBenchOrReport(o, Program::Gui, err), nullptr);
    EXPECT_EQ(err.str().rfind("zentra-pulse: ", 0), 0u) << err.str();
}

TEST(BenchOptions, EarlyExitsAnswerHelpVersionModelsAndUsageErrors) {
    struct Case {
        std::vector<std::string> args;
        std::optional<int> status;
        std::string out;
        std::string err;
    };
    const Case cases[] = {
        {{"show"}, std::nullopt, "", ""},
        {{"--version"}, 0, std::string("zentra-pulse-cli ") + ZP_VERSION + "\n", ""},
        {{"--list-models"}, 0, modelListText(), ""},
        {{"--help"}, 0, usageText(Program::Cli), ""},
        {{"--nope"},
         2,
         "",
         "zentra-pulse-cli: unknown option '--nope'\nTry 'zentra-pulse-cli --help'.\n"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.args.front());
        std::ostringstream out;
        std::ostringstream err;
        EXPECT_EQ(earlyExit(cli(c.args), Program::Cli, out, err), c.status);
        EXPECT_EQ(out.str(), c.out);
        EXPECT_EQ(err.str(), c.err);
    }
    const std::string models = modelListText();
    EXPECT_NE(models.find("kt655\tKT655A\tK71 M83 M84\t4\t3\n"), std::string::npos) << models;
    EXPECT_NE(models.find("kt611\tKT611A\t-\t2\t1\n"), std::string::npos) << models;
    EXPECT_EQ(usageText(Program::Gui).find("calculate"), std::string::npos);
}

TEST(BenchOptions, TheActionHelpComesFromTheActionTable) {
    const std::string usage = usageText(Program::Cli);
    const std::string actions = usage.substr(usage.find("\nActions"));
    EXPECT_EQ(actions.substr(actions.find("  step")),
              "  step FIELD [ROW] up|down    one step of the field, as the arrow keys do\n"
              "  calculate                   solve the timing\n"
              "  apply                       put the setup onto the instruments (or off)\n"
              "  show                        print the main window state as JSON\n"
              "  help                        print the help file the analyzer reports\n"
              "\nExit status: 0 success, 1 failure, 2 bad command line.\n");
    // A usage too long for the column has its help below it.
    const std::string indent(30, ' ');
    EXPECT_NE(actions.find("\n  set FIELD [ROW] VALUE | set TOGGLE on|off\n" + indent +
                           "type VALUE into a field, or set a toggle\n" + indent +
                           "FIELD: prf|pri|ifbw|width ROW|delay ROW\n" + indent +
                           "TOGGLE: fixedprf|converter|nopg|noswgating|pulsed\n" + indent +
                           "VALUE: a number with a unit, e.g. 10k, 200us\n  step"),
              std::string::npos)
        << actions;
    for (const ActionKind& kind : actionTable()) {
        EXPECT_NE(actions.find("\n  " + kind.usage), std::string::npos) << kind.name;
    }
}

TEST(BenchOptions, HelpListsEveryOptionOfItsProgram) {
    const std::pair<const char*, std::vector<std::string>> options[] = {
        {"--analyzer", {"--analyzer", "sim:kt622"}},
        {"--list-models", {"--list-models"}},
        {"--bus", {"--bus", "sim"}},
        {"--trace-io", {"--trace-io", "t.log"}},
        {"--fault", {"--fault", "baddata"}},
        {"--help", {"--help"}},
        {"--version", {"--version"}},
        {"--yes", {"--yes"}},
        {"--keep-going", {"--keep-going"}},
        {"--screenshot", {"--screenshot", "w.png"}}};
    for (const Program program : {Program::Gui, Program::Cli}) {
        const std::string usage = usageText(program);
        for (const auto& [option, args] : options) {
            const bool accepted = parseCommandLine(args, program).error.empty();
            EXPECT_EQ(usage.find(std::string("  ") + option) != std::string::npos, accepted)
                << programName(program) << " " << option;
        }
    }
}

}  // namespace
}  // namespace zp::app

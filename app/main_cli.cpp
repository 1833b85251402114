// zentra-pulse-cli: the main window without a screen. Runs the given actions in order.

#include <iostream>
#include <optional>
#include <string>
#include <vector>

#include "forms/main_form.h"
#include "instruments/instrument_error.h"
#include "common/bench_options.h"
#include "common/cli_actions.h"
#include "common/console_interaction.h"

int main(int argc, char** argv) {
    using namespace zp::app;
    const std::vector<std::string> args(argv + 1, argv + argc);
    const ParsedCommandLine cmd = parseCommandLine(args, Program::Cli);
    if (const std::optional<int> status = earlyExit(cmd, Program::Cli, std::cout, std::cerr)) {
        return *status;
    }
    const BenchOptions& options = cmd.options;
    if (cmd.rest.empty()) {
        std::cerr << "zentra-pulse-cli: no action given\nTry 'zentra-pulse-cli --help'.\n";
        return kUsageExit;
    }

    std::vector<Action> actions;
    try {
        actions = parseActions(cmd.rest);
    } catch (const ActionError& e) {
        std::cerr << "zentra-pulse-cli: " << ConsoleInteraction::oneLine(e.what())
                  << "\nTry 'zentra-pulse-cli --help'.\n";
        return kUsageExit;
    }

    const std::unique_ptr<zp::sim::SimBench> bench =
        makeBenchOrReport(options, Program::Cli, std::cerr);
    if (!bench) return kUsageExit;

    ConsoleInteraction ui(std::cout, options.yes);
    zp::MainForm form(zp::pulsedModule(), *bench, ui);
    try {
        form.Form_Load();
    } catch (const zp::InstrumentError& e) {
        std::cerr << "zentra-pulse-cli: the analyzer cannot be reached: "
                  << ConsoleInteraction::oneLine(e.description()) << '\n';
        return 1;
    } catch (const std::exception& e) {
        std::cerr << "zentra-pulse-cli: start-up failed: " << ConsoleInteraction::oneLine(e.what())
                  << '\n';
        return 1;
    }
    ActionContext ctx{form, ui, std::cout, bench->trace()};
    if (const std::string lost = lostOutput(ctx); !lost.empty()) {
        std::cerr << "zentra-pulse-cli: start-up: " << lost << '\n';
        return 1;
    }
    return runActions(actions, ctx, std::cerr);
}

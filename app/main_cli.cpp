// zentra-pulse-cli: the main window without a screen. Runs the given actions in order.

#include <iostream>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "common/cli_actions.h"
#include "common/console_interaction.h"
#include "common/startup.h"

namespace {

using namespace zp::app;

class CliFrontEnd : public FrontEnd {
  public:
    std::optional<int> prepare(const ParsedCommandLine& cmd) override {
        if (cmd.rest.empty()) {
            std::cerr << "zentra-pulse-cli: no action given\nTry 'zentra-pulse-cli --help'.\n";
            return kUsageExit;
        }
        try {
            actions_ = parseActions(cmd.rest);
        } catch (const ActionError& e) {
            std::cerr << "zentra-pulse-cli: " << ConsoleInteraction::oneLine(e.what())
                      << "\nTry 'zentra-pulse-cli --help'.\n";
            return kUsageExit;
        }
        ui_ = std::make_unique<ConsoleInteraction>(std::cout, cmd.options.yes);
        keepGoing_ = cmd.options.keepGoing;
        return std::nullopt;
    }

    zp::Interaction& interaction() override { return *ui_; }

    void showStartupFailure(StartupFailure failure, const std::string& text) override {
        std::cerr << (failure == StartupFailure::AnalyzerUnreachable
                          ? "zentra-pulse-cli: the analyzer cannot be reached: "
                          : "zentra-pulse-cli: start-up failed: ")
                  << ConsoleInteraction::oneLine(text) << '\n';
    }

    int run(zp::MainForm& form, zp::Bench& bench) override {
        ActionContext ctx{form, *ui_, std::cout, bench.trace(), keepGoing_};
        if (const std::string lost = lostOutput(ctx); !lost.empty()) {
            std::cerr << "zentra-pulse-cli: start-up: " << lost << '\n';
            return 1;
        }
        return runActions(actions_, ctx, std::cerr);
    }

  private:
    std::vector<Action> actions_;
    std::unique_ptr<ConsoleInteraction> ui_;
    bool keepGoing_ = false;
};

}  // namespace

int main(int argc, char** argv) {
    CliFrontEnd frontEnd;
    return runFrontEnd(Program::Cli, std::vector<std::string>(argv + 1, argv + argc), frontEnd);
}

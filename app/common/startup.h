#pragma once
// The one start-up path of zentra-pulse and zentra-pulse-cli: read the command line, answer
// --help, --version and --list-models, refuse a bad command line, build the bench and run the main
// window's start-up. What differs between the two programs is a FrontEnd.

#include <optional>
#include <string>
#include <vector>

#include "common/bench_options.h"
#include "forms/interaction.h"
#include "forms/main_form.h"
#include "instruments/bench.h"

namespace zp::app {

enum class StartupFailure {
    AnalyzerUnreachable,  // the text is the analyzer's description
    Other,                // the text is the reason
};

class FrontEnd {
  public:
    virtual ~FrontEnd() = default;
    // Once the command line is usable, before the bench is built: what only this program checks
    // or sets up. A status ends the program with it.
    virtual std::optional<int> prepare(const ParsedCommandLine& cmd) = 0;
    // The interaction the main window talks to; asked for after prepare().
    virtual Interaction& interaction() = 0;
    // Shows why the main window's start-up failed; the program then ends with status 1.
    virtual void showStartupFailure(StartupFailure failure, const std::string& text) = 0;
    // The program's own work once the main window has started; returns the exit status.
    virtual int run(MainForm& form, Bench& bench) = 0;
};

// Runs the program on its arguments (without the program name) and returns its exit status: 0 or
// 1 from the program, kUsageExit for a command line or bench that cannot be used.
int runFrontEnd(Program program, const std::vector<std::string>& args, FrontEnd& frontEnd);

}  // namespace zp::app

#pragma once
// Command-line options shared by zentra-pulse and zentra-pulse-cli: which bench to run on, the
// generator transport, faults to inject and the I/O trace.

#include <iosfwd>
#include <optional>
#include <string>
#include <vector>

#include "sim/sim_model.h"

namespace zp::app {

enum class Program { Gui, Cli };

struct BenchOptions {
    std::string model = sim::kDefaultModel;
    std::optional<std::string> bus;        // generator resources; nothing = simulated generators
    std::optional<std::string> traceFile;  // I/O trace file
    std::vector<std::string> faults;
    bool listModels = false;
    bool help = false;
    bool version = false;
    // zentra-pulse-cli only.
    bool yes = false;
    bool keepGoing = false;  // a failed action does not end the run
    // zentra-pulse only: render the main window to this PNG after start-up and end.
    std::optional<std::string> screenshot;
};

struct ParsedCommandLine {
    BenchOptions options;
    std::vector<std::string> rest;  // everything from the first non-option (the CLI's actions)
    std::string error;              // non-empty when the command line is unusable
};

// Parses the options (without the program name). Options end at the first argument that is not an
// option or after "--"; every value is checked here so that a bad one is reported before anything
// starts. The GUI accepts no further arguments.
ParsedCommandLine parseCommandLine(const std::vector<std::string>& args, Program program);

// What the command line settles before anything starts: an unusable one is reported on `err`
// (exit status kUsageExit); --help, --version and --list-models write their text to `out`
// (exit status 0). Nothing when the program goes on.
std::optional<int> earlyExit(const ParsedCommandLine& cmd, Program program, std::ostream& out,
                             std::ostream& err);

const char* programName(Program program);
std::string usageText(Program program);
std::string versionText(Program program);
// One line per simulated model: name, model text, options, ports, sources.
std::string modelListText();

// Exit status for a command line that cannot be used.
inline constexpr int kUsageExit = 2;

}  // namespace zp::app

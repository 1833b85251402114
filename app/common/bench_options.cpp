#include "bench_options.h"

#include <ostream>
#include <sstream>
#include <stdexcept>

#include "common/cli_actions.h"
#include "sim/faults.h"
#include "transport/transport_factory.h"

namespace zp::app {
namespace {

// "--name=value" or "--name value"; nothing when `arg` is not this option.
struct ValueOption {
    bool matched = false;
    std::optional<std::string> value;
};

ValueOption takeValue(const std::vector<std::string>& args, std::size_t& i,
                      const std::string& name) {
    const std::string& arg = args[i];
    if (arg == name) {
        if (i + 1 >= args.size()) return {true, std::nullopt};
        return {true, args[++i]};
    }
    if (arg.rfind(name + "=", 0) == 0) return {true, arg.substr(name.size() + 1)};
    return {};
}

std::string checkAnalyzer(const std::string& value, std::string& model) {
    const std::string prefix = "sim:";
    if (value.rfind(prefix, 0) != 0) {
        return "unsupported analyzer '" + value +
               "': only simulated analyzers are available (sim:MODEL, see --list-models)";
    }
    const std::string name = value.substr(prefix.size());
    if (sim::findSimModel(name) == nullptr) {
        return "unknown analyzer model '" + name + "' (see --list-models)";
    }
    model = name;
    return {};
}

// Each action's usage with its help beside it, or below it when the usage is too long.
void printActionHelp(std::ostream& out) {
    constexpr std::size_t kHelpColumn = 30;
    for (const ActionKind& kind : actionTable()) {
        std::string line = "  " + kind.usage;
        std::istringstream help(kind.help);
        for (std::string text; std::getline(help, text); line.clear()) {
            if (line.size() + 2 > kHelpColumn) {
                out << line << '\n';
                line.clear();
            }
            line.resize(kHelpColumn, ' ');
            out << line << text << '\n';
        }
        if (!line.empty()) out << line << '\n';
    }
}

}  // namespace

const char* programName(Program program) {
    return program == Program::Gui ? "zentra-pulse" : "zentra-pulse-cli";
}

ParsedCommandLine parseCommandLine(const std::vector<std::string>& args, Program program) {
    ParsedCommandLine result;
    BenchOptions& o = result.options;
    std::size_t i = 0;
    auto fail = [&](std::string text) {
        result.error = std::move(text);
        return result;
    };
    for (; i < args.size(); ++i) {
        const std::string& arg = args[i];
        if (arg == "--") {
            ++i;
            break;
        }
        // A lone "-" or a negative number is not an option: it starts the actions.
        if (arg.size() < 2 || arg[0] != '-' || (arg[1] >= '0' && arg[1] <= '9') || arg[1] == '.') {
            break;
        }
        if (arg == "--help" || arg == "-h") {
            o.help = true;
            continue;
        }
        if (arg == "--version") {
            o.version = true;
            continue;
        }
        if (arg == "--list-models") {
            o.listModels = true;
            continue;
        }
        if (program == Program::Cli && (arg == "--yes" || arg == "-y")) {
            o.yes = true;
            continue;
        }
        if (program == Program::Cli && arg == "--keep-going") {
            o.keepGoing = true;
            continue;
        }
        struct Named {
            const char* name;
            bool gui;
            bool cli;
        };
        static constexpr Named kValueOptions[] = {{"--analyzer", true, true},
                                                  {"--bus", true, true},
                                                  {"--trace-io", true, true},
                                                  {"--fault", true, true},
                                                  {"--screenshot", true, false}};
        bool handled = false;
        for (const Named& named : kValueOptions) {
            if ((program == Program::Gui && !named.gui) || (program == Program::Cli && !named.cli))
                continue;
            const std::string name = named.name;
            ValueOption v = takeValue(args, i, name);
            if (!v.matched) continue;
            handled = true;
            if (!v.value || v.value->empty()) return fail("option " + name + " needs a value");
            const std::string& value = *v.value;
            if (name == "--analyzer") {
                if (std::string e = checkAnalyzer(value, o.model); !e.empty()) return fail(e);
            } else if (name == "--bus") {
                if (value != "sim") {
                    try {
                        parseBusResources(value);
                    } catch (const std::exception& e) {
                        return fail("bad --bus value: " + std::string(e.what()));
                    }
                    o.bus = value;
                } else {
                    o.bus.reset();
                }
            } else if (name == "--trace-io") {
                o.traceFile = value;
            } else if (name == "--fault") {
                try {
                    sim::SimFaults check;
                    check.add(value);
                } catch (const std::exception& e) {
                    return fail("bad --fault value: " + std::string(e.what()));
                }
                o.faults.push_back(value);
            } else if (name == "--screenshot") {
                o.screenshot = value;
            }
            break;
        }
        if (!handled) return fail("unknown option '" + arg + "'");
    }
    result.rest.assign(args.begin() + static_cast<std::ptrdiff_t>(i), args.end());
    if (program == Program::Gui && !result.rest.empty() && !o.help && !o.version) {
        return fail("unexpected argument '" + result.rest.front() + "'");
    }
    return result;
}

std::optional<int> earlyExit(const ParsedCommandLine& cmd, Program program, std::ostream& out,
                             std::ostream& err) {
    if (!cmd.error.empty()) {
        err << programName(program) << ": " << cmd.error << "\nTry '" << programName(program)
            << " --help'.\n";
        return kUsageExit;
    }
    const BenchOptions& options = cmd.options;
    if (options.help) {
        out << usageText(program);
    } else if (options.version) {
        out << versionText(program);
    } else if (options.listModels) {
        out << modelListText();
    } else {
        return std::nullopt;
    }
    return 0;
}

std::string usageText(Program program) {
    std::ostringstream out;
    const bool cli = program == Program::Cli;
    out << "Usage: " << programName(program) << " [OPTIONS]" << (cli ? " ACTION..." : "") << "\n";
    out << (cli ? "Runs the Zentra Pulse main window without a screen, action by action.\n"
                : "Sets a vector network analyzer up for pulsed RF measurements.\n");
    out << "\nOptions:\n"
           "  --analyzer sim:MODEL  simulated analyzer model (default sim:"
        << sim::kDefaultModel
        << ")\n"
           "  --list-models         list the simulated analyzer models and exit\n"
           "  --bus RESOURCES       pulse generator transport: sim (default) or\n"
           "                        ADDR=RESOURCE,... e.g. 11=TCPIP0::127.0.0.1::5025::SOCKET\n"
           "  --trace-io FILE       write every analyzer call and bus text to FILE\n"
           "  --fault FAULT         make the simulated bench fail (repeatable): analyzer:OP=TEXT,\n"
           "                        noidn:ADDR, generror:ADDR=ENTRY, timeout:ADDR, baddata\n";
    if (cli) {
        out << "  --yes, -y             answer yes to every question\n"
               "  --keep-going          run every action: a failed one prints its reason and\n"
               "                        the rest still run (the exit status is still 1)\n";
    }
    if (!cli)
        out << "  --screenshot FILE     start unattended, save the window as PNG FILE, exit\n";
    out << "  --help, -h            show this help and exit\n"
           "  --version             show the version and exit\n";
    if (cli) {
        out << "\nActions (run in order; the first failure ends the run with status 1,\n"
               "unless --keep-going):\n";
        printActionHelp(out);
    }
    out << "\nExit status: 0 success, 1 failure, 2 bad command line.\n";
    return out.str();
}

std::string versionText(Program program) {
    return std::string(programName(program)) + " " + ZP_VERSION + "\n";
}

std::string modelListText() {
    std::ostringstream out;
    out << "name\tmodel\toptions\tports\tsources\n";
    for (const sim::SimModel& m : sim::simModels()) {
        out << m.name << '\t' << m.modelText << '\t' << (m.optionText.empty() ? "-" : m.optionText)
            << '\t' << m.ports << '\t' << m.sources << '\n';
    }
    return out.str();
}

}  // namespace zp::app

#include "common/startup.h"

#include <iostream>

#include "common/bench_wiring.h"
#include "instruments/instrument_error.h"

namespace zp::app {

int runFrontEnd(Program program, const std::vector<std::string>& args, FrontEnd& frontEnd) {
    const ParsedCommandLine cmd = parseCommandLine(args, program);
    if (const std::optional<int> status = earlyExit(cmd, program, std::cout, std::cerr)) {
        return *status;
    }
    if (const std::optional<int> status = frontEnd.prepare(cmd)) return *status;

    const std::unique_ptr<Bench> bench = makeBenchOrReport(cmd.options, program, std::cerr);
    if (!bench) return kUsageExit;

    MainForm form(pulsedModule(), *bench, frontEnd.interaction());
    try {
        form.Form_Load();
    } catch (const InstrumentError& e) {
        frontEnd.showStartupFailure(StartupFailure::AnalyzerUnreachable, e.description());
        return 1;
    } catch (const std::exception& e) {
        frontEnd.showStartupFailure(StartupFailure::Other, e.what());
        return 1;
    }
    return frontEnd.run(form, *bench);
}

}  // namespace zp::app

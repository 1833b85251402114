#pragma once
// The bench the command line describes: the simulated analyzer, the generators it names (the
// simulated ones or real ones through a transport) and the I/O trace they share.

#include <iosfwd>
#include <memory>

#include "common/bench_options.h"
#include "instruments/bench.h"

namespace zp::app {

// Throws std::invalid_argument / std::runtime_error (a trace file that cannot be opened).
std::unique_ptr<Bench> makeBench(const BenchOptions& options);

// Builds the bench, or reports why it cannot on `err` (prefixed with the program's name) and
// returns nothing; the program then ends with kUsageExit.
std::unique_ptr<Bench> makeBenchOrReport(const BenchOptions& options, Program program,
                                         std::ostream& err);

}  // namespace zp::app

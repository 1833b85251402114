#pragma once
// What start-up learns from the analyzer: its model, options and, for listed models, port and
// source counts and the hardware value.

#include "core/pulsed_module.h"
#include "instruments/bench.h"

namespace zp {

// Reads the identity on an open connection. The calls, in this order, are what the I/O trace of
// start-up shows: hardwareInfo, modelText, optionText, then for listed models sourceCount,
// portCount and hardwareValue. Throws InstrumentError.
AnalyzerIdentity readAnalyzerIdentity(AnalyzerApplication& app);

// The same on a connection of its own, released before it returns.
AnalyzerIdentity readAnalyzerIdentity(Bench& bench);

}  // namespace zp

#pragma once
// Errors the simulated analyzer raises: the number is the SCPI code at the head of the text.

#include <string>

#include "instruments/instrument_error.h"
#include "sim/scpi_syntax.h"

namespace zp::sim {

// "-113 Undefined header" -> InstrumentError(-113, "-113 Undefined header").
InstrumentError analyzerError(std::string description);
InstrumentError analyzerError(ScpiErrorCode error);

}  // namespace zp::sim

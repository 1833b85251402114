#pragma once
// Errors the simulated analyzer raises: the number is the SCPI code at the head of the text.

#include <string>

#include "instruments/instrument_error.h"

namespace zp::sim {

// "-113 Undefined header" -> InstrumentError(-113, "-113 Undefined header").
InstrumentError analyzerError(std::string description);

inline constexpr const char* kUndefinedHeader = "-113 Undefined header";
inline constexpr const char* kSuffixOutOfRange = "-114 Header suffix out of range";
inline constexpr const char* kMissingParameter = "-109 Missing parameter";
inline constexpr const char* kDataOutOfRange = "-222 Data out of range";
inline constexpr const char* kIllegalValue = "-224 Illegal parameter value";
inline constexpr const char* kSettingsConflict = "-221 Settings conflict";

}  // namespace zp::sim

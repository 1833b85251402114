#include "sim/analyzer/sim_errors.h"

#include <cstdlib>

namespace zp::sim {

InstrumentError analyzerError(std::string description) {
    char* end = nullptr;
    const long number = std::strtol(description.c_str(), &end, 10);
    return InstrumentError(end == description.c_str() ? 1 : number, std::move(description));
}

InstrumentError analyzerError(ScpiErrorCode error) {
    return InstrumentError(error.code, std::to_string(error.code) + " " + error.text);
}

}  // namespace zp::sim

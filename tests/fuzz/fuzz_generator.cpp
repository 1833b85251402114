// The simulated pulse generator's SCPI handler, one program message per input line.

#include <cmath>

#include "fuzz_check.h"
#include "sim/generators/sim_generator.h"

namespace {

// "-222,\"Data out of range\"": a signed code, a comma and a quoted text.
bool isErrorEntry(std::string_view entry) {
    const auto comma = entry.find(',');
    if (comma == std::string_view::npos || comma < 2) return false;
    if (entry[0] != '-' && entry[0] != '+') return false;
    for (std::size_t i = 1; i < comma; ++i) {
        if (entry[i] < '0' || entry[i] > '9') return false;
    }
    return entry.size() >= comma + 3 && entry[comma + 1] == '"' && entry.back() == '"';
}

void checkState(const zp::sim::SimGeneratorState& s, std::string_view line) {
    using zp::fuzz::require;
    require(std::isfinite(s.frequency) && s.frequency > 0, "a positive finite frequency", line);
    require(std::isfinite(s.referenceFrequency), "a finite reference frequency", line);
    for (const auto& out : s.outputs) {
        require(std::isfinite(out.width) && out.width >= 0, "a finite width >= 0", line);
        require(std::isfinite(out.delay) && out.delay >= 0, "a finite delay >= 0", line);
        require(std::isfinite(out.high) && std::isfinite(out.low), "finite levels", line);
        require(std::isfinite(out.loadImpedance) && out.loadImpedance > 0,
                "a positive finite load impedance", line);
    }
    // The queue is bounded: a flood of bad commands must not grow it without end.
    require(s.errorQueue.size() <= 64, "a bounded error queue", line);
    for (const auto& entry : s.errorQueue) {
        require(isErrorEntry(entry), "error entries like -113,\"Undefined header\"", line);
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    zp::sim::SimGenerator generator(11, "");
    for (const std::string_view line : zp::fuzz::lines(zp::fuzz::text(data, size))) {
        if (const auto reply = generator.handle(line)) {
            zp::fuzz::require(zp::fuzz::oneLine(*reply), "a reply ending in its only line feed",
                              line);
        }
        checkState(generator.state(), line);
    }
    // Whatever came before, the error query still answers one entry.
    const auto error = generator.handle("SYST:ERR?");
    zp::fuzz::require(error && zp::fuzz::oneLine(*error) &&
                          isErrorEntry(std::string_view(*error).substr(0, error->size() - 1)),
                      "SYST:ERR? answers one error entry", "SYST:ERR?");
    return 0;
}

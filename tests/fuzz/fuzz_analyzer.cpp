// The simulated analyzer's SCPI command parser (what CommandParser.parse runs), one command per
// input line. The first byte picks the analyzer model, so two- and four-port paths are both fed.

#include <string>

#include "fuzz_check.h"
#include "instruments/instrument_error.h"
#include "sim/analyzer/sim_analyzer_state.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size == 0) return 0;
    const auto& models = zp::sim::simModels();
    zp::sim::SimAnalyzerState state(models[data[0] % models.size()], nullptr, nullptr, nullptr);
    for (const std::string_view line : zp::fuzz::lines(zp::fuzz::text(data + 1, size - 1))) {
        try {
            const std::string reply = state.parse(std::string(line));
            zp::fuzz::require(reply.empty() || zp::fuzz::oneLine(reply),
                              "no reply, or one ending in its only line feed", line);
        } catch (const zp::InstrumentError& e) {
            // Failures carry their SCPI code, also at the head of the text: "-113 Undefined
            // header".
            zp::fuzz::require(e.number() <= -100 && e.number() >= -499, "a SCPI error code", line);
            zp::fuzz::require(e.description().rfind(std::to_string(e.number()) + " ", 0) == 0,
                              "the code at the head of the description", line);
        }
    }
    return 0;
}

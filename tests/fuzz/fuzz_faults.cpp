// Fault texts of the simulated bench's --fault option, one per input line, added to one set.

#include <stdexcept>
#include <string>

#include "fuzz_check.h"
#include "sim/faults.h"

namespace {

std::size_t count(const zp::sim::SimFaults& f) {
    return f.analyzer.size() + f.silentGenerators.size() + f.generatorErrors.size() +
           f.timeoutGenerators.size() + (f.malformedData ? 1 : 0);
}

bool validAddresses(const zp::sim::SimFaults& f) {
    const auto ok = [](int a) { return a >= 0 && a <= 30; };
    for (const int a : f.silentGenerators)
        if (!ok(a)) return false;
    for (const int a : f.timeoutGenerators)
        if (!ok(a)) return false;
    for (const auto& [a, entry] : f.generatorErrors)
        if (!ok(a) || entry.empty()) return false;
    return true;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    using zp::fuzz::require;
    zp::sim::SimFaults faults;
    for (const std::string_view line : zp::fuzz::lines(zp::fuzz::text(data, size))) {
        const std::size_t before = count(faults);
        const std::size_t analyzerBefore = faults.analyzer.size();
        try {
            faults.add(std::string(line));
        } catch (const std::invalid_argument& e) {
            // what() is a C string: a NUL in the text (never in a command line) cuts it short.
            require(line.find('\0') != std::string_view::npos ||
                        std::string_view(e.what()).find("noidn:ADDR") != std::string_view::npos,
                    "a refusal that names the accepted forms", line);
            require(count(faults) == before, "a refused fault adds nothing", line);
            continue;
        }
        // Repeating a generator fault may leave the count as it was; it never adds two.
        require(count(faults) <= before + 1, "one fault per text", line);
        require(validAddresses(faults), "GPIB addresses 0..30 with non-empty entries", line);
        if (faults.analyzer.size() != analyzerBefore) {
            const auto& added = faults.analyzer.back();
            require(added.operation.find('.') != std::string::npos && !added.description.empty(),
                    "an analyzer fault as Object.operation=DESCRIPTION", line);
        }
    }
    return 0;
}

#include "sim/generators/wiring.h"

#include <stdexcept>

namespace zp::sim {

Wiring Wiring::defaultTable(int ports) {
    const int rows = ports == 4 ? 6 : 5;
    std::vector<WiredOutput> table;
    for (int r = 0; r < rows; ++r) table.push_back({11 + r / 2, 1 + r % 2});
    return Wiring(ports, std::move(table));
}

Wiring::Wiring(int ports, std::vector<WiredOutput> rows) : ports_(ports), rows_(std::move(rows)) {
    if (ports_ != 2 && ports_ != 4) throw std::invalid_argument("wiring needs 2 or 4 ports");
}

const WiredOutput& Wiring::row(int r) const {
    if (r < 0 || r >= rowCount()) throw std::out_of_range("no wiring for row " + std::to_string(r));
    return rows_[static_cast<std::size_t>(r)];
}

void Wiring::setRow(int r, WiredOutput output) {
    if (r < 0 || r >= rowCount()) throw std::out_of_range("no wiring for row " + std::to_string(r));
    if (output.output != 1 && output.output != 2) {
        throw std::invalid_argument("generator output must be 1 or 2");
    }
    rows_[static_cast<std::size_t>(r)] = output;
}

PulseWindow Wiring::inputWindow(const SimGeneratorState& generator, int output) {
    PulseWindow window;
    if (generator.frequency > 0.0) window.period = 1.0 / generator.frequency;
    const auto& out = generator.outputs[static_cast<std::size_t>(output == 2 ? 1 : 0)];
    if (!out.on) return window;
    window.pulsed = true;
    window.delay = out.delay;
    window.width = out.width;
    window.complement = !out.inverted;
    return window;
}

int Wiring::gateRow(std::string_view receiver, int ports) {
    if (receiver == "A") return 1;
    if (receiver == "B") return 2;
    if (ports == 4) {
        if (receiver == "C") return 3;
        if (receiver == "D") return 4;
        if (receiver == "R" || receiver == "R1" || receiver == "R2" || receiver == "R3" ||
            receiver == "R4") {
            return 5;
        }
        return -1;
    }
    if (receiver == "R1") return 3;
    if (receiver == "R2") return 4;
    return -1;
}

}  // namespace zp::sim

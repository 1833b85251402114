#pragma once
// How the external generator outputs reach the analyzer: row 0 drives the source modulation, the
// other rows the receiver IF gates (two-port A, B, R1, R2; four-port A, B, C, D, R). The
// analyzer's pulse inputs are active low: the pulse is on while the output sits at its low level.

#include <string>
#include <string_view>
#include <vector>

#include "sim/generators/device_model.h"
#include "sim/generators/sim_generator.h"

namespace zp::sim {

struct WiredOutput {
    int address = 0;  // GPIB address of the generator
    int output = 1;   // its output, 1 or 2
};

class Wiring {
  public:
    // Row r is driven by the generator at 11 + r/2, output 1 + r%2.
    static Wiring defaultTable(int ports);

    Wiring(int ports, std::vector<WiredOutput> rows);

    int ports() const { return ports_; }
    int rowCount() const { return static_cast<int>(rows_.size()); }
    // Throws std::out_of_range for a row that is not wired.
    const WiredOutput& row(int r) const;
    void setRow(int r, WiredOutput output);

    // The gate row of a receiver ("A", "R1", "R" ...), -1 when the layout has no such receiver.
    static int gateRow(std::string_view receiver, int ports);
    // The path element that routes an internal generator to a receiver's gate.
    static std::string gateElement(std::string_view receiver) {
        return "IFGate" + std::string(receiver);
    }
    // What an active-low input sees of output 1 or 2 of a generator: an inverted output is on
    // during [delay, delay + width), a normal one during the rest of the period. An output that
    // is off leaves the input idle, which the analyzer takes as "not pulsed" (gate open, source
    // unmodulated), so a generator row left disabled never blanks its receiver.
    static PulseWindow inputWindow(const SimGeneratorState& generator, int output);

    static constexpr const char* kSourceElement = "PulseModDrive";

  private:
    int ports_;
    std::vector<WiredOutput> rows_;
};

}  // namespace zp::sim

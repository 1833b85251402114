#pragma once
// A simulated two-output pulse generator: a SCPI parser, its settings and an error queue.

#include <array>
#include <deque>
#include <optional>
#include <string>
#include <string_view>

namespace zp::sim {

struct SimGeneratorOutput {
    bool on = false;
    bool inverted = false;
    double width = 1e-6;          // s
    double delay = 0.0;           // s
    double high = 5.0;            // V
    double low = 0.0;             // V
    double loadImpedance = 50.0;  // ohm
};

struct SimGeneratorState {
    double frequency = 1e3;  // Hz
    std::array<SimGeneratorOutput, 2> outputs;
    std::string triggerSource = "IMM";
    std::string armSource = "IMM";
    bool externalReference = false;
    double referenceFrequency = 10e6;
    bool holdVoltage = false;
    bool displayOn = true;
    std::deque<std::string> errorQueue;  // entries like -113,"Undefined header"
};

class SimGenerator {
  public:
    SimGenerator(int address, std::string identity);

    int address() const { return address_; }
    const std::string& identity() const { return identity_; }

    // Handles one program message (one line, without its line feed; several commands may be
    // joined by ";"). Returns the reply with its line feed for queries, nothing otherwise.
    std::optional<std::string> handle(std::string_view line);

    const SimGeneratorState& state() const { return state_; }
    void pushError(const std::string& entry);
    void preset();

  private:
    int address_;
    std::string identity_;
    SimGeneratorState state_;
};

}  // namespace zp::sim

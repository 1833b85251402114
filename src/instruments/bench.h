#pragma once
// What the program talks to: every procedure creates its own analyzer connection and, when it needs
// the generators, its own bus, and releases both at its end. The simulated bench and real
// instruments both offer this.

#include <memory>
#include <string>

#include "instruments/analyzer_automation.h"
#include "instruments/instrument_bus.h"

namespace zp {

class IoTrace;

class Bench {
  public:
    virtual ~Bench() = default;
    // A new connection to the analyzer; throws InstrumentError when it cannot be reached.
    virtual std::unique_ptr<AnalyzerApplication> connectAnalyzer() = 0;
    // A new bus object; throws InstrumentError when the bus cannot be created.
    virtual std::unique_ptr<InstrumentBus> createBus() = 0;
    // The I/O trace every call is written to, or nullptr.
    virtual IoTrace* trace() = 0;
    // One line for the user: which analyzer and which generator transport are in use.
    virtual std::string describe() const = 0;
    // True when the analyzer is a simulation (the window says so).
    virtual bool simulated() const = 0;
};

}  // namespace zp

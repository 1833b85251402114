#pragma once
// The external pulse generators as one procedure sees them: its own bus object, one open device
// per table row, commands, queries and the identification and error-queue checks. Every failure
// is an InstrumentError.

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

#include "instruments/bench.h"
#include "instruments/instrument_bus.h"

namespace zp {

// An opened generator: the bus descriptor and the address it was opened for (for messages).
struct GeneratorDescriptor {
    int address = 0;
    std::int16_t descriptor = -1;
};

class GeneratorSession {
  public:
    // Creates the bus object; throws InstrumentError when the bench cannot.
    explicit GeneratorSession(Bench& bench);
    // Takes over a bus object; throws InstrumentError for none.
    explicit GeneratorSession(std::unique_ptr<InstrumentBus> bus);
    GeneratorSession(const GeneratorSession&) = delete;
    GeneratorSession& operator=(const GeneratorSession&) = delete;

    // Opens the generator at a GPIB address with the fixed settings (openGenerator).
    GeneratorDescriptor open(int address);

    // Sends one command. The session adds the line feed that ends it, so a command must not carry
    // one (std::invalid_argument). As the procedures have always done, a write is not checked on
    // its own: the error-queue check that follows a row's commands finds what went wrong.
    void write(const GeneratorDescriptor& generator, std::string_view command);

    // Sends a query (line feed added as by write) and returns the reply as read, line feed
    // included. A reply that does not come is "Error reading from signal generator at address N".
    std::string query(const GeneratorDescriptor& generator, std::string_view command);

    // checkIdentification and checkInstrumentError for this generator.
    void checkIdentification(const GeneratorDescriptor& generator);
    void checkErrorQueue(const GeneratorDescriptor& generator);

    InstrumentBus& bus() { return *bus_; }

  private:
    std::unique_ptr<InstrumentBus> bus_;
};

}  // namespace zp

#include "instruments/instrument_bus.h"

#include <string>

#include "instruments/instrument_error.h"

namespace zp {

namespace {

constexpr std::size_t kReplyBufferSize = 100;

bool failed(const InstrumentBus& bus) {
    return (bus.status() & InstrumentBus::kStatusError) != 0;
}

[[noreturn]] void failReading(int address) {
    throw InstrumentError(kOwnCheckError, "Error reading from signal generator at address " +
                                              std::to_string(address));
}

}  // namespace

std::int16_t openGenerator(InstrumentBus& bus, int address) {
    return bus.openDevice(0, address, 0, InstrumentBus::kTimeout10s, 1, 0);
}

void checkIdentification(InstrumentBus& bus, std::int16_t descriptor, int address) {
    bus.writeText(descriptor, "*IDN?\n");
    if (failed(bus)) failReading(address);
    std::string buffer(kReplyBufferSize, ' ');
    bus.readText(descriptor, buffer);
    if (failed(bus)) failReading(address);
}

void checkInstrumentError(InstrumentBus& bus, std::int16_t descriptor, int address) {
    bus.writeText(descriptor, ":SYST:ERR?\n");
    std::string buffer(kReplyBufferSize, ' ');
    bus.readText(descriptor, buffer);
    // A reply that never came is a bus failure, not a generator error made of blanks.
    if (failed(bus)) failReading(address);
    if (buffer.rfind("+0", 0) != 0) {
        throw InstrumentError(kOwnCheckError, "Pulse Generator at address " +
                                                  std::to_string(address) +
                                                  " generated the following error: " + buffer);
    }
}

}  // namespace zp

#pragma once
// The bus that reaches the external pulse generators (GPIB, or a transport that stands in for it).

#include <cstdint>
#include <string>

namespace zp {

class InstrumentBus {
  public:
    virtual ~InstrumentBus() = default;

    // Bit of the status word that says the last call failed, and the timeout bit.
    static constexpr std::uint16_t kStatusError = 0x8000;
    static constexpr std::uint16_t kStatusTimeout = 0x4000;
    // The bus library's timeout code for 10 seconds.
    static constexpr int kTimeout10s = 13;

    // Opens a device; the descriptor is passed to every later call for it. Throws InstrumentError
    // when the bus object itself fails (no board, no driver, unreachable gateway).
    virtual std::int16_t openDevice(int board, int primaryAddress, int secondaryAddress,
                                    int timeoutCode, int endOrIdentify, int endOfString) = 0;
    // Sends the text unchanged. A failure sets the error bit of status().
    virtual void writeText(std::int16_t descriptor, const std::string& text) = 0;
    // Reads at most buffer.size() characters of the reply; the buffer then holds exactly the text
    // read (callers pass 100 blanks). A failure sets the error bit and leaves the buffer as it was.
    virtual void readText(std::int16_t descriptor, std::string& buffer) = 0;
    // Status word of the last call.
    virtual std::uint16_t status() const = 0;
    virtual void clearDevice(std::int16_t descriptor) = 0;

    // The address a descriptor was opened for (for messages and the I/O trace); -1 if unknown.
    virtual int addressOf(std::int16_t descriptor) const = 0;
};

// Opens the device at board 0 with the fixed settings every caller uses.
std::int16_t openGenerator(InstrumentBus& bus, int address);

// Identification check: "*IDN?" and its reply, failing with error 1 and
// "Error reading from signal generator at address N" when the error bit is set.
void checkIdentification(InstrumentBus& bus, std::int16_t descriptor, int address);

// Instrument error check: ":SYST:ERR?" and its reply, failing with error 1 when the reply does not
// begin with "+0".
void checkInstrumentError(InstrumentBus& bus, std::int16_t descriptor, int address);

}  // namespace zp

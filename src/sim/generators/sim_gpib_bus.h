#pragma once
// The simulated GPIB bus: an InstrumentBus over the bench's simulated generators.
//
// Behaviour, as a real board would show it:
// - openDevice(0, N, ...) returns a small positive descriptor, also when no generator sits at N
//   (a GPIB board cannot tell). Another board number throws InstrumentError; a primary address
//   outside 0..30 sets ERR and returns -1.
// - writeText hands every line of the text (split on line feeds) to the generator. With no
//   generator at the address the write fails with ERR ("no listener"). A new query discards any
//   reply that was not read yet.
// - readText returns at most buffer.size() characters of the pending reply (line feed included);
//   the buffer then holds exactly what was read and the rest stays for the next read. With no
//   reply pending the read times out: status ERR|TIMO, buffer unchanged.
// - clearDevice discards the pending reply (the error queue stays).
// - status() is 0 after a good call.
// Faults: silentGenerators get no reply to "*IDN?"; timeoutGenerators time out on every read;
// generatorErrors push their entry into the generator's error queue at every openDevice.
// With a trace, every call is written to it (see TracingBus).

#include <cstdint>
#include <map>
#include <memory>
#include <string>

#include "instruments/instrument_bus.h"
#include "sim/generators/sim_generator.h"

namespace zp {
class IoTrace;
}

namespace zp::sim {

struct SimFaults;

class SimGpibBus : public InstrumentBus {
  public:
    // The generators, trace and faults must outlive the bus; trace and faults may be null.
    SimGpibBus(std::map<int, std::unique_ptr<SimGenerator>>& generators, IoTrace* trace = nullptr,
               const SimFaults* faults = nullptr);
    ~SimGpibBus() override;

    std::int16_t openDevice(int board, int primaryAddress, int secondaryAddress, int timeoutCode,
                            int endOrIdentify, int endOfString) override;
    void writeText(std::int16_t descriptor, const std::string& text) override;
    void readText(std::int16_t descriptor, std::string& buffer) override;
    std::uint16_t status() const override;
    void clearDevice(std::int16_t descriptor) override;
    int addressOf(std::int16_t descriptor) const override;

  private:
    std::unique_ptr<InstrumentBus> bus_;  // the simulation, behind a TracingBus when traced
};

}  // namespace zp::sim

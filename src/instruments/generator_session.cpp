#include "instruments/generator_session.h"

#include <stdexcept>

#include "instruments/instrument_error.h"
#include "instruments/io_trace.h"

namespace zp {

namespace {

constexpr std::size_t kReplyBufferSize = 100;

std::string line(std::string_view command) {
    if (command.empty()) throw std::invalid_argument("A generator command must not be empty.");
    if (command.find_first_of("\r\n") != std::string_view::npos) {
        throw std::invalid_argument(
            "A generator command must not contain a line end (the session adds the line feed): " +
            IoTrace::quote(command));
    }
    return std::string(command) + "\n";
}

}  // namespace

GeneratorSession::GeneratorSession(Bench& bench) : GeneratorSession(bench.createBus()) {}

GeneratorSession::GeneratorSession(std::unique_ptr<InstrumentBus> bus) : bus_(std::move(bus)) {
    if (!bus_) throw InstrumentError(kOwnCheckError, "The generator bus cannot be created.");
}

GeneratorDescriptor GeneratorSession::open(int address) {
    return {address, openGenerator(*bus_, address)};
}

void GeneratorSession::write(const GeneratorDescriptor& generator, std::string_view command) {
    bus_->writeText(generator.descriptor, line(command));
}

std::string GeneratorSession::query(const GeneratorDescriptor& generator,
                                    std::string_view command) {
    write(generator, command);
    std::string buffer(kReplyBufferSize, ' ');
    bus_->readText(generator.descriptor, buffer);
    if ((bus_->status() & InstrumentBus::kStatusError) != 0) {
        throw InstrumentError(kOwnCheckError, "Error reading from signal generator at address " +
                                                  std::to_string(generator.address));
    }
    return buffer;
}

void GeneratorSession::checkIdentification(const GeneratorDescriptor& generator) {
    zp::checkIdentification(*bus_, generator.descriptor, generator.address);
}

void GeneratorSession::checkErrorQueue(const GeneratorDescriptor& generator) {
    checkInstrumentError(*bus_, generator.descriptor, generator.address);
}

}  // namespace zp

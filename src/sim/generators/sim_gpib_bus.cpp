#include "sim/generators/sim_gpib_bus.h"

#include <limits>

#include "instruments/instrument_error.h"
#include "instruments/tracing_bus.h"
#include "sim/faults.h"
#include "sim/scpi_syntax.h"

namespace zp::sim {

namespace {

constexpr int kMaxPrimaryAddress = 30;

class SimBusCore : public InstrumentBus, public BusErrorSource {
  public:
    SimBusCore(std::map<int, std::unique_ptr<SimGenerator>>& generators, const SimFaults* faults)
        : generators_(generators), faults_(faults) {}

    std::int16_t openDevice(int board, int primaryAddress, int, int, int, int) override {
        if (board != 0) {
            throw InstrumentError(kOwnCheckError,
                                  "GPIB board " + std::to_string(board) + " does not exist");
        }
        if (primaryAddress < 0 || primaryAddress > kMaxPrimaryAddress) {
            fail(kStatusError, "invalid address " + std::to_string(primaryAddress));
            return -1;
        }
        if (next_ == std::numeric_limits<std::int16_t>::max()) {
            throw InstrumentError(kOwnCheckError, "No free GPIB device descriptor");
        }
        const std::int16_t descriptor = next_++;
        devices_[descriptor] = primaryAddress;
        if (faults_ != nullptr) {
            const auto error = faults_->generatorErrors.find(primaryAddress);
            if (SimGenerator* g = generator(primaryAddress);
                g != nullptr && error != faults_->generatorErrors.end()) {
                g->pushError(error->second);
            }
        }
        status_ = 0;
        return descriptor;
    }

    void writeText(std::int16_t descriptor, const std::string& text) override {
        const int address = addressOf(descriptor);
        if (address < 0) return fail(kStatusError, "invalid descriptor");
        SimGenerator* g = generator(address);
        if (g == nullptr) return fail(kStatusError, "no listener");
        const bool silent = faults_ != nullptr && faults_->silentGenerators.count(address) != 0;
        std::size_t start = 0;
        while (start < text.size()) {
            std::size_t end = text.find('\n', start);
            if (end == std::string::npos) end = text.size();
            const std::string_view line(text.data() + start, end - start);
            start = end + 1;
            auto reply = g->handle(line);
            if (silent && upper(trim(line)) == "*IDN?") reply.reset();
            if (reply) {
                pending_[address] = std::move(*reply);
            } else if (trim(line).find('?') != std::string::npos) {
                pending_.erase(address);  // an unanswered query still discards the old reply
            }
        }
        status_ = 0;
    }

    void readText(std::int16_t descriptor, std::string& buffer) override {
        const int address = addressOf(descriptor);
        if (address < 0) return fail(kStatusError, "invalid descriptor");
        const bool timesOut = faults_ != nullptr && faults_->timeoutGenerators.count(address) != 0;
        auto it = pending_.find(address);
        if (timesOut || generator(address) == nullptr || it == pending_.end()) {
            return fail(kStatusError | kStatusTimeout, "timeout");
        }
        std::string& reply = it->second;
        const std::size_t count = std::min(buffer.size(), reply.size());
        buffer = reply.substr(0, count);
        reply.erase(0, count);
        if (reply.empty()) pending_.erase(it);
        status_ = 0;
    }

    std::uint16_t status() const override { return status_; }

    void clearDevice(std::int16_t descriptor) override {
        const int address = addressOf(descriptor);
        if (address < 0) return fail(kStatusError, "invalid descriptor");
        if (generator(address) == nullptr) return fail(kStatusError, "no listener");
        pending_.erase(address);
        status_ = 0;
    }

    int addressOf(std::int16_t descriptor) const override {
        const auto it = devices_.find(descriptor);
        return it == devices_.end() ? -1 : it->second;
    }

    std::string lastErrorText() const override { return lastError_; }

  private:
    SimGenerator* generator(int address) {
        const auto it = generators_.find(address);
        return it == generators_.end() ? nullptr : it->second.get();
    }

    void fail(std::uint16_t status, std::string reason) {
        status_ = status;
        lastError_ = std::move(reason);
    }

    std::map<int, std::unique_ptr<SimGenerator>>& generators_;
    const SimFaults* faults_;
    std::map<std::int16_t, int> devices_;
    std::map<int, std::string> pending_;  // unread reply per address
    std::int16_t next_ = 1;
    std::uint16_t status_ = 0;
    std::string lastError_;
};

}  // namespace

SimGpibBus::SimGpibBus(std::map<int, std::unique_ptr<SimGenerator>>& generators, IoTrace* trace,
                       const SimFaults* faults) {
    auto core = std::make_unique<SimBusCore>(generators, faults);
    if (trace != nullptr) {
        bus_ = std::make_unique<TracingBus>(std::move(core), *trace);
    } else {
        bus_ = std::move(core);
    }
}

SimGpibBus::~SimGpibBus() = default;

std::int16_t SimGpibBus::openDevice(int board, int primaryAddress, int secondaryAddress,
                                    int timeoutCode, int endOrIdentify, int endOfString) {
    return bus_->openDevice(board, primaryAddress, secondaryAddress, timeoutCode, endOrIdentify,
                            endOfString);
}

void SimGpibBus::writeText(std::int16_t descriptor, const std::string& text) {
    bus_->writeText(descriptor, text);
}

void SimGpibBus::readText(std::int16_t descriptor, std::string& buffer) {
    bus_->readText(descriptor, buffer);
}

std::uint16_t SimGpibBus::status() const {
    return bus_->status();
}

void SimGpibBus::clearDevice(std::int16_t descriptor) {
    bus_->clearDevice(descriptor);
}

int SimGpibBus::addressOf(std::int16_t descriptor) const {
    return bus_->addressOf(descriptor);
}

}  // namespace zp::sim

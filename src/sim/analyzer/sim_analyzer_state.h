#pragma once
// The simulated analyzer's settings, shared by every connection to it. Connections lock mutex()
// around each call; the state itself does no tracing and no fault injection.

#include <complex>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "instruments/io_trace.h"
#include "sim/analyzer/sim_channel_state.h"
#include "sim/faults.h"
#include "sim/generators/device_model.h"
#include "sim/generators/wiring.h"
#include "sim/sim_model.h"

namespace zp::sim {

using GeneratorMap = std::map<int, std::unique_ptr<SimGenerator>>;

class SimAnalyzerState {
  public:
    // faults, trace and generators belong to the bench and must outlive this state; any may be
    // nullptr.
    SimAnalyzerState(SimModel model, SimFaults* faults, IoTrace* trace,
                     const GeneratorMap* generators);

    std::mutex& mutex() { return mutex_; }
    const SimModel& model() const { return model_; }
    IoTrace* trace() const { return trace_; }

    // Capabilities derived from the model texts.
    bool isListedModel() const;
    bool hasSourceModulator(int source) const;  // 1 or 2
    double pulseClockHz() const;                // 100 MHz when the hardware value is 5

    // Returns the description of an injected failure of "Object.operation", if one is due.
    std::optional<std::string> takeFault(std::string_view objectOperation);
    bool malformedData() const;

    // Channels. channel() throws InstrumentError when the channel does not exist.
    SimChannel& channel(int number);
    SimChannel* findChannel(int number);
    std::vector<int> channelNumbers() const;
    int currentChannel() const { return current_; }
    // Creates or overwrites `to` with the settings of `from` and makes it current. An existing
    // target keeps its measurements; a new one gets copies of the source's, renamed.
    void copyChannel(int from, int to);

    std::vector<std::string> alcModes(int port) const;  // throws for a port the model lacks
    // Stores the width on the pulse-clock grid (at least one tick).
    void setInternalWidth(SimChannel& channel, int generator, double seconds);

    // Measurement.
    void setPoints(SimChannel& channel, int points);
    void acquirePoint();           // one point on the current channel, gates as set right now
    void singleSweep(int number);  // every point, internal generators stepping their delays
    std::complex<double> measure(const SimChannel& channel, const std::string& parameter,
                                 int point) const;

    // The SCPI command parser; throws InstrumentError with "-113 Undefined header" and the like.
    std::string parse(const std::string& command);

    std::string helpFilePath() const;

    Wiring& wiring() { return wiring_; }
    const DeviceModel& device() const { return device_; }

    // Application-wide settings.
    bool updateSwitch = true;
    bool busSwitch = false;
    std::string messageText;
    int triggerSource = 0;
    int triggerMode = 0;

  private:
    SimChannel makeChannel(int number) const;

    std::mutex mutex_;
    SimModel model_;
    SimFaults* faults_;
    IoTrace* trace_;
    const GeneratorMap* generators_;
    Wiring wiring_;
    DeviceModel device_;
    std::map<int, SimChannel> channels_;
    int current_ = 1;
};

// Parameters a model can measure: "A", "R1", "S21" ... (validity per port count).
bool isMeasurableParameter(std::string_view parameter, int ports);

// The analyzer's ASCII number form for data transfers.
std::string sdataField(double value);  // exactly 19 characters, "+1.23456789012E-001"

}  // namespace zp::sim

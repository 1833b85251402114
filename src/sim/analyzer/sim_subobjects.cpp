// The channel's sub-objects: IF configuration, path configuration and its elements, the internal
// pulse generators and the signal processing module. They keep what they are given.

#include <algorithm>
#include <cctype>
#include <cmath>

#include "sim/analyzer/sim_handles.h"

namespace zp::sim {

namespace {

using trace_text::args;

void require(bool ok, ScpiErrorCode error = kDataOutOfRange) {
    if (!ok) throw analyzerError(error);
}

bool isReceiver(const std::string& name, int ports) {
    static const std::vector<std::string> two = {"A", "B", "R1", "R2"};
    static const std::vector<std::string> four = {"A", "B", "C", "D", "R1", "R2", "R3", "R4"};
    const auto& names = ports == 4 ? four : two;
    return std::find(names.begin(), names.end(), name) != names.end();
}

bool isOneOf(const std::string& value, std::initializer_list<const char*> allowed) {
    return std::any_of(allowed.begin(), allowed.end(), [&](const char* a) { return value == a; });
}

// What each kind of path element accepts.
bool acceptsValue(const std::string& element, const std::string& value) {
    if (element == "PulseModDrive" || element.rfind("IFGate", 0) == 0) {
        return isOneOf(value, {"ON", "OFF", "Pulse1", "Pulse2", "Pulse3", "Pulse4"});
    }
    if (element.rfind("NBFATN", 0) == 0) {
        return !value.empty() && value.size() <= 3 &&
               std::all_of(value.begin(), value.end(),
                           [](char c) { return std::isdigit(static_cast<unsigned char>(c)); });
    }
    if (element == "IFSigPathAll") return isOneOf(value, {"NBF", "WBF"});
    if (element == "IFAntiAliasFilter") return isOneOf(value, {"AUTO", "ON", "OFF"});
    if (element.find("PulseModEnable") != std::string::npos) {
        return isOneOf(value, {"Enable", "Disable"});
    }
    return true;
}

class SimIfConfigurationHandle final : public IfConfiguration, SimHandle {
  public:
    SimIfConfigurationHandle(SimAnalyzerState& state, int channel)
        : SimHandle(state, objectName("IFConfiguration", channel)), channel_(channel) {}

    void setReceiverSwitch(const std::string& selector, bool on) override {
        call("setReceiverSwitch", args(selector, on), [&] {
            auto& c = cfg();
            require(selector == "ALL" || isReceiver(selector, state_.model().ports),
                    kIllegalParameterValue);
            c.receiverSwitch[selector] = on;
        });
    }
    void setReceiverGain(const std::string& receiver, int gainState) override {
        call("setReceiverGain", args(receiver, gainState), [&] {
            auto& c = cfg();
            require(isReceiver(receiver, state_.model().ports), kIllegalParameterValue);
            require(gainState >= 0 && gainState <= 3);
            c.receiverGain[receiver] = gainState;
        });
    }
    void setIfSwitchA(bool on) override {
        call("setIfSwitchA", args(on), [&] { cfg().ifSwitchA = on; });
    }
    void setIfSwitchB(bool on) override {
        call("setIfSwitchB", args(on), [&] { cfg().ifSwitchB = on; });
    }
    void setInternalGateSwitch(bool on) override {
        call("setInternalGateSwitch", args(on), [&] { cfg().internalGateSwitch = on; });
    }
    void setIfTimeA(double seconds) override {
        store("setIfTimeA", seconds, seconds >= 0.0 && seconds <= 1.0,
              [&] { return &cfg().ifTimeA; });
    }
    void setIfCountB(int count) override {
        store("setIfCountB", count, count >= 0, [&] { return &cfg().ifCountB; });
    }
    void setNarrowbandSwitch(int onOff) override {
        store("setNarrowbandSwitch", onOff, onOff == 0 || onOff == 1,
              [&] { return &cfg().narrowbandSwitch; });
    }
    void setNarrowbandValue(double value) override {
        store("setNarrowbandValue", value, std::isfinite(value),
              [&] { return &cfg().narrowbandValue; });
    }

  private:
    SimIfConfiguration& cfg() { return state_.channel(channel_).ifConfiguration; }
    int channel_;
};

class SimPathElementHandle final : public PathElement, SimHandle {
  public:
    SimPathElementHandle(SimAnalyzerState& state, int channel, std::string name)
        : SimHandle(state, objectName("PathElement", channel, name)),
          channel_(channel),
          name_(std::move(name)) {}

    void setValue(const std::string& value) override {
        call("setValue", args(value), [&] {
            std::string& slot = element();
            require(acceptsValue(name_, value), kIllegalParameterValue);
            slot = value;
        });
    }
    std::string value() override {
        return call("value", "", [&] { return element(); });
    }

  private:
    std::string& element() {
        auto& elements = state_.channel(channel_).pathElements;
        const auto it = elements.find(name_);
        if (it == elements.end()) throw analyzerError(kIllegalParameterValue);
        return it->second;
    }
    int channel_;
    std::string name_;
};

class SimPathConfigurationHandle final : public PathConfiguration, SimHandle {
  public:
    SimPathConfigurationHandle(SimAnalyzerState& state, int channel)
        : SimHandle(state, objectName("PathConfiguration", channel)), channel_(channel) {}

    std::unique_ptr<PathElement> element(const std::string& name) override {
        return call("element", args(name), [&]() -> std::unique_ptr<PathElement> {
            const auto& elements = state_.channel(channel_).pathElements;
            if (elements.find(name) == elements.end()) throw analyzerError(kIllegalParameterValue);
            return std::make_unique<SimPathElementHandle>(state_, channel_, name);
        });
    }
    std::vector<std::string> elementNames() override {
        return call("elementNames", "", [&] {
            std::vector<std::string> names;
            for (const auto& [name, value] : state_.channel(channel_).pathElements) {
                names.push_back(name);
            }
            return names;
        });
    }

  private:
    int channel_;
};

class SimPulseGeneratorHandle final : public InternalPulseGenerator, SimHandle {
  public:
    SimPulseGeneratorHandle(SimAnalyzerState& state, int channel)
        : SimHandle(state, objectName("PulseGenerator", channel)), channel_(channel) {}

    void setPeriod(double seconds) override {
        store("setPeriod", seconds, seconds > 0.0 && seconds <= 10.0,
              [&] { return &pulse().period; });
    }
    double period() override {
        return call("period", "", [&] { return pulse().period; });
    }
    void setWidth(int generator, double seconds) override {
        call("setWidth", args(generator, seconds),
             [&] { state_.setInternalWidth(state_.channel(channel_), generator, seconds); });
    }
    double width(int generator) override {
        return call("width", args(generator), [&] { return gen(generator).width; });
    }
    void setDelay(int generator, double seconds) override {
        call("setDelay", args(generator, seconds), [&] {
            auto& g = gen(generator);
            require(seconds >= 0.0 && seconds <= 10.0);
            g.delay = seconds;
        });
    }
    double delay(int generator) override {
        return call("delay", args(generator), [&] { return gen(generator).delay; });
    }
    void setState(int generator, bool on) override {
        call("setState", args(generator, on), [&] { gen(generator).on = on; });
    }
    bool state(int generator) override {
        return call("state", args(generator), [&] { return gen(generator).on; });
    }
    void setDelayStep(int generator, double seconds) override {
        call("setDelayStep", args(generator, seconds), [&] {
            auto& g = gen(generator);
            require(std::isfinite(seconds) && std::abs(seconds) <= 1.0);
            g.delayStep = seconds;
        });
    }
    double delayStep(int generator) override {
        return call("delayStep", args(generator), [&] { return gen(generator).delayStep; });
    }

  private:
    SimPulseGenerators& pulse() { return state_.channel(channel_).pulse; }
    SimInternalGenerator& gen(int generator) {
        auto& p = pulse();
        require(generator >= 0 && generator <= 4);
        return p.generators[static_cast<std::size_t>(generator)];
    }
    int channel_;
};

class SimProcessingModuleHandle final : public SignalProcessingModule, SimHandle {
  public:
    SimProcessingModuleHandle(SimAnalyzerState& state, int channel)
        : SimHandle(state, objectName("SignalProcessingModuleFour", channel)), channel_(channel) {}

    void setFilterType(const std::string& type) override {
        store(
            "setFilterType", type, type == "RECT" || type == "PWIN",
            [&] { return &module().filterType; }, kIllegalParameterValue);
    }
    void setFilterParameter(const std::string& name, double value) override {
        call("setFilterParameter", args(name, value), [&] {
            auto& m = module();
            require(name.size() == 1 && std::isupper(static_cast<unsigned char>(name[0])),
                    kIllegalParameterValue);
            require(std::isfinite(value));
            m.filterParameters[name] = value;
        });
    }
    void setProcessingSwitch(int onOff) override {
        store("setProcessingSwitch", onOff, onOff == 0 || onOff == 1,
              [&] { return &module().processingSwitch; });
    }
    void setProcessingRate(double rate) override {
        store("setProcessingRate", rate, std::isfinite(rate),
              [&] { return &module().processingRate; });
    }
    void setCoefficientsA(const std::vector<std::int32_t>& values) override {
        call("setCoefficientsA", args(values), [&] { module().coefficientsA = values; });
    }
    void setCoefficientsB(const std::vector<std::int32_t>& values) override {
        call("setCoefficientsB", args(values), [&] { module().coefficientsB = values; });
    }
    bool state() override {
        return call("state", "", [&] { return module().processingSwitch != 0; });
    }

  private:
    SimProcessingModule& module() { return state_.channel(channel_).processing; }
    int channel_;
};

}  // namespace

std::unique_ptr<IfConfiguration> makeSimIfConfiguration(SimAnalyzerState& state, int channel) {
    return std::make_unique<SimIfConfigurationHandle>(state, channel);
}
std::unique_ptr<PathConfiguration> makeSimPathConfiguration(SimAnalyzerState& state, int channel) {
    return std::make_unique<SimPathConfigurationHandle>(state, channel);
}
std::unique_ptr<InternalPulseGenerator> makeSimPulseGenerator(SimAnalyzerState& state,
                                                              int channel) {
    return std::make_unique<SimPulseGeneratorHandle>(state, channel);
}
std::unique_ptr<SignalProcessingModule> makeSimProcessingModule(SimAnalyzerState& state,
                                                                int channel) {
    return std::make_unique<SimProcessingModuleHandle>(state, channel);
}

}  // namespace zp::sim

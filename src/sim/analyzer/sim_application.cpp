// The application object and its small companions: channel collection, capabilities, message
// area, command parser and the active measurement.

#include "sim/analyzer/sim_handles.h"

namespace zp::sim {

namespace {

using trace_text::args;

class SimCapsHandle final : public AnalyzerCaps, SimHandle {
  public:
    explicit SimCapsHandle(SimAnalyzerState& state) : SimHandle(state, "Caps") {}
    int portCount() override {
        return call("portCount", "", [&] { return state_.model().ports; });
    }
    int sourceCount() override {
        return call("sourceCount", "", [&] { return state_.model().sources; });
    }
    std::string hardwareValue() override {
        return call("hardwareValue", "", [&] { return state_.model().hardwareValue; });
    }
    double minFrequency() override {
        return call("minFrequency", "", [&] { return state_.model().minFrequency; });
    }
    double maxFrequency() override {
        return call("maxFrequency", "", [&] { return state_.model().maxFrequency; });
    }
};

class SimMessageAreaHandle final : public MessageArea, SimHandle {
  public:
    explicit SimMessageAreaHandle(SimAnalyzerState& state) : SimHandle(state, "MessageArea") {}
    void setText(const std::string& text) override {
        call("setText", args(text), [&] { state_.messageText = text; });
    }
};

class SimCommandParserHandle final : public CommandParser, SimHandle {
  public:
    explicit SimCommandParserHandle(SimAnalyzerState& state) : SimHandle(state, "CommandParser") {}
    std::string parse(const std::string& command) override {
        return call("parse", args(command), [&] { return state_.parse(command); });
    }
};

class SimMeasurementHandle final : public Measurement, SimHandle {
  public:
    SimMeasurementHandle(SimAnalyzerState& state, int channel, std::string name)
        : SimHandle(state, objectName("Measurement", channel, name)),
          channel_(channel),
          name_(std::move(name)) {}

    bool correctionOn() override {
        return call("correctionOn", "", [&] {
            measurement();
            return state_.channel(channel_).correction;
        });
    }
    int correctionType() override {
        return call("correctionType", "", [&] { return measurement().correctionType; });
    }
    void activate() override {
        call("activate", "", [&] {
            measurement();
            state_.channel(channel_).selected = name_;
        });
    }

  private:
    SimMeasurement& measurement() {
        SimMeasurement* m = state_.channel(channel_).findMeasurement(name_);
        if (m == nullptr) throw analyzerError(kSettingsConflict);
        return *m;
    }
    int channel_;
    std::string name_;
};

class SimChannelsHandle final : public ChannelCollection, SimHandle {
  public:
    explicit SimChannelsHandle(SimAnalyzerState& state) : SimHandle(state, "Channels") {}
    int count() override {
        return call("count", "", [&] { return static_cast<int>(state_.channelNumbers().size()); });
    }
    std::unique_ptr<Channel> item(int oneBasedIndex) override {
        return call("item", args(oneBasedIndex), [&] {
            const auto numbers = state_.channelNumbers();
            if (oneBasedIndex < 1 || oneBasedIndex > static_cast<int>(numbers.size())) {
                throw analyzerError(kDataOutOfRange);
            }
            return makeSimChannel(state_, numbers[static_cast<std::size_t>(oneBasedIndex - 1)]);
        });
    }
};

class SimApplicationHandle final : public AnalyzerApplication, SimHandle {
  public:
    explicit SimApplicationHandle(SimAnalyzerState& state) : SimHandle(state, "Application") {}

    std::unique_ptr<Channel> currentChannel() override {
        return call("currentChannel", "",
                    [&] { return makeSimChannel(state_, state_.currentChannel()); });
    }
    std::unique_ptr<ChannelCollection> channels() override {
        return call("channels", "", [&] { return std::make_unique<SimChannelsHandle>(state_); });
    }
    void setUpdateSwitch(bool on) override {
        call("setUpdateSwitch", args(on), [&] { state_.updateSwitch = on; });
    }
    void setBusSwitch(bool on) override {
        call("setBusSwitch", args(on), [&] { state_.busSwitch = on; });
    }
    std::unique_ptr<MessageArea> messageArea() override {
        return call("messageArea", "",
                    [&] { return std::make_unique<SimMessageAreaHandle>(state_); });
    }
    std::unique_ptr<CommandParser> commandParser() override {
        return call("commandParser", "",
                    [&] { return std::make_unique<SimCommandParserHandle>(state_); });
    }
    std::string modelText() override {
        return call("modelText", "", [&] { return state_.model().modelText; });
    }
    std::string optionText() override {
        return call("optionText", "", [&] { return state_.model().optionText; });
    }
    std::unique_ptr<AnalyzerCaps> hardwareInfo() override {
        return call("hardwareInfo", "", [&] { return std::make_unique<SimCapsHandle>(state_); });
    }
    std::unique_ptr<Measurement> activeMeasurement() override {
        return call("activeMeasurement", "", [&] {
            const SimChannel& ch = state_.channel(state_.currentChannel());
            if (ch.selected.empty()) throw analyzerError(kSettingsConflict);
            return std::make_unique<SimMeasurementHandle>(state_, ch.number, ch.selected);
        });
    }
    void setTriggerSource(int source) override {
        call("setTriggerSource", args(source), [&] {
            if (source < 0 || source > 3) throw analyzerError(kDataOutOfRange);
            state_.triggerSource = source;
        });
    }
    void setTriggerMode(int mode) override {
        call("setTriggerMode", args(mode), [&] {
            if (mode < 0 || mode > 3) throw analyzerError(kDataOutOfRange);
            state_.triggerMode = mode;
        });
    }
    void acquirePoint(bool wait, bool flag) override {
        call("acquirePoint", args(wait, flag), [&] { state_.acquirePoint(); });
    }
};

}  // namespace

std::unique_ptr<AnalyzerApplication> makeSimApplication(SimAnalyzerState& state) {
    return std::make_unique<SimApplicationHandle>(state);
}

}  // namespace zp::sim

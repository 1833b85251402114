#include <cmath>

#include "sim/analyzer/sim_handles.h"

namespace zp::sim {

namespace {

using trace_text::args;

void require(bool ok, ScpiErrorCode error = kDataOutOfRange) {
    if (!ok) throw analyzerError(error);
}

class SimChannelHandle final : public Channel, SimHandle {
  public:
    SimChannelHandle(SimAnalyzerState& state, int number)
        : SimHandle(state, objectName("Channel", number)), number_(number) {}

    int channelNumber() override {
        return call("channelNumber", "", [&] { return ch().number; });
    }
    void beginChannelSetup(bool flag) override {
        call("beginChannelSetup", args(flag), [&] { ch().inSetup = flag; });
    }
    void endChannelSetup() override {
        call("endChannelSetup", "", [&] { ch().inSetup = false; });
    }
    void setIfBandwidth(double hz) override {
        store("setIfBandwidth", hz, hz >= 1.0 && hz <= 15e6, [&] { return &ch().ifBandwidth; });
    }

    std::unique_ptr<IfConfiguration> ifConfiguration() override {
        return subObject("ifConfiguration", makeSimIfConfiguration);
    }
    std::unique_ptr<PathConfiguration> pathConfiguration() override {
        return subObject("pathConfiguration", makeSimPathConfiguration);
    }
    std::unique_ptr<InternalPulseGenerator> pulseGenerator() override {
        return subObject("pulseGenerator", makeSimPulseGenerator);
    }
    std::unique_ptr<SignalProcessingModule> signalProcessingModule() override {
        return subObject("signalProcessingModule", makeSimProcessingModule);
    }
    void setFrequencyOffsetState(int value) override {
        store("setFrequencyOffsetState", value, value == 0 || value == 1,
              [&] { return &ch().frequencyOffsetState; });
    }
    void setFrequencyOffsetFrequency(double hz) override {
        store("setFrequencyOffsetFrequency", hz,
              std::isfinite(hz) && std::abs(hz) <= state_.model().maxFrequency,
              [&] { return &ch().frequencyOffsetFrequency; });
    }
    std::vector<std::string> getSupportedALCModes(int port) override {
        return call("getSupportedALCModes", args(port), [&] {
            ch();
            return state_.alcModes(port);
        });
    }
    void setALCLevelingMode(int port, int mode) override {
        call("setALCLevelingMode", args(port, mode), [&] {
            auto& c = ch();
            const auto modes = state_.alcModes(port);
            require(mode >= 0 && mode < static_cast<int>(modes.size()));
            c.alcMode[port] = mode;
        });
    }

    void copyToChannel(int channel) override {
        call("copyToChannel", args(channel), [&] { state_.copyChannel(number_, channel); });
    }
    void singleSweep(bool wait) override {
        call("singleSweep", args(wait), [&] { state_.singleSweep(number_); });
    }
    void setSweepType(int type) override {
        store("setSweepType", type, type >= 0 && type <= 4, [&] { return &ch().sweepType; });
    }
    void setCwFrequency(double hz) override {
        store("setCwFrequency", hz,
              hz >= state_.model().minFrequency && hz <= state_.model().maxFrequency,
              [&] { return &ch().cwFrequency; });
    }
    void setNumberOfPoints(int points) override {
        call("setNumberOfPoints", args(points), [&] { state_.setPoints(ch(), points); });
    }
    void setAlternateSweep(bool on) override {
        call("setAlternateSweep", args(on), [&] { ch().alternateSweep = on; });
    }
    void setAutoSweepTime(bool on) override {
        call("setAutoSweepTime", args(on), [&] { ch().autoSweepTime = on; });
    }
    double sweepTime() override {
        return call("sweepTime", "", [&] { return ch().sweepTime; });
    }
    void setSweepTime(double seconds) override {
        call("setSweepTime", args(seconds), [&] {
            auto& c = ch();
            require(seconds >= 0.0 && seconds <= 86400.0);
            c.sweepTime = seconds;
            c.autoSweepTime = false;
        });
    }

  private:
    template <class Object>
    std::unique_ptr<Object> subObject(std::string_view operation,
                                      std::unique_ptr<Object> (*make)(SimAnalyzerState&, int)) {
        return call(operation, "", [&] {
            ch();
            return make(state_, number_);
        });
    }

    SimChannel& ch() { return state_.channel(number_); }
    int number_;
};

}  // namespace

std::unique_ptr<Channel> makeSimChannel(SimAnalyzerState& state, int number) {
    return std::make_unique<SimChannelHandle>(state, number);
}

}  // namespace zp::sim

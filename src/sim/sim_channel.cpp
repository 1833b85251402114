#include <cmath>

#include "sim/sim_handles.h"

namespace zp::sim {

namespace {

using trace_text::args;

void require(bool ok, const char* description = kDataOutOfRange) {
    if (!ok) throw analyzerError(description);
}

class SimChannelHandle final : public Channel, SimHandle {
  public:
    SimChannelHandle(SimAnalyzerState& state, int number)
        : SimHandle(state, "Channel[" + std::to_string(number) + "]"), number_(number) {}

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
        call("setIfBandwidth", args(hz), [&] {
            auto& c = ch();
            require(hz >= 1.0 && hz <= 15e6);
            c.ifBandwidth = hz;
        });
    }

    std::unique_ptr<IfConfiguration> ifConfiguration() override {
        return call("ifConfiguration", "", [&] {
            ch();
            return makeSimIfConfiguration(state_, number_);
        });
    }
    std::unique_ptr<PathConfiguration> pathConfiguration() override {
        return call("pathConfiguration", "", [&] {
            ch();
            return makeSimPathConfiguration(state_, number_);
        });
    }
    std::unique_ptr<InternalPulseGenerator> pulseGenerator() override {
        return call("pulseGenerator", "", [&] {
            ch();
            return makeSimPulseGenerator(state_, number_);
        });
    }
    std::unique_ptr<SignalProcessingModule> signalProcessingModule() override {
        return call("signalProcessingModule", "", [&] {
            ch();
            return makeSimProcessingModule(state_, number_);
        });
    }
    void setFrequencyOffsetState(int value) override {
        call("setFrequencyOffsetState", args(value), [&] {
            auto& c = ch();
            require(value == 0 || value == 1);
            c.frequencyOffsetState = value;
        });
    }
    void setFrequencyOffsetFrequency(double hz) override {
        call("setFrequencyOffsetFrequency", args(hz), [&] {
            auto& c = ch();
            require(std::isfinite(hz) && std::abs(hz) <= state_.model().maxFrequency);
            c.frequencyOffsetFrequency = hz;
        });
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
        call("setSweepType", args(type), [&] {
            auto& c = ch();
            require(type >= 0 && type <= 4);
            c.sweepType = type;
        });
    }
    void setCwFrequency(double hz) override {
        call("setCwFrequency", args(hz), [&] {
            auto& c = ch();
            require(hz >= state_.model().minFrequency && hz <= state_.model().maxFrequency);
            c.cwFrequency = hz;
        });
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
    SimChannel& ch() { return state_.channel(number_); }
    int number_;
};

}  // namespace

std::unique_ptr<Channel> makeSimChannel(SimAnalyzerState& state, int number) {
    return std::make_unique<SimChannelHandle>(state, number);
}

}  // namespace zp::sim

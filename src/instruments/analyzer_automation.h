#pragma once
// The analyzer's automation object model. A connection is an AnalyzerApplication; sub-objects are
// handles that the caller owns and releases with it. Every failing call throws InstrumentError with
// the analyzer's own description.

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace zp {

class AnalyzerCaps {
  public:
    virtual ~AnalyzerCaps() = default;
    virtual int portCount() = 0;
    virtual int sourceCount() = 0;
    virtual std::string hardwareValue() = 0;  // its number 5 selects the 100 MHz pulse clock
    virtual double minFrequency() = 0;        // Hz
    virtual double maxFrequency() = 0;        // Hz
};

class MessageArea {
  public:
    virtual ~MessageArea() = default;
    virtual void setText(const std::string& text) = 0;
};

class CommandParser {
  public:
    virtual ~CommandParser() = default;
    virtual std::string parse(const std::string& command) = 0;
};

class Measurement {
  public:
    virtual ~Measurement() = default;
    virtual bool correctionOn() = 0;
    virtual int correctionType() = 0;
    // The argument-less operation the point-in-pulse set-up makes on the active measurement.
    virtual void activate() = 0;
};

class IfConfiguration {
  public:
    virtual ~IfConfiguration() = default;
    virtual void setReceiverSwitch(const std::string& selector, bool on) = 0;
    virtual void setReceiverGain(const std::string& receiver, int gainState) = 0;
    virtual void setIfSwitchA(bool on) = 0;
    virtual void setIfSwitchB(bool on) = 0;
    virtual void setInternalGateSwitch(bool on) = 0;
    virtual void setIfTimeA(double seconds) = 0;
    virtual void setIfCountB(int count) = 0;
    virtual void setNarrowbandSwitch(int onOff) = 0;
    virtual void setNarrowbandValue(double value) = 0;
};

class PathElement {
  public:
    virtual ~PathElement() = default;
    virtual void setValue(const std::string& value) = 0;
    virtual std::string value() = 0;
};

class PathConfiguration {
  public:
    virtual ~PathConfiguration() = default;
    virtual std::unique_ptr<PathElement> element(const std::string& name) = 0;
    virtual std::vector<std::string> elementNames() = 0;
};

// The analyzer's internal pulse generators 0 to 4 (1 to 4 drive the pulsed signals).
class InternalPulseGenerator {
  public:
    virtual ~InternalPulseGenerator() = default;
    virtual void setPeriod(double seconds) = 0;
    virtual double period() = 0;
    virtual void setWidth(int generator, double seconds) = 0;
    virtual double width(int generator) = 0;  // the width the analyzer set (on its clock grid)
    virtual void setDelay(int generator, double seconds) = 0;
    virtual double delay(int generator) = 0;
    virtual void setState(int generator, bool on) = 0;
    virtual bool state(int generator) = 0;
    virtual void setDelayStep(int generator, double seconds) = 0;
    virtual double delayStep(int generator) = 0;
};

class SignalProcessingModule {
  public:
    virtual ~SignalProcessingModule() = default;
    virtual void setFilterType(const std::string& type) = 0;
    virtual void setFilterParameter(const std::string& name, double value) = 0;
    virtual void setProcessingSwitch(int onOff) = 0;
    virtual void setProcessingRate(double rate) = 0;
    virtual void setCoefficientsA(const std::vector<std::int32_t>& values) = 0;
    virtual void setCoefficientsB(const std::vector<std::int32_t>& values) = 0;
    virtual bool state() = 0;
};

class Channel {
  public:
    virtual ~Channel() = default;
    virtual int channelNumber() = 0;
    virtual void beginChannelSetup(bool flag) = 0;
    virtual void endChannelSetup() = 0;
    virtual void setIfBandwidth(double hz) = 0;

    // Sub-objects and settings reached by member name on the server.
    virtual std::unique_ptr<IfConfiguration> ifConfiguration() = 0;        // "IFConfiguration"
    virtual std::unique_ptr<PathConfiguration> pathConfiguration() = 0;    // "PathConfiguration"
    virtual std::unique_ptr<InternalPulseGenerator> pulseGenerator() = 0;  // "PulseGenerator"
    virtual std::unique_ptr<SignalProcessingModule> signalProcessingModule() = 0;  // "...Four"
    virtual void setFrequencyOffsetState(int state) = 0;      // "FrequencyOffsetState"
    virtual void setFrequencyOffsetFrequency(double hz) = 0;  // "FrequencyOffsetFrequency"
    virtual std::vector<std::string> getSupportedALCModes(int port) = 0;  // "GetSupportedALCModes"
    virtual void setALCLevelingMode(int port, int mode) = 0;              // "ALCLevelingMode"

    // Point-in-pulse measurement support.
    virtual void copyToChannel(int channel) = 0;
    virtual void singleSweep(bool wait) = 0;
    virtual void setSweepType(int type) = 0;  // 0 = CW time sweep
    virtual void setCwFrequency(double hz) = 0;
    virtual void setNumberOfPoints(int points) = 0;
    virtual void setAlternateSweep(bool on) = 0;
    virtual void setAutoSweepTime(bool on) = 0;
    virtual double sweepTime() = 0;
    virtual void setSweepTime(double seconds) = 0;
};

class ChannelCollection {
  public:
    virtual ~ChannelCollection() = default;
    virtual int count() = 0;
    virtual std::unique_ptr<Channel> item(int oneBasedIndex) = 0;
};

class AnalyzerApplication {
  public:
    virtual ~AnalyzerApplication() = default;
    virtual std::unique_ptr<Channel> currentChannel() = 0;
    virtual std::unique_ptr<ChannelCollection> channels() = 0;
    virtual void setUpdateSwitch(bool on) = 0;
    virtual void setBusSwitch(bool on) = 0;
    virtual std::unique_ptr<MessageArea> messageArea() = 0;
    virtual std::unique_ptr<CommandParser> commandParser() = 0;
    virtual std::string modelText() = 0;
    virtual std::string optionText() = 0;
    virtual std::unique_ptr<AnalyzerCaps> hardwareInfo() = 0;
    virtual std::unique_ptr<Measurement> activeMeasurement() = 0;
    virtual void setTriggerSource(int source) = 0;
    virtual void setTriggerMode(int mode) = 0;
    virtual void acquirePoint(bool wait, bool flag) = 0;
};

}  // namespace zp

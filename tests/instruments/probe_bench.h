#pragma once
// The simulated bench with the two things its trace does not show: when the procedure's
// application and bus objects are released, and a bench that cannot connect or make a bus.

#include <cstddef>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "instruments/bench.h"
#include "instruments/instrument_error.h"
#include "instruments/io_trace.h"
#include "sim/sim_bench.h"

namespace zp::testing_support {

class ProbeBench : public Bench {
  public:
    explicit ProbeBench(std::string_view model = "kt622") : sim_(model) {}

    std::optional<InstrumentError> connectError;  // thrown by connectAnalyzer when set
    std::optional<InstrumentError> busError;      // thrown by createBus when set

    sim::SimBench& sim() { return sim_; }

    std::unique_ptr<AnalyzerApplication> connectAnalyzer() override {
        if (connectError) throw *connectError;
        return std::make_unique<Application>(sim_.connectAnalyzer(), *this);
    }
    std::unique_ptr<InstrumentBus> createBus() override {
        if (busError) throw *busError;
        return std::make_unique<Bus>(sim_.createBus(), *this);
    }
    IoTrace* trace() override { return sim_.trace(); }
    std::string describe() const override { return sim_.describe(); }
    bool simulated() const override { return sim_.simulated(); }

    // The trace with "release Application" and "release Bus" where those objects went.
    std::vector<std::string> timeline() {
        std::vector<std::string> lines = sim_.trace()->lines();
        for (auto it = releases_.rbegin(); it != releases_.rend(); ++it) {
            lines.insert(lines.begin() + static_cast<std::ptrdiff_t>(it->first), it->second);
        }
        return lines;
    }

  private:
    void released(const char* what) {
        releases_.emplace_back(sim_.trace()->lines().size(), std::string("release ") + what);
    }

    class Application : public AnalyzerApplication {
      public:
        Application(std::unique_ptr<AnalyzerApplication> inner, ProbeBench& bench)
            : in_(std::move(inner)), bench_(bench) {}
        ~Application() override { bench_.released("Application"); }
        std::unique_ptr<Channel> currentChannel() override { return in_->currentChannel(); }
        std::unique_ptr<ChannelCollection> channels() override { return in_->channels(); }
        void setUpdateSwitch(bool on) override { in_->setUpdateSwitch(on); }
        void setBusSwitch(bool on) override { in_->setBusSwitch(on); }
        std::unique_ptr<MessageArea> messageArea() override { return in_->messageArea(); }
        std::unique_ptr<CommandParser> commandParser() override { return in_->commandParser(); }
        std::string modelText() override { return in_->modelText(); }
        std::string optionText() override { return in_->optionText(); }
        std::unique_ptr<AnalyzerCaps> hardwareInfo() override { return in_->hardwareInfo(); }
        std::unique_ptr<Measurement> activeMeasurement() override {
            return in_->activeMeasurement();
        }
        void setTriggerSource(int source) override { in_->setTriggerSource(source); }
        void setTriggerMode(int mode) override { in_->setTriggerMode(mode); }
        void acquirePoint(bool wait, bool flag) override { in_->acquirePoint(wait, flag); }

      private:
        std::unique_ptr<AnalyzerApplication> in_;
        ProbeBench& bench_;
    };

    class Bus : public InstrumentBus {
      public:
        Bus(std::unique_ptr<InstrumentBus> inner, ProbeBench& bench)
            : in_(std::move(inner)), bench_(bench) {}
        ~Bus() override { bench_.released("Bus"); }
        std::int16_t openDevice(int board, int address, int secondary, int timeout, int eoi,
                                int eos) override {
            return in_->openDevice(board, address, secondary, timeout, eoi, eos);
        }
        void writeText(std::int16_t d, const std::string& text) override {
            in_->writeText(d, text);
        }
        void readText(std::int16_t d, std::string& buffer) override { in_->readText(d, buffer); }
        std::uint16_t status() const override { return in_->status(); }
        void clearDevice(std::int16_t d) override { in_->clearDevice(d); }
        int addressOf(std::int16_t d) const override { return in_->addressOf(d); }

      private:
        std::unique_ptr<InstrumentBus> in_;
        ProbeBench& bench_;
    };

    sim::SimBench sim_;
    std::vector<std::pair<std::size_t, std::string>> releases_;  // trace position, note
};

}  // namespace zp::testing_support

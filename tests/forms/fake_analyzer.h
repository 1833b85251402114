#pragma once
// Test doubles for the main window model: an analyzer that answers identity and help queries, a
// bench around it, a scripted person at the screen and timing solvers that record their calls.

#include <functional>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

#include "core/timing_solver.h"
#include "forms/interaction.h"
#include "instruments/bench.h"
#include "instruments/instrument_error.h"

namespace zp::test {

struct FakeAnalyzerSetup {
    std::string modelText = "KT622A";
    std::string optionText = "K71 M81";
    int ports = 2;
    int sources = 1;
    std::string hardwareValue = "5";
    std::string helpReply = "\"C:\\Help\\zentra-pulse.html\"\n";
    // Description of an error the model query raises, when set.
    std::optional<std::string> modelError;
    std::optional<std::string> helpError;
    bool unreachable = false;
};

struct FakeLog {
    int connects = 0;
    int capsReads = 0;
    std::vector<std::string> commands;
};

// What every fake part reads its answers from and logs to.
struct FakeParts {
    const FakeAnalyzerSetup& s_;
    FakeLog& log_;
};

class FakeCaps : public AnalyzerCaps, FakeParts {
  public:
    explicit FakeCaps(FakeParts p) : FakeParts(p) {}
    int portCount() override { return ++log_.capsReads, s_.ports; }
    int sourceCount() override { return ++log_.capsReads, s_.sources; }
    std::string hardwareValue() override { return s_.hardwareValue; }
    double minFrequency() override { return 10e6; }
    double maxFrequency() override { return 26.5e9; }
};

class FakeParser : public CommandParser, FakeParts {
  public:
    explicit FakeParser(FakeParts p) : FakeParts(p) {}
    std::string parse(const std::string& command) override {
        log_.commands.push_back(command);
        if (s_.helpError) throw InstrumentError(-1, *s_.helpError);
        return s_.helpReply;
    }
};

class FakeAnalyzer : public AnalyzerApplication, FakeParts {
  public:
    explicit FakeAnalyzer(FakeParts p) : FakeParts(p) {}
    std::unique_ptr<Channel> currentChannel() override { return nullptr; }
    std::unique_ptr<ChannelCollection> channels() override { return nullptr; }
    void setUpdateSwitch(bool) override {}
    void setBusSwitch(bool) override {}
    std::unique_ptr<MessageArea> messageArea() override { return nullptr; }
    std::unique_ptr<CommandParser> commandParser() override {
        return std::make_unique<FakeParser>(FakeParts{s_, log_});
    }
    std::string modelText() override {
        if (s_.modelError) throw InstrumentError(-999, *s_.modelError);
        return s_.modelText;
    }
    std::string optionText() override { return s_.optionText; }
    std::unique_ptr<AnalyzerCaps> hardwareInfo() override {
        return std::make_unique<FakeCaps>(FakeParts{s_, log_});
    }
    std::unique_ptr<Measurement> activeMeasurement() override { return nullptr; }
    void setTriggerSource(int) override {}
    void setTriggerMode(int) override {}
    void acquirePoint(bool, bool) override {}
};

class FakeBench : public Bench {
  public:
    FakeAnalyzerSetup setup;
    FakeLog log;

    std::unique_ptr<AnalyzerApplication> connectAnalyzer() override {
        ++log.connects;
        if (setup.unreachable) throw InstrumentError(-2147221005, "Analyzer not reachable");
        return std::make_unique<FakeAnalyzer>(FakeParts{setup, log});
    }
    std::unique_ptr<InstrumentBus> createBus() override {
        throw InstrumentError(kOwnCheckError, "no bus on the fake bench");
    }
    IoTrace* trace() override { return nullptr; }
    std::string describe() const override { return "fake analyzer"; }
};

class ScriptedInteraction : public Interaction {
  public:
    std::vector<std::string> messages;
    std::vector<Pointer> pointers;
    struct HelpCall {
        std::string file;
        int topic = 0;
    };
    std::vector<HelpCall> helpCalls;

    void message(const std::string& text) override { messages.push_back(text); }
    bool ask(const std::string&) override { return false; }
    std::optional<std::string> chooseOpenFile(const std::string&) override { return std::nullopt; }
    std::optional<std::string> chooseSaveFile(const std::string&) override { return std::nullopt; }
    void processEvents() override {}
    void setPointer(Pointer p) override { pointers.push_back(p); }
    bool showHelp(const std::string& file, int topic) override {
        helpCalls.push_back({file, topic});
        return true;
    }
};

// What a recording solver saw and what it answers. Shared with the test after the form's
// factory has handed the solver over.
struct SolverScript {
    // Answers: the solved PRF (nothing keeps the desired one), the IF bandwidth in Hz.
    std::optional<double> prf;
    std::optional<double> ifbw;
    std::optional<std::string> error;

    int created = 0;
    std::vector<std::string> calls;
    std::int16_t decade = 0;
    double converterDelay = -1;
    double desiredPrf = 0;
    std::int32_t ifbwHzIn = 0;
    double ifbwIn = 0;
    double pulseClockHz = 0;
    Bool16 fixedPrf = 0;
    Bool16 flag = 0;
    double highestGateDelay = -1;
    double widestGateWidth = -1;
};

class RecordingSolver : public TimingSolver {
  public:
    explicit RecordingSolver(SolverScript& s) : s_(s) {}

    void SolveExternal(double& prf, std::int32_t& ifCount, std::int32_t& ifbwHz, double& freqOffset,
                       double& converterDelay, std::int16_t decade, Bool16 fixedPrf,
                       Bool16 flag) override {
        s_.calls.push_back("SolveExternal");
        s_.desiredPrf = prf;
        s_.ifbwHzIn = ifbwHz;
        s_.converterDelay = converterDelay;
        s_.decade = decade;
        s_.fixedPrf = fixedPrf;
        s_.flag = flag;
        ifCount = 7;
        freqOffset = 123.0;
        answer(prf);
        if (s_.ifbw) ifbwHz = static_cast<std::int32_t>(*s_.ifbw);
    }

    void SolveInternal(double& prf, double& ifbw, double& time2, double& time1,
                       double& pulseClockHz, std::vector<std::int32_t>& list1,
                       std::vector<std::int32_t>&, std::vector<std::int32_t>&,
                       Bool16 fixedPrf) override {
        internal("SolveInternal", prf, ifbw, time2, time1, pulseClockHz, list1, fixedPrf,
                 {1, 2, 3});
    }

    void SolveInternalGated(double& prf, double& ifbw, double& time2, double& time1,
                            double& pulseClockHz, std::vector<std::int32_t>& list1,
                            std::vector<std::int32_t>&, std::vector<std::int32_t>&, Bool16 fixedPrf,
                            double highestGateDelay, double widestGateWidth, double& gatedTime1,
                            double&, std::int32_t& gatedTicks) override {
        s_.highestGateDelay = highestGateDelay;
        s_.widestGateWidth = widestGateWidth;
        gatedTime1 = highestGateDelay;
        gatedTicks = 42;
        internal("SolveInternalGated", prf, ifbw, time2, time1, pulseClockHz, list1, fixedPrf,
                 {4, 5});
    }

    void SolveReceiver(double, double, std::int16_t& rxValue) override { rxValue = 0; }

  private:
    void internal(const char* name, double& prf, double& ifbw, double& time2, double& time1,
                  double clock, std::vector<std::int32_t>& list1, Bool16 fixedPrf,
                  std::vector<std::int32_t> answerList) {
        s_.calls.push_back(name);
        s_.desiredPrf = prf;
        s_.ifbwIn = ifbw;
        s_.pulseClockHz = clock;
        s_.fixedPrf = fixedPrf;
        time1 = 1.0;
        time2 = 2.0;
        list1 = std::move(answerList);
        answer(prf);
        if (s_.ifbw) ifbw = *s_.ifbw;
    }
    // Results are written before a scripted error, so that a restore has something to undo.
    void answer(double& prf) {
        if (s_.prf) prf = *s_.prf;
        if (s_.error) throw std::runtime_error(*s_.error);
    }
    SolverScript& s_;
};

inline std::function<std::unique_ptr<TimingSolver>()> recordingFactory(SolverScript& s) {
    return [&s]() -> std::unique_ptr<TimingSolver> {
        ++s.created;
        return std::make_unique<RecordingSolver>(s);
    };
}

}  // namespace zp::test

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
    bool simulated() const override { return false; }
};

class ScriptedInteraction : public Interaction {
  public:
    std::vector<std::string> messages;
    std::vector<MessageKind> kinds;  // of each message
    std::vector<Pointer> pointers;
    std::vector<HelpRequest> helpCalls;

    void message(const std::string& text, MessageKind kind) override {
        messages.push_back(text);
        kinds.push_back(kind);
    }
    bool ask(const std::string&) override { return false; }
    std::optional<std::string> chooseOpenFile(const std::string&) override { return std::nullopt; }
    std::optional<std::string> chooseSaveFile(const std::string&) override { return std::nullopt; }
    void processEvents() override {}
    void setPointer(Pointer p) override { pointers.push_back(p); }
    bool showHelp(const HelpRequest& request) override {
        helpCalls.push_back(request);
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

    void SolveReceiver(double, double, std::int16_t& rxValue) override { rxValue = 0; }

  private:
    ExternalSolution external(const ExternalRequest& r) override {
        s_.calls.push_back("SolveExternal");
        s_.desiredPrf = r.prf;
        s_.ifbwHzIn = r.ifbwHz;
        s_.converterDelay = r.converterDelay;
        s_.decade = r.decade;
        s_.fixedPrf = r.fixedPrf;
        s_.flag = r.flag;
        ExternalSolution out{r.prf, 7, r.ifbwHz, 123.0, r.converterDelay};
        answer(out.prf);
        if (s_.ifbw) out.ifbwHz = static_cast<std::int32_t>(*s_.ifbw);
        return out;
    }

    InternalSolution internal(const InternalRequest& r) override {
        return recordInternal("SolveInternal", r, {1, 2, 3});
    }

    InternalSolution internalGated(const InternalRequest& r, const GateWindow& gate) override {
        s_.highestGateDelay = gate.highestGateDelay;
        s_.widestGateWidth = gate.widestGateWidth;
        InternalSolution out = recordInternal("SolveInternalGated", r, {4, 5});
        out.gate.time1 = gate.highestGateDelay;
        out.gate.ticks = 42;
        return out;
    }

    InternalSolution recordInternal(const char* name, const InternalRequest& r,
                                    std::vector<std::int32_t> answerList) {
        s_.calls.push_back(name);
        s_.desiredPrf = r.prf;
        s_.ifbwIn = r.ifbw;
        s_.pulseClockHz = r.pulseClockHz;
        s_.fixedPrf = r.fixedPrf;
        InternalSolution out;
        out.prf = r.prf;
        out.ifbw = r.ifbw;
        out.pulseClockHz = r.pulseClockHz;
        out.time1 = 1.0;
        out.time2 = 2.0;
        out.list1 = std::move(answerList);
        answer(out.prf);
        if (s_.ifbw) out.ifbw = *s_.ifbw;
        return out;
    }
    void answer(double& prf) {
        if (s_.prf) prf = *s_.prf;
        if (s_.error) throw std::runtime_error(*s_.error);
    }
    SolverScript& s_;
};

// Keeps the desired timing and zeroes the rest: a solver for tests that do not calculate.
class PassThroughSolver final : public TimingSolver {
  public:
    void SolveReceiver(double, double, std::int16_t& rxValue) override { rxValue = 0; }

  private:
    ExternalSolution external(const ExternalRequest& r) override {
        return {r.prf, 0, r.ifbwHz, 0.0, r.converterDelay};
    }
    InternalSolution internal(const InternalRequest& r) override {
        InternalSolution out;
        out.prf = r.prf;
        out.ifbw = r.ifbw;
        out.pulseClockHz = r.pulseClockHz;
        return out;
    }
    InternalSolution internalGated(const InternalRequest& r, const GateWindow&) override {
        return internal(r);
    }
};

inline std::unique_ptr<TimingSolver> makePassThroughSolver() {
    return std::make_unique<PassThroughSolver>();
}

inline std::function<std::unique_ptr<TimingSolver>()> recordingFactory(SolverScript& s) {
    return [&s]() -> std::unique_ptr<TimingSolver> {
        ++s.created;
        return std::make_unique<RecordingSolver>(s);
    };
}

}  // namespace zp::test

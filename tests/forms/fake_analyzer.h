#pragma once
// Test doubles for the main window model: a scripted person at the screen and timing solvers that
// record their calls. The analyzer is the simulated bench's (form_fixture.h).

#include <functional>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

#include "core/timing_solver.h"
#include "forms/interaction.h"

namespace zp::test {

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

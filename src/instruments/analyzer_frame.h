#pragma once
// The frame every apply/off procedure runs in, and its one error rule.
//
// Opening: the procedure's own application object, setUpdateSwitch(false), currentChannel(),
// beginChannelSetup(true) on it. Normal end: setUpdateSwitch(true), endChannelSetup(), the bus
// object released and then setBusSwitch(false) (procedures that use the bus), the channel and the
// application object released last.
//
// Error rule: each step runs under one handler. An InstrumentError whose description begins
// "+106" or "+143" is skipped: the step ends there and the next step runs. Any other error, also
// one that is no InstrumentError, is the procedure's failure: no further step runs and the frame
// ends through the same sequence as the normal end, but with every failure there ignored, so the
// display is switched back on whenever possible and only the first error is reported. The
// opening's four calls are steps too, so a failure there is reported the same way.
//
// The destructor closes a frame that finish() has not, also while an exception passes through;
// the clean-up cannot be forgotten.

#include <functional>
#include <memory>
#include <optional>
#include <string>

#include "instruments/bench.h"
#include "instruments/generator_session.h"

namespace zp {

// The error that ended a procedure.
struct ProcedureFailure {
    long number = 0;          // the InstrumentError's number; 0 for any other error
    std::string description;  // what the user is shown
};

enum class BusUse { None, Generators };

class AnalyzerFrame {
  public:
    // Runs the opening. Never throws for an instrument failure; see failure().
    explicit AnalyzerFrame(Bench& bench, BusUse bus = BusUse::None);
    ~AnalyzerFrame();
    AnalyzerFrame(const AnalyzerFrame&) = delete;
    AnalyzerFrame& operator=(const AnalyzerFrame&) = delete;

    // Runs one step under the error rule. True when the step ran to its end; false when it was
    // skipped, failed, or did not run because the procedure has already failed.
    bool runStep(const std::function<void()>& step);

    // The bus part of a procedure that uses the generators: setBusSwitch(true), then the bus
    // object, as two steps.
    void openGenerators();

    // The frame's objects, for use inside steps. A missing one throws InstrumentError, which ends
    // the procedure like any other failure.
    AnalyzerApplication& application();
    Channel& channel();
    GeneratorSession& generators();

    bool failed() const { return failure_.has_value(); }
    const std::optional<ProcedureFailure>& failure() const { return failure_; }

    // Ends the procedure (normal end, or the clean-up after a failure) and returns its failure.
    // Later calls return the same without touching the analyzer again.
    [[nodiscard]] std::optional<ProcedureFailure> finish();

  private:
    bool guarded(const std::function<void()>& call);
    void cleanUp(const std::function<void()>& call);

    Bench& bench_;
    BusUse busUse_;
    bool closed_ = false;
    std::optional<ProcedureFailure> failure_;
    // Released in the reverse order: bus first, application last.
    std::unique_ptr<AnalyzerApplication> app_;
    std::unique_ptr<Channel> channel_;
    std::unique_ptr<GeneratorSession> generators_;
};

}  // namespace zp

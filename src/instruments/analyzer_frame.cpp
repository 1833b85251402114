#include "instruments/analyzer_frame.h"

#include <exception>
#include <stdexcept>

#include "instruments/analyzer_connection.h"
#include "instruments/instrument_error.h"

namespace zp {

AnalyzerFrame::AnalyzerFrame(Bench& bench, BusUse bus) : bench_(bench), busUse_(bus) {
    guarded([&] { app_ = openAnalyzer(bench_); });
    guarded([&] { application().setUpdateSwitch(false); });
    guarded([&] {
        channel_ = application().currentChannel();
        if (!channel_) {
            throw InstrumentError(kOwnCheckError, "The analyzer reports no current channel.");
        }
    });
    guarded([&] { channel().beginChannelSetup(true); });
}

// Also while an exception passes: every clean-up call is guarded, so nothing leaves here.
AnalyzerFrame::~AnalyzerFrame() {
    (void)finish();
}

bool AnalyzerFrame::runStep(const std::function<void()>& step) {
    if (closed_) throw std::logic_error("A procedure step cannot run after the procedure's end.");
    return guarded(step);
}

bool AnalyzerFrame::guarded(const std::function<void()>& call) {
    if (failure_) return false;
    try {
        call();
        return true;
    } catch (const InstrumentError& e) {
        if (!isSkippableError(e)) failure_ = ProcedureFailure{e.number(), e.description()};
    } catch (const std::exception& e) {
        failure_ = ProcedureFailure{0, e.what()};
    } catch (...) {
        failure_ = ProcedureFailure{0, "An unknown error ended the procedure."};
    }
    return false;
}

void AnalyzerFrame::cleanUp(const std::function<void()>& call) {
    if (!failure_) {
        guarded(call);  // the normal end's calls are steps like any other
        return;
    }
    try {
        call();
    } catch (...) {
        // The error path: only the first error is reported.
    }
}

void AnalyzerFrame::openGenerators() {
    if (busUse_ != BusUse::Generators) {
        throw std::logic_error("The procedure's frame was opened without the generator bus.");
    }
    if (generators_) throw std::logic_error("The generator bus is already open.");
    runStep([&] { application().setBusSwitch(true); });
    runStep([&] { generators_ = std::make_unique<GeneratorSession>(bench_); });
}

AnalyzerApplication& AnalyzerFrame::application() {
    if (!app_) throw InstrumentError(kOwnCheckError, "The analyzer cannot be reached.");
    return *app_;
}

Channel& AnalyzerFrame::channel() {
    if (!channel_)
        throw InstrumentError(kOwnCheckError, "The analyzer reports no current channel.");
    return *channel_;
}

GeneratorSession& AnalyzerFrame::generators() {
    if (!generators_) throw InstrumentError(kOwnCheckError, "The generator bus is not open.");
    return *generators_;
}

std::optional<ProcedureFailure> AnalyzerFrame::finish() {
    if (closed_) return failure_;
    closed_ = true;
    if (app_) cleanUp([&] { app_->setUpdateSwitch(true); });
    if (channel_) cleanUp([&] { channel_->endChannelSetup(); });
    if (busUse_ == BusUse::Generators) {
        generators_.reset();
        if (app_) cleanUp([&] { app_->setBusSwitch(false); });
    }
    channel_.reset();
    app_.reset();
    return failure_;
}

}  // namespace zp

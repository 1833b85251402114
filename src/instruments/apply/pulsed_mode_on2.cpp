// Pulsed mode on with the analyzer's internal hardware: generators and routing, the narrowband IF
// path, signal processing, attenuators, modulator enables and open-loop leveling.

#include <string>
#include <vector>

#include "instruments/apply/apply_procedures.h"
#include "instruments/apply/apply_steps.h"

namespace zp {

namespace {

using namespace apply;

std::int32_t firstOf(const std::vector<std::int32_t>& list) {
    if (list.empty()) {
        throw InstrumentError(kOwnCheckError,
                              "The timing solution has no filter parameter list; calculate the "
                              "timing first.");
    }
    return list.front();
}

void setProcessing(AnalyzerFrame& frame, const InternalHardware& hw,
                   const ApplySnapshot& snapshot) {
    const PulsedModule& state = snapshot.state;
    const auto module = [&](auto&& call) { frame.runStep([&] { call(hw.processingModule()); }); };
    module([&](SignalProcessingModule& m) { m.setProcessingRate(state.IntSolveTime1); });
    module([&](SignalProcessingModule& m) { m.setCoefficientsA(state.IntSolveList1); });
    if (!isTrue(state.HasClock100MHz)) {
        module([&](SignalProcessingModule& m) { m.setCoefficientsB(state.IntSolveList2); });
    }
    const auto parameter = [&](const char* name, auto value) {
        module([&](SignalProcessingModule& m) {
            m.setFilterParameter(name, static_cast<double>(value()));
        });
    };
    const auto firstParameter = [&] { return firstOf(state.IntSolveList3); };
    if (state.GatedSolveTime2 == 0.0 || snapshot.mode.noSWGating) {
        module([](SignalProcessingModule& m) { m.setFilterType("RECT"); });
        parameter("C", firstParameter);
        frame.runStep([&] { hw.pulseGenerator().setState(0, false); });
    } else {
        module([](SignalProcessingModule& m) { m.setFilterType("PWIN"); });
        parameter("C", firstParameter);
        parameter("P", [&] { return periodOf(state.PRF, "PRF"); });
        parameter("D", [&] { return state.GatedSolveTime1; });
        parameter("W", [&] { return state.GatedSolveTime2; });
        parameter("R", [&] { return state.GatedSolveTicks; });
        // Generator 0 works with the processing module: one clock tick wide, at the start.
        frame.runStep(
            [&] { hw.pulseGenerator().setWidth(0, periodOf(state.PulseClockHz, "pulse clock")); });
        frame.runStep([&] { hw.pulseGenerator().setDelay(0, 0.0); });
        frame.runStep([&] { hw.pulseGenerator().setState(0, true); });
    }
    module([](SignalProcessingModule& m) { m.setProcessingSwitch(1); });
}

void enableModulators(AnalyzerFrame& frame, const InternalHardware& hw) {
    std::vector<std::string> names;
    frame.runStep([&] { names = hw.pathConfiguration().elementNames(); });
    for (const std::string& name : names) {
        for (const char* enable : {"Src1Out1PulseModEnable", "Src2Out1PulseModEnable"}) {
            if (name.find(enable) == std::string::npos) continue;
            frame.runStep([&] { setElement(hw.pathConfiguration(), enable, "Enable"); });
        }
    }
}

void openLoopLeveling(AnalyzerFrame& frame) {
    int ports = 0;
    frame.runStep([&] {
        const auto caps = frame.application().hardwareInfo();
        ports = need(caps, "hardware information").portCount();
    });
    for (int port = 1; port <= ports; ++port) {
        std::vector<std::string> modes;
        frame.runStep([&] { modes = frame.channel().getSupportedALCModes(port); });
        for (const std::string& mode : modes) {
            if (mode.find("OPENloop") == std::string::npos) continue;
            frame.runStep([&] { frame.channel().setALCLevelingMode(port, 2); });
        }
    }
}

}  // namespace

ApplyResult SPulsedModeOn2(Bench& bench, const ApplySnapshot& snapshot) {
    const PulsedModule& state = snapshot.state;
    ApplyResult result = startResult(ApplyProcedure::PulsedModeOn2, snapshot);
    AnalyzerFrame frame(bench);
    {
        InternalHardware hw;
        hw.take(frame);
        std::vector<double> widths = snapshot.entries.widths;
        if (!snapshot.mode.noPG) programInternalGenerators(frame, hw, snapshot, widths, result);

        frame.runStep([&] { setElement(hw.pathConfiguration(), "IFSigPathAll", "NBF"); });
        frame.runStep([&] { hw.ifConfiguration().setNarrowbandValue(state.IntSolveTime2); });
        frame.runStep([&] { hw.ifConfiguration().setNarrowbandSwitch(1); });
        setProcessing(frame, hw, snapshot);
        setReceiverAttenuators(frame, hw, snapshot, widths, result);

        showMessage(frame, pulsedIfbwMessage(state.IFBWHz));
        frame.runStep([&] { frame.channel().setIfBandwidth(snapshot.entries.ifbw); });
        enableModulators(frame, hw);
        openLoopLeveling(frame);
    }
    result.failure = frame.finish();
    return result;
}

}  // namespace zp

// Pulsed mode off with the analyzer's internal hardware: generators off, gates open, wideband IF
// path, processing off, attenuators back to their off code, modulators off.

#include <string>

#include "instruments/apply/apply_procedures.h"
#include "instruments/apply/apply_steps.h"

namespace zp {

namespace {

using namespace apply;

// Every row's generator, enabled or not, so nothing an earlier set-up left on keeps running.
void switchGeneratorsOff(AnalyzerFrame& frame, const InternalHardware& hw,
                         const PulsedModule& state) {
    const auto openGate = [&](int i) {
        frame.runStep([&] {
            setElement(hw.pathConfiguration(), nameAt(state.OutputNames, i, "output name"), "ON");
        });
    };
    for (int i = 0; i < state.NumOutputs && !frame.failed(); ++i) {
        PGRow row;
        if (!frame.runStep([&] { row = state.SReadRow(i); })) continue;
        frame.runStep([&] { hw.pulseGenerator().setState(internalGenerator(row, i), false); });
        if (isTrue(state.HasInternalMod) || i != 0) openGate(i);
    }
    if (!state.isFourPort()) return;
    for (int i = state.NumOutputs; i < static_cast<int>(state.OutputNames.size()); ++i) {
        openGate(i);
    }
}

}  // namespace

ApplyResult SPulsedModeOff2(Bench& bench, const ApplySnapshot& snapshot) {
    const PulsedModule& state = snapshot.state;
    ApplyResult result = startResult(ApplyProcedure::PulsedModeOff2, snapshot);
    AnalyzerFrame frame(bench);
    {
        InternalHardware hw;
        hw.take(frame);
        if (!snapshot.mode.noPG) switchGeneratorsOff(frame, hw, state);

        const auto element = [&](const std::string& name, const std::string& value) {
            frame.runStep([&] { setElement(hw.pathConfiguration(), name, value); });
        };
        element("IFAntiAliasFilter", "AUTO");
        element("IFSigPathAll", "WBF");
        frame.runStep([&] { hw.ifConfiguration().setNarrowbandSwitch(0); });
        frame.runStep([&] { hw.processingModule().setProcessingSwitch(0); });
        frame.runStep([&] { hw.pulseGenerator().setState(0, false); });
        showMessage(frame, "");
        for (const std::string& name : state.RxPathNames) {
            element(name, std::to_string(state.GainOffCode));
        }
        // Leveling goes back on the first source's port and on port 3, the second source's.
        if (isTrue(state.HasModSource1)) {
            frame.runStep([&] { frame.channel().setALCLevelingMode(1, 0); });
            element("Src1Out1PulseModEnable", "Disable");
        }
        const bool twoSources = isTrue(state.Is2Port2Src) || isTrue(state.Is4PortMultiSrc);
        if (twoSources && isTrue(state.HasModSource2)) {
            frame.runStep([&] { frame.channel().setALCLevelingMode(3, 0); });
            element("Src2Out1PulseModEnable", "Disable");
        }
    }
    result.failure = frame.finish();
    return result;
}

}  // namespace zp

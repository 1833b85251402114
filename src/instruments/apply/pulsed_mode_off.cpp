// Pulsed mode off with external pulse generators: the used outputs off (no preset, no new
// initialisation), then the IF gating off.

#include "instruments/apply/apply_procedures.h"
#include "instruments/apply/apply_steps.h"

namespace zp {

namespace {

void switchOutputsOff(AnalyzerFrame& frame, const PulsedModule& state, ApplyResult& result) {
    apply::forEachEnabledGenerator(
        frame, state, result, [&](int, const PGRow& row, const GeneratorDescriptor& generator) {
            frame.runStep([&] { frame.generators().bus().clearDevice(generator.descriptor); });
            frame.runStep([&] {
                frame.generators().write(generator,
                                         ":OUTP" + std::to_string(row.gateOutput) + ":STAT OFF");
            });
        });
}

}  // namespace

ApplyResult SPulsedModeOff(Bench& bench, const ApplySnapshot& snapshot) {
    using namespace apply;
    const PulsedModule& state = snapshot.state;
    ApplyResult result = startResult(ApplyProcedure::PulsedModeOff, snapshot);
    AnalyzerFrame frame(bench, BusUse::Generators);

    showMessage(frame, "");
    frame.openGenerators();
    if (!snapshot.mode.noPG) switchOutputsOff(frame, state, result);
    {
        std::unique_ptr<IfConfiguration> ifc;
        frame.runStep([&] { ifc = frame.channel().ifConfiguration(); });
        const auto on = [&](auto&& call) {
            frame.runStep([&] { call(need(ifc, "IFConfiguration")); });
        };
        on([](IfConfiguration& c) { c.setIfSwitchA(false); });
        on([](IfConfiguration& c) { c.setIfSwitchB(false); });
        on([](IfConfiguration& c) { c.setReceiverSwitch("ALL", false); });
        if (isTrue(state.HasInternalGates)) {
            on([](IfConfiguration& c) { c.setInternalGateSwitch(false); });
        }
    }
    if (!snapshot.mode.converterMeas) {
        frame.runStep([&] { frame.channel().setFrequencyOffsetFrequency(0.0); });
    }
    result.failure = frame.finish();
    return result;
}

}  // namespace zp

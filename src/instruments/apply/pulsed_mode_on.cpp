// Pulsed mode on with external pulse generators: the generators first, then the analyzer's IF
// gating, receiver gains and frequency offset.

#include "instruments/apply/apply_procedures.h"
#include "instruments/apply/apply_steps.h"

namespace zp {

ApplyResult SPulsedModeOn(Bench& bench, const ApplySnapshot& snapshot) {
    using namespace apply;
    const PulsedModule& state = snapshot.state;
    ApplyResult result = startResult(ApplyProcedure::PulsedModeOn, snapshot);
    AnalyzerFrame frame(bench, BusUse::Generators);

    // The bus is made even when no generator is programmed.
    frame.openGenerators();
    if (!snapshot.mode.noPG) programExternalGenerators(frame, snapshot, result);

    showMessage(frame, pulsedIfbwMessage(state.IFBWHz));
    frame.runStep([&] { frame.channel().setIfBandwidth(snapshot.entries.ifbw); });
    {
        std::unique_ptr<IfConfiguration> ifc;
        frame.runStep([&] { ifc = frame.channel().ifConfiguration(); });
        const auto on = [&](auto&& call) {
            frame.runStep([&] { call(need(ifc, "IFConfiguration")); });
        };
        on([&](IfConfiguration& c) { c.setIfSwitchA(true); });
        on([&](IfConfiguration& c) { c.setIfTimeA(state.ConverterDelay); });
        on([&](IfConfiguration& c) { c.setIfSwitchB(true); });
        on([&](IfConfiguration& c) { c.setIfCountB(state.SolvedIFCount); });
        on([&](IfConfiguration& c) { c.setReceiverSwitch("ALL", true); });
        for (int k = 0; k < static_cast<int>(state.ReceiverGains.size()); ++k) {
            on([&](IfConfiguration& c) {
                const std::string& receiver = nameAt(state.ReceiverNames, k, "receiver name");
                const std::int16_t code = gainCode(state.ReceiverGains[k], receiver);
                c.setReceiverGain(receiver, code == 3 ? snapshot.autoGain : code);
            });
        }
        if (isTrue(state.HasInternalGates)) {
            on([&](IfConfiguration& c) { c.setInternalGateSwitch(true); });
        }
    }
    frame.runStep([&] { frame.channel().setFrequencyOffsetState(1); });
    if (!snapshot.mode.converterMeas) {
        frame.runStep([&] { frame.channel().setFrequencyOffsetFrequency(state.SolvedFreqOffset); });
    }
    result.failure = frame.finish();
    return result;
}

}  // namespace zp

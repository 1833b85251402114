// The analyzer's internal pulse generators 1 to 4 and their routing to the source modulator and
// the receiver gates.

#include "instruments/apply/apply_steps.h"

namespace zp::apply {

namespace {

// Routes an enabled row's signal from its generator and programs that generator.
void programRow(AnalyzerFrame& frame, const InternalHardware& hw, const ApplySnapshot& snapshot,
                const PGRow& row, int i, bool routed, std::vector<double>& widths,
                ApplyResult& result) {
    const PulsedModule& state = snapshot.state;
    int g = 0;
    frame.runStep([&] {
        g = internalGenerator(row, i);
        if (routed) {
            setElement(hw.pathConfiguration(), nameAt(state.OutputNames, i, "output name"),
                       nameAt(state.IntPGNames, g - 1, "internal generator name"));
        }
    });
    frame.runStep([&] { hw.pulseGenerator().setWidth(g, entryAt(widths, i, "width")); });
    // The analyzer keeps widths on its pulse clock: what it accepted replaces the entry, and the
    // rest of this run works with it, as the window's field will.
    double accepted = 0.0;
    if (frame.runStep([&] { accepted = hw.pulseGenerator().width(g); })) {
        widths[static_cast<std::size_t>(i)] = accepted;
        result.acceptedWidths[static_cast<std::size_t>(i)] = accepted;
    }
    frame.runStep(
        [&] { hw.pulseGenerator().setDelay(g, entryAt(snapshot.entries.delays, i, "delay")); });
    frame.runStep([&] { hw.pulseGenerator().setState(g, true); });
}

}  // namespace

void programInternalGenerators(AnalyzerFrame& frame, const InternalHardware& hw,
                               const ApplySnapshot& snapshot, std::vector<double>& widths,
                               ApplyResult& result) {
    const PulsedModule& state = snapshot.state;
    frame.runStep([&] { hw.pulseGenerator().setPeriod(periodOf(state.PRF, "PRF")); });
    for (int i = 0; i < state.NumOutputs && !frame.failed(); ++i) {
        PGRow row;
        if (!frame.runStep([&] { row = state.SReadRow(i); })) continue;
        // Without internal modulators the source modulation element is left alone.
        const bool routed = isTrue(state.HasInternalMod) || i != 0;
        if (row.enabled > 0) {
            programRow(frame, hw, snapshot, row, i, routed, widths, result);
        } else if (routed) {
            // A gate left open rather than on an older routing.
            frame.runStep([&] {
                setElement(hw.pathConfiguration(), nameAt(state.OutputNames, i, "output name"),
                           "ON");
            });
        }
    }
    if (!state.isFourPort()) return;
    // The reference gates after the first follow the last row.
    const int last = state.NumOutputs - 1;
    for (int i = state.NumOutputs; i < static_cast<int>(state.OutputNames.size()); ++i) {
        frame.runStep([&] {
            PathConfiguration& path = hw.pathConfiguration();
            const std::string& element = nameAt(state.OutputNames, i, "output name");
            if (state.SReadRow(last).enabled > 0) {
                const auto source = path.element(nameAt(state.OutputNames, last, "output name"));
                setElement(path, element, need(source, "path element").value());
            } else {
                setElement(path, element, "ON");
            }
        });
    }
}

}  // namespace zp::apply

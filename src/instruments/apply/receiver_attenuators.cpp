// The narrowband attenuator of each receiver: a fixed value for a manual gain, the solver's value
// for "Auto".

#include <algorithm>
#include <array>

#include "instruments/apply/apply_steps.h"

namespace zp::apply {

namespace {

// Two-port attenuators NBFATNA, NBFATNB, NBFATNR1, NBFATNR2 against the receiver order A, R1, R2,
// B of the gain list.
constexpr std::array<int, 4> kTwoPortGainIndex = {0, 3, 1, 2};

struct Attenuator {
    int gainIndex;  // into ReceiverGains (and ReceiverNames)
    int widthRow;   // the gate row whose width the solver gets
};

// Attenuator i belongs to the receiver gated by row i + 1. On four-port analyzers the reference
// receivers after the first share the last gate row and the first reference receiver's gain.
Attenuator attenuator(const PulsedModule& state, int i) {
    if (state.isFourPort()) {
        const int lastGate = state.NumOutputs - 1;
        return {std::min(i, lastGate - 1), std::min(i + 1, lastGate)};
    }
    return {kTwoPortGainIndex[static_cast<std::size_t>(i)], i + 1};
}

int attenuatorCount(const PulsedModule& state) {
    if (state.isFourPort()) {
        return std::max(static_cast<int>(state.RxPathNames.size()), state.NumOutputs - 1);
    }
    return std::min<int>(state.NumOutputs - 1, static_cast<int>(kTwoPortGainIndex.size()));
}

}  // namespace

void setReceiverAttenuators(AnalyzerFrame& frame, const InternalHardware& hw,
                            const ApplySnapshot& snapshot, const std::vector<double>& widths,
                            ApplyResult& result) {
    const PulsedModule& state = snapshot.state;
    std::unique_ptr<TimingSolver> solver;  // made at the first "Auto"
    for (int i = 0; i < attenuatorCount(state); ++i) {
        std::string value;
        const bool known = frame.runStep([&] {
            const Attenuator a = attenuator(state, i);
            const std::string& receiver = nameAt(state.ReceiverNames, a.gainIndex, "receiver name");
            const std::int16_t code =
                gainCode(valueAt(state.ReceiverGains, a.gainIndex, "receiver gain"), receiver);
            if (code != 3) {
                value = std::to_string(valueAt(state.GainTable, code, "gain table"));
                return;
            }
            valueAt(result.rxSolveValues, i, "receiver solve value");
            if (!solver && snapshot.solver) solver = snapshot.solver();
            if (!solver) {
                throw InstrumentError(kOwnCheckError,
                                      "No timing solver is available for the receiver "
                                      "attenuation of receiver " +
                                          receiver + ".");
            }
            std::int16_t& solved = result.rxSolveValues[static_cast<std::size_t>(i)];
            solver->SolveReceiver(state.PRF, entryAt(widths, a.widthRow, "width"), solved);
            value = std::to_string(solved);
        });
        if (!known) continue;
        frame.runStep([&] {
            setElement(hw.pathConfiguration(), nameAt(state.RxPathNames, i, "receiver path name"),
                       value);
        });
    }
}

}  // namespace zp::apply

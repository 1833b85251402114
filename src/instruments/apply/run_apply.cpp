#include "instruments/apply/apply_procedures.h"

namespace zp {

const char* procedureName(ApplyProcedure procedure) {
    switch (procedure) {
        case ApplyProcedure::PulsedModeOn:
            return "SPulsedModeOn";
        case ApplyProcedure::PulsedModeOn2:
            return "SPulsedModeOn2";
        case ApplyProcedure::PulsedModeOff:
            return "SPulsedModeOff";
        case ApplyProcedure::PulsedModeOff2:
            return "SPulsedModeOff2";
    }
    return "unknown procedure";
}

ApplyProcedure applyProcedureFor(bool pulsedChecked, std::int16_t useInternalPG) {
    const bool internal = useInternalPG != 0;
    if (pulsedChecked)
        return internal ? ApplyProcedure::PulsedModeOn2 : ApplyProcedure::PulsedModeOn;
    return internal ? ApplyProcedure::PulsedModeOff2 : ApplyProcedure::PulsedModeOff;
}

ApplyResult runApply(Bench& bench, const ApplySnapshot& snapshot) {
    switch (applyProcedureFor(snapshot.pulsedChecked, snapshot.state.UseInternalPG)) {
        case ApplyProcedure::PulsedModeOn:
            return SPulsedModeOn(bench, snapshot);
        case ApplyProcedure::PulsedModeOn2:
            return SPulsedModeOn2(bench, snapshot);
        case ApplyProcedure::PulsedModeOff:
            return SPulsedModeOff(bench, snapshot);
        case ApplyProcedure::PulsedModeOff2:
            return SPulsedModeOff2(bench, snapshot);
    }
    return SPulsedModeOff(bench, snapshot);
}

}  // namespace zp

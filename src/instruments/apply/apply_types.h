#pragma once
// What an apply or off procedure reads, and what it hands back. The procedures work on a copy
// taken by the window when Apply runs; they never touch the window or the program-wide state, so
// the window writes back what it wants from the result.

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "core/pulsed_module.h"
#include "core/timing_solver.h"
#include "instruments/analyzer_frame.h"

namespace zp {

// The timing entries as the window's fields hold them when Apply runs. Index = table row.
struct ApplyEntries {
    double prf = 0.0;            // PRF field, Hz
    double ifbw = 0.0;           // IF bandwidth field, Hz
    std::vector<double> widths;  // s
    std::vector<double> delays;  // s
};

// The three check-mark menu entries that set the measurement mode.
struct MeasurementMode {
    bool noPG = false;           // "No Pulse Generators": analyzer side only
    bool converterMeas = false;  // "Converter Measurements": frequency offset left alone
    bool noSWGating = false;     // "No SW Gating": rectangular processing filter
};

// Made once per procedure, and only when a receiver attenuator is on "Auto".
using SolverFactory = std::function<std::unique_ptr<TimingSolver>()>;

struct ApplySnapshot {
    PulsedModule state;  // table, name lists, gains, flags and the last solver results
    ApplyEntries entries;
    MeasurementMode mode;
    bool pulsedChecked = false;  // "Pulsed Mode On"
    std::int16_t autoGain = 0;   // the gain code "Auto" stands for on the external path
    SolverFactory solver = makeDefaultSolver;
};

enum class ApplyProcedure { PulsedModeOn, PulsedModeOn2, PulsedModeOff, PulsedModeOff2 };

// "SPulsedModeOn" ... for messages and logs.
const char* procedureName(ApplyProcedure procedure);

struct ApplyResult {
    ApplyProcedure procedure = ApplyProcedure::PulsedModeOff;
    // External generator rows that got through to their error-queue check: programmed by
    // SPulsedModeOn, switched off by SPulsedModeOff.
    int generatorRows = 0;
    // Per table row, the width the analyzer accepted for it (internal generators only); the
    // window shows it in the row's width field.
    std::vector<std::optional<double>> acceptedWidths;
    // The receiver attenuator values as the solver left them (internal path); the window keeps
    // them in its state.
    std::vector<std::int16_t> rxSolveValues;
    std::optional<ProcedureFailure> failure;
};

}  // namespace zp

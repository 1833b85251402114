#pragma once
// Pieces the apply and off procedures share. Every check throws InstrumentError with the
// program's own error number, so the frame reports it and ends the procedure there.

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "core/pg_table.h"
#include "core/pulsed_module.h"
#include "instruments/analyzer_automation.h"
#include "instruments/analyzer_frame.h"
#include "instruments/apply/apply_types.h"
#include "instruments/instrument_error.h"

namespace zp::apply {

// A sub-object the analyzer did not give (its step was skipped) cannot be used.
template <class T>
T& need(const std::unique_ptr<T>& object, const char* name) {
    if (!object) {
        throw InstrumentError(kOwnCheckError,
                              std::string("The analyzer gave no ") + name + " object.");
    }
    return *object;
}

// A result carrying the procedure's name and the state's values it may hand back.
ApplyResult startResult(ApplyProcedure procedure, const ApplySnapshot& snapshot);

// Entry i of a value list, or an error naming the list ("width", "delay" ...).
double entryAt(const std::vector<double>& values, int row, const char* what);
// Entry i of a name list, or an error naming the list.
const std::string& nameAt(const std::vector<std::string>& names, int index, const char* what);
std::int16_t valueAt(const std::vector<std::int16_t>& values, int index, const char* what);

// The row's IntPGOutput when it is 1 to 4.
int internalGenerator(const PGRow& row, int rowIndex);
// A receiver gain code when it is 0 to 3.
std::int16_t gainCode(std::int16_t code, const std::string& receiver);

// 1 / frequency, refused for a frequency that is not above 0.
double periodOf(double hz, const char* what);

// "Pulsed IFBW setting is 2500 Hz".
std::string pulsedIfbwMessage(std::int32_t ifbwHz);

// The analyzer's message area, shown the text (one step).
void showMessage(AnalyzerFrame& frame, const std::string& text);

// element(name), then setValue(value).
void setElement(PathConfiguration& path, const std::string& name, const std::string& value);

// The four channel objects the internal-hardware procedures use, taken in this order, one step
// each. Released before the frame ends.
struct InternalHardware {
    std::unique_ptr<InternalPulseGenerator> pulse;
    std::unique_ptr<PathConfiguration> path;
    std::unique_ptr<IfConfiguration> ifc;
    std::unique_ptr<SignalProcessingModule> processing;

    void take(AnalyzerFrame& frame);
    InternalPulseGenerator& pulseGenerator() const { return need(pulse, "PulseGenerator"); }
    PathConfiguration& pathConfiguration() const { return need(path, "PathConfiguration"); }
    IfConfiguration& ifConfiguration() const { return need(ifc, "IFConfiguration"); }
    SignalProcessingModule& processingModule() const {
        return need(processing, "SignalProcessingModuleFour");
    }
};

// For every enabled table row, in order: its generator opened and identified, then `program`
// with the row; a row whose error-queue check passes after that counts in result.generatorRows.
// Ends at the first failure.
void forEachEnabledGenerator(
    AnalyzerFrame& frame, const PulsedModule& state, ApplyResult& result,
    const std::function<void(int i, const PGRow& row, const GeneratorDescriptor& generator)>&
        program);

// The internal generators and their routing (analyzer side of SPulsedModeOn2, generator part).
// `widths` are the width fields; a width the analyzer accepted replaces its row's entry.
void programInternalGenerators(AnalyzerFrame& frame, const InternalHardware& hw,
                               const ApplySnapshot& snapshot, std::vector<double>& widths,
                               ApplyResult& result);

// The narrowband attenuator of every receiver, from its gain code or, on "Auto", the solver.
void setReceiverAttenuators(AnalyzerFrame& frame, const InternalHardware& hw,
                            const ApplySnapshot& snapshot, const std::vector<double>& widths,
                            ApplyResult& result);

// Every enabled table row onto its external generator (the bus part of SPulsedModeOn).
void programExternalGenerators(AnalyzerFrame& frame, const ApplySnapshot& snapshot,
                               ApplyResult& result);

}  // namespace zp::apply

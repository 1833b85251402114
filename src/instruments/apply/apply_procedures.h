#pragma once
// The four procedures Apply chooses from, each in its own AnalyzerFrame with the one error rule:
// a failure ends the procedure and comes back in ApplyResult::failure, it is never thrown.

#include <cstdint>

#include "instruments/apply/apply_types.h"
#include "instruments/bench.h"
#include "instruments/generator_session.h"

namespace zp {

// External pulse generators over the bus, then the analyzer's IF gating.
ApplyResult SPulsedModeOn(Bench& bench, const ApplySnapshot& snapshot);
// The analyzer's internal pulse generators, routing, narrowband path and processing.
ApplyResult SPulsedModeOn2(Bench& bench, const ApplySnapshot& snapshot);
// External generator outputs off, IF gating off.
ApplyResult SPulsedModeOff(Bench& bench, const ApplySnapshot& snapshot);
// The internal hardware back to normal.
ApplyResult SPulsedModeOff2(Bench& bench, const ApplySnapshot& snapshot);

// The first settings of a generator output: master (own trigger, external 10 MHz reference) or
// slave (armed from its external input). Throws what the bus throws.
void SInitPulseGenerator(GeneratorSession& session, const GeneratorDescriptor& generator,
                         int output, bool isMaster);

// Pulsed Mode On checked or not, and the UseInternalPG check value (0 = external generators).
ApplyProcedure applyProcedureFor(bool pulsedChecked, std::int16_t useInternalPG);

// Runs the procedure that the snapshot's check box and UseInternalPG choose.
ApplyResult runApply(Bench& bench, const ApplySnapshot& snapshot);

}  // namespace zp

#pragma once
// Handles onto the shared simulated analyzer state: one per automation object a caller holds.
// A handle only keeps the state by reference, so no handle may outlive its bench.

#include <memory>
#include <string>

#include "instruments/analyzer_automation.h"
#include "sim/analyzer/sim_call.h"

namespace zp::sim {

class SimHandle {
  protected:
    SimHandle(SimAnalyzerState& state, std::string object)
        : state_(state), object_(std::move(object)) {}

    template <class F>
    auto call(std::string_view operation, const std::string& arguments, F&& body) {
        return simCall(state_, object_, operation, arguments, std::forward<F>(body));
    }

    // Stores a checked value in the slot `find` points to. The slot is looked up first so that a
    // missing channel is reported ahead of a bad value.
    template <class Value, class Find>
    void store(std::string_view operation, const Value& value, bool valid, Find&& find,
               ScpiErrorCode refusal = kDataOutOfRange) {
        call(operation, trace_text::args(value), [&] {
            auto* slot = find();
            if (!valid) throw analyzerError(refusal);
            *slot = value;
        });
    }

    SimAnalyzerState& state_;
    std::string object_;
};

std::unique_ptr<AnalyzerApplication> makeSimApplication(SimAnalyzerState& state);
std::unique_ptr<Channel> makeSimChannel(SimAnalyzerState& state, int number);
std::unique_ptr<IfConfiguration> makeSimIfConfiguration(SimAnalyzerState& state, int channel);
std::unique_ptr<PathConfiguration> makeSimPathConfiguration(SimAnalyzerState& state, int channel);
std::unique_ptr<InternalPulseGenerator> makeSimPulseGenerator(SimAnalyzerState& state, int channel);
std::unique_ptr<SignalProcessingModule> makeSimProcessingModule(SimAnalyzerState& state,
                                                                int channel);

}  // namespace zp::sim

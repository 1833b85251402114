#pragma once
// The simulated bench: one analyzer model, pulse generators at GPIB addresses, their wiring to the
// analyzer, a pulsed device and injected faults. The program's default back end.

#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "instruments/wired_bench.h"
#include "sim/faults.h"
#include "sim/generators/sim_generator.h"
#include "sim/sim_model.h"

namespace zp::sim {

class SimAnalyzerState;  // the analyzer's settings, shared by every connection

// The simulated instruments. The generators' outputs reach the analyzer's inputs, so the two are
// built together; everything either does is written to the trace given, which must outlive them.
class SimInstruments : public AnalyzerSource {
  public:
    // Throws std::invalid_argument for an unknown model name (the message lists the known ones)
    // and for generator addresses outside 0 to 30 or given twice.
    explicit SimInstruments(IoTrace& trace, std::string_view modelName = kDefaultModel,
                            SimFaults faults = {},
                            std::vector<int> generatorAddresses = {11, 12, 13});
    ~SimInstruments() override;

    std::unique_ptr<AnalyzerApplication> connectAnalyzer() override;
    std::string describe() const override;
    bool simulated() const override { return true; }

    // Buses to the simulated generators; these instruments must outlive the source.
    std::unique_ptr<BusSource> generatorBus();

    const SimModel& model() const { return model_; }
    SimFaults& faults() { return faults_; }
    SimGenerator* generator(int address);  // nullptr when none at that address
    SimAnalyzerState& analyzer() { return *analyzer_; }

  private:
    SimModel model_;
    SimFaults faults_;
    IoTrace& trace_;
    std::map<int, std::unique_ptr<SimGenerator>> generators_;
    std::unique_ptr<SimAnalyzerState> analyzer_;
};

// The whole simulated bench: the simulated analyzer with its own simulated generators.
class SimBench : public WiredBench {
  public:
    explicit SimBench(std::string_view modelName = kDefaultModel, SimFaults faults = {},
                      std::vector<int> generatorAddresses = {11, 12, 13});

    const SimModel& model() const { return instruments_->model(); }
    SimFaults& faults() { return instruments_->faults(); }
    SimGenerator* generator(int address) { return instruments_->generator(address); }
    SimAnalyzerState& analyzer() { return instruments_->analyzer(); }

  private:
    SimInstruments* instruments_;  // owned by the wiring
};

}  // namespace zp::sim

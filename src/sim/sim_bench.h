#pragma once
// The simulated bench: one analyzer model, pulse generators at GPIB addresses, their wiring to the
// analyzer, a pulsed device, injected faults and the I/O trace. The program's default back end.

#include <functional>
#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "instruments/bench.h"
#include "instruments/io_trace.h"
#include "sim/faults.h"
#include "sim/sim_generator.h"

namespace zp::sim {

struct SimModel {
    std::string name;  // "kt622", ... as given on the command line
    std::string modelText;
    std::string optionText;
    int ports = 2;
    int sources = 1;
    std::string hardwareValue;
    double minFrequency = 10e6;
    double maxFrequency = 26.5e9;
};

const std::vector<SimModel>& simModels();
const SimModel* findSimModel(std::string_view name);  // nullptr when unknown
inline constexpr const char* kDefaultModel = "kt622";

class SimAnalyzerState;  // the analyzer's settings, shared by every connection

class SimBench : public Bench {
  public:
    // Throws std::invalid_argument for an unknown model name (the message lists the known ones).
    explicit SimBench(std::string_view modelName = kDefaultModel, SimFaults faults = {},
                      std::vector<int> generatorAddresses = {11, 12, 13});
    ~SimBench() override;

    std::unique_ptr<AnalyzerApplication> connectAnalyzer() override;
    // Simulated generators unless a bus factory was set (real generators through a transport).
    std::unique_ptr<InstrumentBus> createBus() override;
    IoTrace* trace() override { return &trace_; }
    std::string describe() const override;
    bool simulated() const override { return true; }

    void setBusFactory(std::function<std::unique_ptr<InstrumentBus>()> factory,
                       std::string description);

    const SimModel& model() const { return model_; }
    SimFaults& faults() { return faults_; }
    SimGenerator* generator(int address);  // nullptr when none at that address
    SimAnalyzerState& analyzer() { return *analyzer_; }

  private:
    SimModel model_;
    SimFaults faults_;
    IoTrace trace_;
    std::map<int, std::unique_ptr<SimGenerator>> generators_;
    std::unique_ptr<SimAnalyzerState> analyzer_;
    std::function<std::unique_ptr<InstrumentBus>()> busFactory_;
    std::string busDescription_;
};

}  // namespace zp::sim

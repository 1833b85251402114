#include "sim/sim_bench.h"

#include <stdexcept>

#include "sim/analyzer/sim_analyzer_state.h"
#include "sim/analyzer/sim_handles.h"
#include "sim/generators/sim_gpib_bus.h"

namespace zp::sim {

namespace {

SimModel modelNamed(std::string_view name) {
    if (const SimModel* model = findSimModel(name)) return *model;
    std::string known;
    for (const auto& model : simModels()) known += (known.empty() ? "" : ", ") + model.name;
    throw std::invalid_argument("unknown analyzer model '" + std::string(name) +
                                "'; known: " + known);
}

class SimGeneratorBusSource : public BusSource {
  public:
    SimGeneratorBusSource(GeneratorMap& generators, IoTrace& trace, const SimFaults& faults)
        : generators_(generators), trace_(trace), faults_(faults) {}

    std::unique_ptr<InstrumentBus> createBus() override {
        return std::make_unique<SimGpibBus>(generators_, &trace_, &faults_);
    }

    std::string describe() const override {
        if (generators_.empty()) return "no generators";
        std::string text = "simulated generators at ";
        bool first = true;
        for (const auto& [address, generator] : generators_) {
            text += (first ? "" : ", ") + std::to_string(address);
            first = false;
        }
        return text;
    }

  private:
    GeneratorMap& generators_;
    IoTrace& trace_;
    const SimFaults& faults_;
};

}  // namespace

SimInstruments::SimInstruments(IoTrace& trace, std::string_view modelName, SimFaults faults,
                               std::vector<int> generatorAddresses)
    : model_(modelNamed(modelName)), faults_(std::move(faults)), trace_(trace) {
    for (const int address : generatorAddresses) {
        if (address < 0 || address > 30) {
            throw std::invalid_argument("generator GPIB address " + std::to_string(address) +
                                        " is outside 0 to 30");
        }
        if (!generators_.emplace(address, std::make_unique<SimGenerator>(address, "")).second) {
            throw std::invalid_argument("two generators at GPIB address " +
                                        std::to_string(address));
        }
    }
    analyzer_ = std::make_unique<SimAnalyzerState>(model_, &faults_, &trace_, &generators_);
}

SimInstruments::~SimInstruments() = default;

std::unique_ptr<AnalyzerApplication> SimInstruments::connectAnalyzer() {
    return makeSimApplication(*analyzer_);
}

std::string SimInstruments::describe() const {
    return "simulated " + model_.modelText + " (" + model_.name + ")";
}

std::unique_ptr<BusSource> SimInstruments::generatorBus() {
    return std::make_unique<SimGeneratorBusSource>(generators_, trace_, faults_);
}

SimGenerator* SimInstruments::generator(int address) {
    const auto it = generators_.find(address);
    return it == generators_.end() ? nullptr : it->second.get();
}

SimBench::SimBench(std::string_view modelName, SimFaults faults,
                   std::vector<int> generatorAddresses) {
    auto instruments = std::make_unique<SimInstruments>(*trace(), modelName, std::move(faults),
                                                        std::move(generatorAddresses));
    instruments_ = instruments.get();
    std::unique_ptr<BusSource> bus = instruments->generatorBus();
    wire(std::move(instruments), std::move(bus));
}

}  // namespace zp::sim

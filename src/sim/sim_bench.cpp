#include "sim/sim_bench.h"

#include <stdexcept>

#include "sim/sim_analyzer_state.h"
#include "sim/sim_gpib_bus.h"
#include "sim/sim_handles.h"

namespace zp::sim {

namespace {

SimModel modelNamed(std::string_view name) {
    if (const SimModel* model = findSimModel(name)) return *model;
    std::string known;
    for (const auto& model : simModels()) known += (known.empty() ? "" : ", ") + model.name;
    throw std::invalid_argument("unknown analyzer model '" + std::string(name) +
                                "'; known: " + known);
}

}  // namespace

SimBench::SimBench(std::string_view modelName, SimFaults faults,
                   std::vector<int> generatorAddresses)
    : model_(modelNamed(modelName)), faults_(std::move(faults)) {
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

SimBench::~SimBench() = default;

std::unique_ptr<AnalyzerApplication> SimBench::connectAnalyzer() {
    return makeSimApplication(*analyzer_);
}

std::unique_ptr<InstrumentBus> SimBench::createBus() {
    if (busFactory_) return busFactory_();
    return std::make_unique<SimGpibBus>(generators_, &trace_, &faults_);
}

std::string SimBench::describe() const {
    std::string text = "simulated " + model_.modelText + " (" + model_.name + "), ";
    if (busFactory_) return text + busDescription_;
    if (generators_.empty()) return text + "no generators";
    text += "simulated generators at ";
    bool first = true;
    for (const auto& [address, generator] : generators_) {
        text += (first ? "" : ", ") + std::to_string(address);
        first = false;
    }
    return text;
}

void SimBench::setBusFactory(std::function<std::unique_ptr<InstrumentBus>()> factory,
                             std::string description) {
    busFactory_ = std::move(factory);
    busDescription_ = std::move(description);
}

SimGenerator* SimBench::generator(int address) {
    const auto it = generators_.find(address);
    return it == generators_.end() ? nullptr : it->second.get();
}

}  // namespace zp::sim

#include "instruments/wired_bench.h"

#include <stdexcept>

namespace zp {

namespace {

template <typename Source>
Source& wired(const std::unique_ptr<Source>& source) {
    if (!source) throw std::logic_error("the bench is used before its sources are wired");
    return *source;
}

}  // namespace

void WiredBench::wire(std::unique_ptr<AnalyzerSource> analyzer, std::unique_ptr<BusSource> bus) {
    bus_.reset();
    analyzer_ = std::move(analyzer);
    bus_ = std::move(bus);
}

std::unique_ptr<AnalyzerApplication> WiredBench::connectAnalyzer() {
    return wired(analyzer_).connectAnalyzer();
}

std::unique_ptr<InstrumentBus> WiredBench::createBus() {
    return wired(bus_).createBus();
}

std::string WiredBench::describe() const {
    return wired(analyzer_).describe() + ", " + wired(bus_).describe();
}

bool WiredBench::simulated() const {
    return wired(analyzer_).simulated();
}

}  // namespace zp

#include "common/bench_wiring.h"

#include <ostream>
#include <string>

#include "instruments/wired_bench.h"
#include "sim/sim_bench.h"
#include "transport/transport_factory.h"

namespace zp::app {

namespace {

// Real generators at the resources of --bus.
class TransportBusSource : public BusSource {
  public:
    TransportBusSource(const std::string& text, IoTrace& trace)
        : resources_(parseBusResources(text)), text_(text), trace_(trace) {}

    std::unique_ptr<InstrumentBus> createBus() override {
        return makeTransportBus(resources_, &trace_);
    }
    std::string describe() const override { return "generators on " + text_; }

  private:
    BusResources resources_;
    std::string text_;
    IoTrace& trace_;
};

}  // namespace

std::unique_ptr<Bench> makeBench(const BenchOptions& options) {
    sim::SimFaults faults;
    for (const std::string& fault : options.faults) faults.add(fault);
    auto bench = std::make_unique<WiredBench>();
    IoTrace& trace = *bench->trace();
    auto analyzer = std::make_unique<sim::SimInstruments>(trace, options.model, std::move(faults));
    if (options.traceFile) trace.openFile(*options.traceFile);
    std::unique_ptr<BusSource> bus;
    if (options.bus) {
        bus = std::make_unique<TransportBusSource>(*options.bus, trace);
    } else {
        bus = analyzer->generatorBus();
    }
    bench->wire(std::move(analyzer), std::move(bus));
    return bench;
}

std::unique_ptr<Bench> makeBenchOrReport(const BenchOptions& options, Program program,
                                         std::ostream& err) {
    try {
        return makeBench(options);
    } catch (const std::exception& e) {
        err << programName(program) << ": " << e.what() << '\n';
        return nullptr;
    }
}

}  // namespace zp::app

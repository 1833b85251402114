#pragma once
// A bench put together from two sources, one for analyzer connections and one for generator
// buses, and the one I/O trace both write to, in the order things happen. The trace belongs to the
// bench, not to a source, so that the sources can be mixed (a simulated analyzer with real
// generators) and still share it.

#include <memory>
#include <string>

#include "instruments/bench.h"
#include "instruments/io_trace.h"

namespace zp {

class AnalyzerSource {
  public:
    virtual ~AnalyzerSource() = default;
    virtual std::unique_ptr<AnalyzerApplication> connectAnalyzer() = 0;
    virtual std::string describe() const = 0;  // "simulated KT622A (kt622)"
    virtual bool simulated() const = 0;
};

class BusSource {
  public:
    virtual ~BusSource() = default;
    virtual std::unique_ptr<InstrumentBus> createBus() = 0;
    virtual std::string describe() const = 0;  // "simulated generators at 11, 12"
};

class WiredBench : public Bench {
  public:
    // The sources are built on trace() first, then wired in. A bench without them throws
    // std::logic_error when used.
    void wire(std::unique_ptr<AnalyzerSource> analyzer, std::unique_ptr<BusSource> bus);

    std::unique_ptr<AnalyzerApplication> connectAnalyzer() override;
    std::unique_ptr<InstrumentBus> createBus() override;
    IoTrace* trace() override { return &trace_; }
    // "<analyzer source>, <bus source>".
    std::string describe() const override;
    bool simulated() const override;  // the analyzer source's

  private:
    IoTrace trace_;
    std::unique_ptr<AnalyzerSource> analyzer_;
    // Declared last so that it goes first: it may use the analyzer source's instruments.
    std::unique_ptr<BusSource> bus_;
};

}  // namespace zp

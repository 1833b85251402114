#pragma once
// A main window model on the simulated bench, loaded for one of its analyzer models.

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <string_view>
#include <utility>

#include "core/pulsed_module.h"
#include "fake_analyzer.h"
#include "forms/main_form.h"
#include "instruments/io_trace.h"
#include "sim/sim_bench.h"

namespace zp::test {

// Simulated models by what the window makes of them.
inline constexpr const char* kTwoPortExternal = "kt611";   // listed, no internal generators
inline constexpr const char* kTwoPortInternal = "kt622";   // internal generators, 100 MHz clock
inline constexpr const char* kTwoPortSlowClock = "kt633";  // internal generators, 60 MHz clock
inline constexpr const char* kFourPortThreeSources = "kt655";
inline constexpr const char* kUnlisted = "zx20-j55";

// The simulated bench of one model at a time, so that a window can be started again on another.
class ModelBench : public Bench {
  public:
    explicit ModelBench(std::string_view model = kTwoPortExternal, sim::SimFaults faults = {}) {
        use(model, std::move(faults));
    }
    void use(std::string_view model, sim::SimFaults faults = {}) {
        sim_ = std::make_unique<sim::SimBench>(model, std::move(faults));
    }
    sim::SimBench& sim() { return *sim_; }
    std::vector<std::string> lines() { return sim_->trace()->lines(); }

    std::unique_ptr<AnalyzerApplication> connectAnalyzer() override {
        return sim_->connectAnalyzer();
    }
    std::unique_ptr<InstrumentBus> createBus() override { return sim_->createBus(); }
    IoTrace* trace() override { return sim_->trace(); }
    std::string describe() const override { return sim_->describe(); }
    bool simulated() const override { return sim_->simulated(); }

  private:
    std::unique_ptr<sim::SimBench> sim_;
};

class FormTest : public ::testing::Test {
  protected:
    PulsedModule state;
    ModelBench bench;
    ScriptedInteraction ui;
    SolverScript solver;
    MainForm form{state, bench, ui, recordingFactory(solver)};

    void load(std::string_view model) {
        bench.use(model);
        form.Form_Load();
    }
    void SetUp() override { form.Form_Load(); }
    // Types a value into a field as a person would; the entry must be accepted.
    static void type(EntryField& field, double v, ChangeSource how = ChangeSource::Typed) {
        ASSERT_EQ(field.enter(v, how), std::nullopt) << field.name() << " refused " << v;
    }
    void typePrf(double v) { type(form.VexoEdit_prf, v); }
};

}  // namespace zp::test

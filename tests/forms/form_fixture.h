#pragma once
// A main window model on a fake analyzer, loaded for one of the test bench models.

#include <gtest/gtest.h>

#include "core/pulsed_module.h"
#include "fake_analyzer.h"
#include "forms/main_form.h"

namespace zp::test {

// Listed two-port model with external generators (no internal pulse generator option).
inline FakeAnalyzerSetup twoPortExternal() {
    FakeAnalyzerSetup s;
    s.modelText = "KT622A";
    s.optionText = "M81";
    return s;
}

// Listed two-port model with the internal pulse generators in use.
inline FakeAnalyzerSetup twoPortInternal() {
    FakeAnalyzerSetup s;
    s.modelText = "KT622A";
    s.optionText = "K71 M81";
    return s;
}

inline FakeAnalyzerSetup fourPortThreeSources() {
    FakeAnalyzerSetup s;
    s.modelText = "KT655A";
    s.optionText = "K71 M83 M84";
    s.ports = 4;
    s.sources = 3;
    s.hardwareValue = "5.0";
    return s;
}

inline FakeAnalyzerSetup unlisted() {
    FakeAnalyzerSetup s;
    s.modelText = "ZX20";
    s.optionText = "J55";
    return s;
}

class FormTest : public ::testing::Test {
  protected:
    PulsedModule state;
    FakeBench bench;
    ScriptedInteraction ui;
    SolverScript solver;
    MainForm form{state, bench, ui, recordingFactory(solver)};

    void load(const FakeAnalyzerSetup& setup) {
        bench.setup = setup;
        form.Form_Load();
    }
    void SetUp() override { load(twoPortExternal()); }
};

}  // namespace zp::test

#pragma once
// A main window model on a fake analyzer, loaded for one of the test bench models.

#include <gtest/gtest.h>

#include <string>

#include "core/pulsed_module.h"
#include "fake_analyzer.h"
#include "forms/main_form.h"

namespace zp::test {

inline FakeAnalyzerSetup analyzer(std::string model, std::string options, int ports = 2,
                                  int sources = 1, std::string hardwareValue = "5") {
    FakeAnalyzerSetup s;
    s.modelText = std::move(model);
    s.optionText = std::move(options);
    s.ports = ports;
    s.sources = sources;
    s.hardwareValue = std::move(hardwareValue);
    return s;
}

// Listed two-port model with external generators (no internal pulse generator option).
inline FakeAnalyzerSetup twoPortExternal() {
    return analyzer("KT622A", "M81");
}
// Listed two-port model with the internal pulse generators in use.
inline FakeAnalyzerSetup twoPortInternal() {
    return analyzer("KT622A", "K71 M81");
}
inline FakeAnalyzerSetup fourPortThreeSources() {
    return analyzer("KT655A", "K71 M83 M84", 4, 3, "5.0");
}
inline FakeAnalyzerSetup unlisted() {
    return analyzer("ZX20", "J55");
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
    // Types a value into a field as a person would; the entry must be accepted.
    static void type(EntryField& field, double v, ChangeSource how = ChangeSource::Typed) {
        ASSERT_EQ(field.enter(v, how), std::nullopt) << field.name() << " refused " << v;
    }
    void typePrf(double v) { type(form.VexoEdit_prf, v); }
};

}  // namespace zp::test

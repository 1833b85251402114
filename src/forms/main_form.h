#pragma once
// The main window "Veltrix Zentra Pulse Application" as a presentation model: every control's
// state, the start-up sequence, the entry rules, the timing rules and Calculate. Its table of
// controls (controls()) is what views bind to and what the command line drives; it never touches
// a widget.

#include <cstdint>
#include <deque>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "core/entry_field.h"
#include "core/pulsed_module.h"
#include "core/timing_solver.h"
#include "forms/control_registry.h"
#include "forms/controls.h"
#include "forms/interaction.h"
#include "instruments/bench.h"

namespace zp {

// What the status line says: the analyzer, whether it is simulated, whether to Calculate.
struct AnalyzerStatus {
    std::string model;
    std::string options;
    bool simulated = false;
    bool needsCalculation = true;
    // e.g. "KT622A K71 M81 (simulated) - Calculate needed"
    std::string text() const;
};

class MainForm : public FormModel {
  public:
    using SolverFactory = std::function<std::unique_ptr<TimingSolver>()>;

    MainForm(PulsedModule& state, Bench& bench, Interaction& ui,
             SolverFactory solverFactory = makeDefaultSolver);
    MainForm(const MainForm&) = delete;
    MainForm& operator=(const MainForm&) = delete;

    // Start-up steps 2 to 12 on the bench's analyzer. Throws InstrumentError when the analyzer
    // cannot be reached or answers with an error; the state is then left as it was.
    void Form_Load();

    // ---- Controls, named as in the window. Rows are indexed 0 .. NumOutputs - 1; they sit in
    // deques so that a view's reference to a row stays good while rows are added.
    Control f_PulsedZentra;  // the window itself: caption and height
    Control frm_gates, lbl_width, lbl_delay;
    std::deque<Control> lbl_gate;
    std::deque<EntryField> VexoEdit_width;
    std::deque<EntryField> VexoEdit_delay;
    Control frm_PulsedParams, lbl_prf, lbl_pri, lbl_ifbw;
    EntryField VexoEdit_prf;
    EntryField VexoEdit_pri;
    EntryField VexoEdit_IFBW;
    CheckBox chk_FixedPRF;
    Control frm_DutyCycle, lbl_DutyCycle;
    Control frm_pulsed, b_calculate, b_apply;
    CheckBox chk_pulsed;
    Control b_recall, b_save, b_PulseProfile, b_min, b_close;

    MenuEntry m_Config, m_ConfigPG, m_ConfigRx, m_ConverterMeas, m_NoPG, m_NoSWGating;
    MenuEntry m_View, m_PulseProfile, m_PulseConfig;
    MenuEntry m_help, m_contents, m_about;

    // ---- Handlers (the table runs them; views refresh once after each).
    void b_calculate_Click();
    void chk_FixedPRF_Click();
    void chk_pulsed_Click();
    void m_ConverterMeas_Click();
    void m_NoPG_Click();
    void m_NoSWGating_Click();
    // Help at topic 1114: the analyzer's help file, or our own manual when it names none.
    void m_contents_Click();
    void Invalidate();

    AnalyzerStatus status() const;

    // ---- Timing rules.
    double FMaxPulseWidth() const;
    double FMaxGateWidth() const;
    double FMinPulseWidth() const;
    double FHighestGateDelay() const;
    bool FPulseWidthOK(double prf);
    std::int16_t FAutoGain() const;
    void SUpdateDutyCycle();

    // ---- Entry rules (normally run by the fields' value-changed notifications).
    // prfRule() is the program's own run (start-up, recall): it never steps the PRF up. The PRF
    // field's notification runs the same rule with the step-up when the entry came from a step.
    void prfRule();
    void priRule();
    void ifbwRule();
    void widthRule(int row);
    void delayRule(int row);
    // The significant-digit normalisation of a row's width or delay field; the one-argument form
    // steps up only when the field's last entry was a step.
    static void SNormalizeValue(EntryField& field);
    static void SNormalizeValue(EntryField& field, bool fromStep);

    // Rows that share a generator output with `row` (the row itself excluded).
    std::vector<int> sharedRows(int row) const;

    int rowCount() const { return static_cast<int>(VexoEdit_width.size()); }
    PulsedModule& state() { return state_; }
    const PulsedModule& state() const { return state_; }
    Bench& bench() { return bench_; }

    static constexpr int kHelpTopic = 1114;

  private:
    // The designed window: every control in its first state, declared in the table.
    void declareControls();
    // Rows 0 .. rows - 1 in their designed state, changed in place; rows beyond go.
    void setRowCount(int rows);
    void layOutRows(const PulsedModule& filled);
    void runPrfRule(bool fromStep);
    void pullBackDelay(EntryField& delay, double prf);
    // The tail of the width and delay rules: the changed row's value goes to the rows sharing
    // its output, the profile is disabled and the setup invalidated.
    void shareRowChange(std::deque<EntryField>& column, int row);
    void calculateSolution(double desiredPrf);
    void showResults(double desiredPrf);
    // Rows the timing rules look at: NumOutputs, never more than the window has.
    int ruleRows() const;

    PulsedModule& state_;
    Bench& bench_;
    SolverFactory solverFactory_;
    AnalyzerIdentity identity_;
};

}  // namespace zp

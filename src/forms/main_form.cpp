// The main window's controls, start-up, measurement-mode menus and help.

#include "forms/main_form.h"

#include <algorithm>
#include <stdexcept>
#include <utility>

#include "core/timing_limits.h"
#include "forms/main_form_layout.h"
#include "instruments/analyzer_identity_query.h"
#include "instruments/help_file_query.h"

namespace zp {

namespace {

constexpr int kMaxRows = 6;
constexpr const char* kGateCaptions[] = {
    "Source Modulation :", "A IF Gate :", "B IF Gate :", "R1 IF Gate :", "R2 IF Gate :"};
constexpr const char* kFourPortCaptions[] = {
    "A IF Gate :", "B IF Gate :", "C IF Gate :", "D IF Gate :"};
constexpr const char* kSixthRowCaption = "R IF Gate :";

std::string rowName(const char* base, int row) {
    return ControlRegistry::rowName(base, row);
}

Geometry shiftedDown(Geometry g, int by) {
    g.top += by;
    return g;
}

// Rows are changed in place, never rebuilt: views hold references to them.
template <typename T>
void putRow(std::deque<T>& rows, int row, T value) {
    const auto i = static_cast<std::size_t>(row);
    if (i < rows.size()) {
        rows[i] = std::move(value);
    } else {
        rows.push_back(std::move(value));
    }
}

}  // namespace

std::string AnalyzerStatus::text() const {
    std::string text = model.empty() ? std::string("No analyzer") : model;
    if (!options.empty()) text += " " + options;
    if (simulated) text += " (simulated)";
    return text + (needsCalculation ? " - Calculate needed" : " - Calculated");
}

MainForm::MainForm(PulsedModule& state, Bench& bench, Interaction& ui, SolverFactory solverFactory)
    : FormModel(ui), state_(state), bench_(bench), solverFactory_(std::move(solverFactory)) {
    declareControls();
}

// One line per control, in the order the window and its JSON show them.
void MainForm::declareControls() {
    using namespace layout;
    ControlRegistry& t = controls_;
    const ControlRegistry::Handler notYet;  // says "... is not available in this version yet."
    const MenuStyle checkMark{.checkable = true};
    t.clear();
    t.window(f_PulsedZentra, {"f_PulsedZentra", kAppTitle, {0, 0, kWindowWidth, kWindowHeight}});

    const std::string params = "frm_PulsedParams";
    t.frame(frm_PulsedParams, {params, "Desired PRF and IFBW", kPulsedParamsFrame});
    t.label(lbl_prf, {"lbl_prf", "Pulse Repetition Frequency :", kPrfLabel}, params);
    t.entry(VexoEdit_prf,
            {"VexoEdit_prf", 5000.0, kPrfRangeHz.low, kPrfRangeHz.high, 3, units::kHertz},
            kPrfField, params, [this] { runPrfRule(VexoEdit_prf.stepProperty() != 1); });
    t.label(lbl_pri, {"lbl_pri", "Pulse Repetition Interval :", kPriLabel}, params);
    t.entry(VexoEdit_pri, {"VexoEdit_pri", 0.0002, 3.4e-9, 1e18, 3, units::kSeconds}, kPriField,
            params, [this] { priRule(); });
    t.label(lbl_ifbw, {"lbl_ifbw", "Receiver IF Bandwidth :", kIfbwLabel}, params);
    t.entry(VexoEdit_IFBW,
            {"VexoEdit_IFBW", 500.0, kIfbwRangeHz.low, kIfbwRangeHz.high, 0, units::kHertz},
            kIfbwField, params, [this] { ifbwRule(); });
    t.checkBox(chk_FixedPRF, {"chk_FixedPRF", "Fixed PRF", kFixedPrfBox}, kChecked, params,
               [this] { chk_FixedPRF_Click(); });

    const std::string gates = "frm_gates";
    t.frame(frm_gates, {gates, "Modulation/Gates", kGatesFrame});
    t.label(lbl_width, {"lbl_width", "Width", kWidthHeading}, gates);
    t.label(lbl_delay, {"lbl_delay", "Delay", kDelayHeading}, gates);
    setRowCount(kDesignedRows);
    t.labelRows("lbl_gate", lbl_gate, gates);
    t.entryRows("VexoEdit_width", VexoEdit_width, gates, [this](int row) { widthRule(row); });
    t.entryRows("VexoEdit_delay", VexoEdit_delay, gates, [this](int row) { delayRule(row); });

    t.frame(frm_DutyCycle, {"frm_DutyCycle", "Duty Cycle", kDutyCycleFrame});
    t.label(lbl_DutyCycle, {"lbl_DutyCycle", "", kDutyCycleLabel}, "frm_DutyCycle");
    t.frame(frm_pulsed, {"frm_pulsed", "", kPulsedFrame});
    t.button(b_calculate, {"b_calculate", "Calculate", kCalculateButton}, "frm_pulsed",
             [this] { b_calculate_Click(); });
    t.button(b_apply, {"b_apply", "Apply", kApplyButton}, "frm_pulsed",
             [this] { b_Apply_Click(); });
    t.checkBox(chk_pulsed, {"chk_pulsed", "Pulsed Mode On", kPulsedBox}, kChecked, "frm_pulsed",
               [this] { chk_pulsed_Click(); });

    const auto slot = [](int i) {
        return Geometry{kButtonLeft[i], kButtonTop, kButtonWidth, kButtonHeight};
    };
    // Minimize and Close act on the window a view shows; the model has nothing to do for them.
    const ControlRegistry::Handler byView = [] {};
    t.button(b_PulseProfile, {"b_PulseProfile", "Pulse Profile", slot(0)}, "", notYet);
    t.button(b_recall, {"b_recall", "Recall", slot(1)}, "", notYet);
    t.button(b_save, {"b_save", "Save", slot(2)}, "", notYet);
    t.button(b_min, {"b_min", "Minimize", slot(3)}, "", byView);
    t.button(b_close, {"b_close", "Close", slot(4)}, "", byView);

    t.menu(m_Config, {"m_Config", "&Configure"});
    t.menuEntry(m_ConfigPG, {"m_ConfigPG", "&Pulse Generators/Modulators..."}, "m_Config", notYet);
    t.menuEntry(m_ConfigRx, {"m_ConfigRx", "&Receiver Gains..."}, "m_Config", notYet);
    t.menuEntry(m_ConverterMeas, {"m_ConverterMeas", "&Converter Measurements"}, "m_Config",
                [this] { m_ConverterMeas_Click(); }, {.checkable = true, .separatorBefore = true});
    t.menuEntry(
        m_NoPG, {"m_NoPG", "No Pulse &Generators"}, "m_Config", [this] { m_NoPG_Click(); },
        checkMark);
    t.menuEntry(
        m_NoSWGating, {"m_NoSWGating", "No &SW Gating"}, "m_Config",
        [this] { m_NoSWGating_Click(); }, checkMark);
    t.menu(m_View, {"m_View", "&View"});
    t.menuEntry(m_PulseProfile, {"m_PulseProfile", "&Pulse Profile..."}, "m_View", notYet);
    t.menuEntry(m_PulseConfig, {"m_PulseConfig", "Pulse &Configuration..."}, "m_View", notYet);
    t.menu(m_help, {"m_help", "&Help"});
    t.menuEntry(m_contents, {"m_contents", "&Contents..."}, "m_help",
                [this] { m_contents_Click(); });
    t.menuEntry(m_about, {"m_about", "&About..."}, "m_help", notYet);
}

void MainForm::setRowCount(int rows) {
    for (int row = 0; row < rows; ++row) {
        Control label;
        label.name = rowName("lbl_gate", row);
        label.caption = row < layout::kDesignedRows ? kGateCaptions[row] : kSixthRowCaption;
        label.geometry = layout::gateLabel(row);
        putRow(lbl_gate, row, std::move(label));
        putRow(VexoEdit_width, row,
               EntryField(rowName("VexoEdit_width", row), 1e-6, 3.4e-9, 1e18, 3, units::kSeconds));
        putRow(VexoEdit_delay, row,
               EntryField(rowName("VexoEdit_delay", row), 0.0, 0.0, 1.0, 3, units::kSeconds));
        controls_.placeField(VexoEdit_width[row].name(), layout::widthField(row));
        controls_.placeField(VexoEdit_delay[row].name(), layout::delayField(row));
    }
    const auto keep = static_cast<std::size_t>(rows);
    while (lbl_gate.size() > keep) lbl_gate.pop_back();
    while (VexoEdit_width.size() > keep) VexoEdit_width.pop_back();
    while (VexoEdit_delay.size() > keep) VexoEdit_delay.pop_back();
}

int MainForm::ruleRows() const {
    return std::clamp<int>(state_.NumOutputs, 0, rowCount());
}

AnalyzerStatus MainForm::status() const {
    return {identity_.modelText, identity_.optionText, bench_.simulated(),
            isTrue(state_.NeedsCalculation)};
}

// ---- Start-up.

void MainForm::Form_Load() {
    // Everything the analyzer can fail on happens before the state or a control is touched.
    PulsedModule filled = state_;
    AnalyzerIdentity identity = readAnalyzerIdentity(bench_);
    fillAtStartup(filled, identity);
    state_ = std::move(filled);
    identity_ = std::move(identity);

    declareControls();
    layOutRows(state_);
    chk_FixedPRF.value = isTrue(state_.FixedPRF) ? kChecked : kUnchecked;

    if (!state_.hasKnownLayout()) m_NoSWGating.enabled = false;

    state_.NeedsCalculation = kTrue;
    b_apply.enabled = false;
    m_PulseProfile.enabled = false;
    b_PulseProfile.enabled = false;

    for (int row = 0; row < ruleRows(); ++row) {
        SNormalizeValue(VexoEdit_width[row], false);
        SNormalizeValue(VexoEdit_delay[row], false);
    }
    runPrfRule(false);

    m_PulseConfig.visible = state_.hasKnownLayout();
    m_PulseConfig.enabled = state_.hasKnownLayout();
    notifyChanged();
}

void MainForm::layOutRows(const PulsedModule& filled) {
    if (!filled.isFourPort()) return;  // the designed five rows stay as they are
    // Growing puts every row into its designed state, so the captions come after.
    if (rowCount() < filled.NumOutputs) {
        setRowCount(std::min<int>(filled.NumOutputs, kMaxRows));
        controls_.connectEntries();
    }
    for (int row = 1; row <= 4; ++row) lbl_gate[row].caption = kFourPortCaptions[row - 1];

    const int grow = layout::kRowPitch * (rowCount() - layout::kDesignedRows);
    frm_gates.geometry.height = layout::kGatesFrame.height + grow;
    frm_DutyCycle.geometry = shiftedDown(layout::kDutyCycleFrame, grow);
    frm_pulsed.geometry = shiftedDown(layout::kPulsedFrame, grow);
    for (Control* b : {&b_PulseProfile, &b_min, &b_save, &b_recall, &b_close})
        b->geometry.top = layout::kButtonTop + grow;
    f_PulsedZentra.geometry.height = layout::kWindowHeight + grow;
}

// ---- Check boxes and measurement-mode menus.

void MainForm::chk_FixedPRF_Click() {
    state_.FixedPRF = toBool16(chk_FixedPRF.checked());
}

// Apply reads the box when it runs; nothing else depends on it.
void MainForm::chk_pulsed_Click() {}

void MainForm::Invalidate() {
    state_.NeedsCalculation = kTrue;
    b_apply.enabled = false;
    m_PulseProfile.enabled = false;
    b_PulseProfile.enabled = false;
}

void MainForm::m_NoSWGating_Click() {
    m_NoSWGating.checked = !m_NoSWGating.checked;
    Invalidate();
}

void MainForm::m_ConverterMeas_Click() {
    m_ConverterMeas.checked = !m_ConverterMeas.checked;
    state_.NeedsCalculation = kTrue;
    if (b_apply.enabled) b_apply.enabled = false;
}

void MainForm::m_NoPG_Click() {
    m_NoPG.checked = !m_NoPG.checked;
    if (m_NoPG.checked) {
        b_PulseProfile.enabled = false;
        m_PulseProfile.enabled = false;
        m_ConfigPG.enabled = false;
        frm_gates.enabled = false;
    } else {
        m_ConfigPG.enabled = true;
        frm_gates.enabled = true;
    }
    state_.NeedsCalculation = kTrue;
}

// ---- Help.

void MainForm::m_contents_Click() {
    HelpFileQuery help = queryHelpFile(bench_);
    ui_.showHelp({std::move(help.file), kHelpTopic, std::move(help.error)});
}

}  // namespace zp

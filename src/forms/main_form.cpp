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

template <typename C = Control>
C makeControl(std::string name, std::string caption, Geometry g = {}) {
    C c;
    c.name = std::move(name);
    c.caption = std::move(caption);
    c.geometry = g;
    return c;
}

CheckBox makeCheckBox(std::string name, std::string caption, Geometry g, Check16 value) {
    CheckBox c = makeControl<CheckBox>(std::move(name), std::move(caption), g);
    c.value = value;
    return c;
}

std::string rowName(const char* base, int row) {
    return std::string(base) + "(" + std::to_string(row) + ")";
}

Geometry shiftedDown(Geometry g, int by) {
    g.top += by;
    return g;
}

}  // namespace

MainForm::MainForm(PulsedModule& state, Bench& bench, Interaction& ui, SolverFactory solverFactory)
    : state_(state), bench_(bench), ui_(ui), solverFactory_(std::move(solverFactory)) {
    buildControls();
}

void MainForm::buildControls() {
    using namespace layout;
    f_PulsedZentra = makeControl("f_PulsedZentra", kAppTitle, {0, 0, kWindowWidth, kWindowHeight});

    frm_PulsedParams = makeControl("frm_PulsedParams", "Desired PRF and IFBW", kPulsedParamsFrame);
    lbl_prf = makeControl("lbl_prf", "Pulse Repetition Frequency :", kPrfLabel);
    lbl_pri = makeControl("lbl_pri", "Pulse Repetition Interval :", kPriLabel);
    lbl_ifbw = makeControl("lbl_ifbw", "Receiver IF Bandwidth :", kIfbwLabel);
    VexoEdit_prf =
        EntryField("VexoEdit_prf", 5000.0, kPrfRangeHz.low, kPrfRangeHz.high, 3, units::kHertz);
    VexoEdit_pri = EntryField("VexoEdit_pri", 0.0002, 3.4e-9, 1e18, 3, units::kSeconds);
    VexoEdit_IFBW =
        EntryField("VexoEdit_IFBW", 500.0, kIfbwRangeHz.low, kIfbwRangeHz.high, 0, units::kHertz);
    chk_FixedPRF = makeCheckBox("chk_FixedPRF", "Fixed PRF", kFixedPrfBox, kChecked);

    frm_gates = makeControl("frm_gates", "Modulation/Gates", kGatesFrame);
    lbl_width = makeControl("lbl_width", "Width", kWidthHeading);
    lbl_delay = makeControl("lbl_delay", "Delay", kDelayHeading);
    lbl_gate.clear();
    VexoEdit_width.clear();
    VexoEdit_delay.clear();
    // Room for the sixth row up front, so that growing never moves a field a view is bound to.
    lbl_gate.reserve(kMaxRows);
    VexoEdit_width.reserve(kMaxRows);
    VexoEdit_delay.reserve(kMaxRows);
    fieldGeometry.clear();
    for (int row = 0; row < kDesignedRows; ++row) addRow(row);

    frm_DutyCycle = makeControl("frm_DutyCycle", "Duty Cycle", kDutyCycleFrame);
    lbl_DutyCycle = makeControl("lbl_DutyCycle", "", kDutyCycleLabel);
    frm_pulsed = makeControl("frm_pulsed", "", kPulsedFrame);
    b_calculate = makeControl("b_calculate", "Calculate", kCalculateButton);
    b_apply = makeControl("b_apply", "Apply", kApplyButton);
    chk_pulsed = makeCheckBox("chk_pulsed", "Pulsed Mode On", kPulsedBox, kChecked);

    const auto button = [](const char* name, const char* caption, int slot) {
        return makeControl(name, caption,
                           {kButtonLeft[slot], kButtonTop, kButtonWidth, kButtonHeight});
    };
    b_PulseProfile = button("b_PulseProfile", "Pulse Profile", 0);
    b_recall = button("b_recall", "Recall", 1);
    b_save = button("b_save", "Save", 2);
    b_min = button("b_min", "Minimize", 3);
    b_close = button("b_close", "Close", 4);

    struct MenuRow {
        MenuEntry MainForm::*entry;
        const char* name;
        const char* caption;
    };
    static constexpr MenuRow kMenus[] = {
        {&MainForm::m_Config, "m_Config", "&Configure"},
        {&MainForm::m_ConfigPG, "m_ConfigPG", "&Pulse Generators/Modulators..."},
        {&MainForm::m_ConfigRx, "m_ConfigRx", "&Receiver Gains..."},
        {&MainForm::m_ConverterMeas, "m_ConverterMeas", "&Converter Measurements"},
        {&MainForm::m_NoPG, "m_NoPG", "No Pulse &Generators"},
        {&MainForm::m_NoSWGating, "m_NoSWGating", "No &SW Gating"},
        {&MainForm::m_View, "m_View", "&View"},
        {&MainForm::m_PulseProfile, "m_PulseProfile", "&Pulse Profile..."},
        {&MainForm::m_PulseConfig, "m_PulseConfig", "Pulse &Configuration..."},
        {&MainForm::m_help, "m_help", "&Help"},
        {&MainForm::m_contents, "m_contents", "&Contents..."},
        {&MainForm::m_about, "m_about", "&About..."},
    };
    for (const MenuRow& m : kMenus) this->*m.entry = makeControl<MenuEntry>(m.name, m.caption);

    fieldGeometry[VexoEdit_prf.name()] = kPrfField;
    fieldGeometry[VexoEdit_pri.name()] = kPriField;
    fieldGeometry[VexoEdit_IFBW.name()] = kIfbwField;
    bindFields();
}

void MainForm::addRow(int row) {
    const std::string caption =
        row < layout::kDesignedRows ? kGateCaptions[row] : std::string(kSixthRowCaption);
    lbl_gate.push_back(makeControl(rowName("lbl_gate", row), caption, layout::gateLabel(row)));
    VexoEdit_width.emplace_back(rowName("VexoEdit_width", row), 1e-6, 3.4e-9, 1e18, 3,
                                units::kSeconds);
    VexoEdit_delay.emplace_back(rowName("VexoEdit_delay", row), 0.0, 0.0, 1.0, 3, units::kSeconds);
    fieldGeometry[VexoEdit_width.back().name()] = layout::widthField(row);
    fieldGeometry[VexoEdit_delay.back().name()] = layout::delayField(row);
}

void MainForm::bindFields() {
    VexoEdit_prf.onValueChanged([this] {
        runPrfRule(VexoEdit_prf.stepProperty() != 1);
        notifyChanged();
    });
    VexoEdit_pri.onValueChanged([this] {
        priRule();
        notifyChanged();
    });
    VexoEdit_IFBW.onValueChanged([this] {
        ifbwRule();
        notifyChanged();
    });
    for (int row = 0; row < rowCount(); ++row) {
        VexoEdit_width[row].onValueChanged([this, row] {
            widthRule(row);
            notifyChanged();
        });
        VexoEdit_delay[row].onValueChanged([this, row] {
            delayRule(row);
            notifyChanged();
        });
    }
}

void MainForm::notifyChanged() {
    for (const auto& listener : listeners_) listener();
}

int MainForm::ruleRows() const {
    return std::clamp<int>(state_.NumOutputs, 0, rowCount());
}

// ---- Start-up.

void MainForm::Form_Load() {
    // Everything the analyzer can fail on happens before the state or a control is touched.
    PulsedModule filled = state_;
    fillAtStartup(filled, readAnalyzerIdentity(bench_));
    state_ = std::move(filled);

    buildControls();
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
    for (int row = 1; row <= 4; ++row) lbl_gate[row].caption = kFourPortCaptions[row - 1];
    while (rowCount() < filled.NumOutputs && rowCount() < kMaxRows) addRow(rowCount());
    bindFields();

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
    notifyChanged();
}

void MainForm::setFixedPRF(bool checked) {
    chk_FixedPRF.value = checked ? kChecked : kUnchecked;
    chk_FixedPRF_Click();
}

// Apply reads the box when it runs; nothing else depends on it.
void MainForm::chk_pulsed_Click() {
    notifyChanged();
}

void MainForm::Invalidate() {
    state_.NeedsCalculation = kTrue;
    b_apply.enabled = false;
    m_PulseProfile.enabled = false;
    b_PulseProfile.enabled = false;
}

void MainForm::m_NoSWGating_Click() {
    m_NoSWGating.checked = !m_NoSWGating.checked;
    Invalidate();
    notifyChanged();
}

void MainForm::m_ConverterMeas_Click() {
    m_ConverterMeas.checked = !m_ConverterMeas.checked;
    state_.NeedsCalculation = kTrue;
    if (b_apply.enabled) b_apply.enabled = false;
    notifyChanged();
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
    notifyChanged();
}

// ---- Help.

void MainForm::m_contents_Click() {
    const HelpFileQuery help = queryHelpFile(bench_);
    if (help.error) {
        ui_.message(*help.error);
        return;
    }
    ui_.showHelp(help.file, kHelpTopic);
}

}  // namespace zp

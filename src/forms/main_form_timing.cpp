// The timing rules of the main window, the duty-cycle summary and Calculate.

#include <cmath>
#include <stdexcept>

#include "core/numeric.h"
#include "forms/main_form.h"

namespace zp {

namespace {

constexpr const char* kWidthLimitMessage =
    "The pulse width must be less than 90% of the pulse period (1/PRF)";
constexpr const char* kNoSolutionMessage =
    "No solution found.\nFor more information, see \"Pulsed Application\" in Veltrix Zentra "
    "online help.";
constexpr double kConverterDelay = 6.2e-6;
constexpr double kClock100MHz = 100000000.0;
constexpr double kClock60MHz = 60000000.0;

}  // namespace

// ---- Timing rules. The first row of each scan counts even when its field is disabled.

double MainForm::FMaxPulseWidth() const {
    double widest = VexoEdit_width.at(0).value();
    for (int row = 1; row < ruleRows(); ++row) {
        const EntryField& f = VexoEdit_width[row];
        if (f.enabled() && f.value() > widest) widest = f.value();
    }
    return widest;
}

double MainForm::FMaxGateWidth() const {
    double widest = VexoEdit_width.at(1).value();
    for (int row = 2; row < ruleRows(); ++row) {
        const EntryField& f = VexoEdit_width[row];
        if (f.enabled() && f.value() > widest) widest = f.value();
    }
    return widest;
}

double MainForm::FMinPulseWidth() const {
    double narrowest = VexoEdit_width.at(0).value();
    for (int row = 1; row < ruleRows(); ++row) {
        const EntryField& f = VexoEdit_width[row];
        if (f.enabled() && f.value() < narrowest) narrowest = f.value();
    }
    return narrowest;
}

double MainForm::FHighestGateDelay() const {
    double highest = VexoEdit_delay.at(1).value();
    for (int row = 2; row < ruleRows(); ++row) {
        const EntryField& f = VexoEdit_delay[row];
        if (f.enabled() && f.value() > highest) highest = f.value();
    }
    return highest;
}

bool MainForm::FPulseWidthOK(double prf) {
    if (FMaxPulseWidth() < 0.9 * (1.0 / prf)) return true;
    ui_.message(kWidthLimitMessage);
    return false;
}

std::int16_t MainForm::FAutoGain() const {
    const double narrowest = FMinPulseWidth();
    if (state_.PRF <= 50000.0 && narrowest < 1e-6) return 1;
    return narrowest < 1e-7 ? 1 : 0;
}

void MainForm::SUpdateDutyCycle() {
    const double prf = VexoEdit_prf.value();
    std::string text;
    for (int row = 0; row < ruleRows(); ++row) {
        const EntryField& width = VexoEdit_width[row];
        if (!width.enabled()) continue;
        text += lbl_gate[row].caption;
        text += generalText(roundHalfEven(width.value() * 100.0 * prf, 4));
        text += "%\n";
    }
    lbl_DutyCycle.caption = text;
}

// ---- Calculate.

void MainForm::b_calculate_Click() {
    {
        BusyPointer busy(ui_);
        const double desired = VexoEdit_prf.value();
        if (FPulseWidthOK(desired) && isTrue(state_.NeedsCalculation)) calculateSolution(desired);
        if (state_.PRF != 0.0) SUpdateDutyCycle();
    }
    notifyChanged();
}

void MainForm::calculateSolution(double desiredPrf) {
    // The solver writes into the state as it goes; a failure puts every field back.
    const PulsedModule saved = state_;
    std::unique_ptr<TimingSolver> solver;
    const auto useSolver = [&]() -> TimingSolver& {
        if (!solver && solverFactory_) solver = solverFactory_();
        if (!solver) throw std::runtime_error("The timing solver is not available.");
        return *solver;
    };
    PulsedModule& s = state_;
    try {
        s.PRF = VexoEdit_prf.value();
        if (isTrue(s.IsListedModel) && s.UseInternalPG != kUnchecked) {
            s.IFBW = VexoEdit_IFBW.value();
            s.PulseClockHz = isTrue(s.HasClock100MHz) ? kClock100MHz : kClock60MHz;
            if (m_NoSWGating.checked) {
                useSolver().SolveInternal(s.PRF, s.IFBW, s.IntSolveTime2, s.IntSolveTime1,
                                          s.PulseClockHz, s.IntSolveList1, s.IntSolveList2,
                                          s.IntSolveList3, s.FixedPRF);
            } else {
                const double highestDelay = FHighestGateDelay();
                const double widestWidth = FMaxGateWidth();
                useSolver().SolveInternalGated(
                    s.PRF, s.IFBW, s.IntSolveTime2, s.IntSolveTime1, s.PulseClockHz,
                    s.IntSolveList1, s.IntSolveList2, s.IntSolveList3, s.FixedPRF, highestDelay,
                    widestWidth, s.GatedSolveTime1, s.GatedSolveTime2, s.GatedSolveTicks);
            }
            s.IFBWHz = toInt32(s.IFBW);
        } else {
            const auto decade = static_cast<std::int16_t>(std::floor(FLog10(s.PRF)) - 3);
            s.IFBWHz = toInt32(VexoEdit_IFBW.value());
            s.ConverterDelay = m_ConverterMeas.checked ? kConverterDelay : 0.0;
            useSolver().SolveExternal(s.PRF, s.SolvedIFCount, s.IFBWHz, s.SolvedFreqOffset,
                                      s.ConverterDelay, decade, s.FixedPRF, kTrue);
        }
        if (!std::isfinite(s.PRF) || s.PRF < 0.0)
            throw std::runtime_error("The timing solver gave an invalid PRF (" +
                                     generalText(s.PRF) + " Hz).");
    } catch (const std::exception& e) {
        state_ = saved;
        ui_.message(e.what());
        return;
    } catch (...) {
        state_ = saved;
        ui_.message("The timing solver failed.");
        return;
    }
    if (s.PRF == 0.0)
        ui_.message(kNoSolutionMessage);
    else
        showResults(desiredPrf);
}

void MainForm::showResults(double desiredPrf) {
    VexoEdit_prf.setValue(state_.PRF);
    VexoEdit_IFBW.setValue(roundHalfEven(static_cast<double>(state_.IFBWHz)));
    // Keep the interval the reciprocal of the PRF the solver moved to.
    if (state_.PRF != desiredPrf) VexoEdit_pri.setValue(1.0 / VexoEdit_prf.value());
    state_.NeedsCalculation = kFalse;
    b_apply.enabled = true;
}

}  // namespace zp

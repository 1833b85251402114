// The timing rules of the main window, the duty-cycle summary and Calculate.

#include <cmath>
#include <functional>
#include <stdexcept>
#include <utility>

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

// The value of rows [first, end) that `better` prefers. The first row counts even when its field
// is disabled; later rows only when enabled.
template <typename Better>
double extremeOfRows(const std::deque<EntryField>& rows, int first, int end, Better better) {
    double best = rows.at(first).value();
    for (int row = first + 1; row < end; ++row) {
        const EntryField& f = rows[row];
        if (f.enabled() && better(f.value(), best)) best = f.value();
    }
    return best;
}

}  // namespace

// ---- Timing rules.

double MainForm::FMaxPulseWidth() const {
    return extremeOfRows(VexoEdit_width, 0, ruleRows(), std::greater<>());
}

double MainForm::FMaxGateWidth() const {
    return extremeOfRows(VexoEdit_width, 1, ruleRows(), std::greater<>());
}

double MainForm::FMinPulseWidth() const {
    return extremeOfRows(VexoEdit_width, 0, ruleRows(), std::less<>());
}

double MainForm::FHighestGateDelay() const {
    return extremeOfRows(VexoEdit_delay, 1, ruleRows(), std::greater<>());
}

bool MainForm::FPulseWidthOK(double prf) {
    if (FMaxPulseWidth() < 0.9 * (1.0 / prf)) return true;
    ui_.message(kWidthLimitMessage, MessageKind::Warning);
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
    BusyPointer busy(ui_);
    const double desired = VexoEdit_prf.value();
    if (FPulseWidthOK(desired) && isTrue(state_.NeedsCalculation)) calculateSolution(desired);
    if (state_.PRF != 0.0) SUpdateDutyCycle();
}

void MainForm::calculateSolution(double desiredPrf) {
    // The solution is worked out on its own and written into the state only once the solver has
    // answered with a usable PRF; a failure leaves every field as it was.
    std::unique_ptr<TimingSolver> solver;
    const auto useSolver = [&]() -> TimingSolver& {
        if (!solver && solverFactory_) solver = solverFactory_();
        if (!solver) throw std::runtime_error("The timing solver is not available.");
        return *solver;
    };
    const auto checkPrf = [](double prf) {
        if (!std::isfinite(prf) || prf < 0.0)
            throw std::runtime_error("The timing solver gave an invalid PRF (" + generalText(prf) +
                                     " Hz).");
    };
    PulsedModule& s = state_;
    try {
        const double prf = VexoEdit_prf.value();
        if (isTrue(s.IsListedModel) && s.UseInternalPG != kUnchecked) {
            const InternalRequest request{
                .prf = prf,
                .ifbw = VexoEdit_IFBW.value(),
                .pulseClockHz = isTrue(s.HasClock100MHz) ? kClock100MHz : kClock60MHz,
                .fixedPrf = s.FixedPRF};
            const bool gated = !m_NoSWGating.checked;
            InternalSolution solution;
            if (gated) {
                const GateWindow gate{.highestGateDelay = FHighestGateDelay(),
                                      .widestGateWidth = FMaxGateWidth()};
                solution = useSolver().SolveInternalGated(request, gate);
            } else {
                solution = useSolver().SolveInternal(request);
            }
            const std::int32_t ifbwHz = toInt32(solution.ifbw);
            checkPrf(solution.prf);
            s.PRF = solution.prf;
            s.IFBW = solution.ifbw;
            s.PulseClockHz = solution.pulseClockHz;
            s.IntSolveTime1 = solution.time1;
            s.IntSolveTime2 = solution.time2;
            s.IntSolveList1 = std::move(solution.list1);
            s.IntSolveList2 = std::move(solution.list2);
            s.IntSolveList3 = std::move(solution.list3);
            if (gated) {
                s.GatedSolveTime1 = solution.gate.time1;
                s.GatedSolveTime2 = solution.gate.time2;
                s.GatedSolveTicks = solution.gate.ticks;
            }
            s.IFBWHz = ifbwHz;
        } else {
            const ExternalRequest request{
                .prf = prf,
                .ifbwHz = toInt32(VexoEdit_IFBW.value()),
                .converterDelay = m_ConverterMeas.checked ? kConverterDelay : 0.0,
                .decade = static_cast<std::int16_t>(std::floor(FLog10(prf)) - 3),
                .fixedPrf = s.FixedPRF,
                .flag = kTrue};
            const ExternalSolution solution = useSolver().SolveExternal(request);
            checkPrf(solution.prf);
            s.PRF = solution.prf;
            s.SolvedIFCount = solution.ifCount;
            s.IFBWHz = solution.ifbwHz;
            s.SolvedFreqOffset = solution.freqOffset;
            s.ConverterDelay = solution.converterDelay;
        }
    } catch (const std::exception& e) {
        ui_.message(e.what(), MessageKind::Warning);
        return;
    } catch (...) {
        ui_.message("The timing solver failed.", MessageKind::Warning);
        return;
    }
    if (s.PRF == 0.0)
        ui_.message(kNoSolutionMessage, MessageKind::Warning);
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

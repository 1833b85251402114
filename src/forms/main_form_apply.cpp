// Apply: the window gathers a snapshot, the chosen procedure runs on the bench, and the window
// takes back what the procedure hands it.

#include <algorithm>
#include <cstddef>
#include <utility>

#include "forms/main_form.h"
#include "instruments/apply/apply_procedures.h"

namespace zp {

ApplySnapshot MainForm::applySnapshot() const {
    ApplySnapshot s;
    s.state = state_;
    s.entries.prf = VexoEdit_prf.value();
    s.entries.ifbw = VexoEdit_IFBW.value();
    for (int row = 0; row < rowCount(); ++row) {
        s.entries.widths.push_back(VexoEdit_width[row].value());
        s.entries.delays.push_back(VexoEdit_delay[row].value());
    }
    s.mode = {.noPG = m_NoPG.checked,
              .converterMeas = m_ConverterMeas.checked,
              .noSWGating = m_NoSWGating.checked};
    s.pulsedChecked = chk_pulsed.checked();
    s.autoGain = FAutoGain();
    s.solver = solverFactory_;
    return s;
}

void MainForm::b_Apply_Click() {
    {
        BusyPointer busy(ui_);
        ApplyResult result = runApply(bench_, applySnapshot());
        // Taken back on failure too: what the procedure did before it stopped is on the
        // instruments. The widths are the program's own writes, so no entry rule runs and the
        // setup stays calculated.
        const int rows = std::min<int>(rowCount(), static_cast<int>(result.acceptedWidths.size()));
        for (int row = 0; row < rows; ++row) {
            if (const auto& width = result.acceptedWidths[static_cast<std::size_t>(row)])
                VexoEdit_width[row].setValue(*width);
        }
        state_.RxSolveValues = result.rxSolveValues;
        lastApply_ = std::move(result);
        if (lastApply_->failure)
            ui_.message(lastApply_->failure->description, MessageKind::Warning);
        SUpdateDutyCycle();
    }
    const bool profile = chk_pulsed.checked() && !m_NoPG.checked;
    b_PulseProfile.enabled = profile;
    m_PulseProfile.enabled = profile;
}

}  // namespace zp

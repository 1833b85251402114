// The entry rules of the main window: PRF, PRI, IF bandwidth, widths, delays and shared outputs.

#include <algorithm>
#include <cmath>
#include <optional>
#include <stdexcept>
#include <string>

#include "core/numeric.h"
#include "forms/main_form.h"

namespace zp {

namespace {

constexpr double kDelayPhaseLimit = 340.0;  // degrees of the pulse period

double powerOfTen(int e) {
    return std::pow(10.0, e);
}

// The exact decimal exponent: 10^e <= v < 10^(e+1). A single-precision logarithm rounds values
// just below a power of ten up to it (9999.999 Hz would count as 10^4).
int decimalExponent(double v) {
    if (!(v > 0.0) || !std::isfinite(v)) return 0;
    int e = static_cast<int>(std::floor(std::log10(v)));
    while (powerOfTen(e) > v) --e;
    while (powerOfTen(e + 1) <= v) ++e;
    return e;
}

// The value a text of digits stands for, scaled by 10^scale without binary noise.
double decimalValue(const std::string& digits, int scale) {
    const std::string text = scale == 0 ? digits : digits + "e" + std::to_string(scale);
    const std::optional<double> v = parseNumber(text);
    if (!v) throw std::logic_error("the PRF rule cut '" + digits + "' to a non-number");
    return *v;
}

// Drops the rounding noise of a sum so that the field shows what the rule meant.
double cleaned(double v) {
    return parseNumber(generalText(v)).value_or(v);
}

void checkRow(int row, int rows) {
    if (row < 0 || row >= rows)
        throw std::out_of_range("row " + std::to_string(row) + " is outside the rows 0 to " +
                                std::to_string(rows - 1));
}

}  // namespace

void MainForm::SNormalizeValue(EntryField& field) {
    SNormalizeValue(field, field.lastSource() == ChangeSource::Step);
}

void MainForm::SNormalizeValue(EntryField& field, bool fromStep) {
    field.setValue(::zp::SNormalizeValue(field.value(), fromStep));
}

std::vector<int> MainForm::sharedRows(int row) const {
    std::vector<int> rows;
    const int count = std::min(ruleRows(), state_.Table.rows());
    if (row < 0 || row >= count) return rows;
    // A row the table cannot give (a recalled cell that is not a number) shares with nobody.
    const auto read = [this](int r) -> std::optional<PGRow> {
        try {
            return state_.SReadRow(r);
        } catch (const std::exception&) {
            return std::nullopt;
        }
    };
    const std::optional<PGRow> mine = read(row);
    if (!mine) return rows;
    for (int i = 0; i < count; ++i) {
        if (i == row) continue;
        const std::optional<PGRow> other = read(i);
        if (!other) continue;
        bool shares = false;
        if (state_.UseInternalPG == kUnchecked)
            shares =
                other->gpibAddress == mine->gpibAddress && other->gateOutput == mine->gateOutput;
        else if (state_.UseInternalPG == kChecked)
            shares = other->intPGOutput == mine->intPGOutput;
        if (shares) rows.push_back(i);
    }
    return rows;
}

void MainForm::prfRule() {
    runPrfRule(false);
}

void MainForm::runPrfRule(bool fromStep) {
    const double v = VexoEdit_prf.value();
    const std::string text = generalText(v);
    // The exponent of the number the text shows, so that the kept characters match it even when
    // the text rounds up to the next power of ten.
    const int e = decimalExponent(parseNumber(text).value_or(v));
    const std::size_t keep = e < 3 ? 5 : 4;
    const int scale = e < 3 ? 0 : e - 3;
    double prf = decimalValue(text.substr(0, keep), scale);
    if (fromStep && text.back() == '1' && text.size() != 4) prf = cleaned(prf + powerOfTen(e - 3));
    VexoEdit_prf.setValue(prf);

    const double period = 1.0 / VexoEdit_prf.value();
    VexoEdit_pri.setValue(period);
    for (int row = 0; row < ruleRows(); ++row) {
        if (VexoEdit_delay[row].enabled()) pullBackDelay(VexoEdit_delay[row], VexoEdit_prf.value());
    }
    Invalidate();
}

void MainForm::pullBackDelay(EntryField& delay, double prf) {
    if (roundHalfEven(prf * delay.value() * 360.0) < kDelayPhaseLimit) return;
    delay.setValue(kDelayPhaseLimit / (prf * 360.0));
    SNormalizeValue(delay, false);
}

void MainForm::priRule() {
    // A PRF beyond the field's range is clamped by the field before the rule reads it back.
    VexoEdit_prf.setValue(1.0 / VexoEdit_pri.value());
    runPrfRule(false);
}

void MainForm::ifbwRule() {
    Invalidate();
}

void MainForm::widthRule(int row) {
    checkRow(row, ruleRows());
    SNormalizeValue(VexoEdit_width[row]);
    shareRowChange(VexoEdit_width, row);
}

void MainForm::delayRule(int row) {
    checkRow(row, ruleRows());
    EntryField& changed = VexoEdit_delay[row];
    SNormalizeValue(changed);
    pullBackDelay(changed, VexoEdit_prf.value());
    shareRowChange(VexoEdit_delay, row);
}

void MainForm::shareRowChange(std::deque<EntryField>& column, int row) {
    const double value = column[row].value();
    // With external generators a row already holding the value is left alone.
    const bool external = state_.UseInternalPG == kUnchecked;
    for (int i : sharedRows(row)) {
        if (external && column[i].value() == value) continue;
        column[i].setValue(value);
    }
    b_PulseProfile.enabled = false;
    m_PulseProfile.enabled = false;
    if (!m_NoSWGating.checked) Invalidate();
}

}  // namespace zp

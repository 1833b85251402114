#include "core/pg_table.h"

#include <cmath>
#include <limits>
#include <stdexcept>
#include <string>

#include "core/numeric.h"
#include "core/text.h"

namespace zp {

namespace {

const char* const kColumnNames[PGColumnCount] = {"GateOutput", "GpibAddress",   "Master",
                                                 "Enabled",    "HighLevel",     "LowLevel",
                                                 "Complement", "LoadImpedance", "IntPGOutput"};

// The cell as a number; an empty cell reads as 0. Configuration files may keep the Master flag
// as "True"/"False".
double cellNumber(const PGCell& cell, int column) {
    struct Visitor {
        int column;
        double operator()(std::monostate) const { return 0.0; }
        double operator()(std::int16_t v) const { return v; }
        double operator()(std::int32_t v) const { return v; }
        double operator()(float v) const { return v; }
        double operator()(double v) const { return v; }
        double operator()(const std::string& text) const {
            if (column == Master) {
                const auto t = trim(text);
                if (equalsIgnoringCase(t, "True")) return kTrue;
                if (equalsIgnoringCase(t, "False")) return kFalse;
            }
            if (const auto v = parseNumber(text)) return *v;
            throw std::invalid_argument(std::string("'") + text + "' in column " +
                                        kColumnNames[column] + " is not a number");
        }
    };
    return std::visit(Visitor{column}, cell);
}

std::int16_t readInt16(const PGCell& cell, int column) {
    try {
        return toInt16(cellNumber(cell, column));
    } catch (const RangeError& e) {
        throw RangeError(std::string(kColumnNames[column]) + ": " + e.what());
    }
}

std::int32_t readInt32(const PGCell& cell, int column) {
    try {
        return toInt32(cellNumber(cell, column));
    } catch (const RangeError& e) {
        throw RangeError(std::string(kColumnNames[column]) + ": " + e.what());
    }
}

float readFloat(const PGCell& cell, int column) {
    const double v = cellNumber(cell, column);
    if (!std::isfinite(v) || std::fabs(v) > std::numeric_limits<float>::max()) {
        throw RangeError(std::string(kColumnNames[column]) + ": value " + generalText(v) +
                         " does not fit a single-precision number");
    }
    return static_cast<float>(v);
}

Bool16 readBool(const PGCell& cell, int column) {
    const double v = cellNumber(cell, column);
    if (std::isnan(v)) {
        throw RangeError(std::string(kColumnNames[column]) + ": NaN is not a boolean");
    }
    return toBool16(v != 0.0);
}

}  // namespace

void PGTable::resize(int rows) {
    if (rows < 0)
        throw std::invalid_argument("a table cannot have " + std::to_string(rows) + " rows");
    cells_.resize(static_cast<std::size_t>(rows), std::vector<PGCell>(PGColumnCount));
}

void PGTable::checkRow(int row) const {
    if (row < 0 || row >= rows()) {
        throw std::out_of_range("row " + std::to_string(row) + " is outside the table rows 0 to " +
                                std::to_string(rows() - 1));
    }
}

PGCell& PGTable::cell(int row, int column) {
    checkRow(row);
    if (column < 0 || column >= PGColumnCount) {
        throw std::out_of_range("column " + std::to_string(column) + " is outside 0 to 8");
    }
    return cells_[static_cast<std::size_t>(row)][static_cast<std::size_t>(column)];
}

const PGCell& PGTable::cell(int row, int column) const {
    checkRow(row);
    if (column < 0 || column >= PGColumnCount) {
        throw std::out_of_range("column " + std::to_string(column) + " is outside 0 to 8");
    }
    return cells_[static_cast<std::size_t>(row)][static_cast<std::size_t>(column)];
}

void PGTable::writeRow(int row, const PGRow& values) {
    checkRow(row);
    auto& r = cells_[static_cast<std::size_t>(row)];
    r[GateOutput] = values.gateOutput;
    r[GpibAddress] = values.gpibAddress;
    r[Master] = values.master;
    r[Enabled] = values.enabled;
    r[HighLevel] = values.highLevel;
    r[LowLevel] = values.lowLevel;
    r[Complement] = values.complement;
    r[LoadImpedance] = values.loadImpedance;
    r[IntPGOutput] = values.intPGOutput;
}

PGRow PGTable::readRow(int row) const {
    checkRow(row);
    const auto& r = cells_[static_cast<std::size_t>(row)];
    PGRow out;
    out.gateOutput = readInt16(r[GateOutput], GateOutput);
    out.gpibAddress = readInt16(r[GpibAddress], GpibAddress);
    out.master = readBool(r[Master], Master);
    out.enabled = readInt16(r[Enabled], Enabled);
    out.highLevel = readFloat(r[HighLevel], HighLevel);
    out.lowLevel = readFloat(r[LowLevel], LowLevel);
    out.complement = readInt16(r[Complement], Complement);
    out.loadImpedance = readInt32(r[LoadImpedance], LoadImpedance);
    out.intPGOutput = readInt16(r[IntPGOutput], IntPGOutput);
    return out;
}

}  // namespace zp

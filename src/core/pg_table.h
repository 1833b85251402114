#pragma once
// The pulse-generator output table: one row per pulsed signal, nine typed columns.

#include <cstdint>
#include <string>
#include <variant>
#include <vector>

#include "core/bool16.h"

namespace zp {

enum PGColumn : int {
    GateOutput = 0,
    GpibAddress = 1,
    Master = 2,
    Enabled = 3,
    HighLevel = 4,
    LowLevel = 5,
    Complement = 6,
    LoadImpedance = 7,
    IntPGOutput = 8,
    PGColumnCount = 9
};

// A cell keeps whatever was stored into it: a typed value, a double (start-up stores some
// columns as doubles) or the text read from a configuration file.
using PGCell = std::variant<std::monostate, std::int16_t, std::int32_t, float, double, std::string>;

// One row in column types, as the row writer takes it and the row reader gives it.
struct PGRow {
    std::int16_t gateOutput = 0;
    std::int16_t gpibAddress = 0;
    Bool16 master = kFalse;
    Check16 enabled = kUnchecked;
    float highLevel = 0.0f;
    float lowLevel = 0.0f;
    Check16 complement = kUnchecked;
    std::int32_t loadImpedance = 0;
    std::int16_t intPGOutput = 0;

    bool operator==(const PGRow&) const = default;
};

class PGTable {
  public:
    PGTable() = default;
    explicit PGTable(int rows) { resize(rows); }

    void resize(int rows);
    int rows() const { return static_cast<int>(cells_.size()); }

    PGCell& cell(int row, int column);
    const PGCell& cell(int row, int column) const;

    // Row writer: stores the nine values, in column order.
    void writeRow(int row, const PGRow& values);
    // Row reader: converts each cell to its column's type (round half to even for numbers, text
    // cells parsed strictly). Throws std::invalid_argument for a text cell that is not a number
    // and zp::RangeError for a value outside the column's type.
    PGRow readRow(int row) const;

  private:
    void checkRow(int row) const;
    std::vector<std::vector<PGCell>> cells_;
};

}  // namespace zp

#include <gtest/gtest.h>

#include <cmath>
#include <stdexcept>
#include <string>
#include <utility>

#include "core/numeric.h"
#include "core/pg_table.h"

namespace zp {
namespace {

TEST(PGTable, WriterStoresColumnTypesAndReaderGivesThemBack) {
    PGRow r;
    r.gateOutput = 2;
    r.gpibAddress = 14;
    r.master = kTrue;
    r.enabled = kChecked;
    r.highLevel = 2.5f;
    r.lowLevel = -0.5f;
    r.loadImpedance = 50;
    r.intPGOutput = 3;
    PGTable t(5);
    t.writeRow(4, r);
    EXPECT_EQ(t.readRow(4), r);
    EXPECT_TRUE(std::holds_alternative<float>(t.cell(4, HighLevel)));
    EXPECT_TRUE(std::holds_alternative<std::int32_t>(t.cell(4, LoadImpedance)));
    EXPECT_TRUE(std::holds_alternative<std::int16_t>(t.cell(4, GpibAddress)));
    EXPECT_EQ(t.readRow(3), PGRow{});

    EXPECT_THROW(t.writeRow(5, r), std::out_of_range);
    EXPECT_THROW(t.writeRow(-1, r), std::out_of_range);
    EXPECT_THROW(t.cell(0, 9), std::out_of_range);
    EXPECT_THROW(t.cell(5, 0), std::out_of_range);
    EXPECT_THROW(std::as_const(t).cell(-1, 0), std::out_of_range);
    EXPECT_THROW(PGTable().readRow(0), std::out_of_range);
    EXPECT_THROW(t.resize(-1), std::invalid_argument);
}

TEST(PGTable, DoubleAndTextCellsRoundHalfToEven) {
    PGTable t(1);
    const std::pair<PGCell, int> addresses[] = {
        {11.5, 12}, {12.5, 12}, {std::string("12.5"), 12}, {std::string(" 13 "), 13}};
    for (const auto& [cell, expected] : addresses) {
        t.cell(0, GpibAddress) = cell;
        EXPECT_EQ(t.readRow(0).gpibAddress, expected);
    }
    t.cell(0, LoadImpedance) = 49.5;
    EXPECT_EQ(t.readRow(0).loadImpedance, 50);
    t.cell(0, HighLevel) = std::string(" 3.3 ");
    EXPECT_EQ(t.readRow(0).highLevel, 3.3f);
    for (const char* bad : {"abc", "12abc", ""}) {
        t.cell(0, GpibAddress) = std::string(bad);
        EXPECT_THROW(t.readRow(0), std::invalid_argument) << bad;
    }
}

TEST(PGTable, MasterAcceptsBooleanTextsAndNumbers) {
    PGTable t(1);
    const std::pair<PGCell, Bool16> cases[] = {
        {std::string("True"), kTrue},   {std::string("false"), kFalse}, {std::string("-1"), kTrue},
        {std::string(" TRUE "), kTrue}, {std::int16_t{1}, kTrue},       {0.0, kFalse}};
    for (const auto& [cell, expected] : cases) {
        t.cell(0, Master) = cell;
        EXPECT_EQ(t.readRow(0).master, expected);
    }
    // A word of the same length is no boolean.
    for (const char* bad : {"yes", "Trux", "Falsy"}) {
        t.cell(0, Master) = std::string(bad);
        EXPECT_THROW(t.readRow(0), std::invalid_argument) << bad;
    }
    // "True" is only a boolean in the Master column.
    t.cell(0, Master) = kFalse;
    t.cell(0, Enabled) = std::string("True");
    EXPECT_THROW(t.readRow(0), std::invalid_argument);
}

TEST(PGTable, OutOfRangeCellsRaiseRangeErrorNamingTheColumn) {
    PGTable t(1);
    t.cell(0, GpibAddress) = 40000.0;
    try {
        t.readRow(0);
        FAIL() << "no RangeError";
    } catch (const RangeError& e) {
        EXPECT_NE(std::string(e.what()).find("GpibAddress"), std::string::npos) << e.what();
    }
    t.cell(0, GpibAddress) = std::int16_t{1};
    t.cell(0, LoadImpedance) = std::string("1e12");
    EXPECT_THROW(t.readRow(0), RangeError);
    t.cell(0, LoadImpedance) = std::int32_t{50};
    t.cell(0, HighLevel) = std::nan("");
    EXPECT_THROW(t.readRow(0), RangeError);
}

}  // namespace
}  // namespace zp

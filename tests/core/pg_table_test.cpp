#include <gtest/gtest.h>

#include <cmath>
#include <stdexcept>
#include <string>

#include "core/numeric.h"
#include "core/pg_table.h"

namespace zp {
namespace {

PGRow sampleRow() {
    PGRow r;
    r.gateOutput = 2;
    r.gpibAddress = 14;
    r.master = kTrue;
    r.enabled = kChecked;
    r.highLevel = 2.5f;
    r.lowLevel = -0.5f;
    r.complement = kUnchecked;
    r.loadImpedance = 50;
    r.intPGOutput = 3;
    return r;
}

TEST(PGTable, WriterStoresColumnTypesAndReaderGivesThemBack) {
    PGTable t(5);
    t.writeRow(4, sampleRow());
    EXPECT_EQ(t.readRow(4), sampleRow());
    EXPECT_TRUE(std::holds_alternative<float>(t.cell(4, HighLevel)));
    EXPECT_TRUE(std::holds_alternative<std::int32_t>(t.cell(4, LoadImpedance)));
    EXPECT_TRUE(std::holds_alternative<std::int16_t>(t.cell(4, GpibAddress)));
    // Other rows are untouched and read as zeros.
    EXPECT_EQ(t.readRow(3), PGRow{});
}

TEST(PGTable, RowsOutsideTheTableAreRefused) {
    PGTable t(5);
    EXPECT_THROW(t.writeRow(5, sampleRow()), std::out_of_range);
    EXPECT_THROW(t.writeRow(-1, sampleRow()), std::out_of_range);
    EXPECT_THROW(t.readRow(5), std::out_of_range);
    EXPECT_THROW(t.cell(0, 9), std::out_of_range);
    EXPECT_THROW(PGTable().readRow(0), std::out_of_range);
    EXPECT_THROW(t.resize(-1), std::invalid_argument);
}

TEST(PGTable, DoubleCellsRoundHalfToEven) {
    PGTable t(1);
    t.cell(0, GpibAddress) = 11.5;
    EXPECT_EQ(t.readRow(0).gpibAddress, 12);
    t.cell(0, GpibAddress) = 12.5;
    EXPECT_EQ(t.readRow(0).gpibAddress, 12);
    t.cell(0, LoadImpedance) = 49.5;
    EXPECT_EQ(t.readRow(0).loadImpedance, 50);
    t.cell(0, HighLevel) = 2.25;
    EXPECT_EQ(t.readRow(0).highLevel, 2.25f);
}

TEST(PGTable, TextCellsAreParsedStrictly) {
    PGTable t(1);
    t.cell(0, GpibAddress) = std::string("12.5");
    EXPECT_EQ(t.readRow(0).gpibAddress, 12);
    t.cell(0, HighLevel) = std::string(" 3.3 ");
    EXPECT_EQ(t.readRow(0).highLevel, 3.3f);
    t.cell(0, GpibAddress) = std::string("abc");
    EXPECT_THROW(t.readRow(0), std::invalid_argument);
    t.cell(0, GpibAddress) = std::string("12abc");
    EXPECT_THROW(t.readRow(0), std::invalid_argument);
    t.cell(0, GpibAddress) = std::string("");
    EXPECT_THROW(t.readRow(0), std::invalid_argument);
}

TEST(PGTable, MasterAcceptsBooleanTexts) {
    PGTable t(1);
    for (const auto& [text, expected] : {std::pair<std::string, Bool16>{"True", kTrue},
                                         {"false", kFalse},
                                         {"-1", kTrue},
                                         {"0", kFalse},
                                         {" TRUE ", kTrue}}) {
        t.cell(0, Master) = text;
        EXPECT_EQ(t.readRow(0).master, expected) << text;
    }
    t.cell(0, Master) = std::string("yes");
    EXPECT_THROW(t.readRow(0), std::invalid_argument);
    // "True" is only a boolean in the Master column.
    t.cell(0, Master) = kFalse;
    t.cell(0, Enabled) = std::string("True");
    EXPECT_THROW(t.readRow(0), std::invalid_argument);
}

TEST(PGTable, NumericMasterReadsAsBoolean) {
    PGTable t(1);
    t.cell(0, Master) = std::int16_t{1};
    EXPECT_EQ(t.readRow(0).master, kTrue);
    t.cell(0, Master) = 0.0;
    EXPECT_EQ(t.readRow(0).master, kFalse);
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
    t.cell(0, HighLevel) = 1e300;
    EXPECT_THROW(t.readRow(0), RangeError);
    t.cell(0, HighLevel) = std::nan("");
    EXPECT_THROW(t.readRow(0), RangeError);
}

}  // namespace
}  // namespace zp

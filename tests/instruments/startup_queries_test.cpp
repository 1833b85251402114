// What start-up and the help entry ask the analyzer, as values.

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "instruments/analyzer_identity_query.h"
#include "instruments/error_capture.h"
#include "instruments/help_file_query.h"
#include "sim/sim_bench.h"

namespace zp {
namespace {

using testing_support::errorOf;

TEST(ReadAnalyzerIdentity, CountsAndHardwareValueForListedModelsOnly) {
    const struct {
        const char* model;
        AnalyzerIdentity id;
    } cases[] = {
        {"kt655", {"KT655A", "K71 M83 M84", Ports{4}, Sources{3}, "5.0"}},
        {"kt633", {"KT633A", "K72 M81 M82", Ports{2}, Sources{2}, "4"}},
        {"zx20-j55", {"ZX20", "J55", Ports{0}, Sources{0}, ""}},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.model);
        sim::SimBench bench(c.model);
        const AnalyzerIdentity id = readAnalyzerIdentity(bench);
        EXPECT_EQ(id.modelText, c.id.modelText);
        EXPECT_EQ(id.optionText, c.id.optionText);
        EXPECT_EQ(id.portCount, c.id.portCount);
        EXPECT_EQ(id.sourceCount, c.id.sourceCount);
        EXPECT_EQ(id.hardwareValue, c.id.hardwareValue);
    }
}

TEST(ReadAnalyzerIdentity, AnalyzerErrorsAreThrown) {
    sim::SimFaults faults;
    faults.add("analyzer:Caps.portCount=-200 Execution error");
    sim::SimBench bench("kt622", faults);
    EXPECT_EQ(errorOf([&] { readAnalyzerIdentity(bench); }), "-200 Execution error");
}

// The capability object is obtained before the model text is read: an analyzer that cannot
// give it is never asked for its model.
TEST(ReadAnalyzerIdentity, CapabilityObjectComesFirst) {
    sim::SimFaults faults;
    faults.add("analyzer:Application.hardwareInfo=-200 Execution error");
    sim::SimBench bench("kt622", faults);
    EXPECT_EQ(errorOf([&] { readAnalyzerIdentity(bench); }), "-200 Execution error");
    EXPECT_EQ(bench.trace()->lines(),
              std::vector<std::string>{"ANA Application.hardwareInfo() !! -200 Execution error"});
}

TEST(QueryHelpFile, FileWithoutQuotesOrTheAnalyzersError) {
    sim::SimBench bench;
    const HelpFileQuery help = queryHelpFile(bench);
    EXPECT_FALSE(help.error);
    EXPECT_TRUE(help.file.ends_with("/zentra-pulse.html")) << help.file;
    EXPECT_EQ(help.file.find_first_of("\"\r\n"), std::string::npos) << help.file;

    bench.faults().add("analyzer:CommandParser.parse=-113 Undefined header");
    const HelpFileQuery failed = queryHelpFile(bench);
    EXPECT_EQ(failed.error, "-113 Undefined header");
    EXPECT_EQ(failed.file, "");
}

}  // namespace
}  // namespace zp

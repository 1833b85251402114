#include "instruments/help_file_query.h"

#include <exception>
#include <memory>

#include "instruments/analyzer_connection.h"
#include "instruments/instrument_error.h"

namespace zp {

HelpFileQuery queryHelpFile(Bench& bench) {
    HelpFileQuery result;
    try {
        std::unique_ptr<AnalyzerApplication> app = openAnalyzer(bench);
        std::unique_ptr<CommandParser> parser = app->commandParser();
        if (!parser) throw InstrumentError(kOwnCheckError, "The analyzer has no command parser.");
        result.file = parser->parse("DIAG:HELP:FILE?");
    } catch (const std::exception& e) {
        return {{}, e.what()};
    }
    std::erase_if(result.file, [](char c) { return c == '"' || c == '\n' || c == '\r'; });
    return result;
}

}  // namespace zp

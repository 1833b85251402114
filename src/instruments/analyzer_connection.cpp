#include "instruments/analyzer_connection.h"

#include "instruments/instrument_error.h"

namespace zp {

std::unique_ptr<AnalyzerApplication> openAnalyzer(Bench& bench) {
    std::unique_ptr<AnalyzerApplication> app = bench.connectAnalyzer();
    if (!app) throw InstrumentError(kOwnCheckError, "The analyzer cannot be reached.");
    return app;
}

}  // namespace zp

#include "instruments/analyzer_identity_query.h"

#include <memory>

#include "instruments/analyzer_connection.h"
#include "instruments/instrument_error.h"

namespace zp {

AnalyzerIdentity readAnalyzerIdentity(AnalyzerApplication& app) {
    // The capability object comes before the model and option texts, as the start-up trace
    // shows them.
    std::unique_ptr<AnalyzerCaps> caps = app.hardwareInfo();
    if (!caps) throw InstrumentError(kOwnCheckError, "The analyzer reports no capability object.");
    AnalyzerIdentity id;
    id.modelText = app.modelText();
    id.optionText = app.optionText();
    if (isListedModelText(id.modelText)) {
        // Sources are asked first: the order is part of the start-up trace.
        id.sourceCount = caps->sourceCount();
        id.portCount = caps->portCount();
        id.hardwareValue = caps->hardwareValue();
    }
    return id;
}

AnalyzerIdentity readAnalyzerIdentity(Bench& bench) {
    return readAnalyzerIdentity(*openAnalyzer(bench));
}

}  // namespace zp

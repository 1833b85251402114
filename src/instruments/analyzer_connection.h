#pragma once
// The one way procedures open their analyzer connection.

#include <memory>

#include "instruments/bench.h"

namespace zp {

// A new application object of the bench's analyzer. Throws InstrumentError: the bench's own, or
// "The analyzer cannot be reached." when the bench hands back none.
std::unique_ptr<AnalyzerApplication> openAnalyzer(Bench& bench);

}  // namespace zp

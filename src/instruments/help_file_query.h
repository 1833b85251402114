#pragma once
// The help file the analyzer names for this program ("DIAG:HELP:FILE?").

#include <optional>
#include <string>

#include "instruments/bench.h"

namespace zp {

struct HelpFileQuery {
    // The file as the analyzer named it, without quotes and line ends; may be empty.
    std::string file;
    // Set when the query failed: the analyzer's error description, shown to the user as it is.
    std::optional<std::string> error;
};

// Asks through the command parser of a connection of its own. Never throws for an analyzer
// failure: the failure comes back in `error`.
HelpFileQuery queryHelpFile(Bench& bench);

}  // namespace zp

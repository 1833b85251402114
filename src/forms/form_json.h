#pragma once
// A form's controls as JSON members keyed by control name, in the order of its table.

#include "forms/control_registry.h"
#include "forms/json_writer.h"

namespace zp {

// Writes one member per table line into the object `w` has open.
void writeControls(JsonWriter& w, const ControlRegistry& controls);

}  // namespace zp

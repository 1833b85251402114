#pragma once
// Plain-data stand-ins for a window's controls: what a view shows and what the rules change.

#include <string>

#include "core/bool16.h"

namespace zp {

// Position and size in twips (1/1440 inch), as the window layouts are designed.
struct Geometry {
    int left = 0;
    int top = 0;
    int width = 0;
    int height = 0;
};

struct Control {
    std::string name;
    std::string caption;
    bool enabled = true;
    bool visible = true;
    Geometry geometry;
};

// A check box holds 0 or 1. Setting it from code runs its click rule as a user's click does.
struct CheckBox : Control {
    Check16 value = kUnchecked;
    bool checked() const { return value == kChecked; }
};

struct MenuEntry : Control {
    bool checked = false;
};

// A caption as a sentence names it: "&Pulse Profile..." -> "Pulse Profile" ("&&" is a literal &).
std::string plainCaption(const std::string& caption);

}  // namespace zp

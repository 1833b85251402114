#include "forms/form_json.h"

#include <string_view>

namespace zp {

namespace {

void geometry(JsonWriter& w, const Geometry& g) {
    w.member("left", g.left);
    w.member("top", g.top);
    w.member("width", g.width);
    w.member("height", g.height);
}

void fieldBody(JsonWriter& w, const EntryField& f) {
    w.beginObject();
    w.member("value", f.value());
    w.member("enabled", f.enabled());
    w.member("text", f.displayText());
    w.member("lower", f.lower());
    w.member("upper", f.upper());
    w.endObject();
}

// The members every control shares, its own ones, then where it sits (menus sit nowhere).
void controlBody(JsonWriter& w, const ControlRegistry::Item& item) {
    const Control& c = ControlRegistry::controlOf(item, -1);
    w.beginObject();
    w.member("caption", c.caption);
    if (item.kind == ControlKind::Window) {
        w.member("width", c.geometry.width);
        w.member("height", c.geometry.height);
        w.endObject();
        return;
    }
    if (item.kind == ControlKind::CheckBox)
        w.member("value", static_cast<int>(static_cast<const CheckBox&>(c).value));
    if (item.kind == ControlKind::Menu) w.member("checked", ControlRegistry::checkedOf(item, -1));
    w.member("enabled", c.enabled);
    w.member("visible", c.visible);
    if (item.kind != ControlKind::Menu) geometry(w, c.geometry);
    w.endObject();
}

// Row groups list their rows: labels by caption, fields in full.
void rows(JsonWriter& w, const ControlRegistry::Item& item) {
    w.beginArray();
    for (int row = 0; row < item.rowCount(); ++row) {
        if (item.kind == ControlKind::Entry) {
            fieldBody(w, ControlRegistry::fieldOf(item, row));
        } else {
            w.value(ControlRegistry::controlOf(item, row).caption);
        }
    }
    w.endArray();
}

}  // namespace

void writeControls(JsonWriter& w, const ControlRegistry& controls) {
    for (const ControlRegistry::Item& item : controls.items()) {
        w.key(item.name);
        if (item.hasRows()) {
            rows(w, item);
        } else if (item.kind == ControlKind::Entry) {
            fieldBody(w, ControlRegistry::fieldOf(item, -1));
        } else {
            controlBody(w, item);
        }
    }
}

}  // namespace zp

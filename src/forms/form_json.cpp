#include "forms/form_json.h"

#include <string_view>

namespace zp {

namespace {

// One "name": value member.
template <typename T>
void member(JsonWriter& w, std::string_view name, const T& v) {
    w.key(name);
    w.value(v);
}

void geometry(JsonWriter& w, const Geometry& g) {
    member(w, "left", g.left);
    member(w, "top", g.top);
    member(w, "width", g.width);
    member(w, "height", g.height);
}

void fieldBody(JsonWriter& w, const EntryField& f) {
    w.beginObject();
    member(w, "value", f.value());
    member(w, "enabled", f.enabled());
    member(w, "text", f.displayText());
    member(w, "lower", f.lower());
    member(w, "upper", f.upper());
    w.endObject();
}

// The members every control shares, its own ones, then where it sits (menus sit nowhere).
void controlBody(JsonWriter& w, const ControlRegistry::Item& item) {
    const Control& c = ControlRegistry::controlOf(item, -1);
    w.beginObject();
    member(w, "caption", c.caption);
    if (item.kind == ControlKind::Window) {
        member(w, "width", c.geometry.width);
        member(w, "height", c.geometry.height);
        w.endObject();
        return;
    }
    if (item.kind == ControlKind::CheckBox)
        member(w, "value", static_cast<int>(static_cast<const CheckBox&>(c).value));
    if (item.kind == ControlKind::Menu) member(w, "checked", ControlRegistry::checkedOf(item, -1));
    member(w, "enabled", c.enabled);
    member(w, "visible", c.visible);
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

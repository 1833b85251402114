#include "forms/control_registry.h"

#include <charconv>
#include <stdexcept>
#include <utility>

namespace zp {

namespace {

ControlRegistry::RowHandler ignoringRow(ControlRegistry::Handler h) {
    if (!h) return {};
    return [h = std::move(h)](int) { h(); };
}

}  // namespace

int ControlRegistry::Item::rowCount() const {
    if (controlRows != nullptr) return static_cast<int>(controlRows->size());
    if (fieldRows != nullptr) return static_cast<int>(fieldRows->size());
    return 0;
}

std::string ControlRegistry::rowName(const std::string& base, int row) {
    return base + "(" + std::to_string(row) + ")";
}

// ---- Declaring.

void ControlRegistry::clear() {
    items_.clear();
    fieldGeometry_.clear();
}

ControlRegistry::Item& ControlRegistry::add(Item item) {
    if (findItem(item.name) != nullptr)
        throw std::logic_error("the control " + item.name + " is declared twice");
    if (!item.container.empty()) {
        const Item* holder = findItem(item.container);
        if (holder == nullptr ||
            (holder->kind != ControlKind::Frame && holder->kind != ControlKind::Menu))
            throw std::logic_error(item.name + " sits in " + item.container +
                                   ", which is no frame or menu declared before it");
    }
    items_.push_back(std::move(item));
    return items_.back();
}

ControlRegistry::Item& ControlRegistry::declare(ControlKind kind, Control& c, ControlDesign d,
                                                std::string container, Handler handler) {
    c.name = std::move(d.name);
    c.caption = std::move(d.caption);
    c.geometry = d.geometry;
    c.enabled = true;
    c.visible = true;
    return add({.kind = kind,
                .name = c.name,
                .container = std::move(container),
                .control = &c,
                .handler = ignoringRow(std::move(handler))});
}

void ControlRegistry::window(Control& c, ControlDesign d) {
    declare(ControlKind::Window, c, std::move(d), {}, {});
}

void ControlRegistry::frame(Control& c, ControlDesign d, std::string container) {
    declare(ControlKind::Frame, c, std::move(d), std::move(container), {});
}

void ControlRegistry::label(Control& c, ControlDesign d, std::string container) {
    declare(ControlKind::Label, c, std::move(d), std::move(container), {});
}

void ControlRegistry::entry(EntryField& f, EntryField design, Geometry g, std::string container,
                            Handler rule) {
    f = std::move(design);
    placeField(f.name(), g);
    connect(add({.kind = ControlKind::Entry,
                 .name = f.name(),
                 .container = std::move(container),
                 .field = &f,
                 .handler = ignoringRow(std::move(rule))}));
}

void ControlRegistry::checkBox(CheckBox& c, ControlDesign d, Check16 value, std::string container,
                               Handler onClick) {
    declare(ControlKind::CheckBox, c, std::move(d), std::move(container), std::move(onClick));
    c.value = value;
}

void ControlRegistry::button(Control& c, ControlDesign d, std::string container, Handler onClick) {
    declare(ControlKind::Button, c, std::move(d), std::move(container), std::move(onClick));
}

void ControlRegistry::menu(MenuEntry& m, ControlDesign d) {
    m.checked = false;
    // Opening a menu changes nothing.
    declare(ControlKind::Menu, m, std::move(d), {}, [] {});
}

void ControlRegistry::menuEntry(MenuEntry& m, ControlDesign d, std::string menu, Handler onClick,
                                MenuStyle style) {
    m.checked = false;
    Item& item = declare(ControlKind::Menu, m, std::move(d), std::move(menu), std::move(onClick));
    item.checkable = style.checkable;
    item.separatorBefore = style.separatorBefore;
}

void ControlRegistry::labelRows(std::string name, std::deque<Control>& rows,
                                std::string container) {
    add({.kind = ControlKind::Label,
         .name = std::move(name),
         .container = std::move(container),
         .controlRows = &rows});
}

void ControlRegistry::entryRows(std::string name, std::deque<EntryField>& rows,
                                std::string container, RowHandler rule) {
    connect(add({.kind = ControlKind::Entry,
                 .name = std::move(name),
                 .container = std::move(container),
                 .fieldRows = &rows,
                 .handler = std::move(rule)}));
}

void ControlRegistry::connect(const Item& item) {
    if (item.kind != ControlKind::Entry || !item.handler) return;
    const auto listen = [this](EntryField& f, const RowHandler& rule, int row) {
        f.onValueChanged([this, rule, row] { runAndNotify([&] { rule(row); }); });
    };
    if (item.field != nullptr) listen(*item.field, item.handler, -1);
    for (int row = 0; row < item.rowCount(); ++row)
        listen((*item.fieldRows)[static_cast<std::size_t>(row)], item.handler, row);
}

void ControlRegistry::connectEntries() {
    for (const Item& item : items_) connect(item);
}

void ControlRegistry::setHandler(const std::string& name, Handler handler) {
    const Item& target = item(name);
    if (target.kind != ControlKind::Button && target.kind != ControlKind::Menu &&
        target.kind != ControlKind::CheckBox)
        throw std::invalid_argument(name + " is not a button, check box or menu entry");
    plugged_[name] = std::move(handler);
}

ControlRegistry::RowHandler ControlRegistry::handlerOf(const Item& item) const {
    const auto it = plugged_.find(item.name);
    return it != plugged_.end() ? ignoringRow(it->second) : item.handler;
}

// ---- Operations.

void ControlRegistry::notifyChanged() {
    // By index: a listener may add another.
    for (std::size_t i = 0; i < listeners_.size(); ++i) listeners_[i]();
}

void ControlRegistry::runAndNotify(const Handler& rule) {
    try {
        rule();
    } catch (...) {
        notifyChanged();
        throw;
    }
    notifyChanged();
}

std::optional<std::string> ControlRegistry::refusal(const std::string& name) const {
    const Ref ref = find(name);
    const std::string what = describe(ref);
    if (ref.item->kind == ControlKind::Entry) {
        if (!fieldAt(ref).enabled()) return what + " is disabled";
    } else {
        const Control& c = controlAt(ref);
        if (!c.enabled) return what + " is disabled";
        if (!c.visible) return what + " is not shown";
    }
    for (const Item* holder = findItem(ref.item->container); holder != nullptr;
         holder = findItem(holder->container)) {
        const std::string where = describe({holder, -1});
        if (!holder->control->enabled) return what + " is disabled (" + where + " is disabled)";
        if (!holder->control->visible) return what + " is not shown (" + where + " is hidden)";
    }
    return std::nullopt;
}

std::optional<std::string> ControlRegistry::click(const std::string& name) {
    const Ref ref = find(name);
    const ControlKind kind = ref.item->kind;
    if (kind != ControlKind::Button && kind != ControlKind::Menu && kind != ControlKind::CheckBox)
        return describe(ref) + " cannot be clicked";
    if (std::optional<std::string> why = refusal(name)) return why;
    const RowHandler handler = handlerOf(*ref.item);
    runAndNotify([&] {
        if (kind == ControlKind::CheckBox) {
            auto& box = static_cast<CheckBox&>(controlAt(ref));
            box.value = box.checked() ? kUnchecked : kChecked;
        }
        if (handler) {
            handler(ref.row);
        } else {
            ui_.message(describe(ref) + " is not available in this version yet.",
                        MessageKind::Information);
        }
    });
    return std::nullopt;
}

std::optional<std::string> ControlRegistry::setChecked(const std::string& name, bool on) {
    const Ref ref = find(name);
    const bool box = ref.item->kind == ControlKind::CheckBox;
    if (!box && !(ref.item->kind == ControlKind::Menu && ref.item->checkable))
        return describe(ref) + " has no check mark";
    if (std::optional<std::string> why = refusal(name)) return why;
    if (checkedOf(*ref.item, ref.row) == on) return std::nullopt;
    // A check box takes the new value before its rule runs; a menu entry's rule toggles it.
    if (box) static_cast<CheckBox&>(controlAt(ref)).value = on ? kChecked : kUnchecked;
    const RowHandler handler = handlerOf(*ref.item);
    runAndNotify([&] {
        if (handler) handler(ref.row);
    });
    if (checkedOf(*ref.item, ref.row) != on) return describe(ref) + " did not change";
    return std::nullopt;
}

std::optional<std::string> ControlRegistry::enterText(const std::string& name,
                                                      std::string_view text) {
    const Ref ref = find(name);
    if (ref.item->kind != ControlKind::Entry) return describe(ref) + " takes no value";
    if (std::optional<std::string> why = refusal(name)) return why;
    return fieldAt(ref).enterText(text);
}

std::optional<std::string> ControlRegistry::step(const std::string& name, int direction) {
    const Ref ref = find(name);
    if (ref.item->kind != ControlKind::Entry) return describe(ref) + " takes no value";
    if (std::optional<std::string> why = refusal(name)) return why;
    return fieldAt(ref).step(direction);
}

// ---- Looking up.

const ControlRegistry::Item* ControlRegistry::findItem(std::string_view base) const {
    if (base.empty()) return nullptr;
    for (const Item& item : items_) {
        if (item.name == base) return &item;
    }
    return nullptr;
}

ControlRegistry::Ref ControlRegistry::find(const std::string& name) const {
    std::string_view base = name;
    int row = -1;
    if (const auto open = name.find('('); open != std::string::npos) {
        const char* first = name.data() + open + 1;
        const char* last = name.data() + name.size() - 1;
        const auto [end, ec] = std::from_chars(first, last, row);
        if (name.back() != ')' || ec != std::errc() || end != last || row < 0)
            throw std::invalid_argument("'" + name + "' is no control name (expected NAME or " +
                                        "NAME(ROW) with ROW a whole number from 0)");
        base = std::string_view(name).substr(0, open);
    }
    const Item* item = findItem(base);
    if (item == nullptr) throw std::invalid_argument("no control is named '" + name + "'");
    if (item->hasRows() != (row >= 0))
        throw std::invalid_argument(item->hasRows()
                                        ? "'" + name + "' needs a row, e.g. " + rowName(name, 0)
                                        : "'" + item->name + "' has no rows");
    if (row >= item->rowCount())
        throw std::invalid_argument(name + " does not exist (rows 0 to " +
                                    std::to_string(item->rowCount() - 1) + ")");
    return {item, row};
}

const ControlRegistry::Item& ControlRegistry::item(const std::string& name) const {
    if (name.find('(') != std::string::npos) return *find(name).item;
    const Item* found = findItem(name);
    if (found == nullptr) throw std::invalid_argument("no control is named '" + name + "'");
    return *found;
}

Control& ControlRegistry::controlAt(const Ref& ref) {
    const Item& item = *ref.item;
    if (item.controlRows != nullptr) return (*item.controlRows)[static_cast<std::size_t>(ref.row)];
    if (item.control == nullptr) throw std::invalid_argument(item.name + " is an entry field");
    return *item.control;
}

EntryField& ControlRegistry::fieldAt(const Ref& ref) {
    const Item& item = *ref.item;
    if (item.fieldRows != nullptr) return (*item.fieldRows)[static_cast<std::size_t>(ref.row)];
    if (item.field == nullptr) throw std::invalid_argument(item.name + " is no entry field");
    return *item.field;
}

const Control& ControlRegistry::controlOf(const Item& item, int row) {
    return controlAt({&item, row});
}

const EntryField& ControlRegistry::fieldOf(const Item& item, int row) {
    return fieldAt({&item, row});
}

bool ControlRegistry::checkedOf(const Item& item, int row) {
    const Control& c = controlOf(item, row);
    if (item.kind == ControlKind::CheckBox) return static_cast<const CheckBox&>(c).checked();
    if (item.kind == ControlKind::Menu) return static_cast<const MenuEntry&>(c).checked;
    return false;
}

Control& ControlRegistry::control(const std::string& name) {
    return controlAt(find(name));
}

const Control& ControlRegistry::control(const std::string& name) const {
    return controlAt(find(name));
}

EntryField& ControlRegistry::field(const std::string& name) {
    return fieldAt(find(name));
}

const EntryField& ControlRegistry::field(const std::string& name) const {
    return fieldAt(find(name));
}

bool ControlRegistry::checked(const std::string& name) const {
    const Ref ref = find(name);
    return checkedOf(*ref.item, ref.row);
}

Geometry ControlRegistry::fieldGeometry(const std::string& name) const {
    find(name);
    const auto it = fieldGeometry_.find(name);
    return it == fieldGeometry_.end() ? Geometry{} : it->second;
}

std::string ControlRegistry::describe(const Ref& ref) const {
    const std::string name = ref.row >= 0 ? rowName(ref.item->name, ref.row) : ref.item->name;
    if (ref.item->kind == ControlKind::Entry) return name;
    const std::string caption = plainCaption(controlAt(ref).caption);
    return caption.empty() ? name : caption;
}

std::string ControlRegistry::describe(const std::string& name) const {
    return describe(find(name));
}

}  // namespace zp

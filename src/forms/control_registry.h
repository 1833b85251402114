#pragma once
// A form model's one table of controls: each control by name with its kind, the frame or menu it
// sits in and what it does. The JSON view, the Qt binder and the command line all go through the
// table, so a control declared here shows up everywhere. The operations apply the enabling rule
// first: a disabled or hidden control, or one inside a disabled or hidden frame or menu, is refused
// with the reason, as the window would not let the person reach it.

#include <deque>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "core/entry_field.h"
#include "forms/controls.h"
#include "forms/interaction.h"

namespace zp {

enum class ControlKind { Window, Frame, Label, Entry, CheckBox, Button, Menu };

// What the window's design gives a control.
struct ControlDesign {
    std::string name;
    std::string caption;
    Geometry geometry{};
};

// How a menu entry shows: with a check mark, after a separator line.
struct MenuStyle {
    bool checkable = false;
    bool separatorBefore = false;
};

class ControlRegistry {
  public:
    using Handler = std::function<void()>;
    using RowHandler = std::function<void(int row)>;

    // One line of the table. A row group stands for the controls "name(0)", "name(1)", ...
    struct Item {
        ControlKind kind = ControlKind::Label;
        std::string name{};
        std::string container{};  // the frame or menu it sits in; empty for the window's own
        Control* control = nullptr;
        std::deque<Control>* controlRows = nullptr;
        EntryField* field = nullptr;
        std::deque<EntryField>* fieldRows = nullptr;
        // The click rule, or an entry's value rule (with the row; -1 outside a row group). Empty
        // on a button or menu entry: the control is not available in this version yet.
        RowHandler handler{};
        bool checkable = false;  // menu entries with a check mark
        bool separatorBefore = false;

        bool hasRows() const { return controlRows != nullptr || fieldRows != nullptr; }
        int rowCount() const;
    };

    explicit ControlRegistry(Interaction& ui) : ui_(ui) {}
    ControlRegistry(const ControlRegistry&) = delete;
    ControlRegistry& operator=(const ControlRegistry&) = delete;

    // ---- Declaring, in the order views and the JSON show the controls. Each declaration also puts
    // the control into its designed state, so a model's reset declares the table anew. Containers
    // must be declared before what they hold.
    void clear();
    void window(Control& c, ControlDesign d);
    void frame(Control& c, ControlDesign d, std::string container = {});
    void label(Control& c, ControlDesign d, std::string container);
    void entry(EntryField& f, EntryField design, Geometry g, std::string container, Handler rule);
    void checkBox(CheckBox& c, ControlDesign d, Check16 value, std::string container,
                  Handler onClick);
    void button(Control& c, ControlDesign d, std::string container, Handler onClick);
    void menu(MenuEntry& m, ControlDesign d);
    void menuEntry(MenuEntry& m, ControlDesign d, std::string menu, Handler onClick,
                   MenuStyle style = {});
    // Row groups: the model fills the rows (and may add or drop some later); the table only
    // refers to them.
    void labelRows(std::string name, std::deque<Control>& rows, std::string container);
    void entryRows(std::string name, std::deque<EntryField>& rows, std::string container,
                   RowHandler rule);
    // The designed position of a field (entry fields keep no geometry of their own).
    void placeField(const std::string& name, Geometry g) { fieldGeometry_[name] = g; }
    // Gives the fields their rules again: assigning a field or adding a row drops its listener.
    void connectEntries();
    // A handler a later version plugs in (e.g. Apply); it outlives the table's resets.
    void setHandler(const std::string& name, Handler handler);

    // ---- What a person does. Each returns the reason when the control refuses; views refresh
    // once after an operation that ran.
    std::optional<std::string> click(const std::string& name);
    // Sets a check box or a menu check mark; a control that already shows `on` is left alone.
    std::optional<std::string> setChecked(const std::string& name, bool on);
    std::optional<std::string> enterText(const std::string& name, std::string_view text);
    std::optional<std::string> step(const std::string& name, int direction);
    // Why the control cannot be used now; nothing when it can.
    std::optional<std::string> refusal(const std::string& name) const;

    // ---- Looking up. Names are the control names, rows as "VexoEdit_width(2)"; an unknown name
    // or a missing row throws std::invalid_argument.
    const std::vector<Item>& items() const { return items_; }
    // The table line of a control, of a row, or of a row group by its plain name.
    const Item& item(const std::string& name) const;
    Control& control(const std::string& name);
    const Control& control(const std::string& name) const;
    EntryField& field(const std::string& name);
    const EntryField& field(const std::string& name) const;
    bool checked(const std::string& name) const;
    Geometry fieldGeometry(const std::string& name) const;
    // The shown name of a control in messages: its plain caption, or its name without one.
    std::string describe(const std::string& name) const;

    // A table line's control or field; `row` is -1 outside a row group.
    static const Control& controlOf(const Item& item, int row);
    static const EntryField& fieldOf(const Item& item, int row);
    static bool checkedOf(const Item& item, int row);
    static std::string rowName(const std::string& base, int row);

    // ---- Change notification: views refresh from the model after every change.
    void onChanged(std::function<void()> listener) { listeners_.push_back(std::move(listener)); }
    void notifyChanged();

  private:
    struct Ref {
        const Item* item;
        int row;  // -1 outside a row group
    };
    Ref find(const std::string& name) const;
    const Item* findItem(std::string_view base) const;
    Item& add(Item item);
    // Puts a control into its designed state and adds its line.
    Item& declare(ControlKind kind, Control& c, ControlDesign d, std::string container,
                  Handler handler);
    RowHandler handlerOf(const Item& item) const;
    std::string describe(const Ref& ref) const;
    void connect(const Item& item);
    // Runs a rule and tells the views once, also when the rule fails.
    void runAndNotify(const Handler& rule);
    static Control& controlAt(const Ref& ref);
    static EntryField& fieldAt(const Ref& ref);

    Interaction& ui_;
    std::vector<Item> items_;
    std::map<std::string, Handler> plugged_;
    std::map<std::string, Geometry> fieldGeometry_;
    std::vector<std::function<void()>> listeners_;
};

// The base of every window model: its table of controls and the person at the screen. A model
// declares its controls into the table; views and the command line take it from there.
class FormModel {
  public:
    explicit FormModel(Interaction& ui) : ui_(ui), controls_(ui) {}
    virtual ~FormModel() = default;
    FormModel(const FormModel&) = delete;
    FormModel& operator=(const FormModel&) = delete;

    ControlRegistry& controls() { return controls_; }
    const ControlRegistry& controls() const { return controls_; }
    Interaction& ui() { return ui_; }
    void onChanged(std::function<void()> listener) { controls_.onChanged(std::move(listener)); }
    void notifyChanged() { controls_.notifyChanged(); }

  protected:
    Interaction& ui_;
    ControlRegistry controls_;
};

}  // namespace zp

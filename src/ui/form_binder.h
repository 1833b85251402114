#pragma once
// Binds a window's widgets to a form model's table of controls: it builds each control's widget
// under the control's name, shows the model in all of them once per change, and sends clicks,
// check marks and entries to the table's operations. A window's view is its layout plus bind().
//
// Row controls are named as in the table, e.g. "VexoEdit_width(2)", and carry their row number in
// the property "row". Before a click runs, a field left with a refused entry gets the focus back
// and the click does not happen.

#include <QObject>
#include <QPointer>
#include <QString>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "forms/control_registry.h"

class QCheckBox;
class QGroupBox;
class QLabel;
class QMenuBar;
class QPushButton;
class QWidget;

namespace zp::ui {

class NumericEntry;

class FormBinder : public QObject {
    Q_OBJECT
  public:
    // `window` shows the model's window control (its title).
    FormBinder(FormModel& model, QWidget* window, Interaction& ui);
    ~FormBinder() override;

    // ---- Builders: the widget of the control of that name, for the layout to place.
    QGroupBox* frame(const std::string& name);
    QLabel* label(const std::string& name);
    QPushButton* button(const std::string& name);
    QCheckBox* checkBox(const std::string& name);
    NumericEntry* entry(const std::string& name);
    // Every menu and menu entry of the table, in its order, on the menu bar.
    void menus(QMenuBar* bar);
    // A label that shows `text` after every change; for facts that are no control of the table.
    QLabel* textLabel(const QString& objectName, std::function<std::string()> text);
    // Lays out the widgets of a row whenever a row appears; a row that goes takes its widgets.
    void rows(std::function<void(int row)> place);
    // What a button or menu entry does in this view instead of in the model (e.g. Minimize).
    void onClick(const std::string& name, std::function<void()> handler);

    // Connects to the model and shows it. Throws std::logic_error when a control of the table
    // has no widget: a control the layout forgot.
    void bind();
    // Shows every control as the model has it.
    void refresh();
    // Runs a button or menu entry as its click does.
    void trigger(const std::string& name);

    template <class W>
    W* widget(const std::string& name) const {
        const auto it = widgets_.find(name);
        return it == widgets_.end() ? nullptr : qobject_cast<W*>(it->second.data());
    }
    int shownRows() const { return placedRows_; }
    // How often the view was refreshed (one refresh per change).
    int refreshCount() const { return refreshes_; }

  signals:
    // An entry or a control refused, with the reason.
    void refused(const QString& reason);
    // An entry was taken.
    void entered();

  private:
    template <class W>
    W* adopt(const std::string& name, ControlKind kind, W* widget);
    void show(const ControlRegistry::Item& item, int row, QObject* widget);
    void placeRows();
    // Commits a field still holding typed text; false when it refused (it keeps the focus).
    bool commitPending();
    void check(const std::string& name, bool on);
    // Runs an operation of the table; a refusal or a failure is told, never thrown.
    void run(const std::function<std::optional<std::string>()>& operation);

    FormModel& model_;
    ControlRegistry& controls_;
    QPointer<QWidget> window_;
    Interaction& ui_;
    std::shared_ptr<bool> alive_;
    std::map<std::string, QPointer<QObject>> widgets_;
    std::vector<std::pair<QPointer<QLabel>, std::function<std::string()>>> texts_;
    std::map<std::string, std::function<void()>> viewHandlers_;
    std::function<void(int)> placeRow_;
    int placedRows_ = 0;
    int refreshes_ = 0;
    bool refreshing_ = false;
};

}  // namespace zp::ui

#include "ui/form_binder.h"

#include <QAction>
#include <QCheckBox>
#include <QGroupBox>
#include <QLabel>
#include <QMenu>
#include <QMenuBar>
#include <QPushButton>
#include <algorithm>
#include <stdexcept>

#include "instruments/instrument_error.h"
#include "ui/numeric_entry.h"

namespace zp::ui {
namespace {

QString text(const std::string& s) {
    return QString::fromStdString(s);
}

void showState(QWidget* w, const Control& c) {
    w->setEnabled(c.enabled);
    // Hidden by the model only; a shown window shows the rest.
    if (w->isHidden() == c.visible) w->setVisible(c.visible);
}

// The row of a row control's name, -1 for others: "VexoEdit_width(2)" -> 2.
int rowOf(const std::string& name) {
    const auto open = name.find('(');
    return open == std::string::npos ? -1 : std::stoi(name.substr(open + 1));
}

}  // namespace

FormBinder::FormBinder(FormModel& model, QWidget* window, Interaction& ui)
    : model_(model),
      controls_(model.controls()),
      window_(window),
      ui_(ui),
      alive_(std::make_shared<bool>(true)) {}

FormBinder::~FormBinder() {
    alive_.reset();
    // Fields outlive this binder only on their way out; they must not call it any more.
    for (auto& [name, object] : widgets_) {
        if (auto* entry = qobject_cast<NumericEntry*>(object.data())) entry->unbind();
    }
}

// ---- Builders.

template <class W>
W* FormBinder::adopt(const std::string& name, ControlKind kind, W* widget) {
    if (controls_.item(name).kind != kind)
        throw std::logic_error("the control " + name + " is not of the kind its widget shows");
    if (widgets_.count(name) != 0) throw std::logic_error("the control " + name + " has a widget");
    widget->setObjectName(text(name));
    if (const int row = rowOf(name); row >= 0) widget->setProperty("row", row);
    widgets_[name] = widget;
    return widget;
}

QGroupBox* FormBinder::frame(const std::string& name) {
    return adopt(name, ControlKind::Frame, new QGroupBox);
}

QLabel* FormBinder::label(const std::string& name) {
    auto* label = adopt(name, ControlKind::Label, new QLabel);
    label->setTextFormat(Qt::PlainText);
    return label;
}

QPushButton* FormBinder::button(const std::string& name) {
    auto* button = adopt(name, ControlKind::Button, new QPushButton);
    connect(button, &QPushButton::clicked, this, [this, name] { trigger(name); });
    return button;
}

QCheckBox* FormBinder::checkBox(const std::string& name) {
    auto* box = adopt(name, ControlKind::CheckBox, new QCheckBox);
    connect(box, &QCheckBox::clicked, this, [this, name](bool on) { check(name, on); });
    return box;
}

NumericEntry* FormBinder::entry(const std::string& name) {
    auto sink = [this, name](const NumericEntry::Edit& edit) -> std::optional<std::string> {
        std::optional<std::string> refusal;
        run([&] {
            refusal =
                edit.text ? controls_.enterText(name, *edit.text) : controls_.step(name, edit.step);
            return std::nullopt;  // the field shows its own refusal
        });
        return refusal;
    };
    auto* entry = adopt(name, ControlKind::Entry, new NumericEntry(controls_.field(name), sink));
    connect(entry, &NumericEntry::entered, this, &FormBinder::entered);
    connect(entry, &NumericEntry::refused, this, &FormBinder::refused);
    return entry;
}

void FormBinder::menus(QMenuBar* bar) {
    for (const ControlRegistry::Item& item : controls_.items()) {
        if (item.kind != ControlKind::Menu) continue;
        const QString caption = text(ControlRegistry::controlOf(item, -1).caption);
        if (item.container.empty()) {
            adopt(item.name, ControlKind::Menu, bar->addMenu(caption));
            continue;
        }
        auto* menu = widget<QMenu>(item.container);
        if (menu == nullptr) throw std::logic_error(item.name + " has no menu to go in");
        if (item.separatorBefore) menu->addSeparator();
        QAction* action = adopt(item.name, ControlKind::Menu, menu->addAction(caption));
        action->setCheckable(item.checkable);
        connect(action, &QAction::triggered, this, [this, name = item.name] { trigger(name); });
    }
}

QLabel* FormBinder::textLabel(const QString& objectName, std::function<std::string()> shown) {
    auto* label = new QLabel;
    label->setObjectName(objectName);
    label->setTextFormat(Qt::PlainText);
    texts_.emplace_back(label, std::move(shown));
    return label;
}

void FormBinder::rows(std::function<void(int row)> place) {
    placeRow_ = std::move(place);
}

void FormBinder::onClick(const std::string& name, std::function<void()> handler) {
    controls_.item(name);  // the control must exist
    viewHandlers_[name] = std::move(handler);
}

// ---- Showing the model.

void FormBinder::bind() {
    refresh();
    std::string missing;
    for (const ControlRegistry::Item& item : controls_.items()) {
        if (item.kind == ControlKind::Window) continue;
        const std::string name =
            item.hasRows() ? ControlRegistry::rowName(item.name, 0) : item.name;
        if (item.hasRows() && item.rowCount() == 0) continue;
        if (widgets_.count(name) == 0) missing += (missing.empty() ? "" : ", ") + name;
    }
    if (!missing.empty()) throw std::logic_error("no widget for the controls " + missing);
    // The model may outlive this view: a listener left behind then does nothing.
    model_.onChanged([weak = std::weak_ptr<bool>(alive_), this] {
        if (weak.lock()) refresh();
    });
}

void FormBinder::placeRows() {
    int rows = 0;
    for (const ControlRegistry::Item& item : controls_.items()) {
        if (!item.hasRows()) continue;
        rows = std::max(rows, item.rowCount());
        // Widgets of rows that went: deleted once the event that got here is over.
        for (int row = item.rowCount();; ++row) {
            const auto it = widgets_.find(ControlRegistry::rowName(item.name, row));
            if (it == widgets_.end()) break;
            if (auto* entry = qobject_cast<NumericEntry*>(it->second.data())) entry->unbind();
            if (auto* w = qobject_cast<QWidget*>(it->second.data())) {
                w->hide();
                w->deleteLater();
            }
            widgets_.erase(it);
        }
    }
    placedRows_ = std::min(placedRows_, rows);
    while (placeRow_ && placedRows_ < rows) placeRow_(placedRows_++);
}

void FormBinder::refresh() {
    // A refresh can arrive from inside another (a rule run by a widget's own write).
    if (refreshing_) return;
    refreshing_ = true;
    ++refreshes_;
    placeRows();
    for (const ControlRegistry::Item& item : controls_.items()) {
        if (item.kind == ControlKind::Window) {
            if (window_)
                window_->setWindowTitle(text(ControlRegistry::controlOf(item, -1).caption));
            continue;
        }
        const int rows = item.hasRows() ? item.rowCount() : 1;
        for (int row = 0; row < rows; ++row) {
            const int r = item.hasRows() ? row : -1;
            const auto it =
                widgets_.find(r >= 0 ? ControlRegistry::rowName(item.name, r) : item.name);
            if (it != widgets_.end() && it->second) show(item, r, it->second.data());
        }
    }
    for (auto& [label, shown] : texts_) {
        if (label) label->setText(text(shown()));
    }
    refreshing_ = false;
}

void FormBinder::show(const ControlRegistry::Item& item, int row, QObject* widget) {
    if (item.kind == ControlKind::Entry) {
        static_cast<NumericEntry*>(widget)->refresh();
        return;
    }
    const Control& c = ControlRegistry::controlOf(item, row);
    QString caption = text(c.caption);
    if (auto* action = qobject_cast<QAction*>(widget)) {
        action->setText(caption);
        action->setEnabled(c.enabled);
        action->setVisible(c.visible);
        if (action->isCheckable()) action->setChecked(ControlRegistry::checkedOf(item, row));
    } else if (auto* menu = qobject_cast<QMenu*>(widget)) {
        menu->setTitle(caption);
        menu->menuAction()->setEnabled(c.enabled);
        menu->menuAction()->setVisible(c.visible);
    } else if (auto* label = qobject_cast<QLabel*>(widget)) {
        label->setText(caption.replace(QStringLiteral("\r\n"), QStringLiteral("\n")));
        showState(label, c);
    } else if (auto* box = qobject_cast<QCheckBox*>(widget)) {
        box->setText(caption);
        box->setChecked(ControlRegistry::checkedOf(item, row));
        showState(box, c);
    } else if (auto* button = qobject_cast<QPushButton*>(widget)) {
        button->setText(caption);
        showState(button, c);
    } else if (auto* frame = qobject_cast<QGroupBox*>(widget)) {
        frame->setTitle(caption);
        showState(frame, c);
    }
}

// ---- What the person does.

bool FormBinder::commitPending() {
    for (auto& [name, object] : widgets_) {
        auto* entry = qobject_cast<NumericEntry*>(object.data());
        if (entry == nullptr || !entry->isModified()) continue;
        if (!entry->commitOnLeave()) return false;
    }
    return true;
}

void FormBinder::trigger(const std::string& name) {
    if (!commitPending()) {
        refresh();  // a menu check mark Qt has already toggled shows the model again
        return;
    }
    const auto local = viewHandlers_.find(name);
    if (local != viewHandlers_.end()) {
        // The handler may replace itself; run a copy.
        const std::function<void()> handler = local->second;
        handler();
        return;
    }
    run([&] { return controls_.click(name); });
}

void FormBinder::check(const std::string& name, bool on) {
    if (!commitPending()) {
        refresh();  // the box Qt has already toggled shows the model again
        return;
    }
    run([&] { return controls_.setChecked(name, on); });
}

void FormBinder::run(const std::function<std::optional<std::string>()>& operation) {
    std::optional<std::string> refusal;
    try {
        refusal = operation();
    } catch (const InstrumentError& e) {
        ui_.message(e.description(), MessageKind::Warning);
    } catch (const std::exception& e) {
        ui_.message(e.what(), MessageKind::Warning);
    }
    if (refusal) {
        emit refused(text(*refusal));
        refresh();
    }
}

}  // namespace zp::ui

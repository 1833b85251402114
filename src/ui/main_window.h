#pragma once
// The main window as a thin view of MainForm. Every widget carries the model control's name as its
// objectName; row controls use the model's row names, e.g. "VexoEdit_width(2)" and "lbl_gate(5)",
// and also carry the row number in the dynamic property "row". All widgets are refreshed from the
// model after every change; clicks and entries go to the model's handlers.

#include <QMainWindow>
#include <QString>
#include <functional>
#include <map>
#include <memory>
#include <vector>

#include "forms/main_form.h"

class QAction;
class QCheckBox;
class QGridLayout;
class QGroupBox;
class QLabel;
class QMenu;
class QPushButton;

namespace zp::ui {

class NumericEntry;

class MainWindow : public QMainWindow {
    Q_OBJECT
  public:
    MainWindow(MainForm& form, Interaction& ui, QWidget* parent = nullptr);
    ~MainWindow() override;

    // Shows every control as the model has it.
    void refresh();
    // Restores a minimised window and brings it to the front (a second start asked for it).
    void bringToFront();

    // Replaces what a button or menu entry does, by its objectName; windows that later versions
    // add plug in here. Until then those entries say that they are not available yet.
    void setHandler(const QString& objectName, std::function<void()> handler);
    // Runs the handler of a button or menu entry as its click does.
    void trigger(const QString& objectName);

    NumericEntry* entry(const QString& objectName) const;
    int shownRows() const { return static_cast<int>(rows_.size()); }

  private:
    struct Row {
        QLabel* label = nullptr;
        NumericEntry* width = nullptr;
        NumericEntry* delay = nullptr;
    };

    void buildMenus();
    QWidget* buildCentral();
    void buildRows();
    QPushButton* makeButton(const Control& c);
    QLabel* makeLabel(const Control& c);
    QGroupBox* makeFrame(const Control& c);
    // A check box whose click runs `onClick` with the new state as a model handler.
    QCheckBox* makeCheckBox(const CheckBox& c, std::function<void(bool)> onClick);
    NumericEntry* makeEntry(EntryField& field);
    QAction* makeAction(QMenu* menu, const MenuEntry& entry, bool checkable);
    void notAvailable(const Control& c);
    // Runs a model handler; a failure it did not report itself is shown, then all is refreshed.
    void run(const std::function<void()>& handler);

    MainForm& form_;
    Interaction& ui_;
    std::shared_ptr<bool> alive_;
    std::map<QString, std::function<void()>> handlers_;
    std::vector<std::function<void()>> refreshers_;  // fixed controls
    std::vector<NumericEntry*> entries_;             // fixed entry fields
    std::vector<Row> rows_;
    QGroupBox* gatesFrame_ = nullptr;
    QGridLayout* gatesGrid_ = nullptr;
    bool refreshing_ = false;
};

}  // namespace zp::ui

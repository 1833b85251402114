#pragma once
// The main window: the layout of MainForm's controls, bound to the model by a FormBinder. Every
// widget carries its control's name as objectName (rows as "VexoEdit_width(2)", with the property
// "row"). The status line holds the refusal of the last entry and, permanently, the analyzer and
// whether a Calculate is needed.

#include <QMainWindow>
#include <QString>

#include "forms/main_form.h"
#include "ui/form_binder.h"

class QGridLayout;

namespace zp::ui {

class NumericEntry;

class MainWindow : public QMainWindow {
    Q_OBJECT
  public:
    MainWindow(MainForm& form, Interaction& ui, QWidget* parent = nullptr);
    ~MainWindow() override;

    // Restores a minimised window and brings it to the front (a second start asked for it).
    void bringToFront();
    // Runs a button or menu entry as its click does.
    void trigger(const QString& objectName);

    FormBinder& binder() { return binder_; }
    int shownRows() const { return binder_.shownRows(); }

  private:
    QWidget* layOut();
    void placeRow(int row);
    NumericEntry* field(const std::string& name);

    FormBinder binder_;
    QGridLayout* gatesGrid_ = nullptr;
};

}  // namespace zp::ui

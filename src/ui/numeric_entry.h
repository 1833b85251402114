#pragma once
// A text box bound to one EntryField: shows its value in a readable unit, takes typed values with
// units or multiplier letters ("10k", "2.5 us") on Enter or when the focus leaves, and steps the
// value with the Up/Down keys and the mouse wheel. Refused entries show their reason and the old
// value comes back.

#include <QLineEdit>
#include <QString>

#include "core/entry_field.h"

namespace zp::ui {

class NumericEntry : public QLineEdit {
    Q_OBJECT
  public:
    explicit NumericEntry(EntryField& field, QWidget* parent = nullptr);

    EntryField& field() { return *field_; }
    // Rebinds (the model's rows are rebuilt when the analyzer is identified).
    void bind(EntryField& field);

    // Shows the field's current value and enabled state; never runs the field's rules.
    void refresh();

    // The typed text as a user's entry; false when refused (the reason is shown).
    bool commit();
    // One step up (+1) or down (-1) as a user's entry.
    bool stepBy(int direction);

    // The reason of the last refusal, empty after an accepted entry or a refresh.
    const QString& lastError() const { return lastError_; }

  signals:
    // After an accepted entry (the field's rules have run).
    void entered();
    // After a refused entry, with the reason.
    void refused(const QString& reason);

  protected:
    void keyPressEvent(QKeyEvent* event) override;
    void wheelEvent(QWheelEvent* event) override;
    void focusOutEvent(QFocusEvent* event) override;

  private:
    bool accept(const std::optional<std::string>& refusal);
    void showError(const QString& reason);
    void clearError();

    EntryField* field_;
    QString lastError_;
    int wheelRemainder_ = 0;
};

}  // namespace zp::ui

#pragma once
// A text box showing one EntryField: its value in a readable unit. Typed values with units or
// multiplier letters ("10k", "2.5 us") are entered on Enter or when the focus leaves; Up/Down and
// the mouse wheel (while the box has the focus) step the value. Entries go to a sink, which
// answers with the refusal reason or nothing. A refused Enter or step brings the old value back;
// a refused entry made by leaving the box keeps the typed text and takes the focus back, so the
// person corrects it (or presses Esc) before doing anything else.

#include <QLineEdit>
#include <QString>
#include <functional>
#include <optional>
#include <string>

#include "core/entry_field.h"

namespace zp::ui {

class NumericEntry : public QLineEdit {
    Q_OBJECT
  public:
    // Typed text, or a step of +1 or -1.
    struct Edit {
        std::optional<std::string> text;
        int step = 0;
    };
    using Sink = std::function<std::optional<std::string>(const Edit&)>;

    NumericEntry(const EntryField& field, Sink sink, QWidget* parent = nullptr);

    // Its field went (a row was dropped): from now on it shows and takes nothing.
    void unbind();

    // Shows the field's current value and enabled state; typed text that was refused on leaving
    // stays until it is corrected or thrown away.
    void refresh();

    // The typed text as a person's Enter; false when refused.
    bool commit();
    // The typed text as the focus leaves; false when refused.
    bool commitOnLeave();
    // One step up (+1) or down (-1) as a person's entry.
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
    bool accept(const std::optional<std::string>& refusal, bool keepText);
    void showError(const QString& reason);
    void clearError();

    const EntryField* field_;
    Sink sink_;
    QString lastError_;
    bool holdsRefusedText_ = false;
    int wheelRemainder_ = 0;
};

}  // namespace zp::ui

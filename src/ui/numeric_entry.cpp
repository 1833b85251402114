#include "ui/numeric_entry.h"

#include <QFocusEvent>
#include <QKeyEvent>
#include <QStyle>
#include <QToolTip>
#include <QWheelEvent>

namespace zp::ui {

NumericEntry::NumericEntry(EntryField& field, QWidget* parent) : QLineEdit(parent), field_(&field) {
    setObjectName(QString::fromStdString(field.name()));
    setAlignment(Qt::AlignRight | Qt::AlignVCenter);
    refresh();
}

void NumericEntry::bind(EntryField& field) {
    field_ = &field;
    setObjectName(QString::fromStdString(field.name()));
    refresh();
}

void NumericEntry::refresh() {
    clearError();
    setEnabled(field_->enabled());
    const QString text = QString::fromStdString(field_->displayText());
    if (QLineEdit::text() != text) setText(text);
    setModified(false);
    setToolTip(QString::fromStdString(field_->unitList()).isEmpty()
                   ? QString()
                   : tr("Type a value such as 10k or 2.5 us; Up/Down or the wheel steps it."));
}

bool NumericEntry::commit() {
    if (!isModified()) return true;
    return accept(field_->enterText(text().toStdString()));
}

bool NumericEntry::stepBy(int direction) {
    if (isModified() && !commit()) return false;
    return accept(field_->step(direction));
}

bool NumericEntry::accept(const std::optional<std::string>& refusal) {
    if (refusal) {
        const QString reason = QString::fromStdString(*refusal);
        // The old value comes back; the reason stays visible until the next entry.
        setText(QString::fromStdString(field_->displayText()));
        setModified(false);
        showError(reason);
        emit refused(reason);
        return false;
    }
    // The field's rules may already have refreshed this widget through the model.
    refresh();
    emit entered();
    return true;
}

void NumericEntry::showError(const QString& reason) {
    lastError_ = reason;
    setProperty("invalid", true);
    setStyleSheet(QStringLiteral("QLineEdit { border: 2px solid #d02020; }"));
    setToolTip(reason);
    if (isVisible()) QToolTip::showText(mapToGlobal(QPoint(0, height())), reason, this);
}

void NumericEntry::clearError() {
    if (lastError_.isEmpty() && !property("invalid").toBool()) return;
    lastError_.clear();
    setProperty("invalid", false);
    setStyleSheet(QString());
}

void NumericEntry::keyPressEvent(QKeyEvent* event) {
    switch (event->key()) {
        case Qt::Key_Return:
        case Qt::Key_Enter:
            commit();
            selectAll();
            return;
        case Qt::Key_Up:
            stepBy(+1);
            return;
        case Qt::Key_Down:
            stepBy(-1);
            return;
        case Qt::Key_Escape:
            if (isModified()) {
                refresh();
                return;
            }
            break;
        default:
            break;
    }
    QLineEdit::keyPressEvent(event);
}

void NumericEntry::wheelEvent(QWheelEvent* event) {
    if (!isEnabled()) {
        event->ignore();
        return;
    }
    // One step per notch (120 units); touchpads deliver fractions that add up.
    wheelRemainder_ += event->angleDelta().y();
    while (wheelRemainder_ >= 120) {
        wheelRemainder_ -= 120;
        stepBy(+1);
    }
    while (wheelRemainder_ <= -120) {
        wheelRemainder_ += 120;
        stepBy(-1);
    }
    event->accept();
}

void NumericEntry::focusOutEvent(QFocusEvent* event) {
    // A popup (e.g. the context menu) takes the focus without ending the entry.
    if (event->reason() != Qt::PopupFocusReason) commit();
    QLineEdit::focusOutEvent(event);
}

}  // namespace zp::ui

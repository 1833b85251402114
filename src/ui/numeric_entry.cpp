#include "ui/numeric_entry.h"

#include <QFocusEvent>
#include <QKeyEvent>
#include <QTimer>
#include <QToolTip>
#include <QWheelEvent>

namespace zp::ui {

NumericEntry::NumericEntry(const EntryField& field, Sink sink, QWidget* parent)
    : QLineEdit(parent), field_(&field), sink_(std::move(sink)) {
    setObjectName(QString::fromStdString(field.name()));
    setAlignment(Qt::AlignRight | Qt::AlignVCenter);
    refresh();
}

void NumericEntry::unbind() {
    field_ = nullptr;
    sink_ = nullptr;
    setModified(false);
}

void NumericEntry::refresh() {
    if (field_ == nullptr) return;
    setEnabled(field_->enabled());
    if (holdsRefusedText_) return;
    clearError();
    const QString text = QString::fromStdString(field_->displayText());
    if (QLineEdit::text() != text) setText(text);
    setModified(false);
    setToolTip(QString::fromStdString(field_->unitList()).isEmpty()
                   ? QString()
                   : tr("Type a value such as 10k or 2.5 us; Up/Down or the wheel steps it."));
}

bool NumericEntry::commit() {
    if (!isModified() || !sink_) return true;
    return accept(sink_({text().toStdString(), 0}), false);
}

bool NumericEntry::commitOnLeave() {
    if (!isModified() || !sink_) return true;
    if (accept(sink_({text().toStdString(), 0}), true)) return true;
    // Taken back once the focus change that got here is over.
    QTimer::singleShot(0, this, [this] { setFocus(Qt::OtherFocusReason); });
    return false;
}

bool NumericEntry::stepBy(int direction) {
    if (!sink_) return false;
    if (isModified() && !commit()) return false;
    return accept(sink_({std::nullopt, direction}), false);
}

bool NumericEntry::accept(const std::optional<std::string>& refusal, bool keepText) {
    if (refusal) {
        const QString reason = QString::fromStdString(*refusal);
        holdsRefusedText_ = keepText;
        if (!keepText && field_ != nullptr) {
            setText(QString::fromStdString(field_->displayText()));
            setModified(false);
        }
        // The reason stays visible until the next entry.
        showError(reason);
        emit refused(reason);
        return false;
    }
    holdsRefusedText_ = false;
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
                holdsRefusedText_ = false;
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
    // Scrolling past the form must not change a value: only the box being edited steps.
    if (!isEnabled() || !hasFocus()) {
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
    if (event->reason() != Qt::PopupFocusReason) commitOnLeave();
    QLineEdit::focusOutEvent(event);
}

}  // namespace zp::ui

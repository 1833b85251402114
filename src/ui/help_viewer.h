#pragma once
// The in-program manual viewer, and the check that a help file named by the analyzer belongs to
// the manual before it is shown.

#include <QDialog>
#include <QString>
#include <QStringList>

class QLabel;
class QTextBrowser;

namespace zp::ui {

struct HelpFileCheck {
    QString path;   // canonical path, when usable
    QString error;  // the reason otherwise
    bool ok() const { return error.isEmpty(); }
};

// The file must exist and lie inside one of the manual folders (compared as canonical paths, so
// ".." and links cannot lead out of them).
HelpFileCheck checkHelpFile(const QString& file, const QStringList& manualFolders);

// The program's own manual: zentra-pulse.html in the first manual folder that has it.
HelpFileCheck ownManual(const QStringList& manualFolders);

class HelpViewer : public QDialog {
    Q_OBJECT
  public:
    explicit HelpViewer(QWidget* parent = nullptr);

    // Shows `path` (already checked) at the anchor "topic-<topic>"; `note` (one line, may be
    // empty) says above it why this manual is shown.
    void showTopic(const QString& path, int topic, const QString& note = {});

    QTextBrowser* browser() const { return browser_; }
    QLabel* note() const { return note_; }
    static QString anchorFor(int topic) { return QStringLiteral("topic-%1").arg(topic); }

  private:
    QLabel* note_;
    QTextBrowser* browser_;
};

}  // namespace zp::ui

#pragma once
// The in-program manual viewer, and the check that a help file named by the analyzer belongs to
// the manual before it is shown.

#include <QDialog>
#include <QString>
#include <QStringList>

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

class HelpViewer : public QDialog {
    Q_OBJECT
  public:
    explicit HelpViewer(QWidget* parent = nullptr);

    // Shows `path` (already checked) at the anchor "topic-<topic>".
    void showTopic(const QString& path, int topic);

    QTextBrowser* browser() const { return browser_; }
    static QString anchorFor(int topic) { return QStringLiteral("topic-%1").arg(topic); }

  private:
    QTextBrowser* browser_;
};

}  // namespace zp::ui

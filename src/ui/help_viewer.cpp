#include "ui/help_viewer.h"

#include <QDialogButtonBox>
#include <QDir>
#include <QFileInfo>
#include <QLabel>
#include <QPushButton>
#include <QTextBrowser>
#include <QUrl>
#include <QVBoxLayout>

#include "forms/interaction.h"

namespace zp::ui {

HelpFileCheck checkHelpFile(const QString& file, const QStringList& manualFolders) {
    if (file.trimmed().isEmpty())
        return {{}, QObject::tr("The analyzer did not name a help file.")};
    const QFileInfo info(file);
    if (!info.exists() || !info.isFile()) {
        return {{}, QObject::tr("The help file \"%1\" was not found.").arg(file)};
    }
    const QString canonical = info.canonicalFilePath();
    for (const QString& folder : manualFolders) {
        const QString root = QFileInfo(folder).canonicalFilePath();
        if (root.isEmpty()) continue;
        if (canonical.startsWith(root + QLatin1Char('/'))) return {canonical, {}};
    }
    return {{},
            QObject::tr("The help file \"%1\" is not part of the Zentra Pulse manual.").arg(file)};
}

HelpFileCheck ownManual(const QStringList& manualFolders) {
    for (const QString& folder : manualFolders) {
        const HelpFileCheck check = checkHelpFile(
            QDir(folder).filePath(QStringLiteral("zentra-pulse.html")), manualFolders);
        if (check.ok()) return check;
    }
    return {{},
            QObject::tr("The Zentra Pulse manual was not found in %1.")
                .arg(manualFolders.isEmpty() ? QObject::tr("any folder")
                                             : manualFolders.join(QStringLiteral(", ")))};
}

HelpViewer::HelpViewer(QWidget* parent)
    : QDialog(parent), note_(new QLabel(this)), browser_(new QTextBrowser(this)) {
    setObjectName(QStringLiteral("HelpViewer"));
    setWindowTitle(QString::fromUtf8(kAppTitle) + tr(" - Help"));
    note_->setObjectName(QStringLiteral("HelpNote"));
    note_->setTextFormat(Qt::PlainText);
    note_->setWordWrap(true);
    note_->hide();
    browser_->setObjectName(QStringLiteral("HelpBrowser"));
    // Links to the web open outside; the manual's own pages stay inside the viewer.
    browser_->setOpenExternalLinks(true);
    auto* buttons = new QDialogButtonBox(QDialogButtonBox::Close, this);
    connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
    auto* back = buttons->addButton(tr("&Back"), QDialogButtonBox::ActionRole);
    connect(back, &QPushButton::clicked, browser_, &QTextBrowser::backward);
    connect(browser_, &QTextBrowser::backwardAvailable, back, &QPushButton::setEnabled);
    back->setEnabled(false);
    auto* layout = new QVBoxLayout(this);
    layout->addWidget(note_);
    layout->addWidget(browser_);
    layout->addWidget(buttons);
    resize(760, 560);
}

void HelpViewer::showTopic(const QString& path, int topic, const QString& note) {
    note_->setText(note);
    note_->setVisible(!note.isEmpty());
    QUrl url = QUrl::fromLocalFile(path);
    url.setFragment(anchorFor(topic));
    browser_->setSearchPaths({QFileInfo(path).absolutePath()});
    browser_->setSource(url);
    browser_->scrollToAnchor(anchorFor(topic));
}

}  // namespace zp::ui

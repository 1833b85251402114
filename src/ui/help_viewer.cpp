#include "ui/help_viewer.h"

#include <QDialogButtonBox>
#include <QDir>
#include <QFileInfo>
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

HelpViewer::HelpViewer(QWidget* parent) : QDialog(parent), browser_(new QTextBrowser(this)) {
    setObjectName(QStringLiteral("HelpViewer"));
    setWindowTitle(QString::fromUtf8(kAppTitle) + tr(" - Help"));
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
    layout->addWidget(browser_);
    layout->addWidget(buttons);
    resize(760, 560);
}

void HelpViewer::showTopic(const QString& path, int topic) {
    QUrl url = QUrl::fromLocalFile(path);
    url.setFragment(anchorFor(topic));
    browser_->setSearchPaths({QFileInfo(path).absolutePath()});
    browser_->setSource(url);
    browser_->scrollToAnchor(anchorFor(topic));
}

}  // namespace zp::ui

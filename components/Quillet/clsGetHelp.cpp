#include "clsGetHelp.h"

#include "app/CatalogueServer.h"

#include <QApplication>
#include <QDesktopServices>
#include <QFileInfo>
#include <QMessageBox>

namespace Brimvault {

namespace {

const QString MoreGamesSuffix = QStringLiteral("MoreGames");

bool isAddress(const QString& text)
{
    const QUrl url(text, QUrl::StrictMode);
    return url.isValid() && url.scheme().size() > 1 && !url.host().isEmpty();
}

} // namespace

clsGetHelp::clsGetHelp(QObject* parent)
    : QObject(parent)
{ }

QUrl clsGetHelp::HelpUrl(const QString& sHelpFile)
{
    const QString help = sHelpFile.trimmed();
    if (help.isEmpty())
        return {};
    if (isAddress(help))
        return QUrl(help);
    const QFileInfo file(help);
    if (file.isFile())
        return QUrl::fromLocalFile(file.absoluteFilePath());
    if (help.endsWith(MoreGamesSuffix, Qt::CaseInsensitive)) {
        const QString product = help.left(help.size() - MoreGamesSuffix.size());
        QUrl page(CatalogueServerRoot() + QStringLiteral("/more-games.asp"));
        if (!product.isEmpty())
            page.setQuery(QStringLiteral("product=") + QString::fromLatin1(QUrl::toPercentEncoding(product)));
        return page;
    }
    return {};
}

bool clsGetHelp::GetHelp(const QString& sHelpFile)
{
    const QUrl url = HelpUrl(sHelpFile);
    if (url.isEmpty()) {
        QMessageBox box(QMessageBox::Warning, QApplication::applicationDisplayName(),
            QStringLiteral("The help file was not found:\n") + sHelpFile.trimmed(), QMessageBox::Ok,
            QApplication::activeWindow());
        box.setObjectName(QStringLiteral("msgHelpNotFound"));
        box.exec();
        return false;
    }
    return QDesktopServices::openUrl(url);
}

} // namespace Brimvault

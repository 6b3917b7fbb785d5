#include "gameactions/LaunchRules.h"

#include "support/PathFunctions.h"

#include <QDir>
#include <QRegularExpression>
#include <QUrl>

namespace Brimvault {

namespace {

const QRegularExpression& webAddressPattern()
{
    static const QRegularExpression pattern(
        QStringLiteral("^\\s*https?://"), QRegularExpression::CaseInsensitiveOption);
    return pattern;
}

bool hasUrlScheme(const QString& text)
{
    static const QRegularExpression pattern(QStringLiteral("^[A-Za-z][A-Za-z0-9+.-]+://"));
    return pattern.match(text).hasMatch();
}

} // namespace

LaunchKind LaunchKindOf(const QString& path)
{
    const QString extension = GetFileExtention(path, false, false).toLower();
    const QString webExtensions = QStringLiteral("*htm*html*shtml*mht*asp*php*aspx*");
    if (webExtensions.contains(u'*' + extension + u'*') || path.toLower().contains(QStringLiteral(".asp?")))
        return LaunchKind::WebPage;
    if (extension == QStringLiteral("swf"))
        return LaunchKind::FlashMovie;
    if (webAddressPattern().match(path).hasMatch())
        return LaunchKind::WebPage;
    return LaunchKind::Process;
}

QString ArticleCode(const QString& moviePath)
{
    const QString name = GetFileName(moviePath, false);
    if (!name.startsWith(QStringLiteral("20")))
        return QString();
    const QString code = name.left(20);
    if (code.size() != 20 || !QStringLiteral("0123456789").contains(code.back()))
        return QString();
    return code;
}

QString ArticleAddress(const QString& catalogueRoot, const QString& code)
{
    QString root = catalogueRoot.trimmed();
    while (root.endsWith(u'/'))
        root.chop(1);
    return root + QStringLiteral("/OnlineGamesArticle.asp?code=") + code;
}

QUrl BrowserUrl(const QString& pathOrAddress)
{
    const QString text = pathOrAddress.trimmed();
    if (hasUrlScheme(text))
        return QUrl(text, QUrl::TolerantMode);
    return QUrl::fromLocalFile(QDir::current().absoluteFilePath(text));
}

} // namespace Brimvault

#include "media/MediaKind.h"

namespace Brimvault {

MediaKind MediaKindOf(const QString& path)
{
    static const QString webPageExtensions = QStringLiteral("*htm*html*shtml*mht*asp*php*aspx*");
    const QString extension = RightTo(path, QStringLiteral("."), 1, true).toLower();
    // A plain substring search, as the system always did: "ht" or "sp" count as web pages too.
    if (webPageExtensions.contains(extension) || path.toLower().contains(u".asp?"))
        return MediaKind::WebPage;
    if (extension == u"swf")
        return MediaKind::FlashMovie;
    return MediaKind::StillPicture;
}

QString RightTo(const QString& text, const QString& separator, int start, bool fromEnd)
{
    if (separator.isEmpty())
        return text;
    const qsizetype position
        = fromEnd ? text.lastIndexOf(separator) : text.indexOf(separator, qMax<qsizetype>(start, 1) - 1);
    if (position < 0)
        return text;
    return text.mid(position + separator.size());
}

} // namespace Brimvault

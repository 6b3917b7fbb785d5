#include "support/PathFunctions.h"

namespace Brimvault {

namespace {

QString cutAtQuery(const QString& path)
{
    const qsizetype query = path.indexOf(u'?');
    return query < 0 ? path : path.left(query);
}

QString withBackslashes(const QString& path)
{
    QString result = cutAtQuery(path);
    result.replace(u'/', u'\\');
    return result;
}

// 1-based positions as the rules are stated; 0 when absent.
qsizetype lastPosition(const QString& text, QChar character)
{
    return text.lastIndexOf(character) + 1;
}

} // namespace

QString GetFileExtention(const QString& path, bool withWildcard, bool withSemicolon)
{
    const QString text = withBackslashes(path);
    const qsizetype slash = lastPosition(text, u'\\');
    const qsizetype dot = lastPosition(text, u'.');
    QString extension = dot > slash ? text.mid(dot) : QString();
    if (withWildcard)
        extension = QStringLiteral("*.") + extension;
    if (withSemicolon)
        extension += u';';
    return extension;
}

QString GetFileName(const QString& path, bool withExtension)
{
    // One pass from the end over the text before any query, without the copy that turns slashes into
    // backslashes: the name lies after the last separator of either kind, so the copy would not change it.
    const qsizetype query = path.indexOf(u'?');
    const QStringView text = query < 0 ? QStringView(path) : QStringView(path).left(query);
    qsizetype slash = 0;
    qsizetype dot = 0;
    for (qsizetype position = text.size(); position > 0 && slash == 0; --position) {
        const QChar character = text.at(position - 1);
        if (character == u'\\' || character == u'/')
            slash = position;
        else if (character == u'.' && dot == 0)
            dot = position;
    }
    QString name;
    if (dot > slash)
        name = text.mid(slash, dot - slash - 1).toString();
    else if (dot < slash)
        name = text.mid(slash).toString();
    else
        name = text.toString();
    if (withExtension)
        name += u'.' + GetFileExtention(path, false, false);
    return name;
}

QString GetFileFolder(const QString& path, bool withName)
{
    const QString text = cutAtQuery(path);
    const qsizetype separator = qMax(lastPosition(text, u'\\'), lastPosition(text, u'/'));
    QString folder = separator < 1 ? QStringLiteral(".\\") : AddSlash(text.left(separator - 1));
    if (withName)
        folder += GetFileName(path, false);
    return folder;
}

QString AddSlash(const QString& path)
{
    const QString text = cutAtQuery(path);
    if (text.isEmpty())
        return text;
    if (text.endsWith(u'/') || text.endsWith(u'\\'))
        return text;
    const qsizetype backslash = lastPosition(text, u'\\');
    const qsizetype slash = lastPosition(text, u'/');
    if (backslash > slash)
        return text + u'\\';
    if (slash > backslash)
        return text + u'/';
    return QStringLiteral(".\\") + text + u'\\';
}

} // namespace Brimvault

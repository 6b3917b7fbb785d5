#include "catalogue/GameFinder.h"

#include "support/PathFunctions.h"

namespace Brimvault::GameFinder {

namespace {

// Letters that carry their mark in the letter itself, so decomposition leaves them whole.
QChar plainLetter(QChar c)
{
    switch (c.unicode()) {
    case u'ł':
        return u'l';
    case u'đ':
        return u'd';
    case u'ø':
        return u'o';
    default:
        return c;
    }
}

void appendFolded(QChar c, QString& out)
{
    if (c.unicode() < 0x80) {
        out.append(c.toLower());
        return;
    }
    const QChar lower = c.toCaseFolded();
    if (lower.decompositionTag() == QChar::Canonical) {
        for (QChar part : lower.decomposition()) {
            if (!part.isMark())
                out.append(plainLetter(part.toCaseFolded()));
        }
        return;
    }
    if (!lower.isMark())
        out.append(plainLetter(lower));
}

bool isWordChar(QChar c)
{
    return c.isLetterOrNumber();
}

} // namespace

QString Fold(QStringView text)
{
    QString out;
    out.reserve(text.size());
    for (QChar c : text)
        appendFolded(c, out);
    return out;
}

FindKey MakeFindKey(const QString& caption, const QString& path)
{
    FindKey key;
    key.caption.reserve(caption.size());
    for (QChar c : caption) {
        if (!c.isSpace())
            appendFolded(c, key.caption);
    }
    // Words break at anything but letters and digits, and where a capital follows a small letter.
    const QString name = GetFileName(path, false);
    QChar previous;
    for (QChar c : name) {
        const bool starts = isWordChar(c)
            && (!isWordChar(previous) || (c.isUpper() && previous.isLower()) || (c.isDigit() != previous.isDigit()));
        if (starts)
            key.nameWords.append(u' ');
        if (isWordChar(c))
            appendFolded(c, key.nameWords);
        previous = c;
    }
    return key;
}

Query::Query(const QString& typed)
{
    for (QChar c : typed) {
        if (!c.isSpace())
            appendFolded(c, m_compact);
    }
    if (m_compact.isEmpty())
        return;
    const QStringList words = Fold(typed).split(u' ', Qt::SkipEmptyParts);
    m_wordStart = u' ' + words.join(u' ');
}

bool Query::matches(const FindKey& key) const
{
    return m_compact.isEmpty() || key.caption.contains(m_compact) || key.nameWords.contains(m_wordStart);
}

const FindKey& KeyCache::keyAt(int index, const QString& caption, const QString& path)
{
    if (index < 0)
        index = 0;
    if (m_keys.size() <= std::size_t(index))
        m_keys.resize(std::size_t(index) + 1);
    Entry& entry = m_keys[std::size_t(index)];
    const bool same = (entry.caption.isSharedWith(caption) || entry.caption == caption)
        && (entry.path.isSharedWith(path) || entry.path == path);
    if (!same || (entry.caption.isNull() && entry.path.isNull()))
        entry = Entry {caption, path, MakeFindKey(caption, path)};
    return entry.key;
}

} // namespace Brimvault::GameFinder

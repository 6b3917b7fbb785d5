#include "store/clsFileBag.h"

#include "store/BagFileIo.h"
#include "store/SettingsStore.h"
#include "support/TextCase.h"

namespace Brimvault {

namespace {

const QString crLf = QStringLiteral("\r\n");

// Where key occurs from position from on, ignoring case; -1 when it does not. An empty text holds nothing
// and an empty key is found at the start position, so that loops over the text always end.
qsizetype findKey(const QString& text, const QString& key, qsizetype from)
{
    if (text.isEmpty() || from < 0 || from >= text.size())
        return -1;
    if (key.isEmpty())
        return from;
    return IndexOfIgnoringCase(text, key, from);
}

// The CR LF separated line that holds position p: [start, end), end never before start.
struct LineSpan {
    qsizetype start = 0;
    qsizetype end = 0;
    bool endsWithCrLf = false;
};

LineSpan lineAround(const QString& text, qsizetype p)
{
    LineSpan span;
    const qsizetype before = text.lastIndexOf(crLf, p);
    span.start = before < 0 ? 0 : before + 2;
    const qsizetype after = text.indexOf(crLf, p);
    span.endsWithCrLf = after >= 0;
    span.end = qMax(span.start, after < 0 ? text.size() : after);
    if (span.endsWithCrLf && text.mid(span.end, 2) != crLf)
        span.endsWithCrLf = false;
    return span;
}

QString partText(const QVariant& part)
{
    if (part.typeId() == QMetaType::Bool)
        return part.toBool() ? QStringLiteral("True") : QStringLiteral("False");
    return part.toString();
}

} // namespace

QString clsFileBag::escapeText(const QString& text)
{
    QString escaped = text;
    escaped.replace(u'<', QStringLiteral("\\{[}\\"));
    escaped.replace(u'>', QStringLiteral("\\{]}\\"));
    escaped.replace(crLf, QStringLiteral("\\{NL}\\"));
    return escaped;
}

QString clsFileBag::unescapeText(const QString& text)
{
    // Every escape starts with a backslash; most values have none.
    if (!text.contains(u'\\'))
        return text;
    QString plain = text;
    plain.replace(QStringLiteral("\\{[}\\"), QStringLiteral("<"), Qt::CaseInsensitive);
    plain.replace(QStringLiteral("\\{]}\\"), QStringLiteral(">"), Qt::CaseInsensitive);
    plain.replace(QStringLiteral("\\{NL}\\"), crLf, Qt::CaseInsensitive);
    return plain;
}

QString clsFileBag::MakeKey(const QVariantList& parts)
{
    QString key;
    for (qsizetype i = 0; i < parts.size(); ++i) {
        const QString escaped = escapeText(partText(parts[i]));
        if (escaped.isEmpty())
            continue;
        key += u'<' + QString(i + 1, u'>') + escaped;
    }
    return key + u'<';
}

QString clsFileBag::GetField(const QString& key, qint16 fieldNumber)
{
    if (key.isEmpty())
        return QString();
    const QStringList pieces = key.split(u'<');
    if (fieldNumber < 0 || fieldNumber >= pieces.size())
        return QString();
    QString field = pieces[fieldNumber];
    field.remove(u'>');
    return unescapeText(field);
}

QString clsFileBag::GetValueFromRecord(const QString& record, const QString& defaultValue)
{
    const QString value = unescapeText(record.mid(record.lastIndexOf(u'<') + 1));
    return value.isEmpty() ? defaultValue : value;
}

QString clsFileBag::GetRecord(const QString& key) const
{
    const qsizetype found = findKey(m_text, key, 0);
    if (found < 0)
        return QString();
    const LineSpan line = lineAround(m_text, found);
    return m_text.mid(line.start, line.end - line.start);
}

QString clsFileBag::GetValue(const QString& key, const QString& defaultValue) const
{
    return GetValueFromRecord(GetRecord(key), defaultValue);
}

void clsFileBag::SetRecord(const QString& key, const QString& value)
{
    const QString record = key + escapeText(value);
    const qsizetype found = findKey(m_text, key, 0);
    if (found >= 0) {
        const LineSpan line = lineAround(m_text, found);
        m_text.replace(line.start, line.end - line.start, record);
    } else {
        // A text of one or two characters gets no separator: the record is simply appended to it.
        if (m_text.size() > 2 && !m_text.endsWith(crLf))
            m_text += crLf;
        m_text += record;
    }
    m_changed = true;
}

bool clsFileBag::RemoveRecord(const QString& key, bool removeAll)
{
    bool removed = false;
    qsizetype from = 0;
    for (;;) {
        const qsizetype found = findKey(m_text, key, from);
        if (found < 0)
            break;
        const LineSpan line = lineAround(m_text, found);
        const qsizetype length = line.end - line.start + (line.endsWithCrLf ? 2 : 0);
        m_text.remove(line.start, length);
        removed = true;
        m_changed = true;
        if (!removeAll)
            break;
        // An empty last line removes nothing; step past it so that the search moves on.
        from = length > 0 ? line.start : found + 1;
    }
    return removed;
}

QStringList clsFileBag::GetAll(const QString& key, qint16 mode) const
{
    QStringList results {QString()};
    qsizetype from = 0;
    for (;;) {
        const qsizetype found = findKey(m_text, key, from);
        if (found < 0)
            return results;
        const LineSpan span = lineAround(m_text, found);
        const QString line = m_text.mid(span.start, span.end - span.start);
        switch (mode) {
        case 0:
            results.last() = LeftTo(line, QStringLiteral("<"), 0, true) + u'<';
            break;
        case 1:
            results.last() = GetValueFromRecord(line, QString());
            break;
        case 2:
            results.last() = line;
            break;
        default:
            break;
        }
        results.append(QString());
        from = qMax(span.end, found + 1);
    }
}

qint32 clsFileBag::RecordCount() const
{
    qint32 count = 0;
    qsizetype from = 0;
    for (;;) {
        const qsizetype found = m_text.indexOf(QStringLiteral("<>"), from);
        if (found < 0)
            break;
        ++count;
        from = m_text.indexOf(crLf, found);
        if (from < 0)
            break;
    }
    return count;
}

QString clsFileBag::LeftTo(const QString& text, const QString& separator, int compare, bool fromEnd)
{
    if (separator.isEmpty())
        return text;
    const Qt::CaseSensitivity cs = compare == 0 ? Qt::CaseSensitive : Qt::CaseInsensitive;
    const qsizetype at = fromEnd ? text.lastIndexOf(separator, -1, cs) : text.indexOf(separator, 0, cs);
    return at < 0 ? text : text.left(at);
}

void clsFileBag::SetCurrentFileName(const QString& fileName)
{
    if (fileName != m_fileName)
        m_fileUnreadable = false;
    m_fileName = fileName;
}

bool clsFileBag::OpenFile(const QString& fileName)
{
    m_fileName = fileName;
    m_text.clear();
    m_changed = false;
    m_fileUnreadable = false;
    if (fileName.isEmpty())
        return true;
    const BagFileIo::ReadResult read = BagFileIo::readText(fileName);
    m_fileUnreadable = read.status == BagFileIo::ReadStatus::Unreadable;
    if (read.status != BagFileIo::ReadStatus::Read)
        return false;
    m_text = read.text;
    return true;
}

bool clsFileBag::SaveFile()
{
    if (m_fileName.isEmpty()) {
        m_changed = false;
        return true;
    }
    if (m_fileUnreadable)
        return false;
    BagFileIo::createParentFolder(m_fileName);
    const bool saved = m_text.isEmpty() ? BagFileIo::removeFile(m_fileName) : BagFileIo::writeText(m_fileName, m_text);
    if (saved)
        m_changed = false;
    return saved;
}

void clsFileBag::OpenRegistry(
    const QString& appName, const QString& section, const QString& key, const QString& defaultValue)
{
    m_text = Brimvault::GetSetting(appName, section, key, defaultValue);
}

void clsFileBag::SaveRegistry(const QString& appName, const QString& section, const QString& key) const
{
    Brimvault::SaveSetting(appName, section, key, m_text);
}

QString clsFileBag::GetSetting(
    const QVariant& part1, const QVariant& part2, const QVariant& part3, const QString& defaultValue) const
{
    return GetValue(MakeKey(QVariantList {part1, part2, part3}), defaultValue);
}

void clsFileBag::SaveSetting(const QVariant& part1, const QVariant& part2, const QVariant& part3, const QString& value)
{
    SetRecord(MakeKey(QVariantList {part1, part2, part3}), value);
}

} // namespace Brimvault

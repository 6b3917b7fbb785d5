#include "store/IniDocument.h"

#include <QStringDecoder>

namespace Brimvault {

namespace {

// Escapes keep every value on one line and keep a key's "=" and a section's "]" apart from the syntax.
QString escape(const QString& text, QChar special)
{
    QString out;
    out.reserve(text.size());
    for (QChar c : text) {
        if (c == u'\\')
            out += u"\\\\";
        else if (c == u'\r')
            out += u"\\r";
        else if (c == u'\n')
            out += u"\\n";
        else if (c == u'\0')
            out += u"\\0";
        else if (!special.isNull() && c == special)
            out += QString(u'\\') + c;
        else
            out += c;
    }
    return out;
}

QString unescape(QStringView text)
{
    QString out;
    out.reserve(text.size());
    for (qsizetype i = 0; i < text.size(); ++i) {
        QChar c = text[i];
        if (c != u'\\' || i + 1 == text.size()) {
            out += c;
            continue;
        }
        QChar n = text[++i];
        if (n == u'r')
            out += u'\r';
        else if (n == u'n')
            out += u'\n';
        else if (n == u'0')
            out += QChar(u'\0');
        else
            out += n;
    }
    return out;
}

// Position of the first "=" that is not escaped, or -1.
qsizetype findUnescapedEquals(QStringView text)
{
    for (qsizetype i = 0; i < text.size(); ++i) {
        if (text[i] == u'\\')
            ++i;
        else if (text[i] == u'=')
            return i;
    }
    return -1;
}

bool sameName(const QString& a, const QString& b)
{
    return a.compare(b, Qt::CaseInsensitive) == 0;
}

} // namespace

IniDocument IniDocument::parse(const QByteArray& bytes)
{
    IniDocument doc;
    qsizetype start = 0;
    while (start < bytes.size()) {
        qsizetype end = bytes.indexOf('\n', start);
        end = end < 0 ? bytes.size() : end + 1;
        Line line;
        line.raw = bytes.mid(start, end - start);
        start = end;

        QByteArray content = line.raw;
        if (content.endsWith('\n'))
            content.chop(1);
        if (content.endsWith('\r'))
            content.chop(1);
        if (doc.m_lines.empty() && line.raw.endsWith("\r\n"))
            doc.m_lineEnd = "\r\n";
        // The decoder drops a byte order mark at the start of the file.
        QStringDecoder decoder(QStringDecoder::Utf8, QStringDecoder::Flag::Stateless);
        const QString text = decoder.decode(content);
        if (decoder.hasError() || text.contains(QChar(u'\0'))) {
            doc.m_lines.push_back(std::move(line));
            continue;
        }
        const QString trimmed = text.trimmed();
        if (trimmed.startsWith(u'[') && trimmed.endsWith(u']') && trimmed.size() >= 2) {
            line.kind = Line::Section;
            line.name = unescape(QStringView(trimmed).mid(1, trimmed.size() - 2));
        } else if (!text.startsWith(u';') && !text.startsWith(u'#')) {
            const qsizetype eq = findUnescapedEquals(text);
            if (eq > 0) {
                line.kind = Line::Entry;
                line.name = unescape(QStringView(text).left(eq));
                line.value = unescape(QStringView(text).mid(eq + 1));
            }
        }
        doc.m_lines.push_back(std::move(line));
    }
    return doc;
}

// Lines nobody changed are written back byte for byte, so hand edits, other encodings and damaged lines
// survive every write.
QByteArray IniDocument::serialize() const
{
    QByteArray out;
    for (size_t i = 0; i < m_lines.size(); ++i) {
        const Line& line = m_lines[i];
        if (!line.modified) {
            out += line.raw;
            if (!line.raw.endsWith('\n') && i + 1 < m_lines.size())
                out += m_lineEnd;
            continue;
        }
        if (line.kind == Line::Section) {
            out += '[' + escape(line.name, u']').toUtf8() + ']';
        } else {
            QString key = escape(line.name, u'=');
            // A key that would read as a comment or a section header keeps its first character escaped.
            qsizetype first = 0;
            while (first < key.size() && key[first].isSpace())
                ++first;
            if (first < key.size() && (key[first] == u';' || key[first] == u'#' || key[first] == u'['))
                key.insert(first, u'\\');
            out += key.toUtf8() + '=' + escape(line.value, QChar()).toUtf8();
        }
        out += m_lineEnd;
    }
    return out;
}

qsizetype IniDocument::findSection(const QString& section) const
{
    for (size_t i = 0; i < m_lines.size(); ++i) {
        if (m_lines[i].kind == Line::Section && sameName(m_lines[i].name, section))
            return qsizetype(i);
    }
    return -1;
}

qsizetype IniDocument::sectionEnd(qsizetype sectionLine) const
{
    size_t i = size_t(sectionLine) + 1;
    while (i < m_lines.size() && m_lines[i].kind != Line::Section)
        ++i;
    return qsizetype(i);
}

// A section may appear more than once (joined by hand, or spelt in two cases): it is read as one.
qsizetype IniDocument::findEntry(const QString& section, const QString& key) const
{
    bool inSection = false;
    for (size_t i = 0; i < m_lines.size(); ++i) {
        const Line& line = m_lines[i];
        if (line.kind == Line::Section)
            inSection = sameName(line.name, section);
        else if (inSection && line.kind == Line::Entry && sameName(line.name, key))
            return qsizetype(i);
    }
    return -1;
}

std::optional<QString> IniDocument::value(const QString& section, const QString& key) const
{
    const qsizetype entry = findEntry(section, key);
    if (entry < 0)
        return std::nullopt;
    return m_lines[size_t(entry)].value;
}

void IniDocument::setValue(const QString& section, const QString& key, const QString& value)
{
    const qsizetype entry = findEntry(section, key);
    if (entry >= 0) {
        Line& line = m_lines[size_t(entry)];
        if (line.value != value) {
            line.value = value; // keep the stored spelling of the key
            line.modified = true;
        }
        return;
    }
    qsizetype s = findSection(section);
    if (s < 0) {
        if (!m_lines.empty() && !(m_lines.back().kind == Line::Raw && m_lines.back().raw.trimmed().isEmpty()))
            m_lines.push_back(Line {});
        m_lines.push_back(Line {Line::Section, section, {}, {}, true});
        s = qsizetype(m_lines.size()) - 1;
    }
    qsizetype insertAt = sectionEnd(s);
    // New entries go after the section's last entry, before any blank lines that separate it from the next one.
    while (insertAt > s + 1 && m_lines[size_t(insertAt - 1)].kind == Line::Raw
        && m_lines[size_t(insertAt - 1)].raw.trimmed().isEmpty())
        --insertAt;
    m_lines.insert(m_lines.begin() + insertAt, Line {Line::Entry, key, value, {}, true});
}

bool IniDocument::removeValue(const QString& section, const QString& key)
{
    bool removed = false;
    for (qsizetype s = 0; s < qsizetype(m_lines.size()); ++s) {
        if (m_lines[size_t(s)].kind != Line::Section || !sameName(m_lines[size_t(s)].name, section))
            continue;
        qsizetype end = sectionEnd(s);
        for (qsizetype i = s + 1; i < end;) {
            const Line& line = m_lines[size_t(i)];
            if (line.kind == Line::Entry && sameName(line.name, key)) {
                m_lines.erase(m_lines.begin() + i);
                --end;
                removed = true;
            } else {
                ++i;
            }
        }
    }
    return removed;
}

bool IniDocument::removeSection(const QString& section)
{
    bool removed = false;
    for (qsizetype s = 0; s < qsizetype(m_lines.size());) {
        if (m_lines[size_t(s)].kind == Line::Section && sameName(m_lines[size_t(s)].name, section)) {
            m_lines.erase(m_lines.begin() + s, m_lines.begin() + sectionEnd(s));
            removed = true;
        } else {
            ++s;
        }
    }
    return removed;
}

QList<QPair<QString, QString>> IniDocument::sectionPairs(const QString& section) const
{
    QList<QPair<QString, QString>> pairs;
    bool inSection = false;
    for (const Line& line : m_lines) {
        if (line.kind == Line::Section)
            inSection = sameName(line.name, section);
        else if (inSection && line.kind == Line::Entry)
            pairs.append({line.name, line.value});
    }
    return pairs;
}

} // namespace Brimvault

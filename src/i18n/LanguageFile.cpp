#include "i18n/LanguageFile.h"

#include "i18n/LanguageEncoding.h"

#include <QFile>
#include <QFileInfo>
#include <QList>
#include <QStringView>
#include <optional>

namespace Brimvault::modLocalizer {

namespace {

bool IsBlank(QChar c)
{
    return c == u' ' || c == u'\t';
}

QStringView StripLeadingBlanks(QStringView line)
{
    qsizetype start = 0;
    while (start < line.size() && IsBlank(line[start]))
        ++start;
    return line.sliced(start);
}

// A decimal number in the signed 16-bit range, blanks around it allowed; anything else is an error.
std::optional<qint16> ParseCharset(QStringView value)
{
    bool ok = false;
    const int number = value.trimmed().toInt(&ok, 10);
    if (!ok || number < -32768 || number > 32767)
        return std::nullopt;
    return static_cast<qint16>(number);
}

// The charset decides how the rest of the file is decoded, so it is looked up in the raw bytes first.
// Its digits are ASCII in every code page a language file can be written in.
int PeekCharset(const QByteArray& bytes)
{
    qsizetype lineStart = 0;
    while (lineStart < bytes.size()) {
        qsizetype lineEnd = bytes.indexOf('\n', lineStart);
        if (lineEnd < 0)
            lineEnd = bytes.size();
        QByteArrayView line = QByteArrayView(bytes).sliced(lineStart, lineEnd - lineStart);
        lineStart = lineEnd + 1;

        if (line.startsWith("\xEF\xBB\xBF"))
            line = line.sliced(3);
        qsizetype start = 0;
        while (start < line.size() && (line[start] == ' ' || line[start] == '\t'))
            ++start;
        line = line.sliced(start);
        if (!line.startsWith('#'))
            continue;
        const qsizetype eq = line.indexOf('=');
        if (eq <= 1 || line.sliced(1, eq - 1).toByteArray().toLower() != "charset")
            continue;
        if (line.endsWith('\r'))
            line.chop(1);
        return ParseCharset(QString::fromLatin1(line.sliced(eq + 1))).value_or(0);
    }
    return 0;
}

} // namespace

LanguageFileContent ParseLanguageFile(const QByteArray& bytes)
{
    LanguageFileContent content;
    bool failed = false;
    const QString text = DecodeLanguageFileBytes(bytes, PeekCharset(bytes));

    for (QStringView rawLine : QStringView(text).split(u'\n')) {
        if (rawLine.endsWith(u'\r'))
            rawLine.chop(1);
        const QStringView line = StripLeadingBlanks(rawLine);
        if (line.isEmpty() || (line[0] != u'#' && line[0] != u'@'))
            continue;
        const qsizetype eq = line.indexOf(u'=');
        if (eq <= 1)
            continue;
        const QStringView value = line.sliced(eq + 1);

        if (line[0] == u'#') {
            // The name is not trimmed: "#language =x" names a setting that does not exist.
            const QString name = line.sliced(1, eq - 1).toString().toLower();
            if (name == u"language") {
                content.language = value.toString();
            } else if (name == u"charset") {
                const auto charset = ParseCharset(value);
                if (charset)
                    content.charset = *charset;
                else
                    failed = true;
            } else if (name == u"helpfile") {
                content.helpFile = value.toString();
            }
            continue;
        }

        const QString key = line.sliced(1, eq - 1).trimmed().toString().toLower();
        if (key.isEmpty())
            continue;
        if (content.texts.contains(key)) {
            failed = true; // the first text stays, but the file as a whole is refused
            continue;
        }
        content.texts.insert(key, value.toString());
    }

    content.readWithoutError = !failed;
    return content;
}

LanguageFileContent ReadLanguageFile(const QString& path)
{
    QFile file(path);
    // Only a regular file is opened: a named pipe in its place would block start-up for good.
    if (path.isEmpty() || !QFileInfo(path).isFile() || !file.open(QIODevice::ReadOnly)
        || file.size() > kMaxLanguageFileSize)
        return {};
    // What is there, not the largest size allowed: asking for that would allocate it for every small file.
    const QByteArray bytes = file.read(file.size() + 1);
    if (bytes.size() > kMaxLanguageFileSize || file.error() != QFileDevice::NoError)
        return {};
    return ParseLanguageFile(bytes);
}

} // namespace Brimvault::modLocalizer

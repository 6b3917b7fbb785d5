#pragma once

#include <QHash>
#include <QString>

class QByteArray;

namespace Brimvault::modLocalizer {

// What one language file holds. A file is usable only when it was read without an error (no repeated text
// key, a numeric character set), names its language and has a character set other than 0.
struct LanguageFileContent {
    bool readWithoutError = false;
    QString language;
    qint16 charset = 0;
    QString helpFile; // as written in the file, relative to the program's folder
    QHash<QString, QString> texts; // keys lower-cased, escapes not yet expanded

    bool isUsable() const { return readWithoutError && !language.isEmpty() && charset != 0; }
};

// Files bigger than this are not language files; they are left alone rather than read into memory.
constexpr qint64 kMaxLanguageFileSize = 16 * 1024 * 1024;

// Reads a language file from disk. A missing, unreadable or oversized file gives an unusable result.
LanguageFileContent ReadLanguageFile(const QString& path);

// Parses the raw bytes of a language file (CR LF or LF line ends, UTF-8 or the code page of its charset).
LanguageFileContent ParseLanguageFile(const QByteArray& bytes);

} // namespace Brimvault::modLocalizer

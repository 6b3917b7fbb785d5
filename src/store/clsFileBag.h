#pragma once

#include <QString>
#include <QStringList>
#include <QVariant>
#include <QVariantList>

namespace Brimvault {

// A small store of keyed records held as one text: one record per CR LF separated line, each line a key
// made by MakeKey followed by the escaped value. The text comes from a file or from one settings value.
//
// Keys are searched case-insensitively as substrings anywhere in the text, so a shorter key also finds a
// record stored under a longer key that begins with the same parts; callers keep their keys of equal length.
//
// File names may use "\" or "/" as folder separator; elsewhere than on Windows "\" is read as "/" when
// the file system is touched. SaveFile writes the text exactly as it stands, without a final line end.
class clsFileBag {
public:
    clsFileBag() = default;

    static QString MakeKey(const QVariantList& parts);
    template <typename... Parts>
    static QString MakeKey(const Parts&... parts)
    {
        return MakeKey(QVariantList {QVariant(parts)...});
    }

    // Field 0 is the empty text before the first "<"; after an empty part later fields shift down by one.
    static QString GetField(const QString& key, qint16 fieldNumber);
    QString GetValue(const QString& key, const QString& defaultValue = QString()) const;
    static QString GetValueFromRecord(const QString& record, const QString& defaultValue = QString());
    qint32 RecordCount() const;
    bool RemoveRecord(const QString& key, bool removeAll = false);
    void SetRecord(const QString& key, const QString& value);
    QString GetRecord(const QString& key) const;
    // Mode 0 gives each matching line's key, 1 its value, 2 the whole line; the list always ends with one
    // empty element.
    QStringList GetAll(const QString& key, qint16 mode) const;

    // An empty text deletes the file. False, with Changed kept, when the file could not be written or is
    // one that OpenFile found but could not read (a folder, an unreadable or oversized file): that file is
    // never replaced.
    bool SaveFile();
    // False when the file is missing or cannot be read; the text is then empty.
    bool OpenFile(const QString& fileName);

    QString CurrentFileName() const { return m_fileName; }
    void SetCurrentFileName(const QString& fileName);
    QString CurrentFileText() const { return m_text; }
    void SetCurrentFileText(const QString& text) { m_text = text; }
    bool Changed() const { return m_changed; }

    void OpenRegistry(
        const QString& appName, const QString& section, const QString& key, const QString& defaultValue = QString());
    void SaveRegistry(const QString& appName, const QString& section, const QString& key) const;

    QString GetSetting(const QVariant& part1, const QVariant& part2, const QVariant& part3,
        const QString& defaultValue = QString()) const;
    void SaveSetting(const QVariant& part1, const QVariant& part2, const QVariant& part3, const QString& value);

    // The text before the separator's first (or, fromEnd, last) occurrence, or the whole text when it does
    // not occur. compare 0 matches exactly, any other value ignores letter case.
    static QString LeftTo(const QString& text, const QString& separator, int compare = 0, bool fromEnd = false);

private:
    static QString escapeText(const QString& text);
    static QString unescapeText(const QString& text);

    QString m_fileName;
    QString m_text;
    bool m_changed = false;
    // Set when OpenFile found the file but could not read it; SaveFile then leaves that file alone.
    bool m_fileUnreadable = false;
};

} // namespace Brimvault

#pragma once

#include <QByteArray>
#include <QList>
#include <QPair>
#include <QString>
#include <optional>
#include <vector>

namespace Brimvault {

// One settings file held as its lines. Every line that no change touched (hand edits, garbage, another
// encoding, its own line end) is written back byte for byte, so a damaged file never loses what it held.
// A section that appears more than once is read as one.
class IniDocument {
public:
    static IniDocument parse(const QByteArray& bytes);
    QByteArray serialize() const;

    // Section and key names match without regard to letter case; the first match wins.
    std::optional<QString> value(const QString& section, const QString& key) const;
    void setValue(const QString& section, const QString& key, const QString& value);
    bool removeValue(const QString& section, const QString& key);
    bool removeSection(const QString& section);
    QList<QPair<QString, QString>> sectionPairs(const QString& section) const;

private:
    struct Line {
        enum Kind { Section, Entry, Raw } kind = Raw;
        QString name; // section name for Section lines, key for Entry lines
        QString value;
        QByteArray raw; // the line as read, with its line end if it had one
        bool modified = false; // Section and Entry lines that are new or changed are written from name and value
    };

    // Index of the section line, or -1.
    qsizetype findSection(const QString& section) const;
    qsizetype sectionEnd(qsizetype sectionLine) const;
    // Index of the key's first Entry line in any section of that name, or -1.
    qsizetype findEntry(const QString& section, const QString& key) const;

    std::vector<Line> m_lines;
    QByteArray m_lineEnd = "\n"; // for new lines: the line end of the file's first line
};

} // namespace Brimvault

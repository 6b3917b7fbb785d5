#pragma once

#include <QByteArray>
#include <QString>
#include <QStringList>
#include <optional>

namespace Brimvault {

// A VS_VERSIONINFO block and queries over it by path ("\VarFileInfo\Translation",
// "\StringFileInfo\040904B0\CompanyName"), keys matched without regard to case.
class VersionResource {
public:
    explicit VersionResource(QByteArray block);

    // The version block of an executable: its version resource number 1, else its first one.
    static std::optional<VersionResource> fromFile(const QString& path);

    std::optional<QByteArray> queryValue(const QString& path) const;
    // A text value up to its first NUL.
    std::optional<QString> queryString(const QString& path) const;

private:
    struct Node {
        qint64 start = 0;
        qint64 end = 0;
        quint16 valueLength = 0;
        quint16 type = 0;
        QString key;
        qint64 valueStart = 0;
        qint64 childrenStart = 0;
    };
    std::optional<Node> nodeAt(qint64 at, qint64 limit) const;
    std::optional<Node> find(const QString& path) const;

    QByteArray m_block;
};

// The eight text fields of a file's version information, in reading order.
struct VersionStrings {
    QString translation; // language and code page, eight upper-case hex digits: "041904E3"
    QStringList values; // one per VersionFieldNames() entry
};

// CompanyName, FileDescription, FileVersion, InternalName, LegalCopyright, OriginalFileName, ProductName,
// ProductVersion: the order in which the fields are read.
const QStringList& VersionFieldNames();

// Nothing when the file has no version information or no translation table.
std::optional<VersionStrings> ReadVersionStrings(const QString& path);
std::optional<VersionStrings> ReadVersionStrings(const VersionResource& block);

} // namespace Brimvault

#pragma once

#include <QString>

namespace Brimvault::BagFileIo {

// Whole-file reads and writes for record bags and info files, in the system's 8-bit encoding.
// Names may use "\" or "/" between folders; elsewhere than on Windows "\" is taken as "/".

enum class ReadStatus { Read, Missing, Unreadable };

struct ReadResult {
    ReadStatus status = ReadStatus::Missing;
    QString text;
};

// Larger files are not bags: they are reported unreadable rather than loaded.
inline constexpr qint64 MaximumFileSize = 64 * 1024 * 1024;

QString fileSystemPath(const QString& fileName);
// True when the name is an existing plain file (not a folder).
bool isFile(const QString& fileName);
ReadResult readText(const QString& fileName);
bool writeText(const QString& fileName, const QString& text);
bool removeFile(const QString& fileName);
// Creates the folder part of the name when it is missing; one level only.
void createParentFolder(const QString& fileName);

} // namespace Brimvault::BagFileIo

#pragma once

#include <QString>

#include <optional>

namespace Brimvault {

// Bytes the current user may still write on the file system that holds the folder, asked of the file system
// itself (a mount table may not describe the folder: chroots, some containers). Empty when it cannot tell.
std::optional<qint64> FreeBytes(const QString& folder);

// Room a package needs: its bytes, file system blocks and a margin for everything else.
qint64 RequiredFreeSpace(qint64 totalBytes, qint64 fileCount);

// The refusal for a package that does not fit; without `available` when the free space is not known.
QString NotEnoughSpaceProblem(qint64 needed, std::optional<qint64> available);

// Whether the last failed file system call of this thread ran out of room (or of the user's quota).
bool LastErrorWasDiskFull();
// Whether the file system that holds the folder has no room left, in bytes or in files, as far as it tells.
bool FileSystemFull(const QString& folder);

} // namespace Brimvault

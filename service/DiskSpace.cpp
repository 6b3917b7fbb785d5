#include "DiskSpace.h"

#include <QDir>
#include <QFile>

#include <limits>

#ifdef Q_OS_WIN
#include <windows.h>
#else
#include <cerrno>
#include <sys/statvfs.h>
#endif

namespace Brimvault {

namespace {

constexpr qint64 BlockSize = 4096;
constexpr qint64 SpaceMargin = 16 * 1024 * 1024;
constexpr qint64 Megabyte = 1024 * 1024;

} // namespace

qint64 RequiredFreeSpace(qint64 totalBytes, qint64 fileCount)
{
    return totalBytes + fileCount * BlockSize + SpaceMargin;
}

QString NotEnoughSpaceProblem(qint64 needed, std::optional<qint64> available)
{
    const qint64 neededMegabytes = (needed + Megabyte - 1) / Megabyte;
    if (!available)
        return QStringLiteral("There is not enough free space for the game: it needs %1 MB.").arg(neededMegabytes);
    return QStringLiteral("There is not enough free space for the game: it needs %1 MB, %2 MB are free.")
        .arg(neededMegabytes)
        .arg(*available / Megabyte);
}

std::optional<qint64> FreeBytes(const QString& folder)
{
#ifdef Q_OS_WIN
    ULARGE_INTEGER available {};
    const QString native = QDir::toNativeSeparators(QDir(folder).absolutePath()) + u'\\';
    if (!GetDiskFreeSpaceExW(reinterpret_cast<LPCWSTR>(native.utf16()), &available, nullptr, nullptr))
        return std::nullopt;
    return qint64(qMin<quint64>(available.QuadPart, quint64(std::numeric_limits<qint64>::max())));
#else
    struct statvfs status { };
    if (::statvfs(QFile::encodeName(folder).constData(), &status) != 0)
        return std::nullopt;
    const quint64 bytes = quint64(status.f_bavail) * quint64(status.f_frsize ? status.f_frsize : status.f_bsize);
    return qint64(qMin<quint64>(bytes, quint64(std::numeric_limits<qint64>::max())));
#endif
}

bool FileSystemFull(const QString& folder)
{
#ifdef Q_OS_WIN
    return FreeBytes(folder) == 0;
#else
    struct statvfs status { };
    if (::statvfs(QFile::encodeName(folder).constData(), &status) != 0)
        return false;
    return status.f_bavail == 0 || (status.f_files != 0 && status.f_favail == 0);
#endif
}

bool LastErrorWasDiskFull()
{
#ifdef Q_OS_WIN
    const DWORD error = GetLastError();
    return error == ERROR_DISK_FULL || error == ERROR_HANDLE_DISK_FULL;
#else
    return errno == ENOSPC || errno == EDQUOT;
#endif
}

} // namespace Brimvault

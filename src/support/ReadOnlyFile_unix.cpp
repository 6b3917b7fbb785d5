#include "support/ReadOnlyFile.h"

#ifndef Q_OS_WIN

#include <cerrno>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace Brimvault {

namespace {

// Without O_NONBLOCK, opening a named pipe would wait for a writer that may never come.
constexpr int ReadFlags = O_RDONLY | O_CLOEXEC | O_NONBLOCK;

} // namespace

OpenFolder::OpenFolder(const QString& path)
    : m_path(path)
{
    if (!path.isEmpty())
        m_descriptor = ::open(path.toUtf8().constData(), O_PATH | O_DIRECTORY | O_CLOEXEC);
}

OpenFolder::~OpenFolder()
{
    if (m_descriptor >= 0)
        ::close(m_descriptor);
}

ReadOnlyFile::ReadOnlyFile(const QString& path)
{
    // File names are UTF-8 here, and the plain encoder is much quicker than the locale's.
    if (!path.isEmpty())
        take(::open(path.toUtf8().constData(), ReadFlags));
}

ReadOnlyFile::ReadOnlyFile(const QString& path, const OpenFolder& folder)
{
    const QStringView name = QStringView(path).sliced(qMin(path.size(), folder.path().size()));
    const bool inFolder = folder.m_descriptor >= 0 && !name.isEmpty() && path.startsWith(folder.path())
        && folder.path().endsWith(u'/') && !name.contains(u'/');
    if (inFolder)
        take(::openat(folder.m_descriptor, name.toUtf8().constData(), ReadFlags));
    else if (!path.isEmpty())
        take(::open(path.toUtf8().constData(), ReadFlags));
}

void ReadOnlyFile::take(int descriptor)
{
    if (descriptor < 0) {
        m_state = (errno == ENOENT || errno == ENOTDIR) ? State::Missing : State::NotReadable;
        return;
    }
    struct stat status { };
    if (::fstat(descriptor, &status) != 0 || !S_ISREG(status.st_mode)) {
        ::close(descriptor);
        m_state = State::NotReadable;
        return;
    }
    m_descriptor = descriptor;
    m_size = status.st_size;
    m_state = State::Open;
}

ReadOnlyFile::~ReadOnlyFile()
{
    if (m_descriptor >= 0)
        ::close(m_descriptor);
}

QByteArray ReadOnlyFile::readAt(qint64 offset, qint64 count)
{
    if (!isOpen() || offset < 0 || count <= 0)
        return {};
    QByteArray bytes(count, Qt::Uninitialized);
    ssize_t got = -1;
    do
        got = ::pread(m_descriptor, bytes.data(), size_t(count), offset);
    while (got < 0 && errno == EINTR);
    // A regular file reads short only at its end, so one call is enough.
    m_failed = m_failed || got < 0;
    bytes.truncate(qMax<qint64>(got, 0));
    return bytes;
}

} // namespace Brimvault

#endif

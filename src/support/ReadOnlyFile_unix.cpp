#include "support/ReadOnlyFile.h"

#ifndef Q_OS_WIN

#include <cerrno>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace Brimvault {

ReadOnlyFile::ReadOnlyFile(const QString& path)
{
    if (path.isEmpty())
        return;
    // Without O_NONBLOCK, opening a named pipe would wait for a writer that may never come.
    // File names are UTF-8 here, and the plain encoder is much quicker than the locale's.
    const int descriptor = ::open(path.toUtf8().constData(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
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

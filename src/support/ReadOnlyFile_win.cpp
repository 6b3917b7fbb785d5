#include "support/ReadOnlyFile.h"

#ifdef Q_OS_WIN

#include <QFile>
#include <QFileInfo>

namespace Brimvault {

struct ReadOnlyFile::Handle {
    QFile file;
};

ReadOnlyFile::ReadOnlyFile(const QString& path)
    : m_handle(std::make_unique<Handle>())
{
    if (path.isEmpty())
        return;
    const QFileInfo info(path);
    if (!info.exists()) {
        m_state = State::Missing;
        return;
    }
    m_handle->file.setFileName(info.filePath());
    if (!info.isFile() || !m_handle->file.open(QIODevice::ReadOnly | QIODevice::Unbuffered)) {
        m_state = State::NotReadable;
        return;
    }
    m_size = m_handle->file.size();
    m_state = State::Open;
}

ReadOnlyFile::ReadOnlyFile(const QString& path, const OpenFolder&)
    : ReadOnlyFile(path)
{ }

ReadOnlyFile::~ReadOnlyFile() = default;

OpenFolder::OpenFolder(const QString& path)
    : m_path(path)
{ }

OpenFolder::~OpenFolder() = default;

QByteArray ReadOnlyFile::readAt(qint64 offset, qint64 count)
{
    if (!isOpen() || offset < 0 || count <= 0 || !m_handle->file.seek(offset))
        return {};
    QByteArray bytes = m_handle->file.read(count);
    m_failed = m_failed || m_handle->file.error() != QFileDevice::NoError;
    return bytes;
}

} // namespace Brimvault

#endif

#include "icons/PeSource.h"

#include <QFile>
#include <QFileInfo>
#include <QtEndian>

namespace Brimvault {

namespace {

constexpr qint64 PageSize = 4096;
constexpr qint64 ChunkSize = 16384;
// Past this many loaded bytes (overlapping windows) the whole file is read once instead.
constexpr qint64 MaxLoadedFactor = 2;

} // namespace

PeSource::~PeSource() = default;

std::unique_ptr<PeSource> PeSource::fromFile(const QString& path, int* platformError)
{
    std::unique_ptr<PeSource> source(new PeSource);
    source->m_file = std::make_unique<QFile>(path);
    // Only a regular file is opened: a named pipe in a game's place would block the window for good.
    if (!QFileInfo(path).isFile() || !source->m_file->open(QIODevice::ReadOnly)) {
        *platformError = QFileInfo::exists(path) ? 5 : 2;
        return nullptr;
    }
    source->m_size = source->m_file->size();
    *platformError = 0;
    return source;
}

std::unique_ptr<PeSource> PeSource::fromBytes(QByteArray bytes)
{
    std::unique_ptr<PeSource> source(new PeSource);
    source->m_size = bytes.size();
    source->m_windows.append({0, std::move(bytes)});
    return source;
}

bool PeSource::contains(qint64 offset, qint64 length) const
{
    return offset >= 0 && length >= 0 && offset <= m_size && length <= m_size - offset;
}

std::optional<QByteArrayView> PeSource::bytes(qint64 offset, qint64 length) const
{
    if (!contains(offset, length))
        return std::nullopt;
    for (const Window& window : m_windows) {
        if (offset >= window.offset && offset - window.offset <= window.bytes.size() - length)
            return QByteArrayView(window.bytes).sliced(offset - window.offset, length);
    }
    if (!m_file)
        return std::nullopt;
    qint64 start = offset - offset % PageSize;
    qint64 end = qMin(m_size, qMax(offset + length, start + ChunkSize));
    if (m_loaded + (end - start) > MaxLoadedFactor * m_size) {
        start = 0;
        end = m_size;
    }
    if (!m_file->seek(start))
        return std::nullopt;
    QByteArray chunk = m_file->read(end - start);
    // A file that shrank since it was opened: the bytes asked for are not there.
    if (chunk.size() != end - start)
        return std::nullopt;
    m_loaded += chunk.size();
    m_windows.append({start, std::move(chunk)});
    return QByteArrayView(m_windows.last().bytes).sliced(offset - start, length);
}

QByteArrayView PeSource::bytesUpTo(qint64 offset, qint64 maxLength) const
{
    if (offset < 0 || offset >= m_size || maxLength <= 0)
        return {};
    return bytes(offset, qMin(maxLength, m_size - offset)).value_or(QByteArrayView());
}

std::optional<quint8> PeSource::u8(qint64 offset) const
{
    const auto view = bytes(offset, 1);
    return view ? std::optional<quint8>(quint8(view->at(0))) : std::nullopt;
}

std::optional<quint16> PeSource::u16(qint64 offset) const
{
    const auto view = bytes(offset, 2);
    return view ? std::optional<quint16>(qFromLittleEndian<quint16>(view->data())) : std::nullopt;
}

std::optional<quint32> PeSource::u32(qint64 offset) const
{
    const auto view = bytes(offset, 4);
    return view ? std::optional<quint32>(qFromLittleEndian<quint32>(view->data())) : std::nullopt;
}

} // namespace Brimvault

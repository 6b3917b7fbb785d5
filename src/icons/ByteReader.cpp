#include "icons/ByteReader.h"

#include <QtEndian>

namespace Brimvault {

bool ByteReader::contains(qint64 offset, qint64 length) const
{
    return offset >= 0 && length >= 0 && offset <= size() && length <= size() - offset;
}

std::optional<quint8> ByteReader::u8(qint64 offset) const
{
    if (!contains(offset, 1))
        return std::nullopt;
    return static_cast<quint8>(m_bytes[offset]);
}

std::optional<quint16> ByteReader::u16(qint64 offset) const
{
    if (!contains(offset, 2))
        return std::nullopt;
    return qFromLittleEndian<quint16>(m_bytes.data() + offset);
}

std::optional<quint32> ByteReader::u32(qint64 offset) const
{
    if (!contains(offset, 4))
        return std::nullopt;
    return qFromLittleEndian<quint32>(m_bytes.data() + offset);
}

std::optional<qint32> ByteReader::i32(qint64 offset) const
{
    if (!contains(offset, 4))
        return std::nullopt;
    return qFromLittleEndian<qint32>(m_bytes.data() + offset);
}

std::optional<QByteArrayView> ByteReader::bytes(qint64 offset, qint64 length) const
{
    if (!contains(offset, length))
        return std::nullopt;
    return m_bytes.sliced(offset, length);
}

QByteArrayView ByteReader::bytesUpTo(qint64 offset, qint64 maxLength) const
{
    if (offset < 0 || offset >= size() || maxLength <= 0)
        return {};
    return m_bytes.sliced(offset, qMin(maxLength, size() - offset));
}

ByteReader ByteReader::sub(qint64 offset, qint64 length) const
{
    if (!contains(offset, length))
        return {};
    return ByteReader(m_bytes.sliced(offset, length));
}

} // namespace Brimvault

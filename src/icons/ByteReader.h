#pragma once

#include <QByteArrayView>
#include <QtGlobal>
#include <optional>

namespace Brimvault {

// Every read of outside bytes (executables, icon files, version blocks) goes through this reader: offsets and
// lengths are 64-bit, every answer says whether the bytes were there.
class ByteReader {
public:
    ByteReader() = default;
    explicit ByteReader(QByteArrayView bytes)
        : m_bytes(bytes)
    { }

    qint64 size() const { return m_bytes.size(); }
    bool contains(qint64 offset, qint64 length) const;

    std::optional<quint8> u8(qint64 offset) const;
    std::optional<quint16> u16(qint64 offset) const;
    std::optional<quint32> u32(qint64 offset) const;
    std::optional<qint32> i32(qint64 offset) const;
    std::optional<QByteArrayView> bytes(qint64 offset, qint64 length) const;
    // As many bytes as lie between offset and the end, at most maxLength.
    QByteArrayView bytesUpTo(qint64 offset, qint64 maxLength) const;
    // A reader over [offset, offset + length); empty when that range is not wholly inside.
    ByteReader sub(qint64 offset, qint64 length) const;

private:
    QByteArrayView m_bytes;
};

} // namespace Brimvault

#pragma once

#include <QByteArray>
#include <QByteArrayView>
#include <QList>
#include <QString>
#include <memory>
#include <optional>

class QFile;

namespace Brimvault {

// The bytes of an executable, read from the file only where the reader looks: a game's executable can be hundreds
// of megabytes, its icons a few kilobytes. Every read is bounds-checked against the file's size and answers
// success or failure; a file that shrinks under us gives failures, never stale or foreign bytes.
class PeSource {
public:
    static std::unique_ptr<PeSource> fromFile(const QString& path, int* platformError);
    static std::unique_ptr<PeSource> fromBytes(QByteArray bytes);
    ~PeSource();
    PeSource(const PeSource&) = delete;
    PeSource& operator=(const PeSource&) = delete;

    qint64 size() const { return m_size; }
    bool contains(qint64 offset, qint64 length) const;
    // The view stays valid as long as this source lives.
    std::optional<QByteArrayView> bytes(qint64 offset, qint64 length) const;
    // As many bytes as lie between offset and the end, at most maxLength.
    QByteArrayView bytesUpTo(qint64 offset, qint64 maxLength) const;
    std::optional<quint8> u8(qint64 offset) const;
    std::optional<quint16> u16(qint64 offset) const;
    std::optional<quint32> u32(qint64 offset) const;

private:
    PeSource() = default;
    struct Window {
        qint64 offset;
        QByteArray bytes;
    };

    std::unique_ptr<QFile> m_file;
    qint64 m_size = 0;
    mutable QList<Window> m_windows;
    mutable qint64 m_loaded = 0;
};

} // namespace Brimvault

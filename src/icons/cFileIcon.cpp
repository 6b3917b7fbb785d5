#include "icons/cFileIcon.h"

#include "icons/ByteReader.h"
#include "icons/NumberedError.h"
#include "icons/PeLayout.h"
#include "support/ReadOnlyFile.h"

#include <QFile>
#include <QtEndian>

namespace Brimvault {

using namespace detail;

namespace {

constexpr quint32 IconExists = ObjectErrorBase + 1049;
constexpr quint32 NoFilename = ObjectErrorBase + 1051;
constexpr quint32 CannotWrite = ObjectErrorBase + 1052;
constexpr quint32 WriteFailed = ObjectErrorBase + 1053;
// Far above any real icon image; keeps AddImage from asking for gigabytes.
constexpr qint64 MaxAddedImageBytes = qint64(1) << 27;
// What LoadIcon reads at once: the whole of a usual icon file.
constexpr qint64 FirstReadSize = qint64(1) << 16;

[[noreturn]] void raise(quint32 number, const QString& message)
{
    throw NumberedError(number, message, ErrorSource(QStringLiteral("cFileIcon")));
}

qint64 rowBytes(qint64 bits)
{
    return ((bits + 31) / 32) * 4;
}

// The 16 bytes at `at`, which the caller has made sure are there.
IconDirEntry readEntry(const char* at)
{
    IconDirEntry entry;
    entry.bWidth = quint8(at[0]);
    entry.bHeight = quint8(at[1]);
    entry.bColorCount = quint8(at[2]);
    entry.bReserved = quint8(at[3]);
    entry.wPlanes = qFromLittleEndian<quint16>(at + 4);
    entry.wBitCount = qFromLittleEndian<quint16>(at + 6);
    entry.dwBytesInRes = qFromLittleEndian<quint32>(at + 8);
    entry.dwImageOffset = qFromLittleEndian<quint32>(at + 12);
    return entry;
}

void appendU16(QByteArray& out, quint16 value)
{
    char bytes[2];
    qToLittleEndian(value, bytes);
    out.append(bytes, 2);
}

void appendU32(QByteArray& out, quint32 value)
{
    char bytes[4];
    qToLittleEndian(value, bytes);
    out.append(bytes, 4);
}

QByteArray entryBytes(const IconDirEntry& entry)
{
    QByteArray out;
    out.append(char(entry.bWidth)).append(char(entry.bHeight)).append(char(entry.bColorCount));
    out.append(char(entry.bReserved));
    appendU16(out, entry.wPlanes);
    appendU16(out, entry.wBitCount);
    appendU32(out, entry.dwBytesInRes);
    appendU32(out, entry.dwImageOffset);
    return out;
}

} // namespace

void cFileIcon::reset(const QString& sFileName)
{
    m_filename = sFileName;
    m_resourceId = QVariant();
    m_entries.clear();
    m_images.clear();
    m_fileBytes.clear();
    m_idReserved = 0;
    m_idType = 0;
    m_idCount = 0;
}

bool cFileIcon::LoadIcon(const QString& sFileName)
{
    // A folder or a named pipe in the icon's place is refused, not waited on.
    ReadOnlyFile file(sFileName);
    return loadFrom(sFileName, file);
}

bool cFileIcon::LoadIcon(const QString& sFileName, const OpenFolder& folder)
{
    ReadOnlyFile file(sFileName, folder);
    return loadFrom(sFileName, file);
}

bool cFileIcon::loadFrom(const QString& sFileName, ReadOnlyFile& file)
{
    reset(sFileName);
    m_lastLoadMessage.clear();
    // One read takes in the whole of a usual icon file; images beyond it are read on their own.
    const qint64 fileSize = file.size();
    QByteArray bytes;
    const auto readUpTo = [&](qint64 end) {
        if (end > bytes.size())
            bytes += file.readAt(bytes.size(), qMax(end, qMin(fileSize, FirstReadSize)) - bytes.size());
    };
    // A file that cannot be opened reads as nothing: the zeroed header then fails the type test.
    readUpTo(IconHeaderSize);
    const ByteReader headerReader {QByteArrayView(bytes)};
    m_idReserved = headerReader.u16(0).value_or(0);
    m_idType = headerReader.u16(2).value_or(0);
    m_idCount = qint16(headerReader.u16(4).value_or(0));
    if (m_idReserved != 0) {
        m_lastLoadMessage = QStringLiteral("File is not icon type (reserved member is 0)");
        return false;
    }
    if (m_idType != 1) {
        m_lastLoadMessage = QStringLiteral("File is not icon type (idType <> IMAGE_ICON)");
        return false;
    }
    if (m_idCount < 1) {
        m_lastLoadMessage = QStringLiteral("Icon contains no images.");
        return false;
    }

    bool failed = false;
    readUpTo(IconHeaderSize + IconDirEntrySize * m_idCount);
    const qsizetype entriesRead = qMin<qsizetype>(m_idCount, (bytes.size() - IconHeaderSize) / IconDirEntrySize);
    m_entries.reserve(entriesRead);
    m_images.reserve(entriesRead);
    // The images read with the directory stay where they are: each refers into these bytes, not a copy.
    m_fileBytes = bytes;
    for (int i = 0; i < m_idCount; ++i) {
        const qint64 at = IconHeaderSize + IconDirEntrySize * i;
        if (bytes.size() < at + IconDirEntrySize) {
            m_lastLoadMessage = QStringLiteral("Icon Directory Array is Corrupt.");
            failed = true;
            break;
        }
        m_entries.append(readEntry(bytes.constData() + at));
    }
    for (qsizetype i = 0; i < m_entries.size() && !failed; ++i) {
        const IconDirEntry& entry = m_entries.at(i);
        // Never ask for more than the file can hold: a size past its end is a short read anyway.
        const qint64 offset = entry.dwImageOffset;
        const qint64 size = entry.dwBytesInRes;
        const bool fits = offset <= fileSize && size <= fileSize - offset;
        QByteArray image;
        if (fits && offset + size <= m_fileBytes.size())
            image = QByteArray::fromRawData(m_fileBytes.constData() + offset, size);
        else if (fits)
            image = file.readAt(offset, size);
        if (!fits || image.size() < size) {
            m_lastLoadMessage = QStringLiteral("Icon Images Array is Corrupt.");
            failed = true;
            break;
        }
        m_images.append(image);
    }
    if (failed) {
        m_entries.clear();
        m_images.clear();
        m_fileBytes.clear();
        m_idCount = 0;
        return false;
    }
    return true;
}

QByteArray cFileIcon::toIconFile() const
{
    QByteArray out;
    appendU16(out, m_idReserved);
    appendU16(out, m_idType);
    appendU16(out, quint16(m_idCount));
    for (const IconDirEntry& entry : m_entries)
        out.append(entryBytes(entry));
    for (const QByteArray& image : m_images)
        out.append(image);
    return out;
}

bool cFileIcon::SaveIcon(const QString& sFileName)
{
    if (m_filename.isEmpty() && sFileName.isEmpty())
        raise(NoFilename, QStringLiteral("No filename specified."));
    if (m_idCount == 0)
        raise(CannotWrite, QStringLiteral("Icon contains no images."));
    if (!sFileName.isEmpty())
        m_filename = sFileName;

    QFile file(m_filename);
    if (!file.open(QIODevice::WriteOnly | QIODevice::Truncate))
        raise(CannotWrite, QStringLiteral("Couldn't open file for writing."));
    QByteArray header;
    appendU16(header, m_idReserved);
    appendU16(header, m_idType);
    appendU16(header, quint16(m_idCount));
    bool shortWrite = file.write(header) != header.size();
    for (qsizetype i = 0; i < m_entries.size() && !shortWrite; ++i) {
        const QByteArray raw = entryBytes(m_entries.at(i));
        shortWrite = file.write(raw) != raw.size();
    }
    for (qsizetype i = 0; i < m_images.size() && !shortWrite; ++i)
        shortWrite = file.write(m_images.at(i)) != m_images.at(i).size();
    if (!file.flush())
        shortWrite = true;
    file.close();
    if (shortWrite)
        raise(WriteFailed, QStringLiteral("General failure writing icon."));
    return true;
}

void cFileIcon::CloneTo(cFileIcon& target) const
{
    if (&target == this)
        return;
    target.m_filename = m_filename;
    target.m_resourceId = m_resourceId;
    target.m_idReserved = m_idReserved;
    target.m_idType = m_idType;
    target.m_idCount = m_idCount;
    target.m_entries = m_entries;
    target.m_images.clear();
    target.m_fileBytes.clear();
    for (const QByteArray& image : m_images)
        target.m_images.append(QByteArray(image.constData(), image.size()));
}

void cFileIcon::checkIndex(int nIndex) const
{
    if (nIndex < 1 || nIndex > m_entries.size())
        throw NumberedError(
            SubscriptOutOfRange, QStringLiteral("Subscript out of range"), ErrorSource(QStringLiteral("cFileIcon")));
}

const IconDirEntry& cFileIcon::entry(int nIndex) const
{
    checkIndex(nIndex);
    return m_entries.at(nIndex - 1);
}

QByteArray cFileIcon::imageBytes(int nIndex) const
{
    checkIndex(nIndex);
    if (nIndex > m_images.size())
        return {};
    // A copy of its own: the image may refer into bytes this icon lets go of on its next load.
    const QByteArray& image = m_images.at(nIndex - 1);
    return QByteArray(image.constData(), image.size());
}

int cFileIcon::ImageWidth(int nIndex) const
{
    return entry(nIndex).bWidth;
}

int cFileIcon::ImageHeight(int nIndex) const
{
    return entry(nIndex).bHeight;
}

qint64 cFileIcon::ImageColourCount(int nIndex) const
{
    const IconDirEntry& e = entry(nIndex);
    if (e.bColorCount != 0)
        return e.bColorCount;
    if (e.wBitCount == 32)
        return -1;
    // Bit counts no real image has would overflow; they saturate.
    return e.wBitCount >= 63 ? std::numeric_limits<qint64>::max() : qint64(1) << e.wBitCount;
}

int cFileIcon::ImageSize(int nIndex) const
{
    return int(entry(nIndex).dwBytesInRes);
}

void cFileIcon::AddImage(int lWidth, int lHeight, int lColours)
{
    IconDirEntry added;
    switch (lColours) {
    case 2:
        added.wBitCount = 1;
        added.bColorCount = 2;
        break;
    case 16:
        added.wBitCount = 4;
        added.bColorCount = 16;
        break;
    case 256:
        added.wBitCount = 8;
        break;
    default:
        added.wBitCount = 24;
        break;
    }
    added.wPlanes = 1;
    added.bWidth = quint8(lWidth);
    added.bHeight = quint8(lHeight);
    const qint64 size = BmpHeaderSize + 4 * qint64(lColours)
        + rowBytes(qint64(added.wBitCount) * lWidth * added.wPlanes) * lHeight + rowBytes(lWidth) * lHeight;
    if (lWidth < 0 || lHeight < 0 || lColours < 0 || size > MaxAddedImageBytes)
        throw NumberedError(InvalidProcedureCall, QStringLiteral("Invalid procedure call or argument"),
            ErrorSource(QStringLiteral("cFileIcon")));
    added.dwBytesInRes = quint32(size);

    quint32 end = 0;
    if (m_idCount >= 2) {
        qsizetype last = -1;
        for (qsizetype i = 0; i < m_entries.size(); ++i) {
            const IconDirEntry& e = m_entries.at(i);
            if (e.bHeight == lHeight && e.bWidth == lWidth && ImageColourCount(int(i + 1)) == lColours)
                raise(IconExists, QStringLiteral("Icon already exists."));
            if (last < 0 || e.dwImageOffset > m_entries.at(last).dwImageOffset)
                last = i;
        }
        if (last >= 0)
            end = m_entries.at(last).dwImageOffset + m_entries.at(last).dwBytesInRes;
        for (IconDirEntry& e : m_entries)
            e.dwImageOffset += IconDirEntrySize;
        end += IconDirEntrySize;
    }
    // The one-image quirk: with a single image already there, end is still 0.
    added.dwImageOffset = m_idCount == 0 ? IconHeaderSize + IconDirEntrySize : end;

    QByteArray image(size, '\0');
    qToLittleEndian<quint32>(BmpHeaderSize, image.data());
    qToLittleEndian<qint32>(lWidth, image.data() + BmpWidth);
    qToLittleEndian<qint32>(lHeight * 2, image.data() + BmpHeight);
    qToLittleEndian<quint16>(1, image.data() + BmpPlanes);
    qToLittleEndian<quint16>(added.wBitCount, image.data() + BmpBitCount);
    if (added.wBitCount == 1) {
        image[44] = char(255);
        image[45] = char(255);
        image[46] = char(255);
    }
    m_entries.append(added);
    m_images.append(image);
    ++m_idCount;
}

void cFileIcon::RemoveImage(int nIndex)
{
    if (m_idCount < 2) {
        m_entries.clear();
        m_images.clear();
        m_idCount = 0;
        return;
    }
    bool found = false;
    quint32 removedSize = 0;
    for (qsizetype i = 0; i < m_entries.size(); ++i) {
        if (i == nIndex - 1) {
            found = true;
            removedSize = m_entries.at(i).dwBytesInRes;
        } else if (found) {
            m_entries[i - 1] = m_entries.at(i);
            m_entries[i - 1].dwImageOffset -= removedSize;
            if (i < m_images.size())
                m_images[i - 1] = m_images.at(i);
        }
    }
    --m_idCount;
    if (!m_entries.isEmpty())
        m_entries.removeLast();
    if (!m_images.isEmpty())
        m_images.removeLast();
    if (found) {
        for (IconDirEntry& e : m_entries)
            e.dwImageOffset -= IconDirEntrySize;
    }
}

} // namespace Brimvault

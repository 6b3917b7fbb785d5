#include "PackageArchive.h"

#include <QFile>

#include <archive.h>
#include <archive_entry.h>

namespace Brimvault {

namespace {

constexpr size_t ReadBlockSize = 1024 * 1024;

EntryHeader::Kind entryKind(archive_entry* entry)
{
    if (archive_entry_hardlink(entry))
        return EntryHeader::Kind::HardLink;
    switch (archive_entry_filetype(entry)) {
    case AE_IFREG:
        return EntryHeader::Kind::File;
    case AE_IFDIR:
        return EntryHeader::Kind::Folder;
    case AE_IFLNK:
        return EntryHeader::Kind::SymbolicLink;
    default:
        return EntryHeader::Kind::Special;
    }
}

} // namespace

PackageArchive::PackageArchive() = default;

PackageArchive::~PackageArchive()
{
    release();
}

void PackageArchive::release()
{
    if (m_archive)
        archive_read_free(m_archive);
    m_archive = nullptr;
}

bool PackageArchive::openFile(const QString& path)
{
    release();
    m_archive = archive_read_new();
    archive_read_support_format_zip(m_archive);
    return archive_read_open_filename(m_archive, QFile::encodeName(path).constData(), ReadBlockSize) == ARCHIVE_OK;
}

bool PackageArchive::openMemory(const void* data, size_t size)
{
    release();
    m_archive = archive_read_new();
    archive_read_support_format_zip(m_archive);
    return archive_read_open_memory(m_archive, data, size) == ARCHIVE_OK;
}

PackageArchive::Next PackageArchive::nextHeader(EntryHeader& header)
{
    if (!m_archive)
        return Next::Error;
    archive_entry* entry = nullptr;
    const int status = archive_read_next_header(m_archive, &entry);
    if (status == ARCHIVE_EOF)
        return Next::End;
    if (status < ARCHIVE_WARN || !entry)
        return Next::Error;

    header = EntryHeader();
    const char* utf8Path = archive_entry_pathname_utf8(entry);
    header.pathReadable = utf8Path != nullptr;
    if (utf8Path)
        header.path = QString::fromUtf8(utf8Path);
    header.kind = entryKind(entry);
    header.sizeKnown = archive_entry_size_is_set(entry) != 0;
    header.size = header.sizeKnown ? archive_entry_size(entry) : 0;
    header.encrypted = archive_entry_is_encrypted(entry) != 0;
    if (archive_entry_mtime_is_set(entry))
        header.modified = QDateTime::fromSecsSinceEpoch(archive_entry_mtime(entry));
    return Next::Entry;
}

qint64 PackageArchive::readBlock(const void** block, qint64* offset)
{
    size_t size = 0;
    la_int64_t blockOffset = 0;
    const int status = archive_read_data_block(m_archive, block, &size, &blockOffset);
    *offset = blockOffset;
    if (status == ARCHIVE_EOF)
        return 0;
    // A bad checksum comes as a mere warning; for a package it is damage.
    if (status != ARCHIVE_OK)
        return -1;
    return qint64(size);
}

QString PackageArchive::errorText() const
{
    const char* text = m_archive ? archive_error_string(m_archive) : nullptr;
    return text ? QString::fromLocal8Bit(text) : QStringLiteral("unreadable archive");
}

} // namespace Brimvault

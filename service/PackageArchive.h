#pragma once

#include <QDateTime>
#include <QString>
#include <memory>
#include <optional>

struct archive;

namespace Brimvault {

// What one entry header of a package says about itself. Nothing here is trusted until validated.
struct EntryHeader {
    enum class Kind { File, Folder, SymbolicLink, HardLink, Special };

    QString path; // as stored, "/" separated
    bool pathReadable = true;
    Kind kind = Kind::File;
    qint64 size = 0;
    bool sizeKnown = true;
    bool encrypted = false;
    QDateTime modified;
};

// A package opened for reading with libarchive: ZIP only, read from a file or from memory.
class PackageArchive {
public:
    PackageArchive();
    ~PackageArchive();
    PackageArchive(const PackageArchive&) = delete;
    PackageArchive& operator=(const PackageArchive&) = delete;

    bool openFile(const QString& path);
    // The bytes must outlive the archive.
    bool openMemory(const void* data, size_t size);

    enum class Next { Entry, End, Error };
    // Reads the next header into `header`; Error leaves the reason in errorText().
    Next nextHeader(EntryHeader& header);

    // The data of the current entry in the archive's own blocks: size 0 at its end, -1 on error. `offset`
    // is where the block belongs in the entry.
    qint64 readBlock(const void** block, qint64* offset);

    QString errorText() const;

private:
    void release();

    archive* m_archive = nullptr;
};

} // namespace Brimvault

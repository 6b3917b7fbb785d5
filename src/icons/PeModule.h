#pragma once

#include "icons/PeSource.h"

#include <QByteArray>
#include <QHash>
#include <QList>
#include <QString>
#include <memory>
#include <optional>

namespace Brimvault {

// A resource type or name: an integer id, or a name text.
struct ResourceKey {
    bool named = false;
    quint16 id = 0;
    QString name;

    static ResourceKey fromId(quint16 value) { return {false, value, {}}; }
    static ResourceKey fromName(const QString& text) { return {true, 0, text}; }
    bool matches(const ResourceKey& other) const;
};

// One leaf of the resource tree, as a full walk finds it.
struct ResourceLeaf {
    ResourceKey type;
    ResourceKey name;
    quint16 language = 0;
    quint32 dataRva = 0;
    quint32 size = 0;
    qint64 fileOffset = -1; // -1 when the data lies outside the file
};

// Platform error numbers, so that callers can word failures as the system would.
enum class PeError {
    None = 0,
    FileNotFound = 2,
    AccessDenied = 5,
    InvalidHandle = 6,
    BadFormat = 193,
    NoResourceSection = 1812,
    TypeNotFound = 1813,
    NameNotFound = 1814,
};

// A PE executable (32- or 64-bit) read as data: its section table and resource directory. Portable, no
// platform loader involved.
class PeModule {
public:
    struct OpenResult {
        std::unique_ptr<PeModule> module;
        PeError error = PeError::None;
    };
    static OpenResult open(const QString& path);
    static OpenResult fromBytes(QByteArray bytes);
    ~PeModule();

    bool is64Bit() const { return m_is64; }
    bool hasResources() const { return m_resourceRva != 0; }

    // The types, and a type's names, in directory order: named entries first, then integer ids.
    QList<ResourceKey> resourceTypes() const;
    std::optional<QList<ResourceKey>> resourceNames(const ResourceKey& type) const;
    // The first language's data of a resource; nullopt when not found. sizeOnly answers the stored size even
    // when the data itself lies outside the file.
    struct Found {
        quint32 size = 0;
        std::optional<QByteArrayView> data;
    };
    std::optional<Found> findResource(const ResourceKey& type, const ResourceKey& name) const;
    // Every leaf of the tree, with a visited set and a cap on the number of leaves.
    QList<ResourceLeaf> allResources(int maxLeaves = 65536) const;

    std::optional<qint64> rvaToOffset(quint32 rva) const;

private:
    struct Section {
        quint32 virtualAddress;
        quint32 virtualSize;
        quint32 rawSize;
        quint32 rawPointer;
    };
    struct DirEntry {
        ResourceKey key;
        bool isDirectory;
        quint32 target; // offset from the resource root, without the high bit
    };

    struct Directory {
        QList<DirEntry> entries;
        QHash<quint16, qsizetype> byId;
        QHash<QString, qsizetype> byUpperName;
    };

    explicit PeModule(std::unique_ptr<PeSource> source);
    static OpenResult parsed(std::unique_ptr<PeSource> source);
    PeError parse();
    const Directory& directory(quint32 dirOffset) const;
    const QList<DirEntry>& directoryEntries(quint32 dirOffset) const { return directory(dirOffset).entries; }
    std::optional<DirEntry> findEntry(quint32 dirOffset, const ResourceKey& key) const;
    std::optional<ResourceLeaf> leafAt(quint32 dataEntryOffset) const;
    QString resourceName(quint32 nameOffset) const;

    std::unique_ptr<PeSource> m_source;
    bool m_is64 = false;
    quint32 m_sizeOfHeaders = 0;
    QList<Section> m_sections;
    quint32 m_resourceRva = 0;
    // Parsed once: lookups by id or name stay cheap however many resources a file declares.
    mutable QHash<quint32, Directory> m_directories;
    mutable QHash<quint32, QString> m_names;
    // Directories of a real file never overlap, so their entries fit in the file; crafted overlapping ones could
    // otherwise make the walk quadratic in the file's size.
    mutable qint64 m_entryBudget = 0;
};

} // namespace Brimvault

#include "icons/PeModule.h"

#include "icons/ByteReader.h"
#include "icons/PeLayout.h"

#include <QSet>

namespace Brimvault {

using namespace detail;

bool ResourceKey::matches(const ResourceKey& other) const
{
    if (named != other.named)
        return false;
    return named ? name.compare(other.name, Qt::CaseInsensitive) == 0 : id == other.id;
}

PeModule::PeModule(std::unique_ptr<PeSource> source)
    : m_source(std::move(source))
{ }

PeModule::~PeModule() = default;

PeModule::OpenResult PeModule::open(const QString& path)
{
    int platformError = 0;
    std::unique_ptr<PeSource> source = PeSource::fromFile(path, &platformError);
    if (!source)
        return {nullptr, PeError(platformError)};
    return parsed(std::move(source));
}

PeModule::OpenResult PeModule::fromBytes(QByteArray bytes)
{
    return parsed(PeSource::fromBytes(std::move(bytes)));
}

PeModule::OpenResult PeModule::parsed(std::unique_ptr<PeSource> source)
{
    std::unique_ptr<PeModule> module(new PeModule(std::move(source)));
    const PeError error = module->parse();
    if (error != PeError::None)
        return {nullptr, error};
    return {std::move(module), PeError::None};
}

PeError PeModule::parse()
{
    m_entryBudget = m_source->size() / ResDirEntrySize + 1024;
    if (m_source->u16(0) != DosMagic)
        return PeError::BadFormat;
    const auto peOffset = m_source->u32(DosPeOffsetField);
    if (!peOffset || m_source->u32(*peOffset) != PeSignature)
        return PeError::BadFormat;
    const qint64 fileHeader = qint64(*peOffset) + 4;
    const auto sectionCount = m_source->u16(fileHeader + FileHeaderSectionCount);
    const auto optionalSize = m_source->u16(fileHeader + FileHeaderOptionalSize);
    if (!sectionCount || !optionalSize)
        return PeError::BadFormat;
    const qint64 optional = fileHeader + FileHeaderSize;
    const auto magic = m_source->u16(optional);
    if (magic != OptionalMagic32 && magic != OptionalMagic64)
        return PeError::BadFormat;
    m_is64 = magic == OptionalMagic64;
    const qint64 dirCountAt = m_is64 ? Optional64DataDirCount : Optional32DataDirCount;
    const qint64 dirsAt = m_is64 ? Optional64DataDirs : Optional32DataDirs;
    m_sizeOfHeaders = m_source->u32(optional + OptionalSizeOfHeaders).value_or(0);

    const qint64 sectionTable = optional + *optionalSize;
    for (qint64 i = 0; i < *sectionCount; ++i) {
        const qint64 at = sectionTable + i * SectionHeaderSize;
        const auto header = m_source->bytes(at, SectionHeaderSize);
        if (!header)
            return PeError::BadFormat;
        const ByteReader section(*header);
        m_sections.append({*section.u32(SectionVirtualAddress), *section.u32(SectionVirtualSize),
            *section.u32(SectionRawSize), *section.u32(SectionRawPointer)});
    }

    const auto dirCount = m_source->u32(optional + dirCountAt);
    const qint64 resourceDir = optional + dirsAt + ResourceDataDirIndex * DataDirSize;
    // The data directory must lie inside the optional header the file header announced.
    if (dirCount && *dirCount > ResourceDataDirIndex && resourceDir + DataDirSize <= sectionTable) {
        const quint32 rva = m_source->u32(resourceDir).value_or(0);
        const quint32 size = m_source->u32(resourceDir + 4).value_or(0);
        if (rva != 0 && size != 0 && rvaToOffset(rva))
            m_resourceRva = rva;
    }
    return PeError::None;
}

std::optional<qint64> PeModule::rvaToOffset(quint32 rva) const
{
    for (const Section& section : m_sections) {
        const quint32 span = qMax(section.virtualSize, section.rawSize);
        if (rva < section.virtualAddress || quint64(rva) >= quint64(section.virtualAddress) + span)
            continue;
        const quint32 delta = rva - section.virtualAddress;
        // Bytes past the raw data are zero-filled by the loader: they are not in the file.
        if (delta >= section.rawSize)
            return std::nullopt;
        const qint64 offset = qint64(section.rawPointer) + delta;
        if (offset >= m_source->size())
            return std::nullopt;
        return offset;
    }
    if (rva < m_sizeOfHeaders && rva < m_source->size())
        return qint64(rva);
    return std::nullopt;
}

QString PeModule::resourceName(quint32 nameOffset) const
{
    const auto cached = m_names.constFind(nameOffset);
    if (cached != m_names.cend())
        return *cached;
    QString name;
    const auto at
        = quint64(m_resourceRva) + nameOffset > 0xFFFFFFFFu ? std::nullopt : rvaToOffset(m_resourceRva + nameOffset);
    if (at) {
        const quint16 length = qMin<quint16>(m_source->u16(*at).value_or(0), MaxResourceNameLength);
        const QByteArrayView chars = m_source->bytesUpTo(*at + 2, qint64(length) * 2);
        name = QString::fromUtf16(reinterpret_cast<const char16_t*>(chars.data()), chars.size() / 2);
    }
    m_names.insert(nameOffset, name);
    return name;
}

const PeModule::Directory& PeModule::directory(quint32 dirOffset) const
{
    const auto cached = m_directories.constFind(dirOffset);
    if (cached != m_directories.cend())
        return *cached;
    Directory dir;
    const auto at
        = quint64(m_resourceRva) + dirOffset > 0xFFFFFFFFu ? std::nullopt : rvaToOffset(m_resourceRva + dirOffset);
    const auto header = at ? m_source->bytes(*at, ResDirHeaderSize) : std::nullopt;
    if (header) {
        const ByteReader headerReader(*header);
        const qint64 count = qint64(*headerReader.u16(ResDirNamedCount)) + *headerReader.u16(ResDirIdCount);
        const qint64 first = *at + ResDirHeaderSize;
        // A count running past the end of the file lists what is there.
        const qint64 available
            = qBound<qint64>(0, qMin(count, (m_source->size() - first) / ResDirEntrySize), m_entryBudget);
        m_entryBudget -= available;
        const ByteReader table(m_source->bytes(first, available * ResDirEntrySize).value_or(QByteArrayView()));
        QList<DirEntry> ids;
        for (qint64 i = 0; i < table.size() / ResDirEntrySize; ++i) {
            const quint32 name = *table.u32(i * ResDirEntrySize);
            const quint32 target = *table.u32(i * ResDirEntrySize + 4);
            DirEntry entry {{}, (target & ResHighBit) != 0, target & ~ResHighBit};
            if (name & ResHighBit) {
                entry.key = ResourceKey::fromName(resourceName(name & ~ResHighBit));
                dir.entries.append(entry);
            } else {
                entry.key = ResourceKey::fromId(quint16(name));
                ids.append(entry);
            }
        }
        dir.entries.append(ids);
        // The first of several equal keys wins, as a linear search would find it.
        for (qsizetype i = dir.entries.size() - 1; i >= 0; --i) {
            const ResourceKey& key = dir.entries.at(i).key;
            if (key.named)
                dir.byUpperName[key.name.toUpper()] = i;
            else
                dir.byId[key.id] = i;
        }
    }
    return *m_directories.insert(dirOffset, std::move(dir));
}

std::optional<PeModule::DirEntry> PeModule::findEntry(quint32 dirOffset, const ResourceKey& key) const
{
    const Directory& dir = directory(dirOffset);
    if (key.named) {
        const auto it = dir.byUpperName.constFind(key.name.toUpper());
        if (it != dir.byUpperName.cend())
            return dir.entries.at(*it);
    } else {
        const auto it = dir.byId.constFind(key.id);
        if (it != dir.byId.cend())
            return dir.entries.at(*it);
    }
    return std::nullopt;
}

QList<ResourceKey> PeModule::resourceTypes() const
{
    QList<ResourceKey> types;
    if (!hasResources())
        return types;
    for (const DirEntry& entry : directoryEntries(0))
        types.append(entry.key);
    return types;
}

std::optional<QList<ResourceKey>> PeModule::resourceNames(const ResourceKey& type) const
{
    if (!hasResources())
        return std::nullopt;
    const auto typeEntry = findEntry(0, type);
    if (!typeEntry || !typeEntry->isDirectory)
        return std::nullopt;
    QList<ResourceKey> names;
    for (const DirEntry& entry : directoryEntries(typeEntry->target))
        names.append(entry.key);
    return names;
}

std::optional<ResourceLeaf> PeModule::leafAt(quint32 dataEntryOffset) const
{
    if (quint64(m_resourceRva) + dataEntryOffset > 0xFFFFFFFFu)
        return std::nullopt;
    const auto at = rvaToOffset(m_resourceRva + dataEntryOffset);
    const auto entry = at ? m_source->bytes(*at, ResDataEntrySize) : std::nullopt;
    if (!entry)
        return std::nullopt;
    const ByteReader entryReader(*entry);
    ResourceLeaf leaf;
    leaf.dataRva = *entryReader.u32(0);
    leaf.size = *entryReader.u32(4);
    const auto offset = rvaToOffset(leaf.dataRva);
    if (offset && m_source->contains(*offset, leaf.size))
        leaf.fileOffset = *offset;
    return leaf;
}

std::optional<PeModule::Found> PeModule::findResource(const ResourceKey& type, const ResourceKey& name) const
{
    if (!hasResources())
        return std::nullopt;
    const auto typeEntry = findEntry(0, type);
    if (!typeEntry || !typeEntry->isDirectory)
        return std::nullopt;
    const auto nameEntry = findEntry(typeEntry->target, name);
    if (!nameEntry)
        return std::nullopt;
    quint32 dataEntry = nameEntry->target;
    if (nameEntry->isDirectory) {
        const QList<DirEntry> languages = directoryEntries(nameEntry->target);
        if (languages.isEmpty() || languages.first().isDirectory)
            return std::nullopt;
        dataEntry = languages.first().target;
    }
    const auto leaf = leafAt(dataEntry);
    if (!leaf)
        return std::nullopt;
    Found found;
    found.size = leaf->size;
    if (leaf->fileOffset >= 0)
        found.data = m_source->bytes(leaf->fileOffset, leaf->size);
    return found;
}

QList<ResourceLeaf> PeModule::allResources(int maxLeaves) const
{
    QList<ResourceLeaf> leaves;
    if (!hasResources())
        return leaves;
    // Directories shared between branches, or pointing back up, are walked once.
    QSet<quint32> visited {0};
    for (const DirEntry& type : directoryEntries(0)) {
        if (!type.isDirectory || visited.contains(type.target))
            continue;
        visited.insert(type.target);
        for (const DirEntry& name : directoryEntries(type.target)) {
            if (!name.isDirectory || visited.contains(name.target))
                continue;
            visited.insert(name.target);
            for (const DirEntry& language : directoryEntries(name.target)) {
                if (language.isDirectory)
                    continue;
                auto leaf = leafAt(language.target);
                if (!leaf)
                    continue;
                leaf->type = type.key;
                leaf->name = name.key;
                leaf->language = language.key.id;
                leaves.append(*leaf);
                if (leaves.size() >= maxLeaves)
                    return leaves;
            }
        }
    }
    return leaves;
}

} // namespace Brimvault

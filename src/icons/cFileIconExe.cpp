#include "icons/cFileIcon.h"

#include "icons/ByteReader.h"
#include "icons/NumberedError.h"
#include "icons/PeLayout.h"
#include "icons/PeModule.h"
#include "icons/cResources.h"

namespace Brimvault {

using namespace detail;

namespace {

constexpr quint16 RtIcon = 3;
constexpr quint16 RtGroupIcon = 14;

// A name of the form "#123" stands for the integer id 123, as the platform's resource lookup reads it.
ResourceKey keyFromText(const QString& text)
{
    if (text.startsWith(u'#')) {
        bool ok = false;
        const uint value = QStringView(text).mid(1).toUInt(&ok, 10);
        if (ok && value <= 0xFFFF && !text.mid(1).startsWith(u'+'))
            return ResourceKey::fromId(quint16(value));
    }
    return ResourceKey::fromName(text);
}

} // namespace

bool cFileIcon::LoadIconFromEXE(const QString& sFileName, int lID, const QString& sName)
{
    reset(sFileName);
    const PeModule::OpenResult opened = PeModule::open(sFileName);
    if (!opened.module)
        return false;
    return loadGroup(*opened.module, lID, sName);
}

bool cFileIcon::loadGroup(const PeModule& module, int lID, const QString& sName)
{
    const ResourceKey groupType = ResourceKey::fromId(RtGroupIcon);
    std::optional<PeModule::Found> group;
    if (lID != 0) {
        group = module.findResource(groupType, keyFromText(u'#' + QString::number(lID)));
        if (group)
            m_resourceId = lID;
    }
    if (!group) {
        group = module.findResource(groupType, keyFromText(sName));
        if (!group)
            return false;
        m_resourceId = sName;
    }
    if (!group->data)
        return false;
    const ByteReader groupReader(*group->data);
    if (!groupReader.contains(0, IconHeaderSize))
        return false;
    m_idReserved = *groupReader.u16(0);
    m_idType = *groupReader.u16(2);
    m_idCount = qint16(*groupReader.u16(4));
    if (m_idCount < 1)
        return false;

    bool failed = !groupReader.contains(IconHeaderSize, GroupEntrySize * m_idCount);
    QList<quint16> imageIds;
    quint32 offset = IconHeaderSize + IconDirEntrySize * quint32(m_idCount);
    for (int k = 0; k < m_idCount && !failed; ++k) {
        const qint64 at = IconHeaderSize + GroupEntrySize * k;
        IconDirEntry entry;
        entry.bWidth = *groupReader.u8(at);
        entry.bHeight = *groupReader.u8(at + 1);
        entry.bColorCount = *groupReader.u8(at + 2);
        entry.bReserved = *groupReader.u8(at + 3);
        entry.wPlanes = *groupReader.u16(at + 4);
        entry.wBitCount = *groupReader.u16(at + 6);
        entry.dwBytesInRes = *groupReader.u32(at + 8);
        entry.dwImageOffset = offset;
        offset += entry.dwBytesInRes;
        imageIds.append(*groupReader.u16(at + 12));
        m_entries.append(entry);
    }

    const ResourceKey imageType = ResourceKey::fromId(RtIcon);
    for (qsizetype k = 0; k < m_entries.size() && !failed; ++k) {
        // The id is read as a signed 16-bit number: ids above 32767 become "#-..." and are never found.
        const qint16 id = qint16(imageIds.at(k));
        if (id < 0) {
            failed = true;
            break;
        }
        const auto image = module.findResource(imageType, ResourceKey::fromId(quint16(id)));
        if (!image) {
            failed = true;
            break;
        }
        // A size that disagrees with the group fails the load as surely as a missing image.
        if (image->size == 0 || image->size != m_entries.at(k).dwBytesInRes || !image->data) {
            failed = true;
            break;
        }
        m_images.append(image->data->toByteArray());
    }

    if (failed) {
        m_entries.clear();
        m_images.clear();
        m_idCount = 0;
        m_resourceId = QVariant();
        return false;
    }
    return true;
}

bool cFileIcon::LoadMainIconFromEXE(const QString& sFileName)
{
    reset(sFileName);
    std::unique_ptr<PeModule> module;
    QList<QVariant> groups;
    try {
        cResources resources;
        resources.setFile(sFileName);
        resources.GetResourceTypes();
        const int typeIndex = resources.IndexOfResourceType(RtGroupIcon);
        if (typeIndex == 0)
            return false;
        const int count = resources.GetResourceNames(typeIndex);
        for (int j = 1; j <= count; ++j)
            groups.append(resources.ResourceName(typeIndex, j));
        module = resources.releaseModule();
    } catch (const NumberedError&) {
        return false;
    }
    // The groups are loaded from the bytes already read rather than loading the file once per group.
    for (const QVariant& name : groups) {
        reset(sFileName);
        const bool loaded = name.typeId() == QMetaType::Int ? loadGroup(*module, name.toInt(), QString())
                                                            : loadGroup(*module, 0, name.toString());
        if (loaded)
            return true;
    }
    reset(sFileName);
    return false;
}

} // namespace Brimvault

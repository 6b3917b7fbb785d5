#include "icons/cResources.h"

#include "icons/NumberedError.h"
#include "icons/PeModule.h"
#include "icons/mResource.h"

namespace Brimvault {

namespace {

constexpr quint32 LoadFailed = ObjectErrorBase + 0x419;
constexpr quint32 NamesFailed = ObjectErrorBase + 0x41A;

[[noreturn]] void raise(quint32 number, PeError error, const char* object)
{
    throw NumberedError(number, mResource::ApiErrorText(error), ErrorSource(QString::fromLatin1(object)));
}

[[noreturn]] void subscriptOutOfRange()
{
    throw NumberedError(
        SubscriptOutOfRange, QStringLiteral("Subscript out of range"), ErrorSource(QStringLiteral("cResources")));
}

} // namespace

cResources::cResources() = default;

cResources::~cResources()
{
    ClearUp();
}

void cResources::setFile(const QString& sFile)
{
    ClearUp();
    m_file = sFile;
    PeModule::OpenResult opened = PeModule::open(sFile);
    if (!opened.module)
        raise(LoadFailed, opened.error, "cResources");
    m_module = std::move(opened.module);
}

int cResources::GetResourceTypes()
{
    m_types.clear();
    QList<ResourceKey> keys;
    const PeError error = mResource::EnumTypes(m_module.get(), keys);
    if (error != PeError::None)
        raise(LoadFailed, error, "cResource");
    for (const ResourceKey& key : keys)
        m_types.append(key.named ? TypeRecord {0, key.name} : TypeRecord {key.id, {}});
    return int(m_types.size());
}

int cResources::IndexOfResourceType(qint32 lTypeId) const
{
    for (qsizetype i = 0; i < m_types.size(); ++i) {
        if (m_types.at(i).id == lTypeId)
            return int(i + 1);
    }
    return 0;
}

const cResources::TypeRecord& cResources::typeAt(int nIndex) const
{
    if (nIndex < 1 || nIndex > m_types.size())
        subscriptOutOfRange();
    return m_types.at(nIndex - 1);
}

QVariant cResources::ResourceType(int nIndex) const
{
    const TypeRecord& type = typeAt(nIndex);
    return type.name.isEmpty() ? QVariant(type.id) : QVariant(type.name);
}

QString cResources::ResourceTypeName(qint32 lTypeId)
{
    switch (lTypeId) {
    case 1:
        return QStringLiteral("Cursor");
    case 2:
        return QStringLiteral("Bitmap");
    case 3:
        return QStringLiteral("Icon");
    case 4:
        return QStringLiteral("Menu");
    case 5:
        return QStringLiteral("Dialog");
    case 6:
        return QStringLiteral("String");
    case 7:
        return QStringLiteral("Font Directory");
    case 8:
        return QStringLiteral("Font");
    case 9:
        return QStringLiteral("Accelerators");
    case 10:
        return QStringLiteral("RC Data");
    case 11:
        return QStringLiteral("Message Table");
    case 12:
        return QStringLiteral("Group Cursor");
    case 14:
        return QStringLiteral("Group Icon");
    case 16:
        return QStringLiteral("Version");
    case 17:
        return QStringLiteral("Dialog Include");
    case 19:
    case 20:
        return QStringLiteral("VXD");
    case 21:
        return QStringLiteral("Animated Cursor");
    case 22:
        return QStringLiteral("Animated Icon");
    case 23:
        return QStringLiteral("HTML");
    default:
        return QStringLiteral("Other (") + QString::number(lTypeId) + u')';
    }
}

const cResources::NameList* cResources::namesOf(int nTypeIndex) const
{
    for (const NameList& list : m_nameLists) {
        if (list.typeIndex == nTypeIndex)
            return &list;
    }
    return nullptr;
}

int cResources::GetResourceNames(int nTypeIndex)
{
    const TypeRecord& type = typeAt(nTypeIndex);
    qsizetype slot = -1;
    for (qsizetype i = 0; i < m_nameLists.size() && slot < 0; ++i) {
        if (m_nameLists.at(i).typeIndex == nTypeIndex)
            slot = i;
    }
    for (qsizetype i = 0; i < m_nameLists.size() && slot < 0; ++i) {
        if (m_nameLists.at(i).typeIndex == 0)
            slot = i;
    }
    if (slot < 0) {
        m_nameLists.append(NameList {});
        slot = m_nameLists.size() - 1;
    }
    NameList& list = m_nameLists[slot];
    list.typeIndex = nTypeIndex;
    list.names.clear();

    const ResourceKey key
        = type.name.isEmpty() ? ResourceKey::fromId(quint16(type.id)) : ResourceKey::fromName(type.name);
    QList<ResourceKey> names;
    const PeError error = mResource::EnumNames(m_module.get(), key, names);
    if (error != PeError::None)
        raise(NamesFailed, error, "cResource");
    for (const ResourceKey& name : names)
        list.names.append(mResource::KeyToVariant(name));
    return int(list.names.size());
}

int cResources::ResourceNameCount(int nTypeIndex) const
{
    const NameList* list = namesOf(nTypeIndex);
    return list ? int(list->names.size()) : 0;
}

QVariant cResources::ResourceName(int nTypeIndex, int nIndex) const
{
    const NameList* list = namesOf(nTypeIndex);
    if (!list || nIndex < 1 || nIndex > list->names.size())
        subscriptOutOfRange();
    return list->names.at(nIndex - 1);
}

void cResources::UnloadModule()
{
    m_module.reset();
}

std::unique_ptr<PeModule> cResources::releaseModule()
{
    return std::move(m_module);
}

void cResources::ClearUp()
{
    UnloadModule();
    m_types.clear();
    m_nameLists.clear();
}

} // namespace Brimvault

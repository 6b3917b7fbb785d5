#pragma once

#include <QList>
#include <QString>
#include <QVariant>
#include <memory>

namespace Brimvault {

class PeModule;

// Lists the resource types of an executable and, per type, the names or integer ids of its resources, in the
// order of its resource directory. Failures raise NumberedError (source ".cResources" / ".cResource").
class cResources {
public:
    cResources();
    ~cResources();
    cResources(const cResources&) = delete;
    cResources& operator=(const cResources&) = delete;

    // Loads the executable as data; a file that cannot be loaded raises 0x80040419.
    void setFile(const QString& sFile);
    QString file() const { return m_file; }
    // The executable loaded as data; null when none.
    const PeModule* hModule() const { return m_module.get(); }

    int GetResourceTypes();
    int ResourceTypeCount() const { return int(m_types.size()); }
    int IndexOfResourceType(qint32 lTypeId) const;
    QVariant ResourceType(int nIndex) const;
    static QString ResourceTypeName(qint32 lTypeId);

    int GetResourceNames(int nTypeIndex);
    int ResourceNameCount(int nTypeIndex) const;
    QVariant ResourceName(int nTypeIndex, int nIndex) const;

    void UnloadModule();
    void ClearUp();
    // Hands the loaded module to the caller (hModule becomes null), so that what follows reads the same bytes
    // without loading the file again.
    std::unique_ptr<PeModule> releaseModule();

private:
    struct TypeRecord {
        qint32 id = 0;
        QString name;
    };
    struct NameList {
        int typeIndex = 0; // 0: a free slot
        QList<QVariant> names;
    };

    const TypeRecord& typeAt(int nIndex) const;
    const NameList* namesOf(int nTypeIndex) const;

    QString m_file;
    std::unique_ptr<PeModule> m_module;
    QList<TypeRecord> m_types;
    QList<NameList> m_nameLists;
};

} // namespace Brimvault

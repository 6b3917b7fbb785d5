#include "app/clsFileVersion.h"

#include "icons/VersionResource.h"

#include <QStringList>

namespace Brimvault {

bool clsFileVersion::ReadVersion(const QString& sFullFileName)
{
    for (QString& field : m_fields)
        field.clear();
    const auto strings = ReadVersionStrings(sFullFileName);
    if (!strings)
        return false;
    for (size_t i = 0; i < m_fields.size() && qsizetype(i) < strings->values.size(); ++i)
        m_fields[i] = strings->values.at(qsizetype(i));
    m_fullFileName = sFullFileName;
    return true;
}

QString clsFileVersion::GetAll() const
{
    const QStringList ordered {ProductName(), ProductVersion(), InternalName(), FileDescription(), FileVersion(),
        CompanyName(), LegalCopyright(), OriginalFileName()};
    return ordered.join(QStringLiteral("; "));
}

} // namespace Brimvault

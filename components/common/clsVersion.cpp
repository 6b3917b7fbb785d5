#include "clsVersion.h"

namespace Brimvault {

clsVersion::clsVersion(QString version, QObject* parent)
    : QObject(parent)
    , m_version(std::move(version))
{ }

QString clsVersion::GetVersion() const
{
    return m_version;
}

} // namespace Brimvault

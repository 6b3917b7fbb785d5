#include "catalogue/GameEntry.h"

namespace Brimvault {

QString IconSourceName(IconSource source)
{
    switch (source) {
    case IconSource::File:
        return QStringLiteral("file");
    case IconSource::Cache:
        return QStringLiteral("cache");
    case IconSource::Flash:
        return QStringLiteral("flash");
    case IconSource::Online:
        return QStringLiteral("online");
    case IconSource::Queued:
        break;
    }
    return QStringLiteral("queued");
}

} // namespace Brimvault

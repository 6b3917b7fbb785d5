#include "ui/listview/ListError.h"

namespace Brimvault {

ListError ListError::missingElement(int index)
{
    return {340, QStringLiteral("Control array element '%1' doesn't exist").arg(index)};
}

ListError ListError::overflow()
{
    return {6, QStringLiteral("Overflow")};
}

} // namespace Brimvault

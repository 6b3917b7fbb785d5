#pragma once

#include <QString>

namespace Brimvault {

// The path as it lies on disk when it names an existing file or folder apart from letter case, otherwise the
// path unchanged. Paths reach us upper-cased ("Open game offline", renamed games); on Windows the file system
// ignores the case anyway, elsewhere each part of the path is matched against the folder's entries.
QString ExistingPathIgnoringCase(const QString& path);

} // namespace Brimvault

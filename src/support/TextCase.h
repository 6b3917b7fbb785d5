#pragma once

#include <QString>

namespace Brimvault {

// QString::toUpper, toLower and toCaseFolded, with the same results, but a plain loop when the text is ASCII: the
// general conversion looks every character up in the Unicode tables, which a pass over thousands of paths
// notices.
QString UpperCased(const QString& text);
QString LowerCased(const QString& text);
QString CaseFolded(const QString& text);

// QString::indexOf(key, from, Qt::CaseInsensitive), with a plain comparison when both texts are ASCII.
qsizetype IndexOfIgnoringCase(const QString& text, const QString& key, qsizetype from);

} // namespace Brimvault

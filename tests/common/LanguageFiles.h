#pragma once

#include <QByteArray>
#include <QString>

// A language file in `folder`: its "#language" and "#charset" settings, then `texts` as they stand (lines
// such as "@10=Title\r\n"). Returns the file's path, empty when it could not be written.
QString WriteLanguageFile(const QString& folder, const QString& name, const QByteArray& language, int charset,
    const QByteArray& texts = QByteArrayLiteral("@10=Title\r\n"));

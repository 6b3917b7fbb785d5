#include "LanguageFiles.h"

#include "TestFiles.h"

QString WriteLanguageFile(
    const QString& folder, const QString& name, const QByteArray& language, int charset, const QByteArray& texts)
{
    const QString path = folder + u'/' + name;
    const QByteArray header = "#language=" + language + "\r\n#charset=" + QByteArray::number(charset) + "\r\n";
    return WriteFile(path, header + texts) ? path : QString();
}

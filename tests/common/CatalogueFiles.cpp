#include "CatalogueFiles.h"

#include "icons/cFileIcon.h"

#include "PeFixtures.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

QString CatalogueFixture(const QString& name)
{
    return QStringLiteral(BRIMVAULT_TEST_DATA_DIR "/catalogue/") + name;
}

bool CopyFixture(const QString& fixture, const QString& path)
{
    QDir().mkpath(QFileInfo(path).absolutePath());
    QFile::remove(path);
    return QFileInfo::exists(fixture) && QFile::copy(fixture, path);
}

QByteArray ValidIconFile()
{
    Brimvault::cFileIcon icon;
    return icon.LoadMainIconFromEXE(PeFixture(QStringLiteral("multi64.exe"))) ? icon.toIconFile() : QByteArray();
}

#include "CatalogueFiles.h"

#include "icons/cFileIcon.h"

#include "PeFixtures.h"
#include "TestFiles.h"

#include <QFileInfo>

QString CatalogueFixture(const QString& name)
{
    return QStringLiteral(BRIMVAULT_TEST_DATA_DIR "/catalogue/") + name;
}

bool CopyFixture(const QString& fixture, const QString& path)
{
    return QFileInfo::exists(fixture) && WriteFile(path, ReadFile(fixture));
}

QByteArray ValidIconFile()
{
    Brimvault::cFileIcon icon;
    return icon.LoadMainIconFromEXE(PeFixture(QStringLiteral("multi64.exe"))) ? icon.toIconFile() : QByteArray();
}

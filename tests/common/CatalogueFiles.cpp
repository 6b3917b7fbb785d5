#include "CatalogueFiles.h"

#include "store/clsFileBag.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

bool WriteInfoFile(const QString& path, const QList<QPair<QString, QString>>& records)
{
    QDir().mkpath(QFileInfo(path).absolutePath());
    Brimvault::clsFileBag bag;
    for (const auto& [key, value] : records)
        bag.SetRecord(Brimvault::clsFileBag::MakeKey(key), value);
    bag.SetCurrentFileName(path);
    return bag.SaveFile();
}

bool WriteStopMark(const QString& folder, const QString& value)
{
    return WriteInfoFile(folder + QStringLiteral("/DirInfo.bvxinf"), {{QStringLiteral("StopDir"), value}});
}

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

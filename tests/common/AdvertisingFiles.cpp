#include "AdvertisingFiles.h"

#include "store/clsFileBag.h"

#include <QDir>
#include <QImage>

using Brimvault::clsFileBag;

bool WriteReclamaInfo(const QString& folder, const QList<AdvertisingRecord>& records)
{
    clsFileBag bag;
    bag.SetCurrentFileName(QDir(folder).filePath(QStringLiteral("Reclama.ifb")));
    for (const AdvertisingRecord& record : records) {
        bag.SetRecord(clsFileBag::MakeKey(record.name, QStringLiteral("URL")), record.url);
        bag.SetRecord(clsFileBag::MakeKey(record.name, QStringLiteral("DateShowFrom")), record.showFrom);
        bag.SetRecord(clsFileBag::MakeKey(record.name, QStringLiteral("DateShowTo")), record.showTo);
    }
    return QDir().mkpath(folder) && bag.SaveFile();
}

bool WritePicture(const QString& path, const QColor& colour, const QSize& size)
{
    QImage picture(size, QImage::Format_RGB32);
    picture.fill(colour);
    return QDir().mkpath(QFileInfo(path).absolutePath()) && picture.save(path);
}

bool WriteDueAdvertisement(const QString& reclamaFolder, const QString& clickAddress, const QColor& colour)
{
    return WritePicture(QDir(reclamaFolder).filePath(QStringLiteral("Image_summer.png")), colour)
        && WriteReclamaInfo(reclamaFolder,
            {{QStringLiteral("image_summer"), clickAddress, QStringLiteral("X.X.X"), QStringLiteral("X.X.X")}});
}

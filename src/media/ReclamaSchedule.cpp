#include "media/ReclamaSchedule.h"

#include "media/ReclamaDate.h"
#include "store/DataFolders.h"
#include "store/clsFileBag.h"

#include <QDate>
#include <QDir>
#include <QRandomGenerator>
#include <QTime>

namespace Brimvault::ReclamaSchedule {

bool ShowsReclamaOnUnload(UnloadMode mode)
{
    return mode == UnloadMode::FormControlMenu || mode == UnloadMode::FormCode;
}

QStringList ReclamaFiles(const QString& folder)
{
    if (folder.trimmed().isEmpty())
        return {};
    const QDir dir(folder);
    QStringList paths;
    const QStringList names
        = dir.entryList({QString(FilePattern)}, QDir::Files | QDir::Readable, QDir::Name | QDir::IgnoreCase);
    for (const QString& name : names)
        paths.append(dir.filePath(name));
    return paths;
}

std::optional<QList<DueReclama>> DueReclamas(const QString& folder, const QDate& today)
{
    const QStringList files = ReclamaFiles(folder);
    if (files.isEmpty())
        return QList<DueReclama> {};

    clsFileBag bag;
    if (!bag.OpenFile(QDir(folder).filePath(QString(InfoFileName))))
        return std::nullopt;

    QList<DueReclama> due;
    for (const QString& path : files) {
        const QString key = QFileInfo(path).completeBaseName().toLower().trimmed();
        const QString address = bag.GetValue(clsFileBag::MakeKey(key, QStringLiteral("URL"))).trimmed();
        const QString from = bag.GetValue(clsFileBag::MakeKey(key, QStringLiteral("DateShowFrom"))).trimmed();
        const QString to = bag.GetValue(clsFileBag::MakeKey(key, QStringLiteral("DateShowTo"))).trimmed();
        if (address.isEmpty() || from.isEmpty() || to.isEmpty())
            continue;
        const std::optional<bool> isDue = ReclamaDate::IsDue(from, to, today);
        if (!isDue)
            return std::nullopt;
        if (*isDue)
            due.append({path, address});
    }
    return due;
}

std::optional<DueReclama> PickReclama(const QList<DueReclama>& due, double random)
{
    if (due.isEmpty() || !(random >= 0.0) || random >= 1.0)
        return std::nullopt;
    const auto index = static_cast<qsizetype>(random * static_cast<double>(due.size()));
    return due.at(qMin(index, due.size() - 1));
}

std::optional<DueReclama> ReclamaToShow(UnloadMode mode)
{
    if (!ShowsReclamaOnUnload(mode))
        return std::nullopt;
    const std::optional<QList<DueReclama>> due = DueReclamas(DataFolders::ReclamaFolder(), QDate::currentDate());
    if (!due || due->isEmpty())
        return std::nullopt;
    QRandomGenerator generator(static_cast<quint32>(QTime::currentTime().msecsSinceStartOfDay()));
    return PickReclama(*due, generator.generateDouble());
}

} // namespace Brimvault::ReclamaSchedule

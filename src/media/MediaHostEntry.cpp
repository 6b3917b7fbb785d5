#include "media/MediaHostEntry.h"

#include "media/frmReclama.h"

namespace Brimvault {

namespace {

void runGame(const QString& path, const QString& caption, std::function<void()> closed)
{
    auto* host = new frmReclama;
    QObject::connect(host, &QObject::destroyed, std::move(closed));
    host->RunGame(path, caption);
}

void showReclama(const ReclamaSchedule::DueReclama& due)
{
    auto* window = new frmReclama;
    window->SetReclamaCaption();
    window->ReclamaShow(due.filePath, due.address);
}

const MediaHost::EntryPoints entryPoints {runGame, showReclama};

} // namespace

const MediaHost::EntryPoints* MediaHostEntryPoints()
{
    return &entryPoints;
}

} // namespace Brimvault

// The media host windows the main window opens: Flash movies it launches, and the advertisement that is due
// when it closes.
#include "ui/main/frmMain.h"

#include "media/MediaHost.h"
#include "store/PlayHistory.h"

#include <QElapsedTimer>

namespace Brimvault {

void frmMain::connectMediaHost()
{
    connect(this, &frmMain::flashMovieRequested, this, [](const QString& path, const QString& caption) {
        const MediaHost::EntryPoints* media = MediaHost::Get();
        if (!media) {
            MediaHost::ReportFlashMissing();
            return;
        }
        // A movie is played for as long as its window is open.
        QElapsedTimer clock;
        clock.start();
        media->runGame(
            path, caption, [clock, path] { PlayHistory::AddPlayTime(path, (clock.elapsed() + 500) / 1000); });
    });
}

void frmMain::showDueReclama(ReclamaSchedule::UnloadMode mode)
{
    // The schedule is read first: the host is loaded only when there is something to show.
    const std::optional<ReclamaSchedule::DueReclama> due = ReclamaSchedule::ReclamaToShow(mode);
    if (!due)
        return;
    if (const MediaHost::EntryPoints* media = MediaHost::Get())
        media->showReclama(*due);
}

} // namespace Brimvault

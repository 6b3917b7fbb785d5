// The media host windows the main window opens: Flash movies it launches, and the advertisement that is due
// when it closes.
#include "ui/main/frmMain.h"

#ifdef BRIMVAULT_WITH_MEDIA
#include "media/ReclamaOnClose.h"
#include "media/frmReclama.h"
#endif

#include "store/PlayHistory.h"

#include <QCoreApplication>
#include <QElapsedTimer>

#include <memory>

namespace Brimvault {

void frmMain::connectMediaHost()
{
#ifdef BRIMVAULT_WITH_MEDIA
    connect(this, &frmMain::flashMovieRequested, this, [](const QString& path, const QString& caption) {
        auto* host = new frmReclama;
        // A movie is played for as long as its window is open.
        auto clock = std::make_shared<QElapsedTimer>();
        clock->start();
        connect(host, &QObject::destroyed, QCoreApplication::instance(),
            [clock, path] { PlayHistory::AddPlayTime(path, (clock->elapsed() + 500) / 1000); });
        host->RunGame(path, caption);
    });
#endif
}

void frmMain::showDueReclama(ReclamaSchedule::UnloadMode mode)
{
#ifdef BRIMVAULT_WITH_MEDIA
    ShowDueReclama(mode);
#else
    Q_UNUSED(mode);
#endif
}

} // namespace Brimvault

// The media host windows the main window opens: Flash movies it launches, and the advertisement that is due
// when it closes.
#include "ui/main/frmMain.h"

#ifdef BRIMVAULT_WITH_MEDIA
#include "media/ReclamaSchedule.h"
#include "media/frmReclama.h"

#include <QGuiApplication>
#endif

namespace Brimvault {

void frmMain::connectMediaHost()
{
#ifdef BRIMVAULT_WITH_MEDIA
    connect(this, &frmMain::flashMovieRequested, this, [](const QString& path, const QString& caption) {
        auto* host = new frmReclama;
        host->RunGame(path, caption);
    });
    connect(this, &frmMain::closing, this, [this] {
        const auto mode
            = m_closedByUser ? ReclamaSchedule::UnloadMode::FormControlMenu : ReclamaSchedule::UnloadMode::FormCode;
        if (qApp->isSavingSession())
            return;
        if (const std::optional<ReclamaSchedule::DueReclama> due = ReclamaSchedule::ReclamaToShow(mode)) {
            auto* host = new frmReclama;
            host->ReclamaShow(due->filePath, due->address);
        }
    });
#endif
}

} // namespace Brimvault

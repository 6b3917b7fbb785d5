#include "media/ReclamaOnClose.h"

#include "media/ReclamaSchedule.h"
#include "media/frmReclama.h"

#include <QPointer>

namespace Brimvault {

bool ShowDueReclama(ReclamaSchedule::UnloadMode mode)
{
    const std::optional<ReclamaSchedule::DueReclama> due = ReclamaSchedule::ReclamaToShow(mode);
    if (!due)
        return false;
    QPointer<frmReclama> window = new frmReclama();
    window->SetReclamaCaption();
    window->ReclamaShow(due->filePath, due->address);
    return window && window->isVisible();
}

} // namespace Brimvault

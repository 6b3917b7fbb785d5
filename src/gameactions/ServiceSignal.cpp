#include "gameactions/ServiceSignal.h"

#include "store/CatalogueKeys.h"
#include "store/SettingsStore.h"

#include <QTimer>

namespace Brimvault {

bool TakeNewGameInstalledSignal()
{
    const QString value = GetSetting(AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey,
        CatalogueKeys::NoNewGameInstalled);
    if (value != QStringLiteral("1"))
        return false;
    // Reset before the rebuild rather than after: the rebuild lets events run, and the next tick must not see
    // the same signal again.
    SaveSetting(AppTitle(), CatalogueKeys::CommandsSection, CatalogueKeys::NewGameInstalledKey,
        CatalogueKeys::NoNewGameInstalled);
    return true;
}

ServiceSignalWatcher::ServiceSignalWatcher(QObject* parent)
    : QObject(parent)
    , m_timer(new QTimer(this))
{
    m_timer->setInterval(PollIntervalMs);
    connect(m_timer, &QTimer::timeout, this, &ServiceSignalWatcher::poll);
    m_timer->start();
}

void ServiceSignalWatcher::poll()
{
    if (TakeNewGameInstalledSignal())
        Q_EMIT rebuildRequested();
}

} // namespace Brimvault

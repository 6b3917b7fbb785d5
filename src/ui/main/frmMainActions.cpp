// What the window's items and commands do to games: launching, installing, removing, renaming, and the two
// small timers. The work itself is the game actions library's; the window passes it the current item.
#include "ui/main/frmMain.h"

#include "app/CatalogueServer.h"
#include "app/ConnectionCheck.h"
#include "catalogue/ListBuilder.h"
#include "gameactions/GameLauncher.h"
#include "gameactions/GameRemoval.h"
#include "gameactions/GameRenaming.h"
#include "gameactions/ItemMenuDelay.h"
#include "gameactions/PackageInstallCommand.h"
#include "gameactions/ServiceSignal.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/QuilletCalls.h"

#include <QMimeData>
#include <QScopeGuard>

namespace Brimvault {

void frmMain::connectGameActions()
{
    m_launcher = new GameLauncher(this);
    m_launcher->setObjectName(QStringLiteral("GameLauncher"));
    m_launcher->setCatalogueRoot(&CatalogueServerRoot);
    m_launcher->setConnectionProbe(&IsConnected);
    connect(m_launcher, &GameLauncher::flashMovieRequested, this, &frmMain::flashMovieRequested);

    m_tmrMenu = new ItemMenuDelay(this);
    m_tmrMenu->setObjectName(QStringLiteral("tmrMenu"));
    connect(m_tmrMenu, &ItemMenuDelay::showItemMenu, this, &frmMain::showItemMenu);

    m_tmrRegTest = new ServiceSignalWatcher(this);
    m_tmrRegTest->setObjectName(QStringLiteral("tmrRegTest"));
    connect(m_tmrRegTest, &ServiceSignalWatcher::rebuildRequested, this, [this] {
        if (m_closing)
            return;
        m_listView->RemoveAll();
        RebuildList();
    });

    // EnterKey passes its argument by reference: it is connected directly, without a queued copy.
    connect(m_listView, &SimpleListView::EnterKey, this, &frmMain::listEnterKey, Qt::DirectConnection);
    connect(m_listView, &SimpleListView::MouseUp, this,
        [this](qint16 button, qint16, float, float) { listMouseUp(button); });
    connect(
        m_listView, &SimpleListView::OLEDragDrop, this,
        [this](
            const QMimeData* dropped, qint32& effect, qint16, qint16, float, float) { listDragDrop(dropped, effect); },
        Qt::DirectConnection);
}

QString frmMain::currentCaption() const
{
    return m_listView->GetCurrentCaption().trimmed();
}

void frmMain::listEnterKey(QString& itemData)
{
    if (itemData.isEmpty() && m_listView->isNarrowed())
        return; // nothing found, nothing to start
    m_launcher->launchItem(itemData, currentCaption());
}

void frmMain::listMouseUp(qint16 button)
{
    m_tmrMenu->mouseButtonPressed(button);
}

void frmMain::mnuOpenGameClick()
{
    m_launcher->launchOffline(m_listView->GetCurrentData(), currentCaption());
}

void frmMain::mnuInstallClick()
{
    const QString package = QuilletCalls::ShowOpenDialog(
        this, InstallDialogTitle(), InstallDialogFilter(), 1, m_installFolder->dialogFolder());
    if (package.isEmpty())
        return;
    m_installFolder->packageChosen(package);
    enterBusy();
    const auto idle = qScopeGuard([this] { leaveBusy(); });
    if (InstallGamePackage(package) && !m_closing) {
        m_listView->RemoveAll();
        RebuildList();
    }
}

void frmMain::mnuRemoveFileClick()
{
    const QString itemData = m_listView->GetCurrentData();
    if (AskAndRemoveGame(currentCaption(), itemData) != RemovalOutcome::Removed)
        return;
    // Only this item goes: a rebuild would lose the selection and the scroll position, and bring back a game
    // that discovery finds by itself. The list cannot remove its only item, so that one is cleared.
    if (m_listView->RemoveCurrentItem())
        m_listView->RemoveAll();
    m_builder->ForgetGame(itemData);
}

void frmMain::mnuRemoveAllFilesClick()
{
    if (!AskAndRemoveAllAddedGames())
        return;
    m_listView->RemoveAll();
    RebuildList();
}

void frmMain::mnuRenameGameClick()
{
    if (const std::optional<QString> caption = AskAndRenameGame(currentCaption(), m_listView->GetCurrentData()))
        m_listView->SetCurrentCaption(*caption);
}

} // namespace Brimvault

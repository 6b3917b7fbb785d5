// Filling the list: discovery, the icons that follow on tmrIcons, and the games the user adds.
#include "ui/main/frmMain.h"

#include "catalogue/CatalogueLocations.h"
#include "catalogue/GameAdder.h"
#include "catalogue/GameDiscovery.h"
#include "catalogue/GameEntry.h"
#include "catalogue/IconCacheBuilder.h"
#include "catalogue/ListBuilder.h"
#include "catalogue/ListOrder.h"
#include "icons/NumberedError.h"
#include "store/PlayHistory.h"
#include "support/PathFunctions.h"
#include "support/SystemFolders.h"
#include "ui/listview/ImageCtrl.h"
#include "ui/listview/ListElements.h"
#include "ui/listview/SimpleListView.h"
#include "ui/main/AddGameDialogs.h"
#include "ui/main/QuilletCalls.h"

#include <QCoreApplication>
#include <QElapsedTimer>
#include <QMimeData>
#include <QScopeGuard>
#include <QTimer>
#include <QUrl>

namespace Brimvault {

namespace {

// How long the fill may go without letting pending events run: well under one frame.
constexpr qint64 EventPeriodMilliseconds = 8;

} // namespace

void frmMain::RebuildList()
{
    if (m_rebuildRunning) {
        m_rebuildAgain = true;
        return;
    }
    enterBusy();
    m_rebuildRunning = true;
    const auto idle = qScopeGuard([this] {
        m_rebuildRunning = false;
        leaveBusy();
    });

    do {
        m_rebuildAgain = false;
        m_tmrIcons->stop();
        m_iconBuilder->clear();

        GameDiscovery discovery(*m_builder, CatalogueLocations::fromSystem());
        // Any order but the found one needs every game before the first is shown.
        const ListOrder order = ListOrders::Stored();
        QList<GameEntry> held;
        DiscoveryHooks hooks;
        hooks.stopRequested = [this] { return m_closing; };
        hooks.clearList = [this, &held] {
            m_listView->RemoveAll();
            held.clear();
        };
        hooks.addItem = [this, order, &held](const GameEntry& entry) {
            if (order == ListOrder::AsFound)
                addEntry(entry);
            else
                held.append(entry);
        };
        // Asking the system for events costs more than adding an item; a few milliseconds apart is as
        // responsive as after every item, and leaves the fill its speed. The moment the games reach the
        // bottom of the window it is painted, so that the user sees a full window at once.
        QElapsedTimer sinceEvents;
        sinceEvents.start();
        bool screenShown = false;
        hooks.letEventsRun = [this, &sinceEvents, &screenShown] {
            const bool screenJustFilled
                = !screenShown && m_listView->layoutState().lowestBottom >= m_listView->height();
            if (!screenJustFilled && sinceEvents.elapsed() < EventPeriodMilliseconds)
                return;
            screenShown = screenShown || screenJustFilled;
            QCoreApplication::processEvents();
            sinceEvents.restart();
        };
        const DiscoveryResult result = discovery.Run(hooks);
        if (result.stopped || m_closing)
            break;
        if (order != ListOrder::AsFound && !m_rebuildAgain) {
            ListOrders::Sort(held, order, PlayHistory::ReadAll());
            for (const GameEntry& entry : std::as_const(held))
                addEntry(entry);
            m_listView->Refresh();
        }
        if (!m_rebuildAgain) {
            m_listView->InitSelection();
            startIconTimerIfNeeded();
        }
    } while (m_rebuildAgain && !m_closing);
    Q_EMIT listRebuilt();
}

void frmMain::addEntry(const GameEntry& entry)
{
    // Beyond 32767 items the list raises its overflow error: the games that fit stay shown, the rest are
    // left out.
    try {
        addListItem(entry);
    } catch (const NumberedError&) { }
}

void frmMain::addListItem(const GameEntry& entry)
{
    switch (entry.source) {
    case IconSource::File:
    case IconSource::Cache:
        if (entry.picture.isNull())
            m_listView->Add([file = entry.iconFile] { return QPixmap::fromImage(ListBuilder::ShownPicture(file)); },
                entry.caption, entry.path);
        else
            m_listView->Add(QPixmap::fromImage(entry.picture), entry.caption, entry.path);
        return;
    case IconSource::Flash:
        m_listView->Add(m_imgSWF->Picture(), entry.caption, entry.path);
        return;
    case IconSource::Online:
        m_listView->Add(m_imgOnLine->Picture(), entry.caption, entry.path);
        return;
    case IconSource::Queued:
        break;
    }
    const qint16 index = m_listView->AddEx(entry.caption, entry.path);
    if (index >= 0)
        m_iconBuilder->enqueue(entry.path, quint64(index));
}

qsizetype frmMain::pendingIcons() const
{
    return m_iconBuilder->pending();
}

void frmMain::startIconTimerIfNeeded()
{
    if (m_iconBuilder->pending() > 0 && !m_closing)
        m_tmrIcons->start();
}

void frmMain::tmrIconsTimer()
{
    m_tmrIcons->stop();
    const std::optional<IconCacheBuilder::Done> done = m_iconBuilder->Tick(m_closing);
    if (!done)
        return;
    const QPixmap picture
        = done->result.picture.isNull() ? m_imgNoIcon->Picture() : QPixmap::fromImage(done->result.picture);
    // Removing an item moves the ones after it up by one, so the ticket only says where to look first.
    int index = int(done->ticket);
    if (m_listView->imgN(index).Data() != done->path) {
        index = -1;
        for (int i = 0; i < m_listView->loadedCount(); ++i) {
            if (m_listView->imgN(i).Data() == done->path && m_listView->imgN(i).Picture().isNull()) {
                index = i;
                break;
            }
        }
    }
    if (index >= 0)
        m_listView->imgN(index).SetPicture(picture);
    startIconTimerIfNeeded();
}

void frmMain::mnuAddFileClick()
{
    if (m_lastAddFileFolder.isEmpty())
        m_lastAddFileFolder = GetSpecialFolder(CSIDL_PERSONAL, QString());
    const QString file = QuilletCalls::ShowOpenDialog(
        this, AddGameDialogs::AddFileTitle(), AddGameDialogs::AddFileFilter(), 1, m_lastAddFileFolder);
    if (file.isEmpty())
        return;
    m_lastAddFileFolder = GetFileFolder(file, false);
    GameAdder adder(*m_builder);
    if (const std::optional<GameEntry> entry = adder.AddGameFile(file)) {
        addEntry(*entry);
        m_listView->Refresh();
    }
    startIconTimerIfNeeded();
}

void frmMain::mnuAddFolderClick()
{
    const QString folder = QuilletCalls::BrowseForFolder(this, AddGameDialogs::AddFolderTitle());
    if (folder.isEmpty())
        return;
    GameAdder adder(*m_builder);
    adder.AddGamesFromFolder(folder, [this](const GameEntry& entry) { addEntry(entry); });
    m_listView->Refresh();
    startIconTimerIfNeeded();
}

void frmMain::listDragDrop(const QMimeData* dropped, qint32& effect)
{
    Q_UNUSED(effect);
    if (!dropped || !dropped->hasUrls())
        return;
    QStringList files;
    const QList<QUrl> urls = dropped->urls();
    for (const QUrl& url : urls) {
        if (url.isLocalFile())
            files.append(url.toLocalFile());
    }
    // New icons wait for the icon timer's next run; a drop does not start it.
    GameAdder adder(*m_builder);
    adder.AddDroppedFiles(files, [this](const GameEntry& entry) {
        addEntry(entry);
        m_listView->Refresh();
    });
}

} // namespace Brimvault

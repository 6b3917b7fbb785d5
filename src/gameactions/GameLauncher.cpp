#include "gameactions/GameLauncher.h"

#include "app/CatalogueServer.h"
#include "app/ConnectionCheck.h"
#include "gameactions/CaseInsensitivePath.h"
#include "gameactions/CompatibilityRunner.h"
#include "gameactions/LaunchRules.h"
#include "gameactions/PlayTimeWatcher.h"
#include "gameactions/ServiceCommands.h"
#include "store/PlayHistory.h"
#include "support/CommandLine.h"
#include "support/PathFunctions.h"

#include <QDateTime>
#include <QDesktopServices>
#include <QDir>
#include <QFileInfo>
#include <QUrl>

namespace Brimvault {

namespace {

// A started process inherits the current folder, so a game starts in its own folder; the folder stays current
// afterwards. Addresses have no folder and leave it as it is.
void enterGameFolder(const QString& path)
{
    const QString folder = GetFileFolder(path, false);
    if (QFileInfo(folder).isDir())
        QDir::setCurrent(folder);
}

} // namespace

GameLauncher::GameLauncher(QObject* parent)
    : QObject(parent)
    , m_connectionProbe(&IsConnected)
    , m_catalogueRoot(&CatalogueServerRoot)
    , m_playTime(new PlayTimeWatcher(this))
{ }

GameLauncher::~GameLauncher() = default;

void GameLauncher::setConnectionProbe(ConnectionProbe probe)
{
    m_connectionProbe = std::move(probe);
}

void GameLauncher::setCatalogueRoot(CatalogueRootSource source)
{
    m_catalogueRoot = std::move(source);
}

void GameLauncher::launchItem(const QString& data, const QString& caption)
{
    LaunchGame(data, false, caption);
}

void GameLauncher::launchOffline(const QString& data, const QString& caption)
{
    LaunchGame(data.toUpper().trimmed(), true, caption);
}

void GameLauncher::LaunchGame(const QString& path, bool offline, const QString& caption)
{
    const QString runner = CompatibilityRunner();
    const QString onDisk = ExistingPathIgnoringCase(path);
    enterGameFolder(onDisk);
    switch (LaunchKindOf(onDisk)) {
    case LaunchKind::WebPage:
        if (openInBrowser(onDisk))
            PlayHistory::RecordLaunch(path, QDateTime::currentDateTimeUtc());
        break;
    case LaunchKind::Process:
        if (const std::optional<qint64> pid = startProcess(onDisk, runner)) {
            PlayHistory::RecordLaunch(path, QDateTime::currentDateTimeUtc());
            m_playTime->watch(*pid, path);
        }
        break;
    case LaunchKind::FlashMovie:
        // The window that plays the movie adds its play time when it closes.
        PlayHistory::RecordLaunch(path, QDateTime::currentDateTimeUtc());
        playMovie(onDisk, offline, caption);
        break;
    }
    signalServiceOnce(runner);
}

bool GameLauncher::openInBrowser(const QString& pathOrAddress)
{
    return QDesktopServices::openUrl(BrowserUrl(pathOrAddress));
}

std::optional<qint64> GameLauncher::startProcess(const QString& path, const QString& runner)
{
    // The path is the whole command line, unquoted: a path with blanks is found by its shortest start that
    // names a program.
    return StartCommandLine(path, 1, runner);
}

void GameLauncher::playMovie(const QString& path, bool offline, const QString& caption)
{
    if (!offline) {
        const QString code = ArticleCode(path);
        if (!code.isEmpty() && m_connectionProbe && m_catalogueRoot && m_connectionProbe()) {
            openInBrowser(ArticleAddress(m_catalogueRoot(), code));
            return;
        }
    }
    Q_EMIT flashMovieRequested(path, caption.trimmed());
}

void GameLauncher::signalServiceOnce(const QString& runner)
{
    if (m_serviceSignalled)
        return;
    m_serviceSignalled = true;
    StartCommandLine(ServiceCommands::AfterFirstLaunch, 0, runner);
}

} // namespace Brimvault

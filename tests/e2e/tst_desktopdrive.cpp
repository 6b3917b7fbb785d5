// The real program on a real X display, worked only with the pointer and the keyboard as a person works it:
// the list fills, a game starts from the keyboard, a file is dropped, a package is installed through the
// service, games are renamed and removed, the language changes, and closing shows the advertisement.
#include "DesktopDriver.h"
#include "DriveLibrary.h"
#include "RuffleFixture.h"
#include "TestEnvironment.h"
#include "XvfbServer.h"
#include "catalogue/IconCacheKey.h"
#include "store/CatalogueKeys.h"
#include "store/CatalogueStore.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include <QDir>
#include <QFile>
#include <QProcess>
#include <QStandardPaths>
#include <QTest>

#include <memory>

using namespace Brimvault;
using DriveLibrary::ListedGame;

namespace {

constexpr int ScreenWidth = 1280;
constexpr int ScreenHeight = 1024;
// The list's designed place in the window at 96 dots per inch (200 and 1260 twips).
constexpr QPoint ListInWindow(13, 84);
constexpr int CellsPerRow = 9;
// The Actions caption keeps this margin to the window's right edge in every language.
constexpr int ActionsFromRight = 32;
constexpr int ActionsY = 38;
constexpr QColor FlashMovieColour(40, 160, 60);
constexpr int WindowTimeoutMs = 60000;
constexpr int StateTimeoutMs = 60000;
// A menu click that shows nothing within this long is taken as lost and tried again.
constexpr int MenuTimeoutMs = 15000;
constexpr int SelectionTimeoutMs = 3000;
constexpr int MenuAttempts = 3;

// Items of the Actions menu, counted in key presses from the top (separators are passed over).
constexpr int InstallItem = 3;
constexpr int LanguageItem = 7;
// Items of the item menu.
constexpr int OpenOfflineItem = 1;
constexpr int RenameItem = 2;
constexpr int RemoveItem = 3;

QString fixture(const char* name)
{
    return QStringLiteral(BRIMVAULT_TEST_DATA_DIR "/pe/") + QLatin1String(name);
}

QString programPath()
{
    return QStringLiteral(BRIMVAULT_BIN_DIR "/brimvault");
}

QStringList downKeys(int count)
{
    QStringList keys;
    for (int i = 0; i < count; ++i)
        keys << QStringLiteral("Down");
    return keys;
}

} // namespace

class TestDesktopDrive : public QObject {
    Q_OBJECT

private:
    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<XvfbServer> m_xvfb;
    std::unique_ptr<DesktopDriver> m_desktop;
    QProcess m_program;
    QProcess m_dragSource;
    QProcessEnvironment m_programEnvironment;
    QString m_programErrors;
    qulonglong m_mainWindow = 0;
    QRect m_mainGeometry;
    int m_shots = 0;

    QString m_games;
    QStringList m_installed;
    QString m_addedByHand;
    QString m_flashMovie;
    QString m_dropped;
    QString m_package;
    QString m_runnerLog;

    QPoint listOrigin() const { return m_mainGeometry.topLeft() + ListInWindow; }
    QPoint actionsButton() const
    {
        return m_mainGeometry.topLeft() + QPoint(m_mainGeometry.width() - ActionsFromRight, ActionsY);
    }
    QList<ListedGame> discovered() const { return DriveLibrary::ListAsDiscovered(programPath(), m_programEnvironment); }

    // Every step leaves its picture: <build>/screenshots/e2e/NN-step.png.
    QImage keepScreenshot(const QString& step)
    {
        const QString name = QStringLiteral("%1-%2.png").arg(++m_shots, 2, 10, QLatin1Char('0')).arg(step);
        return m_desktop->screenshot(QStringLiteral(BRIMVAULT_SCREENSHOT_DIR "/") + name);
    }

    int itemsShown() const
    {
        const QImage screen = m_desktop->screenshot(m_env->path(QStringLiteral("poll.png")));
        return screen.isNull() ? -1 : ListPicture::ItemsInFirstRow(screen, listOrigin(), CellsPerRow);
    }

    bool screenShows(const QPoint& at, const QColor& wanted) const
    {
        const QImage screen = m_desktop->screenshot(m_env->path(QStringLiteral("poll.png")));
        if (screen.isNull())
            return false;
        const QColor seen(screen.pixel(at));
        return qAbs(seen.red() - wanted.red()) < 30 && qAbs(seen.green() - wanted.green()) < 30
            && qAbs(seen.blue() - wanted.blue()) < 30;
    }

    QString programErrors()
    {
        m_programErrors += QString::fromLocal8Bit(m_program.readAllStandardError());
        return m_programErrors;
    }

    // A pop-up menu has no name of its own: it is the program's one new visible window.
    bool waitForPopup(const QList<qulonglong>& before, int timeoutMs = WindowTimeoutMs)
    {
        QDeadlineTimer deadline(timeoutMs);
        do {
            for (qulonglong window : m_desktop->allVisibleWindows()) {
                if (!before.contains(window) && m_desktop->windowProcess(window) == m_program.processId())
                    return true;
            }
            QTest::qWait(50);
        } while (!deadline.hasExpired());
        return false;
    }

    bool chooseFromActionsMenu(int item)
    {
        const QList<qulonglong> before = m_desktop->allVisibleWindows();
        if (!m_desktop->click(actionsButton()) || !m_desktop->waitForFocus(m_mainWindow, WindowTimeoutMs)
            || !waitForPopup(before))
            return false;
        return m_desktop->keys(downKeys(item) << QStringLiteral("Return"));
    }

    // A right click selects the item and then opens its menu. A click that got lost on a busy machine (the
    // item stays unselected) is retried, as a person would click again, after dismissing whatever showed.
    bool chooseFromItemMenu(int index, int item)
    {
        for (int attempt = 0; attempt < MenuAttempts; ++attempt) {
            const QList<qulonglong> before = m_desktop->allVisibleWindows();
            if (!m_desktop->click(ListPicture::IconCentre(listOrigin(), index), 3))
                return false;
            if (m_desktop->waitForFocus(m_mainWindow, MenuTimeoutMs) && waitForPopup(before, MenuTimeoutMs)
                && QTest::qWaitFor([&] { return itemLooksSelected(index); }, SelectionTimeoutMs))
                return m_desktop->keys(downKeys(item) << QStringLiteral("Return"));
            keepScreenshot(QStringLiteral("item-menu-retry"));
            m_desktop->keys({QStringLiteral("Escape")});
        }
        return false;
    }

    bool itemLooksSelected(int index) const
    {
        const QImage screen = m_desktop->screenshot(m_env->path(QStringLiteral("poll.png")));
        return !screen.isNull() && ListPicture::ItemLooksSelected(screen, listOrigin(), index);
    }

    // Message boxes and input boxes carry the product name as their title, like the main window.
    qulonglong waitForBox() const { return waitForDialog(QStringLiteral("^Brimvault$")); }

    // A dialog counts as there once it shows and has the keyboard, so that no key goes to the window below.
    qulonglong waitForDialog(const QString& namePattern) const
    {
        const qulonglong dialog = m_desktop->waitForWindow(namePattern, WindowTimeoutMs, {m_mainWindow});
        return dialog != 0 && m_desktop->waitForFocus(dialog, WindowTimeoutMs) ? dialog : 0;
    }

    void prepareLibrary()
    {
        m_games = DataFolders::GamesFolder();
        QVERIFY(!m_games.isEmpty());
        const struct {
            const char* path;
            const char* fixture;
            const char* name;
            const char* russianName;
        } installed[] = {
            {"Color Lines/lines.exe", "multi32.exe", "Color Lines", "Цветные линии"},
            {"Harbor Chess/harborchess.exe", "twogroups32.exe", "Harbor Chess", "Шахматы в гавани"},
            {"Moon Sudoku/moonsudoku.exe", "multi64.exe", "Moon Sudoku", "Лунное судоку"},
        };
        for (const auto& game : installed) {
            const QString path = m_games + QString::fromUtf8(game.path);
            QVERIFY2(DriveLibrary::PlaceGame(path, fixture(game.fixture), QString::fromUtf8(game.name),
                         QString::fromUtf8(game.russianName)),
                qPrintable(path));
            m_installed << path;
        }

        m_flashMovie = m_games + QStringLiteral("Bubble Pop/bubblepop.swf");
        QVERIFY(DriveLibrary::WriteFlashMovie(m_flashMovie, FlashMovieColour));
        QVERIFY(DriveLibrary::WriteGameInfo(m_flashMovie, QStringLiteral("Bubble Pop"), QStringLiteral("Пузыри")));

        m_addedByHand = m_env->path(QStringLiteral("My Games/Pinewood/pinewood.exe"));
        QVERIFY(DriveLibrary::PlaceGame(
            m_addedByHand, fixture("multi32.exe"), QStringLiteral("Pinewood Patience"), QStringLiteral("Пасьянс")));
        QCOMPARE(CatalogueStore::AddGame(m_addedByHand), QStringLiteral("File1"));

        m_dropped = m_env->path(QStringLiteral("Downloads/Rocket.exe"));
        QVERIFY(QDir().mkpath(QFileInfo(m_dropped).absolutePath()));
        QVERIFY(QFile::copy(fixture("twogroups64.exe"), m_dropped));

        m_runnerLog = m_env->path(QStringLiteral("launches.txt"));
        const QString runner = m_env->path(QStringLiteral("record-launch.sh"));
        QVERIFY(DriveLibrary::WriteRecordingRunner(runner, m_runnerLog));
        QVERIFY(SaveSetting(AppTitle(), CatalogueKeys::SettingsSection, QStringLiteral("CompatibilityRunner"), runner));
        QVERIFY(SaveSetting(AppTitle(), CatalogueKeys::LocaleSettingsSection, CatalogueKeys::LngFileNameKey,
            CatalogueKeys::DefaultLngFileName));
        QVERIFY(SaveSetting(
            AppTitle(), CatalogueKeys::LocaleSettingsSection, CatalogueKeys::LngNikKey, CatalogueKeys::DefaultLngNik));

        QVERIFY(DriveLibrary::WriteDueAdvertisement(
            DataFolders::ReclamaFolder(), QStringLiteral("http://127.0.0.1:9/summer-sale")));
    }

    void packGame()
    {
        const QString source = m_env->path(QStringLiteral("sources/Star Quest"));
        QVERIFY(DriveLibrary::PlaceGame(source + QStringLiteral("/StarQuest.exe"), fixture("multi64.exe"),
            QStringLiteral("Star Quest Deluxe"), QStringLiteral("Звёздный поход")));
        m_package = m_env->path(QStringLiteral("personal/StarQuest.bvxpak"));
        QProcess service;
        service.setProcessChannelMode(QProcess::MergedChannels);
        QProcessEnvironment headless = m_programEnvironment;
        headless.insert(QStringLiteral("QT_QPA_PLATFORM"), QStringLiteral("offscreen"));
        service.setProcessEnvironment(headless);
        service.start(
            QStringLiteral(BRIMVAULT_BIN_DIR "/BrimvaultService"), {QStringLiteral("--pack"), source, m_package});
        QVERIFY(service.waitForFinished(60000));
        QVERIFY2(service.exitCode() == 0, service.readAll().constData());
        QVERIFY(QFile::exists(m_package));
    }

private Q_SLOTS:
    void initTestCase()
    {
        if (QStandardPaths::findExecutable(QStringLiteral("Xvfb")).isEmpty())
            QSKIP("Xvfb is not installed (package xvfb)");
        if (QStandardPaths::findExecutable(QStringLiteral("xdotool")).isEmpty())
            QSKIP("xdotool is not installed (package xdotool)");

        // Pictures of an earlier run would mix with this one's.
        QDir(QStringLiteral(BRIMVAULT_SCREENSHOT_DIR)).removeRecursively();
        m_env = std::make_unique<TestEnvironment>();
        prepareLibrary();
        if (QTest::currentTestFailed())
            return;
        m_xvfb = std::make_unique<XvfbServer>();
        const QString failure = m_xvfb->start(ScreenWidth, ScreenHeight, 30000);
        QVERIFY2(failure.isEmpty(), qPrintable(failure));
        m_desktop = std::make_unique<DesktopDriver>(m_xvfb->display(), QStringLiteral(BRIMVAULT_DESKTOP_HELPER));
        m_programEnvironment = DriveLibrary::ProgramEnvironment(*m_env, m_desktop->environment());
        packGame();
        if (QTest::currentTestFailed())
            return;

        m_program.setProcessEnvironment(m_programEnvironment);
        m_program.setWorkingDirectory(m_env->root());
        m_program.start(programPath(), QStringList());
        QVERIFY2(m_program.waitForStarted(30000), qPrintable(m_program.errorString()));
        m_mainWindow = m_desktop->waitForWindow(QStringLiteral("^Brimvault$"), WindowTimeoutMs);
        if (m_mainWindow == 0)
            keepScreenshot(QStringLiteral("failed-start"));
        QVERIFY2(m_mainWindow != 0, qPrintable(programErrors()));
        m_mainGeometry = m_desktop->windowGeometry(m_mainWindow);
        QVERIFY(m_mainGeometry.width() > 400 && m_mainGeometry.height() > 300);
        QVERIFY(QRect(0, 0, ScreenWidth, ScreenHeight).contains(m_mainGeometry));
    }

    void cleanup()
    {
        if (!QTest::currentTestFailed() || !m_desktop)
            return;
        keepScreenshot(QStringLiteral("failed-") + QString::fromLatin1(QTest::currentTestFunction()));
        qWarning("program's error output:\n%s", qPrintable(programErrors()));
    }

    void cleanupTestCase()
    {
        for (QProcess* process : {&m_dragSource, &m_program}) {
            if (process->state() == QProcess::NotRunning)
                continue;
            process->kill();
            process->waitForFinished(10000);
        }
        if (m_xvfb)
            m_xvfb->stop();
    }

    void listFills()
    {
        const QList<ListedGame> expected = discovered();
        QCOMPARE(expected.size(), 1 + m_installed.size() + 1 + 1);
        for (const QString& game : m_installed + QStringList {m_flashMovie, m_addedByHand})
            QVERIFY2(DriveLibrary::IndexOfPath(expected, game) > 0, qPrintable(game));

        // The window's icon builder caches the icon of every game it lists.
        for (const ListedGame& game : expected.mid(1)) {
            if (game.path == m_flashMovie)
                continue;
            const QString cached = IconCacheFile(DataFolders::IconsFolder(), game.path);
            QTRY_VERIFY2_WITH_TIMEOUT(QFile::exists(cached), qPrintable(cached), StateTimeoutMs);
        }
        QTRY_COMPARE_WITH_TIMEOUT(itemsShown(), int(expected.size()), StateTimeoutMs);
        QVERIFY(!keepScreenshot(QStringLiteral("list-filled")).isNull());
    }

    void arrowKeysAndEnterStartAGame()
    {
        const QList<ListedGame> games = discovered();
        // The last installed executable, so that the arrows have a way to go.
        int target = 0;
        for (const QString& game : m_installed)
            target = qMax(target, int(DriveLibrary::IndexOfPath(games, game)));
        QVERIFY(target > 1);

        // A click selects without starting; the arrows move on, Enter starts.
        QVERIFY(m_desktop->click(ListPicture::IconCentre(listOrigin(), 0)));
        QVERIFY(m_desktop->waitForFocus(m_mainWindow, WindowTimeoutMs));
        QVERIFY(m_desktop->keys(QStringList(target, QStringLiteral("Right")) << QStringLiteral("Return")));
        QTRY_COMPARE_WITH_TIMEOUT(DriveLibrary::RecordedLaunches(m_runnerLog).size(), 1, StateTimeoutMs);
        const auto launch = DriveLibrary::RecordedLaunches(m_runnerLog).constFirst();
        QCOMPARE(launch.second, games.at(target).path);
        QCOMPARE(QDir(launch.first).canonicalPath(), QFileInfo(games.at(target).path).canonicalPath());
        keepScreenshot(QStringLiteral("game-started"));
        // Nothing else was started on the way.
        QTest::qWait(500);
        QCOMPARE(DriveLibrary::RecordedLaunches(m_runnerLog).size(), 1);
    }

    void openGameOfflineStartsTheFileOnDisk()
    {
        // The command upper-cases the path; on a file system that minds case the file must still be found.
        const QString game = m_installed.at(0);
        const qsizetype index = DriveLibrary::IndexOfPath(discovered(), game);
        QVERIFY(index > 0);
        const qsizetype launchesBefore = DriveLibrary::RecordedLaunches(m_runnerLog).size();
        QVERIFY(chooseFromItemMenu(int(index), OpenOfflineItem));
        QTRY_COMPARE_WITH_TIMEOUT(
            DriveLibrary::RecordedLaunches(m_runnerLog).size(), launchesBefore + 1, StateTimeoutMs);
        QCOMPARE(DriveLibrary::RecordedLaunches(m_runnerLog).constLast().second, game);
    }

    void flashMovieOpensInTheMediaHost()
    {
        REQUIRE_RUFFLE();
        const qsizetype index = DriveLibrary::IndexOfPath(discovered(), m_flashMovie);
        QVERIFY(index > 0);
        QVERIFY(m_desktop->doubleClick(ListPicture::IconCentre(listOrigin(), int(index))));
        // The host window is captioned with the game's name and plays the movie.
        const qulonglong host = m_desktop->waitForWindow(QStringLiteral("^Bubble Pop$"), WindowTimeoutMs);
        QVERIFY2(host != 0, qPrintable(programErrors()));
        const QRect area = m_desktop->windowGeometry(host);
        QTRY_VERIFY_WITH_TIMEOUT(screenShows(area.center(), FlashMovieColour), StateTimeoutMs);
        keepScreenshot(QStringLiteral("flash-movie"));
        // A movie is no process of its own: the runner saw nothing new.
        QCOMPARE(DriveLibrary::RecordedLaunches(m_runnerLog).size(), 2);

        QVERIFY(m_desktop->closeWindow(host));
        QVERIFY(m_desktop->waitForWindowGone(host, WindowTimeoutMs));
        QCOMPARE(m_program.state(), QProcess::Running);
    }

    void droppedExecutableIsAdded()
    {
        const int shownBefore = itemsShown();
        QVERIFY(shownBefore > 0);
        m_dragSource.setProcessEnvironment(m_programEnvironment);
        m_dragSource.start(m_desktop->helperProgram(), {QStringLiteral("drag"), m_dropped});
        const qulonglong source = m_desktop->waitForWindow(QStringLiteral("^Brimvault drag source$"), WindowTimeoutMs);
        QVERIFY(source != 0);
        const QRect from = m_desktop->windowGeometry(source);
        QVERIFY(!from.intersects(m_mainGeometry));

        const QPoint target = listOrigin() + QPoint(400, 250);
        QVERIFY(m_desktop->moveTo(from.center()));
        QVERIFY(m_desktop->pressButton(1));
        for (int step = 1; step <= 5; ++step)
            QVERIFY(m_desktop->moveTo(from.center() + (target - from.center()) * step / 5));
        QVERIFY(m_desktop->moveTo(target + QPoint(4, 4)));
        QVERIFY(m_desktop->releaseButton(1));

        QTRY_VERIFY_WITH_TIMEOUT(CatalogueStore::FindAddedGame(m_dropped).has_value(), StateTimeoutMs);
        // The program has taken the dropped data: the drag source has done its part.
        m_dragSource.terminate();
        QVERIFY(m_dragSource.waitForFinished(10000));
        QCOMPARE(CatalogueStore::FindAddedGame(m_dropped)->key, QStringLiteral("File2"));
        QCOMPARE(CatalogueStore::AddedGames().size(), 2);
        QTRY_COMPARE_WITH_TIMEOUT(itemsShown(), shownBefore + 1, StateTimeoutMs);
        keepScreenshot(QStringLiteral("dropped"));
    }

    void packageInstallsThroughTheService()
    {
        const int shownBefore = itemsShown();
        const QString installedGame = m_games + QStringLiteral("Star Quest/StarQuest.exe");
        QVERIFY(!QFile::exists(installedGame));

        QVERIFY(chooseFromActionsMenu(InstallItem));
        const qulonglong dialog = waitForDialog(QStringLiteral("^Install game$"));
        QVERIFY2(dialog != 0, qPrintable(programErrors()));
        keepScreenshot(QStringLiteral("install-dialog"));
        // The file name field has the focus: a typed full path and Return choose the package.
        QVERIFY(m_desktop->typeText(QDir::toNativeSeparators(m_package)));
        QVERIFY(m_desktop->keys({QStringLiteral("Return")}));

        QTRY_VERIFY_WITH_TIMEOUT(QFile::exists(installedGame), StateTimeoutMs);
        QTRY_VERIFY_WITH_TIMEOUT(
            QFile::exists(IconCacheFile(DataFolders::IconsFolder(), installedGame)), StateTimeoutMs);
        QTRY_COMPARE_WITH_TIMEOUT(itemsShown(), shownBefore + 1, StateTimeoutMs);
        // The service also raised the new-game signal: the window takes it within a few seconds and fills its
        // list once more, dropping the selection and any open menu. Later steps start after that.
        QTRY_COMPARE_WITH_TIMEOUT(GetSetting(AppTitle(), CatalogueKeys::CommandsSection,
                                      CatalogueKeys::NewGameInstalledKey, CatalogueKeys::NoNewGameInstalled),
            CatalogueKeys::NoNewGameInstalled, StateTimeoutMs);
        QTRY_COMPARE_WITH_TIMEOUT(itemsShown(), shownBefore + 1, StateTimeoutMs);
        QVERIFY(DriveLibrary::IndexOfPath(discovered(), installedGame) > 0);
        keepScreenshot(QStringLiteral("installed"));
    }

    void gameIsRenamed()
    {
        const qsizetype index = DriveLibrary::IndexOfPath(discovered(), m_dropped);
        QVERIFY(index > 0);
        QVERIFY(chooseFromItemMenu(int(index), RenameItem));
        QVERIFY(waitForBox() != 0);
        keepScreenshot(QStringLiteral("rename-box"));
        QVERIFY(m_desktop->keys({QStringLiteral("ctrl+a")}));
        QVERIFY(m_desktop->typeText(QStringLiteral("Rocket Race")));
        QVERIFY(m_desktop->keys({QStringLiteral("Return")}));

        QTRY_COMPARE_WITH_TIMEOUT(
            CatalogueStore::DisplayName(QStringLiteral("File2")), QStringLiteral("Rocket Race"), StateTimeoutMs);
        QCOMPARE(discovered().value(index).caption, QStringLiteral("Rocket Race"));
        // The game keeps its entry: renaming adds no second one.
        QCOMPARE(CatalogueStore::AddedGames().size(), 2);
        keepScreenshot(QStringLiteral("renamed"));
    }

    void gameIsRemoved()
    {
        const QString removed = m_installed.at(1);
        const QList<ListedGame> before = discovered();
        const qsizetype index = DriveLibrary::IndexOfPath(before, removed);
        QVERIFY(index > 0);
        const int shownBefore = itemsShown();

        // Escape answers No: the game stays.
        QVERIFY(chooseFromItemMenu(int(index), RemoveItem));
        const qulonglong refused = waitForBox();
        QVERIFY(refused != 0);
        QVERIFY(m_desktop->keys({QStringLiteral("Escape")}));
        QVERIFY(m_desktop->waitForWindowGone(refused, WindowTimeoutMs));
        QVERIFY(QFile::exists(removed));
        QCOMPARE(itemsShown(), shownBefore);

        QVERIFY(chooseFromItemMenu(int(index), RemoveItem));
        QVERIFY(waitForBox() != 0);
        keepScreenshot(QStringLiteral("remove-question"));
        QVERIFY(m_desktop->keys({QStringLiteral("Return")}));

        QTRY_VERIFY_WITH_TIMEOUT(!QFileInfo::exists(QFileInfo(removed).absolutePath()), StateTimeoutMs);
        QTRY_COMPARE_WITH_TIMEOUT(itemsShown(), shownBefore - 1, StateTimeoutMs);
        QCOMPARE(discovered().size(), before.size() - 1);
        for (const QString& kept : {m_installed.at(0), m_installed.at(2)})
            QVERIFY(QFile::exists(kept));
        QCOMPARE(CatalogueStore::AddedGames().size(), 2);
        keepScreenshot(QStringLiteral("removed"));
    }

    void languageSwitchesToRussian()
    {
        const QImage english = m_desktop->screenshot(m_env->path(QStringLiteral("english.png")));
        QVERIFY(!english.isNull());
        QVERIFY(chooseFromActionsMenu(LanguageItem));
        const qulonglong dialog = waitForDialog(QStringLiteral("^Program language$"));
        QVERIFY(dialog != 0);
        // English (Default), then the language files in name order: Polish, Russian.
        QVERIFY(m_desktop->keys({QStringLiteral("Down"), QStringLiteral("Down")}));
        keepScreenshot(QStringLiteral("language-dialog"));
        QVERIFY(m_desktop->keys({QStringLiteral("Return")}));
        QVERIFY(m_desktop->waitForWindowGone(dialog, WindowTimeoutMs));

        QTRY_COMPARE_WITH_TIMEOUT(
            GetSetting(AppTitle(), CatalogueKeys::LocaleSettingsSection, CatalogueKeys::LngFileNameKey),
            QStringLiteral("Brimvault_Russian.lng"), StateTimeoutMs);
        QCOMPARE(GetSetting(AppTitle(), CatalogueKeys::LocaleSettingsSection, CatalogueKeys::LngNikKey),
            QStringLiteral("RUSSIAN"));
        // The title band holds the copyright line and the Actions caption, both translated now.
        const QRect band(m_mainGeometry.topLeft(), QSize(m_mainGeometry.width(), ListInWindow.y() - 8));
        QTRY_VERIFY_WITH_TIMEOUT(
            ListPicture::ChangedShare(english, m_desktop->screenshot(m_env->path(QStringLiteral("poll.png"))), band)
                > 0.01,
            StateTimeoutMs);
        const QList<ListedGame> games = discovered();
        QCOMPARE(games.value(DriveLibrary::IndexOfPath(games, m_installed.at(0))).caption,
            QString::fromUtf8("Цветные линии"));
        QTRY_COMPARE_WITH_TIMEOUT(itemsShown(), int(games.size()), StateTimeoutMs);
        keepScreenshot(QStringLiteral("russian"));
    }

    void closingShowsTheDueAdvertisement()
    {
        const QList<qulonglong> before = m_desktop->allVisibleWindows();
        QVERIFY(m_desktop->closeWindow(m_mainWindow));
        QVERIFY(m_desktop->waitForWindowGone(m_mainWindow, WindowTimeoutMs));
        const qulonglong advert = m_desktop->waitForWindow(QStringLiteral(".+"), WindowTimeoutMs, before);
        QVERIFY2(advert != 0, qPrintable(programErrors()));
        QCOMPARE(m_desktop->windowName(advert), QString::fromUtf8("Реклама"));
        const QRect area = m_desktop->windowGeometry(advert);
        // The advertisement's own picture fills the window: its colour is at the centre.
        QTRY_VERIFY_WITH_TIMEOUT(screenShows(area.center(), DriveLibrary::AdvertisementColour()), StateTimeoutMs);
        keepScreenshot(QStringLiteral("advertisement"));
        QCOMPARE(m_program.state(), QProcess::Running);

        QVERIFY(m_desktop->closeWindow(advert));
        QTRY_COMPARE_WITH_TIMEOUT(m_program.state(), QProcess::NotRunning, StateTimeoutMs);
        QCOMPARE(m_program.exitStatus(), QProcess::NormalExit);
        QVERIFY2(m_program.exitCode() == 0, qPrintable(programErrors()));
    }
};

QTEST_MAIN(TestDesktopDrive)
#include "tst_desktopdrive.moc"

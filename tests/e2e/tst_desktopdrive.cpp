// The real program on a real X display, worked only with the pointer and the keyboard as a person works it:
// the list fills, a game starts from the keyboard and from the item menu, a Flash movie plays, a file is
// dropped, a package is installed through the service, a game is removed, and closing shows the advertisement.
#include "AdvertisingFiles.h"
#include "DesktopDriver.h"
#include "LaunchRecords.h"
#include "MainWindowFixture.h"
#include "MovieFiles.h"
#include "PeFixtures.h"
#include "ProgramRun.h"
#include "RuffleFixture.h"
#include "TestEnvironment.h"
#include "TestFiles.h"

#include "catalogue/IconCacheKey.h"
#include "store/CatalogueStore.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QTest>

using namespace Brimvault;

namespace {

constexpr int ScreenWidth = 1280;
constexpr int ScreenHeight = 1024;
// The list's designed place in the window at 96 dots per inch (200 and 1260 twips), and its cells.
constexpr QPoint ListInWindow(13, 84);
constexpr int CellsPerRow = 9;
constexpr int CellWidth = 80;
constexpr int CellHeight = 76;
constexpr QPoint FirstIconCentre(39, 30);
// Below the first row the list shows its bare background.
constexpr QPoint BackgroundSample(8, 200);
// The Actions caption keeps this margin to the window's right edge in every language.
constexpr int ActionsFromRight = 32;
constexpr int ActionsY = 38;
constexpr QColor FlashMovieColour(40, 160, 60);
constexpr QColor AdvertisementColour(250, 200, 40);
constexpr int TimeoutMs = 60000;
// A menu click that shows nothing within this long is taken as lost and tried again.
constexpr int MenuTimeoutMs = 15000;
// Items of the Actions menu and of the item menu, counted in key presses from the top.
constexpr int InstallItem = 3;
constexpr int OpenOfflineItem = 1;
constexpr int RemoveItem = 3;

bool near(QRgb a, QRgb b, int tolerance)
{
    return qAbs(qRed(a) - qRed(b)) <= tolerance && qAbs(qGreen(a) - qGreen(b)) <= tolerance
        && qAbs(qBlue(a) - qBlue(b)) <= tolerance;
}

QPoint iconCentre(const QPoint& listOrigin, int index)
{
    return listOrigin + FirstIconCentre + QPoint(index * CellWidth, 0);
}

// Items fill the grid's cells left to right: the first row tells how many are shown.
int itemsInFirstRow(const QImage& screen, const QPoint& listOrigin)
{
    const QRgb background = screen.pixel(listOrigin + BackgroundSample);
    int items = 0;
    for (; items < CellsPerRow; ++items) {
        const QRect cell = QRect(listOrigin.x() + items * CellWidth + 2, listOrigin.y() + 4, CellWidth - 4, CellHeight)
                               .intersected(screen.rect());
        int different = 0;
        for (int y = cell.top(); y <= cell.bottom(); ++y) {
            for (int x = cell.left(); x <= cell.right(); ++x)
                different += near(screen.pixel(x, y), background, 40) ? 0 : 1;
        }
        if (different < 15)
            break;
    }
    return items;
}

QStringList downKeys(int count)
{
    return QStringList(count, QStringLiteral("Down")) << QStringLiteral("Return");
}

} // namespace

class TestDesktopDrive : public QObject {
    Q_OBJECT

    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<DesktopDriver> m_desktop;
    QProcess m_program;
    QProcess m_dragSource;
    QProcessEnvironment m_programEnvironment;
    qulonglong m_mainWindow = 0;
    QRect m_mainGeometry;
    int m_shots = 0;
    QStringList m_installed;
    QString m_addedByHand;
    QString m_flashMovie;
    QString m_dropped;
    QString m_package;

    QPoint listOrigin() const { return m_mainGeometry.topLeft() + ListInWindow; }

    // Every step leaves its picture: <build>/screenshots/e2e/NN-step.png.
    void keepScreenshot(const QString& step)
    {
        m_desktop->screenshot(
            QStringLiteral(BRIMVAULT_SCREENSHOT_DIR "/%1-%2.png").arg(++m_shots, 2, 10, QLatin1Char('0')).arg(step));
    }

    QImage screen() const { return m_desktop->screenshot(m_env->path(QStringLiteral("poll.png"))); }

    int itemsShown() const
    {
        const QImage shot = screen();
        return shot.isNull() ? -1 : itemsInFirstRow(shot, listOrigin());
    }

    bool screenShows(const QPoint& at, const QColor& wanted) const
    {
        const QImage shot = screen();
        return !shot.isNull() && near(shot.pixel(at), wanted.rgb(), 30);
    }

    // The selection frame shows beside the icon, where nothing else paints.
    bool itemLooksSelected(int index) const
    {
        const QImage shot = screen();
        const QPoint besideIcon = iconCentre(listOrigin(), index) - QPoint(28, 0);
        return !shot.isNull() && !near(shot.pixel(besideIcon), shot.pixel(listOrigin() + BackgroundSample), 40);
    }

    QString programErrors() { return QString::fromLocal8Bit(m_program.readAllStandardError()); }

    // The paths in the list as the program's own discovery builds it, to find where each game is shown.
    QStringList discovered() const
    {
        QProcess lister;
        QProcessEnvironment headless = m_programEnvironment;
        headless.insert(QStringLiteral("QT_QPA_PLATFORM"), QStringLiteral("offscreen"));
        lister.setProcessEnvironment(headless);
        lister.start(ProgramPath(), {QStringLiteral("--list"), QStringLiteral("--json")});
        if (!lister.waitForFinished(TimeoutMs) || lister.exitCode() != 0)
            qWarning("--list --json failed: %s", lister.readAllStandardError().constData());
        QStringList paths;
        for (const QJsonValue& entry : QJsonDocument::fromJson(lister.readAllStandardOutput()).array())
            paths << QDir::cleanPath(entry[QStringLiteral("path")].toString());
        return paths;
    }

    int indexOf(const QString& path) const { return int(discovered().indexOf(QDir::cleanPath(path))); }

    QList<LaunchRecord> launches() const
    {
        return ReadLaunchRecords(m_env->path(QStringLiteral("launches")), QStringLiteral("runner"));
    }

    // A pop-up menu has no name of its own: it is the program's one new visible window.
    bool waitForPopup(const QList<qulonglong>& before, int timeoutMs)
    {
        return QTest::qWaitFor(
            [&] {
                for (qulonglong window : m_desktop->windows()) {
                    if (!before.contains(window) && m_desktop->windowProcess(window) == m_program.processId())
                        return true;
                }
                return false;
            },
            timeoutMs);
    }

    bool chooseFromActionsMenu(int item)
    {
        const QList<qulonglong> before = m_desktop->windows();
        const QPoint actions = m_mainGeometry.topLeft() + QPoint(m_mainGeometry.width() - ActionsFromRight, ActionsY);
        return m_desktop->click(actions) && m_desktop->waitForFocus(m_mainWindow, TimeoutMs)
            && waitForPopup(before, TimeoutMs) && m_desktop->keys(downKeys(item));
    }

    // A right click selects the item and then opens its menu. A click that got lost on a busy machine (the
    // item stays unselected) is retried, as a person would click again, after dismissing whatever showed.
    bool chooseFromItemMenu(int index, int item)
    {
        for (int attempt = 0; attempt < 3; ++attempt) {
            const QList<qulonglong> before = m_desktop->windows();
            if (!m_desktop->click(iconCentre(listOrigin(), index), 3))
                return false;
            if (m_desktop->waitForFocus(m_mainWindow, MenuTimeoutMs) && waitForPopup(before, MenuTimeoutMs)
                && QTest::qWaitFor([&] { return itemLooksSelected(index); }, 3000))
                return m_desktop->keys(downKeys(item));
            keepScreenshot(QStringLiteral("item-menu-retry"));
            m_desktop->keys({QStringLiteral("Escape")});
        }
        return false;
    }

    // A dialog counts as there once it shows and has the keyboard, so that no key goes to the window below.
    // Message and input boxes carry the product name as their title, like the main window.
    qulonglong waitForDialog(const QString& namePattern = QStringLiteral("^Brimvault$")) const
    {
        const qulonglong dialog = m_desktop->waitForWindow(namePattern, TimeoutMs, {m_mainWindow});
        return dialog != 0 && m_desktop->waitForFocus(dialog, TimeoutMs) ? dialog : 0;
    }

    void prepareLibrary()
    {
        // folder/file, fixture, name
        const char* const installed[][3] = {{"Color Lines/lines.exe", "multi32.exe", "Color Lines"},
            {"Harbor Chess/harborchess.exe", "twogroups32.exe", "Harbor Chess"},
            {"Moon Sudoku/moonsudoku.exe", "multi64.exe", "Moon Sudoku"}};
        for (const auto& game : installed) {
            const QString path = DataFolders::GamesFolder() + QString::fromUtf8(game[0]);
            const QString name = QString::fromUtf8(game[2]);
            QVERIFY(WriteFile(path, ReadFile(PeFixture(QLatin1String(game[1])))) && WriteGameInfo(path, name, name));
            m_installed << path;
        }
        m_flashMovie = DataFolders::GamesFolder() + QStringLiteral("Bubble Pop/bubblepop.swf");
        QVERIFY(WriteFlashMovie(m_flashMovie, FlashMovieColour)
            && WriteGameInfo(m_flashMovie, QStringLiteral("Bubble Pop"), QStringLiteral("Bubble Pop")));
        m_addedByHand = m_env->path(QStringLiteral("My Games/Pinewood/pinewood.exe"));
        QVERIFY(WriteFile(m_addedByHand, ReadFile(PeFixture(QStringLiteral("multi32.exe")))));
        QCOMPARE(CatalogueStore::AddGame(m_addedByHand), QStringLiteral("File1"));
        m_dropped = m_env->path(QStringLiteral("Downloads/Rocket.exe"));
        QVERIFY(WriteFile(m_dropped, ReadFile(PeFixture(QStringLiteral("twogroups64.exe")))));

        const QString source = m_env->path(QStringLiteral("sources/Star Quest/StarQuest.exe"));
        QVERIFY(WriteFile(source, ReadFile(PeFixture(QStringLiteral("multi64.exe"))))
            && WriteGameInfo(source, QStringLiteral("Star Quest Deluxe"), QStringLiteral("Star Quest Deluxe")));
        m_package = m_env->path(QStringLiteral("personal/StarQuest.bvxpak"));
        QString output;
        QVERIFY2(RunService({QStringLiteral("--pack"), QFileInfo(source).absolutePath(), m_package}, &output) == 0,
            qPrintable(output));

        // Games start through a runner that records how it was started.
        const QString runner = m_env->path(QStringLiteral("runner"));
        QVERIFY(InstallRecorder(QStringLiteral(LAUNCH_RECORDER), runner)
            && QDir().mkpath(m_env->path(QStringLiteral("launches"))));
        QVERIFY(SaveSetting(AppTitle(), QStringLiteral("Settings"), QStringLiteral("CompatibilityRunner"), runner));
        QVERIFY(SaveSetting(AppTitle(), QStringLiteral("LocaleSettings"), QStringLiteral("LngFileName"),
            QStringLiteral("English (Default)")));
        QVERIFY(
            SaveSetting(AppTitle(), QStringLiteral("LocaleSettings"), QStringLiteral("LngNik"), QStringLiteral("ENG")));
        QVERIFY(WriteDueAdvertisement(
            DataFolders::ReclamaFolder(), QStringLiteral("http://127.0.0.1:9/summer-sale"), AdvertisementColour));
    }

    // Settings and caches under the user's home belong to the temporary tree as well; every dialog is worked
    // by hand here.
    void setProgramEnvironment()
    {
        const QString home = m_env->path(QStringLiteral("home"));
        QVERIFY(QDir().mkpath(home + QStringLiteral("/runtime")));
        QFile::setPermissions(home + QStringLiteral("/runtime"),
            QFileDevice::ReadOwner | QFileDevice::WriteOwner | QFileDevice::ExeOwner);
        m_programEnvironment = m_desktop->environment();
        const QStringList variables {QStringLiteral("HOME"), home, QStringLiteral("XDG_CONFIG_HOME"),
            home + QStringLiteral("/.config"), QStringLiteral("XDG_DATA_HOME"), home + QStringLiteral("/.local/share"),
            QStringLiteral("XDG_CACHE_HOME"), home + QStringLiteral("/.cache"), QStringLiteral("XDG_RUNTIME_DIR"),
            home + QStringLiteral("/runtime"), QStringLiteral("BV_LAUNCH_RECORD"),
            m_env->path(QStringLiteral("launches")), QStringLiteral("QTWEBENGINE_DISABLE_SANDBOX"), QStringLiteral("1"),
            QStringLiteral("QTWEBENGINE_CHROMIUM_FLAGS"), QStringLiteral("--disable-gpu")};
        for (qsizetype i = 0; i < variables.size(); i += 2)
            m_programEnvironment.insert(variables.at(i), variables.at(i + 1));
        for (const char* name : {"BRIMVAULT_DIALOG_ANSWER", "BRIMVAULT_PROMPT_LOG", "BRIMVAULT_WINDOW_REPORT"})
            m_programEnvironment.remove(QString::fromLatin1(name));
    }

private Q_SLOTS:
    void initTestCase()
    {
        REQUIRE_TOOL("Xvfb", "xvfb");
        REQUIRE_TOOL("xdotool", "xdotool");
        REQUIRE_RUFFLE();
        // Pictures of an earlier run would mix with this one's.
        QDir(QStringLiteral(BRIMVAULT_SCREENSHOT_DIR)).removeRecursively();
        m_env = std::make_unique<TestEnvironment>();
        prepareLibrary();
        if (QTest::currentTestFailed())
            return;
        m_desktop = std::make_unique<DesktopDriver>(QStringLiteral(BRIMVAULT_DESKTOP_HELPER));
        const QString failure = m_desktop->start(ScreenWidth, ScreenHeight);
        QVERIFY2(failure.isEmpty(), qPrintable(failure));
        setProgramEnvironment();

        m_program.setProcessEnvironment(m_programEnvironment);
        m_program.setWorkingDirectory(m_env->root());
        m_program.start(ProgramPath(), QStringList());
        QVERIFY2(m_program.waitForStarted(30000), qPrintable(m_program.errorString()));
        m_mainWindow = m_desktop->waitForWindow(QStringLiteral("^Brimvault$"), TimeoutMs);
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
            process->kill();
            process->waitForFinished(10000);
        }
        m_desktop.reset();
    }

    void listFills()
    {
        const QStringList games = discovered();
        QCOMPARE(games.size(), 1 + m_installed.size() + 1 + 1);
        for (const QString& game : m_installed + QStringList {m_flashMovie, m_addedByHand})
            QVERIFY2(indexOf(game) > 0, qPrintable(game));
        // The window's icon builder caches the icon of every game it lists.
        for (const QString& game : m_installed + QStringList {m_addedByHand})
            QTRY_VERIFY_WITH_TIMEOUT(QFile::exists(IconCacheFile(DataFolders::IconsFolder(), game)), TimeoutMs);
        QTRY_COMPARE_WITH_TIMEOUT(itemsShown(), int(games.size()), TimeoutMs);
        keepScreenshot(QStringLiteral("list-filled"));
    }

    void arrowKeysAndEnterStartAGame()
    {
        // The last installed executable, so that the arrows have a way to go.
        int target = 0;
        for (const QString& game : m_installed)
            target = qMax(target, indexOf(game));
        QVERIFY(target > 1);
        const QString game = discovered().at(target);

        // A click selects without starting; the arrows move on, Enter starts.
        QVERIFY(m_desktop->click(iconCentre(listOrigin(), 0)));
        QVERIFY(m_desktop->waitForFocus(m_mainWindow, TimeoutMs));
        QVERIFY(m_desktop->keys(QStringList(target, QStringLiteral("Right")) << QStringLiteral("Return")));
        QTRY_COMPARE_WITH_TIMEOUT(launches().size(), 1, TimeoutMs);
        QCOMPARE(launches().constFirst().arguments, QStringList {game});
        QCOMPARE(QDir(launches().constFirst().workingFolder).canonicalPath(), QFileInfo(game).canonicalPath());
        keepScreenshot(QStringLiteral("game-started"));
        // Nothing else was started on the way.
        QTest::qWait(500);
        QCOMPARE(launches().size(), 1);
    }

    void openGameOfflineStartsTheFileOnDisk()
    {
        // The command upper-cases the path; on a file system that minds case the file must still be found.
        const int index = indexOf(m_installed.at(0));
        QVERIFY(index > 0);
        QVERIFY(chooseFromItemMenu(index, OpenOfflineItem));
        QTRY_COMPARE_WITH_TIMEOUT(launches().size(), 2, TimeoutMs);
        QCOMPARE(launches().constLast().arguments, QStringList {m_installed.at(0)});
    }

    void flashMovieOpensInTheMediaHost()
    {
        const int index = indexOf(m_flashMovie);
        QVERIFY(index > 0);
        QVERIFY(m_desktop->doubleClick(iconCentre(listOrigin(), index)));
        // The host window is captioned with the game's name and plays the movie.
        const qulonglong host = m_desktop->waitForWindow(QStringLiteral("^Bubble Pop$"), TimeoutMs);
        QVERIFY2(host != 0, qPrintable(programErrors()));
        QTRY_VERIFY_WITH_TIMEOUT(screenShows(m_desktop->windowGeometry(host).center(), FlashMovieColour), TimeoutMs);
        keepScreenshot(QStringLiteral("flash-movie"));
        // A movie is no process of its own: the runner saw nothing new.
        QCOMPARE(launches().size(), 2);
        QVERIFY(m_desktop->closeWindow(host) && m_desktop->waitForWindowGone(host, TimeoutMs));
        QCOMPARE(m_program.state(), QProcess::Running);
    }

    void droppedExecutableIsAdded()
    {
        const int shownBefore = itemsShown();
        QVERIFY(shownBefore > 0);
        m_dragSource.setProcessEnvironment(m_programEnvironment);
        m_dragSource.start(m_desktop->helperProgram(), {QStringLiteral("drag"), m_dropped});
        const qulonglong source = m_desktop->waitForWindow(QStringLiteral("^Brimvault drag source$"), TimeoutMs);
        QVERIFY(source != 0);
        const QPoint from = m_desktop->windowGeometry(source).center();
        QVERIFY(!m_mainGeometry.contains(from));

        const QPoint target = listOrigin() + QPoint(400, 250);
        QVERIFY(m_desktop->moveTo(from) && m_desktop->xdotool({QStringLiteral("mousedown"), QStringLiteral("1")}));
        for (int step = 1; step <= 5; ++step)
            QVERIFY(m_desktop->moveTo(from + (target - from) * step / 5));
        QVERIFY(m_desktop->moveTo(target + QPoint(4, 4)));
        QVERIFY(m_desktop->xdotool({QStringLiteral("mouseup"), QStringLiteral("1")}));

        QTRY_VERIFY_WITH_TIMEOUT(CatalogueStore::FindAddedGame(m_dropped).has_value(), TimeoutMs);
        // The program has taken the dropped data: the drag source has done its part.
        m_dragSource.terminate();
        QVERIFY(m_dragSource.waitForFinished(10000));
        QCOMPARE(CatalogueStore::AddedGames().size(), 2);
        QTRY_COMPARE_WITH_TIMEOUT(itemsShown(), shownBefore + 1, TimeoutMs);
        keepScreenshot(QStringLiteral("dropped"));
    }

    void packageInstallsThroughTheService()
    {
        const int shownBefore = itemsShown();
        const QString installedGame = DataFolders::GamesFolder() + QStringLiteral("Star Quest/StarQuest.exe");
        QVERIFY(!QFile::exists(installedGame));

        QVERIFY(chooseFromActionsMenu(InstallItem));
        QVERIFY2(waitForDialog(QStringLiteral("^Install game$")) != 0, qPrintable(programErrors()));
        keepScreenshot(QStringLiteral("install-dialog"));
        // The file name field has the focus: a typed full path and Return choose the package.
        QVERIFY(
            m_desktop->typeText(QDir::toNativeSeparators(m_package)) && m_desktop->keys({QStringLiteral("Return")}));

        QTRY_VERIFY_WITH_TIMEOUT(QFile::exists(installedGame), TimeoutMs);
        QTRY_VERIFY_WITH_TIMEOUT(QFile::exists(IconCacheFile(DataFolders::IconsFolder(), installedGame)), TimeoutMs);
        QTRY_COMPARE_WITH_TIMEOUT(itemsShown(), shownBefore + 1, TimeoutMs);
        // The service also raised the new-game signal: the window takes it within a few seconds and fills its
        // list once more, dropping the selection and any open menu. Later steps start after that.
        QTRY_COMPARE_WITH_TIMEOUT(
            GetSetting(AppTitle(), QStringLiteral("Commands"), QStringLiteral("NewGameInstalled"), QStringLiteral("0")),
            QStringLiteral("0"), TimeoutMs);
        QTRY_COMPARE_WITH_TIMEOUT(itemsShown(), shownBefore + 1, TimeoutMs);
        QVERIFY(indexOf(installedGame) > 0);
        keepScreenshot(QStringLiteral("installed"));
    }

    void gameIsRemoved()
    {
        const QString removed = m_installed.at(1);
        const qsizetype listed = discovered().size();
        const int index = indexOf(removed);
        QVERIFY(index > 0);
        const int shownBefore = itemsShown();

        // Escape answers No: the game stays.
        QVERIFY(chooseFromItemMenu(index, RemoveItem));
        const qulonglong refused = waitForDialog();
        QVERIFY(refused != 0);
        QVERIFY(m_desktop->keys({QStringLiteral("Escape")}) && m_desktop->waitForWindowGone(refused, TimeoutMs));
        QVERIFY(QFile::exists(removed));
        QCOMPARE(itemsShown(), shownBefore);

        QVERIFY(chooseFromItemMenu(index, RemoveItem));
        QVERIFY(waitForDialog() != 0);
        keepScreenshot(QStringLiteral("remove-question"));
        QVERIFY(m_desktop->keys({QStringLiteral("Return")}));

        QTRY_VERIFY_WITH_TIMEOUT(!QFileInfo::exists(QFileInfo(removed).absolutePath()), TimeoutMs);
        QTRY_COMPARE_WITH_TIMEOUT(itemsShown(), shownBefore - 1, TimeoutMs);
        QCOMPARE(discovered().size(), listed - 1);
        QVERIFY(QFile::exists(m_installed.at(0)) && QFile::exists(m_installed.at(2)));
        QCOMPARE(CatalogueStore::AddedGames().size(), 2);
        keepScreenshot(QStringLiteral("removed"));
    }

    void closingShowsTheDueAdvertisement()
    {
        const QList<qulonglong> before = m_desktop->windows();
        QVERIFY(m_desktop->closeWindow(m_mainWindow) && m_desktop->waitForWindowGone(m_mainWindow, TimeoutMs));
        const qulonglong advert = m_desktop->waitForWindow(QStringLiteral(".+"), TimeoutMs, before);
        QVERIFY2(advert != 0, qPrintable(programErrors()));
        QCOMPARE(m_desktop->windowName(advert), QStringLiteral("Advertising"));
        // The advertisement's own picture fills the window: its colour is at the centre.
        QTRY_VERIFY_WITH_TIMEOUT(
            screenShows(m_desktop->windowGeometry(advert).center(), AdvertisementColour), TimeoutMs);
        keepScreenshot(QStringLiteral("advertisement"));
        QCOMPARE(m_program.state(), QProcess::Running);

        QVERIFY(m_desktop->closeWindow(advert));
        QTRY_COMPARE_WITH_TIMEOUT(m_program.state(), QProcess::NotRunning, TimeoutMs);
        QCOMPARE(m_program.exitStatus(), QProcess::NormalExit);
        QVERIFY2(m_program.exitCode() == 0, qPrintable(programErrors()));
    }
};

QTEST_MAIN(TestDesktopDrive)
#include "tst_desktopdrive.moc"

// The real program on its own X display, worked only with the pointer and the keyboard as a person works it:
// the list fills, a game starts from the keyboard, a file is dropped, a package is installed through the
// service, and closing shows the advertisement.
#include "AdvertisingFiles.h"
#include "LaunchRecords.h"
#include "MainWindowFixture.h"
#include "PeFixtures.h"
#include "ProgramRun.h"
#include "TestEnvironment.h"
#include "TestFiles.h"

#include "catalogue/IconCacheKey.h"
#include "store/CatalogueStore.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QProcess>
#include <QTest>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

constexpr int TimeoutMs = 60000;
// The list's designed place in the window at 96 dots per inch (200 and 1260 twips), and its cells.
constexpr QPoint ListInWindow(13, 84);
constexpr int CellWidth = 80;
constexpr QPoint FirstIconCentre(39, 30);
// Below the first row the list shows its bare background.
constexpr QPoint BackgroundSample(8, 200);
constexpr QColor AdvertisementColour(250, 200, 40);

bool near(QRgb a, QRgb b, int tolerance)
{
    return qAbs(qRed(a) - qRed(b)) <= tolerance && qAbs(qGreen(a) - qGreen(b)) <= tolerance
        && qAbs(qBlue(a) - qBlue(b)) <= tolerance;
}

// A private X display worked through xdotool, and the desktop helper for screenshots, drags and closing.
class Desktop {
public:
    ~Desktop()
    {
        m_xvfb.kill();
        m_xvfb.waitForFinished(5000);
    }
    // Xvfb picks a free display number and writes it once it accepts clients.
    bool start()
    {
        m_xvfb.start(u"Xvfb"_s,
            {u"-displayfd"_s, u"1"_s, u"-screen"_s, u"0"_s, u"1280x1024x24"_s, u"-nolisten"_s, u"tcp"_s,
                u"-noreset"_s});
        (void)QTest::qWaitFor([&] { return m_xvfb.waitForReadyRead(100) && m_xvfb.canReadLine(); }, 30000);
        environment.insert(u"DISPLAY"_s, u':' + QString::fromLatin1(m_xvfb.readLine().trimmed()));
        environment.insert(u"QT_QPA_PLATFORM"_s, u"xcb"_s);
        environment.remove(u"WAYLAND_DISPLAY"_s);
        return environment.value(u"DISPLAY"_s).size() > 1;
    }
    bool run(const QString& program, const QStringList& arguments, QString* output = nullptr) const
    {
        QProcess process;
        process.setProcessEnvironment(environment);
        process.start(program, arguments);
        const bool ended = process.waitForFinished(20000);
        if (output)
            *output = QString::fromUtf8(process.readAllStandardOutput()).trimmed();
        return ended && process.exitStatus() == QProcess::NormalExit && process.exitCode() == 0;
    }
    bool xdotool(const QStringList& arguments) const { return run(u"xdotool"_s, arguments); }
    QString ask(const QStringList& arguments) const
    {
        QString output;
        run(u"xdotool"_s, arguments, &output);
        return output;
    }
    // Visible windows whose name matches; without a pattern every one, unnamed pop-up menus included.
    QList<qulonglong> windows(const QString& pattern = {}) const
    {
        QList<qulonglong> found;
        const QString search = pattern.isEmpty() ? u"--class"_s : u"--name"_s;
        for (const QString& line : ask({u"search"_s, u"--onlyvisible"_s, search, pattern.isEmpty() ? u".*"_s : pattern})
                                       .split(u'\n', Qt::SkipEmptyParts))
            found << line.toULongLong();
        return found;
    }
    qulonglong waitForWindow(const QString& pattern, const QList<qulonglong>& except = {}) const
    {
        qulonglong found = 0;
        const auto shown = [&] {
            for (qulonglong window : windows(pattern)) {
                if (!except.contains(window) && !geometry(window).isEmpty())
                    return found = window;
            }
            return found = 0;
        };
        return QTest::qWaitFor(shown, TimeoutMs) ? found : 0;
    }
    // A window takes the keyboard a moment after it shows.
    bool waitForFocus(qulonglong window) const
    {
        return QTest::qWaitFor([&] { return ask({u"getwindowfocus"_s}).toULongLong() == window; }, TimeoutMs);
    }
    QRect geometry(qulonglong window) const
    {
        QHash<QString, int> values;
        for (const QString& line : ask({u"getwindowgeometry"_s, u"--shell"_s, QString::number(window)}).split(u'\n'))
            values.insert(line.section(u'=', 0, 0), line.section(u'=', 1).toInt());
        return {values[u"X"_s], values[u"Y"_s], values[u"WIDTH"_s], values[u"HEIGHT"_s]};
    }
    // The pointer's arrival is an event of its own; the next press must not overtake it.
    bool moveTo(const QPoint& at) const
    {
        const bool moved = xdotool({u"mousemove"_s, QString::number(at.x()), QString::number(at.y())});
        QTest::qWait(100);
        return moved;
    }
    // xdotool waits between events so that every one is handled in turn.
    bool click(const QPoint& at, int button = 1, int times = 1) const
    {
        return moveTo(at)
            && xdotool(
                {u"click"_s, u"--repeat"_s, QString::number(times), u"--delay"_s, u"60"_s, QString::number(button)});
    }
    bool keys(const QStringList& names) const { return xdotool(QStringList {u"key"_s, u"--delay"_s, u"60"_s} + names); }
    bool close(qulonglong window) const
    {
        return run(QStringLiteral(BRIMVAULT_DESKTOP_HELPER), {u"close"_s, QString::number(window)});
    }
    QImage screenshot(const QString& png) const
    {
        QDir().mkpath(QFileInfo(png).absolutePath());
        return run(QStringLiteral(BRIMVAULT_DESKTOP_HELPER), {u"grab"_s, png}) ? QImage(png) : QImage();
    }

    QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();

private:
    QProcess m_xvfb;
};

} // namespace

class TestDesktopDrive : public QObject {
    Q_OBJECT

    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<Desktop> m_desktop;
    QProcess m_program;
    QProcess m_dragSource;
    qulonglong m_mainWindow = 0;
    QRect m_mainGeometry;
    QStringList m_installed;
    QString m_addedByHand;
    QString m_dropped;
    QString m_package;

    QPoint listOrigin() const { return m_mainGeometry.topLeft() + ListInWindow; }
    QPoint iconCentre(int index) const { return listOrigin() + FirstIconCentre + QPoint(index * CellWidth, 0); }

    QImage screen() const { return m_desktop->screenshot(m_env->path(u"poll.png"_s)); }

    // Items fill the first row's cells left to right: the painted cells tell how many are shown.
    int itemsShown() const
    {
        const QImage shot = screen();
        if (shot.isNull())
            return -1;
        const QRgb background = shot.pixel(listOrigin() + BackgroundSample);
        int items = 0;
        for (bool painted = true; painted && items < 9; items += painted) {
            int different = 0;
            for (int y = 4; y < 80; ++y) {
                for (int x = 2; x < CellWidth - 2; ++x)
                    different += !near(shot.pixel(listOrigin() + QPoint(items * CellWidth + x, y)), background, 40);
            }
            painted = different >= 15;
        }
        return items;
    }

    QString programErrors() { return QString::fromLocal8Bit(m_program.readAllStandardError()); }

    // The list's paths as the program's own discovery builds it, to find where each game is shown.
    QStringList discovered() const
    {
        QString json;
        m_desktop->run(ProgramPath(), {u"--list"_s, u"--json"_s}, &json);
        QStringList paths;
        for (const QJsonValue& entry : QJsonDocument::fromJson(json.toUtf8()).array())
            paths << QDir::cleanPath(entry[u"path"_s].toString());
        return paths;
    }
    int indexOf(const QString& path) const { return int(discovered().indexOf(QDir::cleanPath(path))); }

    QList<LaunchRecord> launches() const { return ReadLaunchRecords(m_env->path(u"launches"_s), u"runner"_s); }

    // A pop-up menu has no name of its own: it is the program's one new visible window.
    bool waitForPopup(const QList<qulonglong>& before)
    {
        return QTest::qWaitFor(
            [&] {
                for (qulonglong window : m_desktop->windows()) {
                    if (!before.contains(window)
                        && m_desktop->ask({u"getwindowpid"_s, QString::number(window)}).toLongLong()
                            == m_program.processId())
                        return true;
                }
                return false;
            },
            TimeoutMs);
    }

private Q_SLOTS:
    void initTestCase()
    {
        REQUIRE_TOOL("Xvfb", "xvfb");
        REQUIRE_TOOL("xdotool", "xdotool");
        m_env = std::make_unique<TestEnvironment>();
        for (const auto& [file, fixture] : {std::pair(u"Color Lines/lines.exe"_s, u"multi32.exe"_s),
                 std::pair(u"Harbor Chess/harborchess.exe"_s, u"twogroups32.exe"_s)}) {
            const QString path = DataFolders::GamesFolder() + file;
            const QString name = file.section(u'/', 0, 0);
            QVERIFY(WriteFile(path, ReadFile(PeFixture(fixture))) && WriteGameInfo(path, name, name));
            m_installed << path;
        }
        m_addedByHand = m_env->path(u"My Games/Pinewood/pinewood.exe"_s);
        QVERIFY(WriteFile(m_addedByHand, ReadFile(PeFixture(u"multi32.exe"_s))));
        QCOMPARE(CatalogueStore::AddGame(m_addedByHand), u"File1"_s);
        m_dropped = m_env->path(u"Downloads/Rocket.exe"_s);
        QVERIFY(WriteFile(m_dropped, ReadFile(PeFixture(u"twogroups64.exe"_s))));

        const QString source = m_env->path(u"sources/Star Quest/StarQuest.exe"_s);
        QVERIFY(WriteFile(source, ReadFile(PeFixture(u"multi64.exe"_s)))
            && WriteGameInfo(source, u"Star Quest Deluxe"_s, u"Star Quest Deluxe"_s));
        m_package = m_env->path(u"personal/StarQuest.bvxpak"_s);
        QCOMPARE(RunService({u"--pack"_s, QFileInfo(source).absolutePath(), m_package}, nullptr), 0);

        // Games start through a runner that records how it was started.
        const QString runner = m_env->path(u"runner"_s);
        QVERIFY(InstallRecorder(QStringLiteral(LAUNCH_RECORDER), runner) && QDir().mkpath(m_env->path(u"launches"_s)));
        QVERIFY(SaveSetting(AppTitle(), u"Settings"_s, u"CompatibilityRunner"_s, runner)
            && SaveSetting(AppTitle(), u"LocaleSettings"_s, u"LngFileName"_s, u"English (Default)"_s)
            && SaveSetting(AppTitle(), u"LocaleSettings"_s, u"LngNik"_s, u"ENG"_s));
        QVERIFY(WriteDueAdvertisement(
            DataFolders::ReclamaFolder(), u"http://127.0.0.1:9/summer-sale"_s, AdvertisementColour));

        m_desktop = std::make_unique<Desktop>();
        QVERIFY2(m_desktop->start(), "Xvfb gave no display number");
        // Settings and caches under the user's home belong to the temporary tree as well; every dialog is worked
        // by hand here.
        QProcessEnvironment& environment = m_desktop->environment;
        const QString home = m_env->path(u"home"_s);
        QVERIFY(QDir().mkpath(home + u"/runtime"_s));
        QFile::setPermissions(
            home + u"/runtime"_s, QFileDevice::ReadOwner | QFileDevice::WriteOwner | QFileDevice::ExeOwner);
        const QStringList variables {u"HOME"_s, home, u"XDG_CONFIG_HOME"_s, home + u"/.config"_s, u"XDG_DATA_HOME"_s,
            home + u"/.local/share"_s, u"XDG_CACHE_HOME"_s, home + u"/.cache"_s, u"XDG_RUNTIME_DIR"_s,
            home + u"/runtime"_s, u"BV_LAUNCH_RECORD"_s, m_env->path(u"launches"_s), u"QTWEBENGINE_DISABLE_SANDBOX"_s,
            u"1"_s, u"QTWEBENGINE_CHROMIUM_FLAGS"_s, u"--disable-gpu"_s};
        for (qsizetype i = 0; i < variables.size(); i += 2)
            environment.insert(variables.at(i), variables.at(i + 1));
        for (const QString& name :
            {u"BRIMVAULT_DIALOG_ANSWER"_s, u"BRIMVAULT_PROMPT_LOG"_s, u"BRIMVAULT_WINDOW_REPORT"_s})
            environment.remove(name);
        m_program.setProcessEnvironment(environment);
        m_program.setWorkingDirectory(m_env->root());
        m_program.start(ProgramPath(), QStringList());
        m_mainWindow = m_desktop->waitForWindow(u"^Brimvault$"_s);
        QVERIFY2(m_mainWindow != 0, qPrintable(programErrors()));
        m_mainGeometry = m_desktop->geometry(m_mainWindow);
        QVERIFY(m_mainGeometry.width() > 400 && QRect(0, 0, 1280, 1024).contains(m_mainGeometry));
    }

    void cleanup()
    {
        if (!QTest::currentTestFailed() || !m_desktop)
            return;
        // The screen of a failed step: <build>/screenshots/e2e/<step>.png.
        m_desktop->screenshot(QStringLiteral(BRIMVAULT_SCREENSHOT_DIR "/")
            + QString::fromLatin1(QTest::currentTestFunction()) + u".png"_s);
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
        QCOMPARE(games.size(), m_installed.size() + 2); // the online games first, and the one added by hand
        // The window's icon builder caches the icon of every game it lists.
        for (const QString& game : m_installed + QStringList {m_addedByHand}) {
            QVERIFY2(indexOf(game) > 0, qPrintable(game));
            QTRY_VERIFY_WITH_TIMEOUT(QFile::exists(IconCacheFile(DataFolders::IconsFolder(), game)), TimeoutMs);
        }
        QTRY_COMPARE_WITH_TIMEOUT(itemsShown(), int(games.size()), TimeoutMs);
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
        QVERIFY(m_desktop->click(iconCentre(0)) && m_desktop->waitForFocus(m_mainWindow));
        QVERIFY(m_desktop->keys(QStringList(target, u"Right"_s) << u"Return"_s));
        QTRY_COMPARE_WITH_TIMEOUT(launches().size(), 1, TimeoutMs);
        QCOMPARE(launches().constFirst().arguments, QStringList {game});
        QCOMPARE(QDir(launches().constFirst().workingFolder).canonicalPath(), QFileInfo(game).canonicalPath());
        QTest::qWait(500);
        QCOMPARE(launches().size(), 1);
    }

    void droppedExecutableIsAdded()
    {
        const int shownBefore = itemsShown();
        m_dragSource.setProcessEnvironment(m_desktop->environment);
        m_dragSource.start(QStringLiteral(BRIMVAULT_DESKTOP_HELPER), {u"drag"_s, m_dropped});
        const qulonglong source = m_desktop->waitForWindow(u"^Brimvault drag source$"_s);
        const QPoint from = m_desktop->geometry(source).center();
        QVERIFY(source != 0 && !m_mainGeometry.contains(from));
        const QPoint to = listOrigin() + QPoint(400, 250);
        QVERIFY(m_desktop->moveTo(from) && m_desktop->xdotool({u"mousedown"_s, u"1"_s}));
        for (int step = 1; step <= 5; ++step)
            QVERIFY(m_desktop->moveTo(from + (to - from) * step / 5));
        QVERIFY(m_desktop->moveTo(to + QPoint(4, 4)) && m_desktop->xdotool({u"mouseup"_s, u"1"_s}));

        QTRY_VERIFY_WITH_TIMEOUT(CatalogueStore::FindAddedGame(m_dropped).has_value(), TimeoutMs);
        // The program has taken the dropped data: the drag source has done its part.
        m_dragSource.terminate();
        QVERIFY(m_dragSource.waitForFinished(10000));
        QCOMPARE(CatalogueStore::AddedGames().size(), 2);
        QTRY_COMPARE_WITH_TIMEOUT(itemsShown(), shownBefore + 1, TimeoutMs);
    }

    void packageInstallsThroughTheService()
    {
        const int shownBefore = itemsShown();
        const QString installedGame = DataFolders::GamesFolder() + u"Star Quest/StarQuest.exe"_s;
        QVERIFY(!QFile::exists(installedGame));
        // The Actions caption keeps 32 pixels to the window's right edge in every language; a menu's items are
        // counted in key presses from its top.
        const QList<qulonglong> before = m_desktop->windows();
        QVERIFY(m_desktop->click(m_mainGeometry.topLeft() + QPoint(m_mainGeometry.width() - 32, 38))
            && m_desktop->waitForFocus(m_mainWindow) && waitForPopup(before));
        QVERIFY(m_desktop->keys({u"Down"_s, u"Down"_s, u"Down"_s, u"Return"_s}));
        // The dialog counts as there once it has the keyboard, so that no key goes to the window below.
        const qulonglong dialog = m_desktop->waitForWindow(u"^Install game$"_s, {m_mainWindow});
        QVERIFY2(dialog != 0 && m_desktop->waitForFocus(dialog), qPrintable(programErrors()));
        // The file name field has the focus: a typed full path and Return choose the package.
        QVERIFY(m_desktop->xdotool({u"type"_s, u"--delay"_s, u"60"_s, QDir::toNativeSeparators(m_package)})
            && m_desktop->keys({u"Return"_s}));
        QTRY_VERIFY_WITH_TIMEOUT(QFile::exists(installedGame), TimeoutMs);
        QTRY_VERIFY_WITH_TIMEOUT(QFile::exists(IconCacheFile(DataFolders::IconsFolder(), installedGame)), TimeoutMs);
        QTRY_COMPARE_WITH_TIMEOUT(itemsShown(), shownBefore + 1, TimeoutMs);
        // The service also raised the new-game signal: the window takes it within a few seconds and fills its
        // list once more, dropping the selection and any open menu. Later steps start after that.
        QTRY_COMPARE_WITH_TIMEOUT(
            GetSetting(AppTitle(), u"Commands"_s, u"NewGameInstalled"_s, u"0"_s), u"0"_s, TimeoutMs);
        QTRY_COMPARE_WITH_TIMEOUT(itemsShown(), shownBefore + 1, TimeoutMs);
        QVERIFY(indexOf(installedGame) > 0);
    }

    void closingShowsTheDueAdvertisement()
    {
        const QList<qulonglong> before = m_desktop->windows();
        QVERIFY(m_desktop->close(m_mainWindow));
        QTRY_VERIFY_WITH_TIMEOUT(!m_desktop->windows().contains(m_mainWindow), TimeoutMs);
        const qulonglong advert = m_desktop->waitForWindow(u"^Advertising$"_s, before);
        QVERIFY2(advert != 0, qPrintable(programErrors()));
        // The advertisement's own picture fills the window: its colour is at the centre.
        QTRY_VERIFY_WITH_TIMEOUT(
            near(screen().pixel(m_desktop->geometry(advert).center()), AdvertisementColour.rgb(), 30), TimeoutMs);
        QCOMPARE(m_program.state(), QProcess::Running);
        QVERIFY(m_desktop->close(advert));
        QTRY_COMPARE_WITH_TIMEOUT(m_program.state(), QProcess::NotRunning, TimeoutMs);
        QCOMPARE(m_program.exitStatus(), QProcess::NormalExit);
        QVERIFY2(m_program.exitCode() == 0, qPrintable(programErrors()));
    }
};

QTEST_MAIN(TestDesktopDrive)
#include "tst_desktopdrive.moc"

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

} // namespace

// Windows are named by the ids xdotool prints; the desktop helper grabs the screen, drags and closes windows.
class TestDesktopDrive : public QObject {
    Q_OBJECT

    std::unique_ptr<TestEnvironment> m_env;
    QProcessEnvironment m_environment;
    QProcess m_xvfb;
    QProcess m_program;
    QProcess m_dragSource;
    QString m_mainWindow;
    QRect m_mainGeometry;
    QStringList m_installed;
    QString m_dropped;
    QString m_package;

    // A tool run on the test's display: its output, or nothing when it failed.
    std::optional<QString> run(const QString& program, const QStringList& arguments, int timeoutMs = 20000) const
    {
        QProcess process;
        process.setProcessEnvironment(m_environment);
        process.start(program, arguments);
        if (!process.waitForFinished(timeoutMs) || process.exitStatus() != QProcess::NormalExit
            || process.exitCode() != 0)
            return std::nullopt;
        return QString::fromUtf8(process.readAllStandardOutput()).trimmed();
    }
    bool xdotool(const QStringList& arguments) const { return run(u"xdotool"_s, arguments).has_value(); }
    QString ask(const QStringList& arguments) const { return run(u"xdotool"_s, arguments).value_or(QString()); }
    bool helper(const QString& command, const QString& argument) const
    {
        return run(QStringLiteral(BRIMVAULT_DESKTOP_HELPER), {command, argument}).has_value();
    }

    QString waitForWindow(const QString& pattern) const
    {
        const QStringList search {u"search"_s, u"--sync"_s, u"--onlyvisible"_s, u"--name"_s, pattern};
        return run(u"xdotool"_s, search, TimeoutMs).value_or(QString()).section(u'\n', 0, 0);
    }
    // Pop-up menus have no name: they are told by the program's process.
    QStringList programWindows() const
    {
        return ask({u"search"_s, u"--onlyvisible"_s, u"--pid"_s, QString::number(m_program.processId())})
            .split(u'\n', Qt::SkipEmptyParts);
    }
    // A window takes the keyboard a moment after it shows.
    bool waitForFocus(const QString& window) const
    {
        return QTest::qWaitFor([&] { return ask({u"getwindowfocus"_s}) == window; }, TimeoutMs);
    }
    QRect geometry(const QString& window) const
    {
        QHash<QString, int> values;
        for (const QString& line : ask({u"getwindowgeometry"_s, u"--shell"_s, window}).split(u'\n'))
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
    bool keys(const QStringList& names) const { return xdotool(QStringList {u"key"_s, u"--delay"_s, u"60"_s} + names); }

    QPoint listOrigin() const { return m_mainGeometry.topLeft() + ListInWindow; }

    QImage screen() const
    {
        const QString png = m_env->path(u"poll.png"_s);
        return helper(u"grab"_s, png) ? QImage(png) : QImage();
    }

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
        QStringList paths;
        const QString json = run(ProgramPath(), {u"--list"_s, u"--json"_s}).value_or(QString());
        for (const QJsonValue& entry : QJsonDocument::fromJson(json.toUtf8()).array())
            paths << QDir::cleanPath(entry[u"path"_s].toString());
        return paths;
    }
    int indexOf(const QString& path) const { return int(discovered().indexOf(QDir::cleanPath(path))); }

    QList<LaunchRecord> launches() const { return ReadLaunchRecords(m_env->path(u"launches"_s), u"runner"_s); }

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
        const QString addedByHand = m_env->path(u"My Games/Pinewood/pinewood.exe"_s);
        QVERIFY(WriteFile(addedByHand, ReadFile(PeFixture(u"multi32.exe"_s))));
        QCOMPARE(CatalogueStore::AddGame(addedByHand), u"File1"_s);
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

        // Xvfb picks a free display number and writes it, in one line, once it accepts clients.
        m_xvfb.start(u"Xvfb"_s,
            {u"-displayfd"_s, u"1"_s, u"-screen"_s, u"0"_s, u"1280x1024x24"_s, u"-nolisten"_s, u"tcp"_s,
                u"-noreset"_s});
        QVERIFY(m_xvfb.waitForReadyRead(30000));
        // Settings and caches under the user's home belong to the temporary tree as well; every dialog is worked
        // by hand here.
        const QString home = m_env->path(u"home"_s);
        QVERIFY(QDir().mkpath(home + u"/runtime"_s));
        QFile::setPermissions(
            home + u"/runtime"_s, QFileDevice::ReadOwner | QFileDevice::WriteOwner | QFileDevice::ExeOwner);
        const QStringList variables {u"DISPLAY"_s, u':' + QString::fromLatin1(m_xvfb.readLine().trimmed()),
            u"QT_QPA_PLATFORM"_s, u"xcb"_s, u"HOME"_s, home, u"XDG_CONFIG_HOME"_s, home + u"/.config"_s,
            u"XDG_DATA_HOME"_s, home + u"/.local/share"_s, u"XDG_CACHE_HOME"_s, home + u"/.cache"_s,
            u"XDG_RUNTIME_DIR"_s, home + u"/runtime"_s, u"BV_LAUNCH_RECORD"_s, m_env->path(u"launches"_s),
            u"QTWEBENGINE_DISABLE_SANDBOX"_s, u"1"_s, u"QTWEBENGINE_CHROMIUM_FLAGS"_s, u"--disable-gpu"_s};
        m_environment = QProcessEnvironment::systemEnvironment();
        for (qsizetype i = 0; i < variables.size(); i += 2)
            m_environment.insert(variables.at(i), variables.at(i + 1));
        for (const QString& name : {u"WAYLAND_DISPLAY"_s, u"BRIMVAULT_DIALOG_ANSWER"_s, u"BRIMVAULT_PROMPT_LOG"_s,
                 u"BRIMVAULT_WINDOW_REPORT"_s})
            m_environment.remove(name);
        m_program.setProcessEnvironment(m_environment);
        m_program.setWorkingDirectory(m_env->root());
        m_program.start(ProgramPath(), QStringList());
        m_mainWindow = waitForWindow(u"^Brimvault$"_s);
        QVERIFY2(!m_mainWindow.isEmpty(), qPrintable(programErrors()));
        m_mainGeometry = geometry(m_mainWindow);
        QVERIFY(m_mainGeometry.width() > 400 && QRect(0, 0, 1280, 1024).contains(m_mainGeometry));
    }

    void cleanup()
    {
        if (!QTest::currentTestFailed() || !m_env)
            return;
        // The screen of a failed step: <build>/screenshots/e2e/<step>.png.
        QDir().mkpath(QStringLiteral(BRIMVAULT_SCREENSHOT_DIR));
        helper(u"grab"_s,
            QStringLiteral(BRIMVAULT_SCREENSHOT_DIR "/") + QString::fromLatin1(QTest::currentTestFunction())
                + u".png"_s);
        qWarning("program's error output:\n%s", qPrintable(programErrors()));
    }

    void cleanupTestCase()
    {
        for (QProcess* process : {&m_dragSource, &m_program, &m_xvfb}) {
            process->kill();
            process->waitForFinished(10000);
        }
    }

    // The online games, the two installed ones and the one added by hand.
    void listFills() { QTRY_COMPARE_WITH_TIMEOUT(itemsShown(), 4, TimeoutMs); }

    void arrowKeysAndEnterStartAGame()
    {
        // The last installed executable, so that the arrows have a way to go.
        int target = 0;
        for (const QString& game : m_installed)
            target = qMax(target, indexOf(game));
        QVERIFY(target > 1);
        const QString game = discovered().at(target);
        // A left click selects without starting or opening the item menu; the arrows move on, Enter starts.
        QVERIFY(moveTo(listOrigin() + FirstIconCentre) && xdotool({u"click"_s, u"1"_s}) && waitForFocus(m_mainWindow));
        QVERIFY(keys(QStringList(target, u"Right"_s) << u"Return"_s));
        QTRY_COMPARE_WITH_TIMEOUT(launches().size(), 1, TimeoutMs);
        QCOMPARE(launches().constFirst().arguments, QStringList {game});
        QCOMPARE(QDir(launches().constFirst().workingFolder).canonicalPath(), QFileInfo(game).canonicalPath());
        QTest::qWait(500);
        QCOMPARE(launches().size(), 1);
    }

    void droppedExecutableIsAdded()
    {
        const int shownBefore = itemsShown();
        m_dragSource.setProcessEnvironment(m_environment);
        m_dragSource.start(QStringLiteral(BRIMVAULT_DESKTOP_HELPER), {u"drag"_s, m_dropped});
        const QPoint from = geometry(waitForWindow(u"^Brimvault drag source$"_s)).center();
        QVERIFY(!from.isNull() && !m_mainGeometry.contains(from));
        const QPoint to = listOrigin() + QPoint(400, 250);
        QVERIFY(moveTo(from) && xdotool({u"mousedown"_s, u"1"_s}));
        for (int step = 1; step <= 5; ++step)
            QVERIFY(moveTo(from + (to - from) * step / 5));
        QVERIFY(moveTo(to + QPoint(4, 4)) && xdotool({u"mouseup"_s, u"1"_s}));

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
        const qsizetype windowsBefore = programWindows().size();
        QVERIFY(moveTo(m_mainGeometry.topLeft() + QPoint(m_mainGeometry.width() - 32, 38))
            && xdotool({u"click"_s, u"1"_s}) && waitForFocus(m_mainWindow));
        QVERIFY(QTest::qWaitFor([&] { return programWindows().size() > windowsBefore; }, TimeoutMs));
        QVERIFY(keys({u"Down"_s, u"Down"_s, u"Down"_s, u"Return"_s}));
        // The dialog counts as there once it has the keyboard, so that no key goes to the window below.
        const QString dialog = waitForWindow(u"^Install game$"_s);
        QVERIFY2(!dialog.isEmpty() && waitForFocus(dialog), qPrintable(programErrors()));
        // The file name field has the focus: a typed full path and Return choose the package.
        QVERIFY(
            xdotool({u"type"_s, u"--delay"_s, u"60"_s, QDir::toNativeSeparators(m_package)}) && keys({u"Return"_s}));
        QTRY_VERIFY_WITH_TIMEOUT(QFile::exists(installedGame), TimeoutMs);
        // The service also raised the new-game signal: the window takes it within a few seconds and fills its
        // list once more, dropping the selection and any open menu. Later steps start after that.
        QTRY_COMPARE_WITH_TIMEOUT(
            GetSetting(AppTitle(), u"Commands"_s, u"NewGameInstalled"_s, u"0"_s), u"0"_s, TimeoutMs);
        QTRY_COMPARE_WITH_TIMEOUT(itemsShown(), shownBefore + 1, TimeoutMs);
    }

    void closingShowsTheDueAdvertisement()
    {
        QVERIFY(helper(u"close"_s, m_mainWindow));
        QTRY_VERIFY_WITH_TIMEOUT(!programWindows().contains(m_mainWindow), TimeoutMs);
        const QString advert = waitForWindow(u"^Advertising$"_s);
        QVERIFY2(!advert.isEmpty(), qPrintable(programErrors()));
        // The advertisement's own picture fills the window: its colour is at the centre.
        QTRY_VERIFY_WITH_TIMEOUT(
            near(screen().pixel(geometry(advert).center()), AdvertisementColour.rgb(), 30), TimeoutMs);
        QCOMPARE(m_program.state(), QProcess::Running);
        QVERIFY(helper(u"close"_s, advert));
        QTRY_COMPARE_WITH_TIMEOUT(m_program.state(), QProcess::NotRunning, TimeoutMs);
        QCOMPARE(m_program.exitStatus(), QProcess::NormalExit);
        QVERIFY2(m_program.exitCode() == 0, qPrintable(programErrors()));
    }
};

QTEST_MAIN(TestDesktopDrive)
#include "tst_desktopdrive.moc"

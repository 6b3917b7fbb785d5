// Start-up of the real program when something it reads is damaged: the settings, their folder, the data
// folders, the icon cache, the chosen language file, the component libraries and their registry. Each case
// runs build/bin/brimvault as a child process in a temporary tree and checks how it ended, what it said and
// that the user's files are as they were.
#include "ProgramRun.h"
#include "TestEnvironment.h"

#include "app/CompanionComponents.h"
#include "app/ComponentRegistry.h"
#include "catalogue/CatalogueLocations.h"
#include "catalogue/IconCacheKey.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QJsonArray>
#include <QRandomGenerator>
#include <QtTest>

#include <memory>

using namespace Brimvault;

namespace {

const QString adminMessage = QStringLiteral("You need to run the program as administrator!");
const QString peFixtures = QStringLiteral(BRIMVAULT_TEST_DATA_DIR "/pe");

// Bytes that no settings reader could take for text: NULs, bytes that are never UTF-8, and line ends, so
// that the damage spreads over many lines.
QByteArray binaryGarbage(qsizetype size)
{
    QRandomGenerator random(20261121);
    QByteArray bytes(size, Qt::Uninitialized);
    for (qsizetype i = 0; i < size; ++i)
        bytes[i] = char(random.bounded(256));
    for (qsizetype i = 0; i < size; i += 97)
        bytes[i] = '\0';
    bytes.append('\n');
    return bytes;
}

QString settingsText(const QString& section, const QString& key, const QString& value)
{
    return u'[' + section + QStringLiteral("]\n") + key + u'=' + value + u'\n';
}

// The settings as a user has them after adding one game by hand.
QByteArray addedGameSettings(const QString& gamePath)
{
    return (settingsText(QStringLiteral("Files"), QStringLiteral("Count"), QStringLiteral("1"))
        + QStringLiteral("File1=") + gamePath + u'\n')
        .toUtf8();
}

bool hasAdminMessageOnly(const ProgramOutcome& outcome)
{
    if (outcome.prompts.size() != 1)
        return false;
    const QJsonObject& prompt = outcome.prompts.first();
    return prompt.value(QStringLiteral("text")).toString() == adminMessage
        && prompt.value(QStringLiteral("title")).toString() == QStringLiteral("Brimvault")
        && prompt.value(QStringLiteral("icon")).toString() == QStringLiteral("critical")
        && prompt.value(QStringLiteral("buttons")).toString() == QStringLiteral("ok");
}

} // namespace

class TestDamagedEnvironment : public QObject {
    Q_OBJECT

private:
    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<ProgramFolderCopy> m_program;

    ProgramOutcome run(const ProgramRunOptions& options = {}) { return RunProgram(*m_env, m_program->path(), options); }

    // A game executable of the user's, outside every folder the program scans.
    QString userGame(const QString& name)
    {
        const QString path = m_env->path(QStringLiteral("personal/My Games/") + name);
        QDir().mkpath(QFileInfo(path).absolutePath());
        QFile::copy(peFixtures + QStringLiteral("/nores32.exe"), path);
        return path;
    }

    // The first start of an undamaged installation: components registered, versions and language stored.
    void startOnceUndamaged()
    {
        const ProgramOutcome outcome = run();
        QVERIFY2(outcome.finished && outcome.exitCode == 0 && outcome.window, qPrintable(outcome.describe()));
        QVERIFY2(outcome.prompts.isEmpty(), qPrintable(outcome.describe()));
    }

    // The window opened, said nothing and ended normally.
    static void verifyWindowShown(const ProgramOutcome& outcome)
    {
        QVERIFY2(outcome.finished && !outcome.crashed, qPrintable(outcome.describe()));
        QVERIFY2(outcome.window.has_value(), qPrintable(outcome.describe()));
        QVERIFY2(outcome.window->value(QStringLiteral("visible")).toBool(), qPrintable(outcome.describe()));
        QVERIFY2(outcome.prompts.isEmpty(), qPrintable(outcome.describe()));
        QCOMPARE(outcome.exitCode, 0);
    }

    // The single administrator message, no window, and an exit code that says the program did not run.
    static void verifyStoppedWithAdminMessage(const ProgramOutcome& outcome)
    {
        QVERIFY2(outcome.finished && !outcome.crashed, qPrintable(outcome.describe()));
        QVERIFY2(hasAdminMessageOnly(outcome), qPrintable(outcome.describe()));
        QVERIFY2(!outcome.window, qPrintable(outcome.describe()));
        QCOMPARE(outcome.exitCode, 1);
    }

private Q_SLOTS:
    void initTestCase()
    {
        QVERIFY2(QFileInfo::exists(QStringLiteral(BRIMVAULT_BIN_DIR "/brimvault")), "build the brimvault target");
        if (!QFileInfo::exists(peFixtures + QStringLiteral("/multi32.exe")))
            QSKIP("The PE fixtures need mingw-w64 and icoutils");
    }

    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_program = std::make_unique<ProgramFolderCopy>();
        QVERIFY(m_program->isValid());
    }

    void cleanup()
    {
        m_program.reset();
        m_env.reset();
    }

    void damagedSettingsFile_data();
    void damagedSettingsFile();
    void settingsFolderCannotBeMade_data();
    void settingsFolderCannotBeMade();
    void gamesFolderIsNotAFolder_data();
    void gamesFolderIsNotAFolder();
    void addedGameFileDamaged_data();
    void addedGameFileDamaged();
    void iconCacheCannotBeWritten_data();
    void iconCacheCannotBeWritten();
    void chosenLanguageFileDamaged_data();
    void chosenLanguageFileDamaged();
    void componentLibraryDamaged_data();
    void componentLibraryDamaged();
};

// Unreadable settings: storing the first component's version fails, which start-up answers with its one
// message. Readable but damaged settings: the damaged lines are kept as they are and the program runs.
void TestDamagedEnvironment::damagedSettingsFile_data()
{
    QTest::addColumn<QString>("damage");
    QTest::addColumn<bool>("runs");

    QTest::newRow("folder in the file's place") << QStringLiteral("folder") << false;
    QTest::newRow("named pipe in the file's place") << QStringLiteral("pipe") << false;
    QTest::newRow("settings folder is a file") << QStringLiteral("folder is a file") << false;
    QTest::newRow("folder in the lock file's place") << QStringLiteral("lock folder") << false;
    QTest::newRow("named pipe in the lock file's place") << QStringLiteral("lock pipe") << true;
    QTest::newRow("binary garbage before the sections") << QStringLiteral("garbage") << true;
    QTest::newRow("NUL bytes inside a value") << QStringLiteral("nul") << true;
    QTest::newRow("10 MB line") << QStringLiteral("long line") << true;
    QTest::newRow("invalid UTF-8") << QStringLiteral("invalid utf-8") << true;
    QTest::newRow("cut off in the middle of a line") << QStringLiteral("truncated") << true;
    QTest::newRow("link to the user's own file") << QStringLiteral("link") << true;
}

void TestDamagedEnvironment::damagedSettingsFile()
{
    QFETCH(QString, damage);
    QFETCH(bool, runs);

    const QString game = userGame(QStringLiteral("chess.exe"));
    const QByteArray intact = addedGameSettings(game);
    const QString settings = m_env->settingsFile();
    const QString settingsFolder = QFileInfo(settings).absolutePath();
    QString damaged = settings;
    QByteArray original;
    if (damage == QStringLiteral("folder is a file")) {
        QVERIFY(QDir(settingsFolder).removeRecursively());
        QVERIFY(WriteBytes(settingsFolder, intact));
        damaged = settingsFolder;
    } else if (damage == QStringLiteral("lock folder")) {
        damaged = settings + QStringLiteral(".lock");
        QVERIFY(QDir().mkpath(damaged));
    } else if (damage == QStringLiteral("lock pipe")) {
        QVERIFY(MakeNamedPipe(settings + QStringLiteral(".lock")));
        original = intact;
    } else if (damage == QStringLiteral("link")) {
        // Kept elsewhere by the user (a folder of dotfiles, say): written through, the link stays.
        original = intact;
        damaged = m_env->path(QStringLiteral("personal/dotfiles/Brimvault.ini"));
        QVERIFY(WriteBytes(damaged, original));
        QVERIFY(QFile::link(damaged, settings));
    } else if (damage == QStringLiteral("folder")) {
        QVERIFY(QDir().mkpath(settings));
        QVERIFY(WriteBytes(settings + QStringLiteral("/keep.txt"), intact));
    } else if (damage == QStringLiteral("pipe")) {
        QVERIFY(MakeNamedPipe(settings));
    } else if (damage == QStringLiteral("garbage")) {
        original = binaryGarbage(64 * 1024) + intact;
    } else if (damage == QStringLiteral("nul")) {
        original = intact + "[Settings]\nQuilletVersion=1" + QByteArray(1, '\0') + ".0\n";
    } else if (damage == QStringLiteral("long line")) {
        original = intact + "; " + QByteArray(10 * 1024 * 1024, 'x') + '\n';
    } else if (damage == QStringLiteral("invalid utf-8")) {
        original = "[FilesNames]\nFileName1=\xff\xfe\xc3(\x80\n" + intact;
    } else if (damage == QStringLiteral("truncated")) {
        original = intact + "[LocaleSettings]\nLngFileN";
    } else {
        QFAIL("unknown damage");
    }
    if (!original.isEmpty() && damaged == settings)
        QVERIFY(WriteBytes(settings, original));
    const QMap<QString, QByteArray> before = SnapshotTree(damaged);

    const ProgramOutcome outcome = run();

    if (!runs) {
        verifyStoppedWithAdminMessage(outcome);
        if (QTest::currentTestFailed())
            return;
        // The message box cannot say more; standard error names the place that failed.
        QVERIFY2(outcome.standardError.contains(settingsFolder), qPrintable(outcome.standardError));
        QCOMPARE(SnapshotTree(damaged), before);
        return;
    }
    verifyWindowShown(outcome);
    if (QTest::currentTestFailed())
        return;
    QVERIFY2(outcome.itemData().contains(game), qPrintable(outcome.describe()));
    // The program added its own values after the user's bytes and kept every one of them.
    QCOMPARE(QFileInfo(settings).isSymLink(), damaged != settings);
    const QByteArray after = ReadBytes(damaged);
    QVERIFY(after.size() > original.size());
    QVERIFY(after.startsWith(original));
    QCOMPARE(GetSetting(AppTitle(), QStringLiteral("Settings"), QStringLiteral("CorvelleVersion")),
        QStringLiteral(BRIMVAULT_VERSION));
}

void TestDamagedEnvironment::settingsFolderCannotBeMade_data()
{
    QTest::addColumn<QString>("location"); // relative to the test's tree; empty: as the system gives it
    QTest::addColumn<QStringList>("unset");
    QTest::addColumn<bool>("runs");
    QTest::addColumn<QString>("expectedFile"); // where the settings must then be, relative to the tree

    QTest::newRow("below a regular file") << QStringLiteral("blocker/settings") << QStringList() << false << QString();
    QTest::newRow("no HOME, folder given") << QStringLiteral("settings") << QStringList {QStringLiteral("HOME")} << true
                                           << QStringLiteral("settings/Brimvault.ini");
    QTest::newRow("no HOME, only XDG_CONFIG_HOME")
        << QString() << QStringList {QStringLiteral("HOME"), QStringLiteral("BRIMVAULT_SETTINGS_DIR")} << true
        << QStringLiteral("xdg-config/Brimvault/Brimvault.ini");
}

void TestDamagedEnvironment::settingsFolderCannotBeMade()
{
    QFETCH(QString, location);
    QFETCH(QStringList, unset);
    QFETCH(bool, runs);
    QFETCH(QString, expectedFile);

    const QString blocker = m_env->path(QStringLiteral("blocker"));
    QVERIFY(WriteBytes(blocker, "the user's own file\n"));
    ProgramRunOptions options;
    options.unsetEnvironment = unset;
    if (!location.isEmpty())
        options.setEnvironment.insert(QStringLiteral("BRIMVAULT_SETTINGS_DIR"), m_env->path(location));
    // Everything a program might derive from the home folder stays inside the tree.
    options.setEnvironment.insert(QStringLiteral("XDG_CONFIG_HOME"), m_env->path(QStringLiteral("xdg-config")));
    options.setEnvironment.insert(QStringLiteral("XDG_DATA_HOME"), m_env->path(QStringLiteral("xdg-data")));
    options.setEnvironment.insert(QStringLiteral("XDG_CACHE_HOME"), m_env->path(QStringLiteral("xdg-cache")));
    options.setEnvironment.insert(QStringLiteral("XDG_STATE_HOME"), m_env->path(QStringLiteral("xdg-state")));

    const ProgramOutcome outcome = run(options);

    QCOMPARE(ReadBytes(blocker), QByteArray("the user's own file\n"));
    if (!runs) {
        verifyStoppedWithAdminMessage(outcome);
        if (QTest::currentTestFailed())
            return;
        QVERIFY(!outcome.standardError.isEmpty());
        return;
    }
    verifyWindowShown(outcome);
    if (QTest::currentTestFailed())
        return;
    QVERIFY2(
        ReadBytes(m_env->path(expectedFile)).contains("QuilletVersion=" BRIMVAULT_VERSION), qPrintable(expectedFile));
}

// The other games are still shown; installing a package tells why it cannot be done.
void TestDamagedEnvironment::gamesFolderIsNotAFolder_data()
{
    QTest::addColumn<QString>("blocked"); // the path, relative to the tree, that is not a folder
    QTest::addColumn<bool>("pipe");

    QTest::newRow("games folder is a file") << QStringLiteral("commonappdata/Brimvault") << false;
    QTest::newRow("games folder is a named pipe") << QStringLiteral("commonappdata/Brimvault") << true;
    QTest::newRow("application data folder is a file") << QStringLiteral("commonappdata") << false;
}

void TestDamagedEnvironment::gamesFolderIsNotAFolder()
{
    QFETCH(QString, blocked);
    QFETCH(bool, pipe);

    const QString blockedPath = m_env->path(blocked);
    QVERIFY(QDir(blockedPath).removeRecursively());
    QVERIFY(pipe ? MakeNamedPipe(blockedPath) : WriteBytes(blockedPath, "not a folder\n"));
    const QString added = userGame(QStringLiteral("chess.exe"));
    QVERIFY(SaveSetting(AppTitle(), QStringLiteral("Files"), QStringLiteral("Count"), QStringLiteral("1")));
    QVERIFY(SaveSetting(AppTitle(), QStringLiteral("Files"), QStringLiteral("File1"), added));
    const QString solitaire = m_env->path(QStringLiteral("windows/sol.exe"));
    QVERIFY(QFile::copy(peFixtures + QStringLiteral("/nores32.exe"), solitaire));
    const QMap<QString, QByteArray> before = SnapshotTree(blockedPath);

    const ProgramOutcome outcome = run();

    verifyWindowShown(outcome);
    if (QTest::currentTestFailed())
        return;
    const QStringList data = outcome.itemData();
    QCOMPARE(data.size(), 3);
    QVERIFY2(data.first().startsWith(QStringLiteral("http://127.0.0.1:9/")), qPrintable(outcome.describe()));
    QVERIFY2(data.contains(solitaire), qPrintable(outcome.describe()));
    QVERIFY2(data.contains(added), qPrintable(outcome.describe()));

    const QString source = m_env->path(QStringLiteral("sources/Star Quest"));
    QVERIFY(QDir().mkpath(source));
    QVERIFY(QFile::copy(peFixtures + QStringLiteral("/multi32.exe"), source + QStringLiteral("/StarQuest.exe")));
    const QString package = m_env->path(QStringLiteral("StarQuest.bvxpak"));
    QString output;
    QCOMPARE(RunService({QStringLiteral("--pack"), source, package}, &output), 0);
    const int installed = RunService({QStringLiteral("-I"), package}, &output);
    QVERIFY2(installed > 0, qPrintable(output));
    QVERIFY2(output.contains(QStringLiteral("cannot be created")), qPrintable(output));
    QCOMPARE(SnapshotTree(blockedPath), before);
    QCOMPARE(
        GetSetting(AppTitle(), QStringLiteral("Commands"), QStringLiteral("NewGameInstalled"), QStringLiteral("0")),
        QStringLiteral("0"));
}

// A game added by hand whose file is gone or damaged is still listed, with the no-icon picture.
void TestDamagedEnvironment::addedGameFileDamaged_data()
{
    QTest::addColumn<QString>("damage");

    QTest::newRow("file removed") << QStringLiteral("removed");
    QTest::newRow("empty file") << QStringLiteral("empty");
    QTest::newRow("binary garbage") << QStringLiteral("garbage");
    QTest::newRow("folder in its place") << QStringLiteral("folder");
    QTest::newRow("named pipe in its place") << QStringLiteral("pipe");
}

void TestDamagedEnvironment::addedGameFileDamaged()
{
    QFETCH(QString, damage);

    const QString game = userGame(QStringLiteral("chess.exe"));
    QVERIFY(QFile::remove(game));
    if (damage == QStringLiteral("empty"))
        QVERIFY(WriteBytes(game, QByteArray()));
    else if (damage == QStringLiteral("garbage"))
        QVERIFY(WriteBytes(game, "MZ" + binaryGarbage(8192)));
    else if (damage == QStringLiteral("folder"))
        QVERIFY(QDir().mkpath(game));
    else if (damage == QStringLiteral("pipe"))
        QVERIFY(MakeNamedPipe(game));
    QVERIFY(WriteBytes(m_env->settingsFile(), addedGameSettings(game)));
    const QMap<QString, QByteArray> before = SnapshotTree(m_env->path(QStringLiteral("personal")));

    const ProgramOutcome outcome = run();

    verifyWindowShown(outcome);
    if (QTest::currentTestFailed())
        return;
    QCOMPARE(outcome.pictureOf(game), QStringLiteral("no-icon"));
    QCOMPARE(outcome.captions().value(outcome.itemData().indexOf(game)), QStringLiteral("chess"));
    QCOMPARE(SnapshotTree(m_env->path(QStringLiteral("personal"))), before);
}

// Every queued icon is made once, from the executable when the cache cannot be used, and the queue empties.
void TestDamagedEnvironment::iconCacheCannotBeWritten_data()
{
    QTest::addColumn<QString>("damage");
    QTest::addColumn<bool>("cacheKept"); // whatever stood in the cache's place is still there, unchanged

    QTest::newRow("cache folder is a file") << QStringLiteral("folder is a file") << true;
    QTest::newRow("cache folder is a named pipe") << QStringLiteral("folder is a pipe") << true;
    QTest::newRow("cache folder links through a file") << QStringLiteral("link through a file") << true;
    QTest::newRow("cache file is a named pipe") << QStringLiteral("cache file is a pipe") << true;
    QTest::newRow("cache file is a folder") << QStringLiteral("cache file is a folder") << true;
    QTest::newRow("cache file links to a user's file") << QStringLiteral("cache file is a link") << true;
    QTest::newRow("cache file is garbage") << QStringLiteral("cache file is garbage") << false;
}

void TestDamagedEnvironment::iconCacheCannotBeWritten()
{
    QFETCH(QString, damage);
    QFETCH(bool, cacheKept);

    const QString games = DataFolders::GamesFolder();
    const QString withIcon = games + QStringLiteral("Arcade/Arcade.exe");
    const QString withoutIcon = games + QStringLiteral("Plain/Plain.exe");
    QVERIFY(QDir().mkpath(games + QStringLiteral("Arcade")));
    QVERIFY(QDir().mkpath(games + QStringLiteral("Plain")));
    QVERIFY(QFile::copy(peFixtures + QStringLiteral("/multi32.exe"), withIcon));
    QVERIFY(QFile::copy(peFixtures + QStringLiteral("/nores32.exe"), withoutIcon));

    const QString icons = QDir::cleanPath(DataFolders::IconsFolder());
    const QString cacheFile = FileSystemPath(IconCacheFile(DataFolders::IconsFolder(), withIcon));
    const QString notes = m_env->path(QStringLiteral("personal/notes.txt"));
    if (damage == QStringLiteral("folder is a file")) {
        QVERIFY(WriteBytes(icons, "not a folder\n"));
    } else if (damage == QStringLiteral("folder is a pipe")) {
        QVERIFY(MakeNamedPipe(icons));
    } else if (damage == QStringLiteral("link through a file")) {
        QVERIFY(WriteBytes(m_env->path(QStringLiteral("blocker")), "a file\n"));
        QVERIFY(QFile::link(m_env->path(QStringLiteral("blocker/Icons")), icons));
    } else if (damage == QStringLiteral("cache file is a pipe")) {
        QVERIFY(QDir().mkpath(icons));
        QVERIFY(MakeNamedPipe(cacheFile));
    } else if (damage == QStringLiteral("cache file is a link")) {
        QVERIFY(QDir().mkpath(icons));
        QVERIFY(WriteBytes(notes, "my notes\n"));
        QVERIFY(QFile::link(notes, cacheFile));
    } else if (damage == QStringLiteral("cache file is a folder")) {
        QVERIFY(QDir().mkpath(cacheFile));
    } else if (damage == QStringLiteral("cache file is garbage")) {
        QVERIFY(WriteBytes(cacheFile, binaryGarbage(4096)));
    } else {
        QFAIL("unknown damage");
    }
    const QMap<QString, QByteArray> before = SnapshotTree(icons);

    const ProgramOutcome outcome = run();

    verifyWindowShown(outcome);
    if (QTest::currentTestFailed())
        return;
    QCOMPARE(outcome.pictureOf(withIcon), QStringLiteral("picture"));
    QCOMPARE(outcome.pictureOf(withoutIcon), QStringLiteral("no-icon"));
    if (cacheKept)
        QCOMPARE(SnapshotTree(icons), before);
    else
        QVERIFY(ReadBytes(cacheFile).startsWith(QByteArray("\0\0\1\0", 4)));
    if (QFileInfo::exists(notes))
        QCOMPARE(ReadBytes(notes), QByteArray("my notes\n"));
    QVERIFY(!QFileInfo::exists(FileSystemPath(IconCacheFile(DataFolders::IconsFolder(), withoutIcon))));
}

// The stored language applies when its file is usable; otherwise the built-in English texts, silently, and
// the stored choice stays as it is.
void TestDamagedEnvironment::chosenLanguageFileDamaged_data()
{
    QTest::addColumn<QString>("damage");
    QTest::addColumn<bool>("english");

    QTest::newRow("intact") << QStringLiteral("intact") << false;
    QTest::newRow("removed") << QStringLiteral("removed") << true;
    QTest::newRow("empty") << QStringLiteral("empty") << true;
    QTest::newRow("binary garbage") << QStringLiteral("garbage") << true;
    QTest::newRow("folder in its place") << QStringLiteral("folder") << true;
    QTest::newRow("named pipe in its place") << QStringLiteral("pipe") << true;
    QTest::newRow("a text number twice") << QStringLiteral("repeated number") << true;
    QTest::newRow("no character set") << QStringLiteral("no charset") << true;
    QTest::newRow("larger than any language file") << QStringLiteral("huge") << true;
}

void TestDamagedEnvironment::chosenLanguageFileDamaged()
{
    QFETCH(QString, damage);
    QFETCH(bool, english);

    startOnceUndamaged();
    if (QTest::currentTestFailed())
        return;
    QVERIFY(SaveSetting(AppTitle(), QStringLiteral("LocaleSettings"), QStringLiteral("LngFileName"),
        QStringLiteral("Brimvault_Russian.lng")));
    QVERIFY(
        SaveSetting(AppTitle(), QStringLiteral("LocaleSettings"), QStringLiteral("LngNik"), QStringLiteral("RUSSIAN")));

    const QString file = m_program->filePath(QStringLiteral("Brimvault_Russian.lng"));
    const QByteArray russian = ReadBytes(file);
    const QByteArray header = "#language=Russian\r\n#charset=204\r\n";
    if (damage != QStringLiteral("intact"))
        QVERIFY(QFile::remove(file));
    if (damage == QStringLiteral("empty"))
        QVERIFY(WriteBytes(file, QByteArray()));
    else if (damage == QStringLiteral("garbage"))
        QVERIFY(WriteBytes(file, binaryGarbage(32 * 1024)));
    else if (damage == QStringLiteral("folder"))
        QVERIFY(QDir().mkpath(file));
    else if (damage == QStringLiteral("pipe"))
        QVERIFY(MakeNamedPipe(file));
    else if (damage == QStringLiteral("repeated number"))
        QVERIFY(WriteBytes(file, russian + "\r\n@1010=\xc4\xe5\xe9\xf1\xf2\xe2\xe8\xff\r\n"));
    else if (damage == QStringLiteral("no charset"))
        QVERIFY(WriteBytes(file, QByteArray(russian).replace("#charset=204", "; no charset")));
    else if (damage == QStringLiteral("huge"))
        QVERIFY(WriteBytes(file, header + QByteArray(17 * 1024 * 1024, ';')));
    const QMap<QString, QByteArray> settingsBefore = SnapshotTree(m_env->path(QStringLiteral("settings")));

    const ProgramOutcome outcome = run();

    verifyWindowShown(outcome);
    if (QTest::currentTestFailed())
        return;
    const QString actions = outcome.window->value(QStringLiteral("actions")).toString();
    const QString online = outcome.captions().value(0);
    const QJsonArray menu = outcome.window->value(QStringLiteral("menu")).toArray();
    QCOMPARE(actions == QStringLiteral("Actions"), english);
    QCOMPARE(online == QStringLiteral("Online games"), english);
    QCOMPARE(menu.contains(QStringLiteral("Add game file...")), english);
    QCOMPARE(outcome.window->value(QStringLiteral("title")).toString(), QStringLiteral("Brimvault"));
    QCOMPARE(SnapshotTree(m_env->path(QStringLiteral("settings"))), settingsBefore);
}

// A registry entry that names a missing or broken library is repaired by registering the file beside the
// program; when that file is broken too, registration fails with the one message and no window.
void TestDamagedEnvironment::componentLibraryDamaged_data()
{
    QTest::addColumn<QString>("registry"); // what the registry names for Velloran, or how the registry is damaged
    QTest::addColumn<QString>("library"); // what lies beside the program as Velloran's file
    QTest::addColumn<bool>("runs");
    QTest::addColumn<QString>("failing"); // the component named on standard error when the program stops

    const QString beside = QStringLiteral("file beside the program");
    QTest::newRow("registered file deleted")
        << QStringLiteral("deleted") << QStringLiteral("intact") << true << QString();
    QTest::newRow("registered file is text") << QStringLiteral("text") << QStringLiteral("intact") << true << QString();
    QTest::newRow("registered file cut off")
        << QStringLiteral("truncated") << QStringLiteral("intact") << true << QString();
    QTest::newRow("registry is garbage") << QStringLiteral("garbage registry") << QStringLiteral("intact") << true
                                         << QString();
    QTest::newRow("registry is a named pipe")
        << QStringLiteral("pipe registry") << QStringLiteral("intact") << false << QStringLiteral("Quillet");
    QTest::newRow("library deleted") << beside << QStringLiteral("deleted") << false << QStringLiteral("Velloran");
    QTest::newRow("library is text") << beside << QStringLiteral("text") << false << QStringLiteral("Velloran");
    QTest::newRow("library is empty") << beside << QStringLiteral("empty") << false << QStringLiteral("Velloran");
    QTest::newRow("library cut off at 2%")
        << beside << QStringLiteral("truncated 2") << false << QStringLiteral("Velloran");
    QTest::newRow("library cut off at 50%")
        << beside << QStringLiteral("truncated 50") << false << QStringLiteral("Velloran");
    QTest::newRow("library cut off at 95%")
        << beside << QStringLiteral("truncated 95") << false << QStringLiteral("Velloran");
    QTest::newRow("library without DllRegisterServer")
        << beside << QStringLiteral("no entry point") << false << QStringLiteral("Velloran");
    QTest::newRow("folder in the library's place")
        << beside << QStringLiteral("folder") << false << QStringLiteral("Velloran");
    QTest::newRow("named pipe in the library's place")
        << beside << QStringLiteral("pipe") << false << QStringLiteral("Velloran");
    QTest::newRow("registered file deleted, library cut off")
        << QStringLiteral("deleted") << QStringLiteral("truncated 50") << false << QStringLiteral("Velloran");
}

void TestDamagedEnvironment::componentLibraryDamaged()
{
    QFETCH(QString, registry);
    QFETCH(QString, library);
    QFETCH(bool, runs);
    QFETCH(QString, failing);

    startOnceUndamaged();
    if (QTest::currentTestFailed())
        return;
    const QString progId = QStringLiteral("Velloran.clsVersion");
    const QString velloran = m_program->filePath(CompanionComponentFile(QStringLiteral("Velloran")));
    const QByteArray realLibrary = ReadBytes(velloran);
    QVERIFY(!realLibrary.isEmpty());

    const QString elsewhere
        = m_env->path(QStringLiteral("elsewhere/") + CompanionComponentFile(QStringLiteral("Velloran")));
    QByteArray registryBytes;
    if (registry == QStringLiteral("deleted")) {
        QVERIFY(RegisterProgIds({progId}, elsewhere));
    } else if (registry == QStringLiteral("text")) {
        QVERIFY(WriteBytes(elsewhere, "not a library\n"));
        QVERIFY(RegisterProgIds({progId}, elsewhere));
    } else if (registry == QStringLiteral("truncated")) {
        QVERIFY(WriteBytes(elsewhere, realLibrary.left(realLibrary.size() / 2)));
        QVERIFY(RegisterProgIds({progId}, elsewhere));
    } else if (registry == QStringLiteral("garbage registry")) {
        registryBytes = binaryGarbage(8192);
        QVERIFY(WriteBytes(ComponentRegistryPath(), registryBytes));
    } else if (registry == QStringLiteral("pipe registry")) {
        QVERIFY(QFile::remove(ComponentRegistryPath()));
        QVERIFY(MakeNamedPipe(ComponentRegistryPath()));
    }

    if (library != QStringLiteral("intact"))
        QVERIFY(QFile::remove(velloran));
    if (library == QStringLiteral("text"))
        QVERIFY(WriteBytes(velloran,
            "\x7f"
            "ELF but nothing more\n"));
    else if (library == QStringLiteral("empty"))
        QVERIFY(WriteBytes(velloran, QByteArray()));
    else if (library.startsWith(QStringLiteral("truncated ")))
        QVERIFY(WriteBytes(velloran, realLibrary.left(realLibrary.size() * library.mid(10).toInt() / 100)));
    else if (library == QStringLiteral("no entry point"))
        QVERIFY(QFile::copy(
            QStringLiteral(BRIMVAULT_FIXTURE_DIR "/NoEntryPoint/") + CompanionComponentFile(QStringLiteral("Velloran")),
            velloran));
    else if (library == QStringLiteral("folder"))
        QVERIFY(QDir().mkpath(velloran));
    else if (library == QStringLiteral("pipe"))
        QVERIFY(MakeNamedPipe(velloran));
    const QByteArray settingsBefore = ReadBytes(m_env->settingsFile());

    const ProgramOutcome outcome = run();

    // Versions only change when a component changes: the user's settings stay as they were either way.
    QCOMPARE(ReadBytes(m_env->settingsFile()), settingsBefore);
    if (!runs) {
        verifyStoppedWithAdminMessage(outcome);
        if (QTest::currentTestFailed())
            return;
        QVERIFY2(outcome.standardError.contains(failing + QStringLiteral(" cannot be made usable")),
            qPrintable(outcome.standardError));
        return;
    }
    verifyWindowShown(outcome);
    if (QTest::currentTestFailed())
        return;
    QCOMPARE(RegisteredLibrary(progId), QFileInfo(velloran).absoluteFilePath());
    if (!registryBytes.isEmpty())
        QVERIFY(ReadBytes(ComponentRegistryPath()).startsWith(registryBytes));
}

QTEST_GUILESS_MAIN(TestDamagedEnvironment)
#include "tst_damagedenvironment.moc"

// Start-up of the real program when something it reads is damaged: the settings, their folder, the data
// folders, the icon cache, the chosen language file, the component libraries and their registry. Each case
// runs the program as a child process in a temporary tree and checks how it ended, what it said and that the
// user's files are as they were.
#include "PeFixtures.h"
#include "ProgramRun.h"
#include "TestEnvironment.h"
#include "TestFiles.h"

#include "app/CompanionComponents.h"
#include "app/ComponentRegistry.h"
#include "catalogue/CatalogueLocations.h"
#include "catalogue/IconCacheKey.h"
#include "store/DataFolders.h"
#include "store/SettingsStore.h"

#include <QJsonArray>
#include <QtTest>

#include <memory>

using namespace Brimvault;

namespace {

// Bytes no reader could take for text, with NULs and line ends spread through them.
QByteArray garbage(qsizetype size)
{
    return RandomBytes(size, 20261121) + '\n';
}

// Puts a damaged thing at path: "removed", "empty", "garbage", "text", "folder", "pipe", "truncated N" (the
// first N percent of `real`), or "intact".
bool damage(const QString& path, const QString& how, const QByteArray& real = {})
{
    if (how == QStringLiteral("intact"))
        return true;
    QFile::remove(path);
    QDir(path).removeRecursively();
    if (how == QStringLiteral("empty"))
        return WriteFile(path, {});
    if (how == QStringLiteral("garbage"))
        return WriteFile(path, "MZ" + garbage(8192));
    if (how == QStringLiteral("text"))
        return WriteFile(path,
            "\x7f"
            "ELF but nothing more\n");
    if (how == QStringLiteral("folder"))
        return QDir().mkpath(path);
    if (how == QStringLiteral("pipe"))
        return MakeNamedPipe(path);
    if (how.startsWith(QStringLiteral("truncated ")))
        return WriteFile(path, real.left(real.size() * how.mid(10).toInt() / 100));
    return how == QStringLiteral("removed");
}

// The entry at path and everything below it, as SnapshotTree shows them.
QMap<QString, QByteArray> snapshotOf(const QString& path)
{
    const QFileInfo info(path);
    const QMap<QString, QByteArray> all = SnapshotTree(info.absolutePath());
    QMap<QString, QByteArray> entry;
    for (auto it = all.cbegin(); it != all.cend(); ++it) {
        if (it.key() == info.fileName() || it.key().startsWith(info.fileName() + u'/'))
            entry.insert(it.key(), it.value());
    }
    return entry;
}

// The settings as a user has them after adding one game by hand.
QByteArray addedGameSettings(const QString& gamePath)
{
    return "[Files]\nCount=1\nFile1=" + gamePath.toUtf8() + '\n';
}

QString setting(const QString& section, const QString& key)
{
    return GetSetting(AppTitle(), section, key);
}

} // namespace

#define VERIFY_OUTCOME(condition, outcome) QVERIFY2(condition, qPrintable((outcome).describe()))

class TestDamagedEnvironment : public QObject {
    Q_OBJECT

    std::unique_ptr<TestEnvironment> m_env;
    std::unique_ptr<ProgramFolderCopy> m_program;

    ProgramOutcome run(const ProgramRunOptions& options = {}) { return RunProgram(*m_env, m_program->path(), options); }

    // A game executable of the user's, outside every folder the program scans.
    QString userGame()
    {
        const QString path = m_env->path(QStringLiteral("personal/My Games/chess.exe"));
        QDir().mkpath(QFileInfo(path).absolutePath());
        QFile::copy(PeFixture(QStringLiteral("nores32.exe")), path);
        return path;
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_program = std::make_unique<ProgramFolderCopy>();
        QVERIFY(m_program->isValid());
        QVERIFY(!PeFixture(QStringLiteral("multi32.exe")).isEmpty());
    }

    void cleanup()
    {
        m_program.reset();
        m_env.reset();
    }

    // Unreadable settings: storing the first component's version fails, which start-up answers with its one
    // message. Readable but damaged settings: the damaged lines are kept as they are and the program runs.
    void damagedSettingsFile_data()
    {
        QTest::addColumn<QString>("damage");
        QTest::addColumn<QByteArray>("before"); // written before and after the intact settings
        QTest::addColumn<QByteArray>("after");
        QTest::addColumn<bool>("runs");

        const QByteArray none;
        QTest::newRow("folder in the file's place") << QStringLiteral("folder") << none << none << false;
        QTest::newRow("named pipe in the file's place") << QStringLiteral("pipe") << none << none << false;
        QTest::newRow("settings folder is a file") << QStringLiteral("folder is a file") << none << none << false;
        QTest::newRow("folder in the lock file's place") << QStringLiteral("lock folder") << none << none << false;
        QTest::newRow("named pipe in the lock file's place") << QStringLiteral("lock pipe") << none << none << true;
        QTest::newRow("link to the user's own file") << QStringLiteral("link") << none << none << true;
        QTest::newRow("binary garbage before the sections") << QString() << garbage(64 * 1024) << none << true;
        QTest::newRow("NUL bytes inside a value")
            << QString() << none << QByteArray("[Settings]\nQuilletVersion=1") + '\0' + ".0\n"
            << true;
        QTest::newRow("10 MB line") << QString() << none << "; " + QByteArray(10 * 1024 * 1024, 'x') + '\n' << true;
        QTest::newRow("invalid UTF-8") << QString() << QByteArray("[FilesNames]\nFileName1=\xff\xfe\xc3(\x80\n") << none
                                       << true;
        QTest::newRow("cut off in the middle of a line")
            << QString() << none << QByteArray("[LocaleSettings]\nLngFileN") << true;
    }

    void damagedSettingsFile()
    {
        QFETCH(QString, damage);
        QFETCH(QByteArray, before);
        QFETCH(QByteArray, after);
        QFETCH(bool, runs);

        const QString game = userGame();
        const QByteArray intact = addedGameSettings(game);
        const QString settings = m_env->settingsFile();
        const QString folder = QFileInfo(settings).absolutePath();
        QString damaged = settings; // the entry that must be as it was, or keep the user's bytes first
        QByteArray original = before + intact + after;
        if (damage == QStringLiteral("folder is a file")) {
            QVERIFY(QDir(folder).removeRecursively() && WriteFile(folder, intact));
            damaged = folder;
        } else if (damage == QStringLiteral("lock folder")) {
            damaged = settings + QStringLiteral(".lock");
            QVERIFY(QDir().mkpath(damaged));
        } else if (damage == QStringLiteral("link")) {
            // Kept elsewhere by the user (a folder of dotfiles, say): written through, the link stays.
            damaged = m_env->path(QStringLiteral("personal/dotfiles/Brimvault.ini"));
            QVERIFY(WriteFile(damaged, original) && QFile::link(damaged, settings));
        } else if (damage == QStringLiteral("folder")) {
            QVERIFY(WriteFile(settings + QStringLiteral("/keep.txt"), intact));
        } else if (damage == QStringLiteral("pipe")) {
            QVERIFY(MakeNamedPipe(settings));
        } else {
            if (damage == QStringLiteral("lock pipe"))
                QVERIFY(MakeNamedPipe(settings + QStringLiteral(".lock")));
            QVERIFY(WriteFile(settings, original));
        }
        const QMap<QString, QByteArray> untouched = snapshotOf(damaged);

        const ProgramOutcome outcome = run();

        if (!runs) {
            VERIFY_OUTCOME(outcome.stoppedWithAdminMessage(), outcome);
            // The message box cannot say more; standard error names the place that failed.
            VERIFY_OUTCOME(outcome.standardError.contains(folder), outcome);
            QCOMPARE(snapshotOf(damaged), untouched);
            return;
        }
        VERIFY_OUTCOME(outcome.showedWindow() && outcome.items(QStringLiteral("data")).contains(game), outcome);
        // The program added its own values after the user's bytes and kept every one of them.
        QCOMPARE(QFileInfo(settings).isSymLink(), damage == QStringLiteral("link"));
        const QByteArray written = ReadFile(damaged);
        QVERIFY(written.size() > original.size() && written.startsWith(original));
        QCOMPARE(
            setting(QStringLiteral("Settings"), QStringLiteral("CorvelleVersion")), QStringLiteral(BRIMVAULT_VERSION));
    }

    void settingsFolderCannotBeMade_data()
    {
        QTest::addColumn<QString>("location"); // relative to the test's tree; empty: as the system gives it
        QTest::addColumn<QStringList>("unset");
        QTest::addColumn<QString>("expectedFile"); // where the settings must then be; empty: the program stops

        QTest::newRow("below a regular file") << QStringLiteral("blocker/settings") << QStringList() << QString();
        QTest::newRow("no HOME, folder given") << QStringLiteral("settings") << QStringList {QStringLiteral("HOME")}
                                               << QStringLiteral("settings/Brimvault.ini");
        QTest::newRow("no HOME, only XDG_CONFIG_HOME")
            << QString() << QStringList {QStringLiteral("HOME"), QStringLiteral("BRIMVAULT_SETTINGS_DIR")}
            << QStringLiteral("xdg-config/Brimvault/Brimvault.ini");
    }

    void settingsFolderCannotBeMade()
    {
        QFETCH(QString, location);
        QFETCH(QStringList, unset);
        QFETCH(QString, expectedFile);

        const QString blocker = m_env->path(QStringLiteral("blocker"));
        QVERIFY(WriteFile(blocker, "the user's own file\n"));
        ProgramRunOptions options;
        options.unsetEnvironment = unset;
        if (!location.isEmpty())
            options.setEnvironment.insert(QStringLiteral("BRIMVAULT_SETTINGS_DIR"), m_env->path(location));
        // Everything a program might derive from the home folder stays inside the tree.
        for (const char* kind : {"CONFIG", "DATA", "CACHE", "STATE"}) {
            options.setEnvironment.insert(QStringLiteral("XDG_%1_HOME").arg(QLatin1String(kind)),
                m_env->path(QStringLiteral("xdg-") + QString::fromLatin1(kind).toLower()));
        }

        const ProgramOutcome outcome = run(options);

        QCOMPARE(ReadFile(blocker), QByteArray("the user's own file\n"));
        if (expectedFile.isEmpty()) {
            VERIFY_OUTCOME(outcome.stoppedWithAdminMessage() && !outcome.standardError.isEmpty(), outcome);
            return;
        }
        VERIFY_OUTCOME(outcome.showedWindow(), outcome);
        QVERIFY2(ReadFile(m_env->path(expectedFile)).contains("QuilletVersion=" BRIMVAULT_VERSION),
            qPrintable(expectedFile));
    }

    // The other games are still shown; installing a package tells why it cannot be done.
    void gamesFolderIsNotAFolder_data()
    {
        QTest::addColumn<QString>("blocked"); // the path, relative to the tree, that is not a folder
        QTest::addColumn<QString>("damage");

        QTest::newRow("games folder is a file") << QStringLiteral("commonappdata/Brimvault") << QStringLiteral("text");
        QTest::newRow("games folder is a named pipe")
            << QStringLiteral("commonappdata/Brimvault") << QStringLiteral("pipe");
        QTest::newRow("application data folder is a file") << QStringLiteral("commonappdata") << QStringLiteral("text");
    }

    void gamesFolderIsNotAFolder()
    {
        QFETCH(QString, blocked);
        QFETCH(QString, damage);

        const QString blockedPath = m_env->path(blocked);
        QVERIFY(::damage(blockedPath, damage));
        const QString added = userGame();
        QVERIFY(WriteFile(m_env->settingsFile(), addedGameSettings(added)));
        const QString solitaire = m_env->path(QStringLiteral("windows/sol.exe"));
        QVERIFY(QFile::copy(PeFixture(QStringLiteral("nores32.exe")), solitaire));
        const QMap<QString, QByteArray> untouched = snapshotOf(blockedPath);

        const ProgramOutcome outcome = run();

        const QStringList data = outcome.items(QStringLiteral("data"));
        VERIFY_OUTCOME(outcome.showedWindow() && data.size() == 3, outcome);
        VERIFY_OUTCOME(data.first().startsWith(QStringLiteral("http://127.0.0.1:9/")), outcome);
        VERIFY_OUTCOME(data.contains(solitaire) && data.contains(added), outcome);

        const QString source = m_env->path(QStringLiteral("sources/Star Quest/StarQuest.exe"));
        QVERIFY(WriteFile(source, ReadFile(PeFixture(QStringLiteral("multi32.exe")))));
        const QString package = m_env->path(QStringLiteral("StarQuest.bvxpak"));
        QString output;
        QCOMPARE(RunService({QStringLiteral("--pack"), QFileInfo(source).absolutePath(), package}, &output), 0);
        QVERIFY2(RunService({QStringLiteral("-I"), package}, &output) > 0, qPrintable(output));
        QVERIFY2(output.contains(QStringLiteral("cannot be created")), qPrintable(output));
        QCOMPARE(snapshotOf(blockedPath), untouched);
        QCOMPARE(
            GetSetting(AppTitle(), QStringLiteral("Commands"), QStringLiteral("NewGameInstalled"), QStringLiteral("0")),
            QStringLiteral("0"));
    }

    // A game added by hand whose file is gone or damaged is still listed, with the no-icon picture.
    void addedGameFileDamaged_data()
    {
        QTest::addColumn<QString>("damage");
        for (const char* damage : {"removed", "empty", "garbage", "folder", "pipe"})
            QTest::newRow(damage) << QString::fromLatin1(damage);
    }

    void addedGameFileDamaged()
    {
        QFETCH(QString, damage);

        const QString game = userGame();
        QVERIFY(::damage(game, damage));
        QVERIFY(WriteFile(m_env->settingsFile(), addedGameSettings(game)));
        const QMap<QString, QByteArray> untouched = SnapshotTree(m_env->path(QStringLiteral("personal")));

        const ProgramOutcome outcome = run();

        VERIFY_OUTCOME(outcome.showedWindow(), outcome);
        const qsizetype index = outcome.items(QStringLiteral("data")).indexOf(game);
        QCOMPARE(outcome.items(QStringLiteral("picture")).value(index), QStringLiteral("no-icon"));
        QCOMPARE(outcome.items(QStringLiteral("caption")).value(index), QStringLiteral("chess"));
        QCOMPARE(SnapshotTree(m_env->path(QStringLiteral("personal"))), untouched);
    }

    // Every queued icon is made once, from the executable when the cache cannot be used, and the queue empties.
    void iconCacheCannotBeWritten_data()
    {
        QTest::addColumn<QString>("damage");
        for (const char* damage : {"folder is a file", "folder is a pipe", "folder links through a file",
                 "cache file is a pipe", "cache file is a folder", "cache file is a link", "cache file is garbage"})
            QTest::newRow(damage) << QString::fromLatin1(damage);
    }

    void iconCacheCannotBeWritten()
    {
        QFETCH(QString, damage);

        const QString withIcon = DataFolders::GamesFolder() + QStringLiteral("Arcade/Arcade.exe");
        const QString withoutIcon = DataFolders::GamesFolder() + QStringLiteral("Plain/Plain.exe");
        QVERIFY(WriteFile(withIcon, ReadFile(PeFixture(QStringLiteral("multi32.exe")))));
        QVERIFY(WriteFile(withoutIcon, ReadFile(PeFixture(QStringLiteral("nores32.exe")))));
        const QString icons = QDir::cleanPath(DataFolders::IconsFolder());
        const QString cacheFile = FileSystemPath(IconCacheFile(DataFolders::IconsFolder(), withIcon));
        const QString notes = m_env->path(QStringLiteral("personal/notes.txt"));
        QVERIFY(WriteFile(notes, "my notes\n") && WriteFile(m_env->path(QStringLiteral("blocker")), "a file\n"));
        if (damage == QStringLiteral("folder is a file"))
            QVERIFY(WriteFile(icons, "not a folder\n"));
        else if (damage == QStringLiteral("folder is a pipe"))
            QVERIFY(MakeNamedPipe(icons));
        else if (damage == QStringLiteral("folder links through a file"))
            QVERIFY(QFile::link(m_env->path(QStringLiteral("blocker/Icons")), icons));
        else if (damage == QStringLiteral("cache file is a pipe"))
            QVERIFY(MakeNamedPipe(cacheFile));
        else if (damage == QStringLiteral("cache file is a folder"))
            QVERIFY(QDir().mkpath(cacheFile));
        else if (damage == QStringLiteral("cache file is a link"))
            QVERIFY(QDir().mkpath(icons) && QFile::link(notes, cacheFile));
        else
            QVERIFY(WriteFile(cacheFile, garbage(4096)));
        const QMap<QString, QByteArray> untouched = snapshotOf(icons);

        const ProgramOutcome outcome = run();

        VERIFY_OUTCOME(outcome.showedWindow(), outcome);
        const QStringList data = outcome.items(QStringLiteral("data"));
        const QStringList pictures = outcome.items(QStringLiteral("picture"));
        QCOMPARE(pictures.value(data.indexOf(withIcon)), QStringLiteral("picture"));
        QCOMPARE(pictures.value(data.indexOf(withoutIcon)), QStringLiteral("no-icon"));
        if (damage == QStringLiteral("cache file is garbage"))
            QVERIFY(ReadFile(cacheFile).startsWith(QByteArray("\0\0\1\0", 4)));
        else
            QCOMPARE(snapshotOf(icons), untouched);
        QCOMPARE(ReadFile(notes), QByteArray("my notes\n"));
        QVERIFY(!QFileInfo::exists(FileSystemPath(IconCacheFile(DataFolders::IconsFolder(), withoutIcon))));
    }

    // The stored language applies when its file is usable; otherwise the built-in English texts, silently, and
    // the stored choice stays as it is.
    void chosenLanguageFileDamaged_data()
    {
        QTest::addColumn<QString>("damage");
        for (const char* damage :
            {"intact", "removed", "empty", "garbage", "folder", "pipe", "repeated number", "no charset", "huge"})
            QTest::newRow(damage) << QString::fromLatin1(damage);
    }

    void chosenLanguageFileDamaged()
    {
        QFETCH(QString, damage);

        const ProgramOutcome first = run();
        VERIFY_OUTCOME(first.showedWindow(), first);
        QVERIFY(SaveSetting(AppTitle(), QStringLiteral("LocaleSettings"), QStringLiteral("LngFileName"),
            QStringLiteral("Brimvault_Russian.lng")));
        QVERIFY(SaveSetting(
            AppTitle(), QStringLiteral("LocaleSettings"), QStringLiteral("LngNik"), QStringLiteral("RUSSIAN")));
        const QString file = m_program->filePath(QStringLiteral("Brimvault_Russian.lng"));
        const QByteArray russian = ReadFile(file);
        if (damage == QStringLiteral("repeated number"))
            QVERIFY(WriteFile(file, russian + "\r\n@1010=\xc4\xe5\xe9\xf1\xf2\xe2\xe8\xff\r\n"));
        else if (damage == QStringLiteral("no charset"))
            QVERIFY(WriteFile(file, QByteArray(russian).replace("#charset=204", "; no charset")));
        else if (damage == QStringLiteral("huge"))
            QVERIFY(WriteFile(file, "#language=Russian\r\n#charset=204\r\n" + QByteArray(17 * 1024 * 1024, ';')));
        else
            QVERIFY(::damage(file, damage));
        const QMap<QString, QByteArray> settingsBefore = SnapshotTree(m_env->path(QStringLiteral("settings")));

        const ProgramOutcome outcome = run();

        VERIFY_OUTCOME(outcome.showedWindow(), outcome);
        const bool english = damage != QStringLiteral("intact");
        QCOMPARE(outcome.window->value(QStringLiteral("actions")).toString() == QStringLiteral("Actions"), english);
        QCOMPARE(outcome.items(QStringLiteral("caption")).value(0) == QStringLiteral("Online games"), english);
        QCOMPARE(outcome.window->value(QStringLiteral("menu")).toArray().contains(QStringLiteral("Add game file...")),
            english);
        QCOMPARE(outcome.window->value(QStringLiteral("title")).toString(), QStringLiteral("Brimvault"));
        QCOMPARE(SnapshotTree(m_env->path(QStringLiteral("settings"))), settingsBefore);
    }

    // A registry entry that names a missing or broken library is repaired by registering the file beside the
    // program; when that file is broken too, registration fails with the one message and no window.
    void componentLibraryDamaged_data()
    {
        QTest::addColumn<QString>("registered"); // the library the registry names for Velloran; empty: as made
        QTest::addColumn<QString>("library"); // what lies beside the program as Velloran's file
        QTest::addColumn<QString>("failing"); // the component named on standard error; empty: the program runs

        const QString intact = QStringLiteral("intact");
        QTest::newRow("registered file deleted") << QStringLiteral("removed") << intact << QString();
        QTest::newRow("registered file is text") << QStringLiteral("text") << intact << QString();
        QTest::newRow("registered file cut off") << QStringLiteral("truncated 50") << intact << QString();
        QTest::newRow("registry is garbage") << QStringLiteral("garbage registry") << intact << QString();
        QTest::newRow("registry is a named pipe")
            << QStringLiteral("pipe registry") << intact << QStringLiteral("Quillet");
        for (const char* library : {"removed", "text", "empty", "truncated 2", "truncated 50", "truncated 95",
                 "no entry point", "folder", "pipe"})
            QTest::newRow(library) << QString() << QString::fromLatin1(library) << QStringLiteral("Velloran");
        QTest::newRow("registered file deleted, library cut off")
            << QStringLiteral("removed") << QStringLiteral("truncated 50") << QStringLiteral("Velloran");
    }

    void componentLibraryDamaged()
    {
        QFETCH(QString, registered);
        QFETCH(QString, library);
        QFETCH(QString, failing);

        const ProgramOutcome first = run();
        VERIFY_OUTCOME(first.showedWindow(), first);
        const QString progId = QStringLiteral("Velloran.clsVersion");
        const QString fileName = CompanionComponentFile(QStringLiteral("Velloran"));
        const QString velloran = m_program->filePath(fileName);
        const QByteArray real = ReadFile(velloran);
        QVERIFY(!real.isEmpty());

        if (registered.endsWith(QStringLiteral(" registry"))) {
            QVERIFY(damage(ComponentRegistryPath(), registered.section(u' ', 0, 0)));
        } else if (!registered.isEmpty()) {
            const QString elsewhere = m_env->path(QStringLiteral("elsewhere/") + fileName);
            QVERIFY(damage(elsewhere, registered, real) && RegisterProgIds({progId}, elsewhere));
        }
        const QByteArray registryBefore
            = registered.startsWith(QStringLiteral("garbage")) ? ReadFile(ComponentRegistryPath()) : QByteArray();
        if (library == QStringLiteral("no entry point"))
            QVERIFY(QFile::remove(velloran)
                && QFile::copy(QStringLiteral(BRIMVAULT_FIXTURE_DIR "/NoEntryPoint/") + fileName, velloran));
        else
            QVERIFY(damage(velloran, library, real));
        const QByteArray settingsBefore = ReadFile(m_env->settingsFile());

        const ProgramOutcome outcome = run();

        // Versions only change when a component changes: the user's settings stay as they were either way.
        QCOMPARE(ReadFile(m_env->settingsFile()), settingsBefore);
        if (!failing.isEmpty()) {
            VERIFY_OUTCOME(outcome.stoppedWithAdminMessage(), outcome);
            VERIFY_OUTCOME(outcome.standardError.contains(failing + QStringLiteral(" cannot be made usable")), outcome);
            return;
        }
        VERIFY_OUTCOME(outcome.showedWindow(), outcome);
        QCOMPARE(RegisteredLibrary(progId), QFileInfo(velloran).absoluteFilePath());
        QVERIFY(ReadFile(ComponentRegistryPath()).startsWith(registryBefore));
    }
};

QTEST_GUILESS_MAIN(TestDamagedEnvironment)
#include "tst_damagedenvironment.moc"

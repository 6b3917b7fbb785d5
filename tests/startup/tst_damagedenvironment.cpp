// The real program started in a temporary tree where something it reads is damaged: how it ended, what it
// said, and that the user's files are as they were.
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
#include <QJsonDocument>
#include <QProcess>
#include <QtTest>

#include <optional>

using namespace Brimvault;
using namespace Qt::StringLiterals;

namespace {

// What one run of the real program did: how it ended, the boxes it showed (its prompt log) and what its main
// window showed once filled (its window report; none when no window opened).
struct ProgramOutcome {
    bool finished = false; // ended by itself within a minute
    bool crashed = false;
    int exitCode = -1;
    QString standardError;
    QList<QJsonObject> prompts;
    std::optional<QJsonObject> window;

    // The window opened visible, nothing was asked, and the program ended normally.
    bool showedWindow() const
    {
        return finished && !crashed && exitCode == 0 && prompts.isEmpty() && window
            && window->value(u"visible"_s).toBool();
    }
    // Start-up's one message, critical with OK and titled "Brimvault"; no window; exit code 1.
    bool stoppedWithAdminMessage() const
    {
        const QJsonObject message {{u"kind"_s, u"message"_s},
            {u"text"_s, u"You need to run the program as administrator!"_s}, {u"title"_s, u"Brimvault"_s},
            {u"icon"_s, u"critical"_s}, {u"buttons"_s, u"ok"_s}};
        return finished && !crashed && exitCode == 1 && !window && prompts == QList {message};
    }
    // One field ("data", "picture") of every list item, in list order.
    QStringList items(const QString& field) const
    {
        QStringList values;
        for (const QJsonValue& item : window.value_or(QJsonObject()).value(u"items"_s).toArray())
            values.append(item.toObject().value(field).toString());
        return values;
    }
    QString describe() const
    {
        QStringList texts;
        for (const QJsonObject& prompt : prompts)
            texts.append(prompt.value(u"text"_s).toString());
        const QByteArray shown = window ? QJsonDocument(*window).toJson(QJsonDocument::Compact) : "-";
        return u"exit=%1 finished=%2 crashed=%3\nprompts: %4\nwindow: %5\nstderr: %6"_s.arg(exitCode)
            .arg(finished)
            .arg(crashed)
            .arg(texts.join(u" | "_s), QString::fromUtf8(shown), standardError.right(2000));
    }
};

// The entry at path and everything below it, as SnapshotTree shows them.
QMap<QString, QByteArray> snapshotOf(const QString& path)
{
    const QFileInfo info(path);
    QMap<QString, QByteArray> entry = SnapshotTree(info.absolutePath());
    entry.removeIf(
        [&](auto it) { return it.key() != info.fileName() && !it.key().startsWith(info.fileName() + u'/'); });
    return entry;
}

// The settings as a user has them after adding one game by hand.
QByteArray addedGameSettings(const QString& gamePath)
{
    return "[Files]\nCount=1\nFile1=" + gamePath.toUtf8() + '\n';
}

} // namespace

#define VERIFY_OUTCOME(condition, outcome) QVERIFY2(condition, qPrintable((outcome).describe()))

class TestDamagedEnvironment : public QObject {
    Q_OBJECT

    std::unique_ptr<TestEnvironment> m_env;
    // A program folder of the test's own, holding copies of what ships beside the program to be damaged.
    std::unique_ptr<QTemporaryDir> m_program;

    // The real program without arguments, offscreen, with the prompt log and the window report switched on; a
    // null value in changes removes that variable.
    ProgramOutcome run(const QMap<QString, QString>& changes = {})
    {
        const QString promptLog = m_env->path(u"prompts.jsonl"_s);
        const QString windowReport = m_env->path(u"window.json"_s);
        QFile::remove(promptLog);
        QFile::remove(windowReport);
        QMap<QString, QString> variables {{u"QT_QPA_PLATFORM"_s, u"offscreen"_s}, {u"BRIMVAULT_LOCALE"_s, u"en_US"_s},
            {u"BRIMVAULT_PROGRAM_DIR"_s, m_program->path()}, {u"BRIMVAULT_PROMPT_LOG"_s, promptLog},
            {u"BRIMVAULT_WINDOW_REPORT"_s, windowReport}};
        variables.insert(changes);
        QProcessEnvironment system = QProcessEnvironment::systemEnvironment();
        for (auto it = variables.cbegin(); it != variables.cend(); ++it)
            it->isNull() ? system.remove(it.key()) : system.insert(it.key(), it.value());
        QProcess program;
        program.setProcessEnvironment(system);
        program.setWorkingDirectory(m_env->root());
        program.start(ProgramPath(), {});
        ProgramOutcome outcome;
        outcome.finished = program.waitForFinished(60000);
        if (!outcome.finished)
            program.kill(), program.waitForFinished(10000);
        outcome.crashed = outcome.finished && program.exitStatus() == QProcess::CrashExit;
        outcome.exitCode = program.exitCode();
        outcome.standardError = program.errorString() + u'\n' + QString::fromLocal8Bit(program.readAllStandardError());
        for (const QByteArray& line : ReadFile(promptLog).split('\n')) {
            if (!line.trimmed().isEmpty())
                outcome.prompts.append(QJsonDocument::fromJson(line).object());
        }
        if (QFileInfo::exists(windowReport))
            outcome.window = QJsonDocument::fromJson(ReadFile(windowReport)).object();
        return outcome;
    }

    // Puts a damaged thing at path: "removed", "empty", "garbage", "text", "folder", "pipe", "link TARGET" (in
    // the tree), "truncated N" (the first N percent of `real`), or "intact".
    bool spoil(const QString& path, const QString& how, const QByteArray& real = {})
    {
        if (how == u"intact")
            return true;
        QFile::remove(path);
        QDir(path).removeRecursively();
        QDir().mkpath(QFileInfo(path).absolutePath());
        if (how == u"empty")
            return WriteFile(path, {});
        if (how == u"text")
            return WriteFile(path, "\177ELF but nothing more\n");
        if (how == u"garbage")
            return WriteFile(path, "MZ" + RandomBytes(8192, 20261121));
        if (how == u"folder")
            return QDir().mkpath(path);
        if (how == u"pipe")
            return MakeNamedPipe(path);
        if (how.startsWith(u"link "))
            return QFile::link(m_env->path(how.mid(5)), path);
        if (how.startsWith(u"truncated "))
            return WriteFile(path, real.left(real.size() * how.mid(10).toInt() / 100));
        return how == u"removed";
    }

    // A game executable of the user's, outside every folder the program scans.
    QString userGame()
    {
        const QString path = m_env->path(u"personal/My Games/chess.exe"_s);
        return WriteFile(path, ReadFile(PeFixture(u"nores32.exe"_s))) ? path : QString();
    }

private Q_SLOTS:
    void init()
    {
        m_env = std::make_unique<TestEnvironment>();
        m_program = std::make_unique<QTemporaryDir>();
        QStringList shipped {ServicePath()};
        for (const CompanionComponent& component : CompanionComponents())
            shipped << QStringLiteral(BRIMVAULT_BIN_DIR "/") + component.fileName;
        const QDir languages(QStringLiteral(BRIMVAULT_SOURCE_DIR "/lang"));
        for (const QString& name : languages.entryList({u"*.lng"_s}, QDir::Files))
            shipped << languages.filePath(name);
        for (const QString& file : shipped)
            QVERIFY2(QFile::copy(file, m_program->filePath(QFileInfo(file).fileName())), qPrintable(file));
        QVERIFY(!PeFixture(u"multi32.exe"_s).isEmpty());
    }
    void cleanup()
    {
        m_program.reset();
        m_env.reset();
    }

    // Unreadable settings: storing the first component's version fails, which start-up answers with its one
    // message. Otherwise the program runs and keeps the user's bytes.
    void damagedSettingsFile_data()
    {
        QTest::addColumn<QString>("damaged"); // relative to the tree
        QTest::addColumn<QString>("damage");
        QTest::addColumn<bool>("runs");
        const QString file = u"settings/Brimvault.ini"_s;
        const QString lock = u"settings/Brimvault.ini.lock"_s;
        QTest::newRow("named pipe in the file's place") << file << u"pipe"_s << false;
        QTest::newRow("settings folder is a file") << u"settings"_s << u"text"_s << false;
        QTest::newRow("folder in the lock file's place") << lock << u"folder"_s << false;
        QTest::newRow("named pipe in the lock file's place") << lock << u"pipe"_s << true;
        // Kept elsewhere by the user (a folder of dotfiles, say): written through, the link stays.
        QTest::newRow("link to the user's own file") << file << u"link personal/dotfiles/Brimvault.ini"_s << true;
    }
    void damagedSettingsFile()
    {
        QFETCH(QString, damaged);
        QFETCH(QString, damage);
        QFETCH(bool, runs);
        const QString game = userGame();
        const QByteArray original = addedGameSettings(game);
        const QString settings = m_env->settingsFile();
        QVERIFY(WriteFile(settings, original) && WriteFile(m_env->path(u"personal/dotfiles/Brimvault.ini"_s), original)
            && spoil(m_env->path(damaged), damage));
        const QMap<QString, QByteArray> untouched = snapshotOf(m_env->path(damaged));

        const ProgramOutcome outcome = run();

        if (!runs) {
            // The message box cannot say more; standard error names the place that failed.
            VERIFY_OUTCOME(
                outcome.stoppedWithAdminMessage() && outcome.standardError.contains(m_env->path(u"settings"_s)),
                outcome);
            QCOMPARE(snapshotOf(m_env->path(damaged)), untouched);
            return;
        }
        VERIFY_OUTCOME(outcome.showedWindow() && outcome.items(u"data"_s).contains(game), outcome);
        // The program added its own values after the user's bytes and kept every one of them.
        QCOMPARE(QFileInfo(settings).isSymLink(), damage.startsWith(u"link"));
        const QByteArray written = ReadFile(settings);
        QVERIFY(written.size() > original.size() && written.startsWith(original));
        QCOMPARE(GetSetting(AppTitle(), u"Settings"_s, u"CorvelleVersion"_s), QStringLiteral(BRIMVAULT_VERSION));
    }

    // Without HOME and without a folder named, the settings go below XDG_CONFIG_HOME.
    void settingsWithoutHome()
    {
        QMap<QString, QString> changes {{u"HOME"_s, QString()}, {u"BRIMVAULT_SETTINGS_DIR"_s, QString()}};
        // Everything a program might derive from the home folder stays inside the tree.
        for (const QString& kind : {u"CONFIG"_s, u"DATA"_s, u"CACHE"_s, u"STATE"_s})
            changes.insert(u"XDG_"_s + kind + u"_HOME"_s, m_env->path(u"xdg-"_s + kind.toLower()));

        const ProgramOutcome outcome = run(changes);

        VERIFY_OUTCOME(outcome.showedWindow(), outcome);
        QVERIFY(ReadFile(m_env->path(u"xdg-config/Brimvault/Brimvault.ini"_s))
                    .contains("QuilletVersion=" BRIMVAULT_VERSION));
    }

    // A game whose file, folder or icon cache is damaged is still listed, and the damaged thing stays as it
    // was. Icons are made from the executable when the cache cannot be used.
    void gamesDamaged_data()
    {
        QTest::addColumn<QString>("target"); // the game added by hand, its folders, the icons or Arcade's cache
        QTest::addColumn<QString>("damage");
        for (const char* damage : {"removed", "empty", "garbage", "folder", "pipe"})
            QTest::addRow("game file %s", damage) << u"game"_s << QString::fromLatin1(damage);
        QTest::newRow("games folder is a file") << u"commonappdata/Brimvault"_s << u"text"_s;
        QTest::newRow("application data folder is a file") << u"commonappdata"_s << u"text"_s;
        QTest::newRow("icons folder is a file") << u"icons"_s << u"text"_s;
        QTest::newRow("icons folder is a pipe") << u"icons"_s << u"pipe"_s;
        QTest::newRow("icons folder links through a file") << u"icons"_s << u"link blocker/Icons"_s;
        QTest::newRow("cache file is a pipe") << u"cache"_s << u"pipe"_s;
        QTest::newRow("cache file is a folder") << u"cache"_s << u"folder"_s;
        QTest::newRow("cache file is a link") << u"cache"_s << u"link personal/notes.txt"_s;
    }
    void gamesDamaged()
    {
        QFETCH(QString, target);
        QFETCH(QString, damage);
        const QString game = userGame();
        const QString withIcon = DataFolders::GamesFolder() + u"Arcade/Arcade.exe"_s;
        const QMap<QString, QString> targets {{u"game"_s, game},
            {u"cache"_s, FileSystemPath(IconCacheFile(DataFolders::IconsFolder(), withIcon))},
            {u"icons"_s, QDir::cleanPath(DataFolders::IconsFolder())}};
        const QString damaged = targets.value(target, m_env->path(target));
        QVERIFY(WriteFile(withIcon, ReadFile(PeFixture(u"multi32.exe"_s)))
            && WriteFile(m_env->settingsFile(), addedGameSettings(game))
            && WriteFile(m_env->path(u"personal/notes.txt"_s), "my notes\n")
            && WriteFile(m_env->path(u"blocker"_s), "a file\n") && spoil(damaged, damage));
        const QMap<QString, QByteArray> untouched = snapshotOf(damaged);
        const QMap<QString, QByteArray> personal = SnapshotTree(m_env->path(u"personal"_s));
        const bool gamesFolder = targets.contains(target);

        const ProgramOutcome outcome = run();

        // The online games, the game added by hand and, with a usable games folder, Arcade.
        const QStringList data = outcome.items(u"data"_s);
        const QStringList pictures = outcome.items(u"picture"_s);
        VERIFY_OUTCOME(outcome.showedWindow() && data.size() == (gamesFolder ? 3 : 2), outcome);
        QCOMPARE(pictures.value(data.indexOf(game)), u"no-icon"_s);
        QCOMPARE(snapshotOf(damaged), untouched);
        QCOMPARE(SnapshotTree(m_env->path(u"personal"_s)), personal);
        if (gamesFolder)
            QCOMPARE(pictures.value(data.indexOf(withIcon)), u"picture"_s);
    }

    // The stored language applies when its file is usable; otherwise the built-in English texts, silently, and
    // the stored choice stays as it is.
    void chosenLanguageFileDamaged_data()
    {
        QTest::addColumn<QString>("damage");
        for (const char* damage : {"intact", "removed", "empty", "garbage", "folder", "pipe", "huge"})
            QTest::newRow(damage) << QString::fromLatin1(damage);
    }
    void chosenLanguageFileDamaged()
    {
        QFETCH(QString, damage);
        const ProgramOutcome first = run();
        VERIFY_OUTCOME(first.showedWindow(), first);
        QVERIFY(SaveSetting(AppTitle(), u"LocaleSettings"_s, u"LngFileName"_s, u"Brimvault_Russian.lng"_s)
            && SaveSetting(AppTitle(), u"LocaleSettings"_s, u"LngNik"_s, u"RUSSIAN"_s));
        const QString file = m_program->filePath(u"Brimvault_Russian.lng"_s);
        if (damage == u"huge")
            QVERIFY(WriteFile(file, "#language=Russian\r\n#charset=204\r\n" + QByteArray(17 * 1024 * 1024, ';')));
        else
            QVERIFY(spoil(file, damage));
        const QMap<QString, QByteArray> settingsBefore = SnapshotTree(m_env->path(u"settings"_s));

        const ProgramOutcome outcome = run();

        VERIFY_OUTCOME(outcome.showedWindow(), outcome);
        const bool english = damage != u"intact";
        QCOMPARE(outcome.window->value(u"actions"_s).toString() == u"Actions"_s, english);
        QCOMPARE(outcome.window->value(u"menu"_s).toArray().contains(u"Add game file..."_s), english);
        QCOMPARE(SnapshotTree(m_env->path(u"settings"_s)), settingsBefore);
    }

    // A registry entry that names a missing or broken library is repaired by registering the file beside the
    // program; when that file is broken too, registration fails with the one message and no window.
    void componentLibraryDamaged_data()
    {
        QTest::addColumn<QString>("registered"); // the library the registry names for Velloran; empty: as made
        QTest::addColumn<QString>("library"); // what lies beside the program as Velloran's file
        QTest::addColumn<QString>("failing"); // the component named on standard error; empty: the program runs
        const QString intact = u"intact"_s;
        QTest::newRow("registered file deleted") << u"removed"_s << intact << QString();
        QTest::newRow("registered file is text") << u"text"_s << intact << QString();
        QTest::newRow("registered file cut off") << u"truncated 50"_s << intact << QString();
        QTest::newRow("registry is garbage") << u"garbage registry"_s << intact << QString();
        QTest::newRow("registry is a named pipe") << u"pipe registry"_s << intact << u"Quillet"_s;
        for (const char* library : {"removed", "text", "empty", "truncated 2", "truncated 50", "truncated 95",
                 "no entry point", "folder", "pipe"})
            QTest::newRow(library) << QString() << QString::fromLatin1(library) << u"Velloran"_s;
        QTest::newRow("registered file deleted, library cut off") << u"removed"_s << u"truncated 50"_s << u"Velloran"_s;
    }
    void componentLibraryDamaged()
    {
        QFETCH(QString, registered);
        QFETCH(QString, library);
        QFETCH(QString, failing);
        const ProgramOutcome first = run();
        VERIFY_OUTCOME(first.showedWindow(), first);
        const QString progId = u"Velloran.clsVersion"_s;
        const QString fileName = CompanionComponentFile(u"Velloran"_s);
        const QString velloran = m_program->filePath(fileName);
        const QByteArray real = ReadFile(velloran);
        if (registered.endsWith(u" registry")) {
            QVERIFY(spoil(ComponentRegistryPath(), registered.section(u' ', 0, 0)));
        } else if (!registered.isEmpty()) {
            const QString elsewhere = m_env->path(u"elsewhere/"_s + fileName);
            QVERIFY(spoil(elsewhere, registered, real) && RegisterProgIds({progId}, elsewhere));
        }
        const QByteArray registryBefore = registered.startsWith(u"garbage") ? ReadFile(ComponentRegistryPath()) : "";
        if (library == u"no entry point")
            QVERIFY(QFile::remove(velloran)
                && QFile::copy(QStringLiteral(BRIMVAULT_FIXTURE_DIR "/NoEntryPoint/") + fileName, velloran));
        else
            QVERIFY(!real.isEmpty() && spoil(velloran, library, real));
        const QByteArray settingsBefore = ReadFile(m_env->settingsFile());

        const ProgramOutcome outcome = run();

        // Versions only change when a component changes: the user's settings stay as they were either way.
        QCOMPARE(ReadFile(m_env->settingsFile()), settingsBefore);
        if (!failing.isEmpty()) {
            VERIFY_OUTCOME(outcome.stoppedWithAdminMessage()
                    && outcome.standardError.contains(failing + u" cannot be made usable"_s),
                outcome);
            return;
        }
        VERIFY_OUTCOME(outcome.showedWindow(), outcome);
        QCOMPARE(RegisteredLibrary(progId), QFileInfo(velloran).absoluteFilePath());
        QVERIFY(ReadFile(ComponentRegistryPath()).startsWith(registryBefore));
    }
};

QTEST_GUILESS_MAIN(TestDamagedEnvironment)
#include "tst_damagedenvironment.moc"
